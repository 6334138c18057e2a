// The keys of the remote control: their names, their key codes in pages, and the keyboard keys mapped to
// them.
#include "desktop/browser/RemoteControl.h"

#include <algorithm>

namespace desktop {

const QVector<RemoteKey>& remoteKeys() {
    // Many keyboards have no media keys, so F5 to F10 are mapped as well.
    static const QVector<RemoteKey> kKeys = {
        {"left", 37, "VK_LEFT", true, {Qt::Key_Left}},
        {"up", 38, "VK_UP", true, {Qt::Key_Up}},
        {"right", 39, "VK_RIGHT", true, {Qt::Key_Right}},
        {"down", 40, "VK_DOWN", true, {Qt::Key_Down}},
        {"ok", 13, "VK_ENTER", true, {Qt::Key_Return, Qt::Key_Enter}},
        {"back", 461, "VK_BACK", false, {Qt::Key_Backspace, Qt::Key_Escape, Qt::Key_Back}},
        {"red", 403, "VK_RED", false, {Qt::Key_F1, Qt::Key_Red}},
        {"green", 404, "VK_GREEN", false, {Qt::Key_F2, Qt::Key_Green}},
        {"yellow", 405, "VK_YELLOW", false, {Qt::Key_F3, Qt::Key_Yellow}},
        {"blue", 406, "VK_BLUE", false, {Qt::Key_F4, Qt::Key_Blue}},
        {"play", 415, "VK_PLAY", false, {Qt::Key_F5, Qt::Key_MediaPlay, Qt::Key_Play}},
        {"pause", 19, "VK_PAUSE", false, {Qt::Key_F6, Qt::Key_MediaPause, Qt::Key_Pause}},
        {"stop", 413, "VK_STOP", false, {Qt::Key_F7, Qt::Key_MediaStop}},
        {"rewind", 412, "VK_REWIND", false, {Qt::Key_F8, Qt::Key_AudioRewind}},
        {"fast-forward", 417, "VK_FAST_FWD", false, {Qt::Key_F9, Qt::Key_AudioForward}},
        {"info", 457, "VK_INFO", false, {Qt::Key_F10, Qt::Key_Info}},
        {"0", 48, "VK_0", true, {Qt::Key_0}},
        {"1", 49, "VK_1", true, {Qt::Key_1}},
        {"2", 50, "VK_2", true, {Qt::Key_2}},
        {"3", 51, "VK_3", true, {Qt::Key_3}},
        {"4", 52, "VK_4", true, {Qt::Key_4}},
        {"5", 53, "VK_5", true, {Qt::Key_5}},
        {"6", 54, "VK_6", true, {Qt::Key_6}},
        {"7", 55, "VK_7", true, {Qt::Key_7}},
        {"8", 56, "VK_8", true, {Qt::Key_8}},
        {"9", 57, "VK_9", true, {Qt::Key_9}},
    };
    return kKeys;
}

const RemoteKey* remoteKeyByName(const QString& name) {
    const auto& keys = remoteKeys();
    const auto found = std::find_if(keys.begin(), keys.end(),
                                    [&](const RemoteKey& key) { return name == QLatin1String(key.name); });
    return found == keys.end() ? nullptr : &*found;
}

const RemoteKey* remoteKeyByKeyboardKey(int keyboardKey) {
    const auto& keys = remoteKeys();
    const auto found = std::find_if(keys.begin(), keys.end(), [&](const RemoteKey& key) {
        return key.keyboardKeys.contains(keyboardKey);
    });
    return found == keys.end() ? nullptr : &*found;
}

} // namespace desktop
