// The script interface of the video/broadcast object: which names there are, and which arguments each takes.
#include <limits>

#include <gmock/gmock.h>

#include "tests/unit/videobroadcast/BroadcastTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

namespace {

const std::vector<std::string> properties = {"width",
                                             "height",
                                             "fullScreen",
                                             "playState",
                                             "onFullScreenChange",
                                             "onChannelChangeSucceeded",
                                             "onChannelChangeError",
                                             "onPlayStateChange",
                                             "onProgrammesChanged",
                                             "onParentalRatingChange",
                                             "onParentalRatingError",
                                             "programmes",
                                             "currentChannel"};
const std::vector<std::string> constants = {"COMPONENT_TYPE_VIDEO", "COMPONENT_TYPE_AUDIO",
                                            "COMPONENT_TYPE_SUBTITLE"};
const std::vector<std::string> methods = {"getChannelConfig",
                                          "setChannelByTriplet",
                                          "bindToCurrentChannel",
                                          "setChannel",
                                          "prevChannel",
                                          "nextChannel",
                                          "setFullScreen",
                                          "release",
                                          "addCarouselListener",
                                          "addStreamEventListener",
                                          "removeStreamEventListener",
                                          "selectComponent",
                                          "unselectComponent",
                                          "createChannelObject",
                                          "getComponents",
                                          "getCurrentActiveComponents",
                                          "stop"};
const std::vector<std::string> handlers = {
    "onFullScreenChange",  "onChannelChangeSucceeded", "onChannelChangeError", "onPlayStateChange",
    "onProgrammesChanged", "onParentalRatingChange",   "onParentalRatingError"};

class JSVideoBroadcastTest : public BroadcastTest {
protected:
    // A new object, with a clean log behind it.
    EmbeddedObject ready() {
        const EmbeddedObject vb = embed();
        vb.scriptObject();
        log.clear();
        return vb;
    }

    // A channel of the page's, made by the platform for the handle.
    ObjectRef channel(const EmbeddedObject& vb, TELIX_JS_CM_HANDLE handle) {
        platform.TELIX_JS_VB_CreateChannelObjectByTriplet =
            [handle](TELIX_JS_VB_HANDLE, ___UINT8, uint32_t, uint32_t, uint32_t, TELIX_JS_CM_HANDLE* out) {
                *out = handle;
                return 0;
            };
        const ObjectRef made = vb.call("createChannelObject", 0, 1, 2).object();
        log.clear();
        return made;
    }

