// GOption parses the options, everything about commands comes from the command table. There are two passes:
// the first ends at the command, whose own options are known to the second.
#include "desktop/telixctl/CommandLine.h"

#include <algorithm>
#include <cstddef>
#include <cstdio>
#include <glib.h>
#include <json-glib/json-glib.h>
#include <memory>

namespace desktop {

namespace {

using Kind = ControlValueType::Kind;
using Use = ControlParameter::Use;
using OptionContext = std::unique_ptr<GOptionContext, void (*)(GOptionContext*)>;

// ---- Help texts

const char kEpilogue[] =
    "Numbers are decimal, or hexadecimal with the prefix 0x.\n"
    "The television is the one given by --socket, --pid or TELIX_SOCKET, else the only one of "
    "this user.\n\n"
    "Exit status: 0 success; 1 refused by the television, not true in time, or no television; "
    "2 bad\ncommand line or configuration file.";

std::string synopsisOf(const ControlCommand& command) {
    std::string synopsis = command.name;
    for (const ControlParameter& parameter : command.parameters) {
        if (parameter.use == Use::Argument) {
            synopsis += std::string(" ") + parameter.placeholder;
        } else if (parameter.use == Use::OptionalArgument) {
            synopsis += std::string(" [") + parameter.placeholder + "]";
        }
    }
    return synopsis;
}

std::string meaningOf(const ControlParameter& parameter) {
    std::string meaning = parameter.meaning;
    if (!parameter.isRequired()) {
        meaning += std::string(" (default: ") + parameter.defaultMeaning + ")";
    }
    return meaning;
}

std::string helpRow(const std::string& left, const std::string& right) {
    char row[256];
    std::snprintf(row, sizeof(row), "  %-30s %s\n", left.c_str(), right.c_str());
    return row;
}

// The part of --help after the options.
std::string commandsHelp() {
    std::string help = "Commands:\n";
    for (const auto* commands : {&controlCommands(), &localCommands()}) {
        for (const ControlCommand& command : *commands) {
            help += helpRow(synopsisOf(command), command.help);
            for (const ControlParameter& parameter : command.parameters) {
                const std::string value = parameter.placeholder;
                const bool isOption = parameter.use == Use::Option;
                help +=
                    helpRow("    " + (isOption ? std::string("--") + parameter.name + "=" + value : value),
                            meaningOf(parameter));
            }
        }
    }
    return help + "\n" + kEpilogue;
}

// The part of "COMMAND --help" after the options.
std::string argumentsHelp(const ControlCommand& command) {
    std::string help;
    for (const ControlParameter& parameter : command.parameters) {
        if (parameter.use != Use::Option) {
            help += helpRow(parameter.placeholder, meaningOf(parameter));
        }
    }
    return help.empty() ? kEpilogue : "Arguments:\n" + help + "\n" + kEpilogue;
}

// ---- Options

// The storage that GOption writes to: strings of its own allocation.
struct Options {
    char* socket = nullptr;
    char* pid = nullptr;
    gboolean isJson = FALSE;
    gboolean isVersion = FALSE;
    std::map<const ControlParameter*, char*> parameters;
    std::map<const ControlParameter*, std::string> descriptions; // of the options in --help

