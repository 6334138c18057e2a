// Platform calls of the device: preferences, keys, memory, capabilities, rating schemes and DRM messages.
#include "desktop/platform/Device.h"
#include "desktop/platform/Output.h"

using namespace desktop;

namespace {

Device& device() {
    return Device::instance();
}

} // namespace

TELIX_RETCODE_ENUM_T TELIX_JS_APP_Config_GetPreferredAudioLanguage(char** language) {
    return returnString(language, device().configuration().audioLanguage);
}

TELIX_RETCODE_ENUM_T TELIX_JS_APP_Config_GetPreferredSubtitleLanguage(char** language) {
    return returnString(language, device().configuration().subtitleLanguage);
}

TELIX_RETCODE_ENUM_T TELIX_JS_APP_Config_GetCountryId(char** country) {
    return returnString(country, device().configuration().country);
}

TELIX_RETCODE_ENUM_T TELIX_JS_APP_GetFreeMem(uint32_t* amount) {
    *amount = device().freeMemory();
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_APP_RegisterLowMemory(TELIX_JS_APP_LOW_MEMORY_CB callback) {
    device().onLowMemory.set(callback);
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_APP_UnRegisterLowMemory(TELIX_JS_APP_LOW_MEMORY_CB callback) {
    device().onLowMemory.clear(callback);
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_APP_GetKeySetValue(uint32_t* mask) {
    *mask = device().keySet();
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_APP_SetKeySetValue(uint32_t mask, uint32_t* granted) {
    *granted = device().setKeySet(mask);
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_CAP_GetXmlCapabilities(char** xml) {
    const auto& capabilities = device().capabilities();
    return capabilities ? returnString(xml, capabilities->document()) : kRefused;
}

TELIX_RETCODE_ENUM_T TELIX_JS_CAP_HasCapability(const char* profile, ___UINT8* supported) {
    const auto& capabilities = device().capabilities();
    if (!capabilities) {
        return kRefused;
    }
    *supported = capabilities->hasProfile(profile) ? 1 : 0;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_CAP_GetExtraSDVideoDecodes(uint32_t* count) {
    *count = device().configuration().extraSdVideoDecodes;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_CAP_GetExtraHDVideoDecodes(uint32_t* count) {
    *count = device().configuration().extraHdVideoDecodes;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T
TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold(TELIX_JS_SI_PARENTALRATINGSCHEME_HANDLE scheme,
                                              int32_t* threshold) {
    const auto found = device().ratingThreshold(scheme);
    if (!found) {
        return kRefused;
    }
    *threshold = *found;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T
TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes(uint32_t* count,
                                                     PARENTALRATTINGSCHEME_STRUCT_T_TAG** schemes) {
    *count = static_cast<uint32_t>(device().ratingSchemes().size());
    *schemes = device().ratingSchemes().data();
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_DRM_RegisterOnDRMMessageResult(TELIX_JS_DRM_MESSAGE_RESULT_CB callback) {
    device().onDrmMessageResult.set(callback);
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_DRM_UnregisterOnDRMMessageResult(TELIX_JS_DRM_MESSAGE_RESULT_CB callback) {
    device().onDrmMessageResult.clear(callback);
    return TELIX_RETCODE_SUCCESS;
}

// The result is the one that the configuration states, whatever the message is.
TELIX_RETCODE_ENUM_T TELIX_JS_DRM_SendDRMMessage(const char* messageType, const char* message,
                                                 const char* drmSystemId, char** messageId) {
    (void)messageType;
    (void)message;
    return returnString(messageId, device().sendDrmMessage(drmSystemId));
}

// Looked up by the plug-in and never called.
TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetChannelHandle(uint32_t value) {
    (void)value;
    return TELIX_RETCODE_NOT_AVAILABLE;
}
