// The play operations: what each asks of the platform, what it gives to script, and what it changes.
#include "src/avcontrol/AVControl.h"
#include "tests/unit/avcontrol/AVControlTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace avcontrol {
namespace {

class AVControlPlay : public AVControlTest {
protected:
    // What a whole process does with one object: played, started and polled for its position.
    static std::string queueOf(const std::string& url) {
        return "TELIX_JS_AV_Queue(7, " + (url.empty() ? "null" : '"' + url + '"') + ", 1, 6, 512, 0, 0, 0)";
    }
};

// play

TEST_F(AVControlPlay, HandsTheAddressOverAndTakesThePipeline) {
    const EmbeddedObject object = video();
    EXPECT_EQ(g_lastPlayedInstance, nullptr);
    object.scriptObject();
    log.clear();
    EXPECT_EQ(object.call("play", 1), true);
    EXPECT_THAT(log.calls(),
                ElementsAre(HasSubstr("NPN_Evaluate"), "event PlayStateChange at video",
                            HasSubstr("NPN_Evaluate"), "event Buffering at video bubbles",
                            HasSubstr("NPN_Evaluate"), "event PlayStateChange at video", playOf(kClip)));
    EXPECT_EQ(g_lastPlayedInstance, object.model());
}

TEST_F(AVControlPlay, ThatThePlatformRefusesGivesFalseAndStaysBuffering) {
    const EmbeddedObject object = video();
    platform.TELIX_JS_AV_Play = [](TELIX_JS_AV_HANDLE, const char*, uint32_t, int32_t, int32_t, int32_t,
                                   uint32_t, uint16_t) { return 1; };
    EXPECT_EQ(object.call("play", 1), false);
    EXPECT_EQ(state(object), Buffering);
    EXPECT_EQ(g_lastPlayedInstance, object.model());
    clock.await(1); // watched all the same
}

TEST_F(AVControlPlay, OfAnEmptyAddressDoesNothing) {
    const EmbeddedObject object = element("video/mp4", {{"id", "video"}});
    EXPECT_EQ(object.call("play", 1), false);
    EXPECT_EQ(state(object), Stopped);
    EXPECT_EQ(g_lastPlayedInstance, nullptr);
    EXPECT_THAT(events(), IsEmpty());
    clock.await(0);
}

TEST_F(AVControlPlay, AgainWhilePlayingChangesNothing) {
    const EmbeddedObject object = playingVideo();
    EXPECT_EQ(object.call("play", 1), false);
    EXPECT_THAT(playerCalls(), IsEmpty());
    EXPECT_EQ(log.count("event"), 0u);
}

TEST_F(AVControlPlay, AtSpeedZeroPauses) {
    const EmbeddedObject object = playingVideo();
    EXPECT_EQ(object.call("play", 0), true);
    EXPECT_EQ(state(object), Paused);
    log.clear();
    EXPECT_EQ(object.call("play", 0.0), true); // and in state 2 does nothing
    EXPECT_THAT(playerCalls(), IsEmpty());
}

TEST_F(AVControlPlay, AtAnotherSpeedAlsoBeginsPlaying) {
    const EmbeddedObject object = video();
    EXPECT_EQ(object.call("play", 2.0), true);
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_SetPlaySpeed(7, 1, 1, 0)", playOf(kClip)));
}

TEST_F(AVControlPlay, AfterAResumeThatThePlatformRefusedIsPlayingAllTheSame) {
    const EmbeddedObject object = playingVideo();
    object.call("play", 0);
    platform.TELIX_JS_AV_Resume = [](TELIX_JS_AV_HANDLE) { return 1; };
    EXPECT_EQ(object.call("play", 1), false);
    EXPECT_EQ(state(object), Playing);
    EXPECT_EQ(object.get("speed"), 1.0);
}

TEST_F(AVControlPlay, IsToldInTheLog) {
    const EmbeddedObject object = video();
    const std::string printed = logOf(5, [&] { object.call("play", 1); });
    EXPECT_THAT(printed,
                HasSubstr(logLine("AVCONTROL", "play", "called with Speed: 1.000000 and state: 0 \n")));
    EXPECT_THAT(printed,
                HasSubstr(logLine("AVCONTROL", "play", "Media File URL:: " + std::string(kClip) + " \n")));
    EXPECT_THAT(printed, HasSubstr(logLine("AVCONTROL", "play", "AVControl Call ended\n")));
}

// pause

TEST_F(AVControlPlay, APauseThatThePlatformRefusesLeavesTheSpeedAtZero) {
    const EmbeddedObject object = playingVideo();
    platform.TELIX_JS_AV_Pause = [](TELIX_JS_AV_HANDLE) { return 1; };
    EXPECT_EQ(object.call("play", 0), true);
    EXPECT_EQ(state(object), Playing);
    EXPECT_EQ(object.get("speed"), 0.0);
}

TEST_F(AVControlPlay, APauseThatThePlatformAnswersWithFourIsTaken) {
    const EmbeddedObject object = playingVideo();
    platform.TELIX_JS_AV_Pause = [](TELIX_JS_AV_HANDLE) { return 4; };
    object.call("play", 0);
    EXPECT_EQ(state(object), Paused);
}

// stop

TEST_F(AVControlPlay, AStopOfAnObjectThatHasNotPlayedOnlyResetsThePosition) {
    const EmbeddedObject playing = playingVideo();
    nextPlayer = 8;
    const EmbeddedObject other = element("video/mp4", {{"id", "other"}, {"data", kClip}});
    report(info(20, 5000, 60000));
    other.get("playPosition");
    platform.TELIX_JS_AV_GetPlayInfo = [](TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAY_INFO**) { return 1; };
    EXPECT_EQ(other.get("playPosition"), 5000.0);
    log.clear();
    other.call("stop");
    EXPECT_THAT(playerCalls(), IsEmpty());
    EXPECT_EQ(state(other), Stopped);
    EXPECT_EQ(other.get("playPosition"), 0.0);
    EXPECT_EQ(other.get("playTime"), 0.0);
    EXPECT_EQ(state(playing), Playing);
}

TEST_F(AVControlPlay, AStopLeavesQueueAndPlaylistPosition) {
    const EmbeddedObject object =
        playlist(asx({entry("http://media.example/1"), entry("http://media.example/2")}));
    object.call("queue", "http://media.example/q");
    object.call("next");
    object.call("stop");
    EXPECT_EQ(object.get("currentTrackIndex"), 2);
    object.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(object.get("data"), "http://media.example/q");
}

// seek

TEST_F(AVControlPlay, ASeekWithNothingPlayedYetIsFalse) {
    EXPECT_EQ(video().call("seek", 1000), false);
    EXPECT_THAT(playerCalls(), IsEmpty());
}

TEST_F(AVControlPlay, ASeekMovesAndTellsTheListener) {
    const EmbeddedObject object = playingVideo();
    const ScriptFunction listener = browser.function("position");
    listener.does([&](const Values&) {
        EXPECT_EQ(object.get("playPosition"), 1500.0);
        return Value();
    });
    object.set("onPlayPositionChanged", listener);
    log.clear();
    EXPECT_EQ(object.call("seek", 1500.7), true);
    log.expectInOrder({"TELIX_JS_AV_Seek(7, 1500)", "NPN_InvokeDefault position()"});
    EXPECT_EQ(listener.count(), 1u);
    EXPECT_EQ(state(object), Playing);
    EXPECT_EQ(platform.TELIX_JS_AV_Stop.count(), 0u);
}

TEST_F(AVControlPlay, ASeekThatThePlatformRefusesTellsNobody) {
    const EmbeddedObject object = playingVideo();
    const ScriptFunction listener = browser.function("position");
    object.set("onPlayPositionChanged", listener);
    platform.TELIX_JS_AV_Seek = [](TELIX_JS_AV_HANDLE, uint32_t) { return 1; };
    EXPECT_EQ(object.call("seek", 1500), false);
    EXPECT_EQ(listener.count(), 0u);
    EXPECT_TRUE(static_cast<AVControl*>(object.model())->getNotifyReadyState());
}

TEST_F(AVControlPlay, ASeekInAnMp3RestartsIt) {
    const EmbeddedObject object = element("audio/mpeg", {{"id", "video"}, {"data", kClip}});
    object.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    log.clear();
    EXPECT_EQ(object.call("seek", 2000), true);
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_Stop(7)", "TELIX_JS_AV_Seek(7, 2000)",
                                           playOf(kClip, 7, 1, 6, 2, 1)));
    EXPECT_EQ(clock.browserSleeps(), 1u);
    EXPECT_EQ(state(object), Buffering);
}

