// The remote control: its keys by name, the codes that pages see, and the keys of a computer's keyboard that
// stand for them.
#ifndef TELIX_DESKTOP_BROWSER_REMOTECONTROL_H
#define TELIX_DESKTOP_BROWSER_REMOTECONTROL_H

#include <QString>
#include <QVector>

struct RemoteKey {
    // How the command line calls it.
    const char* name;
    // `keyCode` of the page's key events.
    int keyCode;
    // The page's constant for the code.
    const char* constant;
    // Whether the engine gives the page this very code when it is handed the first of `keyboardKeys`. Such a
    // key goes through the engine, which acts on it as well (moves the caret, follows a link); any other
    // becomes a DOM event of our own.
    bool knownToEngine;
    // Qt::Key values that stand for it.
    QVector<int> keyboardKeys;
};

// All keys of the remote control.
const QVector<RemoteKey>& remoteKeys();

// The key with that name, or null.
const RemoteKey* remoteKeyByName(const QString& name);

// The key that a Qt::Key value stands for, or null.
const RemoteKey* remoteKeyByKeyboardKey(int keyboardKey);

#endif
