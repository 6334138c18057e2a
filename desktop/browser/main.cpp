// telix-tv: a window with a browser engine that hosts the plug-in, as a television on the desk.
#include "desktop/browser/CommandLine.h"
#include "desktop/browser/Diagnostics.h"
#include "desktop/browser/LoadCheck.h"
#include "desktop/browser/PluginFolder.h"
#include "desktop/browser/ScriptedRun.h"
#include "desktop/browser/StyleSheet.h"
#include "desktop/browser/TvWindow.h"

#include <QAbstractEventDispatcher>
#include <QApplication>
#include <QScreen>
#include <QWebSettings>

#include <csignal>
#include <cstdio>

#include <glib-unix.h>

namespace {

// The engine paints a plug-in without a window of its own on an opaque pixmap, which would hide the picture
// beneath.
QUrl styleSheetThatHides(const QStringList& mimeTypes) {
    QString style;
    for (const auto& type : mimeTypes) {
        style += QStringLiteral("object[type=\"%1\" i], embed[type=\"%1\" i] { opacity: 0 !important; }\n")
                     .arg(type);
    }
    return styleSheetUrl(style);
}

void configureEngine(const PluginFolder& folder, bool inspect) {
    QWebSettings* settings = QWebSettings::globalSettings();
    QWebSettings::setPluginSearchPaths({folder.path()});
    settings->setAttribute(QWebSettings::PluginsEnabled, true);
    settings->setAttribute(QWebSettings::DeveloperExtrasEnabled, inspect);
    settings->setUserStyleSheetUrl(styleSheetThatHides(folder.mimeTypes()));
}

// Ends the event loop, so that what was made for the run is removed.
gboolean onTermination(gpointer signalNumber) {
    const int shellsOffset = 128;
    QCoreApplication::exit(shellsOffset + GPOINTER_TO_INT(signalNumber));
    return G_SOURCE_CONTINUE;
}

// Runs the window until it is done. Afterwards every page and every object in it is gone.
int runWindow(const CommandLine& commandLine, QString& evaluated) {
    TvWindow window(commandLine.userAgent);
    ScriptedRun run(window, commandLine);
    if (commandLine.fullscreen) {
        // Without a window manager nobody else sets the size.
        window.setGeometry(QGuiApplication::primaryScreen()->geometry());
        window.showFullScreen();
    } else {
        window.resize(commandLine.size);
        window.show();
    }
    window.openApplication(commandLine.page);
    if (commandLine.inspect)
        window.inspect();
    const int exitStatus = QCoreApplication::exec();
    evaluated = run.evaluated();
    return exitStatus;
}

} // namespace

int main(int argc, char* argv[]) {
    CommandLine commandLine;
    {
        // --help and mistakes are answered without a display.
        QCoreApplication application(argc, argv);
        if (const auto exitStatus = readCommandLine(QCoreApplication::arguments(), commandLine))
            return *exitStatus;
    }
    if (qEnvironmentVariableIsEmpty("DISPLAY")) {
        printError(QStringLiteral("there is no display, DISPLAY is not set"));
        return exitUnusable;
    }
    const PluginFolder folder(commandLine.plugin);
    if (!folder.failure().isEmpty()) {
        printError(QStringLiteral("can't load the plug-in %1: %2").arg(commandLine.plugin, folder.failure()));
        return exitUnusable;
    }

    // Plug-ins live in X windows only.
    if (!qEnvironmentVariableIsSet("QT_QPA_PLATFORM"))
        qputenv("QT_QPA_PLATFORM", "xcb");
    // The command line is ours alone.
    int qtArgumentCount = 1;
    QApplication application(qtArgumentCount, argv);
    QApplication::setQuitOnLastWindowClosed(false); // the run does, with its own exit status
    if (!QAbstractEventDispatcher::instance()->inherits("QEventDispatcherGlib")) {
        printError(
            QStringLiteral("Qt does not run on GLib's main loop, so the plug-in's events would never arrive; "
                           "is QT_NO_GLIB set?"));
        return exitUnusable;
    }
    const QString obstacle = loadObstacle(commandLine.page, commandLine.userAgent);
    if (!obstacle.isEmpty()) {
        printError(QStringLiteral("can't load %1: %2").arg(commandLine.page.toDisplayString(), obstacle));
        return exitUnusable;
    }
    for (const int signalNumber : {SIGINT, SIGTERM, SIGHUP})
        g_unix_signal_add(signalNumber, onTermination, GINT_TO_POINTER(signalNumber));
    configureEngine(folder, commandLine.inspect);

    QString evaluated;
    const int exitStatus = runWindow(commandLine, evaluated);
    // Steps that the plug-in has left for a later turn of the loop.
    QCoreApplication::processEvents();
    // Last of all, behind what the plug-in prints when it is shut down.
    if (!evaluated.isNull())
        std::puts(evaluated.toUtf8().constData());
    return exitStatus;
}
