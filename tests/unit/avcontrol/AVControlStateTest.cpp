// Play state and ready state: what each platform message does, which events a change of state gives, and what
// becomes of messages and posted changes that come late.
#include <sstream>

#include "src/avcontrol/AVControl.h"
#include "tests/unit/avcontrol/AVControlTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

namespace avcontrol {
namespace {

class AVControlState : public AVControlTest {
protected:
    // Brings an object into a state by what a page and a platform can do.
    EmbeddedObject inState(int wanted) {
        nextPlayer = 7;
        g_lastReceivedMessage = 0;
        const EmbeddedObject object = video();
        switch (wanted) {
        case Stopped:
            break;
        case Playing:
            object.call("play", 1);
            send(TELIX_AV_CB_MSG_PLAYSTART);
            break;
        case Paused:
            object.call("play", 1);
            object.call("play", 0);
            break;
        case Buffering:
            object.call("play", 1);
            break;
        case Finished:
            object.call("play", 1);
            send(TELIX_AV_CB_MSG_PLAYEND);
            g_lastReceivedMessage = 0;
            break;
        case Error:
            object.call("play", 1);
            send(TELIX_AV_CB_MSG_ERR_PLAYING);
            g_lastReceivedMessage = 0;
            break;
        default:
            ADD_FAILURE() << "no way into state " << wanted;
        }
        EXPECT_EQ(state(object), wanted);
        forget();
        return object;
    }

