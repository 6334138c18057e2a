// The platform thread: its start, and functions that are posted to it.
#include "desktop/platform/Platform.h"

#include <gst/gst.h>

#include <cstdio>
#include <thread>

#include "desktop/platform/Control.h"

namespace desktop {

namespace {

// The user data of a timer.
struct RepeatedFunction {
    std::function<bool()> function;

    static gboolean run(gpointer data) {
        return static_cast<RepeatedFunction*>(data)->function() ? G_SOURCE_CONTINUE : G_SOURCE_REMOVE;
    }
    static void destroy(gpointer data) { delete static_cast<RepeatedFunction*>(data); }
};

} // namespace

Platform& Platform::instance() {
    static auto* platform = new Platform; // lives until the process ends
    return *platform;
}

Platform::Platform() : m_context(g_main_context_new()), m_configuration(Configuration::loadOrDefault()) {
    std::thread(&Platform::run, this).detach(); // runs until the process ends
    std::unique_lock<std::mutex> lock(m_startMutex);
    m_started.wait(lock, [this] { return m_isStarted; });
    // Control::start calls instance(), which blocks until this object is complete.
    post(Control::start);
}

void Platform::run() {
    g_main_context_push_thread_default(m_context);
    GError* error = nullptr;
    if (!gst_init_check(nullptr, nullptr, &error)) {
        std::fprintf(stderr, "libtelix: GStreamer: cannot be initialised, no video and no audio: %s\n",
                     error ? error->message : "unknown reason");
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
    {
        std::lock_guard<std::mutex> lock(m_postedMutex);
        m_posted.push_back(std::move(function));
    }
    GSource* source = g_idle_source_new();
    g_source_set_priority(source, G_PRIORITY_DEFAULT);
    g_source_set_callback(source, runPosted, this, nullptr);
    g_source_attach(source, m_context);
    g_source_unref(source); // the context owns it
}

// Each function has a source of its own, so that other sources are dispatched in between.
gboolean Platform::runPosted(gpointer platform) {
    auto* self = static_cast<Platform*>(platform);
    std::function<void()> function;
    {
        std::lock_guard<std::mutex> lock(self->m_postedMutex);
        function = std::move(self->m_posted.front());
        self->m_posted.pop_front();
    }
    function();
    return G_SOURCE_REMOVE;
}

void Platform::postDelayed(unsigned int milliseconds, std::function<bool()> function) {
    post([this, milliseconds, function = std::move(function)]() mutable {
        GSource* source = g_timeout_source_new(milliseconds);
        g_source_set_callback(source, RepeatedFunction::run, new RepeatedFunction{std::move(function)},
                              RepeatedFunction::destroy);
        g_source_attach(source, m_context);
        g_source_unref(source); // the context owns it
    });
}

bool Platform::isPlatformThread() const {
    return g_main_context_is_owner(m_context);
}

} // namespace desktop
