// The parts of control responses that describe the television.
#ifndef TELIX_DESKTOP_PLATFORM_CONTROLSTATE_H
#define TELIX_DESKTOP_PLATFORM_CONTROLSTATE_H

#include "desktop/platform/ControlJson.h"
#include "desktop/platform/ControlRequest.h"
#include "telix/telix_platform.h"

namespace desktop {

// All functions: platform thread.

// Sets a member to the channel with its position in the channel list, which channels outside the list lack;
// to null if there is no such channel.
void setChannel(JsonObjectWriter& object, const char* name, TELIX_JS_CM_HANDLE handle);

// Handlers of the commands "channels", "applications" and "state".
JsonObjectWriter listChannels(const ControlRequest& request);
JsonObjectWriter listApplications(const ControlRequest& request);
JsonObjectWriter reportState(const ControlRequest& request);

} // namespace desktop

#endif
