// The television's timer on GLib's main loop.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_MAINLOOPTIMER_H
#define TELIX_DESKTOP_WINDOW_SHARED_MAINLOOPTIMER_H

#include "desktop/window/shared/Television.h"

namespace desktop {

// Runs on the thread of the default main context. Whoever has it stops it at last.
Television::Timer mainLoopTimer();

} // namespace desktop

#endif
