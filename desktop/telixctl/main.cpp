// telixctl: looks into a running television and provokes events in it.
#include "desktop/platform/Configuration.h"
#include "desktop/platform/ControlProtocol.h"
#include "desktop/platform/ControlSocket.h"
#include "desktop/telixctl/Output.h"
#include "desktop/telixctl/Television.h"

#include <clocale>
#include <cstdio>
#include <cstdlib>
#include <glib.h>
#include <memory>
#include <vector>

using namespace desktop;

namespace {

enum ExitStatus { exitDone = 0, exitRefused = 1, exitUnusable = 2 };

// A mistake in the command line.
struct Misuse {
    std::string text;
};

// Options that may stand before the command and behind it.
struct Options {
    char* socket = nullptr;
    char* pid = nullptr;
    gboolean json = FALSE;
    gboolean version = FALSE;

    ~Options() {
        g_free(socket);
        g_free(pid);
    }
};

std::vector<GOptionEntry> entriesOf(Options& options) {
    return {
        {"socket", 's', 0, G_OPTION_ARG_FILENAME, &options.socket,
         "The control socket of the television (TELIX_SOCKET)", "FILE"},
        {"pid", 'p', 0, G_OPTION_ARG_STRING, &options.pid, "The television of that process", "PID"},
        {"json", 'j', 0, G_OPTION_ARG_NONE, &options.json, "Print the answer as it comes, one line of JSON",
         nullptr},
    };
}

std::string positional(const ControlParameter& parameter) {
    if (parameter.kind == ControlParameter::Kind::flag) {
        return "on|off";
    }
    char* upper = g_ascii_strup(parameter.name, -1);
    std::string text = upper;
    g_free(upper);
    return text;
}

std::string synopsis(const ControlCommand& command) {
    std::string text = command.name;
    for (const ControlParameter& parameter : command.parameters) {
        text += parameter.isRequired ? " " + positional(parameter) : "";
    }
    return text;
}

// What --help tells behind the options.
std::string overview() {
    std::string text = "Commands:\n";
    char row[512];
    const auto add = [&](const std::string& left, const char* right) {
        std::snprintf(row, sizeof(row), "  %-30s %s\n", left.c_str(), right);
        text += row;
    };
    for (const ControlCommand& command : controlCommands()) {
        add(synopsis(command), command.help);
        for (const ControlParameter& parameter : command.parameters) {
            add("    " + (parameter.isRequired
                              ? positional(parameter)
                              : std::string("--") + parameter.name + "=" +
                                    (parameter.kind == ControlParameter::Kind::number ? "NUMBER" : "TEXT")),
                parameter.help);
        }
    }
    add("list", "list the televisions that run, by their process");
    add("check-config [FILE]",
        "look for faults in a configuration file (the one that a television would read)");
    text += "\nNumbers are decimal, or hexadecimal behind 0x. The television is the one named by --socket, "
            "--pid or "
            "TELIX_SOCKET,\nelse the only one of this user that runs.\n\n"
            "Exit status: 0 done, 1 refused by the television or none is running, 2 for a bad command line "
            "or a bad\n"
            "configuration file.";
    return text;
}

using Context = std::unique_ptr<GOptionContext, void (*)(GOptionContext*)>;

// Takes the options out of `arguments`, whose first one is the program's name.
void parse(GOptionContext* context, const std::vector<GOptionEntry>& entries,
           std::vector<std::string>& arguments) {
    std::vector<GOptionEntry> all = entries;
    all.push_back({});
    g_option_context_add_main_entries(context, all.data(), nullptr);
    char** copies = g_new0(char*, arguments.size() + 1);
    for (size_t index = 0; index < arguments.size(); ++index) {
        copies[index] = g_strdup(arguments[index].c_str());
    }
    GError* error = nullptr;
    const bool isGood = g_option_context_parse_strv(context, &copies, &error);
    arguments.clear();
    for (char** each = copies; *each; ++each) {
        if (std::string(*each) != "--") {
            arguments.push_back(*each);
        }
    }
    g_strfreev(copies);
    if (!isGood) {
        const std::string text = error->message;
        g_error_free(error);
        throw Misuse{text};
    }
}

int64_t readNumber(const std::string& what, const std::string& text, int64_t least, int64_t most) {
    const bool isHexadecimal = text.compare(0, 2, "0x") == 0 || text.compare(0, 2, "0X") == 0;
    gint64 number = 0;
    if (!g_ascii_string_to_signed(text.c_str() + (isHexadecimal ? 2 : 0), isHexadecimal ? 16 : 10, least,
                                  most, &number, nullptr)) {
        throw Misuse{what + ": \"" + text + "\" is no number from " + std::to_string(least) + " to " +
                     std::to_string(most)};
    }
    return number;
}

void addValue(JsonObject* request, const ControlParameter& parameter, const std::string& text) {
    switch (parameter.kind) {
    case ControlParameter::Kind::number:
        json_object_set_int_member(request, parameter.name,
                                   readNumber(parameter.name, text, parameter.least, parameter.most));
        break;
    case ControlParameter::Kind::flag:
        if (text != "on" && text != "off") {
            throw Misuse{std::string(parameter.name) + ": \"" + text + "\" is neither on nor off"};
        }
        json_object_set_boolean_member(request, parameter.name, text == "on");
        break;
    default:
        if (!g_utf8_validate(text.c_str(), -1, nullptr)) {
            throw Misuse{std::string(parameter.name) + " is no UTF-8 text"};
        }
        json_object_set_string_member(request, parameter.name, text.c_str());
    }
}

// The request that the arguments behind the program's name make, the command first.
std::string readRequest(const ControlCommand& command, std::vector<std::string> arguments, Options& options) {
    struct Texts {
        std::vector<char*> values;
        ~Texts() {
            for (char* value : values) {
                g_free(value);
            }
        }
    } texts{std::vector<char*>(command.parameters.size(), nullptr)};
    std::vector<GOptionEntry> entries = entriesOf(options);
    for (size_t index = 0; index < command.parameters.size(); ++index) {
        const ControlParameter& parameter = command.parameters[index];
        if (!parameter.isRequired) {
            entries.push_back({parameter.name, 0, 0, G_OPTION_ARG_STRING, &texts.values[index],
                               parameter.help,
                               parameter.kind == ControlParameter::Kind::number ? "NUMBER" : "TEXT"});
        }
    }
    const Context context(g_option_context_new((synopsis(command) + " - " + command.help).c_str()),
                          g_option_context_free);
    arguments.erase(arguments.begin() + 1);
    parse(context.get(), entries, arguments);

    const std::unique_ptr<JsonObject, void (*)(JsonObject*)> request(json_object_new(), json_object_unref);
    json_object_set_string_member(request.get(), "command", command.name);
    size_t next = 1;
    for (size_t index = 0; index < command.parameters.size(); ++index) {
        const ControlParameter& parameter = command.parameters[index];
        if (parameter.isRequired) {
            if (next >= arguments.size()) {
                throw Misuse{std::string(command.name) + " needs " + positional(parameter)};
            }
            addValue(request.get(), parameter, arguments[next++]);
        } else if (texts.values[index]) {
            addValue(request.get(), parameter, texts.values[index]);
        }
    }
    if (next < arguments.size()) {
        throw Misuse{std::string(command.name) + ": \"" + arguments[next] + "\" is one argument too many"};
    }
    const std::unique_ptr<JsonNode, void (*)(JsonNode*)> node(json_node_new(JSON_NODE_OBJECT),
                                                              json_node_unref);
    json_node_set_object(node.get(), request.get());
    char* text = json_to_string(node.get(), FALSE);
    std::string line = text;
    g_free(text);
    return line;
}

Choice choiceOf(const Options& options) {
    Choice choice;
    choice.socket = options.socket ? options.socket : "";
    choice.pid = options.pid ? static_cast<pid_t>(readNumber("--pid", options.pid, 1, G_MAXINT32)) : 0;
    if (options.socket && options.pid) {
        throw Misuse{"give either --socket or --pid"};
    }
    return choice;
}

int refuse(const std::string& reason) {
    std::fprintf(stderr, "telixctl: %s\n", reason.c_str());
    return exitRefused;
}

int tell(const ControlCommand& command, const std::string& request, const Options& options) {
    std::string error;
    const auto socket = findTelevision(choiceOf(options), error);
    const auto answer = socket ? ask(*socket, request, error) : std::nullopt;
    if (!answer) {
        return refuse(error);
    }
    const std::unique_ptr<JsonParser, void (*)(void*)> parser(json_parser_new(), g_object_unref);
    JsonNode* root = json_parser_load_from_data(parser.get(), answer->c_str(), -1, nullptr)
                         ? json_parser_get_root(parser.get())
                         : nullptr;
    if (!root || !JSON_NODE_HOLDS_OBJECT(root)) {
        return refuse("what answers is no television");
    }
    JsonObject* object = json_node_get_object(root);
    const bool isDone = json_object_get_boolean_member_with_default(object, "ok", FALSE);
    if (options.json) {
        std::printf("%s\n", answer->c_str());
    } else if (isDone) {
        printAnswer(command.name, object);
    }
    if (!isDone) {
        return refuse(json_object_get_string_member_with_default(object, "error", "refused"));
    }
    return exitDone;
}

int listTelevisions() {
    std::string error;
    const std::string folder = controlFolder(error);
    if (folder.empty()) {
        return refuse(error);
    }
    const auto running = runningTelevisions(folder);
    for (const ControlSocket& each : running) {
        std::printf("%d  %s\n", static_cast<int>(each.pid), each.path.c_str());
    }
    return running.empty() ? refuse("no television is running") : exitDone;
}

int checkConfiguration(const std::string& named) {
    const std::string file = named.empty() ? Configuration::file() : named;
    if (file.empty()) {
        std::printf("There is no configuration file: the defaults hold.\n");
        return exitDone;
    }
    Configuration configuration;
    if (const auto error = Configuration::load(file, configuration)) {
        std::fprintf(stderr, "%s\n", error->text().c_str());
        return exitUnusable;
    }
    std::printf("%s: no faults\n", file.c_str());
    return exitDone;
}

int run(std::vector<std::string> arguments) {
    Options options;
    const Context context(g_option_context_new("COMMAND [ARGUMENT...] - look into a running television"),
                          g_option_context_free);
    g_option_context_set_description(context.get(), overview().c_str());
    g_option_context_set_strict_posix(context.get(), TRUE); // what stands behind the command is its own
    std::vector<GOptionEntry> entries = entriesOf(options);
    entries.push_back({"version", 0, 0, G_OPTION_ARG_NONE, &options.version, "Print the version", nullptr});
    parse(context.get(), entries, arguments);
    if (options.version) {
        std::printf("telixctl %s\n", TELIX_VERSION);
        return exitDone;
    }
    if (arguments.size() < 2) {
        throw Misuse{"no command is given"};
    }
    const std::string name = arguments[1];
    if (const ControlCommand* command = findControlCommand(name)) {
        const std::string request = readRequest(*command, arguments, options);
        return tell(*command, request, options);
    }
    const size_t most = name == "check-config" ? 3 : 2;
    if (name != "check-config" && name != "list") {
        throw Misuse{"unknown command \"" + name + "\""};
    }
    if (arguments.size() > most || arguments.back().compare(0, 2, "--") == 0) {
        throw Misuse{name + ": \"" + arguments.back() + "\" is one argument too many"};
    }
    return name == "list" ? listTelevisions() : checkConfiguration(arguments.size() == 3 ? arguments[2] : "");
}

} // namespace

int main(int argc, char** argv) {
    std::setlocale(LC_ALL, "");
    try {
        return run(std::vector<std::string>(argv, argv + argc));
    } catch (const Misuse& misuse) {
        std::fprintf(stderr, "telixctl: %s\nTry telixctl --help.\n", misuse.text.c_str());
        return exitUnusable;
    }
}