    // A component of the page's with the handle and type.
    ObjectRef component(const EmbeddedObject& vb, TELIX_JS_AVCOMPHANDLE handle, int type) {
        static TELIX_JS_AVCOMPHANDLE handles[1];
        handles[0] = handle;
        platform.TELIX_JS_VB_GetComponents = [](TELIX_JS_VB_HANDLE, TELIX_JS_AVCOMPTYPE,
                                                TELIX_JS_AVCOMPHANDLE** components, uint32_t* count) {
            *components = handles;
            *count = 1;
            return 0;
        };
        leftBehind("JSAVcomponent"); // its second reference, from the list's filling
        const ObjectRef made = vb.call("getComponents", type).object().call("item", 0).object();
        log.clear();
        return made;
    }
};

TEST_F(JSVideoBroadcastTest, TheIdentifiersAreFetchedOnceInOrder) {
    const EmbeddedObject vb = embed();
    log.clear();
    vb.scriptObject();
    BorderLog::Entries expected;
    for (const char* name : {"width",
                             "height",
                             "fullScreen",
                             "playState",
                             "onFullScreenChange",
                             "onChannelChangeSucceeded",
                             "onChannelChangeError",
                             "onPlayStateChange",
                             "onProgrammesChanged",
                             "onParentalRatingChange",
                             "onParentalRatingError",
                             "programmes",
                             "currentChannel",
                             "getChannelConfig",
                             "setChannelByTriplet",
                             "bindToCurrentChannel",
                             "setChannel",
                             "prevChannel",
                             "nextChannel",
                             "setFullScreen",
                             "release",
                             "addCarouselListener",
                             "addStreamEventListener",
                             "removeStreamEventListener",
                             "selectComponent",
                             "unselectComponent",
                             "createChannelObject",
                             "COMPONENT_TYPE_VIDEO",
                             "COMPONENT_TYPE_AUDIO",
                             "COMPONENT_TYPE_SUBTITLE",
                             "getComponents",
                             "getCurrentActiveComponents",
                             "stop"}) {
        expected.push_back("NPN_GetStringIdentifier \"" + std::string(name) + "\"");
    }
    EXPECT_EQ(log.startingWith("NPN_GetStringIdentifier"), expected);
    log.clear();
    vb.call("stop");
    EXPECT_EQ(log.count("NPN_GetStringIdentifier"), 0U);
}

TEST_F(JSVideoBroadcastTest, EachNameIsAPropertyOrAMethod) {
    const EmbeddedObject vb = ready();
    for (const std::string& name : properties) {
        EXPECT_TRUE(vb.hasProperty(name)) << name;
        EXPECT_FALSE(vb.hasMethod(name)) << name;
    }
    for (const std::string& name : constants) {
        EXPECT_TRUE(vb.hasProperty(name)) << name;
        EXPECT_FALSE(vb.hasMethod(name)) << name;
    }
    for (const std::string& name : methods) {
        EXPECT_TRUE(vb.hasMethod(name)) << name;
        EXPECT_FALSE(vb.hasProperty(name)) << name;
    }
}

TEST_F(JSVideoBroadcastTest, OtherNamesAreRefused) {
    const EmbeddedObject vb = ready();
    for (const char* name : {"Width", "onChannelChangeSucceded", "data", "0"}) {
        EXPECT_FALSE(vb.hasProperty(name)) << name;
        EXPECT_FALSE(vb.hasMethod(name)) << name;
        EXPECT_FALSE(vb.get(name).succeeded) << name;
        EXPECT_TRUE(vb.get(name).value.isUndefined()) << name;
        EXPECT_FALSE(vb.set(name, 1).succeeded) << name;
        EXPECT_FALSE(vb.call(name).succeeded) << name;
    }
    EXPECT_FALSE(vb.call("width").succeeded);
    EXPECT_FALSE(vb.get("stop").succeeded);
    EXPECT_FALSE(vb.set("stop", 1).succeeded);
    EXPECT_FALSE(vb.scriptObject().callDefault().succeeded);
    EXPECT_FALSE(vb.scriptObject().construct().succeeded);
    EXPECT_FALSE(vb.scriptObject().remove("width"));
    EXPECT_FALSE(vb.scriptObject().enumerate());
}

TEST_F(JSVideoBroadcastTest, ConstantsAreTheTypesOfComponents) {
    const EmbeddedObject vb = ready();
    EXPECT_EQ(vb.get("COMPONENT_TYPE_VIDEO"), 0);
    EXPECT_EQ(vb.get("COMPONENT_TYPE_AUDIO"), 1);
    EXPECT_EQ(vb.get("COMPONENT_TYPE_SUBTITLE"), 2);
    for (const std::string& name : constants) {
        EXPECT_FALSE(vb.set(name, 5).succeeded) << name;
    }
}

TEST_F(JSVideoBroadcastTest, NumbersAreWrittenTruncatedAndOtherTypesRefused) {
    const EmbeddedObject vb = ready();
    EXPECT_TRUE(vb.set("width", 640.9));
    EXPECT_TRUE(vb.set("height", -1.9));
    EXPECT_TRUE(vb.set("playState", 2.9));
    for (const char* name : {"width", "height", "playState"}) {
        for (const Value& value : {Value(true), Value("1"), Value(nullptr), Value(undefined),
                                   Value(browser.scriptObject("object"))}) {
            EXPECT_FALSE(vb.set(name, value).succeeded) << name << " = " << value;
        }
    }
    browser.pump();
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_SetPlayBackState(7, 2)",
                                             "TELIX_JS_VB_SetWidth(7, 640)", "TELIX_JS_VB_SetHeight(7, -1)"));
}

TEST_F(JSVideoBroadcastTest, NumbersBeyondTheIntegersSaturate) {
    const EmbeddedObject vb = ready();
    vb.set("width", 1e12);
    vb.set("height", -1e12);
    vb.set("playState", std::numeric_limits<double>::quiet_NaN());
    browser.pump();
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_SetWidth(7, 2147483647)", "TELIX_JS_VB_SetHeight(7, -2147483648)"));
}

