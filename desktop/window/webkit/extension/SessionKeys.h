// The keys of a WebDriver session: to the page, as those of the remote control, or to the television.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_SESSIONKEYS_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_SESSIONKEYS_H

namespace desktop {

// Adds scripts/sessionkeys.js to every page from now on, before any script of the page. The engine dispatches
// the keys of a session to the page alone, so that the window's KeyRouter does not see them. Main thread of
// the web process, once, after addPageFunctions().
void addSessionKeys();

} // namespace desktop

#endif
