// The other end: a running television's control socket.
#ifndef TELIX_DESKTOP_TELEVISION_H
#define TELIX_DESKTOP_TELEVISION_H

#include <optional>
#include <string>
#include <sys/types.h>

// Which television is meant; if nothing says so, the only one that runs.
struct Choice {
    std::string socket; // a path, empty if none is named
    pid_t pid = 0;      // 0 if none is named
};

// The socket that is meant; nothing, with the reason in `error`, if there is none or more than one.
std::optional<std::string> findTelevision(const Choice& choice, std::string& error);

// Sends one request and gives the answer, both without the end of the line; nothing, with the reason in
// `error`, if there is no answer within ten seconds.
std::optional<std::string> ask(const std::string& socket, const std::string& request, std::string& error);

#endif
