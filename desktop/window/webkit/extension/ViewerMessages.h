// The messages between the window's remote control and the platform library.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_VIEWERMESSAGES_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_VIEWERMESSAGES_H

#include <webkit2/webkit-web-extension.h>

namespace desktop {

// Answers the messages of Messages.h from now on, and reports the channel. Main thread of the web process,
// once.
void answerViewerMessages(WebKitWebExtension* extension);

// The mask of the key groups that pages receive.
uint32_t keySetOfPages();

} // namespace desktop

#endif