TEST_F(JSVideoBroadcastTest, NumbersAreReadAsIntegers) {
    const EmbeddedObject vb = ready();
    vb.set("width", 640);
    vb.set("height", 480);
    vb.set("playState", 2);
    platform.TELIX_JS_VB_GetPlayBackState = [](TELIX_JS_VB_HANDLE, TELIX_PLAYSTATE_ENUM_T*) { return 1; };
    browser.pump();
    EXPECT_EQ(vb.get("width"), 640);
    EXPECT_EQ(vb.get("height"), 480);
    EXPECT_EQ(vb.get("playState"), 2);
}

TEST_F(JSVideoBroadcastTest, ReadOnlyPropertiesRefuseEveryWrite) {
    const EmbeddedObject vb = ready();
    for (const char* name : {"fullScreen", "currentChannel", "programmes"}) {
        for (const Value& value :
             {Value(true), Value(1), Value(nullptr), Value(browser.scriptObject("object"))}) {
            EXPECT_FALSE(vb.set(name, value).succeeded) << name << " = " << value;
        }
    }
    EXPECT_THAT(platformCalls(), IsEmpty());
}

TEST_F(JSVideoBroadcastTest, ObjectsThatAreNotThereReadAsNull) {
    const EmbeddedObject vb = ready();
    platform.defaultResult = 1;
    EXPECT_EQ(vb.get("currentChannel"), nullptr);
    EXPECT_EQ(vb.get("programmes"), nullptr);
    for (const std::string& name : handlers) {
        EXPECT_EQ(vb.get(name), nullptr) << name;
    }
}

// ---- Handlers

TEST_F(JSVideoBroadcastTest, EachHandlerIsStoredReplacedAndRead) {
    const EmbeddedObject vb = ready();
    for (const std::string& name : handlers) {
        const ScriptFunction first = browser.function("first");
        const ScriptFunction second = browser.function("second");
        EXPECT_TRUE(vb.set(name, first));
        EXPECT_EQ(vb.get(name).object(), first) << name;
        EXPECT_EQ(first.pluginReferences(), 1) << name;
        EXPECT_TRUE(vb.set(name, second));
        EXPECT_EQ(vb.get(name).object(), second) << name;
        EXPECT_EQ(first.pluginReferences(), 0) << name;
        EXPECT_EQ(second.pluginReferences(), 1) << name;
    }
    for (const std::string& name : handlers) {
        EXPECT_EQ(vb.get(name).object().name().substr(0, 6), "second") << name;
    }
}

TEST_F(JSVideoBroadcastTest, NullClearsAHandlerAndOtherTypesChangeNothing) {
    const EmbeddedObject vb = ready();
    for (const char* name : {"onFullScreenChange", "onChannelChangeSucceeded", "onChannelChangeError",
                             "onPlayStateChange", "onProgrammesChanged"}) {
        const ScriptFunction handler = browser.function("handler");
        vb.set(name, handler);
        for (const Value& value : {Value(5), Value(true), Value("text"), Value(undefined), Value(0.5)}) {
            EXPECT_TRUE(vb.set(name, value)) << name << " = " << value;
            EXPECT_EQ(vb.get(name).object(), handler) << name << " = " << value;
        }
        EXPECT_TRUE(vb.set(name, nullptr));
        EXPECT_EQ(vb.get(name), nullptr) << name;
        EXPECT_EQ(handler.pluginReferences(), 0) << name;
    }
}

TEST_F(JSVideoBroadcastTest, WhateverIsNoObjectClearsTheRatingChangeHandler) {
    const EmbeddedObject vb = ready();
    for (const Value& value : {Value(5), Value(true), Value("text"), Value(undefined), Value(nullptr)}) {
        const ScriptFunction handler = browser.function("handler");
        vb.set("onParentalRatingChange", handler);
        EXPECT_TRUE(vb.set("onParentalRatingChange", value)) << value;
        EXPECT_EQ(vb.get("onParentalRatingChange"), nullptr) << value;
        EXPECT_EQ(handler.pluginReferences(), 0) << value;
    }
}

