// The messages of telix-tv on standard error, and its exit statuses.
#ifndef TELIX_DESKTOP_BROWSER_DIAGNOSTICS_H
#define TELIX_DESKTOP_BROWSER_DIAGNOSTICS_H

#include <QString>

namespace desktop {

constexpr int kExitSuccess = 0;
// A condition of the command line was not met in time, or --eval threw.
constexpr int kExitNotMet = 1;
// The command line, the page or the plug-in cannot be used.
constexpr int kExitBadInput = 2;

// Writes `message` to standard error as one line that begins with the program's name.
void printError(const QString& message);

// Writes a console message of a page to standard error as `source:line: text`. `source` is the URL of the
// script; a file URL is printed as a path.
void printConsoleMessage(const QString& source, int line, const QString& text);

} // namespace desktop

#endif
