// The television's timer on GLib's main loop.
#include "desktop/window/shared/MainLoopTimer.h"

#include <glib.h>

#include <memory>
#include <utility>

namespace desktop {

namespace {

struct State {
    guint source = 0; // 0: not running
    std::function<void()> onEnd;
};

void stop(State& state) {
    if (state.source) {
        g_source_remove(std::exchange(state.source, 0));
    }
}

gboolean end(gpointer data) {
    auto* state = static_cast<State*>(data);
    state->source = 0;
    // The call may start the timer again.
    const auto onEnd = std::exchange(state->onEnd, nullptr);
    onEnd();
    return G_SOURCE_REMOVE;
}

} // namespace

Television::Timer mainLoopTimer() {
    const auto state = std::make_shared<State>();
    return {[state](unsigned milliseconds, std::function<void()> onEnd) {
                stop(*state);
                state->onEnd = std::move(onEnd);
                state->source = g_timeout_add(milliseconds, end, state.get());
            },
            [state] { stop(*state); }};
}

} // namespace desktop
