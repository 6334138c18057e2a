// Players of the A/V control object.
#include "desktop/conformance/Checks.h"

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <mutex>
#include <set>
#include <thread>

namespace {

using std::chrono::milliseconds;

constexpr milliseconds longestCall{2000}; // of a request, which has to return without waiting
constexpr int32_t ordinarySource = 6;
constexpr int32_t unknownContainer = 1280;

struct Message {
    TELIX_JS_AV_HANDLE player;
    TELIX_AV_CB_MSG message;
};
std::mutex messagesMutex;
std::vector<Message> messages;

TELIX_RETCODE_ENUM_T onMessage(TELIX_JS_AV_HANDLE player, TELIX_AV_CB_MSG message) {
    std::lock_guard<std::mutex> lock(messagesMutex);
    messages.push_back({player, message});
    return 0;
}

TELIX_RETCODE_ENUM_T onRights(TELIX_JS_AV_HANDLE, TELIX_AV_DRM_ERR_STATE_ENUM_T, ___UINT8*, ___UINT8*,
                              ___UINT8*) {
    return 0;
}

bool hasCome(const std::function<bool(const Message& message)>& isMeant) {
    std::lock_guard<std::mutex> lock(messagesMutex);
    return std::any_of(messages.begin(), messages.end(), isMeant);
}

void forgetMessages() {
    std::lock_guard<std::mutex> lock(messagesMutex);
    messages.clear();
}

bool isFault(TELIX_AV_CB_MSG message) {
    return message >= 0xF000 && message < 0x10000;
}

TELIX_JS_AV_HANDLE newPlayer(const Means& m) {
    TELIX_JS_AV_HANDLE player = 0;
    expect(m.library.TELIX_JS_AV_CreatePlayer(&player, unknownContainer, 0, 0) == 0 && player != 0,
           "no player is given");
    if (m.library.TELIX_JS_AV_RegisterOnPlayStateChange) {
        m.library.TELIX_JS_AV_RegisterOnPlayStateChange(player, onMessage);
    }
    return player;
}

// As the plug-in ends an object.
void endPlayer(const Means& m, TELIX_JS_AV_HANDLE player) {
    if (m.library.TELIX_JS_AV_Stop) {
        m.library.TELIX_JS_AV_Stop(player);
    }
    m.library.TELIX_JS_AV_DestroyPlayer(player);
    if (m.library.TELIX_JS_AV_UnregisterOnPlayStateChange) {
        m.library.TELIX_JS_AV_UnregisterOnPlayStateChange(onMessage);
    }
}

// Whether the library has taken the request.
bool play(const Means& m, TELIX_JS_AV_HANDLE player, const std::string& url) {
    forgetMessages();
    const auto begin = std::chrono::steady_clock::now();
    const bool isTaken =
        m.library.TELIX_JS_AV_Play(player, url.c_str(), 1, ordinarySource, unknownContainer, 0, 0, 0) == 0;
    expect(std::chrono::steady_clock::now() - begin < longestCall, "the call waits for the media");
    return isTaken;
}

const char missingMedia[] = "file:///telix/no/such/media.mp4";

// The record must be readable, also while another call fills it in: whoever reads it guards nothing.
__attribute__((noinline, no_sanitize("thread"))) void readRecord(const volatile TELIX_JS_AV_PLAY_INFO* info) {
    (void)info->playPosition;
    (void)info->buffered;
}

// Functions that every player has, from two sides at once.
void hammer(const Means& m, TELIX_JS_AV_HANDLE player) {
    const Library& library = m.library;
    std::atomic<bool> isOver{false};
    const auto beside = [&] {
        while (!isOver) {
            TELIX_JS_AV_PLAY_INFO* info = nullptr;
            if (library.TELIX_JS_AV_GetPlayInfo(player, &info) == 0 && info) {
                readRecord(info);
            }
            library.TELIX_JS_AV_Pause(player);
            library.TELIX_JS_AV_Resume(player);
            library.TELIX_JS_AV_Stop(player);
        }
    };
    std::thread first(beside);
    std::thread second(beside);
    const auto end = std::chrono::steady_clock::now() + milliseconds(500);
    while (std::chrono::steady_clock::now() < end) {
        library.TELIX_JS_AV_Play(player, m.media.empty() ? missingMedia : m.media.c_str(), 1, ordinarySource,
                                 unknownContainer, 0, 0, 0);
        TELIX_JS_AVCOMPHANDLE* components = nullptr;
        uint32_t count = 0;
        library.TELIX_JS_AV_GetComponents(player, TELIX_JS_AVCOMPTYPE_AUDIO, &components, &count);
        library.TELIX_JS_AV_SetVolume(player, 50);
        library.TELIX_JS_AV_Seek(player, 1000);
        TELIX_JS_AV_HANDLE other = 0;
        if (library.TELIX_JS_AV_CreatePlayer(&other, unknownContainer, 0, 0) == 0) {
            library.TELIX_JS_AV_DestroyPlayer(other);
        }
        std::this_thread::sleep_for(milliseconds(2));
    }
    isOver = true;
    first.join();
    second.join();
}

void checkRefusals(const Means& m) {
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_DestroyPlayer));
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_Play), missingMedia, 1, ordinarySource, unknownContainer, 0, 0,
                   0);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_Queue), missingMedia, 1, ordinarySource, unknownContainer, 0, 0,
                   0);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_Stop));
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_Pause));
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_Resume));
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_SetVolume), 50);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_SetFullScreen), 1);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_SetPlaySpeed), 1, 1, 0);
    const TELIX_JS_DISPLAY_AREA area{0, 0, 640, 360};
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_SetDisplayArea), &area);
    checkRefusal(m, ALL_CALLS(TELIX_JS_AV_GetPlayInfo));
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_Seek), 1000);
    TELIX_JS_AVCOMPHANDLE* components = nullptr;
    uint32_t count = 0;
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_GetComponents), 1, &components, &count);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_GetCurrActiveComponents), 1, &components, &count);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_SelectComponent), 1, 1);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_AV_UnselectComponent), 1, 1);
    checkRefusal(m, ALL_CALLS(TELIX_JS_AV_AVComponent_GetEncoding));
    checkRefusal(m, ALL_CALLS(TELIX_JS_AV_AVComponent_GetEncrypted));
    checkRefusal(m, ALL_CALLS(TELIX_JS_AV_AVComponent_GetAspectRatio));
    checkRefusal(m, ALL_CALLS(TELIX_JS_AV_AVComponent_GetLanguage));
    checkRefusal(m, ALL_CALLS(TELIX_JS_AV_AVComponent_GetAudioDescription));
    checkRefusal(m, ALL_CALLS(TELIX_JS_AV_AVComponent_GetAudioChannels));
    checkRefusal(m, ALL_CALLS(TELIX_JS_AV_AVComponent_GetHearingImpaired));
    m.check("a refused call leaves the outputs of the players alone", {},
            [&] { expect(components == nullptr && count == 0, "one has changed"); });
}

