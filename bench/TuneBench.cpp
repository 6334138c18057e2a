// How long a channel change of the desk's television takes: from the request to the first new frame of the
// test multiplex, beside a pipeline that decodes the same service from the beginning of its file, where a
// picture that stands for itself comes first and nothing is sent in real time.
#include <benchmark/benchmark.h>
#include <gst/gst.h>

#include <chrono>
#include <condition_variable>
#include <cstdio>
#include <mutex>
#include <string>
#include <thread>

#include "desktop/platform/Multiplex.h"
#include "desktop/platform/telix_picture.h"
#include "telix/telix_platform.h"

namespace {

using Clock = std::chrono::steady_clock;
constexpr int kTunes = 31;
constexpr auto kLimit = std::chrono::seconds(10);

std::mutex g_mutex;
std::condition_variable g_woken;
uint64_t g_wakeups = 0;

void onWakeup(void* data) {
    (void)data;
    {
        std::lock_guard<std::mutex> lock(g_mutex);
        ++g_wakeups;
    }
    g_woken.notify_all();
}

uint64_t newestFrame() {
    telix_desktop_frame frame{};
    telix_desktop_acquire_frame(&frame);
    const uint64_t serial = frame.visible != 0 ? frame.serial : 0;
    telix_desktop_release_frame(&frame);
    return serial;
}

// Waits until the picture is black, or until there is one.
bool waitForPicture(bool wanted) {
    const auto end = Clock::now() + kLimit;
    for (;;) {
        uint64_t before = 0;
        {
            std::lock_guard<std::mutex> lock(g_mutex);
            before = g_wakeups;
        }
        if ((newestFrame() != 0) == wanted) {
            return true;
        }
        std::unique_lock<std::mutex> lock(g_mutex);
        if (!g_woken.wait_until(lock, end, [&] { return g_wakeups != before; })) {
            return false;
        }
    }
}

// The set, with its channels, once.
struct Set {
    TELIX_JS_VB_HANDLE object = 0;
    TELIX_JS_CM_HANDLE* channels = nullptr;
    uint32_t count = 0;

    Set() {
        TELIX_JS_VB_GetHandle(&object);
        TELIX_JS_CM_GetChannelList(&count, &channels);
        telix_desktop_set_wakeup(onWakeup, nullptr);
    }
    ~Set() {
        telix_desktop_set_wakeup(nullptr, nullptr);
        TELIX_JS_VB_Release(object);
    }
};

void channelChange(benchmark::State& state) {
    static Set set;
    static uint32_t next = 0;
    for (auto each : state) {
        (void)each;
        if (set.count < 2) {
            state.SkipWithError("there are no channels to change between");
            return;
        }
        // Right after a picture that stands for itself the next one is furthest away: viewers zap at any
        // time.
        std::this_thread::sleep_for(std::chrono::milliseconds(next * 137 % 500));
        const auto begin = Clock::now();
        TELIX_JS_VB_SetChannel(set.object, set.channels[next++ % set.count], 0);
        // The frame of the channel before goes first.
        if (!waitForPicture(false) || !waitForPicture(true)) {
            state.SkipWithError("no picture came");
            return;
        }
        state.SetIterationTime(std::chrono::duration<double>(Clock::now() - begin).count());
    }
}

void decodeFromFile(benchmark::State& state) {
    gst_init(nullptr, nullptr);
    std::string error;
    const std::string file = desktop::makeTestMultiplex(error);
    const desktop::TestService& service = desktop::testServices().front();
    const std::string description = "filesrc location=\"" + file +
                                    "\" ! tsdemux program-number=" + std::to_string(service.serviceId) +
                                    " ! mpegvideoparse ! avdec_mpeg2video ! fakesink";
    for (auto each : state) {
        (void)each;
        GstElement* pipeline = gst_parse_launch(description.c_str(), nullptr);
        if (!pipeline) {
            state.SkipWithError("the pipeline cannot be made");
            return;
        }
        const auto begin = Clock::now();
        gst_element_set_state(pipeline, GST_STATE_PAUSED);
        // The sink holds the first frame then.
        const bool isReady =
            gst_element_get_state(pipeline, nullptr, nullptr, 10 * GST_SECOND) == GST_STATE_CHANGE_SUCCESS;
        state.SetIterationTime(std::chrono::duration<double>(Clock::now() - begin).count());
        gst_element_set_state(pipeline, GST_STATE_NULL);
        gst_object_unref(pipeline);
        if (!isReady) {
            state.SkipWithError("no frame came");
            return;
        }
    }
}

void inMilliseconds(benchmark::internal::Benchmark* bench) {
    bench->Iterations(1)->Repetitions(kTunes)->ReportAggregatesOnly()->UseManualTime()->Unit(
        benchmark::kMillisecond);
}

} // namespace

BENCHMARK(decodeFromFile)->Apply(inMilliseconds);
BENCHMARK(channelChange)->Apply(inMilliseconds);
BENCHMARK_MAIN();