TEST_F(AVControlPlay, ASeekThatRestartsDoesNotWaitForARefusedStop) {
    const EmbeddedObject object = playingVideo("mms://media.example/a");
    platform.TELIX_JS_AV_Stop = [](TELIX_JS_AV_HANDLE) { return 1; };
    EXPECT_EQ(object.call("seek", 2000), true);
    EXPECT_EQ(clock.browserSleeps(), 0u);
}

TEST_F(AVControlPlay, ASeekWhoseRestartIsRefusedIsTrueAndUnwatched) {
    const EmbeddedObject object = playingVideo("mms://media.example/a");
    clock.await(1);
    platform.TELIX_JS_AV_Play = [](TELIX_JS_AV_HANDLE, const char*, uint32_t, int32_t, int32_t, int32_t,
                                   uint32_t, uint16_t) { return 1; };
    EXPECT_EQ(object.call("seek", 2000), true);
    clock.await(0);
}

// setPlaySpeed, by way of play

TEST_F(AVControlPlay, AChangeOfSpeedReachesThePlatformOneCallLate) {
    const EmbeddedObject object = playingVideo();
    const ScriptFunction listener = browser.function("speed");
    object.set("onPlaySpeedChanged", listener);
    log.clear();
    object.call("play", 2.5);
    EXPECT_EQ(object.get("speed"), 2.5);
    object.call("play", -3.0);
    EXPECT_EQ(object.get("speed"), -3.0);
    object.call("play", 0.1);
    object.call("play", 1);
    EXPECT_EQ(object.get("speed"), 1.0);
    EXPECT_THAT(playerCalls(),
                ElementsAre("TELIX_JS_AV_SetPlaySpeed(7, 1, 1, 0)", "TELIX_JS_AV_SetPlaySpeed(7, 1, 2, 5)",
                            "TELIX_JS_AV_SetPlaySpeed(7, 0, 3, 0)", "TELIX_JS_AV_SetPlaySpeed(7, 1, 0, 1)"));
    EXPECT_EQ(listener.count(), 4u);
    log.clear();
    object.call("play", 1); // the speed asked for last was that one already
    EXPECT_THAT(playerCalls(), IsEmpty());
}

