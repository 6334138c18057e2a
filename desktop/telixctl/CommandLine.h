// The command line of telixctl: options, the command and its parameters, as the command table states them.
#ifndef TELIX_DESKTOP_TELIXCTL_COMMANDLINE_H
#define TELIX_DESKTOP_TELIXCTL_COMMANDLINE_H

#include <cstdint>
#include <map>
#include <stdexcept>
#include <string>
#include <sys/types.h>
#include <vector>

#include "desktop/platform/ControlProtocol.h"

namespace desktop {

// Bad input on the command line.
class UsageError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

struct CommandLine {
    std::string socket; // --socket; empty if not given
    pid_t pid = 0;      // --pid; 0 if not given
    bool isJson = false;
    bool isVersion = false;                  // then there is no command
    const ControlCommand* command = nullptr; // a row of controlCommands() or localCommands()
    // By name of the parameter, checked against the row; one value each, unless it is one of strings.
    std::map<std::string, std::vector<std::string>> values;

    // Parses `arguments`, of which the first is the name of the program. Prints the help text and exits the
    // process if it is asked for. Throws UsageError.
    static CommandLine parse(std::vector<std::string> arguments);

    // The request to a television, one line without its end.
    std::string toRequest() const;

    // How long the response may take, in seconds.
    int64_t responseTimeout() const;
};

} // namespace desktop

#endif
