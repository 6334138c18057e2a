// How long a channel change of the desktop television takes, from the request to the first new frame:
//   within the multiplex, with what has been received before and without it, compared with a pipeline that
//   decodes the same service from the start of its file, where the first frame is a keyframe and nothing is
//   sent in real time;
//   to another multiplex, compared with the arrival of its first keyframe, and if a second tuner receives it.
// And what it costs to receive a multiplex.
// Exits with 1 if a goal is missed.
#include <benchmark/benchmark.h>
#include <gst/gst.h>

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <future>
#include <map>
#include <mutex>
#include <optional>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include "desktop/platform/Broadcast.h"
#include "desktop/platform/Multiplex.h"
#include "desktop/platform/Playout.h"
#include "desktop/platform/Receiver.h"
#include "desktop/platform/RecentPackets.h"
#include "desktop/platform/Sections.h"
#include "desktop/platform/telix_picture.h"
#include "telix/telix_platform.h"

namespace {

using Clock = std::chrono::steady_clock; // desktop::Clock is that of the playout
constexpr int kTunes = 41;
constexpr size_t kPacketsAtOnce = 32; // about as many as playout sends at once
constexpr auto kLimit = std::chrono::seconds(10);
constexpr auto kSettle = std::chrono::milliseconds(500); // a viewer looks at a channel for a while

// Goals in seconds: of changes to a multiplex that is received already, and of others, which wait for the
// first keyframe.
constexpr double kMedianGoal = 0.10;
constexpr double kPercentileGoal = 0.15;
constexpr double kAfterKeyframeGoal = 0.10;

// The channel list is the test multiplex and twice its file, under other names: each of them counts as a
// multiplex of its own.
constexpr const char* kFiles[] = {"first.ts", "second.ts"};

// By benchmark, in seconds.
std::map<std::string, std::vector<double>> g_times;

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

uint64_t latestFrame() {
    telix_desktop_frame frame{};
    telix_desktop_acquire_frame(&frame);
    const uint64_t serial = frame.visible != 0 ? frame.serial : 0;
    telix_desktop_release_frame(&frame);
    return serial;
}

// Waits until the picture is black, or until there is one.
bool waitForPicture(bool isVisible) {
    const auto end = Clock::now() + kLimit;
    for (;;) {
        uint64_t before = 0;
        {
            std::lock_guard<std::mutex> lock(g_mutex);
            before = g_wakeups;
        }
        if ((latestFrame() != 0) == isVisible) {
            return true;
        }
        std::unique_lock<std::mutex> lock(g_mutex);
        if (!g_woken.wait_until(lock, end, [&] { return g_wakeups != before; })) {
            return false;
        }
    }
}

// The platform with one object, for all iterations.
struct Television {
    TELIX_JS_VB_HANDLE object = 0;
    TELIX_JS_CM_HANDLE* channels = nullptr;
    uint32_t count = 0;

