// The sound of the web process on its way to the window.
#include "desktop/window/webkit/SoundChannel.h"

#include <fcntl.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>
#include <utility>

#include "desktop/window/webkit/SoundMessage.h"

namespace desktop {

namespace {

// The engine's launcher gives low numbers to descriptors of its own in the web process.
constexpr int kFirstInheritedDescriptor = 100;

} // namespace

SoundChannel::SoundChannel(Listener listener) : m_listener(std::move(listener)) {
    int ends[2];
    if (socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, ends) != 0) {
        return;
    }
    m_own = ends[0];
    m_inherited = fcntl(ends[1], F_DUPFD, kFirstInheritedDescriptor);
    close(ends[1]);
    m_thread = std::thread(&SoundChannel::run, this);
}

SoundChannel::~SoundChannel() {
    if (m_thread.joinable()) {
        shutdown(m_own, SHUT_RD);
        m_thread.join();
        close(m_own);
        close(m_inherited);
    }
}

// The web process is not trusted: a message may have any size and time.
void SoundChannel::run() {
    constexpr size_t kFrameSize = sizeof(int16_t) * TELIX_DESKTOP_SOUND_CHANNELS;
    constexpr size_t kHeaderSize = offsetof(SoundMessage, samples);
    SoundMessage message;
    ssize_t size = 0;
    while ((size = recv(m_own, &message, sizeof message, 0)) > 0 || (size < 0 && errno == EINTR)) {
        if (size > static_cast<ssize_t>(kHeaderSize)) {
            const size_t frames = (static_cast<size_t>(size) - kHeaderSize) / kFrameSize;
            m_listener({message.samples, static_cast<uint32_t>(frames), message.time});
        }
    }
}

} // namespace desktop
