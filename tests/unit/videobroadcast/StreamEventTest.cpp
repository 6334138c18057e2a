// Subscriptions to stream events, and the way of one from the broadcast to the page.
#include <algorithm>
#include <iterator>

#include <glib.h>
#include <gmock/gmock.h>

#include "common/PluginUtils.h"
#include "src/videobroadcast/VideoBroadcastUtils.h"
#include "tests/unit/videobroadcast/BroadcastTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace {

class StreamEventTest : public BroadcastTest {
protected:
    // A new object whose element takes listeners, with a clean log behind it.
    EmbeddedObject ready(const std::string& id = "tv") {
        const EmbeddedObject vb = embed(id);
        vb.element().method("addEventListener", [](const Values&) { return Value(); });
        vb.element().method("removeEventListener", [](const Values&) { return Value(); });
        vb.scriptObject();
        log.clear();
        return vb;
    }

    // The tag that the platform gets for one of a description at the address.
    std::string tagFor(const std::string& url, const std::string& tag) {
        std::string given;
        platform.TELIX_JS_VB_RegisterStreamEvent = [&](TELIX_JS_VB_HANDLE, TELIX_JS_VB_STREAM_EVENT_CB,
                                                       const char*, const char* componentTag, const char*) {
            given = componentTag;
            return 0;
        };
        const EmbeddedObject vb = ready();
        EXPECT_TRUE(vb.call("addStreamEventListener", url, "goal", "5", tag));
        return given;
    }

    // From here on a new object gets its window and no element.
    void refuseElement() {
        browser.refuse("NPN_GetValue", ~0U, 1);
        browser.refuse("NPN_GetProperty"); // the element's style
    }

    static ___UINT8* bytes(const char* text) { return reinterpret_cast<___UINT8*>(const_cast<char*>(text)); }
};

// ---- The page's form

TEST_F(StreamEventTest, AListenerStartsTheFetchAndIsAttachedToTheElement) {
    const EmbeddedObject vb = ready();
    const ScriptFunction listener = browser.function("listener");
    EXPECT_TRUE(vb.call("addStreamEventListener", "events.xml", "goal", listener));
    EXPECT_EQ(browser.lastScript(), parseStreamEventXMLScript("events.xml", "goal", "tv", true));
    EXPECT_THAT(vb.element().calls("addEventListener"),
                ElementsAre(ElementsAre(Value("StreamEvent"), Value(listener), Value(false))));
    log.expectInOrder({"NPN_Evaluate " + browser.window().name() + " \"" + browser.lastScript() + "\"",
                       "NPN_Invoke tv.addEventListener(\"StreamEvent\", listener, false)"});
    EXPECT_THAT(platformCalls(), IsEmpty());
    EXPECT_EQ(listener.pluginReferences(), 0);
}

TEST_F(StreamEventTest, WithoutHandleTheListenerIsAttachedAllTheSame) {
    const EmbeddedObject vb = embedWithoutHandle();
    vb.element().method("addEventListener", [](const Values&) { return Value(); });
    EXPECT_TRUE(vb.call("addStreamEventListener", "events.xml", "goal", browser.function("listener")));
    EXPECT_EQ(vb.element().calls("addEventListener").size(), 1U);
}

TEST_F(StreamEventTest, AFetchThatDoesNotRunAttachesNoListener) {
    const EmbeddedObject vb = ready();
    browser.whenEvaluatingTextFrom("var requestURL").throws();
    EXPECT_TRUE(vb.call("addStreamEventListener", "events.xml", "goal", browser.function("listener")));
    EXPECT_THAT(vb.element().calls("addEventListener"), IsEmpty());
}

TEST_F(StreamEventTest, WithoutWindowNothingIsStarted) {
    browser.refuse("NPN_GetValue", 1);
    const EmbeddedObject vb = ready();
    browser.refuse("NPN_GetValue");
    EXPECT_TRUE(vb.call("addStreamEventListener", "events.xml", "goal", browser.function("listener")));
    EXPECT_EQ(log.count("NPN_Evaluate"), 0U);
    EXPECT_THAT(vb.element().calls("addEventListener"), IsEmpty());
}

