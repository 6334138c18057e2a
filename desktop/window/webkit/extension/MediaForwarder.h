// The requests of media players, which are in the web process, on their way to the window.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_MEDIAFORWARDER_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_MEDIAFORWARDER_H

#include <webkit2/webkit-web-extension.h>

namespace desktop {

// Asks the window's MediaIdentity from now on. Main thread of the web process, once.
void forwardMediaRequests(WebKitWebExtension* extension);

} // namespace desktop

#endif
