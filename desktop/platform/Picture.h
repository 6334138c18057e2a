// What is to be seen: the newest frame of whoever presents now, broadcast or a player, and where the page
// wants it. The exported functions for the window are in telix_picture.h.
#ifndef TELIX_DESKTOP_PICTURE_H
#define TELIX_DESKTOP_PICTURE_H

#include "desktop/platform/telix_picture.h"

#include <condition_variable>
#include <cstdint>
#include <functional>
#include <gst/gst.h>
#include <mutex>

namespace desktop {

class Picture {
public:
    // Names a presentation; 0 names none. A presentation that has been replaced has no effect any more.
    using Token = uint64_t;

    // Where the picture stands on the page of 1280 by 720.
    struct View {
        int32_t x = 0;
        int32_t y = 0;
        uint32_t width = 1280;
        uint32_t height = 720;
        bool fullScreen = false;
    };

    // Begins a presentation, which takes the set's one media pipeline from the one before: that one's `lost`
    // is called on this thread, inside. `shown` is called once, when the first frame is there, on GStreamer's
    // thread. Platform thread.
    Token take(const View& view, std::function<void()> lost, std::function<void()> shown = nullptr);

    // Ends a presentation by its own will: `lost` is not called, the picture goes black. Platform thread.
    void release(Token token);

    // Places the picture. Any thread.
    void place(Token token, const View& view);

    // Removes the frame. Any thread.
    void blank(Token token);

    // Takes the picture from sight, or gives it back: what is shown meanwhile is there then. Any thread.
    void hide(Token token, bool isHidden);

    // A sink for pipelines: takes raw video of any format and shows it as `token`, in the place of the sink
    // made before. Until then there is no frame. The reference is floating; null if an element is missing.
    GstElement* makeSink(Token token);

    // The exported functions.
    void setWakeup(telix_desktop_wakeup wakeup, void* data);
    void acquire(telix_desktop_frame& frame);

private:
    struct Target;

    static GstFlowReturn showSample(const Target& target, GstSample* sample);
    void show(const Target& target, GstSample* sample);
    void wake();

    std::mutex m_mutex;
    Token m_last = 0;
    Token m_current = 0;
    uint64_t m_lastSink = 0; // by number
    View m_view;
    bool m_isHidden = false;
    GstSample* m_sample = nullptr; // one reference
    uint64_t m_serial = 0;
    std::function<void()> m_lost;
    std::function<void()> m_shown;

    std::mutex m_wakeupMutex; // held while the wake-up runs
    telix_desktop_wakeup m_wakeup = nullptr;
    void* m_wakeupData = nullptr;
};

} // namespace desktop

#endif
