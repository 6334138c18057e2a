// The core of libtelix.so: starts at the first call of the plug-in and owns what the subsystems share (the
// platform thread, the mutex, the configuration, the video plane).
//
// What a call must return at once is plain data under one mutex. All other work, and every callback to the
// plug-in, runs on the platform thread.
#ifndef TELIX_DESKTOP_PLATFORM_PLATFORM_H
#define TELIX_DESKTOP_PLATFORM_PLATFORM_H

#include <glib.h>

#include <condition_variable>
#include <deque>
#include <functional>
#include <mutex>

#include "desktop/platform/Configuration.h"
#include "desktop/platform/Picture.h"

namespace desktop {

class Platform {
public:
    // The first call, on any thread, starts the platform thread and waits until GStreamer is initialised on
    // it. The platform lives as long as the process, because GStreamer's threads may run longer than any
    // destructor.
    static Platform& instance();

    Platform(const Platform&) = delete;
    Platform& operator=(const Platform&) = delete;

    // Runs `function` on the platform thread, in the order of the calls and never before this returns. Any
    // thread.
    void post(std::function<void()> function);

    // Runs `function` on the platform thread after `milliseconds`, and again at that interval as long as it
    // returns true. Any thread.
    void postDelayed(unsigned int milliseconds, std::function<bool()> function);

    bool isPlatformThread() const;

    // The main context of the platform thread, for bus watches and other sources.
    GMainContext* context() const { return m_context; }

    // Guards the state that calls read. Not held in callbacks to the plug-in, nor while waiting for
    // GStreamer.
    std::mutex& mutex() { return m_mutex; }

    // Does not change after the start. Any thread.
    const Configuration& configuration() const { return m_configuration; }

    Picture& picture() { return m_picture; }

private:
    Platform();
    void run();
    static gboolean runPosted(gpointer platform);

    std::mutex m_mutex;
    GMainContext* m_context;
    std::mutex m_startMutex;
    std::condition_variable m_started;
    bool m_isStarted = false; // guarded by m_startMutex
    std::mutex m_postedMutex;
    std::deque<std::function<void()>> m_posted; // guarded by m_postedMutex
    Configuration m_configuration;
    Picture m_picture;
};

} // namespace desktop

#endif
