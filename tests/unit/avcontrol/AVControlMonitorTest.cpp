// The buffering monitor, poll by poll.
#include <pthread.h>

#include <atomic>
#include <chrono>
#include <memory>
#include <thread>

#include "src/avcontrol/AVControl.h"
#include "tests/unit/avcontrol/AVControlTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

namespace avcontrol {
namespace {

constexpr uint32_t kNoReport = 0xFFFFFFFF;

class AVControlMonitor : public AVControlTest {
protected:
    // A playing object whose monitor stands before its first poll.
    EmbeddedObject watched(const std::string& url = kClip, const Attributes& more = {}) {
        const EmbeddedObject object = playingVideo(url, more);
        clock.await(1);
        clock.second(); // the one before it touches the object
        log.clear();
        return object;
    }

    // One poll with this much buffered; the page is brought to rest after it.
    void poll(uint32_t buffered) { poll(info(buffered)); }
    void poll(const TELIX_JS_AV_PLAY_INFO& reported) {
        report(reported);
        poll();
    }
    void poll() {
        log.clear();
        clock.second();
        browser.pump();
    }
    // What the last poll asked of the player beside the report itself.
    BorderLog::Entries asked() const {
        BorderLog::Entries calls;
        for (const std::string& call : playerCalls()) {
            if (call.find("GetPlayInfo") == std::string::npos) {
                calls.push_back(call);
            }
        }
        return calls;
    }
    size_t reportsAsked() const { return log.count("TELIX_JS_AV_GetPlayInfo"); }
};

TEST_F(AVControlMonitor, PausesBelowTheLowerLimitAndResumesAtTheUpper) {
    const EmbeddedObject object = watched();
    poll(4);
    EXPECT_THAT(asked(), IsEmpty());
    poll(3);
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Pause(7)"));
    EXPECT_EQ(state(object), Buffering);
    EXPECT_THAT(log.startingWith("event"),
                ElementsAre("event Buffering at video bubbles", "event PlayStateChange at video"));
    poll(2); // already paused
    EXPECT_THAT(asked(), IsEmpty());
    poll(9); // between the limits nothing changes
    EXPECT_THAT(asked(), IsEmpty());
    EXPECT_EQ(state(object), Buffering);
    poll(10);
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Resume(7)"));
    EXPECT_EQ(state(object), Playing);
    EXPECT_THAT(log.startingWith("event"),
                ElementsAre("event Buffering at video", "event PlayStateChange at video"));
    poll(5);
    EXPECT_THAT(asked(), IsEmpty());
}

TEST_F(AVControlMonitor, CrossesToThePageByThePostedCall) {
    const EmbeddedObject object = watched();
    report(info(3));
    log.clear();
    clock.second();
    EXPECT_EQ(state(object), Playing);
    EXPECT_EQ(log.count("NPN_PluginThreadAsyncCall"), 1u);
    browser.pump();
    EXPECT_EQ(state(object), Buffering);
}

TEST_F(AVControlMonitor, ASecondPostedChangeCarriesTheSameStateItCameFrom) {
    const EmbeddedObject object = watched();
    report(info(3));
    clock.second();
    report(info(10));
    clock.second();
    EXPECT_EQ(log.count("NPN_PluginThreadAsyncCall"), 1u); // 1 to 4, and 1 to 1, which is nothing
    browser.pump();
    EXPECT_EQ(state(object), Buffering);
}

TEST_F(AVControlMonitor, PollsOnceASecondAndNotBeforeTheSecondSecond) {
    playingVideo();
    report(info(20));
    clock.await(1);
    EXPECT_EQ(reportsAsked(), 0u);
    clock.second();
    EXPECT_EQ(reportsAsked(), 0u);
    clock.second();
    EXPECT_EQ(reportsAsked(), 2u); // the first poll that is answered writes the play report as well
    clock.second();
    EXPECT_EQ(reportsAsked(), 3u);
}

TEST_F(AVControlMonitor, LooksAtNoResultOfItsPausesAndResumes) {
    const EmbeddedObject object = watched();
    platform.TELIX_JS_AV_Pause = [](TELIX_JS_AV_HANDLE) { return 1; };
    platform.TELIX_JS_AV_Resume = [](TELIX_JS_AV_HANDLE) { return 1; };
    poll(3);
    EXPECT_EQ(state(object), Buffering);
    poll(3);
    EXPECT_THAT(asked(), IsEmpty()); // counts as paused
    poll(10);
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Resume(7)"));
    EXPECT_EQ(state(object), Playing);
    poll(10);
    EXPECT_THAT(asked(), IsEmpty());
}

TEST_F(AVControlMonitor, FlagsInTheReportAreDecoded) {
    watched();
    poll(0x00FF0003); // third byte: the low 16 bits are the amount
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Pause(7)"));
    poll(0x00FF000A);
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Resume(7)"));
    poll(0x12345678); // no flag: all of it
    EXPECT_THAT(asked(), IsEmpty());
    poll(0x00FE0003);
    EXPECT_THAT(asked(), IsEmpty());
}

TEST_F(AVControlMonitor, TheTopByteEndsTheWatching) {
    const EmbeddedObject object = watched();
    poll(0xFF000001);
    EXPECT_THAT(asked(), IsEmpty());
    clock.await(0);
    // The next clip is watched again.
    object.call("stop");
    object.call("play", 1);
    clock.await(1);
}

TEST_F(AVControlMonitor, TheAmountBesideTheTopByteIsLeftInThePlatformsRecord) {
    watched();
    TELIX_JS_AV_PLAY_INFO record = info(0xFF121234);
    platform.TELIX_JS_AV_GetPlayInfo = [&record](TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAY_INFO** out) {
        *out = &record;
        return 0;
    };
    poll();
    clock.await(0);
    EXPECT_EQ(record.buffered, 0x1234u);
}

TEST_F(AVControlMonitor, OtherReportsAreLeftAsThePlatformGaveThem) {
    watched();
    for (const uint32_t buffered : {kNoReport, 0x00FF0020u, 0x12345678u, 20u}) {
        TELIX_JS_AV_PLAY_INFO record = info(buffered);
        platform.TELIX_JS_AV_GetPlayInfo = [&record](TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAY_INFO** out) {
            *out = &record;
            return 0;
        };
        poll();
        EXPECT_EQ(record.buffered, buffered);
        poll(20);
    }
}

TEST_F(AVControlMonitor, AMonitorThatEndsByItselfSaysNothing) {
    const std::string printed = logOf(5, [&] {
        watched();
        poll(0xFF000001);
        clock.await(0);
    });
    EXPECT_THAT(printed, Not(HasSubstr("thread_clean_up")));
}

TEST_F(AVControlMonitor, ACancelledMonitorSaysSo) {
    const std::string printed = logOf(5, [&] {
        const EmbeddedObject object = playingVideo();
        clock.await(1);
        clock.second();
        object.call("stop");
        clock.await(0);
    });
    EXPECT_THAT(printed, HasSubstr("thread_clean_up ::  is called"));
}

// How often the platform has been called on a monitor's thread, and how often the thread could be cancelled
// then.
struct MonitorCalls {
    void count() {
        if (pthread_equal(pthread_self(), browserThread) == 0) {
            int state = 0;
            pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, &state);
            pthread_setcancelstate(state, nullptr);
            ++made;
            cancellable += state == PTHREAD_CANCEL_ENABLE;
        }
    }

