// Players of the A/V control object: without media, with media that do not exist, and, if the command line
// names any, with media that the library can play.
#include <algorithm>
#include <atomic>
#include <mutex>
#include <set>
#include <thread>

#include "desktop/conformance/CheckGroup.h"

namespace desktop {

namespace {

using std::chrono::milliseconds;

constexpr int32_t kOrdinarySource = 6;
constexpr int32_t kUnknownContainer = 1280;
constexpr milliseconds kStressDuration{500};
const char kMissingMedia[] = "file:///telix/no/such/media.mp4";

// ---- Messages

struct Message {
    TELIX_JS_AV_HANDLE player;
    TELIX_AV_CB_MSG message;
};
std::mutex messagesMutex;
std::vector<Message> messages; // guarded by messagesMutex

TELIX_RETCODE_ENUM_T onMessage(TELIX_JS_AV_HANDLE player, TELIX_AV_CB_MSG message) {
    std::lock_guard<std::mutex> lock(messagesMutex);
    messages.push_back({player, message});
    return 0;
}

TELIX_RETCODE_ENUM_T onRights(TELIX_JS_AV_HANDLE, TELIX_AV_DRM_ERR_STATE_ENUM_T, ___UINT8*, ___UINT8*,
                              ___UINT8*) {
    return 0;
}

bool hasMessage(const std::function<bool(const Message& message)>& matches) {
    std::lock_guard<std::mutex> lock(messagesMutex);
    return std::any_of(messages.begin(), messages.end(), matches);
}

bool hasAnyMessage() {
    return hasMessage([](const Message&) { return true; });
}

void clearMessages() {
    std::lock_guard<std::mutex> lock(messagesMutex);
    messages.clear();
}

bool isError(TELIX_AV_CB_MSG message) {
    return message >= TELIX_AV_CB_MSG_ERR_PLAYING && message <= 0xFFFF;
}

// ---- Players

TELIX_JS_AV_HANDLE newPlayer(const CheckContext& context) {
    const Library& library = context.library;
    TELIX_JS_AV_HANDLE player = 0;
    expect(library.TELIX_JS_AV_CreatePlayer(&player, kUnknownContainer, 0, 0) == 0 && player != 0,
           "no player is created");
    if (library.TELIX_JS_AV_RegisterOnPlayStateChange) {
        library.TELIX_JS_AV_RegisterOnPlayStateChange(player, onMessage);
    }
    return player;
}

// In the order of the plug-in.
void destroyPlayer(const CheckContext& context, TELIX_JS_AV_HANDLE player) {
    const Library& library = context.library;
    if (library.TELIX_JS_AV_Stop) {
        library.TELIX_JS_AV_Stop(player);
    }
    library.TELIX_JS_AV_DestroyPlayer(player);
    if (library.TELIX_JS_AV_UnregisterOnPlayStateChange) {
        library.TELIX_JS_AV_UnregisterOnPlayStateChange(onMessage);
    }
}

// Returns whether the library accepts the request.
bool play(const CheckContext& context, TELIX_JS_AV_HANDLE player, const std::string& url) {
    clearMessages();
    const auto begin = std::chrono::steady_clock::now();
    const bool isAccepted = context.library.TELIX_JS_AV_Play(player, url.c_str(), 1, kOrdinarySource,
                                                             kUnknownContainer, 0, 0, 0) == 0;
    expect(std::chrono::steady_clock::now() - begin < kMaxRequestDuration, "the request waits for the media");
    return isAccepted;
}

void checkHandles(const CheckContext& context) {
    std::set<uint32_t> handles;
    for (const int32_t container : {2, 512, kUnknownContainer}) {
        for (const int32_t codec : {0, 1, 4}) {
            TELIX_JS_AV_HANDLE player = 0;
            expect(context.library.TELIX_JS_AV_CreatePlayer(&player, container, codec, 0) == 0,
                   "one is refused");
            expect(player != 0, "a handle is 0");
            expect(handles.insert(player).second, "two have the same");
        }
    }
    for (const uint32_t player : handles) {
        context.library.TELIX_JS_AV_DestroyPlayer(player);
    }
}

// ---- Refusals

// Arguments and outputs of calls that are refused.
const TELIX_JS_DISPLAY_AREA kArea{0, 0, 640, 360};
TELIX_JS_AVCOMPHANDLE* refusedComponents = nullptr;
uint32_t refusedCount = 0;

void checkRefusedOutputs(const CheckContext& context) {
    (void)context;
    expect(refusedComponents == nullptr && refusedCount == 0, "one has changed");
}

std::vector<Check> refusals() {
    return {
        refusal(NAMED_CALL(TELIX_JS_AV_DestroyPlayer)),
        refusal(NAMED_CALL(TELIX_JS_AV_Play), kMissingMedia, 1, kOrdinarySource, kUnknownContainer, 0, 0, 0),
        refusal(NAMED_CALL(TELIX_JS_AV_Queue), kMissingMedia, 1, kOrdinarySource, kUnknownContainer, 0, 0, 0),
        refusal(NAMED_CALL(TELIX_JS_AV_Stop)),
        refusal(NAMED_CALL(TELIX_JS_AV_Pause)),
        refusal(NAMED_CALL(TELIX_JS_AV_Resume)),
        refusal(NAMED_CALL(TELIX_JS_AV_SetVolume), 50),
        refusal(NAMED_CALL(TELIX_JS_AV_SetFullScreen), 1),
        refusal(NAMED_CALL(TELIX_JS_AV_SetPlaySpeed), 1, 1, 0),
        refusal(NAMED_CALL(TELIX_JS_AV_SetDisplayArea), &kArea),
        refusalWithOutput(NAMED_CALL(TELIX_JS_AV_GetPlayInfo)),
        refusal(NAMED_CALL(TELIX_JS_AV_Seek), 1000),
        refusal(NAMED_CALL(TELIX_JS_AV_GetComponents), TELIX_JS_AVCOMPTYPE_AUDIO, &refusedComponents,
                &refusedCount),
        refusal(NAMED_CALL(TELIX_JS_AV_GetCurrActiveComponents), TELIX_JS_AVCOMPTYPE_AUDIO,
                &refusedComponents, &refusedCount),
        refusal(NAMED_CALL(TELIX_JS_AV_SelectComponent), 1, TELIX_JS_AVCOMPTYPE_AUDIO),
        refusal(NAMED_CALL(TELIX_JS_AV_UnselectComponent), 1, TELIX_JS_AVCOMPTYPE_AUDIO),
        refusalWithOutput(NAMED_CALL(TELIX_JS_AV_AVComponent_GetEncoding)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_AV_AVComponent_GetEncrypted)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_AV_AVComponent_GetAspectRatio)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_AV_AVComponent_GetLanguage)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_AV_AVComponent_GetAudioDescription)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_AV_AVComponent_GetAudioChannels)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_AV_AVComponent_GetHearingImpaired)),
        {"refused calls leave the outputs of the players unchanged", {}, checkRefusedOutputs},
    };
}

