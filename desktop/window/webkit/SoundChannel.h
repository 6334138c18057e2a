// The sound of the web process on its way to the window.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_SOUNDCHANNEL_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_SOUNDCHANNEL_H

#include <functional>
#include <thread>

#include "desktop/platform/telix_sound.h"

namespace desktop {

// A socket pair that all web processes inherit, one after the other; their extension writes to it. Each
// message is a piece of sound: its time (8 bytes), then the samples. Made, used and ended on the main thread.
class SoundChannel {
public:
    // Called on the thread of this object.
    using Listener = std::function<void(const telix_desktop_sound& sound)>;

    // Before the first web process.
    explicit SoundChannel(Listener listener);
    // Afterwards the listener is not running and is never called again.
    ~SoundChannel();
    SoundChannel(const SoundChannel&) = delete;
    SoundChannel& operator=(const SoundChannel&) = delete;

    // The descriptor that web processes inherit; -1 if there is none.
    int inherited() const { return m_inherited; }

private:
    void run();

    Listener m_listener;
    int m_own = -1;
    int m_inherited = -1;
    std::thread m_thread;
};

} // namespace desktop

#endif
