// The options of telix-tv.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_COMMANDLINE_H
#define TELIX_DESKTOP_WINDOW_SHARED_COMMANDLINE_H

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "desktop/window/shared/LoadCheck.h"
#include "desktop/window/shared/RemoteControl.h"

namespace desktop {

// What the options depend on.
struct EngineInformation {
    // The engine and its toolkit with their versions, for --version.
    std::string versions;
    // Returns the engine's own user agent string; empty without a display, which some engines need for it.
    std::function<std::string()> userAgent;
    // Whether it has --automation and --profile.
    bool hasSessions = false;
};

struct CommandLine {
    // The URL of the page, also if a file name is given; empty for live television, and with `automation`.
    std::string page;
    // Whether `page` is the URL of an XML AIT.
    bool isXmlAit = false;
    // The URL of a page to signal, and the channel that signals it and is on at first; empty and 0 if the
    // options are not given.
    std::string signalUrl;
    uint32_t channel = 0;
    // Whether the plug-in works as on sets in the field.
    bool isStrict = false;
    // Whether a WebDriver session opens the pages.
    bool automation = false;
    // The folder of the profile; empty for a temporary one.
    std::string profile;
    int width = 0;
    int height = 0;
    bool fullscreen = false;
    bool inspect = false;
    // HOST:PORT; empty if the option is not given.
    std::string inspectorServer;
    // File name of the plug-in.
    std::string plugin;
    std::vector<const RemoteKey*> keys;
    std::string userAgent;
    bool ignoresCertificateErrors = false;
    bool waitForPicture = false;
    std::optional<std::string> waitFor;
    std::optional<std::string> eval;
    std::optional<std::string> screenshot;
    // The file of the recording.
    std::optional<std::string> record;
    double timeoutSeconds = 0;

    // Whether the program exits when all steps are done.
    bool quitsWhenDone() const { return waitForPicture || waitFor || eval || screenshot; }
    // Whether there are steps at all.
    bool hasSteps() const { return quitsWhenDone() || !keys.empty(); }

    RequestOptions requestOptions() const { return {userAgent, ignoresCertificateErrors}; }
};

// Parses the arguments (the program's name first) into `commandLine`. Returns the exit status if the program
// shall exit: after --help or --version, which are handled here, and after a usage error, which is printed.
std::optional<int> readCommandLine(const std::vector<std::string>& arguments, const EngineInformation& engine,
                                   CommandLine& commandLine);

// Lets the plug-in escape what it puts into the scripts of pages, unless the command line is strict or the
// user has decided: it reads the environment.
void escapeEvents(const CommandLine& commandLine);

// What must be known before an engine is there. Empty strings if the options are not given, or if the
// arguments cannot be parsed, which readCommandLine() reports.
struct EarlyOptions {
    std::string engine;
    std::string inspectorServer;
    std::string profile;
};
EarlyOptions earlyOptions(const std::vector<std::string>& arguments);

} // namespace desktop

#endif
