// Channels, video/broadcast objects and their events, for the checks of broadcast.
#ifndef TELIX_DESKTOP_CONFORMANCE_BROADCASTFIXTURE_H
#define TELIX_DESKTOP_CONFORMANCE_BROADCASTFIXTURE_H

#include "desktop/conformance/CheckContext.h"

namespace desktop {

// All functions fail the check if the library refuses.
std::vector<TELIX_JS_CM_HANDLE> channelsOf(const CheckContext& context);
TELIX_JS_CM_HANDLE firstChannel(const CheckContext& context); // skips the check if there are no channels
TELIX_JS_VB_HANDLE newObject(const CheckContext& context);

// The DVB triplet of a service.
struct Triplet {
    uint32_t onid = 0;
    uint32_t tsid = 0;
    uint32_t sid = 0;

    bool operator==(const Triplet& other) const {
        return onid == other.onid && tsid == other.tsid && sid == other.sid;
    }
};
Triplet tripletOf(const CheckContext& context, TELIX_JS_CM_HANDLE channel);

// The transport stream id of a page that leaves it out.
constexpr uint32_t kAnyTransportStream = 8191;

// A stream event callback that does nothing.
TELIX_RETCODE_ENUM_T ignoreStreamEvent(TELIX_JS_VB_HANDLE object, ___UINT8* first, ___UINT8* second,
                                       ___UINT8* name, ___UINT8* data, ___UINT32 length, ___UINT8* status);

} // namespace desktop

#endif
