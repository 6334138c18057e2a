// Sends the window the video frames of the platform library that the plug-in loads.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_FRAMESENDER_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_FRAMESENDER_H

#include <webkit2/webkit-web-extension.h>

namespace desktop {

// Sends them from when the library is loaded to the end of the process, in a ring that the web context
// receives as a message kFramesMessage, or has the page paint them, see VideoPlacement. Main thread of the
// web process, once.
void sendFrames(WebKitWebExtension* extension);

} // namespace desktop

#endif
