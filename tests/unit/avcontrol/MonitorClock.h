// The time of the buffering monitors: this executable has a `sleep` of its own, and the threads that call it
// go on when a test lets a second pass. The browser thread never waits in it. The monitors are counted from
// the call that makes them to their end, so that none is missed that has not come to run yet.
#ifndef TELIX_TESTS_UNIT_AVCONTROL_MONITORCLOCK_H
#define TELIX_TESTS_UNIT_AVCONTROL_MONITORCLOCK_H

#include <pthread.h>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <utility>

class MonitorClock {
public:
    static MonitorClock& instance();

    // Waits until this many monitors stand in `sleep` and none is on its way. The test fails if it doesn't
    // come to that.
    void await(size_t sleeping);
    // Waits until this many have ended since the last reset.
    void awaitEnded(size_t ended);
    // Lets each of the sleeping monitors go on, and waits until it sleeps again or has ended.
    void second();
    void seconds(unsigned count);
    // Monitors no longer stop in `sleep`, or stop again.
    void runFreely(bool free);

    size_t sleeping();
    // Threads that have ended since the last reset.
    size_t ended();

    // Whether pthread_create and pthread_cancel fail from now on.
    void refuseThreads(bool refuses) { m_refusesThreads = refuses; }
    void refuseCancellation(bool refuses) { m_refusesCancellation = refuses; }

    // How often the browser thread slept since the last reset, and what happens meanwhile.
    unsigned browserSleeps() const { return m_browserSleeps; }
    void whenBrowserSleeps(std::function<void()> what) { m_whenBrowserSleeps = std::move(what); }
    void reset();

    // Sets the monotonic time of GLib forward, for good.
    void advance(unsigned seconds) { m_secondsAhead += seconds; }

    void sleepOneSecond(); // what `sleep` does
    int createThread(pthread_t* thread, const pthread_attr_t* attributes, void* (*body)(void*),
                     void* argument);         // what `pthread_create` does
    int cancelThread(pthread_t thread) const; // what `pthread_cancel` does
    int64_t monotonicTime() const;            // what `g_get_monotonic_time` does

private:
    friend class MonitorThread;

    class Lock;

    template <class Condition>
    bool waitUntil(Condition condition);

    pthread_mutex_t m_mutex = PTHREAD_MUTEX_INITIALIZER;
    pthread_cond_t m_changed = PTHREAD_COND_INITIALIZER;
    const pthread_t m_browserThread = pthread_self();
    size_t m_threads = 0; // that live, or are being made
    size_t m_sleeping = 0;
    size_t m_ended = 0;
    unsigned long m_now = 0;
    bool m_free = false;
    bool m_refusesThreads = false;
    std::atomic<bool> m_refusesCancellation{false};
    unsigned m_browserSleeps = 0;
    std::function<void()> m_whenBrowserSleeps;
    std::atomic<unsigned> m_secondsAhead{0};
};

#endif
