// The script interface: every name, what it reads, takes and refuses, and the components.
#include "tests/unit/avcontrol/AVControlTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace avcontrol {
namespace {

const char* const kMethods[] = {"play",
                                "stop",
                                "next",
                                "previous",
                                "seek",
                                "getComponents",
                                "getCurrentActiveComponents",
                                "selectComponent",
                                "unselectComponent",
                                "setVolume",
                                "setFullScreen",
                                "queue"};
const char* const kListeners[] = {"onPlayStateChange", "onFullScreenChange", "onPlaySpeedChanged",
                                  "onPlayPositionChanged", "onDRMRightsError"};

class AVControlScript : public AVControlTest {
protected:
    EmbeddedObject object = video();
};

TEST_F(AVControlScript, HasTwelveMethodsAndTwentyProperties) {
    for (const char* method : kMethods) {
        EXPECT_TRUE(object.hasMethod(method)) << method;
        EXPECT_FALSE(object.hasProperty(method)) << method;
        EXPECT_FALSE(object.get(method).succeeded) << method;
    }
    const char* const properties[] = {"data",
                                      "playPosition",
                                      "persist",
                                      "playTime",
                                      "playState",
                                      "error",
                                      "speed",
                                      "fullScreen",
                                      "nrTracks",
                                      "currentTrackIndex",
                                      "onPlayStateChange",
                                      "COMPONENT_TYPE_VIDEO",
                                      "COMPONENT_TYPE_AUDIO",
                                      "COMPONENT_TYPE_SUBTITLE",
                                      "width",
                                      "height",
                                      "onFullScreenChange",
                                      "onPlaySpeedChanged",
                                      "onPlayPositionChanged",
                                      "onDRMRightsError"};
    for (const char* property : properties) {
        EXPECT_TRUE(object.hasProperty(property)) << property;
        EXPECT_FALSE(object.hasMethod(property)) << property;
        EXPECT_TRUE(object.get(property)) << property;
        EXPECT_FALSE(object.scriptObject().call(property, 1).succeeded) << property;
    }
    for (const char* name : {"readyState", "Data", "0", "item", "length"}) {
        EXPECT_FALSE(object.hasProperty(name)) << name;
        EXPECT_FALSE(object.hasMethod(name)) << name;
        EXPECT_FALSE(object.get(name).succeeded) << name;
        EXPECT_FALSE(object.set(name, 1).succeeded) << name;
    }
    EXPECT_FALSE(object.scriptObject().callDefault().succeeded);
    EXPECT_FALSE(object.scriptObject().construct().succeeded);
    EXPECT_FALSE(object.scriptObject().remove("data"));
    EXPECT_FALSE(object.scriptObject().enumerate());
}

TEST_F(AVControlScript, NamesAreFetchedInOrder) {
    object.scriptObject();
    const BorderLog::Entries fetched = log.startingWith("NPN_GetStringIdentifier");
    std::vector<std::string> expected;
    for (const char* name : {"data",
                             "playPosition",
                             "playTime",
                             "playState",
                             "error",
                             "speed",
                             "fullScreen",
                             "onPlayStateChange",
                             "nrTracks",
                             "currentTrackIndex",
                             "persist",
                             "width",
                             "height",
                             "onFullScreenChange",
                             "onPlaySpeedChanged",
                             "onPlayPositionChanged",
                             "play",
                             "seek",
                             "stop",
                             "next",
                             "previous",
                             "getComponents",
                             "getCurrentActiveComponents",
                             "selectComponent",
                             "unselectComponent",
                             "setVolume",
                             "setFullScreen",
                             "COMPONENT_TYPE_VIDEO",
                             "COMPONENT_TYPE_AUDIO",
                             "COMPONENT_TYPE_SUBTITLE",
                             "queue",
                             "onDRMRightsError"}) {
        expected.push_back("NPN_GetStringIdentifier \"" + std::string(name) + "\"");
    }
    EXPECT_EQ(fetched, expected);
}

TEST_F(AVControlScript, ReadsHaveTheirTypes) {
    EXPECT_EQ(object.get("data"), kClip);
    EXPECT_TRUE(object.get("data").inBrowserMemory);
    EXPECT_EQ(object.get("playPosition"), 0.0);
    EXPECT_EQ(object.get("persist"), false);
    EXPECT_EQ(object.get("playTime"), 0.0);
    EXPECT_EQ(object.get("playState"), 0);
    EXPECT_EQ(object.get("error"), undefined);
    EXPECT_EQ(object.get("speed"), 1.0);
    EXPECT_EQ(object.get("fullScreen"), false);
    EXPECT_EQ(object.get("nrTracks"), 0);
    EXPECT_EQ(object.get("currentTrackIndex"), 0);
    EXPECT_EQ(object.get("COMPONENT_TYPE_VIDEO"), 0);
    EXPECT_EQ(object.get("COMPONENT_TYPE_AUDIO"), 1);
    EXPECT_EQ(object.get("COMPONENT_TYPE_SUBTITLE"), 2);
    EXPECT_EQ(object.get("width"), 0);
    EXPECT_EQ(object.get("height"), 0);
    for (const char* listener : kListeners) {
        EXPECT_EQ(object.get(listener), nullptr) << listener;
    }
}

TEST_F(AVControlScript, DataWithoutMemoryReadsAsUndefined) {
    browser.refuse("NPN_MemAlloc");
    EXPECT_EQ(object.get("data"), undefined);
}

TEST_F(AVControlScript, AnErrorReadsAsANumberAndStaysThroughANewPlay) {
    EXPECT_THAT(logOf(5, [&] { object.get("error"); }),
                HasSubstr(logLine("AVCONTROL", "GetProperty", "Setting Error property to Undefined")));
    object.call("play", 1);
    send(TELIX_AV_CB_MSG_ERR_CODEC_NOT_SUPPORTED);
    EXPECT_EQ(object.get("error"), 0);
    object.call("play", 1);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(object.get("error"), 0);
}

TEST_F(AVControlScript, WidthAndHeightAreStoredUntilThePlaceIsRead) {
    EXPECT_TRUE(object.set("width", 640));
    EXPECT_TRUE(object.set("height", 360.9));
    EXPECT_EQ(object.get("width"), 640);
    EXPECT_EQ(object.get("height"), 360);
    EXPECT_TRUE(object.set("width", -5.5));
    EXPECT_EQ(object.get("width"), -5);
    object.setRectangle(0, 0, 100, 50);
    object.setWindow(0, 0, 0, 0);
    EXPECT_EQ(object.get("width"), 100);
    EXPECT_EQ(object.get("height"), 50);
}

TEST_F(AVControlScript, PersistIsStored) {
    EXPECT_TRUE(object.set("persist", true));
    EXPECT_EQ(object.get("persist"), true);
    EXPECT_TRUE(object.set("persist", false));
    EXPECT_EQ(object.get("persist"), false);
}

TEST_F(AVControlScript, WritesOfAnotherTypeAreRefused) {
    const Value someObject(browser.scriptObject("thing"));
    const std::map<std::string, Values> wrong = {
        {"data", {undefined, nullptr, true, 1, 1.5, someObject}},
        {"persist", {undefined, nullptr, 1, 1.5, "true", someObject}},
        {"currentTrackIndex", {undefined, nullptr, true, "1", someObject}},
        {"width", {undefined, nullptr, true, "1", someObject}},
        {"height", {undefined, nullptr, true, "1", someObject}},
    };
    for (const auto& [property, values] : wrong) {
        for (const Value& value : values) {
            EXPECT_FALSE(object.set(property, value).succeeded) << property << " = " << value;
        }
    }
    EXPECT_EQ(object.get("data"), kClip);
    EXPECT_THAT(playerCalls(), IsEmpty());
}

TEST_F(AVControlScript, WritesOfReadOnlyPropertiesAreRefused) {
    for (const char* property :
         {"playPosition", "playTime", "playState", "error", "speed", "fullScreen", "nrTracks",
          "COMPONENT_TYPE_VIDEO", "COMPONENT_TYPE_AUDIO", "COMPONENT_TYPE_SUBTITLE", "play"}) {
        for (const Value& value : {Value(1), Value(true), Value("text"), Value(nullptr)}) {
            EXPECT_FALSE(object.set(property, value).succeeded) << property;
        }
    }
}

TEST_F(AVControlScript, AListenerIsKeptHandedOutReplacedAndCleared) {
    for (const std::string name : kListeners) {
        const ScriptFunction first = browser.function(name + "1");
        const ScriptFunction second = browser.function(name + "2");
        EXPECT_TRUE(object.set(name, first));
        EXPECT_EQ(first.pluginReferences(), 1) << name;
        EXPECT_EQ(object.get(name), Value(first)) << name;
        EXPECT_EQ(first.pluginReferences(), 1) << name;
        for (const Value& ignored : {Value(1), Value("text"), Value(undefined), Value(true)}) {
            EXPECT_TRUE(object.set(name, ignored)) << name;
            EXPECT_EQ(object.get(name), Value(first)) << name;
        }
        EXPECT_TRUE(object.set(name, second));
        EXPECT_EQ(first.pluginReferences(), 0) << name;
        EXPECT_EQ(second.pluginReferences(), 1) << name;
        EXPECT_TRUE(object.set(name, nullptr));
        if (name == "onFullScreenChange") {
            EXPECT_EQ(object.get(name), Value(second));
            leftBehind(second);
        } else {
            EXPECT_EQ(object.get(name), nullptr) << name;
            EXPECT_EQ(second.pluginReferences(), 0) << name;
        }
    }
}

TEST_F(AVControlScript, NullForTheFullScreenListenerDropsThePlayStateListener) {
    const ScriptFunction fullScreen = browser.function("fullScreen");
    const ScriptFunction playState = browser.function("playState");
    leftBehind(fullScreen);
    object.set("onFullScreenChange", fullScreen);
    object.set("onPlayStateChange", playState);
    EXPECT_TRUE(object.set("onFullScreenChange", nullptr));
    EXPECT_EQ(object.get("onFullScreenChange"), Value(fullScreen));
    EXPECT_EQ(object.get("onPlayStateChange"), nullptr);
    EXPECT_EQ(playState.pluginReferences(), 0);
}

TEST_F(AVControlScript, MethodsGiveTheirResults) {
    EXPECT_EQ(object.call("play", 1.0), true);
    EXPECT_EQ(object.call("stop"), undefined);
    EXPECT_EQ(object.call("next"), undefined);
    EXPECT_EQ(object.call("previous"), undefined);
    EXPECT_EQ(object.call("seek", 5), true);
    EXPECT_EQ(object.call("setVolume", 5), true);
    EXPECT_EQ(object.call("setFullScreen", false), undefined);
    EXPECT_EQ(object.call("queue", kClip), true);
}

TEST_F(AVControlScript, ArgumentsOfAnotherTypeAreRefused) {
    const Value someObject(browser.scriptObject("thing"));
    const std::map<std::string, Values> wrong = {
        {"play", {undefined, nullptr, true, "1", someObject}},
        {"seek", {undefined, nullptr, true, "1", someObject}},
        {"getComponents", {undefined, nullptr, true, "1", someObject}},
        {"getCurrentActiveComponents", {undefined, nullptr, true, "1", someObject}},
        {"setVolume", {undefined, nullptr, true, "1", someObject}},
        {"selectComponent", {undefined, nullptr, true, 1, 1.5, "1"}},
        {"unselectComponent", {undefined, nullptr, true, 1, 1.5, "1"}},
        {"setFullScreen", {undefined, nullptr, 1, 1.5, "true", someObject}},
    };
    for (const auto& [method, values] : wrong) {
        for (const Value& value : values) {
            const Outcome outcome = object.call(method, value);
            EXPECT_TRUE(outcome.exists);
            EXPECT_FALSE(outcome.succeeded) << method << "(" << value << ")";
        }
    }
    EXPECT_THAT(playerCalls(), IsEmpty());
}

TEST_F(AVControlScript, TheArgumentCountIsNotLookedAt) {
    // The browser's array reads as undefined after its last argument.
    EXPECT_FALSE(object.call("play").succeeded);
    EXPECT_EQ(object.call("play", 1, "more", nullptr), true);
    EXPECT_EQ(object.call("stop", 1, 2, 3), undefined);
}

TEST_F(AVControlScript, AQueueOfAnythingElseIsFalseWithoutACall) {
    for (const Value& value : {Value(undefined), Value(1), Value(1.5), Value(true)}) {
        EXPECT_EQ(object.call("queue", value), false) << value;
    }
    EXPECT_EQ(object.call("queue", browser.scriptObject("thing")), false);
    EXPECT_THAT(playerCalls(), IsEmpty());
}

// Components

class AVControlComponents : public AVControlScript {
protected:
    AVControlComponents() {
        const auto answer = [this](TELIX_JS_AV_HANDLE, TELIX_JS_AVCOMPTYPE, TELIX_JS_AVCOMPHANDLE** out,
                                   uint32_t* count) {
            *out = handles.data();
            *count = static_cast<uint32_t>(handles.size());
            return 0;
        };
        platform.TELIX_JS_AV_GetComponents = answer;
        platform.TELIX_JS_AV_GetCurrActiveComponents = answer;
    }

