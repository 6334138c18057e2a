// The options of telix-tv.
#ifndef TELIX_DESKTOP_BROWSER_COMMANDLINE_H
#define TELIX_DESKTOP_BROWSER_COMMANDLINE_H

#include "desktop/browser/RemoteControl.h"

#include <QSize>
#include <QString>
#include <QStringList>
#include <QUrl>
#include <QVector>

#include <optional>

struct CommandLine {
    QUrl page;
    // Of the window.
    QSize size;
    bool fullscreen = false;
    bool inspect = false;
    // File name of the plug-in.
    QString plugin;
    QVector<const RemoteKey*> keys;
    QString userAgent;
    bool waitForPicture = false;
    // Null texts: not asked for.
    QString waitFor;
    QString eval;
    QString screenshot;
    double timeoutSeconds = 0;

    // Whether the program ends by itself once everything that was asked for is done.
    bool quitsWhenDone() const {
        return waitForPicture || !waitFor.isNull() || !eval.isNull() || !screenshot.isNull();
    }
};

// Reads the arguments (the program's name first) into `commandLine`. Gives the exit status when there is
// nothing to run: after --help or --version, which are answered here, and after a mistake, which has then
// been printed. Needs a QCoreApplication.
std::optional<int> readCommandLine(const QStringList& arguments, CommandLine& commandLine);

#endif
