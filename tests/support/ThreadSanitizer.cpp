// For builds with ThreadSanitizer: lets it see that g_idle_add hands a record from one thread to another.
// GLib is not built with the sanitizer, and the lock by which the record passes is invisible to it. The
// program's own definition takes the place of the library's; everything else about the call is GLib's.
#include <glib.h>
#include <sanitizer/tsan_interface.h>

namespace {

struct HandOver {
    GSourceFunc function;
    gpointer data;
};

gboolean run(gpointer data) {
    __tsan_acquire(data);
    const auto* handOver = static_cast<const HandOver*>(data);
    return handOver->function(handOver->data);
}

void dispose(gpointer data) {
    delete static_cast<HandOver*>(data);
}

} // namespace

extern "C" guint g_idle_add(GSourceFunc function, gpointer data) {
    auto* handOver = new HandOver{function, data};
    __tsan_release(handOver);
    return g_idle_add_full(G_PRIORITY_DEFAULT_IDLE, run, handOver, dispose);
}
