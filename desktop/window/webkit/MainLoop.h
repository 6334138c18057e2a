// Waiting on GLib's main loop.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_MAINLOOP_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_MAINLOOP_H

#include <functional>

namespace desktop {

// Starts an operation and runs the main loop until it calls its argument, which it may do at once, or until
// the timeout in milliseconds has passed. For callers that the engine takes as done when they return.
void runUntilDone(const std::function<void(std::function<void()> done)>& start, unsigned timeoutMs);

} // namespace desktop

#endif