    Television() {
        TELIX_JS_VB_GetHandle(&object);
        TELIX_JS_CM_GetChannelList(&count, &channels);
        telix_desktop_set_wakeup(onWakeup, nullptr);
    }
    ~Television() {
        telix_desktop_set_wakeup(nullptr, nullptr);
        TELIX_JS_VB_Release(object);
    }
};

// The value below which a share of the values lies.
double percentile(std::vector<double> values, double share) {
    std::sort(values.begin(), values.end());
    return values.at(static_cast<size_t>(share * static_cast<double>(values.size() - 1) + 0.5));
}

void report(benchmark::State& state, const std::string& name, double seconds) {
    state.SetIterationTime(seconds);
    g_times[name].push_back(seconds);
}

Television& television() {
    static Television instance;
    return instance;
}

std::mt19937& randomNumbers() {
    static std::mt19937 numbers(20261122);
    return numbers;
}

// A kind of change: the channel at which it may begin (the current one if possible), the one to which it
// leads, and what has to be there before. Channels are positions in the list.
struct Change {
    const char* name;
    bool isInstant;
    std::function<size_t(size_t current)> start;
    std::function<size_t(size_t start)> next;
    std::function<bool()> isReady;
};

bool always() {
    return true;
}

bool receivesNeighbour() {
    const auto tuners = desktop::Broadcast::instance().state().tuners;
    return std::all_of(tuners.begin(), tuners.end(), [](const auto& tuner) { return tuner.keptSize > 0; });
}

size_t services() {
    return desktop::testServices().size(); // of each multiplex
}

size_t inTestMultiplex(size_t current) {
    return current < services() ? current : 0;
}

size_t otherInTestMultiplex(size_t start) {
    return (start + 1 + randomNumbers()() % (services() - 1)) % services();
}

// The service in the middle of a multiplex, whose neighbours are in it, too.
size_t inTheMiddle(size_t current) {
    return current - current % services() + 1;
}

size_t middleOfNextMultiplex(size_t start) {
    return (start + services()) % (services() * (1 + std::size(kFiles)));
}

// The last service of one file, or the first one of the next.
size_t atTheBorder(size_t current) {
    return current == 2 * services() ? current : 2 * services() - 1;
}

size_t acrossTheBorder(size_t start) {
    return start == 2 * services() ? start - 1 : 2 * services();
}

// At a random one, because the distance to the random access points before and after depends on it.
bool waitForMoment(const Change& change) {
    const auto end = Clock::now() + kLimit;
    while (!change.isReady()) {
        if (Clock::now() > end) {
            return false;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    std::this_thread::sleep_for(kSettle + std::chrono::milliseconds(randomNumbers()() % 1000));
    return true;
}

// Seconds from the request to the first frame; nothing if none arrives.
std::optional<double> changeTo(size_t channel) {
    const auto begin = Clock::now();
    TELIX_JS_VB_SetChannel(television().object, television().channels[channel], 0);
    // The last frame of the channel before disappears first.
    if (!waitForPicture(false) || !waitForPicture(true)) {
        return std::nullopt;
    }
    return std::chrono::duration<double>(Clock::now() - begin).count();
}

void tune(benchmark::State& state, const Change& change) {
    static std::optional<size_t> current;
    desktop::Broadcast::instance().setInstantZap(change.isInstant);
    for (auto each : state) {
        (void)each;
        const size_t start = change.start(current.value_or(0));
        if (current != start) {
            changeTo(start);
        }
        if (!waitForMoment(change)) {
            state.SkipWithError("the neighbour is not received");
            return;
        }
        current = change.next(start);
        const auto seconds = changeTo(*current);
        if (!seconds) {
            state.SkipWithError("no frame arrived");
            return;
        }
        report(state, change.name, *seconds);
    }
}

// When the first keyframe of a service has arrived, after the start of the playout of its multiplex.
void keyframeOfOtherMultiplex(benchmark::State& state, const std::string& name, const std::string& file) {
    const desktop::ElementaryStream& video = desktop::testServices()[1].streams.front();
    for (auto each : state) {
        (void)each;
        std::promise<Clock::time_point> arrival;
        bool hasBegun = false;
        bool hasEnded = false;
        desktop::Playout playout(
            desktop::Clock::real(), [&](const uint8_t* packets, size_t size, desktop::Clock::Duration) {
                for (size_t at = 0; at < size && !hasEnded; at += desktop::kPacketSize) {
                    const uint8_t* packet = packets + at;
                    const bool isStart = desktop::pidOf(packet) == video.pid &&
                                         (packet[1] & desktop::kPayloadUnitStartIndicator) != 0;
                    if (isStart && hasBegun) {
                        hasEnded = true;
                        arrival.set_value(Clock::now());
                    }
                    hasBegun = hasBegun || (isStart && desktop::isRandomAccessPoint(packet, video.type));
                }
            });
        std::string error;
        const auto begin = Clock::now();
        auto future = arrival.get_future();
        if (!playout.play(file, nullptr, error) || future.wait_for(kLimit) != std::future_status::ready) {
            state.SkipWithError(("no keyframe: " + error).c_str());
            return;
        }
        report(state, name, std::chrono::duration<double>(future.get() - begin).count());
        playout.stop();
    }
}

void decodeFromFile(benchmark::State& state) {
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
            state.SkipWithError("gst_parse_launch failed");
            return;
        }
        const auto begin = Clock::now();
        gst_element_set_state(pipeline, GST_STATE_PAUSED);
        // Prerolled: the sink has the first frame.
        const bool isReady =
            gst_element_get_state(pipeline, nullptr, nullptr, 10 * GST_SECOND) == GST_STATE_CHANGE_SUCCESS;
        state.SetIterationTime(std::chrono::duration<double>(Clock::now() - begin).count());
        gst_element_set_state(pipeline, GST_STATE_NULL);
        gst_object_unref(pipeline);
        if (!isReady) {
            state.SkipWithError("no frame was decoded");
            return;
        }
    }
}

// What a tuner costs that receives a multiplex, for which nobody is selected.
void receive(benchmark::State& state, const std::string& file, bool isKeeping) {
    std::ifstream stream(file, std::ios::binary);
    const desktop::Bytes packets{std::istreambuf_iterator<char>(stream), {}};
    desktop::Receiver receiver(desktop::Clock::real());
    receiver.keepPackets(isKeeping);
    for (auto each : state) {
        (void)each;
        for (size_t at = 0; at < packets.size(); at += kPacketsAtOnce * desktop::kPacketSize) {
            receiver.push(packets.data() + at,
                          std::min(kPacketsAtOnce * desktop::kPacketSize, packets.size() - at),
                          desktop::Clock::Duration::zero());
        }
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * packets.size()));
}

