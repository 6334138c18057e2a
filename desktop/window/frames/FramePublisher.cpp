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
        if (publish() && m_onChange) {
            m_onChange();
        }
    }
}

bool FramePublisher::waitForWakeup() {
    std::unique_lock<std::mutex> lock(m_mutex);
    m_changed.wait(lock, [this] { return m_isWoken || m_isEnding; });
    // Reset before the frame is acquired, so that one that arrives meanwhile is published as well.
    m_isWoken = false;
    return !m_isEnding;
}

bool FramePublisher::publish() {
    const std::lock_guard<std::mutex> lock(m_ringMutex);
    m_source.refresh();
    const telix_desktop_frame& frame = m_source.frame();
    const Scene scene{frame.presenter, frame.fullScreen != 0, frame.visible != 0};
    const bool isOther = !(scene == m_scene);
    const bool isLeftOut = scene.presenter != 0 && scene.presenter == m_leftOut && !scene.isFullScreen;
    const bool isWatched = scene.presenter != 0 && scene.presenter == m_watched;
    m_scene = scene;
    // The first frame is published nevertheless, because the window is to know that there is video.
    if (isOther || !isLeftOut) {
        publishLocked(frame);
    }
    // The frame is in the ring; its buffer goes back to the decoder.
    m_source.drop();
    return isOther || isWatched;
}

void FramePublisher::publishLocked(telix_desktop_frame frame) {
    const size_t size = FrameWriter::sizeOf(frame);
    if (size == 0) {
        frame.visible = 0;
    }
    const bool isSent = m_writer && m_writer->publish(frame);
    if (!isSent && replaceRing(size)) {
        m_writer->publish(frame);
        m_sendRing(m_writer->memoryDescriptor(), m_writer->wakeupDescriptor());
    }
}

void FramePublisher::leaveOut(uint64_t presenter) {
    {
        const std::lock_guard<std::mutex> lock(m_ringMutex);
        m_leftOut = presenter;
    }
    if (presenter == 0) {
        publishNewest();
    }
}

void FramePublisher::publishNewest() {
    if (m_thread.joinable() && publish() && m_onChange) {
        m_onChange();
    }
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
