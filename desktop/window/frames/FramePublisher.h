// Copies the frames of the platform library that the plug-in has loaded into a ring for the window.
#ifndef TELIX_DESKTOP_WINDOW_FRAMES_FRAMEPUBLISHER_H
#define TELIX_DESKTOP_WINDOW_FRAMES_FRAMEPUBLISHER_H

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

    // Searches the loaded libraries and starts once the platform library is among them. Returns whether it
    // is; cheap while no library has been loaded since the last call.
    bool start();

private:
    static void onWakeup(void* publisher);
    void run();
    bool waitForWakeup();
    void publish();
    bool replaceRing(size_t frameSize);

    SendRing m_sendRing;
    std::thread m_thread;

    std::mutex m_mutex; // guards what follows
    std::condition_variable m_changed;
    bool m_isWoken = false;
    bool m_isEnding = false;

    std::unique_ptr<FrameWriter> m_writer; // of the thread
    FrameSource m_source;                  // ends first: until then the library calls
};

} // namespace desktop

#endif