// With media that the library can play.
void checkMedia(const Means& m) {
    const Library& library = m.library;
    TELIX_JS_AV_HANDLE player = 0;
    bool isPlaying = false;
    const auto require = [&] {
        if (m.media.empty()) {
            throw Skip{"no media is named (--media)"};
        }
        if (!isPlaying) {
            throw Skip{"nothing plays"};
        }
    };
    m.check("media begin with a message of that player",
            {NEED(TELIX_JS_AV_CreatePlayer), NEED(TELIX_JS_AV_Play)}, [&] {
                if (m.media.empty()) {
                    throw Skip{"no media is named (--media)"};
                }
                player = newPlayer(m);
                expect(play(m, player, m.media), "the media is refused");
                expect(m.waitUntil([] { return hasCome([](const Message&) { return true; }); }),
                       "no message comes");
                std::lock_guard<std::mutex> lock(messagesMutex);
                expect(messages.front().player == player, "it concerns another player");
                expect(messages.front().message == TELIX_AV_CB_MSG_PLAYSTART,
                       "it is " + std::to_string(messages.front().message));
                isPlaying = true;
            });
    m.check("the position of playing media goes on", {NEED(TELIX_JS_AV_GetPlayInfo)}, [&] {
        require();
        TELIX_JS_AV_PLAY_INFO* info = nullptr;
        expect(library.TELIX_JS_AV_GetPlayInfo(player, &info) == 0 && info, "there is no record");
        const uint32_t before = info->playPosition;
        expect(m.waitUntil([&] {
            return library.TELIX_JS_AV_GetPlayInfo(player, &info) == 0 && info && info->playPosition > before;
        }),
               "it stays at " + std::to_string(before) + " ms");
    });
    m.check("the components of playing media are complete",
            {NEED(TELIX_JS_AV_GetComponents), NEED(TELIX_JS_AV_GetCurrActiveComponents)}, [&] {
                require();
                for (const TELIX_JS_AVCOMPTYPE type : {0U, 1U, 2U, 77U}) {
                    uint32_t count = 0;
                    TELIX_JS_AVCOMPHANDLE* handles = nullptr;
                    if (library.TELIX_JS_AV_GetComponents(player, type, &handles, &count) != 0) {
                        continue;
                    }
                    expect(handles != nullptr, "an array is null");
                    const std::vector<uint32_t> all(handles, handles + count);
                    for (const uint32_t component : all) {
                        for (auto* function : {library.TELIX_JS_AV_AVComponent_GetEncoding,
                                               library.TELIX_JS_AV_AVComponent_GetLanguage}) {
                            if (function) {
                                takeText("a text of a component",
                                         [&](char** text) { return function(component, type, text); });
                            }
                        }
                    }
                    uint32_t activeCount = 0;
                    expect(library.TELIX_JS_AV_GetCurrActiveComponents(player, type, &handles,
                                                                       &activeCount) != 0 ||
                               (handles && activeCount <= count),
                           "there are more active components than components");
                }
            });
    m.check("playing media stop, and no message comes afterwards", {NEED(TELIX_JS_AV_Stop)}, [&] {
        require();
        expect(library.TELIX_JS_AV_Stop(player) == 0, "it is refused");
        endPlayer(m, player);
        forgetMessages();
        expect(!m.comesWithin(milliseconds(500), [] { return hasCome([](const Message&) { return true; }); }),
               "one came");
    });
}

} // namespace