TEST_F(StreamEventTest, WithoutElementTheFetchIsStartedAndNoListenerAttached) {
    refuseElement();
    const EmbeddedObject vb = ready();
    EXPECT_TRUE(vb.call("addStreamEventListener", "events.xml", "goal", browser.function("listener")));
    EXPECT_EQ(browser.lastScript(), parseStreamEventXMLScript("events.xml", "goal", "tv", true));
    EXPECT_EQ(log.count("NPN_Invoke"), 0U);
}

TEST_F(StreamEventTest, WithoutElementARemovalTakesTheSubscriptionAway) {
    refuseElement();
    const EmbeddedObject vb = ready();
    vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
    log.clear();
    EXPECT_TRUE(vb.call("removeStreamEventListener", "dvb://1", "goal", browser.function("listener")));
    EXPECT_EQ(log.count("NPN_Invoke"), 0U);
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_UnRegisterStreamEvent(7, callback, \"5\", \"31\", \"goal\")"));
}

TEST_F(StreamEventTest, AResultOfTheListItselfIsReleased) {
    const EmbeddedObject vb = ready();
    const ScriptObject result = browser.scriptObject("result");
    vb.element().method("addEventListener", [&](const Values&) { return Value(result); });
    vb.element().method("removeEventListener", [&](const Values&) { return Value(result); });
    browser.whenEvaluatingTextFrom("var requestURL").gives(result);
    const ScriptFunction listener = browser.function("listener");
    vb.call("addStreamEventListener", "events.xml", "goal", listener);
    vb.call("removeStreamEventListener", "events.xml", "goal", listener);
    EXPECT_EQ(result.pluginReferences(), 0);
}

TEST_F(StreamEventTest, ANullListenerStopsTheProcess) {
    const EmbeddedObject vb = ready();
    EXPECT_DEATH(modelOf(vb).addStreamEventListener("url", "goal", nullptr),
                 "src/videobroadcast/VideoBroadcast.*streamEventListener");
    EXPECT_DEATH(modelOf(vb).removeStreamEventListener("url", "goal", nullptr),
                 "src/videobroadcast/VideoBroadcast.*streamEventListener");
}

// ---- The registering form

TEST_F(StreamEventTest, TheSecondFormSubscribesAtThePlatform) {
    const EmbeddedObject vb = ready();
    EXPECT_TRUE(vb.call("addStreamEventListener", "dvb://1.2.3", "goal", "5", "31"));
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_RegisterStreamEvent(7, callback, \"5\", \"31\", \"goal\")"));
}

TEST_F(StreamEventTest, WithoutHandleTheSecondFormStopsTheProcess) {
    const EmbeddedObject vb = embedWithoutHandle();
    EXPECT_DEATH(vb.call("addStreamEventListener", "url", "goal", "5", "31"),
                 "src/videobroadcast/VideoBroadcast.*m_vbHandle");
}

TEST_F(StreamEventTest, ATagThatCameOverHttpIsHandedOnInHexadecimal) {
    EXPECT_EQ(tagFor("events.xml", "31"), "1f");
    EXPECT_EQ(tagFor("http://other.example/events.xml", "255"), "ff");
    EXPECT_EQ(tagFor("events.xml", "abc"), "0");
    EXPECT_EQ(tagFor("events.xml", "12x"), "c");
    EXPECT_EQ(tagFor("events.xml", ""), "0");
    EXPECT_EQ(tagFor("events.xml", "-1"), "ffffffff");
}

TEST_F(StreamEventTest, TheBeginningsOfAddressesAreComparedWithoutCase) {
    browser.setAddress("HTTPS://page.example/app/");
    EXPECT_EQ(tagFor("events.xml", "31"), "1f");
    EXPECT_EQ(tagFor("DVB://1.2.3", "31"), "31");
    EXPECT_EQ(tagFor("dvb:/1.2.3", "31"), "1f");
}

TEST_F(StreamEventTest, ATagOfAPageThatIsNotHttpStaysAsItCame) {
    browser.setAddress("dvb://1.2.3/app/index.html");
    EXPECT_EQ(tagFor("events.xml", "31"), "31");
}

TEST_F(StreamEventTest, ATagStaysAsItCameIfThePagesAddressCannotBeHad) {
    browser.whenEvaluating("document.location.href").throws();
    EXPECT_EQ(tagFor("events.xml", "31"), "31");
}

