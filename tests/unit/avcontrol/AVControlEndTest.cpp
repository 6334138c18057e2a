// The end of an object: steps that come late, also when the next object stands at the same address, and
// monitors that a call of the platform keeps.
#include <atomic>
#include <memory>
#include <thread>
#include <utility>
#include <vector>

#include "src/avcontrol/AVControl.h"
#include "tests/unit/avcontrol/AVControlTest.h"
#include "tests/unit/support/SameAddress.h"

using ::testing::IsEmpty;

namespace avcontrol {
namespace {

// ---- Late steps

class AVControlLateStep : public AVControlTest {
protected:
    // A playing element is taken out, another one comes at the same address and has listeners, and then the
    // steps run that `post` posted for the first.
    void replaceAndRun(const std::function<void(AVControl&)>& post) {
        const EmbeddedObject first = playingVideo(kClip, {{"buffering", "false"}});
        auto* model = static_cast<AVControl*>(first.model());
        first.destroy();
        // The browser's calls run in their order: the end of the first, the new element, the steps.
        browser.table().pluginthreadasynccall(
            first.npp(), [](void* test) { static_cast<AVControlLateStep*>(test)->embedSecond(); }, this);
        onPlatformThread([&] { post(*model); });
        browser.pump();
        ASSERT_TRUE(m_second);
        ASSERT_EQ(m_second->model(), place.address());
        ASSERT_EQ(static_cast<void*>(model), place.address());
    }

    void embedSecond() {
        m_second = std::make_unique<EmbeddedObject>(element("video/mp4", {{"id", "video"}, {"data", kClip}}));
        m_second->set("onPlayStateChange", listener);
        m_second->set("onPlayPositionChanged", listener);
        log.clear();
    }

    const SameAddress place{sizeof(AVControl)};
    const ScriptFunction listener = browser.function("listener");

private:
    std::unique_ptr<EmbeddedObject> m_second;
};

TEST_F(AVControlLateStep, AReadyStateIsNotReportedByTheNextElement) {
    replaceAndRun([](AVControl& first) { first.changeReadyState(5); });
    EXPECT_THAT(log.startingWith("event"), IsEmpty());
}

TEST_F(AVControlLateStep, APlayStateIsNotTakenOnByTheNextElement) {
    replaceAndRun([](AVControl& first) { first.changePlayState(PLAY_STATE_PLAYING, PLAY_STATE_ERROR); });
    EXPECT_THAT(log.startingWith("event"), IsEmpty());
    EXPECT_EQ(listener.count(), 0u);
}

TEST_F(AVControlLateStep, ANewPositionIsNotReportedByTheNextElement) {
    replaceAndRun([](AVControl& first) { first.handlePlayPositionChanged(); });
    EXPECT_EQ(listener.count(), 0u);
}

TEST_F(AVControlLateStep, AnElementWhoseStartFailedLeavesOnlyALineInTheLog) {
    platform.TELIX_JS_AV_CreatePlayer = [](TELIX_JS_AV_HANDLE*, int32_t, int32_t, uint32_t) { return 1; };
    const std::string printed = logOf(5, [&] {
        element("video/mp4", {{"id", "video"}});
        browser.pump();
    });
    EXPECT_THAT(printed, ::testing::HasSubstr(logLine("AVCONTROL", "startMediaCb", "Instance: 0x")));
}

// ---- Steps that never come

// A browser that keeps what is posted while `isKeeping`, instead of running it.
class AVControlDroppedStep : public AVControlTest {
protected:
    struct Step {
        void (*function)(void*);
        void* data;
    };

    AVControlDroppedStep() {
        static decltype(browser.table().pluginthreadasynccall) post;
        post = browser.table().pluginthreadasynccall;
        browser.table().pluginthreadasynccall = [](NPP npp, void (*function)(void*), void* data) {
            if (s_isKeeping) {
                s_kept.push_back({function, data});
            } else {
                post(npp, function, data);
            }
        };
    }
    ~AVControlDroppedStep() override { runKept(); }

