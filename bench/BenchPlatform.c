/* The platform library of the benchmarks: minimal implementations of the calls that they make. */
#include <string.h>

#include "telix/telix_platform.h"

TELIX_RETCODE_ENUM_T TELIX_JS_APP_GetFreeMem(uint32_t* amount) {
    *amount = 1;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_CreatePlayer(TELIX_JS_AV_HANDLE* player, int32_t containerCode,
                                              int32_t audioCodecCode, uint32_t memoryAudio) {
    (void)containerCode;
    (void)audioCodecCode;
    (void)memoryAudio;
    *player = 1;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_GetPlayInfo(TELIX_JS_AV_HANDLE player, TELIX_JS_AV_PLAY_INFO** info) {
    static TELIX_JS_AV_PLAY_INFO record = {2, 5000, 60000, 0, 10, 20};
    (void)player;
    *info = &record;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetChannelType(TELIX_JS_CM_HANDLE channel, int32_t* type) {
    *type = (int32_t)(channel & 1);
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetName(TELIX_JS_CM_HANDLE channel, char** name) {
    (void)channel;
    *name = strdup("A channel's name");
    return TELIX_RETCODE_SUCCESS;
}

/* An empty string, which the plug-in does not cache. */
TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetDsd(TELIX_JS_CM_HANDLE channel, char** descriptor) {
    (void)channel;
    *descriptor = strdup("");
    return TELIX_RETCODE_SUCCESS;
}
