// The keys of the remote control: their names, their key codes in pages, and the keyboard keys mapped to
// them.
#ifndef TELIX_DESKTOP_BROWSER_REMOTECONTROL_H
#define TELIX_DESKTOP_BROWSER_REMOTECONTROL_H

#include <QString>
#include <QVector>

namespace desktop {

struct RemoteKey {
    // For --keys.
    const char* name;
    // `keyCode` of key events.
    int keyCode;
    // The constant of the window object that has the code.
    const char* constant;
    // Whether the engine itself produces this code for the first of `keyboardKeys`. Then the engine gets the
    // key event, and also performs the default action (moves the caret, follows a link). Otherwise the view
    // dispatches DOM events with the code.
    bool hasEngineCode;
    // Qt::Key values mapped to the key.
    QVector<int> keyboardKeys;
};

// All keys.
const QVector<RemoteKey>& remoteKeys();

// The key with that name, or null.
const RemoteKey* remoteKeyByName(const QString& name);

// The key that a Qt::Key value is mapped to, or null.
const RemoteKey* remoteKeyByKeyboardKey(int keyboardKey);

} // namespace desktop

#endif