TEST_F(AVControlPlay, ASpeedThatThePlatformRefusesIsRememberedAsAskedForOnly) {
    const EmbeddedObject object = playingVideo();
    const ScriptFunction listener = browser.function("speed");
    object.set("onPlaySpeedChanged", listener);
    platform.TELIX_JS_AV_SetPlaySpeed = [](TELIX_JS_AV_HANDLE, ___UINT8, int16_t, uint16_t) { return 1; };
    object.call("play", 4.0);
    EXPECT_EQ(object.get("speed"), 1.0);
    EXPECT_EQ(listener.count(), 0u);
    EXPECT_THAT(logOf(5, [&] { object.call("play", 4.0); }),
                HasSubstr("Trying to change PlaySpeed from [1.0 -> 4.0]. Not supported in platform\n"));
    log.clear();
    object.call("play", 1);
    EXPECT_EQ(log.count("TELIX_JS_AV_SetPlaySpeed"), 1u); // 4 was asked for, so 1 is a change
}

TEST_F(AVControlPlay, ASpeedThatIsNoNumberIsNotSent) {
    const EmbeddedObject object = playingVideo();
    object.call("play", std::numeric_limits<double>::infinity());
    log.clear();
    EXPECT_THAT(logOf(5, [&] { object.call("play", 2.0); }), HasSubstr("Play Speed: [inf] parsing failed\n"));
    object.call("play", 2.0);
    EXPECT_THAT(playerCalls(), IsEmpty());
    EXPECT_THAT(logOf(5, [&] { object.call("play", -std::numeric_limits<double>::infinity()); }),
                HasSubstr("parsing failed\n"));
}

TEST_F(AVControlPlay, AnEnormousSpeedIsCutToThePlatformsWidths) {
    const EmbeddedObject object = playingVideo();
    object.call("play", 70000.0);
    object.call("play", 1e308);
    object.call("play", 2.0);
    EXPECT_THAT(playerCalls()[1], "TELIX_JS_AV_SetPlaySpeed(7, 1, 4464, 0)"); // 70000 in 16 bits
    EXPECT_EQ(platform.TELIX_JS_AV_SetPlaySpeed.count(), 3u);
}

