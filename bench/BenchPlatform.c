/* The platform library of the benchmarks: the calls that they make, each as short as it can be. */
#include "telix/telix_platform.h"

TELIX_RETCODE_ENUM_T TELIX_JS_APP_GetFreeMem(uint32_t* amount) {
    *amount = 1;
    return TELIX_RETCODE_SUCCESS;
}
