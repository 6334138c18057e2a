// The control protocol, which libtelix and telixctl share. The commands stand in ControlCommands.h.
//
// A request is one line with a JSON object: "command" is the name of a command, every other member is one of
// its parameters. The response is one line with a JSON object: "ok" true and the results of the command, or
// "ok" false and "error", the reason as a string.
#ifndef TELIX_DESKTOP_PLATFORM_CONTROLPROTOCOL_H
#define TELIX_DESKTOP_PLATFORM_CONTROLPROTOCOL_H

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace desktop {

// What a parameter accepts.
struct ControlValueType {
    enum class Kind {
        String,
        Strings, // one or more; takes the remaining arguments of a command line
        Number,
        Boolean,
        Choice,
        File, // absolute file name; on a command line relative to the current folder
        Page  // absolute URL; on a command line also the name of a file
    };

    Kind kind;
    int64_t minimum = 0; // of a number
    int64_t maximum = 0;
    const char* choices = ""; // of a choice, separated by vertical bars

    // Whether the number, or the choice, is one of the accepted ones.
    bool acceptsNumber(int64_t value) const;
    bool acceptsChoice(const std::string& value) const;

    // The accepted values in words, as "a whole number from 1 to 9", for error messages. Booleans are written
    // differently in JSON and on a command line.
    std::string description(const char* booleans) const;
};

struct ControlParameter {
    // How the value is given on a command line.
    enum class Use { Argument, OptionalArgument, Option };

    const char* name; // of the member of a request, and of the option
    Use use;
    ControlValueType type;
    const char* placeholder;    // stands for the value in help texts
    const char* defaultMeaning; // value, or effect, without the parameter; empty if it is required
    const char* meaning;

    bool isRequired() const { return use == Use::Argument; }
};

struct ControlCommand {
    enum class Handler { Library, Window, Both };

    const char* name;
    Handler handler;
    const char* help;
    std::vector<ControlParameter> parameters;

    // The default of the parameter "timeout", in seconds; 0 without such a parameter.
    int64_t defaultTimeout() const;
};

// The commands that a television handles, and those that telixctl runs itself, in the order of the rows.
const std::vector<ControlCommand>& controlCommands();
const std::vector<ControlCommand>& localCommands();

// Null if there is none with that name.
const ControlCommand* findCommand(const std::vector<ControlCommand>& commands, const std::string& name);
const ControlParameter* findControlParameter(const ControlCommand& command, const std::string& name);

// How long a response may take, in seconds. The time of the parameter "timeout" comes in addition.
constexpr int64_t kResponseTimeout = 10;

// Of the parameter "timeout".
constexpr int64_t kMaxTimeout = 3600;

// Length limit of a request in bytes, without the end of the line.
constexpr size_t kMaxControlRequest = 65536;

// The names of platform messages of a player, as "play-end".
struct PlayerMessage {
    const char* name;
    uint32_t value;
};
const std::vector<PlayerMessage>& playerMessages();

} // namespace desktop

#endif
