// The keys of the remote control: their names, their key codes in pages, the keyboard keys mapped to them,
// and the group of the key set that they belong to.
#include "desktop/window/shared/RemoteControl.h"

#include <X11/XF86keysym.h>
#include <X11/keysym.h>

#include <algorithm>

namespace desktop {

namespace {

// XF86XK_Info, XF86XK_ChannelUp and XF86XK_ChannelDown of newer headers.
constexpr uint32_t kInfoKeysym = 0x10081166;
constexpr uint32_t kChannelUpKeysym = 0x10081192;
constexpr uint32_t kChannelDownKeysym = 0x10081193;

} // namespace

const std::vector<RemoteKey>& remoteKeys() {
    constexpr auto kNavigation = KeyGroupNavigation;
    // Many keyboards have no media keys, so F5 to F10 are mapped as well. The digits of the keypad have
    // keysyms of their own.
    static const std::vector<RemoteKey> kKeys = {
        {"left", 37, "VK_LEFT", "ArrowLeft", "ArrowLeft", true, kNavigation, {XK_Left, XK_KP_Left}},
        {"up", 38, "VK_UP", "ArrowUp", "ArrowUp", true, kNavigation, {XK_Up, XK_KP_Up}},
        {"right", 39, "VK_RIGHT", "ArrowRight", "ArrowRight", true, kNavigation, {XK_Right, XK_KP_Right}},
        {"down", 40, "VK_DOWN", "ArrowDown", "ArrowDown", true, kNavigation, {XK_Down, XK_KP_Down}},
        {"ok", 13, "VK_ENTER", "Enter", "Enter", true, kNavigation, {XK_Return, XK_KP_Enter}},
        {"back",
         461,
         "VK_BACK",
         "GoBack",
         "BrowserBack",
         false,
         kNavigation,
         {XK_BackSpace, XK_Escape, XF86XK_Back}},
        {"red", 403, "VK_RED", "ColorF0Red", "", false, KeyGroupRed, {XK_F1, XF86XK_Red}},
        {"green", 404, "VK_GREEN", "ColorF1Green", "", false, KeyGroupGreen, {XK_F2, XF86XK_Green}},
        {"yellow", 405, "VK_YELLOW", "ColorF2Yellow", "", false, KeyGroupYellow, {XK_F3, XF86XK_Yellow}},
        {"blue", 406, "VK_BLUE", "ColorF3Blue", "", false, KeyGroupBlue, {XK_F4, XF86XK_Blue}},
        {"play", 415, "VK_PLAY", "MediaPlay", "", false, KeyGroupVcr, {XK_F5, XF86XK_AudioPlay}},
        {"pause", 19, "VK_PAUSE", "MediaPause", "", false, KeyGroupVcr, {XK_F6, XF86XK_AudioPause, XK_Pause}},
        {"stop", 413, "VK_STOP", "MediaStop", "MediaStop", false, KeyGroupVcr, {XK_F7, XF86XK_AudioStop}},
        {"rewind", 412, "VK_REWIND", "MediaRewind", "", false, KeyGroupVcr, {XK_F8, XF86XK_AudioRewind}},
        {"fast-forward",
         417,
         "VK_FAST_FWD",
         "MediaFastForward",
         "",
         false,
         KeyGroupVcr,
         {XK_F9, XF86XK_AudioForward}},
        {"info", 457, "VK_INFO", "Info", "", false, KeyGroupInfo, {XK_F10, kInfoKeysym}},
        {"0", 48, "VK_0", "0", "Digit0", true, KeyGroupNumeric, {XK_0, XK_KP_0}},
        {"1", 49, "VK_1", "1", "Digit1", true, KeyGroupNumeric, {XK_1, XK_KP_1}},
        {"2", 50, "VK_2", "2", "Digit2", true, KeyGroupNumeric, {XK_2, XK_KP_2}},
        {"3", 51, "VK_3", "3", "Digit3", true, KeyGroupNumeric, {XK_3, XK_KP_3}},
        {"4", 52, "VK_4", "4", "Digit4", true, KeyGroupNumeric, {XK_4, XK_KP_4}},
        {"5", 53, "VK_5", "5", "Digit5", true, KeyGroupNumeric, {XK_5, XK_KP_5}},
        {"6", 54, "VK_6", "6", "Digit6", true, KeyGroupNumeric, {XK_6, XK_KP_6}},
        {"7", 55, "VK_7", "7", "Digit7", true, KeyGroupNumeric, {XK_7, XK_KP_7}},
        {"8", 56, "VK_8", "8", "Digit8", true, KeyGroupNumeric, {XK_8, XK_KP_8}},
        {"9", 57, "VK_9", "9", "Digit9", true, KeyGroupNumeric, {XK_9, XK_KP_9}},
        {"channel-up",
         427,
         "VK_CHANNEL_UP",
         "ChannelUp",
         "",
         false,
         KeyGroupTelevision,
         {XK_Page_Up, XK_KP_Page_Up, XK_F11, kChannelUpKeysym}},
        {"channel-down",
         428,
         "VK_CHANNEL_DOWN",
         "ChannelDown",
         "",
         false,
         KeyGroupTelevision,
         {XK_Page_Down, XK_KP_Page_Down, XK_F12, kChannelDownKeysym}},
        {"volume-up",
         447,
         "VK_VOLUME_UP",
         "AudioVolumeUp",
         "AudioVolumeUp",
         false,
         KeyGroupTelevision,
         {XK_plus, XK_KP_Add, XF86XK_AudioRaiseVolume}},
        {"volume-down",
         448,
         "VK_VOLUME_DOWN",
         "AudioVolumeDown",
         "AudioVolumeDown",
         false,
         KeyGroupTelevision,
         {XK_minus, XK_KP_Subtract, XF86XK_AudioLowerVolume}},
        {"mute",
         449,
         "VK_MUTE",
         "AudioVolumeMute",
         "AudioVolumeMute",
         false,
         KeyGroupTelevision,
         {XK_KP_Multiply, XF86XK_AudioMute}},
        {"text", 459, "VK_TELETEXT", "Teletext", "", false, KeyGroupTelevision, {XK_Home, XK_KP_Home}},
        {"exit", 10009, nullptr, "Exit", "", false, KeyGroupTelevision, {XK_End, XF86XK_Close}},
    };
    return kKeys;
}

const RemoteKey* remoteKeyByName(const std::string& name) {
    const auto& keys = remoteKeys();
    const auto found =
        std::find_if(keys.begin(), keys.end(), [&](const RemoteKey& key) { return name == key.name; });
    return found == keys.end() ? nullptr : &*found;
}

const RemoteKey* remoteKeyByKeyboardKey(uint32_t keysym) {
    const auto& keys = remoteKeys();
    const auto found = std::find_if(keys.begin(), keys.end(), [keysym](const RemoteKey& key) {
        return std::find(key.keyboardKeys.begin(), key.keyboardKeys.end(), keysym) != key.keyboardKeys.end();
    });
    return found == keys.end() ? nullptr : &*found;
}

int keyCodeOfKeyboardKey(uint32_t keysym) {
    // The first and the last keysym of a row, and the code of the first.
    static const struct {
        uint32_t first;
        uint32_t last;
        int keyCode;
    } kRows[] = {
        {XK_BackSpace, XK_BackSpace, 8}, {XK_Return, XK_Return, 13},   {XK_KP_Enter, XK_KP_Enter, 13},
        {XK_Pause, XK_Pause, 19},        {XK_Escape, XK_Escape, 27},   {XK_End, XK_End, 35},
        {XK_Left, XK_Down, 37},          {XK_KP_Left, XK_KP_Down, 37}, {XK_0, XK_9, 48},
        {XK_KP_0, XK_KP_9, 96},          {XK_F1, XK_F12, 112}};
    for (const auto& row : kRows) {
        if (keysym >= row.first && keysym <= row.last) {
            return row.keyCode + static_cast<int>(keysym - row.first);
        }
    }
    return 0;
}

std::string textOf(const RemoteKey& key) {
    const bool hasText = key.keyCode == '\r' || (key.keyCode >= '0' && key.keyCode <= '9');
    return hasText ? std::string(1, static_cast<char>(key.keyCode)) : std::string();
}

} // namespace desktop
