// Start of the set, its thread, and how work gets there.
#include "desktop/platform/Platform.h"

#include "desktop/platform/Control.h"

#include <cstdio>
#include <gst/gst.h>
#include <thread>

namespace desktop {

namespace {

// A function on its way to the platform thread.
struct Posted {
    std::function<bool()> function;

    static gboolean run(gpointer data) {
        return static_cast<Posted*>(data)->function() ? G_SOURCE_CONTINUE : G_SOURCE_REMOVE;
    }
    static void destroy(gpointer data) { delete static_cast<Posted*>(data); }
};

void attach(GSource* source, GMainContext* context, std::function<bool()> function) {
    g_source_set_callback(source, Posted::run, new Posted{std::move(function)}, Posted::destroy);
    g_source_attach(source, context);
    g_source_unref(source); // the context keeps it
}

} // namespace

Platform& Platform::instance() {
    static auto* const platform = new Platform; // kept until the process ends
    return *platform;
}

Platform::Platform() : m_context(g_main_context_new()), m_configuration(Configuration::loadOrDefault()) {
    std::thread(&Platform::run, this).detach(); // ends with the process
    std::unique_lock<std::mutex> lock(m_startMutex);
    m_started.wait(lock, [this] { return m_isStarted; });
    post(Control::start); // runs when this object is complete
}

void Platform::run() {
    g_main_context_push_thread_default(m_context);
    GError* error = nullptr;
    if (!gst_init_check(nullptr, nullptr, &error)) {
        std::fprintf(stderr, "libtelix: no pictures and no sound: %s\n",
                     error ? error->message : "GStreamer");
        g_clear_error(&error);
    }
    {
        std::lock_guard<std::mutex> lock(m_startMutex);
        m_isStarted = true;
    }
    m_started.notify_all();
    GMainLoop* loop = g_main_loop_new(m_context, FALSE);
    g_main_loop_run(loop);
    g_main_loop_unref(loop);
}

void Platform::post(std::function<void()> function) {
    GSource* source = g_idle_source_new();
    g_source_set_priority(source, G_PRIORITY_DEFAULT);
    attach(source, m_context, [function = std::move(function)] {
        function();
        return false;
    });
}

void Platform::postDelayed(unsigned int milliseconds, std::function<bool()> function) {
    attach(g_timeout_source_new(milliseconds), m_context, std::move(function));
}

bool Platform::isPlatformThread() const {
    return g_main_context_is_owner(m_context);
}

} // namespace desktop