    Options() = default;
    Options(const Options&) = delete;
    Options& operator=(const Options&) = delete;
    ~Options() {
        g_free(socket);
        g_free(pid);
        for (const auto& each : parameters) {
            g_free(each.second);
        }
    }
};

// Options that may stand before and after the command.
std::vector<GOptionEntry> commonEntries(Options& options) {
    return {
        {"socket", 's', 0, G_OPTION_ARG_FILENAME, &options.socket,
         "Control socket of the television (default: TELIX_SOCKET)", "FILE"},
        {"pid", 'p', 0, G_OPTION_ARG_STRING, &options.pid, "Process id of the television", "PID"},
        {"json", 'j', 0, G_OPTION_ARG_NONE, &options.isJson, "Print the response as one line of JSON",
         nullptr},
    };
}

// Removes the options from `arguments`.
void parseOptions(GOptionContext* context, std::vector<GOptionEntry> entries,
                  std::vector<std::string>& arguments) {
    entries.push_back({});
    g_option_context_add_main_entries(context, entries.data(), nullptr);
    char** strings = g_new0(char*, arguments.size() + 1);
    for (size_t index = 0; index < arguments.size(); ++index) {
        strings[index] = g_strdup(arguments[index].c_str());
    }
    GError* error = nullptr;
    const bool isParsed = g_option_context_parse_strv(context, &strings, &error) != FALSE;
    arguments.clear();
    for (char** each = strings; *each; ++each) {
        if (std::string(*each) != "--") {
            arguments.push_back(*each);
        }
    }
    g_strfreev(strings);
    if (!isParsed) {
        const std::string reason = error->message;
        g_error_free(error);
        throw UsageError(reason);
    }
}

// Parses the options before the command.
void parseCommonOptions(Options& options, std::vector<std::string>& arguments) {
    const OptionContext context(g_option_context_new("COMMAND [ARGUMENT...] - control a running television"),
                                g_option_context_free);
    g_option_context_set_description(context.get(), commandsHelp().c_str());
    g_option_context_set_strict_posix(context.get(), TRUE); // stop at the command
    std::vector<GOptionEntry> entries = commonEntries(options);
    entries.push_back({"version", 0, 0, G_OPTION_ARG_NONE, &options.isVersion, "Print the version", nullptr});
    parseOptions(context.get(), entries, arguments);
}

// Parses the options after the command.
void parseCommandOptions(const ControlCommand& command, Options& options,
                         std::vector<std::string>& arguments) {
    std::vector<GOptionEntry> entries = commonEntries(options);
    for (const ControlParameter& parameter : command.parameters) {
        if (parameter.use == Use::Option) {
            char*& value = options.parameters[&parameter];
            std::string& description = options.descriptions[&parameter];
            description = meaningOf(parameter);
            entries.push_back({parameter.name, 0, 0, G_OPTION_ARG_STRING, &value, description.c_str(),
                               parameter.placeholder});
        }
    }
    const OptionContext context(g_option_context_new((synopsisOf(command) + " - " + command.help).c_str()),
                                g_option_context_free);
    g_option_context_set_description(context.get(), argumentsHelp(command).c_str());
    parseOptions(context.get(), entries, arguments);
}

// ---- Values

// Decimal, or hexadecimal with the prefix 0x. False if it is not a number of the type.
bool readNumber(const std::string& value, const ControlValueType& type, int64_t& number) {
    const bool isHexadecimal = value.compare(0, 2, "0x") == 0 || value.compare(0, 2, "0X") == 0;
    gint64 read = 0;
    const bool isRead =
        g_ascii_string_to_signed(value.c_str() + (isHexadecimal ? 2 : 0), isHexadecimal ? 16 : 10,
                                 type.minimum, type.maximum, &read, nullptr) != FALSE;
    number = read;
    return isRead;
}

void checkValue(const std::string& what, const ControlValueType& type, const std::string& value) {
    int64_t number = 0;
    bool isAccepted = true;
    switch (type.kind) {
    case Kind::Number:
        isAccepted = readNumber(value, type, number);
        break;
    case Kind::Boolean:
        isAccepted = value == "on" || value == "off";
        break;
    case Kind::Choice:
        isAccepted = type.acceptsChoice(value);
        break;
    default:
        break;
    }
    if (!g_utf8_validate(value.c_str(), -1, nullptr)) {
        throw UsageError(what + ": the value is not valid UTF-8");
    }
    if (!isAccepted) {
        throw UsageError(what + ": \"" + value + "\" is not " + type.description("on|off"));
    }
}

// The values of a parameter, each of them checked; empty if it is not given. Takes arguments from `next` on.
std::vector<std::string> valuesOf(const ControlParameter& parameter, const std::string& what,
                                  const Options& options, const std::vector<std::string>& arguments,
                                  size_t& next) {
    std::vector<std::string> values;
    if (parameter.use == Use::Option) {
        if (const char* value = options.parameters.at(&parameter)) {
            values.emplace_back(value);
        }
    } else {
        const size_t left = arguments.size() - next;
        const size_t count = parameter.type.kind == Kind::Strings ? left : std::min<size_t>(left, 1);
        values.assign(arguments.begin() + static_cast<ptrdiff_t>(next),
                      arguments.begin() + static_cast<ptrdiff_t>(next + count));
        next += count;
    }
    for (const std::string& value : values) {
        checkValue(what, parameter.type, value);
    }
    return values;
}

// The values of a command: its arguments in the order of the row, `arguments` after the command, and options.
std::map<std::string, std::vector<std::string>>
valuesOf(const ControlCommand& command, const Options& options, const std::vector<std::string>& arguments) {
    std::map<std::string, std::vector<std::string>> values;
    size_t next = 0;
    for (const ControlParameter& parameter : command.parameters) {
        const std::string what = std::string(command.name) + ": " +
                                 (parameter.use == Use::Option ? std::string("--") + parameter.name
                                                               : std::string(parameter.placeholder));
        const auto found = valuesOf(parameter, what, options, arguments, next);
        if (!found.empty()) {
            values[parameter.name] = found;
        } else if (parameter.isRequired()) {
            throw UsageError(what + " is missing");
        }
    }
    if (next < arguments.size()) {
        throw UsageError(std::string(command.name) + ": unexpected argument \"" + arguments[next] + "\"");
    }
    return values;
}

pid_t readPid(const char* value) {
    const ControlValueType type{Kind::Number, 1, G_MAXINT32};
    int64_t pid = 0;
    if (value) {
        checkValue("--pid", type, value);
        readNumber(value, type, pid);
    }
    return static_cast<pid_t>(pid);
}

} // namespace

CommandLine CommandLine::parse(std::vector<std::string> arguments) {
    CommandLine line;
    Options options;
    parseCommonOptions(options, arguments);
    if (options.isVersion) {
        line.isVersion = true;
        return line;
    }
    if (arguments.size() < 2) {
        throw UsageError("no command is given (see telixctl --help)");
    }
    const std::string name = arguments[1];
    line.command = findCommand(controlCommands(), name);
    line.command = line.command ? line.command : findCommand(localCommands(), name);
    if (!line.command) {
        throw UsageError("\"" + name + "\": unknown command (see telixctl --help)");
    }
    arguments.erase(arguments.begin() + 1);
    parseCommandOptions(*line.command, options, arguments);
    arguments.erase(arguments.begin());
    line.values = valuesOf(*line.command, options, arguments);
    line.socket = options.socket ? options.socket : "";
    line.pid = readPid(options.pid);
    line.isJson = options.isJson != FALSE;
    if (options.socket && options.pid) {
        throw UsageError("--socket and --pid exclude each other");
    }
    return line;
}

namespace {

// An absolute URL: that of the file, unless the value has a scheme.
std::string pageOf(const std::string& value) {
    if (g_uri_peek_scheme(value.c_str())) {
        return value;
    }
    const std::unique_ptr<char, void (*)(void*)> file(g_canonicalize_filename(value.c_str(), nullptr),
                                                      g_free);
    const std::unique_ptr<char, void (*)(void*)> url(g_filename_to_uri(file.get(), nullptr, nullptr), g_free);
    return url.get();
}

void setMember(JsonObject* request, const ControlParameter& parameter,
               const std::vector<std::string>& values) {
    const std::string& value = values.front();
    const char* name = parameter.name;
    switch (parameter.type.kind) {
    case Kind::Number: {
        int64_t number = 0;
        readNumber(value, parameter.type, number);
        json_object_set_int_member(request, name, number);
        break;
    }
    case Kind::Boolean:
        json_object_set_boolean_member(request, name, value == "on");
        break;
    case Kind::Strings: {
        JsonArray* array = json_array_new();
        for (const std::string& each : values) {
            json_array_add_string_element(array, each.c_str());
        }
        json_object_set_array_member(request, name, array); // transferred
        break;
    }
    case Kind::File: {
        char* file = g_canonicalize_filename(value.c_str(), nullptr);
        json_object_set_string_member(request, name, file);
        g_free(file);
        break;
    }
    case Kind::Page:
        json_object_set_string_member(request, name, pageOf(value).c_str());
        break;
    default:
        json_object_set_string_member(request, name, value.c_str());
        break;
    }
}

} // namespace

std::string CommandLine::toRequest() const {
    const std::unique_ptr<JsonObject, void (*)(JsonObject*)> request(json_object_new(), json_object_unref);
    json_object_set_string_member(request.get(), "command", command->name);
    for (const ControlParameter& parameter : command->parameters) {
        const auto found = values.find(parameter.name);
        if (found != values.end()) {
            setMember(request.get(), parameter, found->second);
        }
    }
    const std::unique_ptr<JsonNode, void (*)(JsonNode*)> node(json_node_new(JSON_NODE_OBJECT),
                                                              json_node_unref);
    json_node_set_object(node.get(), request.get());
    char* json = json_to_string(node.get(), FALSE);
    std::string line = json;
    g_free(json);
    return line;
}

int64_t CommandLine::responseTimeout() const {
    int64_t timeout = command->defaultTimeout();
    const auto given = values.find("timeout");
    if (given != values.end()) {
        readNumber(given->second.front(), findControlParameter(*command, "timeout")->type, timeout);
    }
    // The television gives a window up first, and says so.
    const bool isLibrary = command->handler == ControlCommand::Handler::Library;
    return timeout + (isLibrary ? 1 : 2) * kResponseTimeout;
}

} // namespace desktop
