// The requests of the control socket, which is in the web process, on their way to the window.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_CONTROLFORWARDER_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_CONTROLFORWARDER_H

#include <webkit2/webkit-web-extension.h>

namespace desktop {

// Forwards them from now on. Main thread of the web process, once.
void forwardControlRequests(WebKitWebExtension* extension);

} // namespace desktop

#endif