TEST_F(JSVideoBroadcastTest, WhateverIsNoObjectWrittenAsRatingErrorHandlerClearsTheOtherOne) {
    const EmbeddedObject vb = ready();
    const ScriptFunction error = browser.function("error");
    vb.set("onParentalRatingError", error);
    for (const Value& value : {Value(nullptr), Value(5), Value(undefined)}) {
        vb.set("onParentalRatingChange", browser.function("change"));
        EXPECT_TRUE(vb.set("onParentalRatingError", value)) << value;
        EXPECT_EQ(vb.get("onParentalRatingChange"), nullptr) << value;
        EXPECT_EQ(vb.get("onParentalRatingError").object(), error) << value;
    }
}

// ---- Methods

TEST_F(JSVideoBroadcastTest, MethodsWithoutArgumentsTakeAny) {
    const EmbeddedObject vb = ready();
    EXPECT_TRUE(vb.call("bindToCurrentChannel", 1, "x").value.isUndefined());
    EXPECT_TRUE(vb.call("prevChannel", nullptr));
    EXPECT_TRUE(vb.call("nextChannel"));
    EXPECT_TRUE(vb.call("stop", 5));
    EXPECT_TRUE(vb.call("release", true));
    EXPECT_TRUE(vb.call("getChannelConfig", 5).value.isObject());
    leftBehind("JSChannel"); // the reference more of the first step to another channel
}

TEST_F(JSVideoBroadcastTest, ATripletIsThreeNumbersWithTheStreamPerhapsNull) {
    const EmbeddedObject vb = ready();
    EXPECT_TRUE(vb.call("setChannelByTriplet", 1, 2, 3).value.isUndefined());
    EXPECT_TRUE(vb.call("setChannelByTriplet", 1, nullptr, 3));
    EXPECT_TRUE(vb.call("setChannelByTriplet", 1.9, -2.9, 3.0));
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_SetChannelByTriplet(7, 1, 2, 3)",
                                             "TELIX_JS_VB_SetChannelByTriplet(7, 1, 8191, 3)",
                                             "TELIX_JS_VB_SetChannelByTriplet(7, 1, -2, 3)"));
}

TEST_F(JSVideoBroadcastTest, TwoNumbersLeaveTheStreamOut) {
    const EmbeddedObject vb = ready();
    EXPECT_TRUE(vb.call("setChannelByTriplet", 1, 3).value.isUndefined());
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_SetChannelByTriplet(7, 1, 8191, 3)"));
}

TEST_F(JSVideoBroadcastTest, OtherTripletsAreRefused) {
    const EmbeddedObject vb = ready();
    EXPECT_FALSE(vb.call("setChannelByTriplet").succeeded);
    EXPECT_FALSE(vb.call("setChannelByTriplet", 1).succeeded);
    EXPECT_FALSE(vb.call("setChannelByTriplet", 1, nullptr).succeeded);
    EXPECT_FALSE(vb.call("setChannelByTriplet", "1", 3).succeeded);
    EXPECT_FALSE(vb.call("setChannelByTriplet", 1, "2", 3).succeeded);
    EXPECT_FALSE(vb.call("setChannelByTriplet", nullptr, 2, 3).succeeded);
    EXPECT_FALSE(vb.call("setChannelByTriplet", 1, 2, true).succeeded);
    EXPECT_FALSE(vb.call("setChannelByTriplet", 1, undefined, 3).succeeded);
    EXPECT_FALSE(vb.call("setChannelByTriplet", 1, 2, 3, 4).succeeded);
    EXPECT_THAT(platformCalls(), IsEmpty());
}

TEST_F(JSVideoBroadcastTest, TheFormsOfATripletAreLogged) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject vb = embed();
        vb.call("setChannelByTriplet", 1, 2, 3);
        vb.call("setChannelByTriplet", 1, 3);
    });
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "Invoke",
                                        "mId_setChannelByTriplet is called with 3 arguments\n")));
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "Invoke",
                                        "mId_setChannelByTriplet is called with 2 arguments\n")));
}

