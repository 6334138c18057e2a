// The television set behind libtelix.so: starts at the first call, owns the platform thread and what all
// calls share. Everything that calls must answer at once is plain data under one mutex; all other work, and
// every callback to the plug-in, happens on the platform thread.
#ifndef TELIX_DESKTOP_PLATFORM_H
#define TELIX_DESKTOP_PLATFORM_H

#include "desktop/platform/Configuration.h"
#include "desktop/platform/Picture.h"

#include <condition_variable>
#include <deque>
#include <functional>
#include <glib.h>
#include <mutex>

namespace desktop {

class Platform {
public:
    // The set. The first call of any thread starts it, and waits until the platform thread is up and
    // GStreamer is initialized on it. It lives as long as the process: GStreamer's threads may outlast any
    // destructor.
    static Platform& instance();

    Platform(const Platform&) = delete;
    Platform& operator=(const Platform&) = delete;

    // Runs `function` on the platform thread, in the order of the calls. Any thread; never runs it at once.
    void post(std::function<void()> function);

    // Runs `function` on the platform thread after `milliseconds`, and then again at that distance as long as
    // it returns true. Any thread.
    void postDelayed(unsigned int milliseconds, std::function<bool()> function);

    bool isPlatformThread() const;

    // For bus watches and the like of the platform thread.
    GMainContext* context() const { return m_context; }

    // Guards the state that calls read. Never hold it in a callback to the plug-in, nor while GStreamer is
    // waited for.
    std::mutex& mutex() { return m_mutex; }

    // Does not change after the start.
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
    bool m_isStarted = false;
    std::mutex m_postedMutex;
    std::deque<std::function<void()>> m_posted;
    Configuration m_configuration;
    Picture m_picture;
};

} // namespace desktop

#endif
