// A platform that is short of memory as soon as somebody wants to know. It tells from a thread of its own,
// and says on standard error which calls it got and when the browser thread has dealt with the notice.
#include "tests/support/RecordingPlatform.h"

#include <cstdio>
#include <thread>

#include <glib.h>

namespace {

gboolean sayThatTheNoticeIsThrough(gpointer) {
    std::fputs("notice dealt with\n", stderr);
    return G_SOURCE_REMOVE;
}

void notify(TELIX_JS_APP_LOW_MEMORY_CB callback) {
    callback();
    // Behind whatever the callback has queued.
    g_idle_add(sayThatTheNoticeIsThrough, nullptr);
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