TEST_F(JSVideoBroadcastTest, AChannelIsSetWithAFlagThatIsFalseUnlessItIsABoolean) {
    const EmbeddedObject vb = ready();
    const ObjectRef channel = this->channel(vb, 77);
    EXPECT_TRUE(vb.call("setChannel", channel).value.isUndefined());
    EXPECT_TRUE(vb.call("setChannel", channel, true));
    EXPECT_TRUE(vb.call("setChannel", channel, false));
    EXPECT_TRUE(vb.call("setChannel", channel, "text"));
    EXPECT_TRUE(vb.call("setChannel", channel, 1));
    EXPECT_TRUE(vb.call("setChannel", channel, true, 5));
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_SetChannel(7, 77, 0)", "TELIX_JS_VB_SetChannel(7, 77, 1)",
                            "TELIX_JS_VB_SetChannel(7, 77, 0)", "TELIX_JS_VB_SetChannel(7, 77, 0)",
                            "TELIX_JS_VB_SetChannel(7, 77, 0)", "TELIX_JS_VB_SetChannel(7, 77, 1)"));
    EXPECT_EQ(channel.pluginReferences(), 0);
}

TEST_F(JSVideoBroadcastTest, NoChannelIsSetWithNullAndOtherTypesAreRefused) {
    const EmbeddedObject vb = ready();
    EXPECT_TRUE(vb.call("setChannel", nullptr));
    EXPECT_TRUE(vb.call("setChannel", nullptr, true));
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_SetChannel(7, 0, 0)", "TELIX_JS_VB_SetChannel(7, 0, 1)"));
    EXPECT_FALSE(vb.call("setChannel", 5).succeeded);
    EXPECT_FALSE(vb.call("setChannel", undefined).succeeded);
    EXPECT_FALSE(vb.call("setChannel", "77").succeeded);
    EXPECT_FALSE(vb.call("setChannel").succeeded);
    EXPECT_EQ(platform.TELIX_JS_VB_SetChannel.count(), 2U);
}

TEST_F(JSVideoBroadcastTest, TheFlagIsLogged) {
    const std::string text = logOf(6, [&] { embed().call("setChannel", nullptr, true); });
    EXPECT_THAT(text,
                HasSubstr(logLine("VIDEOBCAST", "Invoke", "mId_setChannel is called With 2 Parameters\n")));
}

TEST_F(JSVideoBroadcastTest, OnlyABooleanSetsFullScreen) {
    const EmbeddedObject vb = ready();
    EXPECT_FALSE(vb.call("setFullScreen", 1).succeeded);
    EXPECT_FALSE(vb.call("setFullScreen", "true").succeeded);
    EXPECT_FALSE(vb.call("setFullScreen", nullptr).succeeded);
    EXPECT_FALSE(vb.call("setFullScreen").succeeded);
    EXPECT_FALSE(vb.set("fullScreen", true).succeeded);
    EXPECT_THAT(platformCalls(), IsEmpty());
    EXPECT_TRUE(vb.call("setFullScreen", true));
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_SetFullScreen(7, 1)"));
}

TEST_F(JSVideoBroadcastTest, ACarouselListenerIsRefusedWithWhateverArguments) {
    const EmbeddedObject vb = ready();
    EXPECT_FALSE(vb.call("addCarouselListener", "url", browser.function("listener"), "name").succeeded);
    EXPECT_FALSE(vb.call("addCarouselListener", "url", "name", browser.function("listener")).succeeded);
    EXPECT_FALSE(vb.call("addCarouselListener", "url", browser.function("listener")).succeeded);
    EXPECT_FALSE(vb.call("addCarouselListener").succeeded);
    EXPECT_THAT(log.calls(), IsEmpty());
}

TEST_F(JSVideoBroadcastTest, ACarouselListenerOfTheTypesAskedForIsLogged) {
    const std::string line = logLine("VIDEOBCAST", "Invoke", "mId_addCarouselListener is called \n");
    EXPECT_THAT(
        logOf(6, [&] { embed().call("addCarouselListener", "url", browser.function("listener"), "name"); }),
        HasSubstr(line));
    EXPECT_THAT(logOf(6, [&] { embed().call("addCarouselListener", "url", "name", "x"); }),
                ::testing::Not(HasSubstr(line)));
}

