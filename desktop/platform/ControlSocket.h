// Where the control sockets of the running televisions are. Used by the library and by telixctl.
#ifndef TELIX_DESKTOP_PLATFORM_CONTROLSOCKET_H
#define TELIX_DESKTOP_PLATFORM_CONTROLSOCKET_H

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

// The user's folder for sockets: XDG_RUNTIME_DIR or, if that is not set, telix-UID in the folder for
// temporary files, which is created if it does not exist. Empty, with the reason in `error`, if it cannot be
// used or if other users have access to it.
std::string controlFolder(std::string& error);

std::string controlSocketPath(const std::string& folder, pid_t pid);

// Whether a process listens on the socket. Sends nothing.
bool isListening(const std::string& path);

// The sockets on which a process listens, in ascending order of the process ids. Removes the sockets of
// processes that have ended.
std::vector<ControlSocket> runningTelevisions(const std::string& folder);

// The socket address of a path; nothing if the path is too long for one.
std::optional<sockaddr_un> socketAddress(const std::string& path);

} // namespace desktop

#endif