TEST_F(StreamEventTest, AnEmptyAddressLeavesTheTagAloneWithoutAskingThePage) {
    EXPECT_EQ(tagFor("", "31"), "31");
    EXPECT_EQ(log.count("NPN_Evaluate"), 0U);
}

TEST_F(StreamEventTest, SubscribingTwiceRegistersTwice) {
    const EmbeddedObject vb = ready();
    vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
    vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
    EXPECT_EQ(platform.TELIX_JS_VB_RegisterStreamEvent.count(), 2U);
    vb.destroy();
    EXPECT_EQ(platform.TELIX_JS_VB_UnRegisterStreamEvent.count(), 2U);
}

TEST_F(StreamEventTest, ASubscriptionThatThePlatformRefusesStaysInTheList) {
    const EmbeddedObject vb = ready();
    platform.TELIX_JS_VB_RegisterStreamEvent = [](TELIX_JS_VB_HANDLE, TELIX_JS_VB_STREAM_EVENT_CB,
                                                  const char*, const char*, const char*) { return 1; };
    vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
    vb.destroy();
    EXPECT_EQ(platform.TELIX_JS_VB_UnRegisterStreamEvent.count(), 1U);
}

// ---- Removal

TEST_F(StreamEventTest, RemovalTakesTheListenerAndTheSubscriptionAway) {
    const EmbeddedObject vb = ready();
    const ScriptFunction listener = browser.function("listener");
    vb.call("addStreamEventListener", "events.xml", "goal", "5", "31");
    log.clear();
    EXPECT_TRUE(vb.call("removeStreamEventListener", "events.xml", "goal", listener));
    log.expectInOrder({"NPN_Invoke tv.removeEventListener(\"StreamEvent\", listener, false)",
                       "TELIX_JS_VB_UnRegisterStreamEvent(7, callback, \"5\", \"1f\", \"goal\")"});
    EXPECT_EQ(log.count("NPN_Evaluate"), 0U); // nothing is fetched again
    log.clear();
    vb.call("removeStreamEventListener", "events.xml", "goal", listener);
    EXPECT_THAT(platformCalls(), IsEmpty());
}

TEST_F(StreamEventTest, OfTwoSubscriptionsToOneAddressTheLaterOneGoesFirst) {
    const EmbeddedObject vb = ready();
    const ScriptFunction listener = browser.function("listener");
    vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
    vb.call("addStreamEventListener", "dvb://1", "foul", "6", "32");
    vb.call("addStreamEventListener", "dvb://2", "save", "7", "33");
    log.clear();
    vb.call("removeStreamEventListener", "dvb://1", "goal", listener);
    vb.call("removeStreamEventListener", "dvb://1", "goal", listener);
    // The name is the caller's, id and tag are those of the subscription that went.
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_UnRegisterStreamEvent(7, callback, \"6\", \"32\", \"goal\")",
                            "TELIX_JS_VB_UnRegisterStreamEvent(7, callback, \"5\", \"31\", \"goal\")"));
}

TEST_F(StreamEventTest, ANameThatWasNeverSubscribedRemovesTheLatestOfTheAddress) {
    const EmbeddedObject vb = ready();
    vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
    log.clear();
    vb.call("removeStreamEventListener", "dvb://1", "never", browser.function("listener"));
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_UnRegisterStreamEvent(7, callback, \"5\", \"31\", \"never\")"));
}

TEST_F(StreamEventTest, AnUnknownAddressOnlyTakesTheListenerAway) {
    const EmbeddedObject vb = ready();
    vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
    log.clear();
    vb.call("removeStreamEventListener", "dvb://1/", "goal", browser.function("listener"));
    EXPECT_EQ(vb.element().calls("removeEventListener").size(), 1U);
    EXPECT_THAT(platformCalls(), IsEmpty());
}

TEST_F(StreamEventTest, TheEndOfTheObjectUnregistersWhatIsLeftTheLastFirst) {
    const EmbeddedObject vb = ready();
    vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
    vb.call("addStreamEventListener", "dvb://2", "foul", "6", "32");
    log.clear();
    vb.destroy();
    log.expectInOrder({"TELIX_JS_VB_Release(7)",
                       "TELIX_JS_VB_UnRegisterStreamEvent(7, callback, \"6\", \"32\", \"foul\")",
                       "TELIX_JS_VB_UnRegisterStreamEvent(7, callback, \"5\", \"31\", \"goal\")"});
}

