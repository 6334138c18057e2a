/* The public header alone, as a set maker includes it: C and C++, and the layout of what crosses to the
 * library. */
#include "telix/telix_platform.h"

#include <stddef.h>

#ifndef __cplusplus
#define static_assert _Static_assert
#endif

static_assert(sizeof(TELIX_RETCODE_ENUM_T) == 4, "results are 32 bits wide");
static_assert(sizeof(TELIX_AV_CB_MSG) == 4, "messages are 32 bits wide");
static_assert(sizeof(TELIX_PLAYSTATE_ENUM_T) == 4, "play states are 32 bits wide");
static_assert(sizeof(TELIX_ERR_STATE_ENUM_T) == 4, "error states are 32 bits wide");
static_assert(sizeof(TELIX_AV_DRM_ERR_STATE_ENUM_T) == 4, "rights errors are 32 bits wide");
static_assert(sizeof(TELIX_DRM_RESULT_CODE_ENUM_T_tag) == 4, "DRM results are 32 bits wide");
static_assert(sizeof(TELIX_JS_AVCOMPHANDLE) == 4, "handles are 32 bits wide");
static_assert(sizeof(___UINT8) == 1 && sizeof(___UINT32) == 4, "the numbers are what their names say");

static_assert(sizeof(TELIX_JS_DISPLAY_AREA) == 8, "four values of 16 bits");
static_assert(offsetof(TELIX_JS_DISPLAY_AREA, height) == 6, "the height is the last");

static_assert(sizeof(TELIX_JS_AV_PLAY_INFO) == 24, "six values of 32 bits");
static_assert(offsetof(TELIX_JS_AV_PLAY_INFO, playPosition) == 4, "the position is the second");
static_assert(offsetof(TELIX_JS_AV_PLAY_INFO, duration) == 8, "the duration is the third");
static_assert(offsetof(TELIX_JS_AV_PLAY_INFO, bufferedEnd) == 16, "one field stands between");
static_assert(offsetof(TELIX_JS_AV_PLAY_INFO, buffered) == 20, "the amount is the last");

static_assert(offsetof(PARENTALRATTINGSCHEME_STRUCT_T_TAG, szName) == 8, "two numbers come first");
static_assert(sizeof(PARENTALRATTINGSCHEME_STRUCT_T_TAG) == 8 + 3 * sizeof(char*), "three addresses follow");
