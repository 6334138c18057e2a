// The calls of pages in the web process that wait for the window: functions that create, destroy, show and
// hide applications.
#include "desktop/window/webkit/PageChannel.h"

#include <fcntl.h>
#include <glib-unix.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdlib>
#include <vector>

namespace desktop {

namespace {

// Longer than any URL that servers accept; a longer message is refused by the socket.
constexpr std::size_t kMaxMessage = 128 * 1024;

} // namespace

PageChannel::~PageChannel() {
    stopProcess();
}

void PageChannel::stopProcess() {
    if (m_own < 0) {
        return;
    }
    g_source_remove(m_watch);
    close(m_own);
    close(m_inherited);
    m_own = m_inherited = -1;
}

int PageChannel::startProcess() {
    stopProcess();
    ++m_generation;
    int ends[2];
    if (socketpair(AF_UNIX, SOCK_SEQPACKET, 0, ends) != 0) {
        return -1;
    }
    m_own = ends[0];
    m_inherited = ends[1];
    fcntl(m_own, F_SETFD, FD_CLOEXEC);
    m_watch = g_unix_fd_add(
        m_own, static_cast<GIOCondition>(G_IO_IN | G_IO_HUP),
        [](gint, GIOCondition, gpointer channel) -> gboolean {
            return static_cast<PageChannel*>(channel)->onReadable();
        },
        this);
    return m_inherited;
}

// Returns whether to go on reading.
bool PageChannel::onReadable() {
    std::vector<char> message(kMaxMessage);
    const ssize_t size = recv(m_own, message.data(), message.size(), MSG_DONTWAIT);
    if (size <= 0) {
        return size < 0 && (errno == EAGAIN || errno == EINTR);
    }
    const std::string text(message.data(), static_cast<std::size_t>(size));
    const std::size_t function = text.find('\n');
    const std::size_t argument = function == std::string::npos ? function : text.find('\n', function + 1);
    const Reply reply = [this, generation = m_generation](bool value) {
        if (generation == m_generation && m_own >= 0) {
            send(m_own, value ? "1" : "0", 1, MSG_DONTWAIT | MSG_NOSIGNAL);
        }
    };
    if (argument == std::string::npos || !m_handler) {
        reply(false);
        return true;
    }
    m_handler(std::strtoull(text.c_str(), nullptr, 10), text.substr(function + 1, argument - function - 1),
              text.substr(argument + 1), reply);
    return true;
}

} // namespace desktop
