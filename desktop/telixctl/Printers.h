// Prints the responses of a television for a person to read.
#ifndef TELIX_DESKTOP_TELIXCTL_PRINTERS_H
#define TELIX_DESKTOP_TELIXCTL_PRINTERS_H

#include <json-glib/json-glib.h>

#include "desktop/platform/ControlProtocol.h"

namespace desktop {

// The printer of a row of controlCommands(), given a response with "ok" true. Writes to standard output.
using Printer = void (*)(JsonObject* response);
Printer printerOf(const ControlCommand& command);

} // namespace desktop

#endif
