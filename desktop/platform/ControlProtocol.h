// The commands of the control socket, each stated once: the library checks requests against this list, and
// telixctl makes its command line of it.
//
// A request is one line with a JSON object: "command" is the command's name, every other member one of its
// parameters. The answer is one line with a JSON object: "ok" true and what the command gives, or "ok" false
// and "error", a text.
#ifndef TELIX_DESKTOP_CONTROLPROTOCOL_H
#define TELIX_DESKTOP_CONTROLPROTOCOL_H

#include <cstdint>
#include <string>
#include <vector>

namespace desktop {

struct ControlParameter {
    enum class Kind { text, number, flag };

    const char* name;
    Kind kind;
    bool isRequired; // and then told without its name on the command line
    const char* help;
    int64_t least = 0; // of a number
    int64_t most = UINT32_MAX;
};

struct ControlCommand {
    const char* name;
    const char* help;
    std::vector<ControlParameter> parameters;
};

const std::vector<ControlCommand>& controlCommands();

// Null if there is none of that name.
const ControlCommand* findControlCommand(const std::string& name);
const ControlParameter* findControlParameter(const ControlCommand& command, const std::string& name);

// The longest line of a request in bytes, without its end.
constexpr size_t longestControlRequest = 65536;

// The names of player messages, as "play-end", with their numbers.
struct PlayerMessage {
    const char* name;
    uint32_t number;
};
const std::vector<PlayerMessage>& playerMessages();

} // namespace desktop

#endif