    std::vector<TELIX_JS_AVCOMPHANDLE> handles{11, 12};
};

TEST_F(AVControlComponents, AreBuiltOnceForEachType) {
    leftBehind("JSAVcomponent", 6); // the lists leave a reference to each
    for (const int type : {0, 1, 2}) {
        const ObjectRef list = object.call("getComponents", type).object();
        EXPECT_EQ(object.call("getComponents", type).object(), list) << type;
        EXPECT_EQ(list.pluginReferences(), 1) << type;
        EXPECT_EQ(list.get("length"), 2);
        EXPECT_EQ(list.call("item", 1).object().get("type"), type);
    }
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_GetComponents(7, 0, out, out)",
                                           "TELIX_JS_AV_GetComponents(7, 1, out, out)",
                                           "TELIX_JS_AV_GetComponents(7, 2, out, out)"));
}

TEST_F(AVControlComponents, StayThoseOfTheMediaBefore) {
    leftBehind("JSAVcomponent", 2);
    object.call("getComponents", 0);
    handles = {21, 22, 23};
    object.set("data", "http://media.example/other.mp4");
    EXPECT_EQ(object.call("getComponents", 0).object().get("length"), 2);
}

TEST_F(AVControlComponents, OfAnotherTypeAreNull) {
    for (const Value& type : {Value(7), Value(3), Value(-1), Value(1e9)}) {
        EXPECT_EQ(object.call("getComponents", type), nullptr) << type;
    }
    EXPECT_THAT(playerCalls(), IsEmpty());
}