    // Events from here on count.
    void forget() {
        m_eventsBefore = browser.events().size();
        log.clear();
    }
    std::vector<std::string> newEvents() const {
        std::vector<std::string> all;
        const std::vector<DomEvent> dispatched = browser.events();
        for (size_t i = m_eventsBefore; i < dispatched.size(); ++i) {
            const DomEvent& event = dispatched[i];
            EXPECT_EQ(event.elementId, "video");
            EXPECT_FALSE(event.cancelable);
            all.push_back(event.type + (event.bubbles ? "+" : ""));
        }
        return all;
    }

private:
    size_t m_eventsBefore = 0;
};

const int kReachableStates[] = {Stopped, Playing, Paused, Buffering, Finished, Error};

// The table of transitions, row by row. "Buffering+" is the event that bubbles: the one of entering.

TEST_F(AVControlState, PlayConnectsAndBuffersFromEveryStateAtRest) {
    for (const int from : {Stopped, Finished, Error}) {
        const EmbeddedObject object = inState(from);
        EXPECT_EQ(object.call("play", 1), true) << from;
        EXPECT_EQ(state(object), Buffering) << from;
        EXPECT_THAT(newEvents(), ElementsAre("PlayStateChange", "Buffering+", "PlayStateChange")) << from;
        destroy(object);
    }
}

TEST_F(AVControlState, PlayResumesAPausedObject) {
    const EmbeddedObject object = inState(Paused);
    EXPECT_EQ(object.call("play", 1), false);
    EXPECT_EQ(state(object), Playing);
    EXPECT_EQ(object.get("speed"), 1.0);
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_Resume(7)"));
    EXPECT_THAT(newEvents(), ElementsAre("PlayStateChange"));
}

TEST_F(AVControlState, PlayChangesNothingWhileSomethingPlaysOrBuffers) {
    for (const int from : {Playing, Buffering}) {
        const EmbeddedObject object = inState(from);
        EXPECT_EQ(object.call("play", 1), false) << from;
        EXPECT_EQ(state(object), from);
        EXPECT_THAT(playerCalls(), IsEmpty()) << from;
        destroy(object);
    }
}

TEST_F(AVControlState, PlayInStateConnectingChangesNothing) {
    const EmbeddedObject object = video();
    bool asked = false;
    browser.onEvent("PlayStateChange", [&](const DomEvent&) {
        if (state(object) == Connecting) {
            asked = true;
            EXPECT_EQ(object.call("play", 1), false);
            EXPECT_EQ(platform.TELIX_JS_AV_Play.count(), 0u);
        }
    });
    object.call("play", 1);
    EXPECT_TRUE(asked);
    EXPECT_EQ(platform.TELIX_JS_AV_Play.count(), 1u);
}

TEST_F(AVControlState, PauseIsTakenWhilePlayingConnectingOrBuffering) {
    for (const int from : {Playing, Buffering}) {
        const EmbeddedObject object = inState(from);
        EXPECT_EQ(object.call("play", 0), true) << from;
        EXPECT_EQ(state(object), Paused) << from;
        EXPECT_EQ(object.get("speed"), 0.0) << from;
        EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_Pause(7)")) << from;
        destroy(object);
    }
    const EmbeddedObject object = video();
    const ScriptFunction listener = browser.function("listener");
    listener.does([&](const Values&) {
        if (state(object) == Connecting) {
            object.call("play", 0);
            EXPECT_EQ(state(object), Paused);
        }
        return Value();
    });
    object.set("onPlayStateChange", listener);
    object.call("play", 1);
    EXPECT_EQ(platform.TELIX_JS_AV_Pause.count(), 3u);
}

TEST_F(AVControlState, PauseIsNothingInTheOtherStates) {
    for (const int from : {Stopped, Paused, Finished, Error}) {
        const EmbeddedObject object = inState(from);
        EXPECT_EQ(object.call("play", 0), true) << from;
        EXPECT_EQ(state(object), from);
        EXPECT_THAT(playerCalls(), IsEmpty()) << from;
        destroy(object);
    }
}

TEST_F(AVControlState, StopLeadsFromEveryStateToStopped) {
    for (const int from : kReachableStates) {
        const EmbeddedObject object = inState(from);
        g_lastReceivedMessage = 99;
        object.call("stop");
        const bool played = from != Stopped;
        EXPECT_EQ(state(object), Stopped) << from;
        EXPECT_EQ(g_lastReceivedMessage, played ? 0u : 99u) << from;
        EXPECT_EQ(playerCalls().size(), played ? 1u : 0u) << from;
        destroy(object);
    }
}

TEST_F(AVControlState, AStopThatThePlatformRefusesChangesNothing) {
    const EmbeddedObject object = inState(Playing);
    platform.TELIX_JS_AV_Stop = [](TELIX_JS_AV_HANDLE) { return 1; };
    object.call("stop");
    EXPECT_EQ(state(object), Playing);
    EXPECT_EQ(g_lastReceivedMessage, uint32_t{TELIX_AV_CB_MSG_PLAYSTART});
}

TEST_F(AVControlState, AStartLeadsFromEveryStateToPlaying) {
    for (const int from : kReachableStates) {
        const EmbeddedObject object = inState(from);
        g_lastPlayedInstance = static_cast<AVControl*>(object.model());
        send(TELIX_AV_CB_MSG_PLAYSTART);
        EXPECT_EQ(state(object), Playing) << from;
        destroy(object);
    }
}

TEST_F(AVControlState, AnEndLeadsFromEveryStateToFinished) {
    for (const int from : kReachableStates) {
        const EmbeddedObject object = inState(from);
        g_lastPlayedInstance = static_cast<AVControl*>(object.model());
        g_lastReceivedMessage = 0;
        send(TELIX_AV_CB_MSG_PLAYEND);
        EXPECT_EQ(state(object), Finished) << from;
        destroy(object);
    }
}

TEST_F(AVControlState, AnEndEndsTheMonitorBeforeTheStateChanges) {
    const EmbeddedObject object = inState(Playing);
    clock.await(1);
    const std::string printed = logOf(5, [&] { send(TELIX_AV_CB_MSG_PLAYEND); });
    EXPECT_LT(printed.find("destroyBufferingThread ::  called. "), printed.find("called with playstate 5"));
    EXPECT_THAT(printed, HasSubstr("handlePlayStateChange :: Normal Mode :: TELIX_AV_CB_MSG_PLAYEND :: "
                                   "destroyBufferingThread :: changePlayState(Finished)\n"));
    send(TELIX_AV_CB_MSG_PLAYEND);
    clock.await(0);
}

TEST_F(AVControlState, TheEndOfAPlaylistsLastClipEndsTheMonitorAfterTheStateHasChanged) {
    const EmbeddedObject object = playlist(asx({entry("http://media.example/1")}));
    EXPECT_EQ(state(object), Buffering);
    clock.await(1);
    const std::string printed = logOf(5, [&] { send(TELIX_AV_CB_MSG_PLAYEND); });
    EXPECT_GT(printed.find("destroyBufferingThread ::  called. "), printed.find("called with playstate 5"));
    EXPECT_THAT(printed, Not(HasSubstr("Normal Mode")));
    send(TELIX_AV_CB_MSG_PLAYEND);
    EXPECT_EQ(state(object), Finished);
    clock.await(0);
}

TEST_F(AVControlState, TheEndOfAPlaylistsClipPlaysTheNextAtOnce) {
    const EmbeddedObject object =
        playlist(asx({entry("http://media.example/1"), entry("http://media.example/2")}));
    send(TELIX_AV_CB_MSG_PLAYSTART);
    clock.await(1);
    forget();
    bool sawNextClip = false;
    browser.onEvent("PlayStateChange", [&](const DomEvent&) { sawNextClip |= state(object) == NextClip; });
    platform.TELIX_JS_AV_Play = [&](TELIX_JS_AV_HANDLE, const char*, uint32_t, int32_t, int32_t, int32_t,
                                    uint32_t, uint16_t) {
        EXPECT_EQ(state(object), Buffering);
        return 0;
    };
    send(TELIX_AV_CB_MSG_PLAYEND);
    EXPECT_THAT(playerCalls(), ElementsAre(playOf("http://media.example/2")));
    EXPECT_EQ(state(object), Buffering);
    EXPECT_THAT(newEvents(), ElementsAre("PlayStateChange", "Buffering+", "PlayStateChange"));
    EXPECT_FALSE(sawNextClip);
    clock.await(1); // the monitor runs on across clips
    EXPECT_EQ(clock.ended(), 0u);
}

TEST_F(AVControlState, TheStateOfAChangingClipShowsWhilePlayTakesIt) {
    const EmbeddedObject object =
        playlist(asx({entry("http://media.example/1"), entry("http://media.example/2")}));
    // A playback at another speed asks the platform while the clip changes.
    object.call("play", 2.0);
    bool shown = false;
    platform.TELIX_JS_AV_SetPlaySpeed = [&](TELIX_JS_AV_HANDLE, ___UINT8, int16_t, uint16_t) {
        shown = state(object) == NextClip;
        return 0;
    };
    send(TELIX_AV_CB_MSG_PLAYEND);
    EXPECT_TRUE(shown);
}

TEST_F(AVControlState, TheOrderOfPlayFollowsARepeatSection) {
    const EmbeddedObject object = playlist(
        asx({entry("http://media.example/1"), "<Repeat count=\"2\">", entry("http://media.example/2"),
             entry("http://media.example/3"), "</Repeat>", entry("http://media.example/4")}));
    for (int i = 0; i < 6; ++i) {
        send(TELIX_AV_CB_MSG_PLAYSTART);
        send(TELIX_AV_CB_MSG_PLAYEND);
    }
    std::vector<std::string> expected;
    for (const char* clip : {"1", "2", "3", "2", "3", "4"}) {
        expected.push_back(playOf(std::string("http://media.example/") + clip));
    }
    EXPECT_THAT(log.startingWith("TELIX_JS_AV_Play("), ::testing::ElementsAreArray(expected));
    EXPECT_EQ(state(object), Finished);
}

TEST_F(AVControlState, SpeedTakenWhileBufferingShowsAsPlaying) {
    const EmbeddedObject object = inState(Buffering);
    object.call("play", 2.0);
    EXPECT_EQ(state(object), Playing);
    EXPECT_THAT(newEvents(), ElementsAre("Buffering", "PlayStateChange"));
}

TEST_F(AVControlState, SeekingInAStreamThatMustRestartBuffers) {
    const EmbeddedObject object = playingVideo("mms://media.example/a.wmv");
    forget();
    EXPECT_EQ(object.call("seek", 1000), true);
    EXPECT_EQ(state(object), Buffering);
    EXPECT_THAT(newEvents(), ElementsAre("Buffering+", "PlayStateChange"));
}

// Messages

struct Message {
    TELIX_AV_CB_MSG message;
    int state; // after it, of an object that played
    int error; // -1 for none
};

class AVControlMessage : public AVControlTest, public ::testing::WithParamInterface<Message> {};

TEST_P(AVControlMessage, LeadsToItsStateAndError) {
    const Message& row = GetParam();
    const EmbeddedObject object = video();
    object.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    send(row.message);
    EXPECT_EQ(state(object), row.state);
    const Outcome error = object.get("error");
    if (row.error < 0) {
        EXPECT_EQ(error, undefined);
    } else {
        EXPECT_EQ(error, row.error);
    }
    EXPECT_EQ(g_lastReceivedMessage, row.message);
}

INSTANTIATE_TEST_SUITE_P(Rows, AVControlMessage,
                         ::testing::Values(Message{0, Playing, -1},
                                           Message{TELIX_AV_CB_MSG_PLAYEND, Finished, -1},
                                           Message{TELIX_AV_CB_MSG_PLAYSTART, Playing, -1},
                                           Message{TELIX_AV_CB_MSG_ERR_PLAYING, Error, 2},
                                           Message{TELIX_AV_CB_MSG_ERR_NOT_FOUND, Error, 5},
                                           Message{TELIX_AV_CB_MSG_ERR_CODEC_NOT_SUPPORTED, Error, 0},
                                           Message{TELIX_AV_CB_MSG_ERR_NET_DISCONNECTED, Error, 1},
                                           Message{TELIX_AV_CB_MSG_ERR_NET_BUSY, Playing, -1},
                                           Message{TELIX_AV_CB_MSG_ERR_NET_CANNOT_PROCESS, Playing, -1},
                                           Message{TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT, Error, 1},
                                           Message{TELIX_AV_CB_MSG_ERR_WMDRM_CANNOT_PROCESS, Error, 2},
                                           Message{TELIX_AV_CB_MSG_ERR_WMDRM_LIC_FAILLOCAL, Error, 2},
                                           Message{TELIX_AV_CB_MSG_ERR_WMDRM_LIC_FAILTRANSFER, Error, 2},
                                           Message{TELIX_AV_CB_MSG_ERR_WMDRM_LIC_EXPIRED, Error, 2},
                                           Message{3, Playing, -1}, Message{0xF001, Playing, -1},
                                           Message{0xFFFFFFFF, Playing, -1}));

// Errors

struct ErrorRow {
    int code;
    int error; // 77 for unchanged
    int state;
    const char* text;
};

class AVControlError : public AVControlTest, public ::testing::WithParamInterface<ErrorRow> {};

TEST_P(AVControlError, IsReadByScriptAndLogged) {
    const ErrorRow& row = GetParam();
    const EmbeddedObject object = video();
    auto& model = *static_cast<AVControl*>(object.model());
    const std::string printed =
        logOf(5, [&] { model.processError(static_cast<avcontrol_ce_error>(row.code)); });
    EXPECT_THAT(printed, HasSubstr("Error Number = " + std::to_string(row.code) + " \n"));
    if (*row.text) {
        EXPECT_THAT(printed, HasSubstr(row.text));
    } else {
        EXPECT_THAT(printed, Not(HasSubstr("error : ")));
    }
    model.processError(static_cast<avcontrol_ce_error>(row.code));
    if (row.error == 77) {
        EXPECT_EQ(object.get("error"), undefined);
    } else {
        EXPECT_EQ(object.get("error"), row.error);
    }
    EXPECT_EQ(state(object), row.state);
}

const char kUnidentified[] = "error : AVControl_UnIdentified_Error\n";

INSTANTIATE_TEST_SUITE_P(
    Rows, AVControlError,
    ::testing::Values(ErrorRow{0, 0, Error, "error : AVControl_Format_Error\n"},
                      ErrorRow{1, 1, Error, "error : AVControl_Connection_Error\n"},
                      ErrorRow{2, 2, Error, kUnidentified},
                      ErrorRow{1000, 5, Error, "error : AVControl_Content_NotAvailable\n"},
                      ErrorRow{1001, 2, Error, kUnidentified}, ErrorRow{1007, 2, Error, kUnidentified},
                      ErrorRow{1009, 2, Error, kUnidentified}, ErrorRow{1100, 2, Error, kUnidentified},
                      ErrorRow{1103, 2, Error, kUnidentified}, ErrorRow{-1, 77, Stopped, ""},
                      ErrorRow{3, 77, Error, ""}, ErrorRow{1010, 77, Error, ""},
                      ErrorRow{1104, 77, Error, ""}));

// Repeated messages

TEST_F(AVControlState, ASecondEndIsIgnored) {
    const EmbeddedObject object = inState(Playing);
    const ScriptFunction listener = browser.function("position");
    object.set("onPlayPositionChanged", listener);
    send(TELIX_AV_CB_MSG_PLAYEND);
    const std::string printed = logOf(5, [&] { send(TELIX_AV_CB_MSG_PLAYEND); });
    EXPECT_THAT(printed, HasSubstr("Ignored duplicated message(1)\n"));
    send(TELIX_AV_CB_MSG_PLAYEND);
    EXPECT_EQ(listener.count(), 1u);
}

TEST_F(AVControlState, BothOfTwoStartsPassAndEachTakesAQueuedAddress) {
    const EmbeddedObject object = video();
    object.call("play", 1);
    object.call("queue", "http://media.example/1");
    object.call("queue", "http://media.example/2");
    forget();
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(object.get("data"), "http://media.example/1");
    EXPECT_THAT(newEvents(), ElementsAre("Buffering", "PlayStateChange"));
    forget();
    EXPECT_THAT(logOf(5, [&] { send(TELIX_AV_CB_MSG_PLAYSTART); }),
                HasSubstr("handlePlayStateChange :: Queued URL is (http://media.example/2)\n"));
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(object.get("data"), "http://media.example/2");
    EXPECT_THAT(newEvents(), IsEmpty()); // the state was that one already
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(object.get("data"), "http://media.example/2");
}

TEST_F(AVControlState, ABusyNetworkChangesNothingAndCountsAsAMessage) {
    inState(Playing);
    send(TELIX_AV_CB_MSG_ERR_NET_BUSY);
    EXPECT_THAT(newEvents(), IsEmpty());
    EXPECT_THAT(
        logOf(5, [&] { send(TELIX_AV_CB_MSG_ERR_NET_BUSY); }),
        HasSubstr("Ignored duplicated message(" + std::to_string(TELIX_AV_CB_MSG_ERR_NET_BUSY) + ")\n"));
}

TEST_F(AVControlState, MessagesOfTheNetworkAreLogged) {
    inState(Playing);
    for (const TELIX_AV_CB_MSG message :
         {TELIX_AV_CB_MSG_ERR_NET_BUSY, TELIX_AV_CB_MSG_ERR_NET_CANNOT_PROCESS}) {
        std::ostringstream number;
        number << std::hex << message;
        EXPECT_THAT(logOf(5, [&] { send(message); }), HasSubstr("Network message (" + number.str() + ")\n"));
    }
}

TEST_F(AVControlState, AMessagePassesAgainWhenAnotherCameBetween) {
    const EmbeddedObject object = inState(Playing);
    send(TELIX_AV_CB_MSG_ERR_NOT_FOUND);
    object.call("play", 1);
    forget();
    send(TELIX_AV_CB_MSG_ERR_NOT_FOUND); // the same again: nothing
    EXPECT_EQ(state(object), Buffering);
    send(TELIX_AV_CB_MSG_ERR_NET_BUSY);
    send(TELIX_AV_CB_MSG_ERR_NOT_FOUND);
    EXPECT_EQ(state(object), Error);
}

TEST_F(AVControlState, AStopForgetsTheLastMessage) {
    const EmbeddedObject object = inState(Playing);
    send(TELIX_AV_CB_MSG_ERR_NOT_FOUND);
    object.call("stop");
    object.call("play", 1);
    send(TELIX_AV_CB_MSG_ERR_NOT_FOUND);
    EXPECT_EQ(state(object), Error);
}

// Events and listener

TEST_F(AVControlState, AnErrorWhileBufferingGivesThreeEventsAndThenTheListenersCall) {
    const EmbeddedObject object = inState(Buffering);
    const ScriptFunction listener = browser.function("listener");
    object.set("onPlayStateChange", listener);
    forget();
    send(TELIX_AV_CB_MSG_ERR_PLAYING);
    log.expectInOrder({"event Error at video", "event Buffering at video", "event PlayStateChange at video",
                       "NPN_InvokeDefault listener()"});
    EXPECT_THAT(newEvents(), ElementsAre("Error", "Buffering", "PlayStateChange"));
    EXPECT_EQ(listener.count(), 1u);
}

TEST_F(AVControlState, AControlWithoutAnIdChangesStateInSilence) {
    const EmbeddedObject object = element("video/mp4", {{"data", kClip}});
    const ScriptFunction listener = browser.function("listener");
    object.set("onPlayStateChange", listener);
    object.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(state(object), Playing);
    EXPECT_THAT(events(), IsEmpty());
    EXPECT_EQ(listener.count(), 0u);
}

TEST_F(AVControlState, PositionAndLengthReadZeroFromTheEndOfAClipToTheNextStart) {
    const EmbeddedObject object = inState(Playing);
    report(info(20, 5000, 60000));
    EXPECT_EQ(object.get("playPosition"), 5000.0);
    send(TELIX_AV_CB_MSG_PLAYEND);
    EXPECT_EQ(object.get("playPosition"), 0.0);
    EXPECT_EQ(object.get("playTime"), 0.0);
    object.call("play", 1);
    EXPECT_EQ(object.get("playTime"), 0.0);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(object.get("playPosition"), 5000.0);
    EXPECT_EQ(object.get("playTime"), 60000.0);
}

TEST_F(AVControlState, NothingOfAClipThatHasEndedIsReadWhileTheNextIsUnknown) {
    const EmbeddedObject object = inState(Playing);
    report(info(20, 5000, 60000));
    EXPECT_EQ(object.get("playTime"), 60000.0);
    send(TELIX_AV_CB_MSG_PLAYEND);
    report(info(20, 0, 0, 0, 1));
    object.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(object.get("playPosition"), 0.0);
    EXPECT_EQ(object.get("playTime"), 0.0);
}

// Several objects, late messages

TEST_F(AVControlState, AMessageGoesToTheObjectThatPlayedLast) {
    const EmbeddedObject first = element("video/mp4", {{"id", "first"}, {"data", kClip}});
    const EmbeddedObject second = element("video/mp4", {{"id", "second"}, {"data", kClip}});
    first.call("play", 1);
    second.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART); // for player 7, the first's
    EXPECT_EQ(state(first), Buffering);
    EXPECT_EQ(state(second), Playing);
}

TEST_F(AVControlState, ALateEndOfAnOldPlayerEndsTheClipOfTheNew) {
    const EmbeddedObject first = element("video/mp4", {{"id", "first"}, {"data", kClip}});
    const EmbeddedObject second = element("video/mp4", {{"id", "second"}, {"data", kClip}});
    first.call("play", 1);
    post(TELIX_AV_CB_MSG_PLAYEND);
    first.destroy();
    second.call("play", 1);
    browser.pump();
    EXPECT_EQ(state(second), Finished);
}

TEST_F(AVControlState, DestroyingAnObjectThatDidNotPlayLastLeavesTheOtherItsMessages) {
    const EmbeddedObject first = element("video/mp4", {{"id", "first"}, {"data", kClip}});
    const EmbeddedObject second = element("video/mp4", {{"id", "second"}, {"data", kClip}});
    first.call("play", 1);
    second.call("play", 1);
    destroy(first);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(state(second), Playing);
}

TEST_F(AVControlState, AMessageForAnObjectThatIsGoingIsDropped) {
    const EmbeddedObject object = inState(Playing);
    auto& model = *static_cast<AVControl*>(object.model());
    model.setPluginState(PLUGIN_STATE_DESTROYING);
    EXPECT_THAT(logOf(5, [&] { send(TELIX_AV_CB_MSG_PLAYEND); }),
                HasSubstr("Ignore message while destroying plugin \n"));
    send(TELIX_AV_CB_MSG_PLAYEND);
    EXPECT_EQ(g_lastReceivedMessage, uint32_t{TELIX_AV_CB_MSG_PLAYSTART});
    EXPECT_THAT(newEvents(), IsEmpty());
}

TEST_F(AVControlState, AMessageAfterTheLastPlayerHasGoneDoesNothing) {
    const EmbeddedObject object = inState(Playing);
    object.destroy();
    log.clear();
    send(TELIX_AV_CB_MSG_PLAYEND);
    EXPECT_EQ(g_lastReceivedMessage, uint32_t{TELIX_AV_CB_MSG_PLAYSTART});
    send(TELIX_AV_CB_MSG_PLAYEND); // the object is deleted by now
    EXPECT_EQ(log.count("event"), 0u);
    blocksLeftBehind(2); // the records
}

TEST_F(AVControlState, WithoutALastPlayedObjectTheMessageIsLogged) {
    const EmbeddedObject object = video();
    auto& model = *static_cast<AVControl*>(object.model());
    EXPECT_THAT(logOf(5, [&] { model.handlePlayStateChange(7, TELIX_AV_CB_MSG_PLAYEND); }),
                HasSubstr("g_lastPlayedInstance not found\n"));
}

TEST_F(AVControlState, AnObjectWhosePlayerWasRefusedNeverGetsMessages) {
    const EmbeddedObject good = inState(Playing);
    platform.TELIX_JS_AV_CreatePlayer = [](TELIX_JS_AV_HANDLE*, int32_t, int32_t, uint32_t) { return 1; };
    element("video/mp4", {{"id", "other"}, {"data", kClip}});
    EXPECT_EQ(g_lastPlayedInstance, good.model());
}

TEST_F(AVControlState, TheCallbackOnlyQueuesTheMessage) {
    const EmbeddedObject object = inState(Playing);
    post(TELIX_AV_CB_MSG_PLAYEND);
    EXPECT_EQ(state(object), Playing);
    EXPECT_THAT(log.calls(), IsEmpty());
    browser.pump();
    EXPECT_EQ(state(object), Finished);
}

TEST_F(AVControlState, TheWayOfAMessageIsInTheLog) {
    inState(Playing);
    const std::string printed = logOf(5, [&] { send(TELIX_AV_CB_MSG_ERR_NOT_FOUND); });
    EXPECT_THAT(printed, HasSubstr(logLine("AVCONTROL", "onPlayStateChangeCb",
                                           "Received message from tv : (f003)\n")));
    EXPECT_THAT(printed, HasSubstr(logLine("AVCONTROL", "changePlayState", " called with playstate 6")));
    EXPECT_THAT(printed, HasSubstr(logLine("AVCONTROL", "changePlayState", "(Main Thread) called(1->6 \n)")));
}

} // namespace
} // namespace avcontrol
