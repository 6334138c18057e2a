/* The platform library of the benchmarks: the calls that they make, each as short as it can be. */
#include <string.h>

#include "telix/telix_platform.h"

TELIX_RETCODE_ENUM_T TELIX_JS_APP_GetFreeMem(uint32_t* amount) {
    *amount = 1;
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

/* An empty text, which the plug-in asks for again at every read. */
TELIX_RETCODE_ENUM_T TELIX_JS_CM_GetDsd(TELIX_JS_CM_HANDLE channel, char** descriptor) {
    (void)channel;
    *descriptor = strdup("");
    return TELIX_RETCODE_SUCCESS;
}
