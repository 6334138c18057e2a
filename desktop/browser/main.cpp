// telix-tv, the window of the desktop television: a browser engine with the plug-in.
#include <glib-unix.h>

#include <QAbstractEventDispatcher>
#include <QApplication>
#include <QScreen>
#include <QWebSettings>

#include <csignal>
#include <cstdio>

#include "desktop/browser/Automation.h"
#include "desktop/browser/CommandLine.h"
#include "desktop/browser/Diagnostics.h"
#include "desktop/browser/LoadCheck.h"
#include "desktop/browser/PluginFolder.h"
#include "desktop/browser/StyleSheet.h"
#include "desktop/browser/TvWindow.h"

namespace desktop {

namespace {

// The engine paints windowless plug-ins on an opaque pixmap, which would hide the video plane. The elements
// stay in the layout, because their position is the display area of the video.
QUrl pluginStyleSheet(const QStringList& mimeTypes) {
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
    settings->setUserStyleSheetUrl(pluginStyleSheet(folder.mimeTypes()));
}

// Exits the event loop, so that destructors remove temporary files.
gboolean onTermination(gpointer signalNumber) {
    constexpr int kShellSignalOffset = 128; // a shell's status for a process that a signal has terminated
    QCoreApplication::exit(kShellSignalOffset + GPOINTER_TO_INT(signalNumber));
    return G_SOURCE_CONTINUE;
}

// Runs the window until it exits, and destroys it with all pages. `evaluated` receives the value of --eval.
int runWindow(const CommandLine& commandLine, QString& evaluated) {
    TvWindow window(commandLine.userAgent);
    Automation automation(window, commandLine);
    if (commandLine.fullscreen) {
        // Without a window manager nothing else sets the size.
        window.setGeometry(QGuiApplication::primaryScreen()->geometry());
        window.showFullScreen();
    } else {
        window.resize(commandLine.windowSize);
        window.show();
    }
    window.openApplication(commandLine.page);
    if (commandLine.inspect) {
        window.inspect();
    }
    const int exitStatus = QCoreApplication::exec();
    evaluated = automation.evaluated();
    return exitStatus;
}

// Whether the event loop and the page can be used; prints the error if not.
bool isUsable(const CommandLine& commandLine) {
    if (!QAbstractEventDispatcher::instance()->inherits("QEventDispatcherGlib")) {
        printError(
            QStringLiteral("Qt does not use the GLib main loop, which delivers the events of the plug-in; "
                           "is QT_NO_GLIB set?"));
        return false;
    }
    const QString error = loadError(commandLine.page, commandLine.userAgent);
    if (!error.isEmpty()) {
        printError(QStringLiteral("cannot load %1: %2").arg(commandLine.page.toDisplayString(), error));
        return false;
    }
    return true;
}

int runBrowser(const CommandLine& commandLine, char** argv) {
    if (qEnvironmentVariableIsEmpty("DISPLAY")) {
        printError(QStringLiteral("no display: DISPLAY is not set"));
        return kExitBadInput;
    }
    const PluginFolder folder(commandLine.plugin);
    if (!folder.failure().isEmpty()) {
        printError(QStringLiteral("cannot load plug-in %1: %2").arg(commandLine.plugin, folder.failure()));
        return kExitBadInput;
    }
    // The engine supports plug-ins on X11 only.
    if (!qEnvironmentVariableIsSet("QT_QPA_PLATFORM")) {
        qputenv("QT_QPA_PLATFORM", "xcb");
    }
    int qtArgumentCount = 1; // Qt must not interpret the options of telix-tv
    QApplication application(qtArgumentCount, argv);
    QApplication::setQuitOnLastWindowClosed(false); // Automation exits with its own status
    if (!isUsable(commandLine)) {
        return kExitBadInput;
    }
    for (const int signalNumber : {SIGINT, SIGTERM, SIGHUP}) {
        g_unix_signal_add(signalNumber, onTermination, GINT_TO_POINTER(signalNumber));
    }
    configureEngine(folder, commandLine.inspect);

    QString evaluated;
    const int exitStatus = runWindow(commandLine, evaluated);
    // Runs callbacks that the plug-in has deferred to the event loop.
    QCoreApplication::processEvents();
    // The last line of the output, after what the plug-in logs in its teardown.
    if (!evaluated.isNull()) {
        std::puts(evaluated.toUtf8().constData());
    }
    return exitStatus;
}

} // namespace

} // namespace desktop

int main(int argc, char* argv[]) {
    desktop::CommandLine commandLine;
    {
        // --help and usage errors need no display.
        QCoreApplication application(argc, argv);
        if (const auto exitStatus = desktop::readCommandLine(QCoreApplication::arguments(), commandLine)) {
            return *exitStatus;
        }
    }
    return desktop::runBrowser(commandLine, argv);
}