TEST_F(JSVideoBroadcastTest, AStreamEventListenerTakesThreeOrFourArguments) {
    const EmbeddedObject vb = ready();
    const ScriptFunction listener = browser.function("listener");
    vb.element().method("addEventListener", [](const Values&) { return Value(); });
    vb.element().method("removeEventListener", [](const Values&) { return Value(); });
    EXPECT_TRUE(vb.call("addStreamEventListener", "url", "name", listener).value.isUndefined());
    EXPECT_EQ(vb.element().calls("addEventListener").size(), 1U);
    EXPECT_EQ(platform.TELIX_JS_VB_RegisterStreamEvent.count(), 0U);
    EXPECT_TRUE(vb.call("addStreamEventListener", "url", "name", "5", "31").value.isUndefined());
    EXPECT_EQ(platform.TELIX_JS_VB_RegisterStreamEvent.count(), 1U);
    EXPECT_TRUE(vb.call("removeStreamEventListener", "url", "name", listener).value.isUndefined());
    EXPECT_EQ(platform.TELIX_JS_VB_UnRegisterStreamEvent.count(), 1U);
}

TEST_F(JSVideoBroadcastTest, OtherStreamEventListenersAreRefused) {
    const EmbeddedObject vb = ready();
    const ScriptFunction listener = browser.function("listener");
    for (const char* method : {"addStreamEventListener", "removeStreamEventListener"}) {
        EXPECT_FALSE(vb.call(method).succeeded) << method;
        EXPECT_FALSE(vb.call(method, "url", "name").succeeded) << method;
        EXPECT_FALSE(vb.call(method, "url", "name", nullptr).succeeded) << method;
        EXPECT_FALSE(vb.call(method, "url", 5, listener).succeeded) << method;
        EXPECT_FALSE(vb.call(method, nullptr, "name", listener).succeeded) << method;
        EXPECT_FALSE(vb.call(method, "url", "name", "5").succeeded) << method;
        EXPECT_FALSE(vb.call(method, "url", "name", nullptr, "31").succeeded) << method;
        EXPECT_FALSE(vb.call(method, "url", "name", "5", nullptr).succeeded) << method;
    }
    EXPECT_FALSE(vb.call("removeStreamEventListener", "url", "name", "5", "31").succeeded);
    EXPECT_THAT(log.calls(), IsEmpty());
}

TEST_F(JSVideoBroadcastTest, AComponentIsSelectedAsAnObject) {
    const EmbeddedObject vb = ready();
    const ObjectRef component = this->component(vb, 55, 1);
    EXPECT_TRUE(vb.call("selectComponent", component).value.isUndefined());
    EXPECT_TRUE(vb.call("unselectComponent", component).value.isUndefined());
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_SelectComponent(7, 55, 1)",
                                             "TELIX_JS_VB_UnselectComponent(7, 55, 1)"));
    for (const Value& value : {Value(nullptr), Value(undefined), Value(5), Value("x"), Value(true)}) {
        EXPECT_FALSE(vb.call("selectComponent", value).succeeded) << value;
    }
    EXPECT_FALSE(vb.call("selectComponent").succeeded);
    EXPECT_EQ(platform.TELIX_JS_VB_SelectComponent.count(), 1U);
}

TEST_F(JSVideoBroadcastTest, AnyArgumentWithAValueIsTakenAsUnselectedAndOnlyAnObjectReachesThePlatform) {
    const EmbeddedObject vb = ready();
    EXPECT_FALSE(vb.call("unselectComponent").succeeded);
    EXPECT_FALSE(vb.call("unselectComponent", nullptr).succeeded);
    EXPECT_FALSE(vb.call("unselectComponent", undefined).succeeded);
    EXPECT_FALSE(vb.call("unselectComponent", 0).succeeded);
    EXPECT_FALSE(vb.call("unselectComponent", false).succeeded);
    EXPECT_TRUE(vb.call("unselectComponent", 5));
    EXPECT_TRUE(vb.call("unselectComponent", "text"));
    EXPECT_TRUE(vb.call("unselectComponent", true));
    EXPECT_THAT(platformCalls(), IsEmpty());
}

