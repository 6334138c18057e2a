// A platform whose video frame is a test pattern: four quadrants, red and green above, blue and white below.
// A page sets the display area as for any broadcast; setChannelByTriplet(WIDTH, HEIGHT, CONTENT) of an object
// shows the frame with the aspect ratio WIDTH to HEIGHT for this object, removes it, or calls the wake-up
// callback continuously (see Content). When the window removes its callback, and for each frame that it
// releases afterwards, a line is written to standard error.
#include "desktop/platform/telix_picture.h"
#include "tests/support/RecordingPlatform.h"

#include <atomic>
#include <cstdio>
#include <map>
#include <mutex>
#include <thread>

namespace {

enum class Content { None = 0, Pattern = 1, InvertedPattern = 2, WakeupStorm = 3 };

constexpr uint32_t kWidth = 64;
constexpr uint32_t kHeight = 36;
constexpr uint32_t kStride = kWidth + 8; // in pixels, with padding after each line
constexpr uint32_t kPadding = 0xFF123456;
constexpr int kStormThreads = 3;
constexpr TELIX_JS_DISPLAY_AREA kWholePage{0, 0, 1280, 720};

uint32_t pattern[kStride * kHeight];
uint32_t invertedPattern[kStride * kHeight];
std::mutex mutex; // guards the next two
telix_desktop_frame current{};
std::map<uint64_t, TELIX_JS_DISPLAY_AREA> areas; // of the objects by their handles
std::atomic<int> acquiredFrames{0};

std::mutex wakeupMutex; // held while the wake-up runs
telix_desktop_wakeup wakeup = nullptr;
void* wakeupData = nullptr;

void wake() {
    std::lock_guard<std::mutex> lock(wakeupMutex);
    if (wakeup) {
        wakeup(wakeupData);
    }
}

void draw() {
    for (uint32_t y = 0; y < kHeight; ++y) {
        for (uint32_t x = 0; x < kStride; ++x) {
            const bool isRight = x >= kWidth / 2;
            const uint32_t upper = isRight ? 0x0000FF00 : 0x00FF0000;
            const uint32_t lower = isRight ? 0x00FFFFFF : 0x000000FF;
            const uint32_t colour = x >= kWidth ? kPadding : y < kHeight / 2 ? upper : lower;
            pattern[y * kStride + x] = colour;
            invertedPattern[y * kStride + x] = x >= kWidth ? kPadding : colour ^ 0x00FFFFFF;
        }
    }
}

const uint32_t* pixelsOf(Content content) {
    switch (content) {
    case Content::None:
        return nullptr;
    case Content::InvertedPattern:
        return invertedPattern;
    default:
        return pattern;
    }
}

void placeLocked() {
    const TELIX_JS_DISPLAY_AREA area = current.presenter == 0 ? kWholePage : areas[current.presenter];
    current.areaX = area.x;
    current.areaY = area.y;
    current.areaWidth = area.width;
    current.areaHeight = area.height;
}

void show(TELIX_JS_VB_HANDLE object, int32_t aspectWidth, int32_t aspectHeight, Content content) {
    {
        std::lock_guard<std::mutex> lock(mutex);
        current.presenter = object;
        current.visible = content == Content::None ? 0 : 1;
        current.pixels = reinterpret_cast<const uint8_t*>(pixelsOf(content));
        current.width = kWidth;
        current.height = kHeight;
        current.stride = kStride * sizeof(uint32_t);
        current.aspectWidth = static_cast<uint32_t>(aspectWidth);
        current.aspectHeight = static_cast<uint32_t>(aspectHeight);
        ++current.serial;
        placeLocked();
    }
    wake();
}

void wakeContinuously() {
    for (;;) {
        {
            std::lock_guard<std::mutex> lock(mutex);
            ++current.serial;
        }
        wake();
    }
}

const bool scenario = [] {
    draw();
    RecordingPlatform& platform = *telix_recording_platform();
    platform.TELIX_JS_VB_GetHandle = [](TELIX_JS_VB_HANDLE* object) {
        std::lock_guard<std::mutex> lock(mutex);
        *object = static_cast<TELIX_JS_VB_HANDLE>(areas.size() + 1);
        areas[*object] = kWholePage;
        return TELIX_RETCODE_SUCCESS;
    };
    // Without a broadcast object the video fills the page.
    platform.TELIX_JS_VB_Release = [](TELIX_JS_VB_HANDLE object) {
        {
            std::lock_guard<std::mutex> lock(mutex);
            current.presenter = current.presenter == object ? 0 : current.presenter;
            placeLocked();
        }
        wake();
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_SetDisplayArea = [](TELIX_JS_VB_HANDLE object, const TELIX_JS_DISPLAY_AREA* area) {
        {
            std::lock_guard<std::mutex> lock(mutex);
            areas[object] = *area;
            placeLocked();
        }
        wake();
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_SetFullScreen = [](TELIX_JS_VB_HANDLE, ___UINT8 on) {
        {
            std::lock_guard<std::mutex> lock(mutex);
            current.fullScreen = on;
        }
        wake();
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_IsFullScreen = [](TELIX_JS_VB_HANDLE, ___UINT8* on) {
        std::lock_guard<std::mutex> lock(mutex);
        *on = current.fullScreen;
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_SetChannelByTriplet = [](TELIX_JS_VB_HANDLE object, int32_t onid, int32_t tsid,
                                                  int32_t sid) {
        const auto content = static_cast<Content>(sid);
        show(object, onid, tsid, content);
        for (int number = 0; content == Content::WakeupStorm && number < kStormThreads; ++number) {
            std::thread(wakeContinuously).detach();
        }
        return TELIX_RETCODE_SUCCESS;
    };
    return true;
}();

} // namespace

extern "C" void telix_desktop_set_wakeup(telix_desktop_wakeup function, void* data) {
    {
        std::lock_guard<std::mutex> lock(wakeupMutex);
        wakeup = function;
        wakeupData = data;
        if (!function) {
            std::fprintf(stderr, "picture: wake-up removed\n");
        }
    }
    wake();
}

extern "C" void telix_desktop_acquire_frame(telix_desktop_frame* frame) {
    std::lock_guard<std::mutex> lock(mutex);
    ++acquiredFrames;
    *frame = current;
    frame->owner = &acquiredFrames;
}

extern "C" void telix_desktop_release_frame(telix_desktop_frame* frame) {
    if (frame->owner) {
        --acquiredFrames;
    }
    *frame = {};
    std::lock_guard<std::mutex> lock(wakeupMutex);
    if (!wakeup) {
        std::fprintf(stderr, "picture: %d frames not released\n", acquiredFrames.load());
    }
}

extern "C" uint64_t telix_desktop_newest_presenter() {
    std::lock_guard<std::mutex> lock(mutex);
    return areas.size();
}
