// The events of the broadcast, from a platform thread to the page.
#include "src/videobroadcast/VideoBroadcastUtils.h"

#include <memory>

#include <glib.h>
#include <gmock/gmock.h>

#include "tests/unit/support/SameAddress.h"
#include "tests/unit/videobroadcast/BroadcastTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

namespace {

class BroadcastEventTest : public BroadcastTest {
protected:
    BroadcastEventTest() {
        platform.TELIX_JS_CM_GetChannelList = [](uint32_t* count, TELIX_JS_CM_HANDLE** channels) {
            static TELIX_JS_CM_HANDLE list[] = {11, 12};
            *count = 2;
            *channels = list;
            return 0;
        };
    }

    // A new object with a handler in the slot; the log is cleared afterwards.
    EmbeddedObject ready(const std::string& slot = "", const std::string& id = "tv") {
        const EmbeddedObject vb = embed(id);
        vb.scriptObject();
        if (!slot.empty()) {
            vb.set(slot, handler);
        }
        log.clear();
        return vb;
    }

    void fire(const std::function<void()>& callback) {
        onPlatformThread(callback);
        browser.pump();
    }

    // The current programme has this rating collection.
    void programmesHaveRatings() {
        platform.TELIX_JS_SI_GetProgrammeHandles = [](uint32_t* count, TELIX_JS_SI_HANDLE** programmes) {
            static TELIX_JS_SI_HANDLE handles[] = {21};
            *count = 1;
            *programmes = handles;
            return 0;
        };
        platform.TELIX_JS_SI_GetParentalRatingHandles = [](TELIX_JS_SI_HANDLE, uint32_t* count,
                                                           TELIX_JS_SI_PARENTALRATING_HANDLE** ratings) {
            static TELIX_JS_SI_PARENTALRATING_HANDLE handles[] = {61, 62};
            *count = 2;
            *ratings = handles;
            return 0;
        };
    }

    static ___UINT8* bytes(const char* text) { return reinterpret_cast<___UINT8*>(const_cast<char*>(text)); }

    // The DOM event stands in the log as the evaluation of its script.
    static std::string dispatched(const std::string& event) {
        return "NPN_Evaluate window \"var objElement=document.getElementById(\"tv\"); "
               "newEvent=document.createEvent(\"Event\");newEvent.initEvent(\"" +
               event + "\", false,false); objElement.dispatchEvent(newEvent);\"";
    }

