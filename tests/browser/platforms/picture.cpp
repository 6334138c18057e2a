// A platform whose picture is a known pattern: four quarters of one colour each, red, green in the upper
// half, blue, white in the lower. A page places it as it places any broadcast; setChannelByTriplet(WIDTH,
// HEIGHT, WHAT) shows it in the shape WIDTH to HEIGHT, or removes it, or wakes the window without end (see
// What). What the window does with the picture goes to standard error when it lets go of it.
#include "desktop/platform/telix_picture.h"
#include "tests/support/RecordingPlatform.h"

#include <atomic>
#include <cstdio>
#include <mutex>
#include <thread>

namespace {

enum What { nothing = 0, pattern = 1, patternInOtherColours = 2, storm = 3 };

constexpr uint32_t width = 64;
constexpr uint32_t height = 36;
constexpr uint32_t stride = width + 8; // in pixels; those behind the lines are never to be seen
constexpr uint32_t hidden = 0xFF123456;
constexpr TELIX_JS_VB_HANDLE onlyObject = 1;

uint32_t pixels[2][stride * height];
std::mutex mutex; // over what follows
telix_desktop_frame current{};
std::atomic<int> framesOut{0};

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
    for (uint32_t y = 0; y < height; ++y) {
        for (uint32_t x = 0; x < stride; ++x) {
            const bool isRight = x >= width / 2;
            const uint32_t upper = isRight ? 0x0000FF00 : 0x00FF0000;
            const uint32_t lower = isRight ? 0x00FFFFFF : 0x000000FF;
            const uint32_t colour = x >= width ? hidden : y < height / 2 ? upper : lower;
            pixels[0][y * stride + x] = colour;
            pixels[1][y * stride + x] = x >= width ? hidden : colour ^ 0x00FFFFFF;
        }
    }
}

void show(int32_t shapeWidth, int32_t shapeHeight, int32_t what) {
    {
        std::lock_guard<std::mutex> lock(mutex);
        current.visible = what == nothing ? 0 : 1;
        current.pixels =
            what == nothing ? nullptr
                            : reinterpret_cast<const uint8_t*>(pixels[what == patternInOtherColours ? 1 : 0]);
        current.width = width;
        current.height = height;
        current.stride = stride * sizeof(uint32_t);
        current.aspectWidth = static_cast<uint32_t>(shapeWidth);
        current.aspectHeight = static_cast<uint32_t>(shapeHeight);
        ++current.serial;
    }
    wake();
}

void place(int32_t x, int32_t y, uint32_t areaWidth, uint32_t areaHeight) {
    {
        std::lock_guard<std::mutex> lock(mutex);
        current.areaX = x;
        current.areaY = y;
        current.areaWidth = areaWidth;
        current.areaHeight = areaHeight;
    }
    wake();
}

void wakeWithoutEnd() {
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
        *object = onlyObject;
        return TELIX_RETCODE_SUCCESS;
    };
    // Nobody places the picture any more: it fills the page.
    platform.TELIX_JS_VB_Release = [](TELIX_JS_VB_HANDLE) {
        place(0, 0, 1280, 720);
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_SetDisplayArea = [](TELIX_JS_VB_HANDLE, const TELIX_JS_DISPLAY_AREA* area) {
        place(area->x, area->y, area->width, area->height);
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
    platform.TELIX_JS_VB_SetChannelByTriplet = [](TELIX_JS_VB_HANDLE, int32_t onid, int32_t tsid,
                                                  int32_t sid) {
        show(onid, tsid, sid);
        for (int number = 0; sid == storm && number < 3; ++number) {
            std::thread(wakeWithoutEnd).detach();
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
            std::fprintf(stderr, "picture: no wake-up any more\n");
        }
    }
    wake();
}

extern "C" void telix_desktop_acquire_frame(telix_desktop_frame* frame) {
    std::lock_guard<std::mutex> lock(mutex);
    ++framesOut;
    *frame = current;
    frame->owner = &framesOut;
}

extern "C" void telix_desktop_release_frame(telix_desktop_frame* frame) {
    if (frame->owner) {
        --framesOut;
    }
    *frame = {};
    std::lock_guard<std::mutex> lock(wakeupMutex);
    if (!wakeup) {
        std::fprintf(stderr, "picture: %d frames still out\n", framesOut.load());
    }
}
