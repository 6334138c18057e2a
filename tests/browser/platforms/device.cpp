// A platform with settings, a key mask, capabilities, and a DRM system that responds to each message with the
// reversed message, on a thread of its own.
#include "tests/support/RecordingPlatform.h"

#include <algorithm>
#include <atomic>
#include <cstring>
#include <string>
#include <thread>

namespace {

constexpr const char* kCapabilities =
    "<?xml version=\"1.0\" encoding=\"UTF-8\"?>"
    "<profilelist xmlns=\"urn:hbbtv:config:oitf:oitfCapabilities:2011-1\">"
    "<ui_profile name=\"OITF_HD_UIPROF+DVB_T\"><ext><parentalcontrol "
    "schemes=\"dvb-si\">true</parentalcontrol>"
    "</ext></ui_profile>"
    "<video_profile name=\"MP4_AVC_SD_25\" type=\"video/mp4\"/></profilelist>";

std::atomic<uint32_t> keyMask{0x1F};
std::atomic<int> messages{0};
std::atomic<TELIX_JS_DRM_MESSAGE_RESULT_CB> drmCallback{nullptr};

TELIX_RETCODE_ENUM_T returnString(char** text, const std::string& value) {
    *text = strdup(value.c_str());
    return TELIX_RETCODE_SUCCESS;
}

void reportResult(const std::string& id, std::string message) {
    std::reverse(message.begin(), message.end());
    if (TELIX_JS_DRM_MESSAGE_RESULT_CB callback = drmCallback) {
        // The plug-in copies both strings during the call.
        auto* idText = reinterpret_cast<___UINT8*>(const_cast<char*>(id.c_str()));
        auto* resultText = reinterpret_cast<___UINT8*>(const_cast<char*>(message.c_str()));
        callback(idText, resultText, 0);
    }
}

const bool scenario = [] {
    RecordingPlatform& platform = *telix_recording_platform();
    platform.TELIX_JS_APP_Config_GetPreferredAudioLanguage = [](char** text) {
        return returnString(text, "deu");
    };
    platform.TELIX_JS_APP_Config_GetPreferredSubtitleLanguage = [](char** text) {
        return returnString(text, "eng");
    };
    platform.TELIX_JS_APP_Config_GetCountryId = [](char** text) { return returnString(text, "DEU"); };
    platform.TELIX_JS_APP_GetFreeMem = [](uint32_t* amount) {
        *amount = 123456;
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_APP_GetKeySetValue = [](uint32_t* mask) {
        *mask = keyMask;
        return TELIX_RETCODE_SUCCESS;
    };
    // The remote control has no alphanumeric keys.
    platform.TELIX_JS_APP_SetKeySetValue = [](uint32_t mask, uint32_t* granted) {
        keyMask = mask & 0x1FF;
        *granted = keyMask;
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_APP_GetCurrentChannel = [](TELIX_JS_CM_HANDLE* channel) {
        *channel = 7;
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_CM_GetName = [](TELIX_JS_CM_HANDLE channel, char** name) {
        return returnString(name, "Channel " + std::to_string(channel));
    };
    platform.TELIX_JS_CAP_GetXmlCapabilities = [](char** xml) { return returnString(xml, kCapabilities); };
    platform.TELIX_JS_CAP_HasCapability = [](const char* profile, ___UINT8* supported) {
        *supported = std::strcmp(profile, "OITF_HD_UIPROF") == 0;
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_CAP_GetExtraSDVideoDecodes = [](uint32_t* count) {
        *count = 2;
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_CAP_GetExtraHDVideoDecodes = [](uint32_t* count) {
        *count = 1;
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_DRM_RegisterOnDRMMessageResult = [](TELIX_JS_DRM_MESSAGE_RESULT_CB callback) {
        drmCallback = callback;
        return TELIX_RETCODE_SUCCESS;
    };
    // The message "refuse" returns an error.
    platform.TELIX_JS_DRM_SendDRMMessage = [](const char*, const char* message, const char*, char** id) {
        if (std::strcmp(message, "refuse") == 0) {
            return TELIX_RETCODE_NOT_AVAILABLE;
        }
        const std::string number = "message " + std::to_string(++messages);
        std::thread(reportResult, number, std::string(message)).detach();
        return static_cast<decltype(TELIX_RETCODE_NOT_AVAILABLE)>(returnString(id, number));
    };
    return true;
}();

} // namespace
