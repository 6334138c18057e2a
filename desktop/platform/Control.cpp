// The socket and its connections. Requests are read and answered piece by piece on the platform thread, with
// a lower priority than the television's own work, and never waited for.
#include "desktop/platform/Control.h"

#include "desktop/platform/ControlProtocol.h"
#include "desktop/platform/ControlSocket.h"
#include "desktop/platform/Platform.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <glib-unix.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

namespace desktop {

namespace {

constexpr size_t mostConnections = 32;
constexpr size_t pieceSize = 4096;             // read at a time, so that nobody keeps the thread
constexpr size_t mostUnread = size_t{4} << 20; // of answers that nobody reads
const char tooMany[] = R"({"ok":false,"error":"too many connections"})"
                       "\n";

std::string& socketPath() {
    static auto& path = *new std::string;
    return path;
}

// Runs at the end of the process, beside threads that still work.
void removeSocket() {
    const std::string& path = socketPath();
    if (path == controlSocketPath(path.substr(0, path.rfind('/')), getpid())) { // no copy of the process
        unlink(path.c_str());
    }
}

// Watches a descriptor on the platform thread until `function` gives false.
using Ready = std::function<bool()>;

GSource* watch(int descriptor, GIOCondition condition, Ready function) {
    GSource* source = g_unix_fd_source_new(descriptor, condition);
    g_source_set_priority(source, G_PRIORITY_DEFAULT_IDLE);
    const GUnixFDSourceFunc run = [](gint, GIOCondition, gpointer data) -> gboolean {
        return (*static_cast<Ready*>(data))() ? G_SOURCE_CONTINUE : G_SOURCE_REMOVE;
    };
    g_source_set_callback(source, G_SOURCE_FUNC(run), new Ready(std::move(function)),
                          [](gpointer data) { delete static_cast<Ready*>(data); });
    g_source_attach(source, Platform::instance().context());
    return source;
}

void unwatch(GSource*& source) {
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

class Control::Connection {
public:
    Connection(Control& control, int socket) : m_control(control), m_socket(socket) { resume(); }
    ~Connection() {
        unwatch(m_reading);
        unwatch(m_writing);
        close(m_socket);
    }
    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;

private:
    void resume() {
        if (!m_reading && !m_isEnding) {
            m_reading = watch(m_socket, G_IO_IN, [this] { return read(); });
        }
    }

    // The result is whether to watch on. The connection may be gone behind it.
    bool read() {
        char piece[pieceSize];
        const ssize_t size = recv(m_socket, piece, sizeof(piece), 0);
        if (size < 0) {
            return errno == EAGAIN || errno == EINTR || end();
        }
        if (size == 0) {
            if (!m_input.empty()) { // whoever wrote it may still read
                m_output += answerControlRequest(m_input) + "\n";
            }
            m_isEnding = true;
        }
        m_input.append(piece, static_cast<size_t>(size));
        size_t begin = 0;
        for (size_t at = m_input.find('\n'); at != std::string::npos; at = m_input.find('\n', begin)) {
            take(m_input.substr(begin, at - begin));
            begin = at + 1;
        }
        m_input.erase(0, begin);
        if (m_input.size() > longestControlRequest) {
            take(m_input);
            m_isEnding = true; // where the next line begins is not worth waiting for
        }
        return write() && m_reading;
    }

    void take(std::string line) {
        if (!line.empty() && line.back() == '\r') {
            line.pop_back();
        }
        if (!line.empty() && !m_isEnding) {
            m_output += answerControlRequest(line) + "\n";
        }
    }

    // Writes what the other side takes, and waits for it to take the rest. False if the connection is gone.
    bool write() {
        const ssize_t size = send(m_socket, m_output.data(), m_output.size(), MSG_NOSIGNAL);
        if (size < 0 && errno != EAGAIN && errno != EINTR) {
            return end();
        }
        m_output.erase(0, static_cast<size_t>(std::max<ssize_t>(size, 0)));
        if (m_output.size() > mostUnread || (m_output.empty() && m_isEnding)) {
            return end();
        }
        if (m_output.empty()) {
            unwatch(m_writing);
            resume();
        } else {
            unwatch(m_reading); // no more requests before the answers are read
            if (!m_writing) {
                m_writing = watch(m_socket, G_IO_OUT, [this] { return write() && m_writing; });
            }
        }
        return true;
    }

    bool end() {
        m_control.remove(this);
        return false;
    }

    Control& m_control;
    int m_socket;
    GSource* m_reading = nullptr;
    GSource* m_writing = nullptr;
    std::string m_input;
    std::string m_output;
    bool m_isEnding = false;
};

void Control::start() {
    static Control* control = nullptr; // kept until the process ends
    if (control) {
        return;
    }
    control = new Control;
    std::string error;
    if (!control->open(error)) {
        std::fprintf(stderr, "libtelix: no control socket: %s\n", error.c_str());
    }
}

bool Control::open(std::string& error) {
    const std::string folder = controlFolder(error);
    if (folder.empty()) {
        return false;
    }
    runningTelevisions(folder); // removes what others have left
    const std::string path = controlSocketPath(folder, getpid());
    const auto address = socketAddress(path);
    if (!address) {
        error = path + ": the name is too long";
        return false;
    }
    unlink(path.c_str()); // of a former process with this number
    m_socket = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    // The mode of the descriptor becomes that of the file: nobody else can connect even for a moment.
    if (m_socket < 0 || fchmod(m_socket, 0600) != 0 ||
        bind(m_socket, reinterpret_cast<const sockaddr*>(&*address), sizeof(*address)) != 0 ||
        ::listen(m_socket, 16) != 0) {
        error = path + ": " + g_strerror(errno);
        if (m_socket >= 0) {
            close(m_socket);
            m_socket = -1;
        }
        return false;
    }
    socketPath() = path;
    std::atexit(removeSocket);
    listen();
    return true;
}

void Control::listen() {
    GSource* source = watch(m_socket, G_IO_IN, [this] {
        accept();
        return m_socket >= 0;
    });
    g_source_unref(source); // the context keeps it
}

void Control::accept() {
    const int socket = accept4(m_socket, nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK);
    if (socket < 0) {
        if (errno == EMFILE || errno == ENFILE || errno == ENOBUFS || errno == ENOMEM) {
            g_usleep(10000); // the one who waits keeps the socket ready: do not spin
        }
        return;
    }
    if (!isOwner(socket)) {
        close(socket);
        return;
    }
    if (m_connections.size() >= mostConnections) {
        send(socket, tooMany, sizeof(tooMany) - 1, MSG_NOSIGNAL);
        close(socket);
        return;
    }
    m_connections.push_back(std::make_unique<Connection>(*this, socket));
}

void Control::remove(const Connection* connection) {
    m_connections.remove_if([connection](const auto& each) { return each.get() == connection; });
}

} // namespace desktop