    const pthread_t browserThread = pthread_self();
    std::atomic<unsigned> made{0};
    std::atomic<unsigned> cancellable{0};
};

TEST_F(AVControlMonitor, CannotBeCancelledInACallOfThePlatform) {
    const auto calls = std::make_shared<MonitorCalls>();
    const auto reports = [&](const TELIX_JS_AV_PLAY_INFO& reported) {
        platform.TELIX_JS_AV_GetPlayInfo = [calls, record = reported](TELIX_JS_AV_HANDLE,
                                                                      TELIX_JS_AV_PLAY_INFO** out) mutable {
            calls->count();
            *out = &record;
            return 0;
        };
        poll();
    };
    const auto counts = [calls](TELIX_JS_AV_HANDLE) {
        calls->count();
        return 0;
    };
    platform.TELIX_JS_AV_Pause = counts;
    platform.TELIX_JS_AV_Resume = counts;
    platform.TELIX_JS_AV_Stop = counts;
    playlist(asx({entry("first", "<duration value=\"10\"/>")}));
    send(TELIX_AV_CB_MSG_PLAYSTART);
    clock.await(1);
    clock.second();
    reports(info(3));
    EXPECT_EQ(calls->made, 3u); // two reports, of which one is for the log, and the pause
    reports(info(10));
    EXPECT_EQ(calls->made, 5u);
    reports(info(20, 10000));
    EXPECT_EQ(calls->made, 7u); // with the stop of the clip that has run out
    EXPECT_EQ(calls->cancellable, 0u);
    clock.await(0); // the stop has cancelled it, which came into effect afterwards
}

TEST_F(AVControlMonitor, AMonitorCancelledBeforeItBeganSaysNothing) {
    const std::string printed = logOf(5, [&] {
        const EmbeddedObject object = playingVideo();
        clock.await(1);
        object.call("stop");
        clock.await(0);
    });
    EXPECT_THAT(printed, Not(HasSubstr("thread_clean_up")));
}

TEST_F(AVControlMonitor, AReportOfNothingIsSkipped) {
    watched();
    poll(info(0, 0, 0, 0, 0)); // state 0
    EXPECT_THAT(asked(), IsEmpty());
    poll(info(3, 5000, 600000, 10, 0));
    EXPECT_THAT(asked(), IsEmpty());
    poll(info(0, 0, 0, 0, 1)); // nothing known yet
    EXPECT_THAT(asked(), IsEmpty());
    poll(info(0, 1, 0, 0, 1));
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Pause(7)"));
}

TEST_F(AVControlMonitor, AFailedReportIsTriedAgain) {
    watched();
    poll();
    EXPECT_EQ(reportsAsked(), 1u);
    platform.TELIX_JS_AV_GetPlayInfo = [](TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAY_INFO**) { return 0; };
    poll(); // no record
    EXPECT_THAT(asked(), IsEmpty());
    poll(3);
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Pause(7)"));
}

TEST_F(AVControlMonitor, AClipWithLittleLeftToFetchIsNotPaused) {
    watched();
    poll(info(3, 5000, 60000, 51)); // 9 seconds to fetch, and the upper limit is 10
    EXPECT_THAT(asked(), IsEmpty());
    poll(info(3, 5000, 60000, 50));
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Pause(7)"));
}

TEST_F(AVControlMonitor, AClipOfUnknownLengthIsPaused) {
    watched();
    poll(info(3, 5000, 0, 0));
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Pause(7)"));
}

TEST_F(AVControlMonitor, WithoutABufferReportAPausedPlayerResumesAtOnce) {
    const EmbeddedObject object = watched();
    poll(kNoReport);
    EXPECT_THAT(asked(), IsEmpty());
    poll(3);
    poll(kNoReport);
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Resume(7)"));
    EXPECT_EQ(state(object), Playing);
}

TEST_F(AVControlMonitor, TrickPlayIsNotWatched) {
    const EmbeddedObject object = watched();
    object.call("play", 2.0);
    poll(3);
    EXPECT_THAT(playerCalls(), IsEmpty());
    object.call("play", 1.0);
    poll(3);
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Pause(7)"));
}

TEST_F(AVControlMonitor, APauseOfThePageIsNotUndone) {
    const EmbeddedObject object = watched();
    object.call("play", 0);
    poll(20);
    EXPECT_THAT(playerCalls(), IsEmpty());
    EXPECT_EQ(state(object), Paused);
}

TEST_F(AVControlMonitor, APauseOfThePageWhileTheMonitorHasPausedStays) {
    const EmbeddedObject object = watched();
    poll(3);
    object.call("play", 0);
    poll(20);
    EXPECT_THAT(asked(), IsEmpty()); // polled, and left as it is
    EXPECT_EQ(reportsAsked(), 1u);
    EXPECT_EQ(state(object), Paused);
}

TEST_F(AVControlMonitor, AStopOfThePageEndsTheMonitor) {
    const EmbeddedObject object = watched();
    poll(3);
    object.call("stop");
    clock.await(0);
    EXPECT_EQ(state(object), Stopped);
}

TEST_F(AVControlMonitor, NothingIsPolledBeforeThePlatformHasBegun) {
    const EmbeddedObject object = video();
    object.call("play", 1);
    clock.await(1);
    clock.second();
    poll(3);
    EXPECT_THAT(playerCalls(), IsEmpty());
}

TEST_F(AVControlMonitor, NothingIsPolledAfterTheEndOfAClip) {
    const EmbeddedObject object =
        playlist(asx({entry("http://media.example/1"), entry("http://media.example/2")}));
    send(TELIX_AV_CB_MSG_PLAYSTART);
    clock.await(1);
    clock.second();
    send(TELIX_AV_CB_MSG_PLAYEND);
    send(TELIX_AV_CB_MSG_ERR_NET_BUSY);
    poll(3);
    EXPECT_THAT(playerCalls(), IsEmpty()); // state 4, not its own
    send(TELIX_AV_CB_MSG_PLAYSTART);
    poll(3);
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Pause(7)"));
}

TEST_F(AVControlMonitor, LimitsOfZeroNeverPause) {
    watched(kClip, {{"bufferingLowerLimit", "0"}, {"bufferingUpperLimit", "0"}});
    poll(info(0, 5000, 600000));
    EXPECT_THAT(asked(), IsEmpty());
}

TEST_F(AVControlMonitor, CrossedLimitsPauseAndResumeByTurns) {
    watched(kClip, {{"bufferingLowerLimit", "10"}, {"bufferingUpperLimit", "5"}});
    for (int i = 0; i < 3; ++i) {
        poll(7);
        EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Pause(7)"));
        poll(7);
        EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Resume(7)"));
    }
}

// Ready state

TEST_F(AVControlMonitor, ReportsTheReadyStateOnceAfterASeekAboveTheUpperLimit) {
    const EmbeddedObject object = watched();
    EXPECT_EQ(object.call("seek", 1000), true);
    poll(10); // not above it
    EXPECT_THAT(log.startingWith("event"), IsEmpty());
    poll(11);
    EXPECT_THAT(log.startingWith("event"), ElementsAre("event ReadyStateChange at video bubbles",
                                                       "event onReadyStateChange at video bubbles"));
    poll(11);
    EXPECT_THAT(log.startingWith("event"), IsEmpty());
}

TEST_F(AVControlMonitor, APausedPlayerWithASeekPendingIsPolledOnIfTheMonitorPausedIt) {
    const EmbeddedObject object = watched();
    poll(3);
    object.call("play", 0);
    object.call("seek", 1000);
    poll(11);
    EXPECT_THAT(log.startingWith("event"), ElementsAre("event ReadyStateChange at video bubbles",
                                                       "event onReadyStateChange at video bubbles"));
    poll(11); // nothing is pending any more
    EXPECT_THAT(asked(), IsEmpty());
    EXPECT_EQ(state(object), Paused);
}

TEST_F(AVControlMonitor, AnElementWithoutAnIdGetsNoReadyStateEvent) {
    const EmbeddedObject object = element("video/mp4", {{"data", kClip}});
    object.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    clock.await(1);
    clock.second();
    object.call("seek", 1000);
    poll(11);
    EXPECT_THAT(events(), IsEmpty());
    EXPECT_EQ(static_cast<AVControl*>(object.model())->getReadyState(), 5);
}

TEST_F(AVControlMonitor, AResumeOfThePageSetsTheReadyStateBackInSilence) {
    const EmbeddedObject object = watched();
    auto& model = *static_cast<AVControl*>(object.model());
    object.call("seek", 1000);
    poll(11);
    EXPECT_EQ(model.getReadyState(), 5);
    object.call("play", 0);
    log.clear();
    object.call("play", 1);
    EXPECT_EQ(model.getReadyState(), 3);
    EXPECT_THAT(log.startingWith("event"), ElementsAre("event PlayStateChange at video"));
}

// Creation

TEST_F(AVControlMonitor, IsForbiddenByTheAttribute) {
    playingVideo(kClip, {{"buffering", "FALSE"}});
    clock.await(0);
}

TEST_F(AVControlMonitor, ASeekThatRestartsMakesAThreadAllTheSame) {
    const EmbeddedObject object = playingVideo("mms://media.example/a.wmv", {{"buffering", "false"}});
    EXPECT_EQ(object.call("seek", 1000), true);
    clock.await(1);
    clock.second(); // it isn't to run, and ends at once
    clock.await(0);
    EXPECT_EQ(clock.ended(), 1u);
    // Its place is free again.
    EXPECT_EQ(object.call("seek", 2000), true);
    clock.await(1);
}

TEST_F(AVControlMonitor, ASeekThatRestartsReplacesTheMonitor) {
    const EmbeddedObject object = watched("mms://media.example/a.wmv");
    EXPECT_EQ(object.call("seek", 1000), true);
    clock.awaitEnded(1);
    clock.await(1);
    clock.second();
    send(TELIX_AV_CB_MSG_PLAYSTART);
    poll(3);
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Pause(7)"));
}

TEST_F(AVControlMonitor, ASeekThatRestartsAfterTheWatchingHasEndedMakesAThreadThatIsNotToRun) {
    const EmbeddedObject object = watched("mms://media.example/a.wmv");
    poll(0xFF000001);
    clock.await(0);
    EXPECT_EQ(object.call("seek", 1000), true);
    clock.await(1);
    clock.second();
    clock.await(0);
    EXPECT_EQ(clock.ended(), 2u);
    // A play has the next one run.
    object.call("stop");
    object.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    clock.await(1);
    clock.second();
    poll(3);
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Pause(7)"));
}

TEST_F(AVControlMonitor, WithoutAThreadThePlaybackGoesOnUnwatched) {
    clock.refuseThreads(true);
    const EmbeddedObject object = playingVideo();
    clock.await(0);
    clock.refuseThreads(false);
    object.call("stop");
    object.call("play", 1); // its place is free
    clock.await(1);
}

TEST_F(AVControlMonitor, AMonitorThatCannotBeCancelledKeepsItsPlace) {
    const EmbeddedObject object = watched();
    clock.refuseCancellation(true);
    object.call("stop");
    EXPECT_EQ(state(object), Stopped);
    object.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    clock.await(1); // no second one
    poll(3);
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Pause(7)"));
    clock.refuseCancellation(false);
    object.call("stop");
    clock.await(0);
}

TEST_F(AVControlMonitor, ThereIsOneThreadHoweverOftenThePagePlays) {
    const EmbeddedObject object = watched();
    send(TELIX_AV_CB_MSG_ERR_PLAYING); // leaves the monitor running
    object.call("play", 1);
    clock.await(1);
    EXPECT_EQ(clock.ended(), 0u);
}

TEST_F(AVControlMonitor, EachPlayingObjectHasItsOwn) {
    const EmbeddedObject first = element("video/mp4", {{"id", "first"}, {"data", kClip}});
    const EmbeddedObject second = element("video/mp4", {{"id", "second"}, {"data", kClip}});
    first.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    second.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    clock.await(2);
    destroy(first);
    clock.await(1);
    destroy(second);
    clock.await(0);
}

// The duration of a playlist's clip

TEST_F(AVControlMonitor, EndsAPlaylistsClipAtItsTimeAndPlaysTheNext) {
    const EmbeddedObject object =
        playlist(asx({entry("mms-like", "<duration value=\"20\"/>"), entry("second")}));
    send(TELIX_AV_CB_MSG_PLAYSTART);
    clock.await(1);
    clock.second();
    poll(info(20, 19999));
    EXPECT_THAT(asked(), IsEmpty());
    poll(info(20, 20000));
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Stop(7)", playOf("second")));
    EXPECT_EQ(state(object), Buffering);
    EXPECT_EQ(object.get("currentTrackIndex"), 2);
    clock.awaitEnded(1); // it has cancelled itself
    clock.await(1);      // and the next clip has a fresh one
}

TEST_F(AVControlMonitor, CountsTheDurationFromTheStartTime) {
    const EmbeddedObject object =
        playlist(asx({entry("first", "<starttime value=\"5\"/><duration value=\"10\"/>")}));
    EXPECT_THAT(playerCalls(), ElementsAre(playOf("first"), "TELIX_JS_AV_Seek(7, 5000)"));
    send(TELIX_AV_CB_MSG_PLAYSTART);
    clock.await(1);
    clock.second();
    poll(info(20, 14999));
    EXPECT_THAT(asked(), IsEmpty());
    poll(info(20, 15000));
    EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Stop(7)"));
    EXPECT_EQ(state(object), Finished);
    clock.await(0);
}

TEST_F(AVControlMonitor, AClipThatRunsOutEndsAlsoIfThePlatformRefusesItsStop) {
    for (const int result : {0, 1}) {
        nextPlayer = 7;
        g_lastReceivedMessage = 0;
        const EmbeddedObject object = playlist(asx({entry("first", "<duration value=\"10\"/>")}));
        platform.TELIX_JS_AV_Stop = [result](TELIX_JS_AV_HANDLE) { return result; };
        send(TELIX_AV_CB_MSG_PLAYSTART);
        clock.await(1);
        clock.second();
        std::vector<int32_t> states;
        const ScriptFunction listener = browser.function("listener");
        listener.does([&](const Values&) {
            states.push_back(state(object));
            return Value();
        });
        object.set("onPlayStateChange", listener);
        poll(info(20, 10000));
        EXPECT_THAT(asked(), ElementsAre("TELIX_JS_AV_Stop(7)")) << result;
        // A stop that was refused is none, and the end of the clip comes all the same.
        EXPECT_EQ(states,
                  result == 0 ? (std::vector<int32_t>{Stopped, Finished}) : (std::vector<int32_t>{Finished}));
        clock.await(0); // cancelled in either case
        destroy(object);
    }
}

TEST_F(AVControlMonitor, ThePositionListenerIsCalledOnceAtTheEndOfSuchAClip) {
    const EmbeddedObject object =
        playlist(asx({entry("first", "<duration value=\"10\"/>"), entry("second")}));
    const ScriptFunction listener = browser.function("position");
    object.set("onPlayPositionChanged", listener);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    clock.await(1);
    clock.second();
    report(info(20, 10000));
    log.clear();
    clock.second();
    EXPECT_EQ(listener.count(), 0u); // script is reached on the browser thread only
    browser.pump();
    EXPECT_EQ(listener.count(), 1u);
    log.expectInOrder({"TELIX_JS_AV_Stop(7)", "event PlayStateChange at video",
                       "NPN_InvokeDefault position()", playOf("second")});
}

TEST_F(AVControlMonitor, AnotherObjectsPlaylistClipThatRunsOutEndsTheClipOfTheLastPlayed) {
    // One pipeline: what ends is the clip of whichever object played last.
    const EmbeddedObject first = playlist(asx({entry("first", "<duration value=\"10\"/>")}));
    send(TELIX_AV_CB_MSG_PLAYSTART);
    clock.await(1);
    clock.second();
    const EmbeddedObject second =
        element("video/mp4", {{"id", "second"}, {"data", kClip}, {"buffering", "false"}});
    second.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    poll(info(20, 10000));
    EXPECT_EQ(state(first), Playing);
    EXPECT_EQ(state(second), Finished);
    EXPECT_EQ(platform.TELIX_JS_AV_Stop.count(), 0u); // the pipeline isn't the first's
    clock.await(0);
}

// The end of the object

TEST_F(AVControlMonitor, APollUnderWayComesBackToAnObjectThatHasEnded) {
    const EmbeddedObject object = watched();
    std::atomic<bool> inPoll{false};
    std::atomic<bool> goOn{false};
    std::atomic<bool> left{false};
    TELIX_JS_AV_PLAY_INFO record = info(3);
    platform.TELIX_JS_AV_GetPlayInfo = [&](TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAY_INFO** out) {
        inPoll = true;
        while (!goOn) {
            sched_yield();
        }
        left = true;
        *out = &record;
        return 0;
    };
    clock.runFreely(true);
    while (!inPoll) {
        sched_yield();
    }
    destroy(object);
    goOn = true;
    clock.await(0);
    EXPECT_TRUE(left);
    browser.pump();
    EXPECT_EQ(log.count("event"), 0u);
    EXPECT_EQ(log.count("TELIX_JS_AV_Pause"), 0u);
}

TEST_F(AVControlMonitor, AChangePostedBeforeTheEndOfTheObjectStillRuns) {
    const EmbeddedObject object = watched();
    report(info(3));
    clock.second();
    object.destroy();
    log.clear();
    browser.pump();
    // The element is gone from the page, so the script of the event finds nothing; but it ran.
    EXPECT_EQ(log.count("NPN_Evaluate"), 2u);
    EXPECT_EQ(clock.browserSleeps(), 0u);
}

TEST_F(AVControlMonitor, TheEndWaitsThreeSecondsForAPostedChangeAndThenGoesOn) {
    const EmbeddedObject object = watched();
    auto* model = static_cast<AVControl*>(object.model());
    object.destroy();
    // A change that is posted now comes after the step that deletes the object.
    onPlatformThread([&] { model->changePlayState(PLAY_STATE_PLAYING, PLAY_STATE_ERROR); });
    onPlatformThread([&] { model->changeReadyState(5); });
    onPlatformThread([&] { model->handlePlayPositionChanged(); });
    log.clear();
    browser.pump();
    EXPECT_EQ(clock.browserSleeps(), 3u);
    EXPECT_EQ(log.count("NPN_Evaluate"), 0u); // they find their object gone
}

TEST_F(AVControlMonitor, TheEndDoesNotWaitForAReadyStateThatIsPosted) {
    const EmbeddedObject object = watched();
    auto* model = static_cast<AVControl*>(object.model());
    object.destroy();
    onPlatformThread([&] { model->changeReadyState(5); });
    browser.pump();
    EXPECT_EQ(clock.browserSleeps(), 0u);
}

TEST_F(AVControlMonitor, AChangeThatFindsNoMemoryIsLostAndNotWaitedFor) {
    const EmbeddedObject object = playingVideo(kClip, {{"buffering", "false"}});
    auto* model = static_cast<AVControl*>(object.model());
    const auto change = [model] {
        std::thread([model] {
            const MemoryShortage shortage;
            model->changePlayState(PLAY_STATE_PLAYING, PLAY_STATE_ERROR);
        }).join();
    };
    change();
    EXPECT_EQ(log.count("NPN_PluginThreadAsyncCall"), 0u);
    browser.pump();
    EXPECT_EQ(state(object), Playing);
    EXPECT_THAT(logOf(5, change), HasSubstr(logLine("AVCONTROL", "changePlayState", "malloc failed\n")));
    destroy(object);
    EXPECT_EQ(clock.browserSleeps(), 0u);
}

TEST_F(AVControlMonitor, TheEndWaitsNoLongerThanThePostedChanges) {
    const EmbeddedObject object = watched();
    auto* model = static_cast<AVControl*>(object.model());
    object.destroy();
    onPlatformThread([&] { model->changePlayState(PLAY_STATE_PLAYING, PLAY_STATE_ERROR); });
    clock.whenBrowserSleeps([&] { model->decrementWorkingAsyncCall(); });
    browser.pump();
    EXPECT_EQ(clock.browserSleeps(), 1u);
}

TEST_F(AVControlMonitor, AClipChangePostedBeforeTheEndPlaysOnceMoreAndLeavesNothing) {
    const EmbeddedObject object =
        playlist(asx({entry("first", "<duration value=\"10\"/>"), entry("second")}));
    send(TELIX_AV_CB_MSG_PLAYSTART);
    clock.await(1);
    clock.second();
    report(info(20, 10000));
    clock.second();
    object.destroy();
    browser.pump();
    EXPECT_TRUE(log.contains(playOf("second")));
    clock.await(0);
    EXPECT_EQ(g_lastPlayedInstance, nullptr);
    send(TELIX_AV_CB_MSG_PLAYSTART); // finds no object
    blocksLeftBehind(1);             // its record
}

TEST_F(AVControlMonitor, ManyObjectsComeAndGoWhileTheirMonitorsRun) {
    clock.runFreely(true);
    static TELIX_JS_AV_PLAY_INFO low = info(1);
    static TELIX_JS_AV_PLAY_INFO full = info(30);
    std::atomic<unsigned> polls{0};
    platform.TELIX_JS_AV_GetPlayInfo = [&](TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAY_INFO** out) {
        *out = ++polls % 2 ? &low : &full;
        return 0;
    };
    for (int i = 0; i < 20; ++i) {
        const EmbeddedObject object = video();
        const unsigned before = polls;
        object.call("play", 1);
        send(TELIX_AV_CB_MSG_PLAYSTART);
        browser.pumpUntil([&] { return polls > before; }, std::chrono::seconds(50));
        if (i % 2) {
            object.call("stop");
        }
        destroy(object);
    }
    clock.await(0);
    platform.TELIX_JS_AV_GetPlayInfo = nullptr;
}

} // namespace
} // namespace avcontrol