TEST_F(JSVideoBroadcastTest, AnObjectOfAnotherClassIsRefusedWhereAChannelOrAComponentIsTaken) {
    const EmbeddedObject vb = ready();
    const ObjectRef component = this->component(vb, 55, 1);
    const ObjectRef channel = this->channel(vb, 3);
    const ScriptObject plain = browser.scriptObject("plain");
    const EmbeddedObject capabilities = browser.embed("application/oipfcapabilities");
    for (const ObjectRef& other :
         {ObjectRef(plain), component, vb.scriptObject(), capabilities.scriptObject()}) {
        EXPECT_FALSE(vb.call("setChannel", other).succeeded) << other;
        EXPECT_FALSE(vb.call("setChannel", other, true).succeeded) << other;
    }
    for (const ObjectRef& other :
         {ObjectRef(plain), channel, vb.scriptObject(), capabilities.scriptObject()}) {
        EXPECT_FALSE(vb.call("selectComponent", other).succeeded) << other;
        EXPECT_FALSE(vb.call("unselectComponent", other).succeeded) << other;
    }
    EXPECT_EQ(platform.TELIX_JS_VB_SetChannel.count(), 0U);
    EXPECT_EQ(platform.TELIX_JS_VB_SelectComponent.count(), 0U);
    EXPECT_EQ(platform.TELIX_JS_VB_UnselectComponent.count(), 0U);
    EXPECT_TRUE(vb.call("setChannel", channel));
    EXPECT_TRUE(vb.call("selectComponent", component));
}

TEST_F(JSVideoBroadcastTest, WhatIsNoObjectToUnselectIsLoggedAndNothingElse) {
    const std::string text = logOf(6, [&] { ready().call("unselectComponent", 5); });
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "unSelectComponent", "AVCompObj: 0x5 \n")));
    const std::string refused = logOf(6, [&] { ready().call("unselectComponent", 0); });
    EXPECT_THAT(refused, Not(HasSubstr("AVCompObj")));
}

TEST_F(JSVideoBroadcastTest, AnUnselectedObjectIsLoggedOnce) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject vb = ready();
        vb.call("unselectComponent", component(vb, 55, 1));
    });
    const std::string line = logLine("VIDEOBCAST", "unSelectComponent", "AVCompObj: 0x");
    EXPECT_THAT(text, HasSubstr(line));
    EXPECT_EQ(text.find(line), text.rfind(line));
}

TEST_F(JSVideoBroadcastTest, AChannelIsCreatedFromFourOrThreeNumbers) {
    const EmbeddedObject vb = ready();
    EXPECT_TRUE(vb.call("createChannelObject", 10, 1, 2, 3).value.isObject());
    EXPECT_TRUE(vb.call("createChannelObject", 0, 1, 2).value.isObject());
    EXPECT_TRUE(vb.call("createChannelObject", 257, 1.9, -5, 4e9).value.isObject());
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_CreateChannelObjectByTriplet(7, 10, 1, 2, 3, out)",
                            "TELIX_JS_VB_CreateChannelObjectByTriplet(7, 0, 1, 8191, 2, out)",
                            "TELIX_JS_VB_CreateChannelObjectByTriplet(7, 1, 1, 0, 4000000000, out)"));
}

TEST_F(JSVideoBroadcastTest, AChannelIsCreatedFromADescriptor) {
    const EmbeddedObject vb = ready();
    // Characters stand for bytes: U+00FF is one byte, U+1234 two.
    EXPECT_TRUE(vb.call("createChannelObject", 11, "a\xC3\xBF\xE1\x88\xB4", 3).value.isObject());
    EXPECT_TRUE(vb.call("createChannelObject", 11, "", 3, 5).value.isObject());
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_CreateChannelObjectByDsd(7, 11, <61ff1234>, 4, 3, out)",
                            "TELIX_JS_VB_CreateChannelObjectByDsd(7, 11, <>, 0, 3, out)"));
}

TEST_F(JSVideoBroadcastTest, ADescriptorThatIsNoUtf8GivesNull) {
    const EmbeddedObject vb = ready();
    EXPECT_EQ(vb.call("createChannelObject", 11, "\xFF", 3), nullptr);
    EXPECT_THAT(platformCalls(), IsEmpty());
}

TEST_F(JSVideoBroadcastTest, ARefusedChannelIsNull) {
    const EmbeddedObject vb = ready();
    platform.defaultResult = 1;
    EXPECT_EQ(vb.call("createChannelObject", 0, 1, 2, 3), nullptr);
    EXPECT_EQ(vb.call("createChannelObject", 0, 1, 2), nullptr);
    EXPECT_EQ(vb.call("createChannelObject", 0, "x", 2), nullptr);
}

