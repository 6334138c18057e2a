// The messages between the window's television and the platform library.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_VIEWERMESSAGES_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_VIEWERMESSAGES_H

#include <webkit2/webkit-web-extension.h>

#include <string>

#include "desktop/window/shared/TelevisionLibrary.h"

namespace desktop {

// Starts the television as soon as there is a library, which may be that of `plugin`, answers the messages of
// Messages.h, and reports the signalling. Main thread of the web process, once.
void serveTelevision(WebKitWebExtension* extension, const std::string& plugin, const TelevisionStart& start);

// The mask of the key groups that pages receive.
uint32_t keySetOfPages();

} // namespace desktop

#endif
