// Many threads at once, while objects and players come and go: what is called belongs to one that lives.
// TELIX_EVENTS in the environment is the number of events; see docs/reliability.md.
#include <gtest/gtest.h>

#include <array>
#include <atomic>
#include <cstdlib>
#include <mutex>
#include <set>
#include <thread>

#include "desktop/platform/Broadcast.h"
#include "desktop/platform/FaultInjection.h"
#include "desktop/platform/Platform.h"
#include "desktop/platform/PlayerRegistry.h"
#include "telix/telix_platform.h"
#include "tests/desktop/Received.h"

using namespace desktop;

namespace {

constexpr int kThreads = 8;
constexpr int kDefaultEvents = 8000;
// The threads wait when so many events are posted and not yet delivered.
constexpr int kMaxPending = 100;
constexpr char kEventId[] = "10";
constexpr char kComponentTag[] = "1f";
constexpr char kMissingClip[] = "file:///missing/clip.mp4";

int eventsOfAThread() {
    const char* const events = std::getenv("TELIX_EVENTS");
    return (events ? std::atoi(events) : kDefaultEvents) / kThreads;
}

// Handles that may be called, and the number of calls.
class Living {
public:
    void insert(uint32_t handle) {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_handles.insert(handle);
    }
    void erase(uint32_t handle) {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_handles.erase(handle);
    }
    TELIX_RETCODE_ENUM_T called(uint32_t handle) {
        std::lock_guard<std::mutex> lock(m_mutex);
        EXPECT_EQ(m_handles.count(handle), 1U) << handle << " is gone";
        ++m_calls;
        return TELIX_RETCODE_SUCCESS;
    }
    int calls() {
        std::lock_guard<std::mutex> lock(m_mutex);
        return m_calls;
    }

private:
    std::mutex m_mutex;
    std::set<uint32_t> m_handles;
    int m_calls = 0;
};

Living g_players;
Living g_objects;

TELIX_RETCODE_ENUM_T onMessage(TELIX_JS_AV_HANDLE player, TELIX_AV_CB_MSG) {
    return g_players.called(player);
}
TELIX_RETCODE_ENUM_T onRights(TELIX_JS_AV_HANDLE player, TELIX_AV_DRM_ERR_STATE_ENUM_T, ___UINT8*, ___UINT8*,
                              ___UINT8*) {
    return g_players.called(player);
}
TELIX_RETCODE_ENUM_T onStreamEvent(TELIX_JS_VB_HANDLE object, ___UINT8*, ___UINT8*, ___UINT8*, ___UINT8*,
                                   ___UINT32, ___UINT8*) {
    return g_objects.called(object);
}

TELIX_JS_AV_HANDLE newPlayer() {
    TELIX_JS_AV_HANDLE player = 0;
    EXPECT_EQ(TELIX_JS_AV_CreatePlayer(&player, 0, 0, 0), 0);
    g_players.insert(player);
    TELIX_JS_AV_RegisterOnPlayStateChange(player, onMessage);
    TELIX_JS_AV_RegisterOnDRMRightsError(player, onRights);
    return player;
}

// From then on it is the one that is sent messages to.
void fail(TELIX_JS_AV_HANDLE player) {
    TELIX_JS_AV_Play(player, kMissingClip, 1, 0, 0, 0, 0, 0);
}

void destroyPlayer(TELIX_JS_AV_HANDLE player) {
    EXPECT_EQ(TELIX_JS_AV_DestroyPlayer(player), 0);
    g_players.erase(player);
}

TELIX_JS_VB_HANDLE newObject() {
    TELIX_JS_VB_HANDLE object = 0;
    EXPECT_EQ(TELIX_JS_VB_GetHandle(&object), 0);
    g_objects.insert(object);
    EXPECT_EQ(TELIX_JS_VB_RegisterStreamEvent(object, onStreamEvent, kEventId, kComponentTag, "event"), 0);
    return object;
}

void destroyObject(TELIX_JS_VB_HANDLE object) {
    EXPECT_EQ(TELIX_JS_VB_UnRegisterStreamEvent(object, onStreamEvent, kEventId, kComponentTag, "event"), 0);
    g_objects.erase(object);
    TELIX_JS_VB_Release(object);
}

class EventThreadsTest : public testing::Test {
protected:
    // One event of a kind: of the broadcast, of the player that played last, or a question that the plug-in
    // asks on a thread of its own. False if there was nobody to receive it.
    bool makeEvent(int kind) {
        switch (kind % 4) {
        case 0:
            ++m_pending;
            Platform::instance().post([this] {
                m_injection.streamEvent({10, 0x1f, "event", {0x2a}, "trigger"});
                --m_pending;
            });
            return true;
        case 1:
            return PlayerRegistry::instance().injectMessage(TELIX_AV_CB_MSG_PLAYSTART);
        case 2:
            return PlayerRegistry::instance().injectRightsError(0, "content", "system", "url");
        default:
            TELIX_JS_AV_PLAY_INFO* record = nullptr;
            return TELIX_JS_AV_GetPlayInfo(m_player, &record) == 0 && record;
        }
    }

    void makeEvents() {
        for (int event = 0; event < m_eventCount;) {
            if (m_pending < kMaxPending && makeEvent(event)) {
                ++event;
            } else {
                std::this_thread::yield();
            }
        }
        ++m_finished;
    }

    const int m_eventCount = eventsOfAThread();
    FaultInjection m_injection{Broadcast::instance()};
    // Those that stay.
    const TELIX_JS_AV_HANDLE m_player = newPlayer();
    const TELIX_JS_VB_HANDLE m_object = newObject();
    std::atomic<int> m_pending{0};
    std::atomic<int> m_finished{0};
};

TEST_F(EventThreadsTest, WhileObjectsAndPlayersComeAndGoNothingReachesADeadOne) {
    std::array<std::thread, kThreads> threads;
    for (std::thread& thread : threads) {
        thread = std::thread([this] { makeEvents(); });
    }
    while (m_finished != kThreads) {
        const TELIX_JS_AV_HANDLE player = newPlayer();
        const TELIX_JS_VB_HANDLE object = newObject();
        fail(player);
        const int before = g_players.calls();
        while (m_finished != kThreads && g_players.calls() == before) {
            std::this_thread::yield();
        }
        destroyObject(object); // with more on the way to both
        destroyPlayer(player);
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_TRUE(waitUntil([this] { return m_pending == 0; }));
    destroyObject(m_object);
    destroyPlayer(m_player);
    EXPECT_GE(g_objects.calls(), kThreads * m_eventCount / 4);
    EXPECT_GT(g_players.calls(), 0);
}

} // namespace
