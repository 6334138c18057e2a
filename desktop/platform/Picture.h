// The video plane under the page: the newest frame of the one presentation (broadcast or a media player), and
// where on the page it is shown. The functions that are exported to the window are in telix_picture.h.
#ifndef TELIX_DESKTOP_PLATFORM_PICTURE_H
#define TELIX_DESKTOP_PLATFORM_PICTURE_H

#include <gst/gst.h>

#include <atomic>
#include <cstdint>
#include <functional>
#include <mutex>

#include "desktop/platform/telix_picture.h"

namespace desktop {

// Has locks of its own; no function needs the platform's mutex.
class Picture {
public:
    // Identifies a presentation; 0: none. Every function ignores a token whose presentation has ended.
    using Token = uint64_t;

    // Identifies an object that can present: a video/broadcast object or a media player. 0: none.
    using Presenter = uint64_t;

    // Where on the page of 1280 by 720 pixels the video of an object is shown.
    struct View {
        Presenter presenter = 0;
        int32_t x = 0;
        int32_t y = 0;
        uint32_t width = 1280;
        uint32_t height = 720;
        bool fullScreen = false;
    };

    // The number of an object that is created now, increasing. Any thread.
    Presenter newPresenter() { return ++m_lastPresenter; }

    // Starts a presentation and preempts the previous one, whose `onPreempted` runs on this thread before the
    // function returns. `onFirstFrame` runs once, on GStreamer's thread. Platform thread.
    Token acquire(const View& view, std::function<void()> onPreempted,
                  std::function<void()> onFirstFrame = nullptr);

    // Ends a presentation; the video plane becomes black and `onPreempted` does not run. Returns whether it
    // has not been preempted. Platform thread.
    bool release(Token token);

    // The same for a presentation that has taken the picture from the running channel, which may have it
    // back.
    void leave(Token token);

    // Whether there is no presentation. Any thread.
    bool isFree() const;

    // Called from now on when a presentation leaves the picture, on the platform thread. Any thread.
    void setOnFree(std::function<void()> onFree);

    // Any thread, as the next two.
    void setView(Token token, const View& view);

    // Drops the frame; the next one is shown.
    void blank(Token token);

    // While it is hidden, frames still arrive, and the newest is there at once when it is shown again.
    void setHidden(Token token, bool isHidden);

    // The name of the GstBaseSink in the bin that makeSink() returns.
    static constexpr const char* kSinkName = "picture";

    // A sink for raw video of any format, which presents it as `token`. It replaces the sink that was made
    // last: that one's frames are dropped. A floating reference; null if an element is missing. Platform
    // thread.
    GstElement* makeSink(Token token);

    // The exported functions. Any thread.
    void setWakeup(telix_desktop_wakeup wakeup, void* data);
    void acquireFrame(telix_desktop_frame& frame);
    Presenter newestPresenter() const { return m_lastPresenter; }

private:
    struct SinkData;

    bool isCurrentLocked(Token token) const { return token != 0 && token == m_current; }
    static GstFlowReturn onSample(const SinkData& sink, GstSample* sample);
    void showSample(const SinkData& sink, GstSample* sample);
    GstSample* describeFrame(telix_desktop_frame& frame);
    void wakeUp();

    std::atomic<Presenter> m_lastPresenter{0};

    mutable std::mutex m_mutex; // guards what follows; not held in callbacks
    Token m_lastToken = 0;
    Token m_current = 0;
    uint64_t m_lastSink = 0; // the id of the sink that was made last
    View m_view;
    bool m_isHidden = false;
    GstSample* m_sample = nullptr; // owns a reference; null: no frame
    uint64_t m_serial = 0;
    std::function<void()> m_onPreempted;
    std::function<void()> m_onFree;
    std::function<void()> m_onFirstFrame;

    std::mutex m_wakeupMutex; // guards what follows; held while the wake-up runs
    telix_desktop_wakeup m_wakeup = nullptr;
    void* m_wakeupData = nullptr;
};

} // namespace desktop

#endif