TEST_F(StreamEventTest, SubscriptionsAreLogged) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject vb = ready();
        const ScriptFunction listener = browser.function("listener");
        vb.call("addStreamEventListener", "events.xml", "goal", listener);
        vb.call("addStreamEventListener", "events.xml", "goal", "5", "31");
        vb.call("removeStreamEventListener", "events.xml", "foul", listener);
        vb.call("addStreamEventListener", "dvb://1", "save", "6", "32");
        vb.destroy();
    });
    const auto add = [](const std::string& statement) {
        return logLine("VIDEOBCAST", "addStreamEventListener", statement);
    };
    const auto remove = [](const std::string& statement) {
        return logLine("VIDEOBCAST", "removeStreamEventListener", statement);
    };
    EXPECT_THAT(text, HasSubstr(add("VBHandle:-- 7 --, TargetURL: events.xml\n")));
    EXPECT_THAT(text, HasSubstr(add("::PluginObject:-- 0x")));
    EXPECT_THAT(
        text,
        HasSubstr(add("VBHandle:-- 7 -- \n") + add("urlPath:-- http://page.example/app/events.xml \n") +
                  add("targetUrlSubStr:-- events \n") + add("comp_tag value: Decimal value:-- 31 \n") +
                  add("comp_tag value: Hex value:-- 1f \n") + add("Event Name: goal , Id: 5 , CTag: 1f \n")));
    EXPECT_THAT(text, HasSubstr(remove("VBHandle:-- 7 --, TargetURL: events.xml\n") +
                                remove("::PluginObject:-- 0x")));
    EXPECT_THAT(text,
                HasSubstr(logLine("VIDEOBCAST", "getStreamEventInfo", "size of m_StreamEventList: 1 \n") +
                          remove("count value returned is: 0 \n") +
                          remove("Event Name: foul, Id: 5, CTag: 1f \n")));
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "deleteStreamEventInfo",
                                        "Size of m_StreamEventList List: 1 \n") +
                                logLine("VIDEOBCAST", "deleteStreamEventInfo",
                                        "m_StreamEventList[0] TargetURL: dvb://1 \n")));
}

// ---- The event itself

TEST_F(StreamEventTest, AnEventIsDispatchedAtTheElementWithItsTexts) {
    const EmbeddedObject vb = ready();
    vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
    log.clear();
    onPlatformThread([&] {
        char name[] = "goal";
        char data[] = "4142xx"; // the length says how much of it counts
        char status[] = "trigger";
        EXPECT_EQ(callbacks.streamEvent(7, nullptr, nullptr, bytes(name), bytes(data), 4, bytes(status)), 0);
        // The texts are the platform's and go with the callback.
        std::fill(std::begin(name), std::end(name), 'x');
        std::fill(std::begin(data), std::end(data), 'x');
        std::fill(std::begin(status), std::end(status), 'x');
    });
    EXPECT_THAT(log.everything(), IsEmpty());
    browser.pump();
    EXPECT_EQ(browser.lastScript(), streamEventScript("goal", "4142", "trigger", "tv"));
    ASSERT_EQ(browser.events().size(), 1U);
    const DomEvent event = browser.events().front();
    EXPECT_EQ(event.type, "StreamEvent");
    EXPECT_EQ(event.elementId, "tv");
    EXPECT_FALSE(event.bubbles);
    EXPECT_FALSE(event.cancelable);
    EXPECT_EQ(event.fields, (std::map<std::string, std::string>{
                                {"name", "goal"}, {"data", "4142"}, {"text", "AB"}, {"status", "trigger"}}));
}

TEST_F(StreamEventTest, AnEventWithoutDataHasAnEmptyText) {
    const EmbeddedObject vb = ready();
    vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
    onPlatformThread([&] {
        EXPECT_EQ(callbacks.streamEvent(7, bytes("a"), bytes("b"), bytes("goal"), nullptr, 0, bytes("error")),
                  0);
    });
    browser.pump();
    ASSERT_EQ(browser.events().size(), 1U);
    EXPECT_EQ(browser.events().front().fields,
              (std::map<std::string, std::string>{{"name", "goal"}, {"data", ""}, {"status", "error"}}));
}

