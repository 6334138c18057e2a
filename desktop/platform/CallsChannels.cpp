// The platform calls for channels.
#include "desktop/platform/Broadcast.h"
#include "desktop/platform/Output.h"

using namespace desktop;

namespace {

// Returns a property of a channel, or refuses.
template <typename Function>
TELIX_RETCODE_ENUM_T ofChannel(TELIX_JS_CM_HANDLE handle, Function function) {
    const auto channel = Broadcast::instance().channels().find(handle);
    return channel ? function(*channel) : kRefused;
}

} // namespace

TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetChannelList(uint32_t* count, TELIX_JS_CM_HANDLE** channels) {
    static std::vector<TELIX_JS_CM_HANDLE> handles; // valid until the next call
    handles = Broadcast::instance().channels().list();
    handles.reserve(1); // the address of an empty array is not null either
    *count = static_cast<uint32_t>(handles.size());
    *channels = handles.data();
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetChannelType(TELIX_JS_CM_HANDLE channel, int32_t* type) {
    return ofChannel(channel, [=](const Channel& found) {
        *type = found.type;
        return TELIX_RETCODE_SUCCESS;
    });
}

TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetSid(TELIX_JS_CM_HANDLE channel, uint32_t* sid) {
    return ofChannel(channel, [=](const Channel& found) {
        *sid = found.sid;
        return TELIX_RETCODE_SUCCESS;
    });
}

TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetOnid(TELIX_JS_CM_HANDLE channel, uint32_t* onid) {
    return ofChannel(channel, [=](const Channel& found) {
        *onid = found.onid;
        return TELIX_RETCODE_SUCCESS;
    });
}

TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetTsid(TELIX_JS_CM_HANDLE channel, uint32_t* tsid) {
    return ofChannel(channel, [=](const Channel& found) {
        *tsid = found.tsid;
        return TELIX_RETCODE_SUCCESS;
    });
}

// Each byte becomes the character with its code, in UTF-8, as pages hand descriptors back. A descriptor with
// a zero byte is refused, because a string ends at a zero.
TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetDsd(TELIX_JS_CM_HANDLE channel, char** descriptor) {
    return ofChannel(channel, [=](const Channel& found) -> TELIX_RETCODE_ENUM_T {
        std::string string;
        for (const uint8_t byte : found.deliveryDescriptor) {
            if (byte == 0) {
                return kRefused;
            }
            if (byte < 0x80) {
                string += static_cast<char>(byte);
            } else {
                string += static_cast<char>(0xC0 | byte >> 6);
                string += static_cast<char>(0x80 | (byte & 0x3F));
            }
        }
        return returnString(descriptor, string);
    });
}

TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetName(TELIX_JS_CM_HANDLE channel, char** name) {
    return ofChannel(channel, [=](const Channel& found) { return returnString(name, found.name); });
}

TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetChannelByTriplet(uint32_t onid, uint32_t tsid, uint32_t sid,
                                                     TELIX_JS_CM_HANDLE* channel) {
    const TELIX_JS_CM_HANDLE found = Broadcast::instance().channels().findByTriplet(onid, tsid, sid);
    if (found == 0) {
        return kRefused;
    }
    *channel = found;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_APP_GetCurrentChannel(TELIX_JS_CM_HANDLE* channel) {
    *channel = Broadcast::instance().arbiter().currentChannel();
    return resultOf(*channel != 0);
}