    ScriptFunction handler = browser.function("handler");
};

std::string handlerLine(const std::string& statement) {
    return logLine("VIDEOBCAST", "handleVideoBroadcastEvent", statement);
}

// ---- What all events have in common

TEST_F(BroadcastEventTest, ACallbackOnlyQueuesAndTheDomEventComesBeforeTheHandler) {
    const EmbeddedObject vb = ready("onProgrammesChanged");
    onPlatformThread([&] { EXPECT_EQ(callbacks.programmesChanged(7), 0); });
    EXPECT_THAT(log.everything(), IsEmpty());
    EXPECT_EQ(handler.count(), 0U);
    browser.pump();
    EXPECT_THAT(log.calls(), ElementsAre(dispatched("ProgrammesChanged"), "event ProgrammesChanged at tv",
                                         "NPN_InvokeDefault handler()"));
    ASSERT_EQ(browser.events().size(), 1U);
    EXPECT_EQ(browser.events().front(), (DomEvent{"ProgrammesChanged", "tv", false, false, {}}));
    leftBehind(handler);
}

TEST_F(BroadcastEventTest, EachEventHasItsDomEventWithAndWithoutHandler) {
    const EmbeddedObject vb = ready();
    fire([&] {
        callbacks.channelChangeSucceeded(7, 0);
        callbacks.channelChangeError(7, 0, 1);
        callbacks.programmesChanged(7);
        callbacks.parentalRatingChange(7, nullptr, 0, nullptr);
        callbacks.parentalRatingError(7, nullptr, 0, nullptr);
        callbacks.playStateChange(7, 0, 2, 200);
        callbacks.fullScreenChange(7);
    });
    EXPECT_THAT(browser.eventTypes(),
                ElementsAre("ChannelChangeSucceded", "ChannelChangeError", "ProgrammesChanged",
                            "ParentalRatingChange", "ParentalRatingError", "PlayStateChange",
                            "FullScreenChange"));
    for (const DomEvent& event : browser.events()) {
        EXPECT_EQ(event.elementId, "tv");
        EXPECT_FALSE(event.bubbles || event.cancelable) << event;
    }
    leftBehind("JSChannel", 2); // made for the two channel events
}

TEST_F(BroadcastEventTest, AHandlerThatADomListenerSetsIsCalled) {
    const EmbeddedObject vb = ready();
    browser.onEvent("FullScreenChange", [&](const DomEvent&) { vb.set("onFullScreenChange", handler); });
    fire([&] { callbacks.fullScreenChange(7); });
    EXPECT_EQ(handler.count(), 1U);
    leftBehind(handler);
}

TEST_F(BroadcastEventTest, AnElementWithoutIdGetsNoEventsAtAll) {
    const EmbeddedObject vb = embed("");
    vb.set("onFullScreenChange", handler);
    vb.set("onChannelChangeSucceeded", handler);
    modelOf(vb).setActive(true);
    vb.set("onPlayStateChange", handler);
    log.clear();
    fire([&] {
        callbacks.fullScreenChange(7);
        callbacks.channelChangeSucceeded(7, 11);
        callbacks.playStateChange(7, 0, 0, 200);
    });
    EXPECT_EQ(handler.count(), 0U);
    EXPECT_THAT(log.everything(), IsEmpty());
    EXPECT_TRUE(modelOf(vb).isActive());
    blocksLeftBehind(2); // the payloads of the latter two
}

TEST_F(BroadcastEventTest, AnElementWithoutIdIsLoggedForEachEvent) {
    const std::string text = logOf(6, [&] {
        embed("");
        callbacks.fullScreenChange(7);
        browser.pump();
    });
    EXPECT_THAT(text,
                HasSubstr(handlerLine("Invalid VB Instance received or Id attribute is not present with "
                                      "object. isValidInst: 1\n")));
}

TEST_F(BroadcastEventTest, AnEventOfAnObjectThatHasGoneTouchesNoScript) {
    const EmbeddedObject other = embed("other"); // keeps the callbacks registered
    const EmbeddedObject vb = ready("onFullScreenChange");
    onPlatformThread([&] { callbacks.fullScreenChange(8); });
    vb.destroy();
    log.clear();
    browser.pump();
    EXPECT_THAT(log.everything(), IsEmpty());
    EXPECT_EQ(handler.count(), 0U);
}

TEST_F(BroadcastEventTest, AnEventOfTheLastObjectThatHasGoneTouchesNoScript) {
    const EmbeddedObject vb = ready("onFullScreenChange");
    onPlatformThread([&] { callbacks.fullScreenChange(7); });
    vb.destroy();
    log.clear();
    browser.pump();
    EXPECT_THAT(log.everything(), IsEmpty());
    EXPECT_EQ(handler.count(), 0U);
    blocksLeftBehind(1); // the record
}

// What stays of each event, in blocks of the heap: nothing of one that is delivered, the payload of one whose
// object has gone, that and the record of one whose object was the last.
TEST_F(BroadcastEventTest, WhatAnEventLeavesIsItsPayloadOrPayloadAndRecord) {
    anythingMayBeLeft(); // the references of each delivery
    struct Row {
        std::function<void(TELIX_JS_VB_HANDLE)> fire;
        size_t payload; // its blocks
    };
    ___UINT8* const text = bytes("text");
    const Row rows[] = {
        {[&](TELIX_JS_VB_HANDLE vb) { callbacks.channelChangeSucceeded(vb, 0); }, 1},
        {[&](TELIX_JS_VB_HANDLE vb) { callbacks.channelChangeError(vb, 0, 1); }, 1},
        {[&](TELIX_JS_VB_HANDLE vb) { callbacks.programmesChanged(vb); }, 0},
        {[&](TELIX_JS_VB_HANDLE vb) { callbacks.parentalRatingChange(vb, text, 0, text); }, 1},
        {[&](TELIX_JS_VB_HANDLE vb) { callbacks.parentalRatingError(vb, nullptr, 0, text); }, 1},
        {[&](TELIX_JS_VB_HANDLE vb) { callbacks.playStateChange(vb, 0, 2, 200); }, 1},
        {[&](TELIX_JS_VB_HANDLE vb) { callbacks.fullScreenChange(vb); }, 0},
        {[&](TELIX_JS_VB_HANDLE vb) { streamEventHandler(vb, nullptr, nullptr, text, text, 3, text); }, 4},
    };
    size_t left = 0;
    for (const Row& row : rows) {
        const TELIX_JS_VB_HANDLE handle = nextHandle;
        const EmbeddedObject delivered = embed();
        fire([&] { row.fire(handle); });
        EXPECT_EQ(callbackHeap.left(), left) << &row - rows;
        const EmbeddedObject gone = embed("other");
        onPlatformThread([&] { row.fire(handle + 1); });
        gone.destroy();
        browser.pump();
        EXPECT_EQ(callbackHeap.left(), left += row.payload) << &row - rows;
        onPlatformThread([&] { row.fire(handle); });
        delivered.destroy();
        browser.pump();
        EXPECT_EQ(callbackHeap.left(), left += row.payload + 1) << &row - rows;
    }
    blocksLeftBehind(left);
}

TEST_F(BroadcastEventTest, AnEventThatFindsNoMemoryForItsPayloadIsLost) {
    const EmbeddedObject vb = ready();
    onPlatformThread([&] {
        const MemoryShortage shortage;
        EXPECT_EQ(callbacks.channelChangeSucceeded(7, 11), 0);
        EXPECT_EQ(callbacks.channelChangeError(7, 11, 1), 0);
        EXPECT_EQ(callbacks.parentalRatingChange(7, nullptr, 61, nullptr), 0);
        EXPECT_EQ(callbacks.parentalRatingError(7, nullptr, 61, nullptr), 0);
        EXPECT_EQ(callbacks.playStateChange(7, 0, 2, 200), 0);
    });
    EXPECT_FALSE(g_main_context_pending(nullptr));
    blocksLeftBehind(5); // the records
}

TEST_F(BroadcastEventTest, EventsOfObjectsThatHaveGoneAreLogged) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject first = embed();
        const EmbeddedObject second = embed("other");
        callbacks.fullScreenChange(7);
        first.destroy();
        browser.pump();
        callbacks.fullScreenChange(8);
        second.destroy();
        browser.pump();
    });
    EXPECT_THAT(text, HasSubstr(handlerLine("VideoBroadcast class, bCallbacksRegistered : 1 \n")));
    EXPECT_THAT(text, HasSubstr(handlerLine("VB EventType: 8, VB Instance from eventData : 0x")));
    EXPECT_THAT(text,
                HasSubstr(handlerLine("Invalid VB Instance received or Id attribute is not present with "
                                      "object. isValidInst: 0\n")));
    EXPECT_THAT(text, HasSubstr(handlerLine("VideoBroadcast class, bCallbacksRegistered : 0 \n") +
                                handlerLine("Could not process eventData:( 0x")));
}

