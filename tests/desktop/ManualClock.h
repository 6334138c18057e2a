// Clocks that a test advances.
#ifndef TELIX_TESTS_DESKTOP_MANUALCLOCK_H
#define TELIX_TESTS_DESKTOP_MANUALCLOCK_H

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <functional>
#include <mutex>
#include <set>
#include <utility>
#include <vector>

#include "desktop/platform/Clock.h"
#include "desktop/platform/Platform.h"

// Stands still until it is advanced.
class ManualClock : public desktop::Clock {
public:
    // `utcSeconds` since 1970 is the time of day at the start.
    explicit ManualClock(int64_t utcSeconds) : m_utc(std::chrono::seconds(utcSeconds)) {}

    // Ends the waits, and posts the timers, whose time has come.
    void advance(std::chrono::milliseconds duration) {
        std::vector<std::function<void()>> due;
        {
            std::lock_guard<std::mutex> lock(m_mutex);
            m_now += duration;
            m_utc += duration;
            const auto firstLater = std::stable_partition(
                m_timers.begin(), m_timers.end(), [this](const Timer& each) { return each.when <= m_now; });
            for (auto timer = m_timers.begin(); timer != firstLater; ++timer) {
                due.push_back(std::move(timer->function));
            }
            m_timers.erase(m_timers.begin(), firstLater);
        }
        m_waitsChanged.notify_all();
        for (std::function<void()>& function : due) {
            desktop::Platform::instance().post(std::move(function));
        }
    }

    // Waits until somebody waits for a time to come: what was due by now has been done. False if nobody does
    // so within half a minute.
    bool settle() {
        std::unique_lock<std::mutex> lock(m_mutex);
        return m_waitsChanged.wait_for(lock, std::chrono::seconds(30),
                                       [this] { return !m_waits.empty() && *m_waits.rbegin() > m_now; });
    }

    Instant now() const override {
        std::lock_guard<std::mutex> lock(m_mutex);
        return m_now;
    }

    int64_t utcSeconds() const override {
        std::lock_guard<std::mutex> lock(m_mutex);
        return std::chrono::duration_cast<std::chrono::seconds>(m_utc).count();
    }

    // Looks at short intervals: to notify `changed` safely, advance() would need the mutex of the waiting
    // class.
    bool waitUntil(std::unique_lock<std::mutex>& lock, std::condition_variable& changed, Instant when,
                   const std::function<bool()>& isDone) override {
        const Wait wait(*this, when);
        while (!isDone() && now() < when) {
            changed.wait_for(lock, std::chrono::milliseconds(1));
        }
        return isDone();
    }

    void callAfter(std::chrono::milliseconds delay, std::function<void()> function) override {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_timers.push_back({m_now + delay, std::move(function)});
    }

private:
    struct Timer {
        Instant when;
        std::function<void()> function;
    };

    // A wait that is going on.
    class Wait {
    public:
        Wait(ManualClock& clock, Instant when) : m_clock(clock) {
            std::lock_guard<std::mutex> lock(m_clock.m_mutex);
            m_place = m_clock.m_waits.insert(when);
            m_clock.m_waitsChanged.notify_all();
        }
        ~Wait() {
            std::lock_guard<std::mutex> lock(m_clock.m_mutex);
            m_clock.m_waits.erase(m_place);
        }
        Wait(const Wait&) = delete;
        Wait& operator=(const Wait&) = delete;

    private:
        ManualClock& m_clock;
        std::multiset<Instant>::iterator m_place;
    };

    mutable std::mutex m_mutex; // guards what follows
    std::condition_variable m_waitsChanged;
    Instant m_now{std::chrono::hours(1)};
    std::chrono::milliseconds m_utc;
    std::vector<Timer> m_timers;
    std::multiset<Instant> m_waits;
};

// Paces playout by real time, because a pipeline presents in real time. The time of day and the timers stand
// still until the clock is advanced.
class BroadcastClock : public ManualClock {
public:
    using ManualClock::ManualClock;

    Instant now() const override { return real().now(); }

    bool waitUntil(std::unique_lock<std::mutex>& lock, std::condition_variable& changed, Instant when,
                   const std::function<bool()>& isDone) override {
        return real().waitUntil(lock, changed, when, isDone);
    }
};

#endif