TEST_F(StreamEventTest, DataEndAtTheirFirstZeroByte) {
    const EmbeddedObject vb = ready();
    onPlatformThread([&] {
        streamEventHandler(7, nullptr, nullptr, bytes("goal"),
                           bytes("41\0"
                                 "42"),
                           5, bytes("trigger"));
    });
    browser.pump();
    EXPECT_EQ(browser.events().front().fields.at("data"), "41");
}

TEST_F(StreamEventTest, WithoutMemoryForItsRecordAnEventIsLost) {
    const EmbeddedObject vb = ready();
    onPlatformThread([&] {
        const MemoryShortage shortage;
        EXPECT_EQ(streamEventHandler(7, nullptr, nullptr, bytes("goal"), bytes("41"), 2, bytes("trigger")),
                  0);
    });
    EXPECT_FALSE(g_main_context_pending(nullptr));
    blocksLeftBehind(1); // the record
}

TEST_F(StreamEventTest, ATextThatFindsNoMemoryIsEmptyWithThoseAfterIt) {
    const EmbeddedObject vb = ready();
    for (unsigned texts = 0; texts < 3; ++texts) {
        onPlatformThread([&] {
            const MemoryShortage shortage(1, 1 + texts); // the payload, then name, data and status
            streamEventHandler(7, nullptr, nullptr, bytes("goal"), bytes("99"), 2, bytes("trigger"));
        });
        browser.pump();
        EXPECT_EQ(browser.lastScript(),
                  streamEventScript(texts > 0 ? "goal" : "", texts > 1 ? "99" : "", "", "tv"));
    }
}

TEST_F(StreamEventTest, AnEventOfASubscriptionThatHasJustGoneIsDispatchedAllTheSame) {
    const EmbeddedObject vb = ready();
    vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
    vb.call("removeStreamEventListener", "dvb://1", "goal", browser.function("listener"));
    onPlatformThread(
        [&] { callbacks.streamEvent(7, nullptr, nullptr, bytes("goal"), nullptr, 0, bytes("x")); });
    browser.pump();
    EXPECT_THAT(browser.eventTypes(), ElementsAre("StreamEvent"));
}

TEST_F(StreamEventTest, AnEventForAnUnknownHandleIsNotQueued) {
    const EmbeddedObject vb = ready();
    vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
    onPlatformThread([&] {
        EXPECT_EQ(callbacks.streamEvent(99, nullptr, nullptr, bytes("goal"), nullptr, 0, bytes("x")), 0);
    });
    EXPECT_FALSE(g_main_context_pending(nullptr));
}

TEST_F(StreamEventTest, AnEventWithoutItsTextsStopsTheProcess) {
    const EmbeddedObject vb = ready();
    vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
    EXPECT_DEATH(callbacks.streamEvent(7, nullptr, nullptr, nullptr, nullptr, 0, bytes("x")), "szEventName");
    EXPECT_DEATH(callbacks.streamEvent(7, nullptr, nullptr, bytes("x"), nullptr, 0, nullptr),
                 "szEventStatus");
    EXPECT_DEATH(callbacks.streamEvent(7, nullptr, nullptr, bytes("x"), nullptr, 1, bytes("x")),
                 "szEventData");
    EXPECT_DEATH(callbacks.streamEvent(99, nullptr, nullptr, nullptr, nullptr, 0, bytes("x")), "szEventName");
}

TEST_F(StreamEventTest, TheDeliveryIsLogged) {
    const auto deliver = [&] {
        const EmbeddedObject vb = ready();
        vb.call("addStreamEventListener", "dvb://1", "goal", "5", "31");
        callbacks.streamEvent(7, nullptr, nullptr, bytes("goal"), bytes("41"), 2, bytes("trigger"));
        browser.pump();
    };
    const auto line = [](const std::string& statement) {
        return logLine("VIDEOBCAST", "handleVideoBroadcastEvent", statement);
    };
    const std::string text = logOf(6, deliver);
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "streamEventHandler", " VB Inst:( 0x")));
    EXPECT_THAT(text, HasSubstr(line("VBEvent_StreamEvent: Case. \n") +
                                line("Event Name:-- goal --, Data:-- 41 --, Status:-- trigger --\n") +
                                line("StreamEvent success.\n")));
    browser.whenEvaluatingTextFrom("var objElement").throws();
    EXPECT_THAT(logOf(6, deliver), HasSubstr(line("StreamEvent failed.\n")));
}

} // namespace