TEST_F(BroadcastEventTest, ADomListenerMayTakeTheObjectOut) {
    const EmbeddedObject vb = ready("onPlayStateChange");
    browser.onEvent("PlayStateChange", [&](const DomEvent&) { vb.destroy(); });
    fire([&] { callbacks.playStateChange(7, 0, 0, 200); });
    EXPECT_EQ(handler.count(), 0U);
}

TEST_F(BroadcastEventTest, AHandlerMayTakeTheObjectOut) {
    const EmbeddedObject vb = ready("onPlayStateChange");
    handler.does([&](const Values&) {
        vb.destroy();
        return Value();
    });
    fire([&] { callbacks.playStateChange(7, 0, 0, 200); });
    EXPECT_EQ(handler.count(), 1U);
    leftBehind(handler);
}

TEST_F(BroadcastEventTest, AnEventIsNotDeliveredToTheNextObjectAtTheSameAddress) {
    const EmbeddedObject other = embed("other"); // keeps the callbacks registered
    const SameAddress place(sizeof(VideoBroadcast));
    const EmbeddedObject first = embed();
    onPlatformThread([&] {
        callbacks.channelChangeSucceeded(8, 11);
        callbacks.channelChangeError(8, 11, 1);
        callbacks.programmesChanged(8);
        callbacks.playStateChange(8, 0, 2, 200);
        callbacks.fullScreenChange(8);
    });
    first.destroy();
    const EmbeddedObject second = ready("onFullScreenChange");
    ASSERT_EQ(second.model(), place.address());
    for (const char* slot :
         {"onChannelChangeSucceeded", "onChannelChangeError", "onProgrammesChanged", "onPlayStateChange"}) {
        second.set(slot, handler);
    }
    log.clear();
    browser.pump();
    EXPECT_THAT(log.everything(), IsEmpty());
    EXPECT_EQ(handler.count(), 0U);
    // Its own events come.
    onPlatformThread([&] { callbacks.fullScreenChange(9); });
    browser.pump();
    EXPECT_EQ(handler.count(), 1U);
    leftBehind(handler);
    blocksLeftBehind(3); // the payloads of those that have one
}

TEST_F(BroadcastEventTest, AnEventForAReplacedObjectIsLoggedAsOneForAnInvalidInstance) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject other = embed("other");
        const SameAddress place(sizeof(VideoBroadcast));
        const EmbeddedObject first = embed();
        callbacks.fullScreenChange(8);
        first.destroy();
        const EmbeddedObject second = embed();
        EXPECT_EQ(second.model(), place.address());
        browser.pump();
    });
    EXPECT_THAT(text,
                HasSubstr(handlerLine("Invalid VB Instance received or Id attribute is not present with "
                                      "object. isValidInst: 0\n")));
}

TEST_F(BroadcastEventTest, ADomListenerMayPutAnotherObjectInItsPlace) {
    const EmbeddedObject other = embed("other");
    const SameAddress place(sizeof(VideoBroadcast));
    const EmbeddedObject first = ready("onFullScreenChange");
    std::unique_ptr<EmbeddedObject> second;
    browser.onEvent("FullScreenChange", [&](const DomEvent&) {
        first.destroy();
        second = std::make_unique<EmbeddedObject>(ready("onFullScreenChange"));
        ASSERT_NE(second->model(), place.address()); // where the first one still stands for its event
    });
    fire([&] { callbacks.fullScreenChange(8); });
    EXPECT_EQ(handler.count(), 0U);
}