void checkPlayers(const Means& m) {
    const Library& library = m.library;
    m.check("players have distinct handles",
            {NEED(TELIX_JS_AV_CreatePlayer), NEED(TELIX_JS_AV_DestroyPlayer)}, [&] {
                std::set<uint32_t> handles;
                for (const int32_t container : {2, 512, 1280}) {
                    for (const int32_t codec : {0, 1, 4}) {
                        TELIX_JS_AV_HANDLE player = 0;
                        expect(library.TELIX_JS_AV_CreatePlayer(&player, container, codec, 0) == 0,
                               "one is refused");
                        expect(player != 0, "a handle is 0");
                        expect(handles.insert(player).second, "two have the same");
                    }
                }
                for (const uint32_t player : handles) {
                    library.TELIX_JS_AV_DestroyPlayer(player);
                }
            });
    checkRefusals(m);
    const std::initializer_list<Need> basics{NEED(TELIX_JS_AV_CreatePlayer), NEED(TELIX_JS_AV_DestroyPlayer)};
    m.check("each player has a record of its own, which lives as long as the player",
            {NEED(TELIX_JS_AV_CreatePlayer), NEED(TELIX_JS_AV_DestroyPlayer), NEED(TELIX_JS_AV_GetPlayInfo)},
            [&] {
                const TELIX_JS_AV_HANDLE first = newPlayer(m);
                const TELIX_JS_AV_HANDLE second = newPlayer(m);
                TELIX_JS_AV_PLAY_INFO* firstInfo = nullptr;
                TELIX_JS_AV_PLAY_INFO* secondInfo = nullptr;
                const bool isFirst = library.TELIX_JS_AV_GetPlayInfo(first, &firstInfo) == 0 && firstInfo;
                const bool isSecond = library.TELIX_JS_AV_GetPlayInfo(second, &secondInfo) == 0 && secondInfo;
                expect(!isFirst || !isSecond || firstInfo != secondInfo, "two players have the same record");
                if (isFirst) {
                    *firstInfo = {}; // as the plug-in may
                }
                endPlayer(m, second);
                TELIX_JS_AV_PLAY_INFO* again = nullptr;
                expect(!isFirst || library.TELIX_JS_AV_GetPlayInfo(first, &again) == 0,
                       "the end of one player ends the record of another");
                endPlayer(m, first);
            });
    m.check("the volume is taken from 0 to 100",
            {NEED(TELIX_JS_AV_CreatePlayer), NEED(TELIX_JS_AV_SetVolume)}, [&] {
                const TELIX_JS_AV_HANDLE player = newPlayer(m);
                for (const uint32_t volume : {0U, 50U, 100U}) {
                    expect(library.TELIX_JS_AV_SetVolume(player, volume) == 0,
                           std::to_string(volume) + " is refused");
                }
                library.TELIX_JS_AV_SetVolume(player, 0xFFFFFFFF); // may be refused
            });
    m.check("a player without media takes any request without harm", basics, [&] {
        const TELIX_JS_AV_HANDLE player = newPlayer(m);
        for (auto* function :
             {library.TELIX_JS_AV_Pause, library.TELIX_JS_AV_Resume, library.TELIX_JS_AV_Stop}) {
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
            library.TELIX_JS_AV_Queue(player, nullptr, 0, 0, 0, 0, 0, 0); // withdraws
        }
        for (const TELIX_JS_AVCOMPTYPE type : {0U, 1U, 2U, 77U}) {
            for (auto* function :
                 {library.TELIX_JS_AV_GetComponents, library.TELIX_JS_AV_GetCurrActiveComponents}) {
                uint32_t count = 0;
                TELIX_JS_AVCOMPHANDLE* handles = nullptr;
                if (function && function(player, type, &handles, &count) == 0) {
                    expect(handles != nullptr, "an array of components is null");
                }
            }
        }
        endPlayer(m, player);
        endPlayer(m, player); // also for an object that never got a player
    });
    m.check(
        "media that do not exist are refused, or end in an error message of that player",
        {NEED(TELIX_JS_AV_CreatePlayer), NEED(TELIX_JS_AV_Play), NEED(TELIX_JS_AV_RegisterOnPlayStateChange)},
        [&] {
            const TELIX_JS_AV_HANDLE player = newPlayer(m);
            if (play(m, player, missingMedia)) {
                expect(m.waitUntil([&] {
                    return hasCome(
                        [&](const Message& each) { return each.player == player && isFault(each.message); });
                }),
                       "no error comes");
            }
            expect(!hasCome([](const Message& each) { return each.message == TELIX_AV_CB_MSG_PLAYSTART; }),
                   "they play");
        });
    m.check("the end of one player leaves another its messages",
            {NEED(TELIX_JS_AV_CreatePlayer), NEED(TELIX_JS_AV_DestroyPlayer), NEED(TELIX_JS_AV_Play),
             NEED(TELIX_JS_AV_RegisterOnPlayStateChange), NEED(TELIX_JS_AV_UnregisterOnPlayStateChange)},
            [&] {
                const TELIX_JS_AV_HANDLE stays = newPlayer(m);
                endPlayer(m, newPlayer(m));
                if (!play(m, stays, missingMedia)) {
                    throw Skip{"missing media is refused"};
                }
                expect(m.waitUntil([&] {
                    return hasCome([&](const Message& each) { return each.player == stays; });
                }),
                       "no message comes");
            });
    m.check("no message comes after a player has been destroyed",
            {NEED(TELIX_JS_AV_CreatePlayer), NEED(TELIX_JS_AV_DestroyPlayer), NEED(TELIX_JS_AV_Play),
             NEED(TELIX_JS_AV_RegisterOnPlayStateChange), NEED(TELIX_JS_AV_UnregisterOnPlayStateChange)},
            [&] {
                const TELIX_JS_AV_HANDLE player = newPlayer(m);
                play(m, player, missingMedia);
                endPlayer(m, player);
                forgetMessages();
                expect(!m.comesWithin(milliseconds(500),
                                      [] { return hasCome([](const Message&) { return true; }); }),
                       "one came");
            });
    m.check("errors in rights can be asked for and given up",
            {NEED(TELIX_JS_AV_CreatePlayer), NEED(TELIX_JS_AV_RegisterOnDRMRightsError),
             NEED(TELIX_JS_AV_UnregisterOnDRMRightsError)},
            [&] {
                library.TELIX_JS_AV_RegisterOnDRMRightsError(newPlayer(m), onRights);
                library.TELIX_JS_AV_UnregisterOnDRMRightsError(onRights);
                library.TELIX_JS_AV_UnregisterOnDRMRightsError(onRights);
            });
    m.check("play info, pause, resume and stop are safe beside other calls",
            {NEED(TELIX_JS_AV_CreatePlayer), NEED(TELIX_JS_AV_DestroyPlayer), NEED(TELIX_JS_AV_Play),
             NEED(TELIX_JS_AV_GetPlayInfo), NEED(TELIX_JS_AV_Pause), NEED(TELIX_JS_AV_Resume),
             NEED(TELIX_JS_AV_Stop), NEED(TELIX_JS_AV_GetComponents), NEED(TELIX_JS_AV_SetVolume),
             NEED(TELIX_JS_AV_Seek)},
            [&] {
                const TELIX_JS_AV_HANDLE player = newPlayer(m);
                hammer(m, player);
                endPlayer(m, player);
            });
    checkMedia(m);
}
