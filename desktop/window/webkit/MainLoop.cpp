// Waiting on GLib's main loop.
#include "desktop/window/webkit/MainLoop.h"

#include <glib.h>

#include <memory>

namespace desktop {

void runUntilDone(const std::function<void(std::function<void()> done)>& start, unsigned timeoutMs) {
    // Shared with the operation, which may end after the timeout.
    const auto isDone = std::make_shared<bool>(false);
    bool isLate = false;
    const guint timer = g_timeout_add(
        timeoutMs,
        [](gpointer late) -> gboolean {
            *static_cast<bool*>(late) = true;
            return G_SOURCE_CONTINUE;
        },
        &isLate);
    start([isDone] { *isDone = true; });
    while (!*isDone && !isLate) {
        g_main_context_iteration(nullptr, TRUE);
    }
    g_source_remove(timer);
}

} // namespace desktop