TEST_F(BroadcastEventTest, AHandlerMayPutAnotherObjectInItsPlace) {
    const EmbeddedObject other = embed("other");
    const SameAddress place(sizeof(VideoBroadcast));
    const EmbeddedObject first = ready("onPlayStateChange");
    std::unique_ptr<EmbeddedObject> second;
    handler.does([&](const Values&) {
        first.destroy();
        second = std::make_unique<EmbeddedObject>(embed());
        EXPECT_NE(second->model(), place.address());
        modelOf(*second).setActive(true);
        return undefined;
    });
    fire([&] { callbacks.playStateChange(8, 0, TELIX_PLAYSTATE_STOPPED, 200); });
    EXPECT_EQ(handler.count(), 1U);
    EXPECT_TRUE(modelOf(*second).isActive()); // the state was the other one's
    leftBehind(handler);
}

TEST_F(BroadcastEventTest, AHandlerThatThrowsStopsNothing) {
    const EmbeddedObject vb = ready("onPlayStateChange");
    modelOf(vb).setActive(true);
    handler.throws();
    fire([&] {
        callbacks.playStateChange(7, 0, 0, 200);
        callbacks.playStateChange(7, 0, 2, 200);
    });
    EXPECT_EQ(handler.count(), 2U);
    EXPECT_FALSE(modelOf(vb).isActive());
    leftBehind(handler, 2);
}

TEST_F(BroadcastEventTest, ACallbackForAnUnknownHandleQueuesNothing) {
    const EmbeddedObject vb = ready();
    onPlatformThread([&] {
        EXPECT_EQ(callbacks.channelChangeSucceeded(99, 1), 0);
        EXPECT_EQ(callbacks.channelChangeError(99, 1, 1), 0);
        EXPECT_EQ(callbacks.programmesChanged(99), 0);
        EXPECT_EQ(callbacks.parentalRatingChange(99, bytes("a"), 1, bytes("b")), 0);
        EXPECT_EQ(callbacks.parentalRatingError(99, bytes("a"), 1, bytes("b")), 0);
        EXPECT_EQ(callbacks.playStateChange(99, 0, 0, 200), 0);
        EXPECT_EQ(callbacks.fullScreenChange(99), 0);
    });
    EXPECT_FALSE(g_main_context_pending(nullptr));
    blocksLeftBehind(7); // the records
}

TEST_F(BroadcastEventTest, EachObjectGetsItsOwnEvents) {
    const EmbeddedObject first = embed("first");
    const EmbeddedObject second = embed("second");
    fire([&] {
        callbacks.fullScreenChange(8);
        callbacks.programmesChanged(7);
    });
    ASSERT_EQ(browser.events().size(), 2U);
    EXPECT_EQ(browser.events()[0].elementId, "second");
    EXPECT_EQ(browser.events()[1].elementId, "first");
}

TEST_F(BroadcastEventTest, OfTwoObjectsWithOneHandleTheLowerAddressGetsEveryEvent) {
    const EmbeddedObject first = embed("first");
    nextHandle = 7;
    const EmbeddedObject second = embed("second");
    fire([&] {
        callbacks.fullScreenChange(7);
        callbacks.fullScreenChange(7);
    });
    const std::string lower = first.model() < second.model() ? "first" : "second";
    ASSERT_EQ(browser.events().size(), 2U);
    EXPECT_EQ(browser.events()[0].elementId, lower);
    EXPECT_EQ(browser.events()[1].elementId, lower);
}

TEST_F(BroadcastEventTest, EventsOfOneThreadComeInTheirOrder) {
    const EmbeddedObject vb = ready("onPlayStateChange");
    onPlatformThread([&] {
        callbacks.playStateChange(7, 0, 1, 200);
        callbacks.playStateChange(7, 0, 2, 200);
    });
    browser.pump();
    ASSERT_EQ(handler.count(), 2U);
    EXPECT_EQ(handler.calls()[0][0], Value(1));
    EXPECT_EQ(handler.calls()[1][0], Value(2));
    leftBehind(handler, 2);
}

TEST_F(BroadcastEventTest, CallbacksAreLoggedUnderTheirNames) {
    const std::string text = logOf(6, [&] {
        embed();
        callbacks.channelChangeSucceeded(7, 11);
        callbacks.channelChangeError(7, 11, 1);
        callbacks.programmesChanged(7);
        callbacks.parentalRatingChange(7, nullptr, 0, nullptr);
        callbacks.parentalRatingError(7, nullptr, 0, nullptr);
        callbacks.playStateChange(7, 5, 2, 200);
        callbacks.fullScreenChange(7);
    });
    for (const char* callback :
         {"onChannelChangeSuccededCb", "onChannelChangeErrorCb", "onProgrammesChangedCb",
          "onParentalRatingChangeCb", "onParentalRatingErrorCb", "onFullScreenChangeCb"}) {
        EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", callback, " VB Handle 7 . \n") +
                                    logLine("VIDEOBCAST", callback, " VB Inst:( 0x")));
    }
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "onPlayStateChangeCb",
                                        " VB Handle 7, State: 2, Error: 200 \n") +
                                logLine("VIDEOBCAST", "onPlayStateChangeCb", " VB Inst:( 0x")));
    EXPECT_THAT(text, HasSubstr(" ) for vbHandle:( 7 ), Event:( 0x"));
}

// ---- Channel changes

