// Under ThreadSanitizer only: a g_idle_add in front of GLib's. GLib hands sources over by locks of its own
// that the sanitizer cannot see, so this states what the hand-over guarantees: what a thread did before it
// queued has happened when the main loop runs the function. Nothing else is hidden from the sanitizer.
#ifdef __SANITIZE_THREAD__

#include <glib.h>
#include <sanitizer/tsan_interface.h>

namespace {

struct Hop {
    GSourceFunc function;
    gpointer data;
};

} // namespace

guint g_idle_add(GSourceFunc function, gpointer data) {
    auto* hop = new Hop{function, data};
    __tsan_release(hop);
    const auto run = [](gpointer queued) -> gboolean {
        __tsan_acquire(queued);
        const auto* arrived = static_cast<const Hop*>(queued);
        return arrived->function(arrived->data);
    };
    return g_idle_add_full(G_PRIORITY_DEFAULT_IDLE, run, hop,
                           [](gpointer done) { delete static_cast<Hop*>(done); });
}

#endif
