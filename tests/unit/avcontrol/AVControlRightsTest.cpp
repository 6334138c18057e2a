// DRM rights errors from the platform to the page, and the notices of a new speed and position.
#include "src/avcontrol/AVControl.h"
#include "tests/unit/avcontrol/AVControlTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace avcontrol {
namespace {

class AVControlRights : public AVControlTest {};

TEST_F(AVControlRights, ReachTheListenerWithFourArgumentsAfterTheEvent) {
    const EmbeddedObject object = playingVideo();
    const ScriptFunction listener = browser.function("rights");
    object.set("onDRMRightsError", listener);
    log.clear();
    sendRightsError(3, "content", "urn:dvb:casystemid:1", "http://rights.example");
    EXPECT_THAT(listener.last(), ElementsAre(Value(3), Value("content"), Value("urn:dvb:casystemid:1"),
                                             Value("http://rights.example")));
    EXPECT_EQ(listener.count(), 1u);
    log.expectInOrder({"event DRMRightsError at video",
                       "NPN_InvokeDefault rights(3, \"content\", \"urn:dvb:casystemid:1\", "
                       "\"http://rights.example\")"});
    EXPECT_EQ(state(object), Playing);
    EXPECT_EQ(object.get("error"), undefined);
    leftBehind(listener); // each event leaves one
    memoryLeftBehind(3);  // and the strings of its arguments
}

TEST_F(AVControlRights, LeaveAReferenceToTheListenerEachTime) {
    const EmbeddedObject object = playingVideo();
    const ScriptFunction listener = browser.function("rights");
    object.set("onDRMRightsError", listener);
    sendRightsError(0, "", "", "");
    sendRightsError(1, "", "", "");
    EXPECT_EQ(listener.pluginReferences(), 3);
    leftBehind(listener, 2);
    memoryLeftBehind(6);
}

TEST_F(AVControlRights, WithAnEmptyTextGiveAnEmptyString) {
    const EmbeddedObject object = playingVideo();
    const ScriptFunction listener = browser.function("rights");
    object.set("onDRMRightsError", listener);
    sendRightsError(1, "content", "system", "");
    EXPECT_EQ(listener.last().at(3), Value(""));
    leftBehind(listener);
    memoryLeftBehind(3);
}

TEST_F(AVControlRights, WithoutMemoryGiveNull) {
    const EmbeddedObject object = playingVideo();
    const ScriptFunction listener = browser.function("rights");
    object.set("onDRMRightsError", listener);
    browser.refuse("NPN_MemAlloc", 1, 1);
    sendRightsError(1, "content", "system", "url");
    EXPECT_THAT(listener.last(), ElementsAre(Value(1), Value("content"), Value(nullptr), Value("url")));
    leftBehind(listener);
    memoryLeftBehind(2);
}

TEST_F(AVControlRights, WhoseStringCannotBeCopiedGiveNullForItAndThoseAfterIt) {
    const EmbeddedObject object = playingVideo();
    const ScriptFunction listener = browser.function("rights");
    object.set("onDRMRightsError", listener);
    sendRightsError(1, "content", "system", "url", 0);
    EXPECT_THAT(listener.last(), ElementsAre(Value(1), Value(nullptr), Value(nullptr), Value(nullptr)));
    sendRightsError(1, "content", "system", "url", 1);
    EXPECT_THAT(listener.last(), ElementsAre(Value(1), Value("content"), Value(nullptr), Value(nullptr)));
    sendRightsError(1, "content", "system", "url", 2);
    EXPECT_THAT(listener.last(), ElementsAre(Value(1), Value("content"), Value("system"), Value(nullptr)));
    leftBehind(listener, 3);
    memoryLeftBehind(3);
}

TEST_F(AVControlRights, WithoutAListenerAreAnEventOnly) {
    playingVideo();
    sendRightsError(1, "content", "system", "url");
    EXPECT_EQ(log.count("event DRMRightsError at video"), 1u);
    EXPECT_EQ(log.count("NPN_InvokeDefault"), 0u);
}

TEST_F(AVControlRights, WithNoObjectEverPlayedReachNobody) {
    const EmbeddedObject object = video();
    const ScriptFunction listener = browser.function("rights");
    object.set("onDRMRightsError", listener);
    sendRightsError(1, "content", "system", "url");
    EXPECT_THAT(events(), IsEmpty());
    EXPECT_EQ(listener.count(), 0u);
    blocksLeftBehind(4); // the record and its three strings
}

TEST_F(AVControlRights, GoToTheObjectThatPlayedLast) {
    const EmbeddedObject first = playingVideo();
    const EmbeddedObject second = element("video/mp4", {{"id", "second"}, {"data", kClip}});
    second.call("play", 1);
    log.clear();
    sendRightsError(1, "content", "system", "url"); // of player 7, the first's
    EXPECT_THAT(log.startingWith("event"), ElementsAre("event DRMRightsError at second"));
}

TEST_F(AVControlRights, AfterTheObjectHasGoneReachNobody) {
    const EmbeddedObject object = playingVideo();
    destroy(object);
    sendRightsError(1, "content", "system", "url");
    EXPECT_EQ(log.count("event DRMRightsError"), 0u);
    blocksLeftBehind(4);
}

TEST_F(AVControlRights, OfAnElementWithoutAnIdStopTheProcess) {
    const EmbeddedObject object = element("video/mp4", {{"data", kClip}});
    object.call("play", 1);
    EXPECT_DEATH(sendRightsError(1, "content", "system", "url"), "!id.empty\\(\\)");
}

TEST_F(AVControlRights, AreInTheLogOfTheDrmAgent) {
    playingVideo();
    const std::string printed = logOf(12, [&] { sendRightsError(2, "c", "s", "u"); });
    EXPECT_THAT(printed,
                HasSubstr(logLine("DRMAGENT", "onDRMRightsErrorCb",
                                  " Received Callback from system. Player Handle: 7, Error State: (2), "
                                  "Content Id: (c), DRM System Id: (s),  RightsIssuerURL: (u) \n")));
    EXPECT_THAT(printed,
                HasSubstr(logLine("DRMAGENT", "handleDRMRightsErrorEvent", " handleDRMRightsErrorEvent \n")));
}

// Notices

TEST_F(AVControlRights, ThePositionListenerReadsZeroAtTheEndOfAClip) {
    const EmbeddedObject object = playingVideo();
    report(info(20, 5000, 60000));
    object.get("playPosition");
    const ScriptFunction listener = browser.function("position");
    bool called = false;
    listener.does([&](const Values& arguments) {
        called = true;
        EXPECT_THAT(arguments, IsEmpty());
        EXPECT_EQ(object.get("playPosition"), 0.0);
        return Value();
    });
    object.set("onPlayPositionChanged", listener);
    send(TELIX_AV_CB_MSG_PLAYEND);
    EXPECT_TRUE(called);
    EXPECT_EQ(listener.count(), 1u);
}

TEST_F(AVControlRights, TheNoticesAreNoDomEvents) {
    const EmbeddedObject object = playingVideo();
    const ScriptFunction position = browser.function("position");
    const ScriptFunction speed = browser.function("speed");
    object.set("onPlayPositionChanged", position);
    object.set("onPlaySpeedChanged", speed);
    log.clear();
    object.call("seek", 1000);
    object.call("play", 2.0);
    EXPECT_THAT(log.startingWith("NPN_InvokeDefault"),
                ElementsAre("NPN_InvokeDefault position()", "NPN_InvokeDefault speed()"));
    EXPECT_EQ(log.count("event"), 0u);
}

} // namespace
} // namespace avcontrol
