// A running television at the other end of its control socket.
#ifndef TELIX_DESKTOP_TELIXCTL_TELEVISION_H
#define TELIX_DESKTOP_TELIXCTL_TELEVISION_H

#include <cstdint>
#include <optional>
#include <string>
#include <sys/types.h>

namespace desktop {

// The control socket given by a path or a process id; without either by TELIX_SOCKET, else that of the only
// television of this user. Empty and 0 mean not given. Nothing, with the reason in `error`, if no or more
// than one television is running.
std::optional<std::string> findTelevision(const std::string& socket, pid_t pid, std::string& error);

// Sends one request and returns the response, both without the end of the line. Nothing, with the reason in
// `error`, if no response arrives within `timeout` seconds.
std::optional<std::string> sendRequest(const std::string& socket, const std::string& request, int64_t timeout,
                                       std::string& error);

} // namespace desktop

#endif