// ---- Players without media

void checkRecords(const CheckContext& context) {
    const Library& library = context.library;
    const TELIX_JS_AV_HANDLE first = newPlayer(context);
    const TELIX_JS_AV_HANDLE second = newPlayer(context);
    TELIX_JS_AV_PLAY_INFO* firstInfo = nullptr;
    TELIX_JS_AV_PLAY_INFO* secondInfo = nullptr;
    const bool hasFirst = library.TELIX_JS_AV_GetPlayInfo(first, &firstInfo) == 0 && firstInfo;
    const bool hasSecond = library.TELIX_JS_AV_GetPlayInfo(second, &secondInfo) == 0 && secondInfo;
    expect(!hasFirst || !hasSecond || firstInfo != secondInfo, "two players have the same record");
    if (hasFirst) {
        *firstInfo = {}; // the plug-in may write into it
    }
    destroyPlayer(context, second);
    TELIX_JS_AV_PLAY_INFO* again = nullptr;
    expect(!hasFirst || library.TELIX_JS_AV_GetPlayInfo(first, &again) == 0,
           "the record of one player ends with another player");
    destroyPlayer(context, first);
}

void checkVolume(const CheckContext& context) {
    const TELIX_JS_AV_HANDLE player = newPlayer(context);
    for (const uint32_t volume : {0U, 50U, 100U}) {
        expect(context.library.TELIX_JS_AV_SetVolume(player, volume) == 0,
               std::to_string(volume) + " is refused");
    }
    context.library.TELIX_JS_AV_SetVolume(player, 0xFFFFFFFF); // may be refused
}

