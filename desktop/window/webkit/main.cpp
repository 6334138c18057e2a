// The window of the desktop television on WebKitGTK.
#include <glib-unix.h>
#include <gtk/gtk.h>

#include <clocale>
#include <csignal>
#include <cstdio>

#include "desktop/window/record/Recording.h"
#include "desktop/window/shared/Automation.h"
#include "desktop/window/shared/CommandLine.h"
#include "desktop/window/shared/Diagnostics.h"
#include "desktop/window/shared/FirstPage.h"
#include "desktop/window/shared/PluginFile.h"
#include "desktop/window/webkit/AutomationSession.h"
#include "desktop/window/webkit/ChildProcesses.h"
#include "desktop/window/webkit/ControlReceiver.h"
#include "desktop/window/webkit/Engine.h"
#include "desktop/window/webkit/InspectorServer.h"
#include "desktop/window/webkit/MediaIdentity.h"
#include "desktop/window/webkit/PageChannel.h"
#include "desktop/window/webkit/Profile.h"
#include "desktop/window/webkit/SoundChannel.h"
#include "desktop/window/webkit/TvWindow.h"
#include "desktop/window/webkit/WebProcessOutput.h"

namespace desktop {

namespace {

constexpr unsigned kProfileTimeoutMs = 5000;

// The main loop and the exit status that ends it.
struct Run {
    GMainLoop* loop;
    TvWindow* window;
    Recording* recording;
    int exitStatus;

    // Ends the recording, the pages and then the loop. Later calls do nothing.
    void end(int status) {
        if (exitStatus >= 0) {
            return;
        }
        exitStatus = recording->finish(status);
        window->unload([this] { g_main_loop_quit(loop); });
    }
};

template <int SignalNumber>
gboolean onTermination(gpointer run) {
    static_cast<Run*>(run)->end(kExitSignalled + SignalNumber);
    return G_SOURCE_CONTINUE;
}

std::string crashReason(WebKitWebProcessTerminationReason reason, const std::string& failure) {
    switch (reason) {
    case WEBKIT_WEB_PROCESS_CRASHED:
        return "the web process has crashed" + (failure.empty() ? "" : ": " + failure);
    case WEBKIT_WEB_PROCESS_EXCEEDED_MEMORY_LIMIT:
        return "the web process has exceeded its memory limit";
    case WEBKIT_WEB_PROCESS_TERMINATED_BY_API:
        break;
    }
    return "the web process has been terminated";
}

// Runs the window until it exits, and destroys it with all pages. `page`: to open; empty for the channel
// alone. `evaluated` receives the value of --eval.
int runWindow(const CommandLine& commandLine, const std::string& page, const PluginFile& plugin,
              const Profile& profile, std::optional<std::string>& evaluated) {
    WebProcessOutput output;
    PageChannel channel;
    Engine engine(commandLine, plugin, profile, output, channel);
    TvWindow window(engine, channel, commandLine);
    const ControlReceiver control(engine.context(), window);
    const MediaIdentity mediaIdentity(engine.context(), commandLine.userAgent, [&] {
        const auto running = window.applications();
        return running.empty() ? "" : running.front().url;
    });
    Recording recording(window, commandLine);
    if (recording.hasFailed()) {
        return kExitBadInput;
    }
    std::unique_ptr<SoundChannel> sound;
    if (recording.isActive()) {
        sound = std::make_unique<SoundChannel>(
            [&](const telix_desktop_sound& piece) { recording.addSound(piece); });
        engine.setSoundDescriptor(sound->inherited());
    }
    g_autoptr(GMainLoop) loop = g_main_loop_new(nullptr, FALSE);
    Run run{loop, &window, &recording, -1};
    Automation automation(window, commandLine, [&](int status) { run.end(status); });
    const AutomationSession session(
        engine.context(), {[&] { return window.pushApplication().view(); }, [&] { run.end(kExitSuccess); }});
    window.setReports(
        {[&] { automation.onWindowClosed(); },
         [&](const std::string& url, const std::string& reason) { automation.onLoadFailed(url, reason); },
         [&](WebKitWebProcessTerminationReason reason) {
             output.drain();
             const std::string text = crashReason(reason, output.failure());
             if (!automation.onPageCrashed(text)) {
                 window.showNotice(text);
             }
         }});
    g_unix_signal_add(SIGINT, onTermination<SIGINT>, &run);
    g_unix_signal_add(SIGTERM, onTermination<SIGTERM>, &run);
    g_unix_signal_add(SIGHUP, onTermination<SIGHUP>, &run);
    if (commandLine.automation) {
        // The session opens the pages.
    } else if (page.empty()) {
        window.showChannel();
    } else {
        window.openApplication(page);
    }
    if (commandLine.inspect) {
        window.inspect();
    }
    g_main_loop_run(loop);
    evaluated = automation.evaluated();
    return run.exitStatus;
}

int runBrowser(const CommandLine& commandLine) {
    escapeEvents(commandLine);
    if (!gtk_init_check(nullptr, nullptr)) {
        printError("no display: cannot connect to DISPLAY or WAYLAND_DISPLAY");
        return kExitBadInput;
    }
    const PluginFile plugin(commandLine.plugin);
    if (!plugin.failure().empty()) {
        printError("cannot load plug-in " + commandLine.plugin + ": " + plugin.failure());
        return kExitBadInput;
    }
    const std::optional<std::string> page = pageOf(commandLine);
    if (!page) {
        return kExitBadInput;
    }
    const Profile profile(commandLine.profile);
    if (!profile.failure().empty()) {
        printError(profile.failure());
        return kExitBadInput;
    }
    std::optional<std::string> evaluated;
    const int exitStatus = runWindow(commandLine, *page, plugin, profile, evaluated);
    // What a profile keeps is written by the engine's processes when they end.
    endChildProcesses(commandLine.profile.empty() ? 0 : kProfileTimeoutMs);
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
    g_set_prgname("telix-tv");
    // Before the engine's first function, which reads the settings of the server.
    const desktop::EarlyOptions early = desktop::earlyOptions({argv, argv + argc});
    if (!early.profile.empty()) {
        desktop::useProfileOfLibrary(early.profile);
    }
    const std::string& server = early.inspectorServer;
    const std::string serverError = server.empty() ? "" : desktop::serveInspector(server);
    desktop::CommandLine commandLine;
    // --help and usage errors need no display.
    if (const auto exitStatus =
            desktop::readCommandLine({argv, argv + argc}, desktop::engineInformation(), commandLine)) {
        return *exitStatus;
    }
    if (!serverError.empty()) {
        desktop::printError("--inspector-server " + server + ": " + serverError);
        return desktop::kExitBadInput;
    }
    return desktop::runBrowser(commandLine);
}
