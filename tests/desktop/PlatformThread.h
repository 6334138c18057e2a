// The thread of the platform library, for tests.
#ifndef TELIX_TESTS_DESKTOP_PLATFORMTHREAD_H
#define TELIX_TESTS_DESKTOP_PLATFORMTHREAD_H

#include <future>

#include "desktop/platform/Platform.h"

// Waits until the thread has done what has been posted to it before.
inline void flushPlatformThread() {
    std::promise<void> isFlushed;
    desktop::Platform::instance().post([&isFlushed] { isFlushed.set_value(); });
    isFlushed.get_future().wait();
}

#endif
