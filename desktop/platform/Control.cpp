// The socket and its connections. All of them are sources of the platform thread's main context, with a lower
// priority than the television's own work; reads and writes never block.
#include "desktop/platform/Control.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <glib-unix.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include "desktop/platform/ControlProtocol.h"
#include "desktop/platform/ControlSocket.h"
#include "desktop/platform/Platform.h"

namespace desktop {

namespace {

constexpr size_t kMaxConnections = 32;
constexpr int kBacklog = 16;
constexpr size_t kReadSize = 4096;                     // at a time, so that no client keeps the thread busy
constexpr size_t kMaxOutput = size_t{4} << 20;         // bytes of responses that the client has not read
constexpr useconds_t kDescriptorShortageDelay = 10000; // microseconds
const char kTooManyConnections[] = R"({"ok":false,"error":"too many connections"})"
                                   "\n";

ControlSocket& ownSocket() {
    static auto& socket = *new ControlSocket;
    return socket;
}

// Runs when the process exits, while other threads are still running. A forked child inherits the handler,
// but must not remove the socket of its parent.
void removeSocket() {
    if (ownSocket().pid == getpid()) {
        unlink(ownSocket().path.c_str());
    }
}

// Removes the socket of a process that has ended, and no file of another kind.
void removeStale(const std::string& path) {
    struct stat status {};
    if (lstat(path.c_str(), &status) == 0 && S_ISSOCK(status.st_mode)) {
        unlink(path.c_str());
    }
}

// Where to listen: on TELIX_SOCKET, else on a socket of this process in the user's folder. Empty, with the
// reason in `error`, if there is no such place.
std::string pathToListenOn(std::string& error) {
    if (const char* path = g_getenv("TELIX_SOCKET"); path && *path) {
        if (isListening(path)) {
            error = std::string(path) + ": in use by another television";
            return "";
        }
        return path;
    }
    const std::string folder = controlFolder(error);
    if (folder.empty()) {
        return "";
    }
    runningTelevisions(folder); // removes the sockets of processes that have ended
    return controlSocketPath(folder, getpid());
}

using ReadyFunction = std::function<bool()>;

// Calls `function` on the platform thread whenever the condition holds, until it returns false. The caller
// owns the source.
GSource* addDescriptorSource(int descriptor, GIOCondition condition, ReadyFunction function) {
    GSource* source = g_unix_fd_source_new(descriptor, condition);
    g_source_set_priority(source, G_PRIORITY_DEFAULT_IDLE);
    const GUnixFDSourceFunc run = [](gint, GIOCondition, gpointer data) -> gboolean {
        return (*static_cast<ReadyFunction*>(data))() ? G_SOURCE_CONTINUE : G_SOURCE_REMOVE;
    };
    g_source_set_callback(source, G_SOURCE_FUNC(run), new ReadyFunction(std::move(function)),
                          [](gpointer data) { delete static_cast<ReadyFunction*>(data); });
    g_source_attach(source, Platform::instance().context());
    return source;
}

void removeSource(GSource*& source) {
    if (source) {
        g_source_destroy(source);
        g_source_unref(source);
        source = nullptr;
    }
}

bool isOwner(int socket) {
    ucred credentials{};
    socklen_t length = sizeof(credentials);
    return getsockopt(socket, SOL_SOCKET, SO_PEERCRED, &credentials, &length) == 0 &&
           credentials.uid == geteuid();
}

} // namespace

// Handles one request after the other: the lines after one that waits for the window are not read.
class Control::Connection : public std::enable_shared_from_this<Connection> {
public:
    Connection(Control& control, int socket) : m_control(control), m_socket(socket) { resumeReading(); }
    ~Connection() {
        for (GSource** source : {&m_readSource, &m_writeSource, &m_hangupSource}) {
            removeSource(*source);
        }
        ::close(m_socket);
    }
    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;

private:
    void resumeReading() {
        removeSource(m_hangupSource);
        if (!m_readSource && !m_hasEnded) {
            m_readSource = addDescriptorSource(m_socket, G_IO_IN, [this] { return read(); });
        }
    }

    // Reads nothing until the response is there, but notices a client that leaves.
    void pauseReading() {
        removeSource(m_readSource);
        if (!m_hangupSource) {
            m_hangupSource = addDescriptorSource(m_socket, G_IO_HUP, [this] { return close(); });
        }
    }

    // Returns whether the source stays. The connection may have been deleted when this returns.
    bool read() {
        char buffer[kReadSize];
        const ssize_t size = recv(m_socket, buffer, sizeof(buffer), 0);
        if (size < 0) {
            return errno == EAGAIN || errno == EINTR || close();
        }
        m_hasEnded = size == 0; // the client may have shut down only its writing side
        m_input.append(buffer, static_cast<size_t>(size));
        return handleLines() && m_readSource;
    }

