// The recording platform of load_bench: it has a player for the A/V control object.
#include "tests/support/RecordingPlatform.h"

namespace {

TELIX_RETCODE_ENUM_T createPlayer(TELIX_JS_AV_HANDLE* player, int32_t, int32_t, uint32_t) {
    *player = 1;
    return TELIX_RETCODE_SUCCESS;
}

[[maybe_unused]] const bool g_scripted = [] {
    telix_recording_platform()->TELIX_JS_AV_CreatePlayer = createPlayer;
    return true;
}();

} // namespace