TEST_F(AVControlPlay, SpeedIsToldInTheLog) {
    const EmbeddedObject object = playingVideo();
    EXPECT_THAT(logOf(5, [&] { object.call("play", 2.0); }), HasSubstr("Set Play Speed succeed\n"));
}

// Short sounds

TEST_F(AVControlPlay, AShortSoundPlaysAsOftenAsThePageSays) {
    const EmbeddedObject object = video("http://media.example/a.wav");
    browser.window().method("getPlayCountVal", [](const Values&) { return Value("4"); });
    log.clear();
    EXPECT_EQ(object.call("play", 1), true);
    EXPECT_TRUE(log.contains(playOf("http://media.example/a.wav", 7, 4)));
    EXPECT_THAT(browser.lastScript(), HasSubstr("window.getPlayCountVal = function()"));
    EXPECT_THAT(browser.lastScript(), HasSubstr("getElementById(\"video\")"));
    EXPECT_EQ(state(object), Stopped);
    EXPECT_EQ(g_lastPlayedInstance, nullptr);
    clock.await(0);
}

TEST_F(AVControlPlay, AShortSoundKeepsItsCountWhenThePageGivesNone) {
    const EmbeddedObject object = video("http://media.example/a.wav", {{"playCount", "2"}});
    object.call("play", 1); // the page has no such function
    EXPECT_TRUE(log.contains(playOf("http://media.example/a.wav", 7, 2)));
    log.clear();
    browser.window().method("getPlayCountVal", [](const Values&) { return Value(nullptr); });
    object.call("play", 1);
    EXPECT_TRUE(log.contains(playOf("http://media.example/a.wav", 7, 2)));
}

TEST_F(AVControlPlay, AShortSoundOfAnEmptyAddressAsksNothing) {
    const EmbeddedObject object = video("http://media.example/a.wav");
    object.set("data", "");
    log.clear();
    EXPECT_EQ(object.call("play", 1), true);
    EXPECT_THAT(playerCalls(), IsEmpty());
}

TEST_F(AVControlPlay, AShortSoundIsToldInTheLogAsAnotherFunction) {
    const EmbeddedObject object = video("http://media.example/a.wav");
    const std::string printed = logOf(5, [&] { object.call("play", 1); });
    EXPECT_THAT(printed, HasSubstr("Media File URL:: http://media.example/a.wav, PlayCount:: 1 \n"));
    EXPECT_THAT(printed, HasSubstr(" Called:: IF API TELIX_JS_AV_PlaySound returned success \n"));
    EXPECT_EQ(platform.TELIX_JS_AV_PlaySound.count(), 0u);
}

// setVolume

TEST_F(AVControlPlay, AVolumeGoesToAHundred) {
    const EmbeddedObject object = video();
    EXPECT_EQ(object.call("setVolume", 101), false);
    EXPECT_THAT(playerCalls(), IsEmpty());
    EXPECT_EQ(object.call("setVolume", 100), true);
    EXPECT_EQ(object.call("setVolume", 0), true);
    EXPECT_EQ(object.call("setVolume", -3), true); // saturates at 0
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_SetVolume(7, 100)", "TELIX_JS_AV_SetVolume(7, 0)",
                                           "TELIX_JS_AV_SetVolume(7, 0)"));
    platform.TELIX_JS_AV_SetVolume = [](TELIX_JS_AV_HANDLE, uint32_t) { return 1; };
    EXPECT_EQ(object.call("setVolume", 50), false);
}

// queue

TEST_F(AVControlPlay, AQueuedAddressIsMirroredUntilItStarts) {
    const EmbeddedObject object = playingVideo();
    EXPECT_EQ(object.call("queue", "http://media.example/1"), true);
    EXPECT_EQ(object.call("queue", "http://media.example/2"), true);
    EXPECT_THAT(playerCalls(),
                ElementsAre(queueOf("http://media.example/1"), queueOf("http://media.example/2")));
    EXPECT_EQ(object.get("data"), kClip);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(object.get("data"), "http://media.example/1");
}

TEST_F(AVControlPlay, ARelativeQueuedAddressIsMadeAbsolute) {
    const EmbeddedObject object = playingVideo();
    EXPECT_EQ(object.call("queue", "next.mp4"), true);
    EXPECT_THAT(playerCalls(), ElementsAre(queueOf("http://page.example/app/next.mp4")));
}

