// Copies the frames of the platform library that the plug-in has loaded into a ring for the window.
#include "desktop/window/frames/FramePublisher.h"

#include <pthread.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <utility>

namespace desktop {

namespace {

// Of 1280x720 pixels, which most broadcasts do not exceed.
constexpr size_t kUsualFrameSize = size_t{1280} * 720 * kBytesPerPixel;

} // namespace

FramePublisher::FramePublisher(SendRing sendRing)
    : m_sendRing(std::move(sendRing)), m_source(onWakeup, this) {}

FramePublisher::~FramePublisher() {
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        m_isEnding = true;
    }
    m_changed.notify_one();
    if (m_thread.joinable()) {
        m_thread.join();
    }
}

bool FramePublisher::start() {
    if (!m_thread.joinable() && m_source.find()) {
        m_thread = std::thread(&FramePublisher::run, this);
    }
    return m_thread.joinable();
}

// Called on threads of the platform library.
void FramePublisher::onWakeup(void* publisher) {
    auto& self = *static_cast<FramePublisher*>(publisher);
    {
        const std::lock_guard<std::mutex> lock(self.m_mutex);
        self.m_isWoken = true;
    }
    self.m_changed.notify_one();
}

void FramePublisher::run() {
    pthread_setname_np(pthread_self(), "telix-frames");
    while (waitForWakeup()) {
        publish();
    }
}

bool FramePublisher::waitForWakeup() {
    std::unique_lock<std::mutex> lock(m_mutex);
    m_changed.wait(lock, [this] { return m_isWoken || m_isEnding; });
    // Reset before the frame is acquired, so that one that arrives meanwhile is published as well.
    m_isWoken = false;
    return !m_isEnding;
}

void FramePublisher::publish() {
    m_source.refresh();
    telix_desktop_frame frame = m_source.frame();
    const size_t size = FrameWriter::sizeOf(frame);
    if (size == 0) {
        frame.visible = 0;
    }
    const bool isSent = m_writer && m_writer->publish(frame);
    if (!isSent && replaceRing(size)) {
        m_writer->publish(frame);
        m_sendRing(m_writer->memoryDescriptor(), m_writer->wakeupDescriptor());
    }
    // The frame is in the ring; its buffer goes back to the decoder.
    m_source.drop();
}

// The reader keeps what it has of the previous ring.
bool FramePublisher::replaceRing(size_t frameSize) {
    m_writer = FrameWriter::create(std::max(frameSize, kUsualFrameSize));
    if (!m_writer) {
        std::fprintf(stderr, "telix-tv: frames: %s\n", std::strerror(errno));
    }
    return m_writer != nullptr;
}

} // namespace desktop