void inMilliseconds(benchmark::internal::Benchmark* bench) {
    bench->Iterations(1)
        ->Repetitions(kTunes)
        ->ReportAggregatesOnly()
        ->ComputeStatistics("p95", [](const std::vector<double>& times) { return percentile(times, 0.95); })
        ->UseManualTime()
        ->Unit(benchmark::kMillisecond);
}

// False if a goal is missed.
bool meetsGoal(const char* what, double seconds, double goal) {
    std::printf("%s: %.3f s (goal %.3f s)\n", what, seconds, goal);
    return seconds <= goal;
}

bool meetsInstantGoals(const std::string& name) {
    const std::vector<double>& times = g_times[name];
    if (times.empty()) {
        return true; // filtered out
    }
    const bool isMedianMet = meetsGoal((name + ", median").c_str(), percentile(times, 0.5), kMedianGoal);
    return meetsGoal((name + ", 95th percentile").c_str(), percentile(times, 0.95), kPercentileGoal) &&
           isMedianMet;
}

const char* const kInstantChange = "instantChange";
const char* const kNeighbourChange = "changeToNeighbourInOtherMultiplex";
const char* const kOtherChange = "changeToOtherMultiplex";
const char* const kKeyframe = "keyframeOfOtherMultiplex";

bool meetsGoals() {
    const bool isInstantMet = meetsInstantGoals(kInstantChange);
    const bool isNeighbourMet = meetsInstantGoals(kNeighbourChange);
    const bool isComparable = !g_times[kOtherChange].empty() && !g_times[kKeyframe].empty();
    const bool isOtherMet =
        !isComparable || meetsGoal("changeToOtherMultiplex, median", percentile(g_times[kOtherChange], 0.5),
                                   percentile(g_times[kKeyframe], 0.5) + kAfterKeyframeGoal);
    return isInstantMet && isNeighbourMet && isOtherMet;
}

// Two multiplexes beside the test multiplex, and a configuration with a second tuner, in `folder`. False,
// with the reason on standard error, if the test multiplex cannot be made.
bool prepare(const std::filesystem::path& folder) {
    std::string error;
    const std::string file = desktop::makeTestMultiplex(error);
    if (file.empty()) {
        std::fprintf(stderr, "tune_bench: test multiplex: %s\n", error.c_str());
        return false;
    }
    std::string sources = "test";
    for (const char* name : kFiles) {
        std::filesystem::create_symlink(file, folder / name);
        sources += ";" + (folder / name).string();
    }
    std::ofstream(folder / "tv.conf") << "[set]\ntuners=2\n";
    setenv("TELIX_CHANNELS", sources.c_str(), 1);
    setenv("TELIX_CONFIG", (folder / "tv.conf").c_str(), 1);
    return true;
}

void registerAll(const std::filesystem::path& folder) {
    for (const auto& [name, isKeeping] : {std::pair("receive", false), std::pair("receiveAndKeep", true)}) {
        const auto run = [file = (folder / kFiles[0]).string(), isKeeping = isKeeping](auto& state) {
            receive(state, file, isKeeping);
        };
        benchmark::RegisterBenchmark(name, run);
    }
    const auto add = [](const char* name, const std::function<void(benchmark::State&)>& function) {
        benchmark::RegisterBenchmark(name, function)->Apply(inMilliseconds);
    };
    add("decodeFromFile", decodeFromFile);
    add(kKeyframe, [file = (folder / kFiles[0]).string()](benchmark::State& state) {
        keyframeOfOtherMultiplex(state, kKeyframe, file);
    });
    for (const Change& change :
         {Change{"changeAtNextKeyframe", false, inTestMultiplex, otherInTestMultiplex, always},
          Change{kInstantChange, true, inTestMultiplex, otherInTestMultiplex, always},
          Change{kOtherChange, true, inTheMiddle, middleOfNextMultiplex, always},
          Change{kNeighbourChange, true, atTheBorder, acrossTheBorder, receivesNeighbour}}) {
        add(change.name, [change](benchmark::State& state) { tune(state, change); });
    }
}

} // namespace

int main(int argc, char** argv) {
    // In turns, so that other load of the machine affects all.
    std::vector<char*> arguments(argv, argv + argc);
    std::string inTurns = "--benchmark_enable_random_interleaving=true";
    arguments.insert(arguments.begin() + 1, inTurns.data());
    ++argc;
    argv = arguments.data();
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) {
        return 2;
    }
    gst_init(nullptr, nullptr);
    std::string folder = (std::filesystem::temp_directory_path() / "tune_bench-XXXXXX").string();
    if (!mkdtemp(folder.data())) {
        std::perror("tune_bench: temporary folder");
        return 2;
    }
    const bool isPrepared = prepare(folder);
    if (isPrepared) {
        registerAll(folder);
        benchmark::RunSpecifiedBenchmarks();
    }
    std::filesystem::remove_all(folder);
    if (!isPrepared) {
        return 2;
    }
    return meetsGoals() ? 0 : 1;
}