TEST_F(BroadcastEventTest, AChangeOfChannelBringsTheListsOwnObject) {
    const EmbeddedObject vb = ready("onChannelChangeSucceeded");
    fire([&] { callbacks.channelChangeSucceeded(7, 12); });
    EXPECT_THAT(log.calls(),
                ElementsAre(dispatched("ChannelChangeSucceded"), "event ChannelChangeSucceded at tv",
                            "NPN_CreateObject JSChannelConfig", "TELIX_JS_CM_GetChannelList(out, out)",
                            "NPN_CreateObject JSChannelList", "NPN_CreateObject JSChannel",
                            "NPN_CreateObject JSChannel#2", "NPN_InvokeDefault handler(JSChannel#2)"));
    ASSERT_EQ(handler.last().size(), 1U);
    const ObjectRef config = vb.call("getChannelConfig").object();
    const ObjectRef list = config.get("channelList").object();
    const ObjectRef channel = handler.last()[0].object();
    EXPECT_EQ(channel, list.call("item", 1).object());
    // The references that the handler was prepared with are never released.
    EXPECT_EQ(handler.pluginReferences(), 2);
    EXPECT_EQ(config.pluginReferences(), 2);
    EXPECT_EQ(list.pluginReferences(), 2);
    EXPECT_EQ(channel.pluginReferences(), 3);
    leftBehind(handler);
    leftBehind(config);
    leftBehind(list, 2);        // the other one is the configuration's, which stays
    leftBehind("JSChannel", 5); // two each of the list, which stays, and one of the event
}

TEST_F(BroadcastEventTest, AChannelOutsideTheListIsMadeForTheEvent) {
    const EmbeddedObject vb = ready("onChannelChangeSucceeded");
    fire([&] { callbacks.channelChangeSucceeded(7, 99); });
    ASSERT_EQ(handler.last().size(), 1U);
    const ObjectRef channel = handler.last()[0].object();
    EXPECT_EQ(channel.get("ccid"), "99");
    EXPECT_EQ(channel.pluginReferences(), 1);
    anythingMayBeLeft(); // the list as above
}

TEST_F(BroadcastEventTest, AChannelIsMadeForTheEventWithoutAList) {
    const EmbeddedObject vb = ready("onChannelChangeSucceeded");
    platform.TELIX_JS_CM_GetChannelList = [](uint32_t*, TELIX_JS_CM_HANDLE**) { return 1; };
    fire([&] { callbacks.channelChangeSucceeded(7, 11); });
    EXPECT_EQ(handler.last()[0].object().get("ccid"), "11");
    leftBehind(handler);
    leftBehind("JSChannelConfig");
    leftBehind("JSChannel");
}

TEST_F(BroadcastEventTest, TheChannelZeroIsAnEmptyChannel) {
    const EmbeddedObject vb = ready("onChannelChangeSucceeded");
    fire([&] { callbacks.channelChangeSucceeded(7, 0); });
    EXPECT_EQ(handler.last()[0].object().get("ccid"), nullptr);
    EXPECT_EQ(platform.TELIX_JS_CM_GetChannelList.count(), 0U);
    leftBehind(handler);
    leftBehind("JSChannel");
}

TEST_F(BroadcastEventTest, WithoutHandlerTheChannelIsMadeAllTheSame) {
    const EmbeddedObject vb = ready();
    fire([&] { callbacks.channelChangeSucceeded(7, 0); });
    EXPECT_EQ(log.count("NPN_CreateObject JSChannel"), 1U);
    leftBehind("JSChannel");
}

TEST_F(BroadcastEventTest, ABrowserThatMakesNoChannelCallsNoHandler) {
    const EmbeddedObject vb = ready("onChannelChangeSucceeded");
    vb.set("onChannelChangeError", handler);
    browser.refuse("NPN_CreateObject");
    fire([&] {
        callbacks.channelChangeSucceeded(7, 11);
        callbacks.channelChangeError(7, 11, 5);
    });
    EXPECT_THAT(browser.eventTypes(), ElementsAre("ChannelChangeSucceded", "ChannelChangeError"));
    EXPECT_EQ(handler.count(), 0U);
    leftBehind(handler, 2);
}

TEST_F(BroadcastEventTest, AFailedChangeOfChannelBringsChannelAndError) {
    const EmbeddedObject vb = ready("onChannelChangeError");
    fire([&] { callbacks.channelChangeError(7, 0, 5); });
    ASSERT_EQ(handler.last().size(), 2U);
    EXPECT_EQ(handler.last()[0].object().get("ccid"), nullptr);
    EXPECT_EQ(handler.last()[1], Value(5));
    log.expectInOrder({dispatched("ChannelChangeError"), "NPN_InvokeDefault handler(JSChannel, 5)"});
    leftBehind(handler);
    leftBehind("JSChannel");
}

TEST_F(BroadcastEventTest, AFailedChangeOfChannelBringsAnyErrorAsANumber) {
    const EmbeddedObject vb = ready("onChannelChangeError");
    fire([&] { callbacks.channelChangeError(7, 11, TELIX_ERR_STATE_NONE); });
    ASSERT_EQ(handler.count(), 1U);
    EXPECT_EQ(handler.last()[1],
              Value(static_cast<int>(TELIX_ERR_STATE_NONE))); // unlike that of a play state
    anythingMayBeLeft();
}

