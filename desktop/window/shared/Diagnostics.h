// The messages of telix-tv on standard error, and its exit statuses.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_DIAGNOSTICS_H
#define TELIX_DESKTOP_WINDOW_SHARED_DIAGNOSTICS_H

#include <string>

namespace desktop {

constexpr int kExitSuccess = 0;
// A condition of the command line was not met in time, or --eval threw.
constexpr int kExitNotMet = 1;
// The command line, the page or the plug-in cannot be used.
constexpr int kExitBadInput = 2;
// The process of the page has ended by itself.
constexpr int kExitPageCrashed = 3;
// Plus the number of the signal: a shell's status for a process that a signal has terminated.
constexpr int kExitSignalled = 128;

// Writes `message` to standard error as one line that begins with the program's name.
void printError(const std::string& message);

// Writes a console message of a page to standard error as `source:line: text`, without the line if it is 0.
// `source` is the URL of the script; a file URL is printed as a path.
void printConsoleMessage(const std::string& source, int line, const std::string& text);

// Writes a warning of the television to standard error, in the form of a console message: `url: telix: text`.
// Without a URL it belongs to no page.
void printWarning(const std::string& url, const std::string& text);

// `text` with all white space, line ends included, reduced to single spaces, and none at the ends.
std::string simplified(const std::string& text);

} // namespace desktop

#endif