    // An element whose end the browser does not run.
    void endUnnoticed(const EmbeddedObject& object) {
        s_isKeeping = true;
        onPlatformThread([model = static_cast<AVControl*>(object.model())] {
            model->changePlayState(PLAY_STATE_PLAYING, PLAY_STATE_ERROR);
        });
        object.destroy();
        s_isKeeping = false;
    }
    static void runKept() {
        for (const Step& step : std::exchange(s_kept, {})) {
            step.function(step.data);
        }
    }

    static inline bool s_isKeeping = false;
    static inline std::vector<Step> s_kept;
};

TEST_F(AVControlDroppedStep, ItsObjectIsDeletedWithALaterElement) {
    const EmbeddedObject object = video();
    object.set("onPlayStateChange", browser.function("listener"));
    endUnnoticed(object);
    const auto isDeleted = [this] { return log.count("NPN_ReleaseObject listener") != 0; };
    clock.advance(30);
    element("video/mp4", {}).destroy();
    EXPECT_FALSE(isDeleted()) << "the step may still come";
    clock.advance(31);
    element("video/mp4", {}).destroy();
    EXPECT_TRUE(isDeleted());
    EXPECT_EQ(clock.browserSleeps(), 0u) << "it waits for a change of state that never comes";
    browser.pump();
    log.clear();
    runKept();
    EXPECT_THAT(log.everything(), IsEmpty());
}

// ---- Monitors that the platform keeps

// A call of the platform that lasts until the test lets it go.
class HangingCall {
public:
    void hang() {
        m_isEntered = true;
        while (!m_isReleased) {
            std::this_thread::yield();
        }
    }
    void awaitEntered() const {
        while (!m_isEntered) {
            std::this_thread::yield();
        }
    }
    void release() { m_isReleased = true; }

private:
    std::atomic<bool> m_isEntered{false};
    std::atomic<bool> m_isReleased{false};
};

class AVControlHangingMonitor : public AVControlTest {
protected:
    // The element is taken out while its monitor stands in the call; the call then comes back.
    void endWhileHanging(const EmbeddedObject& object) {
        clock.runFreely(true);
        call.awaitEntered();
        clock.runFreely(false);
        object.destroy();
        log.clear();
        browser.pump();
        EXPECT_EQ(platform.TELIX_JS_AV_UnregisterOnPlayStateChange.count(), 1u);
        EXPECT_EQ(clock.ended(), 0u) << "the monitor is still there";
        EXPECT_LE(clock.browserSleeps(), 3u);
        log.clear();
        call.release();
        clock.await(0);
        EXPECT_EQ(clock.ended(), 1u);
        browser.pump();
        EXPECT_THAT(log.everything(), IsEmpty());
    }

    // What the platform reports from the `first` time on; it hangs at that one.
    void hangsInReport(unsigned first, const TELIX_JS_AV_PLAY_INFO& reported) {
        auto count = std::make_shared<std::atomic<unsigned>>(0);
        auto record = std::make_shared<TELIX_JS_AV_PLAY_INFO>(reported);
        platform.TELIX_JS_AV_GetPlayInfo = [=](TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAY_INFO** out) {
            if (++*count == first) {
                call.hang();
            }
            *out = record.get();
            return 0;
        };
    }

    static std::thread::id browserThread() {
        static const std::thread::id id = std::this_thread::get_id();
        return id;
    }
    static bool listenerIsReleased(const BorderLog& border) {
        return border.count("NPN_ReleaseObject listener") != 0;
    }