TEST_F(BroadcastEventTest, AHandlerThatADomListenerClearsIsNotCalled) {
    const EmbeddedObject vb = ready("onFullScreenChange");
    browser.onEvent("FullScreenChange", [&](const DomEvent&) { vb.set("onFullScreenChange", nullptr); });
    fire([&] { callbacks.fullScreenChange(7); });
    EXPECT_EQ(browser.eventTypes(), std::vector<std::string>{"FullScreenChange"});
    EXPECT_EQ(handler.count(), 0U);
}

TEST_F(BroadcastEventTest, AHandlerIsCalledAlsoIfTheDomEventCouldNotBeDispatched) {
    const EmbeddedObject vb = ready("onFullScreenChange");
    browser.whenEvaluatingTextFrom("var objElement=").throws();
    fire([&] { callbacks.fullScreenChange(7); });
    EXPECT_THAT(browser.eventTypes(), IsEmpty());
    EXPECT_EQ(handler.count(), 1U);
    leftBehind(handler);
}

TEST_F(BroadcastEventTest, EventsChangeNoneOfWhatTheObjectHolds) {
    const EmbeddedObject vb = ready();
    platform.TELIX_JS_VB_GetCurrentChannel = [](TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE* channel) {
        *channel = 50;
        return 0;
    };
    const ObjectRef channel = vb.get("currentChannel").object();
    fire([&] {
        callbacks.channelChangeSucceeded(7, 0);
        callbacks.playStateChange(7, 0, 2, 200);
        callbacks.fullScreenChange(7);
    });
    EXPECT_EQ(vb.get("currentChannel").object(), channel);
    log.clear();
    vb.call("setFullScreen", false);
    vb.set("playState", 0);
    EXPECT_THAT(platformCalls(), IsEmpty());
    leftBehind("JSChannel");
}

// ---- Programmes and full screen

TEST_F(BroadcastEventTest, AChangeOfFullScreenByThePlatformCallsTheHandlerWithoutArguments) {
    const EmbeddedObject vb = ready("onFullScreenChange");
    vb.call("setFullScreen", true);
    fire([&] { callbacks.fullScreenChange(7); });
    ASSERT_EQ(handler.count(), 2U);
    EXPECT_THAT(handler.calls()[0], ElementsAre(Value(true)));
    EXPECT_THAT(handler.calls()[1], IsEmpty());
    EXPECT_EQ(handler.pluginReferences(), 2);
    leftBehind(handler);
}

// ---- Play state

TEST_F(BroadcastEventTest, APlayStateWithoutErrorBringsUndefined) {
    const EmbeddedObject vb = ready("onPlayStateChange");
    fire([&] { callbacks.playStateChange(7, 4711, 2, 200); });
    EXPECT_THAT(handler.last(), ElementsAre(Value(2), Value(undefined)));
    log.expectInOrder({dispatched("PlayStateChange"), "NPN_InvokeDefault handler(2, undefined)"});
    leftBehind(handler);
}

TEST_F(BroadcastEventTest, AnyOtherErrorOfAPlayStateIsANumber) {
    const EmbeddedObject vb = ready("onPlayStateChange");
    fire([&] {
        callbacks.playStateChange(7, 0, 0, 0);
        callbacks.playStateChange(7, 0, 0, -1);
    });
    EXPECT_THAT(handler.calls()[0], ElementsAre(Value(0), Value(0)));
    EXPECT_THAT(handler.calls()[1], ElementsAre(Value(0), Value(-1)));
    leftBehind(handler, 2);
}

TEST_F(BroadcastEventTest, ThePlayStatesOtherThanPresentingEndTheActivity) {
    const EmbeddedObject vb = ready("onPlayStateChange");
    int events = 0;
    for (const int state : {0, 1, 2, 3, 4, -1}) {
        modelOf(vb).setActive(true);
        fire([&] { callbacks.playStateChange(7, 0, state, 200); });
        ++events;
        EXPECT_EQ(modelOf(vb).isActive(), state == 2 || state == 4 || state == -1) << state;
    }
    leftBehind(handler, events);
}

TEST_F(BroadcastEventTest, TheObjectIsStillActiveWhileTheHandlerRuns) {
    const EmbeddedObject vb = ready("onPlayStateChange");
    modelOf(vb).setActive(true);
    bool active = false;
    handler.does([&](const Values&) {
        active = modelOf(vb).isActive();
        return Value();
    });
    fire([&] { callbacks.playStateChange(7, 0, 3, 200); });
    EXPECT_TRUE(active);
    EXPECT_FALSE(modelOf(vb).isActive());
    leftBehind(handler);
}

TEST_F(BroadcastEventTest, WithoutHandlerTheObjectStaysAsActiveAsItWas) {
    const EmbeddedObject vb = ready();
    modelOf(vb).setActive(true);
    fire([&] { callbacks.playStateChange(7, 0, 3, 200); });
    EXPECT_TRUE(modelOf(vb).isActive());
}

