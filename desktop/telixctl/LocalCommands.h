// The commands that need no television.
#ifndef TELIX_DESKTOP_TELIXCTL_LOCALCOMMANDS_H
#define TELIX_DESKTOP_TELIXCTL_LOCALCOMMANDS_H

#include "desktop/telixctl/CommandLine.h"
#include "desktop/telixctl/ExitStatus.h"

namespace desktop {

// The function of a row of localCommands(), given the command line.
using LocalFunction = ExitStatus (*)(const CommandLine& line);
LocalFunction localFunctionOf(const ControlCommand& command);

} // namespace desktop

#endif