TEST_F(AVControlComponents, ThatFailAreAskedAgain) {
    leftBehind("JSAVcomponent", 2);
    platform.TELIX_JS_AV_GetComponents = nullptr;
    platform.defaultResult = 1;
    EXPECT_EQ(object.call("getComponents", 1), nullptr);
    platform.defaultResult = 0;
    platform.TELIX_JS_AV_GetComponents = [this](TELIX_JS_AV_HANDLE, TELIX_JS_AVCOMPTYPE,
                                                TELIX_JS_AVCOMPHANDLE** out, uint32_t* count) {
        *out = handles.data();
        *count = 2;
        return 0;
    };
    browser.refuse("NPN_CreateObject", 1);
    EXPECT_EQ(object.call("getComponents", 1), nullptr);
    EXPECT_TRUE(object.call("getComponents", 1).value.isObject());
}

TEST_F(AVControlComponents, InUseAreANewListEachTimeThatStaysForGood) {
    const ObjectRef first = object.call("getCurrentActiveComponents", 1).object();
    const ObjectRef second = object.call("getCurrentActiveComponents", 1.9).object();
    EXPECT_NE(first, second);
    EXPECT_EQ(first.pluginReferences(), 1);
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_GetCurrActiveComponents(7, 1, out, out)",
                                           "TELIX_JS_AV_GetCurrActiveComponents(7, 1, out, out)"));
    leftBehind(first);
    leftBehind(second);
    leftBehind("JSAVcomponent", 8); // two for each, as their lists live on
}

