// What the window adds to the window object of every page: the functions that create, destroy, show and hide
// applications, the key codes of the remote control, and support for HbbTV documents.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_PAGEFUNCTIONS_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_PAGEFUNCTIONS_H

#include <webkit2/webkit-web-extension.h>

#include <string>

namespace desktop {

// Adds them from now on, before any script of a page. `channel`: the inherited descriptor of the window's
// PageChannel; without a valid one the functions return false. Main thread of the web process, once.
void addPageFunctions(int channel);

// Calls a function of the window for a page and waits for its result.
bool callWindow(uint64_t page, const char* function, const std::string& argument);

} // namespace desktop

#endif
