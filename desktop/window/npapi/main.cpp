// The window of the desktop television on QtWebKit.
#include <glib-unix.h>

#include <QAbstractEventDispatcher>
#include <QApplication>
#include <QScreen>
#include <QWebSettings>
#include <QtWebKit/qtwebkitversion.h>
#include <QtWebKit/qwebkitglobal.h>

#include <clocale>
#include <csignal>
#include <cstdio>

#include "desktop/window/control/ControlSource.h"
#include "desktop/window/control/WindowCommands.h"
#include "desktop/window/npapi/PluginFolder.h"
#include "desktop/window/npapi/StyleSheet.h"
#include "desktop/window/npapi/TvWindow.h"
#include "desktop/window/record/Recording.h"
#include "desktop/window/record/SoundSource.h"
#include "desktop/window/shared/Automation.h"
#include "desktop/window/shared/CommandLine.h"
#include "desktop/window/shared/Diagnostics.h"
#include "desktop/window/shared/FirstPage.h"
#include "desktop/window/shared/PluginFile.h"

namespace desktop {

namespace {

EngineInformation engineInformation() {
    return {std::string("QtWebKit " QTWEBKIT_VERSION_STR ", Qt ") + qVersion(), [] {
                return QStringLiteral("Mozilla/5.0 (X11; Linux) AppleWebKit/%1 (KHTML, like Gecko) Safari/%1")
                    .arg(qWebKitVersion())
                    .toStdString();
            }};
}

// The engine paints an object into a pixmap of its size, and the program ends if the X server has none.
constexpr char kSizeLimit[] =
    "object, embed { max-width: 4096px !important; max-height: 4096px !important; }";

void configureEngine(const PluginFile& plugin, const PluginFolder& folder, bool inspect) {
    QWebSettings* settings = QWebSettings::globalSettings();
    QWebSettings::setPluginSearchPaths({folder.path()});
    settings->setAttribute(QWebSettings::PluginsEnabled, true);
    settings->setAttribute(QWebSettings::DeveloperExtrasEnabled, inspect);
    settings->setUserStyleSheetUrl(styleSheetUrl(
        QString::fromStdString(plugin.styleSheet("opacity: 0 !important;")) + QLatin1String(kSizeLimit)));
}

// Exits the event loop, so that destructors remove temporary files.
gboolean onTermination(gpointer signalNumber) {
    QCoreApplication::exit(kExitSignalled + GPOINTER_TO_INT(signalNumber));
    return G_SOURCE_CONTINUE;
}

// Runs the window until it exits, and destroys it with all pages. `page`: to open; empty for the channel
// alone. `evaluated` receives the value of --eval.
int runWindow(const CommandLine& commandLine, const std::string& page, PluginFolder& folder,
              std::optional<std::string>& evaluated) {
    TvWindow window(commandLine);
    folder.reportTo([&window](const std::string& url, Warning warning, const std::string& subject) {
        window.warn(url, warning, subject);
    });
    WindowCommands commands(window);
    const ControlSource control([&](const std::string& line, const ControlSource::Respond& respond) {
        commands.handle(line, respond);
    });
    Recording recording(window, commandLine);
    if (recording.hasFailed()) {
        return kExitBadInput;
    }
    std::unique_ptr<SoundSource> sound;
    if (recording.isActive()) {
        sound = std::make_unique<SoundSource>(
            [&](const telix_desktop_sound& piece) { recording.addSound(piece); });
    }
    Automation automation(window, commandLine, QCoreApplication::exit);
    QObject::connect(&window, &TvWindow::loadFailed, [&](const QUrl& url, const QString& reason) {
        automation.onLoadFailed(url.toDisplayString().toStdString(), reason.toStdString());
    });
    QObject::connect(qGuiApp, &QGuiApplication::lastWindowClosed, [&] { automation.onWindowClosed(); });
    if (commandLine.fullscreen) {
        // Without a window manager nothing else sets the size.
        window.setGeometry(QGuiApplication::primaryScreen()->geometry());
        window.showFullScreen();
    } else {
        window.resize(commandLine.width, commandLine.height);
        window.show();
    }
    if (!page.empty()) {
        window.openApplication(QUrl(QString::fromStdString(page)));
    }
    if (commandLine.inspect) {
        window.inspect();
    }
    const int exitStatus = QCoreApplication::exec();
    evaluated = automation.evaluated();
    return recording.finish(exitStatus);
}

// Whether the event loop can be used; prints the error if not.
bool isEventLoopUsable() {
    if (!QAbstractEventDispatcher::instance()->inherits("QEventDispatcherGlib")) {
        printError(
            "Qt does not use the GLib main loop, which delivers the events of the plug-in; is QT_NO_GLIB "
            "set?");
        return false;
    }
    return true;
}

int runBrowser(const CommandLine& commandLine, char** argv) {
    escapeEvents(commandLine);
    if (qEnvironmentVariableIsEmpty("DISPLAY")) {
        printError("no display: DISPLAY is not set");
        return kExitBadInput;
    }
    const PluginFile plugin(commandLine.plugin);
    if (!plugin.failure().empty()) {
        printError("cannot load plug-in " + commandLine.plugin + ": " + plugin.failure());
        return kExitBadInput;
    }
    PluginFolder folder(plugin, commandLine.isStrict);
    if (!folder.failure().isEmpty()) {
        printError(folder.failure().toStdString());
        return kExitBadInput;
    }
    // The engine supports plug-ins on X11 only.
    if (!qEnvironmentVariableIsSet("QT_QPA_PLATFORM")) {
        qputenv("QT_QPA_PLATFORM", "xcb");
    }
    // The window draws without OpenGL, whose libraries would be loaded nevertheless, and take long.
    if (!qEnvironmentVariableIsSet("QT_XCB_GL_INTEGRATION")) {
        qputenv("QT_XCB_GL_INTEGRATION", "none");
    }
    int qtArgumentCount = 1; // Qt must not interpret the options of telix-tv
    QApplication application(qtArgumentCount, argv);
    QApplication::setQuitOnLastWindowClosed(false); // Automation exits with its own status
    if (!isEventLoopUsable()) {
        return kExitBadInput;
    }
    const std::optional<std::string> page = pageOf(commandLine);
    if (!page) {
        return kExitBadInput;
    }
    for (const int signalNumber : {SIGINT, SIGTERM, SIGHUP}) {
        g_unix_signal_add(signalNumber, onTermination, GINT_TO_POINTER(signalNumber));
    }
    configureEngine(plugin, folder, commandLine.inspect);

    std::optional<std::string> evaluated;
    const int exitStatus = runWindow(commandLine, *page, folder, evaluated);
    folder.reportTo(nullptr);
    // Runs callbacks that the plug-in has deferred to the event loop.
    QCoreApplication::processEvents();
    // The last line of the output, after what the plug-in logs in its teardown.
    if (evaluated) {
        std::puts(evaluated->c_str());
    }
    return exitStatus;
}

} // namespace

} // namespace desktop

int main(int argc, char* argv[]) {
    std::setlocale(LC_ALL, "");
    // The settings of the desktop are not the television's, and their service leaves a folder.
    g_setenv("GSETTINGS_BACKEND", "memory", TRUE);
    desktop::CommandLine commandLine;
    // --help and usage errors need no display.
    if (const auto exitStatus =
            desktop::readCommandLine({argv, argv + argc}, desktop::engineInformation(), commandLine)) {
        return *exitStatus;
    }
    return desktop::runBrowser(commandLine, argv);
}
