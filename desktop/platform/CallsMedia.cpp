// The calls of the A/V control object.
#include "desktop/platform/ComponentCalls.h"
#include "desktop/platform/Output.h"
#include "desktop/platform/PlayerRegistry.h"

using namespace desktop;

namespace {

PlayerRegistry& players() {
    return PlayerRegistry::instance();
}

} // namespace

// The codes from the MIME type and the URL are not used: GStreamer finds the type of the media itself.
TELIX_RETCODE_ENUM_T TELIX_JS_AV_CreatePlayer(TELIX_JS_AV_HANDLE* player, int32_t containerCode,
                                              int32_t audioCodecCode, uint32_t memoryAudio) {
    (void)containerCode;
    (void)audioCodecCode;
    (void)memoryAudio;
    *player = players().create();
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_DestroyPlayer(TELIX_JS_AV_HANDLE player) {
    return resultOf(players().destroy(player));
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_RegisterOnPlayStateChange(TELIX_JS_AV_HANDLE player,
                                                           TELIX_JS_AV_PLAYSTATE_CB callback) {
    return resultOf(players().setCallback(player, callback));
}

// A player's callbacks are removed with the player, and those of other players stay: nothing is left to do.
TELIX_RETCODE_ENUM_T TELIX_JS_AV_UnregisterOnPlayStateChange(TELIX_JS_AV_PLAYSTATE_CB callback) {
    (void)callback;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_RegisterOnDRMRightsError(TELIX_JS_AV_HANDLE player,
                                                          TELIX_JS_AV_DRM_RIGHTS_CB callback) {
    return resultOf(players().setCallback(player, callback));
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_UnregisterOnDRMRightsError(TELIX_JS_AV_DRM_RIGHTS_CB callback) {
    (void)callback;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_Play(TELIX_JS_AV_HANDLE player, const char* url, uint32_t playCount,
                                      int32_t sourceCode, int32_t containerCode, int32_t audioCodecCode,
                                      uint32_t reserved32, uint16_t reserved16) {
    (void)sourceCode; // one pipeline plays all kinds of media
    (void)containerCode;
    (void)audioCodecCode;
    (void)reserved32;
    (void)reserved16;
    return resultOf(url && players().play(player, url, playCount));
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_Queue(TELIX_JS_AV_HANDLE player, const char* url, uint32_t playCount,
                                       int32_t sourceCode, int32_t containerCode, int32_t audioCodecCode,
                                       uint32_t reserved32, uint16_t reserved16) {
    (void)sourceCode;
    (void)containerCode;
    (void)audioCodecCode;
    (void)reserved32;
    (void)reserved16;
    return resultOf(url ? players().queue(player, url, playCount) : players().clearQueue(player));
}

// The plug-in looks this call up and never calls it, so the meaning of its values is unknown.
TELIX_RETCODE_ENUM_T TELIX_JS_AV_PlaySound(uint32_t value1, uint32_t value2, uint32_t value3, uint32_t value4,
                                           uint32_t value5, uint32_t value6, uint32_t value7) {
    (void)value1;
    (void)value2;
    (void)value3;
    (void)value4;
    (void)value5;
    (void)value6;
    (void)value7;
    return TELIX_RETCODE_NOT_AVAILABLE;
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_Stop(TELIX_JS_AV_HANDLE player) {
    return resultOf(players().stop(player));
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_Pause(TELIX_JS_AV_HANDLE player) {
    return resultOf(players().pause(player));
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_Resume(TELIX_JS_AV_HANDLE player) {
    return resultOf(players().resume(player));
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_SetVolume(TELIX_JS_AV_HANDLE player, uint32_t volume) {
    return resultOf(players().setVolume(player, volume));
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_SetFullScreen(TELIX_JS_AV_HANDLE player, ___UINT8 fullScreen) {
    return resultOf(
        players().changeView(player, [=](Picture::View& view) { view.fullScreen = fullScreen != 0; }));
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_SetPlaySpeed(TELIX_JS_AV_HANDLE player, ___UINT8 positive,
                                              int16_t integerPart, uint16_t tenths) {
    if (integerPart < 0 || tenths > 9) {
        return kRefused;
    }
    const double speed = (integerPart * 10 + tenths) / 10.0;
    return resultOf(players().setSpeed(player, positive != 0 ? speed : -speed));
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_SetDisplayArea(TELIX_JS_AV_HANDLE player,
                                                const TELIX_JS_DISPLAY_AREA* area) {
    return resultOf(players().changeView(player, [=](Picture::View& view) {
        view.x = area->x;
        view.y = area->y;
        view.width = area->width;
        view.height = area->height;
    }));
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_GetPlayInfo(TELIX_JS_AV_HANDLE player, TELIX_JS_AV_PLAY_INFO** info) {
    TELIX_JS_AV_PLAY_INFO* record = players().playInfo(player);
    if (record) {
        *info = record;
    }
    return resultOf(record != nullptr);
}

TELIX_RETCODE_ENUM_T TELIX_JS_AV_Seek(TELIX_JS_AV_HANDLE player, uint32_t milliseconds) {
    return resultOf(players().seek(player, milliseconds));
}

TELIX_DEFINE_COMPONENT_CALLS(TELIX_JS_AV, TELIX_JS_AV_HANDLE, PlayerRegistry)
