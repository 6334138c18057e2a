// Errors and events as if they came from the broadcast or the viewer, to test how pages react.
#ifndef TELIX_DESKTOP_PLATFORM_FAULTINJECTION_H
#define TELIX_DESKTOP_PLATFORM_FAULTINJECTION_H

#include <cstdint>
#include <optional>
#include <string>

#include "desktop/platform/Platform.h"
#include "desktop/platform/TsTables.h"
#include "telix/telix_platform.h"

namespace desktop {

class Broadcast;

// Has no state of its own. The functions concern the object that owns the tuner and return false if there is
// none; the callbacks follow on the platform thread. Any thread, unless said otherwise.
class FaultInjection {
public:
    // The subscriptions that match every criterion given receive the event.
    struct Event {
        std::optional<uint16_t> id;
        std::optional<uint8_t> componentTag;
        std::optional<std::string> name;
        Bytes data;
        std::string status = "trigger"; // or "error"
    };

    explicit FaultInjection(Broadcast& broadcast);

    bool channelError(TELIX_ERR_STATE_ENUM_T error);

    // `rating` is as broadcast: an age, or a broadcaster's own value, which is an error; 0: the programme has
    // none. It is reported also if it is the same as before.
    bool rating(const std::string& region, uint8_t rating);
    bool ratingError(std::string contentId, std::string drmSystemId);

    // Returns the number of subscriptions, of all objects, that receive the event. Platform thread.
    size_t streamEvent(const Event& event);

    // The viewer switches between full screen and the page's display area.
    bool fullScreen(bool isFullScreen);

private:
    Broadcast& m_broadcast;
    Platform& m_platform;
};

} // namespace desktop

#endif
