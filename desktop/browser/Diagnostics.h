// What telix-tv says on standard error and the exit statuses that go with it.
#ifndef TELIX_DESKTOP_BROWSER_DIAGNOSTICS_H
#define TELIX_DESKTOP_BROWSER_DIAGNOSTICS_H

#include <QString>

// Exit statuses. `notReached`: what the command line waited for never came. `unusable`: the command line, the
// page or the plug-in can't be used.
enum ExitStatus { exitSuccess = 0, exitNotReached = 1, exitUnusable = 2 };

// Writes `message` to standard error as one line that begins with the program's name.
void printError(const QString& message);

// Writes a message of a page's script to standard error as `file:line: text`. `source` is the script's
// address; for a local file its path is printed.
void printConsoleMessage(const QString& source, int line, const QString& text);

#endif
