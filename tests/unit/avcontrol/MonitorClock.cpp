// The clock of the test's own `sleep`. It waits with plain pthread calls, since a monitor is cancelled
// while it sleeps.
#include "tests/unit/avcontrol/MonitorClock.h"

#include <cerrno>
#include <ctime>
#include <memory>

#include <gtest/gtest.h>

namespace {

constexpr time_t kBound = 40; // seconds, for what comes at once unless it never comes

} // namespace

class MonitorClock::Lock {
public:
    explicit Lock(pthread_mutex_t& mutex) : m_mutex(mutex) { pthread_mutex_lock(&m_mutex); }
    Lock(const Lock&) = delete;
    Lock& operator=(const Lock&) = delete;
    ~Lock() { pthread_mutex_unlock(&m_mutex); }

private:
    pthread_mutex_t& m_mutex;
};

// Counts a thread to its end, whatever ends it.
class MonitorThread {
public:
    MonitorThread() = default;
    MonitorThread(const MonitorThread&) = delete;
    MonitorThread& operator=(const MonitorThread&) = delete;
    ~MonitorThread() {
        const MonitorClock::Lock lock(clock().m_mutex);
        --clock().m_threads;
        ++clock().m_ended;
        pthread_cond_broadcast(&clock().m_changed);
    }

    // Counts the thread as sleeping until the clock moves, or until it is cancelled.
    class Sleep {
    public:
        Sleep() { ++clock().m_sleeping; }
        Sleep(const Sleep&) = delete;
        Sleep& operator=(const Sleep&) = delete;
        ~Sleep() {
            if (!isOver()) {
                --clock().m_sleeping;
            }
        }
        bool isOver() const { return m_began != clock().m_now; }

    private:
        const unsigned long m_began = clock().m_now;
    };

    // A thread's body, as it was given to `pthread_create`.
    struct Body {
        void* (*function)(void*);
        void* argument;
    };
    static void* run(void* given) {
        const std::unique_ptr<const Body> body(static_cast<const Body*>(given));
        const MonitorThread presence;
        return body->function(body->argument);
    }

private:
    static MonitorClock& clock() { return MonitorClock::instance(); }
};

MonitorClock& MonitorClock::instance() {
    static auto* clock = new MonitorClock; // kept: threads may outlive everything else
    return *clock;
}

// Made on the main thread, which is the browser's.
[[maybe_unused]] static const MonitorClock& s_made = MonitorClock::instance();

template <class Condition>
bool MonitorClock::waitUntil(Condition condition) {
    timespec end{};
    clock_gettime(CLOCK_REALTIME, &end);
    end.tv_sec += kBound;
    while (!condition()) {
        if (pthread_cond_timedwait(&m_changed, &m_mutex, &end) != 0) {
            ADD_FAILURE() << "The monitors didn't come to rest: " << m_sleeping << " of " << m_threads
                          << " sleep.";
            return false;
        }
    }
    return true;
}

void MonitorClock::await(size_t sleeping) {
    const Lock lock(m_mutex);
    waitUntil([&] { return m_sleeping == sleeping && m_threads == sleeping; });
}

void MonitorClock::awaitEnded(size_t ended) {
    const Lock lock(m_mutex);
    waitUntil([&] { return m_ended == ended; });
}

void MonitorClock::second() {
    const Lock lock(m_mutex);
    waitUntil([&] { return m_sleeping == m_threads; });
    ++m_now;
    pthread_cond_broadcast(&m_changed);
    m_sleeping = 0;
    waitUntil([&] { return m_sleeping == m_threads; });
}

void MonitorClock::seconds(unsigned count) {
    for (unsigned i = 0; i < count; ++i) {
        second();
    }
}

void MonitorClock::runFreely(bool free) {
    const Lock lock(m_mutex);
    m_free = free;
    pthread_cond_broadcast(&m_changed);
}

size_t MonitorClock::sleeping() {
    const Lock lock(m_mutex);
    return m_sleeping;
}

size_t MonitorClock::ended() {
    const Lock lock(m_mutex);
    return m_ended;
}

void MonitorClock::reset() {
    const Lock lock(m_mutex);
    m_ended = 0;
    m_free = false;
    m_refusesThreads = false;
    m_refusesCancellation = false;
    m_browserSleeps = 0;
    m_whenBrowserSleeps = nullptr;
}

void MonitorClock::sleepOneSecond() {
    if (pthread_equal(pthread_self(), m_browserThread)) {
        ++m_browserSleeps;
        if (m_whenBrowserSleeps) {
            m_whenBrowserSleeps();
        }
        return;
    }
    const Lock lock(m_mutex);
    const MonitorThread::Sleep sleep;
    pthread_cond_broadcast(&m_changed);
    if (m_free) {
        pthread_testcancel();
    }
    while (!sleep.isOver() && !m_free) {
        pthread_cond_wait(&m_changed, &m_mutex);
    }
}

int reallyCreateThread(pthread_t* thread, const pthread_attr_t* attributes, void* (*body)(void*),
                       void* argument) __asm__("__real_pthread_create");

int MonitorClock::createThread(pthread_t* thread, const pthread_attr_t* attributes, void* (*body)(void*),
                               void* argument) {
    if (m_refusesThreads) {
        return EAGAIN;
    }
    auto given = std::make_unique<const MonitorThread::Body>(MonitorThread::Body{body, argument});
    const Lock lock(m_mutex);
    const int result = reallyCreateThread(thread, attributes, MonitorThread::run,
                                          const_cast<MonitorThread::Body*>(given.get()));
    if (result == 0) {
        ++m_threads;
        static_cast<void>(given.release()); // the thread's own
    }
    return result;
}

int reallyCancelThread(pthread_t thread) __asm__("__real_pthread_cancel");

int MonitorClock::cancelThread(pthread_t thread) const {
    return m_refusesCancellation ? ESRCH : reallyCancelThread(thread);
}

int64_t reallyGetTime() __asm__("__real_g_get_monotonic_time");

int64_t MonitorClock::monotonicTime() const {
    return reallyGetTime() + m_secondsAhead * INT64_C(1000000);
}

// The linker leads this program's objects here (tests/unit/CMakeLists.txt).
extern "C" int __wrap_pthread_create(pthread_t* thread, const pthread_attr_t* attributes,
                                     void* (*body)(void*), void* argument) {
    return MonitorClock::instance().createThread(thread, attributes, body, argument);
}

extern "C" int __wrap_pthread_cancel(pthread_t thread) {
    return MonitorClock::instance().cancelThread(thread);
}

extern "C" int64_t __wrap_g_get_monotonic_time() {
    return MonitorClock::instance().monotonicTime();
}

extern "C" unsigned int sleep(unsigned int seconds) {
    for (unsigned int i = 0; i < seconds; ++i) {
        MonitorClock::instance().sleepOneSecond();
    }
    return 0;
}