void checkIdlePlayer(const CheckContext& context) {
    const Library& library = context.library;
    const TELIX_JS_AV_HANDLE player = newPlayer(context);
    for (auto* function : {library.TELIX_JS_AV_Pause, library.TELIX_JS_AV_Resume, library.TELIX_JS_AV_Stop}) {
        if (function) {
            function(player);
            function(player);
        }
    }
    if (library.TELIX_JS_AV_Seek) {
        library.TELIX_JS_AV_Seek(player, 0xFFFFFFFF);
    }
    if (library.TELIX_JS_AV_SetPlaySpeed) {
        library.TELIX_JS_AV_SetPlaySpeed(player, 0, 0x7FFF, 0xFFFF);
    }
    if (library.TELIX_JS_AV_Queue) {
        library.TELIX_JS_AV_Queue(player, nullptr, 0, 0, 0, 0, 0, 0); // removes what is queued
    }
    for (const TELIX_JS_AVCOMPTYPE type : kComponentTypes) {
        for (auto* function :
             {library.TELIX_JS_AV_GetComponents, library.TELIX_JS_AV_GetCurrActiveComponents}) {
            uint32_t count = 0;
            TELIX_JS_AVCOMPHANDLE* handles = nullptr;
            if (function && function(player, type, &handles, &count) == 0) {
                expect(handles != nullptr, "an array of components is null");
            }
        }
    }
    destroyPlayer(context, player);
    destroyPlayer(context, player); // the plug-in also does this for an object that never got a player
}

// ---- Missing media

void checkMissingMedia(const CheckContext& context) {
    const TELIX_JS_AV_HANDLE player = newPlayer(context);
    if (play(context, player, kMissingMedia)) {
        const auto isItsError = [&](const Message& each) {
            return each.player == player && isError(each.message);
        };
        expect(context.waitUntil([&] { return hasMessage(isItsError); }), "no error is reported");
    }
    expect(!hasMessage([](const Message& each) { return each.message == TELIX_AV_CB_MSG_PLAYSTART; }),
           "a start is reported");
}

void checkOtherPlayer(const CheckContext& context) {
    const TELIX_JS_AV_HANDLE player = newPlayer(context);
    destroyPlayer(context, newPlayer(context));
    if (!play(context, player, kMissingMedia)) {
        throw CheckSkipped{"missing media are refused"};
    }
    expect(context.waitUntil(
               [&] { return hasMessage([&](const Message& each) { return each.player == player; }); }),
           "no message is reported");
}

void checkDestroyedPlayer(const CheckContext& context) {
    const TELIX_JS_AV_HANDLE player = newPlayer(context);
    play(context, player, kMissingMedia);
    destroyPlayer(context, player);
    clearMessages();
    expect(!context.happensWithin(kQuietPeriod, hasAnyMessage), "one is reported");
}

void checkRightsCallbacks(const CheckContext& context) {
    context.library.TELIX_JS_AV_RegisterOnDRMRightsError(newPlayer(context), onRights);
    context.library.TELIX_JS_AV_UnregisterOnDRMRightsError(onRights);
    context.library.TELIX_JS_AV_UnregisterOnDRMRightsError(onRights);
}

// ---- Concurrent calls

// The record must be readable, also while another call fills it in: the plug-in reads it without a lock.
__attribute__((noinline, no_sanitize("thread"))) void readRecord(const volatile TELIX_JS_AV_PLAY_INFO* info) {
    (void)info->playPosition;
    (void)info->buffered;
}

