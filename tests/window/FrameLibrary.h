// A libtelix.so with a video plane that a test controls. The functions are looked up with dlsym.
#ifndef TELIX_TESTS_WINDOW_FRAMELIBRARY_H
#define TELIX_TESTS_WINDOW_FRAMELIBRARY_H

#include <cstdint>

// Shows a frame whose bytes all have that value; hides the video for a width of 0.
using ShowFrameFunction = void (*)(uint32_t width, uint32_t height, uint8_t value);
// From now on the frames are those of the object with that number, in full screen or not.
using SetPresenterFunction = void (*)(uint64_t presenter, bool isFullScreen);
// The frames that are acquired and not released.
using CountFramesFunction = int (*)();
// Whether there is a wake-up callback.
using HasWakeupFunction = bool (*)();

#endif