    // Returns false if the connection has been deleted.
    bool handleLines() {
        m_isHandling = true;
        while (!m_isWaiting && hasLine()) {
            handleLine();
        }
        m_isHandling = false;
        return write();
    }

    // A last line without an end counts, and an overlong one, whose end may never come.
    bool hasLine() {
        if (m_input.size() > kMaxControlRequest && m_input.find('\n') == std::string::npos) {
            m_hasEnded = true;
        }
        return m_input.find('\n') != std::string::npos || (m_hasEnded && !m_input.empty());
    }

    void handleLine() {
        const size_t end = std::min(m_input.find('\n'), m_input.size());
        std::string line = m_input.substr(0, end);
        m_input.erase(0, end + 1);
        if (!line.empty() && line.back() == '\r') {
            line.pop_back();
        }
        if (line.empty()) {
            return;
        }
        m_isWaiting = true;
        handleControlRequest(line, [client = weak_from_this()](const std::string& response) {
            if (const auto connection = client.lock()) {
                connection->onResponse(response);
            }
        });
    }

    void onResponse(const std::string& response) {
        m_output += response + "\n";
        m_isWaiting = false;
        if (!m_isHandling) {
            handleLines();
        }
    }

    // Writes as much as the socket accepts and waits until it accepts the rest. Returns false if the
    // connection has been deleted.
    bool write() {
        const ssize_t size = send(m_socket, m_output.data(), m_output.size(), MSG_NOSIGNAL);
        if (size < 0 && errno != EAGAIN && errno != EINTR) {
            return close();
        }
        m_output.erase(0, static_cast<size_t>(std::max<ssize_t>(size, 0)));
        if (m_output.size() > kMaxOutput || (m_output.empty() && m_hasEnded && !m_isWaiting)) {
            return close();
        }
        if (!m_output.empty()) {
            removeSource(m_readSource); // no more requests until the client has read the responses
            if (!m_writeSource) {
                m_writeSource =
                    addDescriptorSource(m_socket, G_IO_OUT, [this] { return write() && m_writeSource; });
            }
            return true;
        }
        removeSource(m_writeSource);
        if (m_isWaiting) {
            pauseReading();
        } else {
            resumeReading();
        }
        return true;
    }

    // Deletes the connection. Returns false.
    bool close() {
        m_control.remove(this);
        return false;
    }

    Control& m_control;
    int m_socket;
    GSource* m_readSource = nullptr;
    GSource* m_writeSource = nullptr;
    GSource* m_hangupSource = nullptr;
    std::string m_input;
    std::string m_output;
    bool m_isHandling = false; // in handleLines()
    bool m_isWaiting = false;  // for the response of a request
    bool m_hasEnded = false;   // nothing more is read; closed once everything is answered and written
};

void Control::start() {
    static Control* control = nullptr; // never deleted: requests may arrive until the process ends
    if (control) {
        return;
    }
    control = new Control;
    std::string error;
    if (!control->open(error)) {
        std::fprintf(stderr, "libtelix: control socket: %s\n", error.c_str());
    }
}

bool Control::open(std::string& error) {
    const std::string path = pathToListenOn(error);
    if (path.empty()) {
        return false;
    }
    const auto address = socketAddress(path);
    if (!address) {
        error = path + ": the path is too long for a socket";
        return false;
    }
    removeStale(path);
    m_socket = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    // The socket file gets the mode of the descriptor, so that no other user can connect at any time.
    if (m_socket < 0 || fchmod(m_socket, 0600) != 0 ||
        bind(m_socket, reinterpret_cast<const sockaddr*>(&*address), sizeof(*address)) != 0 ||
        ::listen(m_socket, kBacklog) != 0) {
        error = path + ": " + g_strerror(errno);
        if (m_socket >= 0) {
            close(m_socket);
            m_socket = -1;
        }
        return false;
    }
    ownSocket() = {getpid(), path};
    std::atexit(removeSocket);
    listen();
    return true;
}

void Control::listen() {
    GSource* source = addDescriptorSource(m_socket, G_IO_IN, [this] {
        accept();
        return true;
    });
    g_source_unref(source); // the context holds a reference
}

void Control::accept() {
    const int socket = accept4(m_socket, nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK);
    if (socket < 0) {
        if (errno == EMFILE || errno == ENFILE || errno == ENOBUFS || errno == ENOMEM) {
            g_usleep(kDescriptorShortageDelay); // the socket stays readable: do not spin
        }
        return;
    }
    if (!isOwner(socket)) {
        close(socket);
        return;
    }
    if (m_connections.size() >= kMaxConnections) {
        send(socket, kTooManyConnections, sizeof(kTooManyConnections) - 1, MSG_NOSIGNAL);
        close(socket);
        return;
    }
    m_connections.push_back(std::make_shared<Connection>(*this, socket));
}

void Control::remove(const Connection* connection) {
    m_connections.remove_if([connection](const auto& each) { return each.get() == connection; });
}

} // namespace desktop
