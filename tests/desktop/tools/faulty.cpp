// A platform library with one fault of each kind, for the tests of telix-conformance. All other functions are
// missing.
#include "telix/telix_platform.h"

#include <cstdlib>
#include <cstring>
#include <string>
#include <thread>
#include <unistd.h>

namespace {

char language[] = "deu";
TELIX_JS_DRM_MESSAGE_RESULT_CB drmCallback = nullptr;

} // namespace

// Returns the same block at each call.
TELIX_RETCODE_ENUM_T TELIX_JS_APP_Config_GetPreferredAudioLanguage(char** string) {
    *string = language;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_APP_Config_GetCountryId(char** string) {
    *string = strdup("Germany");
    return TELIX_RETCODE_SUCCESS;
}

// Refuses, but changes its output.
TELIX_RETCODE_ENUM_T TELIX_JS_APP_GetFreeMem(uint32_t* amount) {
    *amount = 7;
    return 1;
}

// Correct.
TELIX_RETCODE_ENUM_T TELIX_JS_APP_GetKeySetValue(uint32_t* mask) {
    *mask = 0x1F;
    return TELIX_RETCODE_SUCCESS;
}

// Never writes its output.
TELIX_RETCODE_ENUM_T TELIX_JS_APP_SetKeySetValue(uint32_t mask, uint32_t* granted) {
    (void)mask;
    (void)granted;
    return TELIX_RETCODE_SUCCESS;
}

// Not well-formed.
TELIX_RETCODE_ENUM_T TELIX_JS_CAP_GetXmlCapabilities(char** xml) {
    *xml = strdup("<profilelist>");
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetChannelList(uint32_t* count, TELIX_JS_CM_HANDLE** channels) {
    static TELIX_JS_CM_HANDLE twice[] = {5, 5};
    *count = 2;
    *channels = twice;
    return TELIX_RETCODE_SUCCESS;
}

// Accepts any handle.
TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetSid(TELIX_JS_CM_HANDLE channel, uint32_t* sid) {
    *sid = channel;
    return TELIX_RETCODE_SUCCESS;
}

// Crashes.
TELIX_RETCODE_ENUM_T
TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes(uint32_t* count,
                                                     PARENTALRATTINGSCHEME_STRUCT_T_TAG** schemes) {
    (void)count;
    (void)schemes;
    std::abort();
}

// Returns the same handle for all objects.
TELIX_RETCODE_ENUM_T TELIX_JS_VB_GetHandle(TELIX_JS_VB_HANDLE* object) {
    *object = 1;
    return TELIX_RETCODE_SUCCESS;
}

// Hangs.
TELIX_RETCODE_ENUM_T TELIX_JS_AV_CreatePlayer(TELIX_JS_AV_HANDLE* player, int32_t containerCode,
                                              int32_t audioCodecCode, uint32_t memoryAudio) {
    (void)player;
    (void)containerCode;
    (void)audioCodecCode;
    (void)memoryAudio;
    for (;;) {
        pause();
    }
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_DestroyPlayer(TELIX_JS_AV_HANDLE player) {
    (void)player;
    return 1;
}

TELIX_RETCODE_ENUM_T TELIX_JS_DRM_RegisterOnDRMMessageResult(TELIX_JS_DRM_MESSAGE_RESULT_CB callback) {
    drmCallback = callback;
    return TELIX_RETCODE_SUCCESS;
}

// Does nothing: results are still reported.
TELIX_RETCODE_ENUM_T TELIX_JS_DRM_UnregisterOnDRMMessageResult(TELIX_JS_DRM_MESSAGE_RESULT_CB callback) {
    (void)callback;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_DRM_SendDRMMessage(const char* messageType, const char* message,
                                                 const char* drmSystemId, char** messageId) {
    (void)messageType;
    (void)message;
    (void)drmSystemId;
    static int last = 0;
    char id[16] = "m";
    id[1] = static_cast<char>('a' + last++);
    *messageId = strdup(id);
    std::thread([reported = std::string(id)]() mutable {
        char message[] = "";
        drmCallback(reinterpret_cast<___UINT8*>(reported.data()), reinterpret_cast<___UINT8*>(message), 0);
    }).detach();
    return TELIX_RETCODE_SUCCESS;
}
