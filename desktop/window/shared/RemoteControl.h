// The keys of the remote control: their names, their key codes in pages, the keyboard keys mapped to them,
// and the group of the key set that they belong to.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_REMOTECONTROL_H
#define TELIX_DESKTOP_WINDOW_SHARED_REMOTECONTROL_H

#include <cstdint>
#include <string>
#include <vector>

namespace desktop {

// The groups of keys that a page asks for, as bits of the key set's mask.
enum KeyGroup : uint32_t {
    KeyGroupRed = 0x1,
    KeyGroupGreen = 0x2,
    KeyGroupYellow = 0x4,
    KeyGroupBlue = 0x8,
    KeyGroupNavigation = 0x10,
    KeyGroupVcr = 0x20,
    KeyGroupInfo = 0x80,
    KeyGroupNumeric = 0x100,
    // No page can ask for these: they are always the television's.
    KeyGroupTelevision = 0x80000000
};

// What pages receive if the platform library has no key set.
constexpr uint32_t kAllPageKeys = ~static_cast<uint32_t>(KeyGroupTelevision);

struct RemoteKey {
    // For --keys.
    const char* name;
    // `keyCode` of key events.
    int keyCode;
    // The constant of the window object that has the code; null if there is none.
    const char* constant;
    // `key` and `code` of key events. UI Events has no codes for most keys of a remote control: those are
    // empty.
    const char* domKey;
    const char* domCode;
    // Whether an engine itself produces this code for the first of `keyboardKeys`. Then the engine gets the
    // key event, and also performs the default action (moves the caret, follows a link). Otherwise the window
    // dispatches DOM events with the code.
    bool hasEngineCode;
    // A page gets the key only if it has asked for this group.
    KeyGroup group;
    // The keyboard keys mapped to the key, as X keysyms, which GDK's key values are as well.
    std::vector<uint32_t> keyboardKeys;
};

// All keys.
const std::vector<RemoteKey>& remoteKeys();

// The key with that name, or null.
const RemoteKey* remoteKeyByName(const std::string& name);

// The key that a keysym is mapped to, or null.
const RemoteKey* remoteKeyByKeyboardKey(uint32_t keysym);

// The `keyCode` that engines give the events of a keyboard key; 0 for keys without one.
int keyCodeOfKeyboardKey(uint32_t keysym);

// The text that a keyboard would enter with the key; empty for most keys.
std::string textOf(const RemoteKey& key);

} // namespace desktop

#endif
