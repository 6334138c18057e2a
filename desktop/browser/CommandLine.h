// The options of telix-tv.
#ifndef TELIX_DESKTOP_BROWSER_COMMANDLINE_H
#define TELIX_DESKTOP_BROWSER_COMMANDLINE_H

#include <QSize>
#include <QString>
#include <QStringList>
#include <QUrl>
#include <QVector>

#include <optional>

#include "desktop/browser/RemoteControl.h"

namespace desktop {

struct CommandLine {
    QUrl page;
    QSize windowSize;
    bool fullscreen = false;
    bool inspect = false;
    // File name of the plug-in.
    QString plugin;
    QVector<const RemoteKey*> keys;
    QString userAgent;
    bool waitForPicture = false;
    // The following strings are null if the option is not given.
    QString waitFor;
    QString eval;
    QString screenshot;
    double timeoutSeconds = 0;

    // Whether the program exits when all steps are done.
    bool quitsWhenDone() const {
        return waitForPicture || !waitFor.isNull() || !eval.isNull() || !screenshot.isNull();
    }
};

// Parses the arguments (the program's name first) into `commandLine`. Returns the exit status if the program
// shall exit: after --help or --version, which are handled here, and after a usage error, which is printed.
// Needs a QCoreApplication.
std::optional<int> readCommandLine(const QStringList& arguments, CommandLine& commandLine);

} // namespace desktop

#endif
