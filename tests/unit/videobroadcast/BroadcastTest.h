// The fixture of the tests of the video/broadcast object: a platform that hands out handles and keeps the
// callbacks that it is given, to call them as a set does, on threads of its own.
#ifndef TELIX_TESTS_UNIT_VIDEOBROADCAST_BROADCASTTEST_H
#define TELIX_TESTS_UNIT_VIDEOBROADCAST_BROADCASTTEST_H

#include <functional>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "src/videobroadcast/VideoBroadcast.h"
#include "tests/support/BorderTest.h"
#include "tests/unit/support/Heap.h"

class BroadcastTest : public BorderTest {
protected:
    struct Callbacks {
        TELIX_JS_VB_FULLSCREEN_CB fullScreenChange = nullptr;
        TELIX_JS_VB_CHANNEL_CHANGE_CB channelChangeSucceeded = nullptr;
        TELIX_JS_VB_CHANNEL_ERROR_CB channelChangeError = nullptr;
        TELIX_JS_VB_PLAYSTATE_CB playStateChange = nullptr;
        TELIX_JS_VB_PROGRAMMES_CB programmesChanged = nullptr;
        TELIX_JS_VB_PARENTAL_RATING_CB parentalRatingChange = nullptr;
        TELIX_JS_VB_PARENTAL_RATING_CB parentalRatingError = nullptr;
        TELIX_JS_VB_STREAM_EVENT_CB streamEvent = nullptr;
    };

    BroadcastTest() {
        platform.TELIX_JS_VB_GetHandle = [this](TELIX_JS_VB_HANDLE* handle) {
            *handle = nextHandle++;
            return 0;
        };
        platform.TELIX_JS_VB_RegisterOnFullScreenChange = keeps(callbacks.fullScreenChange);
        platform.TELIX_JS_VB_RegisterOnChannelChangeSucceeded = keeps(callbacks.channelChangeSucceeded);
        platform.TELIX_JS_VB_RegisterOnChannelChangeError = keeps(callbacks.channelChangeError);
        platform.TELIX_JS_VB_RegisterOnPlayStateChange = keeps(callbacks.playStateChange);
        platform.TELIX_JS_VB_RegisterOnProgrammesChanged = keepsFor(callbacks.programmesChanged);
        platform.TELIX_JS_VB_RegisterOnParentalRatingChange = keepsFor(callbacks.parentalRatingChange);
        platform.TELIX_JS_VB_RegisterOnParentalRatingError = keepsFor(callbacks.parentalRatingError);
        platform.TELIX_JS_VB_RegisterStreamEvent = [this](TELIX_JS_VB_HANDLE,
                                                          TELIX_JS_VB_STREAM_EVENT_CB callback, const char*,
                                                          const char*, const char*) {
            callbacks.streamEvent = callback;
            return 0;
        };
    }

    // The first object has the platform handle 7, the next one 8 and so on. An empty id leaves the attribute
    // out.
    EmbeddedObject embed(const std::string& id = "tv") {
        return browser.embed("video/broadcast", id.empty() ? Attributes{} : Attributes{{"id", id}});
    }

    EmbeddedObject embedWithoutHandle() {
        platform.TELIX_JS_VB_GetHandle = [](TELIX_JS_VB_HANDLE*) { return 1; };
        return embed();
    }

    static VideoBroadcast& modelOf(const EmbeddedObject& object) {
        return *static_cast<VideoBroadcast*>(object.model());
    }

    // Runs calls of the platform's callbacks as the platform does.
    void onPlatformThread(const std::function<void()>& body) {
        std::thread thread([&] { callbackHeap.during(body); });
        thread.join();
    }

    // How many blocks the platform's callbacks leave on the heap on purpose: records that nobody gets, and
    // what belongs to them. The test fails if it isn't exactly that.
    void blocksLeftBehind(size_t blocks) { m_blocksLeftBehind = blocks; }

    // No check of them; only where the test can't know.
    void anyBlocksMayBeLeft() { m_blocksLeftBehind.reset(); }

    void TearDown() override {
        BorderTest::TearDown();
        if (m_blocksLeftBehind && !HasFailure()) {
            EXPECT_EQ(callbackHeap.left(), *m_blocksLeftBehind) << "blocks of the platform's callbacks left";
        }
    }

    // The calls of the platform since the log was cleared.
    BorderLog::Entries platformCalls() const { return log.startingWith("TELIX_"); }

    Callbacks callbacks;
    TELIX_JS_VB_HANDLE nextHandle = 7;
    HeapWatch callbackHeap;

private:
    template <class Callback>
    static std::function<TELIX_RETCODE_ENUM_T(Callback)> keeps(Callback& place) {
        return [&place](Callback callback) {
            place = callback;
            return 0;
        };
    }
    template <class Callback>
    static std::function<TELIX_RETCODE_ENUM_T(TELIX_JS_VB_HANDLE, Callback)> keepsFor(Callback& place) {
        return [&place](TELIX_JS_VB_HANDLE, Callback callback) {
            place = callback;
            return 0;
        };
    }

    std::optional<size_t> m_blocksLeftBehind = 0; // nothing where the test can't know
};

#endif
