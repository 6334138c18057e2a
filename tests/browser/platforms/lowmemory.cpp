// A platform that reports low memory as soon as a callback is registered, on its own thread. It logs to
// standard error which calls it gets, and when the browser thread has handled the callback.
#include "tests/support/RecordingPlatform.h"

#include <cstdio>
#include <thread>

#include <glib.h>

namespace {

gboolean logHandled(gpointer) {
    std::fputs("callback handled\n", stderr);
    return G_SOURCE_REMOVE;
}

void notify(TELIX_JS_APP_LOW_MEMORY_CB callback) {
    callback();
    // Runs after the idle source that the callback has added.
    g_idle_add(logHandled, nullptr);
}

const bool scenario = [] {
    RecordingPlatform& platform = *telix_recording_platform();
    platform.onCall = [](const std::string& call) { std::fprintf(stderr, "call %s\n", call.c_str()); };
    platform.TELIX_JS_APP_RegisterLowMemory = [](TELIX_JS_APP_LOW_MEMORY_CB callback) {
        std::thread(notify, callback).detach();
        return TELIX_RETCODE_SUCCESS;
    };
    return true;
}();

} // namespace
