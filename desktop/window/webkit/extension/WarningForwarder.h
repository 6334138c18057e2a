// What the bridge reports of pages, on its way to the window.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_WARNINGFORWARDER_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_WARNINGFORWARDER_H

#include <webkit2/webkit-web-extension.h>

namespace desktop {

// Sends the window a kWarningMessage for each report from now on. Main thread of the web process, once.
void forwardWarnings(WebKitWebExtension* extension);

} // namespace desktop

#endif
