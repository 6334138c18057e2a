// The video frames of the platform library that the plug-in has loaded.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_FRAMESOURCE_H
#define TELIX_DESKTOP_WINDOW_SHARED_FRAMESOURCE_H

#include "desktop/platform/telix_picture.h"
#include "desktop/window/shared/PlatformLibrary.h"

namespace desktop {

// All functions are for one thread.
class FrameSource {
public:
    // For frames that are looked at on other occasions, without a wake-up.
    FrameSource() = default;
    // `wakeup` is called with `data` on any thread when a frame or its placement is new, see telix_picture.h.
    FrameSource(telix_desktop_wakeup wakeup, void* data);
    // Afterwards the wake-up callback is not running and is never called again.
    ~FrameSource();
    FrameSource(const FrameSource&) = delete;
    FrameSource& operator=(const FrameSource&) = delete;

    // Looks for the platform library, see PlatformLibrary::find(), and returns whether it is found. One
    // without the functions of telix_picture.h has no frames.
    bool find();

    // Replaces the current frame by the newest one.
    void refresh();
    // Releases the current frame, whose buffer is free for the decoder again.
    void drop();
    // The frame of the last refresh(), valid until the next one or drop(). Not visible if there is no
    // library.
    const telix_desktop_frame& frame() const { return m_frame; }

private:
    void bind();

    telix_desktop_wakeup m_wakeup = nullptr;
    void* m_wakeupData = nullptr;
    PlatformLibrary m_library;
    bool m_isFound = false;
    bool m_isBound = false; // the library has all functions
    telix_desktop_set_wakeup_function m_setWakeup = nullptr;
    telix_desktop_acquire_frame_function m_acquire = nullptr;
    telix_desktop_release_frame_function m_release = nullptr;
    telix_desktop_frame m_frame{};
};

} // namespace desktop

#endif