TEST_F(BroadcastEventTest, APlayStateIsLogged) {
    const auto deliver = [&](const std::string& slot) {
        return logOf(6, [&] {
            ready(slot);
            callbacks.playStateChange(7, 0, 2, 200);
            browser.pump();
        });
    };
    const std::string first = handlerLine("VBEvent_PlayStateChange:: Case. VB State: 2, Plugin State: 0 \n");
    const std::string second = handlerLine("VBEvent_PlayStateChange:: Case. State: 2 \n");
    EXPECT_THAT(deliver("onPlayStateChange"), HasSubstr(first + second));
    const std::string without = deliver("");
    EXPECT_THAT(without, HasSubstr(first));
    EXPECT_THAT(without, Not(HasSubstr(second)));
}

// ---- Parental ratings

TEST_F(BroadcastEventTest, AChangeOfRatingBringsTextsAndRating) {
    programmesHaveRatings();
    const EmbeddedObject vb = ready("onParentalRatingChange");
    onPlatformThread([&] {
        char contentId[] = "content";
        char drmSystemId[] = "drm";
        callbacks.parentalRatingChange(7, bytes(contentId), 62, bytes(drmSystemId));
        contentId[0] = drmSystemId[0] = 'x'; // the platform's, gone with the callback
    });
    browser.pump();
    ASSERT_EQ(handler.last().size(), 3U);
    EXPECT_EQ(handler.last()[0], Value("content"));
    EXPECT_EQ(handler.last()[2], Value("drm"));
    const ObjectRef rating = handler.last()[1].object();
    const ObjectRef listed = vb.get("programmes")
                                 .object()
                                 .call("item", 0)
                                 .object()
                                 .get("parentalRating")
                                 .object()
                                 .call("item", 1)
                                 .object();
    EXPECT_EQ(rating, listed);
    EXPECT_EQ(browser.eventTypes(), std::vector<std::string>{"ParentalRatingChange"});
    EXPECT_EQ(handler.pluginReferences(), 2);
    EXPECT_EQ(vb.get("programmes").object().pluginReferences(), 2);
    anythingMayBeLeft(); // the programmes with their ratings, as counted
}

TEST_F(BroadcastEventTest, MissingTextsOfARatingAreNull) {
    programmesHaveRatings();
    const EmbeddedObject vb = ready("onParentalRatingChange");
    fire([&] {
        callbacks.parentalRatingChange(7, nullptr, 61, bytes(""));
        callbacks.parentalRatingChange(7, bytes("content"), 61, nullptr);
    });
    ASSERT_EQ(handler.count(), 2U);
    EXPECT_EQ(handler.calls()[0][0], Value(nullptr));
    EXPECT_EQ(handler.calls()[0][2], Value(nullptr));
    EXPECT_EQ(handler.calls()[1][0], Value("content"));
    EXPECT_EQ(handler.calls()[1][2], Value(nullptr));
    anythingMayBeLeft();
}

TEST_F(BroadcastEventTest, ARatingErrorCallsTheHandlerOfTheChange) {
    programmesHaveRatings();
    const EmbeddedObject vb = ready("onParentalRatingChange");
    const ScriptFunction error = browser.function("error");
    vb.set("onParentalRatingError", error);
    fire([&] { callbacks.parentalRatingError(7, bytes("content"), 61, bytes("drm")); });
    EXPECT_EQ(browser.eventTypes(), std::vector<std::string>{"ParentalRatingError"});
    ASSERT_EQ(handler.count(), 1U);
    EXPECT_EQ(handler.last()[0], Value("content"));
    EXPECT_TRUE(handler.last()[1].isObject());
    EXPECT_EQ(handler.last()[2], Value("drm"));
    EXPECT_EQ(error.count(), 0U);
    EXPECT_EQ(error.pluginReferences(), 1);
    anythingMayBeLeft();
}

TEST_F(BroadcastEventTest, MissingTextsOfARatingErrorAreNull) {
    programmesHaveRatings();
    const EmbeddedObject vb = ready("onParentalRatingChange");
    fire([&] { callbacks.parentalRatingError(7, nullptr, 61, nullptr); });
    ASSERT_EQ(handler.count(), 1U);
    EXPECT_EQ(handler.last()[0], Value(nullptr));
    EXPECT_EQ(handler.last()[2], Value(nullptr));
    anythingMayBeLeft();
}

TEST_F(BroadcastEventTest, ARatingErrorAloneCallsNothing) {
    programmesHaveRatings();
    const EmbeddedObject vb = ready("onParentalRatingError");
    fire([&] { callbacks.parentalRatingError(7, bytes("content"), 61, bytes("drm")); });
    EXPECT_EQ(browser.eventTypes(), std::vector<std::string>{"ParentalRatingError"});
    EXPECT_EQ(handler.count(), 0U);
    EXPECT_EQ(handler.pluginReferences(), 1);
    anythingMayBeLeft();
}

