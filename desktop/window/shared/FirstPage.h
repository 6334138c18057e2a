// What the command line lets the window show first.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_FIRSTPAGE_H
#define TELIX_DESKTOP_WINDOW_SHARED_FIRSTPAGE_H

#include <optional>
#include <string>

namespace desktop {

struct CommandLine;

// The URL of the page to open, also if the command line has that of an XML AIT; empty if it has none.
// Nothing, after a message, if it or the page to signal cannot be loaded. Blocks until the servers have
// responded.
std::optional<std::string> pageOf(const CommandLine& commandLine);

} // namespace desktop

#endif