    HangingCall call;
};

TEST_F(AVControlHangingMonitor, InTheReportOfTheBufferOutlivesItsObject) {
    const EmbeddedObject object = playingVideo();
    hangsInReport(1, info(3));
    endWhileHanging(object);
}

TEST_F(AVControlHangingMonitor, InTheReportOfAClipOutlivesItsObject) {
    const EmbeddedObject object = playingVideo();
    hangsInReport(2, info(3));
    endWhileHanging(object);
}

TEST_F(AVControlHangingMonitor, DoesNotLookAtTheRecordOfAPlayerThatHasGone) {
    const EmbeddedObject object = playingVideo();
    auto* record = new TELIX_JS_AV_PLAY_INFO(info(0xFF000001));
    platform.TELIX_JS_AV_GetPlayInfo = [this, record](TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAY_INFO** out) {
        *out = record;
        call.hang();
        return 0;
    };
    platform.TELIX_JS_AV_DestroyPlayer = [record](TELIX_JS_AV_HANDLE) {
        delete record; // it lives as long as its player
        return 0;
    };
    endWhileHanging(object);
}

TEST_F(AVControlHangingMonitor, InAPauseOutlivesItsObject) {
    const EmbeddedObject object = playingVideo();
    report(info(3));
    platform.TELIX_JS_AV_Pause = [this](TELIX_JS_AV_HANDLE) {
        call.hang();
        return 0;
    };
    endWhileHanging(object);
}

TEST_F(AVControlHangingMonitor, InAResumeOutlivesItsObject) {
    const EmbeddedObject object = playingVideo();
    report(info(3));
    clock.await(1);
    clock.seconds(2);
    browser.pump();
    EXPECT_EQ(state(object), Buffering);
    report(info(20));
    platform.TELIX_JS_AV_Resume = [this](TELIX_JS_AV_HANDLE) {
        call.hang();
        return 0;
    };
    endWhileHanging(object);
}

TEST_F(AVControlHangingMonitor, InTheStopOfAClipOutlivesItsObject) {
    const EmbeddedObject object =
        playlist(asx({entry("first", "<duration value=\"10\"/>"), entry("second")}));
    send(TELIX_AV_CB_MSG_PLAYSTART);
    report(info(20, 10000));
    platform.TELIX_JS_AV_Stop = [this, browserThread = std::this_thread::get_id()](TELIX_JS_AV_HANDLE) {
        if (std::this_thread::get_id() != browserThread) {
            call.hang();
        }
        return 0;
    };
    endWhileHanging(object);
}

TEST_F(AVControlHangingMonitor, IsLeftAloneByAStopAndANewPlay) {
    const EmbeddedObject object = playingVideo();
    hangsInReport(1, info(20));
    clock.runFreely(true);
    call.awaitEntered();
    clock.runFreely(false);
    object.call("stop");
    object.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(state(object), Playing);
    call.release();
    clock.awaitEnded(1); // cancelled by the stop
    clock.await(1);      // the new play's
}

TEST_F(AVControlHangingMonitor, TheObjectDoesNotEndWhileItsMonitorIsAtWorkOnIt) {
    const EmbeddedObject object = playingVideo();
    const ScriptFunction listener = browser.function("listener");
    object.set("onPlayStateChange", listener);
    report(info(3));
    // The posted change of state is the object's work; here it takes a while.
    browserThread();
    static HangingCall* hanging = nullptr;
    static const BorderLog* border = nullptr;
    static std::atomic<bool> isUnregistered;
    static std::atomic<bool> isReleased;
    hanging = &call;
    border = &log;
    isUnregistered = false;
    isReleased = false;
    auto& post = browser.table().pluginthreadasynccall;
    static auto reallyPost = post;
    post = [](NPP npp, void (*step)(void*), void* data) {
        if (std::this_thread::get_id() == browserThread()) {
            reallyPost(npp, step, data);
            return;
        }
        hanging->hang();
        while (!isUnregistered) {
            std::this_thread::yield();
        }
        for (int i = 0; i < 2000; ++i) {
            std::this_thread::yield(); // enough for an end that doesn't wait to get on
        }
        isReleased = listenerIsReleased(*border);
        reallyPost(npp, step, data);
    };
    clock.runFreely(true);
    call.awaitEntered();
    object.destroy();
    platform.TELIX_JS_AV_UnregisterOnPlayStateChange = [this](TELIX_JS_AV_PLAYSTATE_CB) {
        call.release();
        isUnregistered = true;
        return 0;
    };
    log.clear();
    browser.pump();
    clock.await(0);
    EXPECT_FALSE(isReleased);
    EXPECT_TRUE(listenerIsReleased(log));
    post = reallyPost;
}

} // namespace
} // namespace avcontrol
