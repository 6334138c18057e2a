// Finding the socket, and one request through it.
#include "desktop/telixctl/Television.h"

#include <cerrno>
#include <glib.h>
#include <sys/socket.h>
#include <sys/time.h>
#include <unistd.h>

#include "desktop/platform/ControlSocket.h"

namespace desktop {

namespace {

// A connected socket; negative, with the reason in `error`, if the connection fails.
int connectTo(const std::string& path, int64_t timeoutSeconds, std::string& error) {
    const auto address = socketAddress(path);
    if (!address) {
        error = path + ": the path is too long for a socket";
        return -1;
    }
    const int connection = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    const timeval timeout{static_cast<time_t>(timeoutSeconds), 0};
    setsockopt(connection, SOL_SOCKET, SO_RCVTIMEO, &timeout, sizeof(timeout));
    setsockopt(connection, SOL_SOCKET, SO_SNDTIMEO, &timeout, sizeof(timeout));
    if (connect(connection, reinterpret_cast<const sockaddr*>(&*address), sizeof(*address)) != 0) {
        error = path + ": cannot connect to a television: " + g_strerror(errno);
        close(connection);
        return -1;
    }
    return connection;
}

// After an error the rest is not sent: the response says why the television has stopped reading.
void sendAll(int connection, std::string bytes) {
    while (!bytes.empty()) {
        const ssize_t size = send(connection, bytes.data(), bytes.size(), MSG_NOSIGNAL);
        if (size < 0) {
            return;
        }
        bytes.erase(0, static_cast<size_t>(size));
    }
}

} // namespace

std::optional<std::string> findTelevision(const std::string& socket, pid_t pid, std::string& error) {
    if (!socket.empty()) {
        return socket;
    }
    const char* variable = g_getenv("TELIX_SOCKET");
    if (pid == 0 && variable && *variable) {
        return variable;
    }
    const std::string folder = controlFolder(error);
    if (folder.empty()) {
        return std::nullopt;
    }
    if (pid != 0) {
        return controlSocketPath(folder, pid);
    }
    const auto running = runningTelevisions(folder);
    if (running.size() == 1) {
        return running.front().path;
    }
    error = "no television is running";
    if (!running.empty()) {
        error = "several televisions are running: choose one with --pid:";
        for (const ControlSocket& each : running) {
            error += " " + std::to_string(each.pid);
        }
    }
    return std::nullopt;
}

std::optional<std::string> sendRequest(const std::string& socket, const std::string& request, int64_t timeout,
                                       std::string& error) {
    const int connection = connectTo(socket, timeout, error);
    if (connection < 0) {
        return std::nullopt;
    }
    sendAll(connection, request + "\n");
    std::string response;
    while (response.find('\n') == std::string::npos) {
        char buffer[4096];
        const ssize_t size = recv(connection, buffer, sizeof(buffer), 0);
        if (size <= 0) {
            error = socket + (size < 0 && errno == EAGAIN ? ": the television does not respond"
                                                          : ": the television has closed the connection");
            break;
        }
        response.append(buffer, static_cast<size_t>(size));
    }
    close(connection);
    const size_t end = response.find('\n');
    return end == std::string::npos ? std::nullopt : std::optional(response.substr(0, end));
}

} // namespace desktop