TEST_F(AVControlPlay, NullWithdrawsAndTakesTheFrontOfTheMirror) {
    const EmbeddedObject object = playingVideo();
    object.call("queue", "http://media.example/1");
    object.call("queue", "http://media.example/2");
    log.clear();
    EXPECT_EQ(object.call("queue", nullptr), true);
    EXPECT_THAT(playerCalls(), ElementsAre(queueOf("")));
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(object.get("data"), "http://media.example/2");
    EXPECT_EQ(object.call("queue", nullptr), true); // also with an empty mirror
}

TEST_F(AVControlPlay, WhatThePlatformRefusesToQueueIsNotMirrored) {
    const EmbeddedObject object = playingVideo();
    object.call("queue", "http://media.example/1");
    platform.TELIX_JS_AV_Queue = [](TELIX_JS_AV_HANDLE, const char*, uint32_t, int32_t, int32_t, int32_t,
                                    uint32_t, uint16_t) { return 1; };
    EXPECT_EQ(object.call("queue", "http://media.example/2"), false);
    EXPECT_EQ(object.call("queue", nullptr), false);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(object.get("data"), "http://media.example/1");
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(object.get("data"), "http://media.example/1");
    EXPECT_THAT(logOf(5, [&] { object.call("queue", "http://media.example/2"); }),
                HasSubstr(" AVControl call ended \n"));
}

TEST_F(AVControlPlay, TheQueueIsToldInTheLog) {
    const EmbeddedObject object = playingVideo();
    const std::string printed = logOf(5, [&] { object.call("queue", nullptr); });
    EXPECT_THAT(printed, HasSubstr(" is called with url value as NULL\n"));
    EXPECT_THAT(printed, HasSubstr(" AVControl TELIX_JS_AV_Queue Success\n"));
}

// Clips

class AVControlClips : public AVControlPlay {
protected:
    EmbeddedObject object = playlist(asx(
        {entry("http://media.example/1"), entry("http://media.example/2"), entry("http://media.example/3")}));
};

TEST_F(AVControlClips, NextAndPreviousStopAndPlayTheNeighbour) {
    send(TELIX_AV_CB_MSG_PLAYSTART);
    log.clear();
    object.call("next");
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_Stop(7)", playOf("http://media.example/2")));
    EXPECT_EQ(state(object), Buffering);
    object.call("next");
    log.clear();
    object.call("previous");
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_Stop(7)", playOf("http://media.example/2")));
    EXPECT_EQ(object.get("currentTrackIndex"), 2);
    EXPECT_EQ(object.get("nrTracks"), 3);
}

TEST_F(AVControlClips, PreviousOnTheFirstAndNextOnTheLastLeavePlaybackAlone) {
    send(TELIX_AV_CB_MSG_PLAYSTART);
    log.clear();
    object.call("previous");
    EXPECT_THAT(playerCalls(), IsEmpty());
    EXPECT_EQ(state(object), Playing);
    object.set("currentTrackIndex", 3);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    log.clear();
    object.call("next");
    EXPECT_THAT(playerCalls(), IsEmpty());
    EXPECT_EQ(state(object), Playing);
}

TEST_F(AVControlClips, AChangeThatThePlatformRefusesHasMovedThePlaylistOnly) {
    send(TELIX_AV_CB_MSG_PLAYSTART);
    platform.TELIX_JS_AV_Stop = [](TELIX_JS_AV_HANDLE) { return 1; };
    object.call("next");
    EXPECT_EQ(state(object), Playing);
    EXPECT_EQ(object.get("currentTrackIndex"), 2);
    log.clear();
    object.set("currentTrackIndex", 3); // a write of the index doesn't ask
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_Stop(7)", playOf("http://media.example/3")));
}

TEST_F(AVControlClips, AnIndexThatDoesNotExistIsAWriteWithoutEffect) {
    send(TELIX_AV_CB_MSG_PLAYSTART);
    log.clear();
    for (const Value& index : {Value(0), Value(4), Value(-1), Value(1e12)}) {
        EXPECT_TRUE(object.set("currentTrackIndex", index)) << index;
    }
    EXPECT_THAT(playerCalls(), IsEmpty());
    EXPECT_TRUE(object.set("currentTrackIndex", 2.9)); // truncated
    EXPECT_EQ(object.get("currentTrackIndex"), 2);
}

// getPlayInfo

TEST_F(AVControlPlay, PositionAndLengthAreThePlatforms) {
    const EmbeddedObject object = playingVideo();
    report(info(20, 1234, 60000));
    EXPECT_EQ(object.get("playPosition"), 1234.0);
    EXPECT_EQ(object.get("playTime"), 60000.0);
}

