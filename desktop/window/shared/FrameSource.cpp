// The video frames of the platform library that the plug-in has loaded.
#include "desktop/window/shared/FrameSource.h"

namespace desktop {

FrameSource::FrameSource(telix_desktop_wakeup wakeup, void* data) : m_wakeup(wakeup), m_wakeupData(data) {}

FrameSource::~FrameSource() {
    if (!m_isBound) {
        return;
    }
    if (m_wakeup) {
        m_setWakeup(nullptr, nullptr);
    }
    m_release(&m_frame);
}

bool FrameSource::find() {
    if (!m_isFound && m_library.find()) {
        m_isFound = true;
        bind();
    }
    return m_isFound;
}

void FrameSource::bind() {
    m_isBound = m_library.bind("telix_desktop_acquire_frame", m_acquire) &&
                m_library.bind("telix_desktop_release_frame", m_release) &&
                m_library.bind("telix_desktop_set_wakeup", m_setWakeup);
    if (m_isBound && m_wakeup) {
        m_setWakeup(m_wakeup, m_wakeupData);
    }
}

void FrameSource::refresh() {
    if (!m_isBound) {
        return;
    }
    m_release(&m_frame);
    m_acquire(&m_frame);
}

void FrameSource::drop() {
    if (m_isBound) {
        m_release(&m_frame);
    }
}

} // namespace desktop
