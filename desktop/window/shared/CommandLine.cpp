// The options of telix-tv.
#include "desktop/window/shared/CommandLine.h"

#include <gio/gio.h>

#include <algorithm>
#include <cmath>
#include <cstdio>

#include "desktop/window/shared/Diagnostics.h"
#include "desktop/window/shared/Pattern.h"
#include "desktop/window/shared/ProgramFolder.h"

namespace desktop {

namespace {

const char kDescription[] =
    R"(A scripted run performs these steps in this order, each only if its option is given:
  1. load the page, or the application that the channel signals;
  2. press --keys, one after the other, each when the page that the previous one opened is loaded;
  3. evaluate --wait-for repeatedly until it is true;
  4. --wait-for-picture: wait until the video plane shows broadcast or media;
  5. evaluate --eval and print its value as the last line on standard output;
  6. write --screenshot, also after a timeout;
  7. exit, if --wait-for, --wait-for-picture, --eval or --screenshot is given.
Expressions and keys go to the topmost application, the visible one, when it is loaded. An expression that throws
counts as false. --timeout applies to all steps together.

With --automation, a WebDriver session opens and controls the applications. The window is closed when the session
closes its last application.

Exit status: 0 if all steps are done; 1 after a timeout or if --eval throws; 2 for a bad option, for a page or a
plug-in that cannot be loaded and for a profile that cannot be used; 3 if the process of the page ends by itself, with
the engine webkit.

Without a page the window shows the current channel and starts what it signals.

Keyboard: arrow keys, Enter (OK), Backspace or Escape (Back), F1 to F4 (red, green, yellow, blue), F5 to F10 or the
media keys (play, pause, stop, rewind, fast forward, info), Page Up and Page Down or F11 and F12 (channel up and down),
+ and - (volume), End (exit), Home (text: start what the channel signals), and the digits. A page gets the keys of its
key set; digits outside of it select a channel.)";

constexpr int kMaxSide = 16384;
constexpr uint32_t kMaxChannel = 65535;
constexpr double kMaxTimeoutSeconds = 24 * 60 * 60;
constexpr char kDefaultSize[] = "1280x720";
constexpr char kDefaultTimeout[] = "30";
constexpr char kPlugin[] = "nptelixjs.so";

// HbbTV token of TS 102 796: capabilities (none), vendor, model, software version, hardware version, a
// reserved field.
constexpr char kHbbtvToken[] = " HbbTV/1.1.1 (;Telix;telix-tv;" TELIX_VERSION ";;)";

std::string keyNames() {
    std::string names;
    for (const auto& key : remoteKeys()) {
        names += (names.empty() ? "" : ", ") + std::string(key.name);
    }
    return names;
}

// Values as given: of the encoding of file names, null if the option is not given.
struct Values {
    ~Values() {
        for (char* value : {engine, size, profile, plugin, keys, waitFor, timeout, eval, screenshot, record,
                            userAgent, inspectorServer, ait, signal, on}) {
            g_free(value);
        }
        g_strfreev(pages);
    }

    char* engine = nullptr;
    char* size = nullptr;
    gboolean fullscreen = false;
    gboolean automation = false;
    char* profile = nullptr;
    char* plugin = nullptr;
    char* keys = nullptr;
    char* waitFor = nullptr;
    gboolean waitForPicture = false;
    char* timeout = nullptr;
    char* eval = nullptr;
    char* screenshot = nullptr;
    char* record = nullptr;
    char* userAgent = nullptr;
    gboolean ignoreCertificateErrors = false;
    gboolean inspect = false;
    char* inspectorServer = nullptr;
    char* ait = nullptr;
    char* signal = nullptr;
    char* on = nullptr;
    gboolean strict = false;
    gboolean help = false;
    gboolean version = false;
    char** pages = nullptr;
};

// The descriptions that are made at run time, and the parser.
class Parser {
public:
    explicit Parser(Values& values)
        : m_keys("Press keys of the remote control: " + keyNames() + "."),
          m_plugin("The plug-in to load, default " + besideProgram(kPlugin) + "."),
          m_userAgent(std::string("The user agent string, default that of the engine, followed by") +
                      kHbbtvToken + ".") {
        m_context = g_option_context_new("[URL-or-FILE]");
        g_option_context_set_help_enabled(m_context, FALSE);
        g_option_context_set_summary(
            m_context,
            "The window of the desktop television: shows a page of an HbbTV application with the plug-in.");
        g_option_context_set_description(m_context, kDescription);
        addEntries(values);
    }
    ~Parser() { g_option_context_free(m_context); }
    Parser(const Parser&) = delete;
    Parser& operator=(const Parser&) = delete;

