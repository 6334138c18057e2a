#include "desktop/conformance/BroadcastFixture.h"

namespace desktop {

std::vector<TELIX_JS_CM_HANDLE> channelsOf(const CheckContext& context) {
    uint32_t count = 0;
    TELIX_JS_CM_HANDLE* channels = nullptr;
    expect(context.library.TELIX_JS_CM_GetChannelList(&count, &channels) == 0, "the channel list is refused");
    expect(channels != nullptr, "the array is null");
    return {channels, channels + count};
}

TELIX_JS_CM_HANDLE firstChannel(const CheckContext& context) {
    const auto channels = channelsOf(context);
    if (channels.empty()) {
        throw CheckSkipped{"there are no channels"};
    }
    return channels.front();
}

TELIX_JS_VB_HANDLE newObject(const CheckContext& context) {
    TELIX_JS_VB_HANDLE object = 0;
    expect(context.library.TELIX_JS_VB_GetHandle(&object) == 0 && object != 0, "no object is created");
    return object;
}

Triplet tripletOf(const CheckContext& context, TELIX_JS_CM_HANDLE channel) {
    Triplet triplet;
    context.library.TELIX_JS_CM_GetOnid(channel, &triplet.onid);
    context.library.TELIX_JS_CM_GetTsid(channel, &triplet.tsid);
    context.library.TELIX_JS_CM_GetSid(channel, &triplet.sid);
    return triplet;
}

TELIX_RETCODE_ENUM_T ignoreStreamEvent(TELIX_JS_VB_HANDLE, ___UINT8*, ___UINT8*, ___UINT8*, ___UINT8*,
                                       ___UINT32, ___UINT8*) {
    return 0;
}

} // namespace desktop
