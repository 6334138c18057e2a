// Real time, with timers on the platform's main loop.
#include "desktop/platform/Clock.h"

#include <glib.h>

#include "desktop/platform/Platform.h"

namespace desktop {

namespace {

class RealClock final : public Clock {
public:
    Instant now() const override { return std::chrono::steady_clock::now(); }

    int64_t utcSeconds() const override { return g_get_real_time() / G_USEC_PER_SEC; }

    bool waitUntil(std::unique_lock<std::mutex>& lock, std::condition_variable& changed, Instant when,
                   const std::function<bool()>& isDone) override {
        return changed.wait_until(lock, when, isDone);
    }

    void callAfter(std::chrono::milliseconds delay, std::function<void()> function) override {
        Platform::instance().postDelayed(static_cast<unsigned int>(delay.count()),
                                         [function = std::move(function)] {
                                             function();
                                             return false; // once
                                         });
    }
};

} // namespace

Clock& Clock::real() {
    static auto* clock = new RealClock; // never destroyed: threads use it until the process ends
    return *clock;
}

} // namespace desktop