    // The usage error; empty if there is none.
    std::string parse(const std::vector<std::string>& arguments) {
        // The parser takes the vector apart.
        g_autoptr(GPtrArray) list = g_ptr_array_new();
        for (const auto& argument : arguments) {
            g_ptr_array_add(list, g_strdup(argument.c_str()));
        }
        g_ptr_array_add(list, nullptr);
        char** vector = reinterpret_cast<char**>(g_ptr_array_steal(list, nullptr));
        g_autoptr(GError) error = nullptr;
        g_option_context_parse_strv(m_context, &vector, &error);
        g_strfreev(vector);
        return error ? error->message : "";
    }

    std::string help() const {
        g_autofree char* text = g_option_context_get_help(m_context, TRUE, nullptr);
        return text;
    }

private:
    void addEntries(Values& values) {
        // File names are taken as they are; GLib would convert other strings from the locale's encoding.
        constexpr auto kText = G_OPTION_ARG_FILENAME;
        constexpr auto kFlag = G_OPTION_ARG_NONE;
        const GOptionEntry entries[] = {
            {"engine", 0, 0, kText, &values.engine, "The browser engine: webkit (default) or npapi.", "NAME"},
            {"ait", 0, 0, kText, &values.ait, "Start the application of an XML AIT, in place of a page.",
             "URL-or-FILE"},
            {"signal", 0, 0, kText, &values.signal,
             "Signal a page as autostart application of the channel that is on.", "URL-or-FILE"},
            {"on", 0, 0, kText, &values.on, "With --signal: the channel, which is on at first, from 1.",
             "CHANNEL"},
            {"strict", 0, 0, kFlag, &values.strict,
             "Run the plug-in as sets in the field do: events without escapes, none for elements without an "
             "id, and with npapi no list[index].",
             nullptr},
            {"size", 0, 0, kText, &values.size,
             "Size of the window in pixels, default 1280x720. The page is scaled to it.", "WxH"},
            {"fullscreen", 0, 0, kFlag, &values.fullscreen, "Fill the screen.", nullptr},
            {"profile", 0, 0, kText, &values.profile,
             "The folder with cookies, storage, cache, configuration and control socket, with the engine "
             "webkit. It is created if it does not exist; the default is a temporary one.",
             "FOLDER"},
            {"automation", 0, 0, kFlag, &values.automation,
             "Let WebKitWebDriver open and control the pages, with the engine webkit.", nullptr},
            {"plugin", 0, 0, kText, &values.plugin, m_plugin.c_str(), "FILE"},
            {"keys", 0, 0, kText, &values.keys, m_keys.c_str(), "NAME,NAME..."},
            {"wait-for", 0, 0, kText, &values.waitFor, "Wait until the expression is true.", "EXPR"},
            {"wait-for-picture", 0, 0, kFlag, &values.waitForPicture,
             "Wait until the video plane shows something.", nullptr},
            {"timeout", 0, 0, kText, &values.timeout, "Timeout of all steps in seconds, default 30.",
             "SECONDS"},
            {"eval", 0, 0, kText, &values.eval, "Print the value of the expression as JSON.", "EXPR"},
            {"screenshot", 0, 0, kText, &values.screenshot, "Write a screenshot of the window.", "FILE.png"},
            {"record", 0, 0, kText, &values.record,
             "Record picture, page and sound as an MP4 file (H.264, AAC) until the end.", "FILE.mp4"},
            {"user-agent", 0, 0, kText, &values.userAgent, m_userAgent.c_str(), "TEXT"},
            {"ignore-certificate-errors", 0, 0, kFlag, &values.ignoreCertificateErrors,
             "Accept any certificate of a server, for tests with one that nobody has signed.", nullptr},
            {"inspect", 0, 0, kFlag, &values.inspect, "Open the web inspector.", nullptr},
            {"inspector-server", 0, 0, kText, &values.inspectorServer,
             "Let a remote web inspector connect, with the engine webkit.", "HOST:PORT"},
            {"help", 'h', 0, kFlag, &values.help, "Print this text.", nullptr},
            {"version", 0, 0, kFlag, &values.version, "Print the version.", nullptr},
            {G_OPTION_REMAINING, 0, 0, G_OPTION_ARG_FILENAME_ARRAY, &values.pages, nullptr, nullptr},
            {nullptr, 0, 0, kFlag, nullptr, nullptr, nullptr}};
        g_option_context_add_main_entries(m_context, entries, nullptr);
    }

