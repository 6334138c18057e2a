// The time that broadcast goes by: it paces playout, repeats tables, decides which programme is present, and
// ends a tune that has no outcome. Tests put another clock in its place (Broadcast::useClock).
#ifndef TELIX_DESKTOP_PLATFORM_CLOCK_H
#define TELIX_DESKTOP_PLATFORM_CLOCK_H

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <functional>
#include <mutex>

namespace desktop {

// The functions are called on any thread.
class Clock {
public:
    using Duration = std::chrono::steady_clock::duration;
    using Instant = std::chrono::steady_clock::time_point;

    // Real time. Lives as long as the process.
    static Clock& real();

    virtual ~Clock() = default;
    Clock(const Clock&) = delete;
    Clock& operator=(const Clock&) = delete;

    // Never goes back.
    virtual Instant now() const = 0;

    // The time of day in seconds since 1970, UTC. Goes back if somebody sets it back.
    virtual int64_t utcSeconds() const = 0;

    // Waits on `changed`, whose mutex `lock` holds, until `isDone` or until the clock reaches `when`. Returns
    // what `isDone` returns at the end.
    virtual bool waitUntil(std::unique_lock<std::mutex>& lock, std::condition_variable& changed, Instant when,
                           const std::function<bool()>& isDone) = 0;

    // Calls `function` once, on the platform thread, when `delay` has passed. It cannot be cancelled.
    virtual void callAfter(std::chrono::milliseconds delay, std::function<void()> function) = 0;

protected:
    Clock() = default;
};

} // namespace desktop

#endif
