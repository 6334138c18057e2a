// Copies the frames of the platform library that the plug-in has loaded into a ring for the window.
#ifndef TELIX_DESKTOP_WINDOW_FRAMES_FRAMEPUBLISHER_H
#define TELIX_DESKTOP_WINDOW_FRAMES_FRAMEPUBLISHER_H

#include <atomic>
#include <condition_variable>
#include <functional>
#include <memory>
#include <mutex>
#include <thread>

#include "desktop/window/frames/FrameWriter.h"
#include "desktop/window/shared/FrameSource.h"

namespace desktop {

// Has a thread of its own, so that frames reach the window while a script keeps the main thread busy. Made,
// used and ended on the main thread.
class FramePublisher {
public:
    // Sends both descriptors of a ring to the window; they are valid during the call. Runs on the publisher's
    // thread, for the first ring and for each larger one, which has its first frame by then.
    using SendRing = std::function<void(int memory, int wakeup)>;

    explicit FramePublisher(SendRing sendRing);
    // Afterwards the library does not call any more and no frame is held.
    ~FramePublisher();
    FramePublisher(const FramePublisher&) = delete;
    FramePublisher& operator=(const FramePublisher&) = delete;

    // `onChange` runs on the publisher's thread when another object presents, when full screen or visibility
    // changes, and for each frame of the watched object. Before start().
    void setOnChange(std::function<void()> onChange) { m_onChange = std::move(onChange); }

    // Watches the frames of an object, a number of telix_picture.h; 0: of none.
    void watch(uint64_t presenter) { m_watched = presenter; }

    // Leaves out the frames of an object, which the window does not show; full screen is not left out. 0
    // leaves out none: the newest frame is in the ring when the call returns.
    void leaveOut(uint64_t presenter);

    // Does not wait for the publisher's thread: what there is to be seen is in the ring when the call
    // returns, and `onChange` has run if it is due.
    void publishNewest();

    // Searches the loaded libraries and starts once the platform library is among them. Returns whether it
    // is; cheap while no library has been loaded since the last call.
    bool start();

private:
    // What is to be seen, apart from the pixels and their place.
    struct Scene {
        uint64_t presenter = 0;
        bool isFullScreen = false;
        bool isVisible = false;

        bool operator==(const Scene& other) const {
            return presenter == other.presenter && isFullScreen == other.isFullScreen &&
                   isVisible == other.isVisible;
        }
    };

    static void onWakeup(void* publisher);
    void run();
    bool waitForWakeup();
    // Returns whether there is something for `onChange`.
    bool publish();
    void publishLocked(telix_desktop_frame frame);
    bool replaceRing(size_t frameSize);

    SendRing m_sendRing;
    std::function<void()> m_onChange;
    std::thread m_thread;
    std::atomic<uint64_t> m_watched{0};

    std::mutex m_mutex; // guards the next three
    std::condition_variable m_changed;
    bool m_isWoken = false;
    bool m_isEnding = false;

    std::mutex m_ringMutex; // guards what follows
    uint64_t m_leftOut = 0;
    Scene m_scene; // of the last frame
    std::unique_ptr<FrameWriter> m_writer;
    FrameSource m_source; // ends first: until then the library calls
};

} // namespace desktop

#endif