    std::string m_keys;
    std::string m_plugin;
    std::string m_userAgent;
    GOptionContext* m_context;
};

// Handles --help and --version, which need nothing else of the command line.
bool printInformation(const Parser& parser, const Values& values, const EngineInformation& engine) {
    if (values.help) {
        std::fputs(parser.help().c_str(), stdout);
        return true;
    }
    if (values.version) {
        std::printf("telix-tv %s (%s)\n", TELIX_VERSION, engine.versions.c_str());
        return true;
    }
    return false;
}

// A string with a scheme is a URL, any other a file name.
std::string urlOf(const std::string& page) {
    static const Pattern kUrl("([a-zA-Z][a-zA-Z0-9+.-]*://|data:|about:).*");
    if (kUrl.match(page)) {
        return page;
    }
    g_autoptr(GFile) file = g_file_new_for_path(page.c_str());
    g_autofree char* url = g_file_get_uri(file);
    return url;
}

// The following functions return the usage error, an empty string if there is none.

std::string parseSize(const std::string& text, CommandLine& commandLine) {
    static const Pattern kSize("([1-9][0-9]{0,4})x([1-9][0-9]{0,4})");
    if (const auto parts = kSize.match(text)) {
        commandLine.width = std::stoi((*parts)[1]);
        commandLine.height = std::stoi((*parts)[2]);
        if (commandLine.width <= kMaxSide && commandLine.height <= kMaxSide) {
            return {};
        }
    }
    return "--size: bad size \"" + text + "\", expected WxH";
}

std::string parseTimeout(const std::string& text, CommandLine& commandLine) {
    char* end = nullptr;
    const double seconds = g_ascii_strtod(text.c_str(), &end);
    if (text.empty() || *end || !(seconds > 0 && seconds <= kMaxTimeoutSeconds)) {
        return "--timeout: bad timeout \"" + text + "\", expected seconds";
    }
    commandLine.timeoutSeconds = seconds;
    return {};
}

std::string parseKeys(const std::string& list, CommandLine& commandLine) {
    for (std::size_t start = 0; start <= list.size();) {
        const std::size_t end = std::min(list.find(',', start), list.size());
        const std::string name = list.substr(start, end - start);
        const RemoteKey* key = remoteKeyByName(name);
        if (!key) {
            return "--keys: unknown key \"" + name + "\"";
        }
        commandLine.keys.push_back(key);
        start = end + 1;
    }
    return {};
}

std::string parseInspectorServer(const std::string& text, CommandLine& commandLine) {
    g_autoptr(GSocketConnectable) endpoint = g_network_address_parse(text.c_str(), 0, nullptr);
    if (!endpoint || g_network_address_get_port(G_NETWORK_ADDRESS(endpoint)) == 0) {
        return "--inspector-server: bad address \"" + text + "\", expected HOST:PORT";
    }
    commandLine.inspectorServer = text;
    return {};
}

std::string checkStrings(const Values& values) {
    const struct {
        const char* name;
        const char* value;
    } options[] = {{"--wait-for", values.waitFor},      {"--eval", values.eval},
                   {"--screenshot", values.screenshot}, {"--plugin", values.plugin},
                   {"--user-agent", values.userAgent},  {"--profile", values.profile},
                   {"--record", values.record},         {"--ait", values.ait},
                   {"--signal", values.signal}};
    for (const auto& option : options) {
        if (option.value && simplified(option.value).empty()) {
            return std::string(option.name) + ": empty value";
        }
    }
    for (const auto& option : {options[0], options[1], options[4]}) {
        if (option.value && !g_utf8_validate(option.value, -1, nullptr)) {
            return std::string(option.name) + ": not UTF-8";
        }
    }
    // The user agent becomes a line of a request header.
    for (const char* letter = values.userAgent; letter && *letter; letter = g_utf8_next_char(letter)) {
        if (g_unichar_iscntrl(g_utf8_get_char(letter))) {
            return "--user-agent: control character in the user agent";
        }
    }
    return {};
}

std::string parseChannel(const std::string& text, CommandLine& commandLine) {
    guint64 channel = 0;
    if (!g_ascii_string_to_unsigned(text.c_str(), 10, 1, kMaxChannel, &channel, nullptr)) {
        return "--on: bad channel \"" + text + "\", expected a number from 1";
    }
    commandLine.channel = static_cast<uint32_t>(channel);
    return {};
}

// What the window shows.
std::string parsePage(const Values& values, CommandLine& commandLine) {
    const guint pages = values.pages ? g_strv_length(values.pages) : 0;
    if (values.automation) {
        return pages == 0 && !values.ait && !values.signal
                   ? ""
                   : "--automation: expected no page, because the WebDriver session opens it";
    }
    if (pages > 1 || (pages > 0 && values.ait)) {
        return "expected one page at most, see --help";
    }
    if (values.on && !values.signal) {
        return "--on: expected --signal, too";
    }
    if (pages > 0 || values.ait) {
        commandLine.page = urlOf(values.ait ? values.ait : values.pages[0]);
    }
    commandLine.isXmlAit = values.ait != nullptr;
    commandLine.signalUrl = values.signal ? urlOf(values.signal) : "";
    return values.on ? parseChannel(values.on, commandLine) : "";
}

std::string checkSessions(const Values& values, const EngineInformation& engine) {
    if ((values.automation || values.profile) && !engine.hasSessions) {
        return std::string(values.automation ? "--automation" : "--profile") +
               ": only the engine webkit has it";
    }
    if (values.automation &&
        (values.keys || values.waitFor || values.waitForPicture || values.eval || values.screenshot)) {
        return "--automation: excludes --keys, --wait-for, --wait-for-picture, --eval and --screenshot";
    }
    return {};
}

std::string parseValues(const Values& values, const EngineInformation& engine, CommandLine& commandLine) {
    std::string error = checkSessions(values, engine);
    if (error.empty()) {
        error = parsePage(values, commandLine);
    }
    if (error.empty()) {
        error = parseSize(values.size ? values.size : kDefaultSize, commandLine);
    }
    if (error.empty()) {
        error = parseTimeout(values.timeout ? values.timeout : kDefaultTimeout, commandLine);
    }
    if (error.empty() && values.keys) {
        error = parseKeys(values.keys, commandLine);
    }
    if (error.empty() && values.inspectorServer) {
        error = parseInspectorServer(values.inspectorServer, commandLine);
    }
    return error.empty() ? checkStrings(values) : error;
}

std::optional<std::string> optional(const char* value) {
    return value ? std::optional<std::string>(value) : std::nullopt;
}

// Reports a usage error.
std::optional<int> reject(const std::string& error) {
    printError(error);
    return kExitBadInput;
}

} // namespace