// Calls on two threads the four functions that may come from any thread, and others on this one.
void stressConcurrentCalls(const CheckContext& context, TELIX_JS_AV_HANDLE player) {
    const Library& library = context.library;
    std::atomic<bool> isStopped{false};
    const auto callThreadSafeFunctions = [&] {
        while (!isStopped) {
            TELIX_JS_AV_PLAY_INFO* info = nullptr;
            if (library.TELIX_JS_AV_GetPlayInfo(player, &info) == 0 && info) {
                readRecord(info);
            }
            library.TELIX_JS_AV_Pause(player);
            library.TELIX_JS_AV_Resume(player);
            library.TELIX_JS_AV_Stop(player);
        }
    };
    std::thread first(callThreadSafeFunctions);
    std::thread second(callThreadSafeFunctions);
    const std::string media = context.media.empty() ? kMissingMedia : context.media;
    const auto end = std::chrono::steady_clock::now() + kStressDuration;
    while (std::chrono::steady_clock::now() < end) {
        library.TELIX_JS_AV_Play(player, media.c_str(), 1, kOrdinarySource, kUnknownContainer, 0, 0, 0);
        TELIX_JS_AVCOMPHANDLE* components = nullptr;
        uint32_t count = 0;
        library.TELIX_JS_AV_GetComponents(player, TELIX_JS_AVCOMPTYPE_AUDIO, &components, &count);
        library.TELIX_JS_AV_SetVolume(player, 50);
        library.TELIX_JS_AV_Seek(player, 1000);
        TELIX_JS_AV_HANDLE other = 0;
        if (library.TELIX_JS_AV_CreatePlayer(&other, kUnknownContainer, 0, 0) == 0) {
            library.TELIX_JS_AV_DestroyPlayer(other);
        }
        std::this_thread::sleep_for(milliseconds(2));
    }
    isStopped = true;
    first.join();
    second.join();
}

void checkConcurrentCalls(const CheckContext& context) {
    const TELIX_JS_AV_HANDLE player = newPlayer(context);
    stressConcurrentCalls(context, player);
    destroyPlayer(context, player);
}

// ---- Playback. The checks share one player, which the first one starts.

TELIX_JS_AV_HANDLE playingPlayer = 0;
bool isPlaying = false;

void requireMedia(const CheckContext& context) {
    if (context.media.empty()) {
        throw CheckSkipped{"no media are given (--media)"};
    }
}

void requirePlayback(const CheckContext& context) {
    requireMedia(context);
    if (!isPlaying) {
        throw CheckSkipped{"nothing is playing"};
    }
}

void checkStart(const CheckContext& context) {
    requireMedia(context);
    playingPlayer = newPlayer(context);
    expect(play(context, playingPlayer, context.media), "the media are refused");
    expect(context.waitUntil(hasAnyMessage), "no message is reported");
    std::lock_guard<std::mutex> lock(messagesMutex);
    expect(messages.front().player == playingPlayer, "it is reported for another player");
    expect(messages.front().message == TELIX_AV_CB_MSG_PLAYSTART,
           "the first message is " + std::to_string(messages.front().message));
    isPlaying = true;
}

void checkPosition(const CheckContext& context) {
    requirePlayback(context);
    const Library& library = context.library;
    TELIX_JS_AV_PLAY_INFO* info = nullptr;
    expect(library.TELIX_JS_AV_GetPlayInfo(playingPlayer, &info) == 0 && info, "there is no record");
    const uint32_t before = info->playPosition;
    const auto hasAdvanced = [&] {
        return library.TELIX_JS_AV_GetPlayInfo(playingPlayer, &info) == 0 && info &&
               info->playPosition > before;
    };
    expect(context.waitUntil(hasAdvanced), "it stays at " + std::to_string(before) + " ms");
}

void checkMediaComponents(const CheckContext& context) {
    requirePlayback(context);
    const Library& library = context.library;
    for (const TELIX_JS_AVCOMPTYPE type : kComponentTypes) {
        uint32_t count = 0;
        TELIX_JS_AVCOMPHANDLE* handles = nullptr;
        if (library.TELIX_JS_AV_GetComponents(playingPlayer, type, &handles, &count) != 0) {
            continue;
        }
        expect(handles != nullptr, "an array is null");
        for (const uint32_t component : std::vector<uint32_t>(handles, handles + count)) {
            for (auto* function :
                 {library.TELIX_JS_AV_AVComponent_GetEncoding, library.TELIX_JS_AV_AVComponent_GetLanguage}) {
                if (function) {
                    checkedString("a string of a component",
                                  [&](char** string) { return function(component, type, string); });
                }
            }
        }
        uint32_t activeCount = 0;
        expect(library.TELIX_JS_AV_GetCurrActiveComponents(playingPlayer, type, &handles, &activeCount) !=
                       0 ||
                   (handles && activeCount <= count),
               "there are more active components than components");
    }
}

void checkStop(const CheckContext& context) {
    requirePlayback(context);
    expect(context.library.TELIX_JS_AV_Stop(playingPlayer) == 0, "it is refused");
    destroyPlayer(context, playingPlayer);
    clearMessages();
    expect(!context.happensWithin(kQuietPeriod, hasAnyMessage), "a message is reported");
}

