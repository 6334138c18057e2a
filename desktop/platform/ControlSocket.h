// Where the control sockets of the running televisions are. Used by the library and by telixctl.
#ifndef TELIX_DESKTOP_CONTROLSOCKET_H
#define TELIX_DESKTOP_CONTROLSOCKET_H

#include <optional>
#include <string>
#include <sys/types.h>
#include <sys/un.h>
#include <vector>

namespace desktop {

struct ControlSocket {
    pid_t pid = 0; // of the television
    std::string path;
};

// The user's folder for sockets: XDG_RUNTIME_DIR, or telix-UID in the folder for temporary files, which is
// made if it is missing. Empty, with the reason in `error`, if it can't be used or is not the user's alone.
std::string controlFolder(std::string& error);

std::string controlSocketPath(const std::string& folder, pid_t pid);

// The sockets at which somebody listens, by rising pid. Those that dead processes have left are removed.
std::vector<ControlSocket> runningTelevisions(const std::string& folder);

// The address of a path; nothing if it is too long for one.
std::optional<sockaddr_un> socketAddress(const std::string& path);

} // namespace desktop

#endif