TEST_F(JSVideoBroadcastTest, OtherArgumentsCreateNoChannel) {
    const EmbeddedObject vb = ready();
    EXPECT_FALSE(vb.call("createChannelObject", 0, 1, 2, 3, 4).succeeded);
    EXPECT_FALSE(vb.call("createChannelObject", 0, 1, 2, "3").succeeded);
    EXPECT_FALSE(vb.call("createChannelObject", 0, 1, 2, nullptr).succeeded);
    EXPECT_FALSE(vb.call("createChannelObject", 0, 1).succeeded);
    EXPECT_FALSE(vb.call("createChannelObject", 0, nullptr, 2).succeeded);
    EXPECT_FALSE(vb.call("createChannelObject", 0, 1, "2").succeeded);
    EXPECT_FALSE(vb.call("createChannelObject", 0, "1", "2").succeeded);
    EXPECT_FALSE(vb.call("createChannelObject", "0", "1", 2).succeeded);
    EXPECT_FALSE(vb.call("createChannelObject", "0", 1, 2, 3).succeeded);
    EXPECT_FALSE(vb.call("createChannelObject").succeeded);
    EXPECT_THAT(platformCalls(), IsEmpty());
}

TEST_F(JSVideoBroadcastTest, TheFormsOfCreatingAChannelAreLogged) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject vb = embed();
        vb.call("createChannelObject", 0, 1, 2, 3);
        vb.call("createChannelObject", 0, 1, 2);
        vb.call("createChannelObject", 0, "x", 2);
    });
    const std::string before =
        logLine("VIDEOBCAST", "Invoke", "Before assignment, onid: 0, tsid: 8191, sid: 0 \n");
    EXPECT_THAT(text, HasSubstr(before + logLine("VIDEOBCAST", "Invoke",
                                                 "mId_createChannelObject is called with 4 parameters\n")));
    EXPECT_THAT(text, HasSubstr(before + logLine("VIDEOBCAST", "Invoke",
                                                 "mId_createChannelObject is called with 3 parameters\n")));
    EXPECT_THAT(text,
                HasSubstr(logLine("VIDEOBCAST", "Invoke", "mId_createChannelObject is called with Dsd\n")));
}

TEST_F(JSVideoBroadcastTest, ComponentsTakeANumber) {
    const EmbeddedObject vb = ready();
    platform.defaultResult = 1;
    for (const char* method : {"getComponents", "getCurrentActiveComponents"}) {
        EXPECT_EQ(vb.call(method, 1.9), nullptr) << method;
        EXPECT_EQ(vb.call(method, -1), nullptr) << method;
        EXPECT_FALSE(vb.call(method).succeeded) << method;
        EXPECT_FALSE(vb.call(method, "1").succeeded) << method;
        EXPECT_FALSE(vb.call(method, nullptr).succeeded) << method;
        EXPECT_FALSE(vb.call(method, true).succeeded) << method;
    }
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_GetComponents(7, 1, out, out)",
                                             "TELIX_JS_VB_GetComponents(7, 0, out, out)",
                                             "TELIX_JS_VB_GetCurrActiveComponents(7, 1, out, out)",
                                             "TELIX_JS_VB_GetCurrActiveComponents(7, 0, out, out)"));
}

// ---- Without a model

TEST_F(JSVideoBroadcastTest, AMissingModelStopsTheProcess) {
    const EmbeddedObject vb = ready();
    vb.destroy();
    EXPECT_TRUE(vb.hasProperty("width"));
    EXPECT_TRUE(vb.hasMethod("stop"));
    EXPECT_DEATH(vb.get("width"), "src/videobroadcast/JSVideoBroadcast.*pPlugin");
    EXPECT_DEATH(vb.set("width", 1), "src/videobroadcast/JSVideoBroadcast.*pPlugin");
    EXPECT_DEATH(vb.call("stop"), "src/videobroadcast/JSVideoBroadcast.*pPlugin");
    EXPECT_DEATH(vb.get("COMPONENT_TYPE_AUDIO"), "pPlugin");
    EXPECT_DEATH(vb.call("noSuchMethod"), "pPlugin");
}

TEST_F(JSVideoBroadcastTest, TheConstructionIsLogged) {
    EXPECT_THAT(logOf(6, [&] { embed().scriptObject(); }),
                HasSubstr(logLine("VIDEOBCAST", "JSVideoBroadcast", "Constructor called, This:-- 0x")));
}

} // namespace