std::vector<Check> playbackChecks() {
    return {
        {"the first message of playing media is a start for that player",
         {REQUIRED_CALL(TELIX_JS_AV_CreatePlayer), REQUIRED_CALL(TELIX_JS_AV_Play)},
         checkStart},
        {"the position of playing media advances", {REQUIRED_CALL(TELIX_JS_AV_GetPlayInfo)}, checkPosition},
        {"the components of playing media are complete",
         {REQUIRED_CALL(TELIX_JS_AV_GetComponents), REQUIRED_CALL(TELIX_JS_AV_GetCurrActiveComponents)},
         checkMediaComponents},
        {"playing media can be stopped, and no message is reported afterwards",
         {REQUIRED_CALL(TELIX_JS_AV_Stop)},
         checkStop},
    };
}

std::vector<Check> idleChecks() {
    const std::vector<RequiredCall> basicCalls{REQUIRED_CALL(TELIX_JS_AV_CreatePlayer),
                                               REQUIRED_CALL(TELIX_JS_AV_DestroyPlayer)};
    const std::vector<RequiredCall> messageCalls{
        REQUIRED_CALL(TELIX_JS_AV_CreatePlayer), REQUIRED_CALL(TELIX_JS_AV_DestroyPlayer),
        REQUIRED_CALL(TELIX_JS_AV_Play), REQUIRED_CALL(TELIX_JS_AV_RegisterOnPlayStateChange),
        REQUIRED_CALL(TELIX_JS_AV_UnregisterOnPlayStateChange)};
    return {
        {"each player has its own record, which lives as long as the player",
         {REQUIRED_CALL(TELIX_JS_AV_CreatePlayer), REQUIRED_CALL(TELIX_JS_AV_DestroyPlayer),
          REQUIRED_CALL(TELIX_JS_AV_GetPlayInfo)},
         checkRecords},
        {"volumes from 0 to 100 are accepted",
         {REQUIRED_CALL(TELIX_JS_AV_CreatePlayer), REQUIRED_CALL(TELIX_JS_AV_SetVolume)},
         checkVolume},
        {"requests to a player without media are harmless", basicCalls, checkIdlePlayer},
        {"missing media are refused, or an error is reported for that player",
         {REQUIRED_CALL(TELIX_JS_AV_CreatePlayer), REQUIRED_CALL(TELIX_JS_AV_Play),
          REQUIRED_CALL(TELIX_JS_AV_RegisterOnPlayStateChange)},
         checkMissingMedia},
        {"messages of a player are reported after another player has been destroyed", messageCalls,
         checkOtherPlayer},
        {"no message is reported after a player has been destroyed", messageCalls, checkDestroyedPlayer},
        {"rights error callbacks can be registered and unregistered repeatedly",
         {REQUIRED_CALL(TELIX_JS_AV_CreatePlayer), REQUIRED_CALL(TELIX_JS_AV_RegisterOnDRMRightsError),
          REQUIRED_CALL(TELIX_JS_AV_UnregisterOnDRMRightsError)},
         checkRightsCallbacks},
        {"play info, pause, resume and stop are safe beside other calls",
         {REQUIRED_CALL(TELIX_JS_AV_CreatePlayer), REQUIRED_CALL(TELIX_JS_AV_DestroyPlayer),
          REQUIRED_CALL(TELIX_JS_AV_Play), REQUIRED_CALL(TELIX_JS_AV_GetPlayInfo),
          REQUIRED_CALL(TELIX_JS_AV_Pause), REQUIRED_CALL(TELIX_JS_AV_Resume),
          REQUIRED_CALL(TELIX_JS_AV_Stop), REQUIRED_CALL(TELIX_JS_AV_GetComponents),
          REQUIRED_CALL(TELIX_JS_AV_SetVolume), REQUIRED_CALL(TELIX_JS_AV_Seek)},
         checkConcurrentCalls},
    };
}

} // namespace

std::vector<Check> playerChecks() {
    std::vector<Check> checks{
        {"players have distinct handles",
         {REQUIRED_CALL(TELIX_JS_AV_CreatePlayer), REQUIRED_CALL(TELIX_JS_AV_DestroyPlayer)},
         checkHandles}};
    for (const auto& part : {refusals(), idleChecks(), playbackChecks()}) {
        checks.insert(checks.end(), part.begin(), part.end());
    }
    return checks;
}

} // namespace desktop