TEST_F(AVControlPlay, WithinItsLastSecondAClipReadsAsComplete) {
    const EmbeddedObject object = playingVideo();
    report(info(20, 59000, 60000));
    EXPECT_EQ(object.get("playPosition"), 59000.0);
    report(info(20, 59001, 60000));
    EXPECT_EQ(object.get("playPosition"), 60000.0);
    report(info(20, 60001, 60000)); // beyond the end: a difference far above a second
    EXPECT_EQ(object.get("playPosition"), 60001.0);
}

TEST_F(AVControlPlay, WithoutAnAnswerTheLastValuesRead) {
    const EmbeddedObject object = playingVideo();
    report(info(20, 1234, 60000));
    object.get("playPosition");
    report(info(20, 0, 0, 0, 1)); // nothing known yet
    EXPECT_EQ(object.get("playPosition"), 1234.0);
    platform.TELIX_JS_AV_GetPlayInfo = [](TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAY_INFO**) { return 0; };
    EXPECT_EQ(object.get("playTime"), 60000.0); // success without a record counts as none
    platform.TELIX_JS_AV_GetPlayInfo = [](TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAY_INFO**) { return 1; };
    EXPECT_EQ(object.get("playTime"), 60000.0);
    report(info(20, 0, 0, 0, 2));
    EXPECT_EQ(object.get("playTime"), 0.0);
}

TEST_F(AVControlPlay, WithoutAPlayerThereIsNoPosition) {
    const EmbeddedObject object = browser.embed("video/mp4", {}, NP_FULL);
    EXPECT_EQ(object.get("playPosition"), 0.0);
    EXPECT_THAT(logOf(5, [&] { object.get("playTime"); }),
                HasSubstr("Error:m_playerHandle=( 0 ), g_lastReceivedMessage=( 0 )\n"));
    EXPECT_THAT(playerCalls(), IsEmpty());
}

// setFullScreen

TEST_F(AVControlPlay, FullScreenIsToldToTheListener) {
    const EmbeddedObject object = video();
    const ScriptFunction listener = browser.function("fullScreen");
    leftBehind(listener);
    object.set("onFullScreenChange", listener);
    EXPECT_EQ(object.call("setFullScreen", true), undefined);
    EXPECT_EQ(object.get("fullScreen"), true);
    EXPECT_THAT(listener.last(), ElementsAre(Value(true)));
    object.call("setFullScreen", false);
    EXPECT_THAT(listener.last(), ElementsAre(Value(false)));
    EXPECT_THAT(playerCalls(),
                ElementsAre("TELIX_JS_AV_SetFullScreen(7, 1)", "TELIX_JS_AV_SetFullScreen(7, 0)"));
}

TEST_F(AVControlPlay, FullScreenThatThePlatformRefusesIsNot) {
    const EmbeddedObject object = video();
    platform.TELIX_JS_AV_SetFullScreen = [](TELIX_JS_AV_HANDLE, ___UINT8) { return 1; };
    object.call("setFullScreen", true);
    EXPECT_EQ(object.get("fullScreen"), false);
}

TEST_F(AVControlPlay, WithoutAPlayerNoOperationAsksThePlatform) {
    const EmbeddedObject object = browser.embed("video/mp4", {{"id", "video"}, {"src", kClip}}, NP_FULL);
    log.clear();
    EXPECT_EQ(object.call("play", 1), false);
    EXPECT_EQ(object.call("play", 0), false);
    EXPECT_EQ(object.call("play", 2), false);
    object.call("stop");
    EXPECT_EQ(object.call("seek", 1), false);
    EXPECT_EQ(object.call("setVolume", 1), false);
    EXPECT_EQ(object.call("queue", kClip), false);
    EXPECT_EQ(object.call("queue", nullptr), false);
    object.call("setFullScreen", true);
    EXPECT_EQ(object.get("fullScreen"), false);
    EXPECT_EQ(object.call("getComponents", 0), nullptr);
    EXPECT_EQ(object.call("getCurrentActiveComponents", 0), nullptr);
    object.set("currentTrackIndex", 1);
    object.call("next");
    EXPECT_THAT(playerCalls(), IsEmpty());
    EXPECT_EQ(state(object), Stopped);
}

} // namespace
} // namespace avcontrol