std::optional<int> readCommandLine(const std::vector<std::string>& arguments, const EngineInformation& engine,
                                   CommandLine& commandLine) {
    Values values;
    Parser parser(values);
    const std::string parserError = parser.parse(arguments);
    if (!parserError.empty()) {
        return reject(parserError);
    }
    if (printInformation(parser, values, engine)) {
        return kExitSuccess;
    }
    const std::string error = parseValues(values, engine, commandLine);
    if (!error.empty()) {
        return reject(error);
    }
    commandLine.fullscreen = values.fullscreen;
    commandLine.automation = values.automation;
    commandLine.profile = values.profile ? values.profile : "";
    commandLine.inspect = values.inspect;
    commandLine.isStrict = values.strict;
    commandLine.plugin = values.plugin ? values.plugin : besideProgram(kPlugin);
    commandLine.userAgent = values.userAgent ? values.userAgent : engine.userAgent() + kHbbtvToken;
    commandLine.ignoresCertificateErrors = values.ignoreCertificateErrors;
    commandLine.waitForPicture = values.waitForPicture;
    commandLine.waitFor = optional(values.waitFor);
    commandLine.eval = optional(values.eval);
    commandLine.screenshot = optional(values.screenshot);
    commandLine.record = optional(values.record);
    return std::nullopt;
}

void escapeEvents(const CommandLine& commandLine) {
    if (!commandLine.isStrict) {
        g_setenv("PLUGIN_ESCAPE_EVENTS", "1", FALSE);
    }
}

EarlyOptions earlyOptions(const std::vector<std::string>& arguments) {
    Values values;
    Parser parser(values);
    if (!parser.parse(arguments).empty()) {
        return {};
    }
    const auto given = [](const char* value) { return std::string(value ? value : ""); };
    return {given(values.engine), given(values.inspectorServer), given(values.profile)};
}

} // namespace desktop
