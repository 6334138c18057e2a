// The server of the engine's remote inspector.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_INSPECTORSERVER_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_INSPECTORSERVER_H

#include <string>

namespace desktop {

// Lets the engine serve its inspector at `hostAndPort`, HOST:PORT. Returns the reason why it cannot; empty if
// it can. Must be called before any function of the engine is called. Blocks while the name is resolved.
std::string serveInspector(const std::string& hostAndPort);

} // namespace desktop

#endif