TEST_F(BroadcastEventTest, TheRatingZeroCallsNoHandlerAndAsksNoPlatform) {
    programmesHaveRatings();
    const EmbeddedObject vb = ready("onParentalRatingChange");
    fire([&] { callbacks.parentalRatingChange(7, bytes("content"), 0, bytes("drm")); });
    EXPECT_EQ(browser.eventTypes(), std::vector<std::string>{"ParentalRatingChange"});
    EXPECT_EQ(handler.count(), 0U);
    EXPECT_THAT(platformCalls(), IsEmpty());
    leftBehind(handler);
}

TEST_F(BroadcastEventTest, ARatingThatNoProgrammeKnowsCallsNoHandler) {
    programmesHaveRatings();
    platform.TELIX_JS_SI_GetParentalRatingHandles = [](TELIX_JS_SI_HANDLE, uint32_t*,
                                                       TELIX_JS_SI_PARENTALRATING_HANDLE**) { return 1; };
    const EmbeddedObject vb = ready("onParentalRatingChange");
    fire([&] { callbacks.parentalRatingChange(7, bytes("content"), 99, bytes("drm")); });
    EXPECT_EQ(browser.eventTypes(), std::vector<std::string>{"ParentalRatingChange"});
    EXPECT_EQ(handler.count(), 0U);
    EXPECT_EQ(platform.TELIX_JS_SI_GetParentalRatingHandles.count(), 1U);
    leftBehind(handler);
    leftBehind("JSProgrammeCollection");
    leftBehind("JSProgramme", 2);
}

TEST_F(BroadcastEventTest, ARatingThatTheProgrammesDoNotHoldIsMadeAnew) {
    programmesHaveRatings();
    const EmbeddedObject vb = ready("onParentalRatingChange");
    fire([&] { callbacks.parentalRatingChange(7, bytes("content"), 99, bytes("drm")); });
    EXPECT_EQ(handler.count(), 1U);
    anythingMayBeLeft();
}

TEST_F(BroadcastEventTest, ARatingWithoutProgrammesCallsNoHandlerAndDoesNotFault) {
    platform.defaultResult = 1;
    const EmbeddedObject vb = ready("onParentalRatingChange");
    fire([&] { callbacks.parentalRatingChange(7, bytes("content"), 61, bytes("drm")); });
    EXPECT_EQ(browser.eventTypes(), std::vector<std::string>{"ParentalRatingChange"});
    EXPECT_EQ(handler.count(), 0U);
    leftBehind(handler);
}

// ---- The handler's own guards

TEST_F(BroadcastEventTest, ARecordWithoutObjectIsNotProcessed) {
    const EmbeddedObject vb = ready();
    VideoBcastEvent event;
    EXPECT_EQ(handleVideoBroadcastEvent(nullptr), 0);
    EXPECT_EQ(handleVideoBroadcastEvent(&event), 0); // and not deleted
    EXPECT_THAT(log.everything(), IsEmpty());
    EXPECT_THAT(logOf(6, [&] { handleVideoBroadcastEvent(&event); }),
                HasSubstr(handlerLine("Could not process eventData:( 0x")));
}

TEST_F(BroadcastEventTest, ARecordOfNoEventIsLogged) {
    const EmbeddedObject vb = ready();
    const auto deliver = [&](unsigned int type) {
        auto* event = new VideoBcastEvent;
        event->eventType = static_cast<VBEventType>(type);
        event->vbInstance = modelOf(vb).ref();
        EXPECT_EQ(handleVideoBroadcastEvent(event), 0);
    };
    deliver(0);
    deliver(9);
    EXPECT_THAT(log.everything(), IsEmpty());
    EXPECT_THAT(logOf(6, [&] { deliver(0); }), HasSubstr(handlerLine("VBEvent_NoEvent: Case. \n")));
    EXPECT_THAT(logOf(6, [&] { deliver(9); }), Not(HasSubstr(handlerLine("VBEvent_"))));
}

TEST_F(BroadcastEventTest, ARecordWithoutPayloadEndsWithTheDomEvent) {
    const EmbeddedObject vb = ready("onPlayStateChange");
    for (const char* slot : {"onChannelChangeSucceeded", "onChannelChangeError", "onParentalRatingChange"}) {
        vb.set(slot, handler);
    }
    log.clear();
    for (const unsigned int type : {1, 2, 3, 5, 6, 7}) {
        auto* event = new VideoBcastEvent;
        event->eventType = static_cast<VBEventType>(type);
        event->vbInstance = modelOf(vb).ref();
        EXPECT_EQ(handleVideoBroadcastEvent(event), 0);
    }
    EXPECT_THAT(log.calls(),
                ElementsAre(dispatched("ChannelChangeSucceded"), "event ChannelChangeSucceded at tv",
                            dispatched("ChannelChangeError"), "event ChannelChangeError at tv",
                            dispatched("ParentalRatingChange"), "event ParentalRatingChange at tv",
                            dispatched("ParentalRatingError"), "event ParentalRatingError at tv",
                            dispatched("PlayStateChange"), "event PlayStateChange at tv"));
    EXPECT_EQ(log.count("NPN_RetainObject"), 0U);
}

} // namespace
