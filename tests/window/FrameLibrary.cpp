// A libtelix.so with a video plane that a test controls.
#include "tests/window/FrameLibrary.h"

#include <atomic>
#include <memory>
#include <mutex>
#include <vector>

#include "desktop/platform/telix_picture.h"

namespace {

using Pixels = std::shared_ptr<std::vector<uint8_t>>;

std::mutex frameMutex; // guards the next two
telix_desktop_frame current{};
Pixels currentPixels;
std::atomic<int> acquiredFrames{0};

std::mutex wakeupMutex; // held while the wake-up runs
telix_desktop_wakeup wakeup = nullptr;
void* wakeupData = nullptr;

} // namespace

void telix_desktop_set_wakeup(telix_desktop_wakeup function, void* data) {
    const std::lock_guard<std::mutex> lock(wakeupMutex);
    wakeup = function;
    wakeupData = data;
}

void telix_desktop_acquire_frame(telix_desktop_frame* frame) {
    const std::lock_guard<std::mutex> lock(frameMutex);
    *frame = current;
    frame->owner = new Pixels(currentPixels);
    acquiredFrames++;
}

void telix_desktop_release_frame(telix_desktop_frame* frame) {
    if (frame->owner) {
        delete static_cast<Pixels*>(frame->owner);
        acquiredFrames--;
    }
    *frame = {};
}

extern "C" {

TELIX_DESKTOP_API void showFrame(uint32_t width, uint32_t height, uint8_t value) {
    {
        const std::lock_guard<std::mutex> lock(frameMutex);
        currentPixels = std::make_shared<std::vector<uint8_t>>(size_t{width} * height * 4, value);
        current.visible = width > 0 ? 1 : 0;
        current.pixels = width > 0 ? currentPixels->data() : nullptr;
        current.width = width;
        current.height = height;
        current.stride = width * 4;
        current.serial++;
    }
    const std::lock_guard<std::mutex> lock(wakeupMutex);
    if (wakeup) {
        wakeup(wakeupData);
    }
}

TELIX_DESKTOP_API void setPresenter(uint64_t presenter, bool isFullScreen) {
    const std::lock_guard<std::mutex> lock(frameMutex);
    current.presenter = presenter;
    current.fullScreen = isFullScreen ? 1 : 0;
}

TELIX_DESKTOP_API int countFrames() {
    return acquiredFrames;
}

TELIX_DESKTOP_API bool hasWakeup() {
    const std::lock_guard<std::mutex> lock(wakeupMutex);
    return wakeup != nullptr;
}
}
