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
constexpr std::size_t kMaxMessage = std::size_t{128} * 1024;

// The engine's launcher gives low numbers to descriptors of its own in the web process.
constexpr int kFirstInheritedDescriptor = 100;

} // namespace

PageChannel::PageChannel() {
    m_prepared = makePair();
}

PageChannel::~PageChannel() {
    if (m_watch) {
        g_source_remove(m_watch);
    }
    closePair(m_current);
    closePair(m_prepared);
}

PageChannel::Pair PageChannel::makePair() {
    int ends[2];
    if (socketpair(AF_UNIX, SOCK_SEQPACKET, 0, ends) != 0) {
        return {};
    }
    fcntl(ends[0], F_SETFD, FD_CLOEXEC);
    const Pair pair{ends[0], fcntl(ends[1], F_DUPFD, kFirstInheritedDescriptor)};
    close(ends[1]);
    return pair;
}

void PageChannel::closePair(const Pair& pair) {
    if (pair.own >= 0) {
        close(pair.own);
        close(pair.inherited);
    }
}

int PageChannel::useProcess() {
    if (m_watch) {
        g_source_remove(m_watch);
    }
    closePair(m_current);
    m_current = m_prepared;
    m_prepared = makePair();
    ++m_generation;
    m_watch = g_unix_fd_add(
        m_current.own, static_cast<GIOCondition>(G_IO_IN | G_IO_HUP),
        [](gint, GIOCondition, gpointer data) -> gboolean {
            auto* self = static_cast<PageChannel*>(data);
            const bool isOpen = self->onReadable();
            if (!isOpen) {
                self->m_watch = 0;
            }
            return isOpen;
        },
        this);
    return m_current.inherited;
}

// Returns whether to go on reading.
bool PageChannel::onReadable() {
    std::vector<char> message(kMaxMessage);
    const ssize_t size = recv(m_current.own, message.data(), message.size(), MSG_DONTWAIT);
    if (size <= 0) {
        return size < 0 && (errno == EAGAIN || errno == EINTR);
    }
    const std::string text(message.data(), static_cast<std::size_t>(size));
    const std::size_t function = text.find('\n');
    const std::size_t argument = function == std::string::npos ? function : text.find('\n', function + 1);
    const Reply reply = [this, generation = m_generation](bool value) {
        if (generation == m_generation && m_current.own >= 0) {
            send(m_current.own, value ? "1" : "0", 1, MSG_DONTWAIT | MSG_NOSIGNAL);
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
