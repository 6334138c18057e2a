// A platform with one simulated media pipeline: media connects, plays and ends. It sends its messages on a
// thread of its own and logs to standard error which calls it gets.
//
// The URL controls the media: "length=NUMBER" is its duration in milliseconds (default 60000), "absent" makes
// it unavailable. The volume controls the buffer level: it is not reported until the first change of the
// volume, and is then the volume in seconds.
#include "tests/support/RecordingPlatform.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <mutex>
#include <thread>

namespace {

constexpr TELIX_RETCODE_ENUM_T kError = 1;
constexpr int kTickMilliseconds = 20;
constexpr int kTicksToConnect = 5;
constexpr double kMinute = 60000;
constexpr uint32_t kNoBufferReport = 0xFFFFFFFF;

enum class Stage { Idle, Connecting, Playing, Paused, Ended };

struct Pipeline {
    std::mutex mutex; // guards everything here
    Stage stage = Stage::Idle;
    Stage stageBeforePause = Stage::Idle;
    TELIX_JS_AV_HANDLE player = 0;
    bool available = true;
    int ticks = 0;
    double position = 0; // milliseconds, as the length
    double length = 0;
    double speed = 1;
    uint32_t buffered = kNoBufferReport;
    TELIX_JS_AV_PLAYSTATE_CB callback = nullptr;
    std::map<TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAY_INFO> records; // by player
};

// Never destroyed, because the thread of the pipeline runs until the process exits.
Pipeline& pipeline = *new Pipeline;

double lengthOf(const std::string& url) {
    static const std::string name = "length=";
    const size_t found = url.find(name);
    return found == std::string::npos ? kMinute : std::atof(url.c_str() + found + name.size());
}

void report(TELIX_AV_CB_MSG message) {
    std::fprintf(stderr, "message %x\n", message);
    pipeline.callback(pipeline.player, message);
}

void tick() {
    const std::lock_guard<std::mutex> lock(pipeline.mutex);
    if (pipeline.stage == Stage::Connecting && ++pipeline.ticks == kTicksToConnect) {
        pipeline.stage = pipeline.available ? Stage::Playing : Stage::Idle;
        report(pipeline.available ? TELIX_AV_CB_MSG_PLAYSTART : TELIX_AV_CB_MSG_ERR_NOT_FOUND);
    } else if (pipeline.stage == Stage::Playing) {
        pipeline.position = std::max(0.0, pipeline.position + kTickMilliseconds * pipeline.speed);
        if (pipeline.position >= pipeline.length) {
            pipeline.stage = Stage::Ended;
            report(TELIX_AV_CB_MSG_PLAYEND);
        }
    }
}

void run() {
    for (;;) {
        std::this_thread::sleep_for(std::chrono::milliseconds(kTickMilliseconds));
        tick();
    }
}

TELIX_RETCODE_ENUM_T play(TELIX_JS_AV_HANDLE player, const char* url, uint32_t, int32_t, int32_t, int32_t,
                          uint32_t, uint16_t) {
    const std::lock_guard<std::mutex> lock(pipeline.mutex);
    if (pipeline.stage != Stage::Idle) {
        pipeline.position = 0; // only a seek in a stopped pipeline applies to what is played next
    }
    pipeline.stage = Stage::Connecting;
    pipeline.player = player;
    pipeline.available = std::string(url).find("absent") == std::string::npos;
    pipeline.ticks = 0;
    pipeline.length = lengthOf(url);
    return TELIX_RETCODE_SUCCESS;
}

// An engine may end a player after the next one has begun to play.
TELIX_RETCODE_ENUM_T stop(TELIX_JS_AV_HANDLE player) {
    const std::lock_guard<std::mutex> lock(pipeline.mutex);
    if (pipeline.player == player) {
        pipeline.stage = Stage::Idle;
        pipeline.position = 0;
    }
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T pause(TELIX_JS_AV_HANDLE) {
    const std::lock_guard<std::mutex> lock(pipeline.mutex);
    if (pipeline.stage != Stage::Paused) {
        pipeline.stageBeforePause = pipeline.stage;
        pipeline.stage = Stage::Paused;
    }
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T resume(TELIX_JS_AV_HANDLE) {
    const std::lock_guard<std::mutex> lock(pipeline.mutex);
    if (pipeline.stage == Stage::Paused) {
        pipeline.stage = pipeline.stageBeforePause;
    }
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T seek(TELIX_JS_AV_HANDLE, uint32_t milliseconds) {
    const std::lock_guard<std::mutex> lock(pipeline.mutex);
    pipeline.position = milliseconds;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T setSpeed(TELIX_JS_AV_HANDLE, ___UINT8 positive, int16_t integerPart, uint16_t tenths) {
    const std::lock_guard<std::mutex> lock(pipeline.mutex);
    pipeline.speed = (integerPart + tenths / 10.0) * (positive ? 1 : -1);
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T setVolume(TELIX_JS_AV_HANDLE, uint32_t volume) {
    const std::lock_guard<std::mutex> lock(pipeline.mutex);
    pipeline.buffered = volume;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T getPlayInfo(TELIX_JS_AV_HANDLE player, TELIX_JS_AV_PLAY_INFO** info) {
    const std::lock_guard<std::mutex> lock(pipeline.mutex);
    TELIX_JS_AV_PLAY_INFO& record = pipeline.records[player];
    record.state = pipeline.stage == Stage::Idle ? 0 : 2;
    record.playPosition = static_cast<uint32_t>(pipeline.position);
    record.duration = static_cast<uint32_t>(pipeline.length);
    record.buffered = pipeline.buffered;
    *info = &record;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T noComponents(TELIX_JS_AV_HANDLE, TELIX_JS_AVCOMPTYPE, TELIX_JS_AVCOMPHANDLE**,
                                  uint32_t*) {
    return kError;
}

TELIX_RETCODE_ENUM_T createPlayer(TELIX_JS_AV_HANDLE* player, int32_t, int32_t, uint32_t) {
    static TELIX_JS_AV_HANDLE lastPlayer = 0;
    *player = ++lastPlayer;
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T registerCallback(TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAYSTATE_CB callback) {
    const std::lock_guard<std::mutex> lock(pipeline.mutex);
    if (!pipeline.callback) {
        std::thread(run).detach();
    }
    pipeline.callback = callback;
    return TELIX_RETCODE_SUCCESS;
}

const bool scenario = [] {
    RecordingPlatform& platform = *telix_recording_platform();
    platform.onCall = [](const std::string& call) { std::fprintf(stderr, "call %s\n", call.c_str()); };
    platform.TELIX_JS_AV_CreatePlayer = createPlayer;
    platform.TELIX_JS_AV_RegisterOnPlayStateChange = registerCallback;
    platform.TELIX_JS_AV_Play = play;
    platform.TELIX_JS_AV_Stop = stop;
    platform.TELIX_JS_AV_Pause = pause;
    platform.TELIX_JS_AV_Resume = resume;
    platform.TELIX_JS_AV_Seek = seek;
    platform.TELIX_JS_AV_SetPlaySpeed = setSpeed;
    platform.TELIX_JS_AV_SetVolume = setVolume;
    platform.TELIX_JS_AV_GetPlayInfo = getPlayInfo;
    platform.TELIX_JS_AV_GetComponents = noComponents;
    platform.TELIX_JS_AV_GetCurrActiveComponents = noComponents;
    return true;
}();

} // namespace
