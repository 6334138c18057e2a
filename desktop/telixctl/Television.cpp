// Finding the socket, and one exchange through it.
#include "desktop/telixctl/Television.h"

#include "desktop/platform/ControlSocket.h"

#include <cerrno>
#include <glib.h>
#include <sys/socket.h>
#include <sys/time.h>
#include <unistd.h>

using namespace desktop;

std::optional<std::string> findTelevision(const Choice& choice, std::string& error) {
    if (!choice.socket.empty()) {
        return choice.socket;
    }
    const char* named = g_getenv("TELIX_SOCKET");
    if (choice.pid == 0 && named && *named) {
        return named;
    }
    const std::string folder = controlFolder(error);
    if (folder.empty()) {
        return std::nullopt;
    }
    if (choice.pid != 0) {
        return controlSocketPath(folder, choice.pid);
    }
    const auto running = runningTelevisions(folder);
    if (running.size() == 1) {
        return running.front().path;
    }
    error = "no television is running";
    if (!running.empty()) {
        error = "several televisions are running; say which one: --pid";
        for (const ControlSocket& each : running) {
            error += " " + std::to_string(each.pid);
        }
    }
    return std::nullopt;
}

std::optional<std::string> ask(const std::string& socket, const std::string& request, std::string& error) {
    constexpr int longestWait = 10; // seconds
    const auto address = socketAddress(socket);
    if (!address) {
        error = socket + ": the name is too long";
        return std::nullopt;
    }
    const int connection = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    const timeval limit{longestWait, 0};
    setsockopt(connection, SOL_SOCKET, SO_RCVTIMEO, &limit, sizeof(limit));
    setsockopt(connection, SOL_SOCKET, SO_SNDTIMEO, &limit, sizeof(limit));
    std::string line = request + "\n";
    std::string answer;
    if (connect(connection, reinterpret_cast<const sockaddr*>(&*address), sizeof(*address)) != 0) {
        error = std::string("no television at ") + socket + ": " + g_strerror(errno);
    } else {
        while (!line.empty()) {
            const ssize_t size = send(connection, line.data(), line.size(), MSG_NOSIGNAL);
            if (size < 0) {
                break; // what it has answered tells why
            }
            line.erase(0, static_cast<size_t>(size));
        }
        char piece[4096];
        while (answer.find('\n') == std::string::npos) {
            const ssize_t size = recv(connection, piece, sizeof(piece), 0);
            if (size <= 0) {
                error = size < 0 && errno == EAGAIN ? "the television does not answer"
                                                    : "the television has closed the connection";
                break;
            }
            answer.append(piece, static_cast<size_t>(size));
        }
    }
    close(connection);
    const size_t end = answer.find('\n');
    return end == std::string::npos ? std::nullopt : std::optional(answer.substr(0, end));
}