TEST_F(AVControlComponents, InUseOfAnyTypeAreAskedOfThePlatform) {
    platform.TELIX_JS_AV_GetCurrActiveComponents = [](TELIX_JS_AV_HANDLE, TELIX_JS_AVCOMPTYPE,
                                                      TELIX_JS_AVCOMPHANDLE**, uint32_t*) { return 1; };
    EXPECT_EQ(object.call("getCurrentActiveComponents", 7), nullptr);
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_GetCurrActiveComponents(7, 7, out, out)"));
}

TEST_F(AVControlComponents, AreSelectedByHandleAndType) {
    leftBehind("JSAVcomponent", 2);
    const ObjectRef component = object.call("getComponents", 2).object().call("item", 1).object();
    log.clear();
    EXPECT_EQ(object.call("selectComponent", component), undefined);
    EXPECT_EQ(object.call("unselectComponent", component), undefined);
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_SelectComponent(7, 12, 2)",
                                           "TELIX_JS_AV_UnselectComponent(7, 12, 2)"));
}

TEST_F(AVControlComponents, AreToldFromObjectsOfOtherClasses) {
    leftBehind("JSAVcomponent", 2);
    const ObjectRef list = object.call("getComponents", 2).object();
    log.clear();
    for (const ObjectRef& other : {ObjectRef(browser.scriptObject("plain")), list, object.scriptObject()}) {
        EXPECT_FALSE(object.call("selectComponent", other).succeeded) << other;
        EXPECT_FALSE(object.call("unselectComponent", other).succeeded) << other;
    }
    EXPECT_THAT(playerCalls(), IsEmpty());
}

TEST_F(AVControlComponents, AskTheAVFamilyForTheirProperties) {
    leftBehind("JSAVcomponent", 2);
    const ObjectRef component = object.call("getComponents", 1).object().call("item", 0).object();
    component.get("audioChannels");
    EXPECT_EQ(log.count("TELIX_JS_AV_AVComponent_GetAudioChannels(11, 1, out)"), 1u);
}

TEST_F(AVControlComponents, WithoutAPlayerAreNotSelected) {
    leftBehind("JSAVcomponent", 2);
    const ObjectRef component = object.call("getComponents", 2).object().call("item", 1).object();
    const EmbeddedObject without = browser.embed("video/mp4", {}, NP_FULL);
    log.clear();
    without.call("selectComponent", component);
    without.call("unselectComponent", component);
    EXPECT_THAT(playerCalls(), IsEmpty());
}

TEST_F(AVControlComponents, AreToldInTheLog) {
    const std::string printed = logOf(5, [&] { object.call("getComponents", 1); });
    EXPECT_THAT(printed, HasSubstr("Comp Type: 1 \n"));
    EXPECT_THAT(printed, HasSubstr("count::2"));
}

} // namespace
} // namespace avcontrol
