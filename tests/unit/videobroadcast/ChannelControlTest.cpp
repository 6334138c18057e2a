// Tuning, channels, programmes and components of the video/broadcast object.
#include <gmock/gmock.h>

#include "tests/unit/videobroadcast/BroadcastTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace {

class ChannelControlTest : public BroadcastTest {
protected:
    ChannelControlTest() {
        platform.TELIX_JS_VB_GetCurrentChannel = [this](TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE* channel) {
            *channel = current;
            return 0;
        };
        platform.TELIX_JS_CM_GetChannelList = [this](uint32_t* count, TELIX_JS_CM_HANDLE** channels) {
            *channels = list.data();
            *count = static_cast<uint32_t>(list.size());
            return 0;
        };
        const auto components = [this](TELIX_JS_VB_HANDLE, TELIX_JS_AVCOMPTYPE, TELIX_JS_AVCOMPHANDLE** out,
                                       uint32_t* count) {
            *out = componentHandles.data();
            *count = static_cast<uint32_t>(componentHandles.size());
            return 0;
        };
        platform.TELIX_JS_VB_GetComponents = components;
        platform.TELIX_JS_VB_GetCurrActiveComponents = components;
        platform.TELIX_JS_SI_GetProgrammeHandles = [this](uint32_t* count, TELIX_JS_SI_HANDLE** out) {
            *count = static_cast<uint32_t>(programmeHandles.size());
            *out = programmeHandles.data();
            return 0;
        };
    }

    // Steps to the next channel give this handle from now on.
    void stepsLeadTo(TELIX_JS_CM_HANDLE handle) {
        const auto step = [handle](TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE* channel) {
            *channel = handle;
            return 0;
        };
        platform.TELIX_JS_VB_NextChannel = step;
        platform.TELIX_JS_VB_PrevChannel = step;
    }

    static std::string ccid(const ObjectRef& channel) { return channel.get("ccid").value.string(); }

    TELIX_JS_CM_HANDLE current = 11;
    std::vector<TELIX_JS_CM_HANDLE> list = {11, 12};
    std::vector<TELIX_JS_AVCOMPHANDLE> componentHandles = {31, 32};
    std::vector<TELIX_JS_SI_HANDLE> programmeHandles = {21};
};

// ---- Tuning

TEST_F(ChannelControlTest, BindingMakesTheObjectActive) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_BindToCurrChannel = [](TELIX_JS_VB_HANDLE) { return 1; };
    vb.call("bindToCurrentChannel");
    EXPECT_FALSE(modelOf(vb).isActive());
    platform.TELIX_JS_VB_BindToCurrChannel = nullptr;
    vb.call("bindToCurrentChannel");
    EXPECT_TRUE(modelOf(vb).isActive());
    platform.TELIX_JS_VB_BindToCurrChannel = [](TELIX_JS_VB_HANDLE) { return 1; };
    vb.call("bindToCurrentChannel");
    EXPECT_TRUE(modelOf(vb).isActive());
    EXPECT_EQ(log.count("TELIX_JS_VB_BindToCurrChannel(7)"), 3U);
}

TEST_F(ChannelControlTest, BindingIsLogged) {
    EXPECT_THAT(
        logOf(6, [&] { embed().call("bindToCurrentChannel"); }),
        HasSubstr(logLine("VIDEOBCAST", "bindToCurrentChannel", "TELIX_JS_VB_BindToCurrChannel Success \n")));
    EXPECT_THAT(
        logOf(6, [&] { embedWithoutHandle().call("bindToCurrentChannel"); }),
        HasSubstr(logLine("VIDEOBCAST", "bindToCurrentChannel", "TELIX_JS_VB_BindToCurrChannel Failed \n")));
}

TEST_F(ChannelControlTest, NoChannelMarksTheObjectActiveToo) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_SetChannel = [](TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE, ___UINT8) { return 1; };
    vb.call("setChannel", nullptr);
    EXPECT_FALSE(modelOf(vb).isActive());
    platform.TELIX_JS_VB_SetChannel = nullptr;
    vb.call("setChannel", nullptr);
    EXPECT_TRUE(modelOf(vb).isActive());
    EXPECT_EQ(log.count("TELIX_JS_VB_SetChannel(7, 0, 0)"), 2U);
}

TEST_F(ChannelControlTest, SettingAChannelIsLogged) {
    EXPECT_THAT(logOf(6, [&] { embed().call("setChannel", nullptr); }),
                HasSubstr(logLine("VIDEOBCAST", "setChannel", "TELIX_JS_VB_SetChannel call succeeded \n")));
}

TEST_F(ChannelControlTest, ATripletDoesNotMakeTheObjectActive) {
    const EmbeddedObject vb = embed();
    vb.call("setChannelByTriplet", 1, 2, 3);
    EXPECT_FALSE(modelOf(vb).isActive());
}

TEST_F(ChannelControlTest, WithoutHandleRequestsNeverReachThePlatform) {
    const EmbeddedObject vb = embedWithoutHandle();
    log.clear();
    for (const char* method : {"bindToCurrentChannel", "prevChannel", "nextChannel", "stop"}) {
        EXPECT_TRUE(vb.call(method)) << method;
    }
    EXPECT_TRUE(vb.call("setChannel", nullptr));
    EXPECT_TRUE(vb.call("setChannelByTriplet", 1, 2, 3));
    EXPECT_EQ(vb.call("getComponents", 0), nullptr);
    EXPECT_EQ(vb.call("getCurrentActiveComponents", 0), nullptr);
    EXPECT_THAT(platformCalls(), IsEmpty());
    EXPECT_FALSE(modelOf(vb).isActive());
}

TEST_F(ChannelControlTest, WithoutHandleSomeQuestionsReachThePlatform) {
    const EmbeddedObject vb = embedWithoutHandle();
    platform.defaultResult = 1;
    platform.TELIX_JS_VB_GetCurrentChannel = nullptr;
    log.clear();
    vb.get("currentChannel");
    vb.call("createChannelObject", 0, 1, 2);
    vb.call("createChannelObject", 0, "", 2);
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_GetCurrentChannel(0, out)",
                            "TELIX_JS_VB_CreateChannelObjectByTriplet(0, 0, 1, 8191, 2, out)",
                            "TELIX_JS_VB_CreateChannelObjectByDsd(0, 0, <>, 0, 2, out)"));
}

TEST_F(ChannelControlTest, ASelectionWithoutHandleDoesNothing) {
    const EmbeddedObject first = embed();
    const ObjectRef component = first.call("getComponents", 0).object().call("item", 0).object();
    leftBehind("JSAVcomponent", 2);
    const EmbeddedObject vb = embedWithoutHandle();
    log.clear();
    EXPECT_TRUE(vb.call("selectComponent", component));
    EXPECT_TRUE(vb.call("unselectComponent", component));
    EXPECT_THAT(platformCalls(), IsEmpty());
}

TEST_F(ChannelControlTest, StopIsForwardedAndLoggedAndKeepsTheObjectActive) {
    const EmbeddedObject vb = embed();
    vb.call("bindToCurrentChannel");
    vb.call("stop");
    EXPECT_TRUE(log.contains("TELIX_JS_VB_Stop(7)"));
    EXPECT_TRUE(modelOf(vb).isActive());
    EXPECT_THAT(logOf(6, [&] { vb.call("stop"); }),
                HasSubstr(logLine("VIDEOBCAST", "stop", "is success \n")));
    platform.TELIX_JS_VB_Stop = [](TELIX_JS_VB_HANDLE) { return 1; };
    EXPECT_THAT(logOf(6, [&] { vb.call("stop"); }), HasSubstr(logLine("VIDEOBCAST", "stop", "is failed \n")));
}

// ---- Current channel

TEST_F(ChannelControlTest, TheCurrentChannelIsOneObjectAsLongAsItIsOneChannel) {
    const EmbeddedObject vb = embed();
    const ObjectRef first = vb.get("currentChannel").object();
    EXPECT_EQ(ccid(first), "11");
    EXPECT_EQ(vb.get("currentChannel").object(), first);
    EXPECT_EQ(first.pluginReferences(), 1);
    current = 12;
    const ObjectRef second = vb.get("currentChannel").object();
    EXPECT_NE(second, first);
    EXPECT_EQ(ccid(second), "12");
    EXPECT_EQ(ccid(first), "11");
    EXPECT_EQ(first.pluginReferences(), 0);
    EXPECT_EQ(second.pluginReferences(), 1);
    EXPECT_EQ(platform.TELIX_JS_VB_GetCurrentChannel.count(), 3U);
}

TEST_F(ChannelControlTest, ARefusedQuestionForgetsTheCurrentChannel) {
    const EmbeddedObject vb = embed();
    const ObjectRef first = vb.get("currentChannel").object();
    platform.TELIX_JS_VB_GetCurrentChannel = [](TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE*) { return 1; };
    EXPECT_EQ(vb.get("currentChannel"), nullptr);
    EXPECT_EQ(first.pluginReferences(), 0);
    EXPECT_EQ(vb.get("currentChannel"), nullptr);
}

TEST_F(ChannelControlTest, ABrowserThatMakesNoObjectGivesNoCurrentChannel) {
    const EmbeddedObject vb = embed();
    vb.scriptObject();
    browser.refuse("NPN_CreateObject");
    EXPECT_EQ(vb.get("currentChannel"), nullptr);
    EXPECT_EQ(vb.call("getChannelConfig"), nullptr);
    EXPECT_EQ(vb.call("createChannelObject", 0, 1, 2), nullptr);
    EXPECT_EQ(vb.call("createChannelObject", 0, "x", 2), nullptr);
    EXPECT_EQ(vb.call("getComponents", 0), nullptr);
    EXPECT_EQ(vb.call("getCurrentActiveComponents", 0), nullptr);
    EXPECT_EQ(vb.get("programmes"), nullptr);
    browser.permit("NPN_CreateObject");
    EXPECT_TRUE(vb.get("currentChannel").value.isObject());
}

TEST_F(ChannelControlTest, TheChangesOfTheCurrentChannelAreLogged) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject vb = embed();
        vb.get("currentChannel");
        current = 12;
        vb.get("currentChannel");
        platform.TELIX_JS_VB_GetCurrentChannel = [](TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE*) { return 1; };
        vb.get("currentChannel");
    });
    EXPECT_THAT(text,
                HasSubstr(logLine("VIDEOBCAST", "getCurrChannel", "New Object created. m_pCurChannel = 0x")));
    EXPECT_THAT(text,
                HasSubstr(logLine("VIDEOBCAST", "getCurrChannel", "The current channel is different12 \n")));
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "getCurrChannel",
                                        " TELIX_JS_VB_GetCurrentChannel API failed.\n")));
}

TEST_F(ChannelControlTest, ANewCurrentChannelIsLoggedBeforeItIsRetainedForTheCaller) {
    const std::string text = logOf(1, [&] { embed().get("currentChannel"); });
    const size_t logged = text.find("New Object created. m_pCurChannel = ");
    ASSERT_NE(logged, std::string::npos);
    const size_t made = text.rfind("NPN_CreateObject", logged);
    ASSERT_NE(made, std::string::npos);
    EXPECT_GT(text.find("NPN_RetainObject", made), logged);
    EXPECT_NE(text.find("NPN_RetainObject", logged), std::string::npos);
}

TEST_F(ChannelControlTest, AStepTurnsTheObjectThatThePageHoldsIntoTheNewChannel) {
    const EmbeddedObject vb = embed();
    const ObjectRef channel = vb.get("currentChannel").object();
    platform.TELIX_JS_CM_GetName = [](TELIX_JS_CM_HANDLE handle, char** name) {
        *name = strdup(handle == 11 ? "Eleven" : "Twelve");
        return 0;
    };
    EXPECT_EQ(channel.get("name"), "Eleven");
    stepsLeadTo(12);
    log.clear();
    vb.call("nextChannel");
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_NextChannel(7, out)"));
    EXPECT_EQ(ccid(channel), "12");
    EXPECT_EQ(channel.get("name"), "Twelve");
    current = 12;
    EXPECT_EQ(vb.get("currentChannel").object(), channel);
    stepsLeadTo(11);
    vb.call("prevChannel");
    EXPECT_EQ(ccid(channel), "11");
    EXPECT_EQ(channel.pluginReferences(), 1);
}

TEST_F(ChannelControlTest, AStepWithoutCurrentObjectMakesOneAndLeavesAReferenceBehind) {
    const EmbeddedObject vb = embed();
    stepsLeadTo(12);
    vb.call("nextChannel");
    current = 12;
    const ObjectRef channel = vb.get("currentChannel").object();
    EXPECT_EQ(ccid(channel), "12");
    EXPECT_EQ(channel.pluginReferences(), 2);
    leftBehind(channel);
}

TEST_F(ChannelControlTest, ARefusedStepChangesNothing) {
    const EmbeddedObject vb = embed();
    const ObjectRef channel = vb.get("currentChannel").object();
    const auto refuse = [](TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE* out) {
        *out = 12;
        return 1;
    };
    platform.TELIX_JS_VB_NextChannel = refuse;
    platform.TELIX_JS_VB_PrevChannel = refuse;
    EXPECT_TRUE(vb.call("nextChannel"));
    EXPECT_TRUE(vb.call("prevChannel"));
    EXPECT_EQ(ccid(channel), "11");
}

TEST_F(ChannelControlTest, AStepThatSucceedsWithoutAChannelEmptiesTheObjectThatThePageHolds) {
    const EmbeddedObject vb = embed();
    const ObjectRef channel = vb.get("currentChannel").object();
    EXPECT_EQ(ccid(channel), "11");
    platform.TELIX_JS_VB_NextChannel = [](TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE*) { return 0; };
    EXPECT_TRUE(vb.call("nextChannel"));
    EXPECT_EQ(channel.get("ccid"), Value(nullptr));
    EXPECT_EQ(channel.get("channelType"), 3);
}

TEST_F(ChannelControlTest, AStepWithNoObjectToResetDoesNothingFurther) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_GetCurrentChannel = [](TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE*) { return 1; };
    stepsLeadTo(12);
    EXPECT_TRUE(vb.call("nextChannel"));
    EXPECT_TRUE(vb.call("prevChannel"));
    EXPECT_EQ(browser.liveCount("JSChannel"), 0U);
}

// ---- Channel objects

TEST_F(ChannelControlTest, ACreatedChannelIsAnObjectOfItsOwn) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_CreateChannelObjectByTriplet = [](TELIX_JS_VB_HANDLE, ___UINT8, uint32_t, uint32_t,
                                                           uint32_t, TELIX_JS_CM_HANDLE* channel) {
        *channel = 11;
        return 0;
    };
    const ObjectRef listed =
        vb.call("getChannelConfig").object().get("channelList").object().call("item", 0).object();
    const ObjectRef created = vb.call("createChannelObject", 0, 1, 2).object();
    EXPECT_EQ(ccid(listed), ccid(created));
    EXPECT_NE(listed, created);
    EXPECT_EQ(created.pluginReferences(), 0);
    leftBehind("JSChannel", 2); // the second references of the list's two
}

TEST_F(ChannelControlTest, ADescriptorMakesAChannelOfItsOwn) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_CreateChannelObjectByDsd = [](TELIX_JS_VB_HANDLE, ___UINT8, const ___UINT8*,
                                                       uint32_t, uint32_t, TELIX_JS_CM_HANDLE* channel) {
        *channel = 40;
        return 0;
    };
    const ObjectRef created = vb.call("createChannelObject", 11, "dsd", 2).object();
    EXPECT_EQ(ccid(created), "40");
    EXPECT_EQ(created.pluginReferences(), 0);
}

TEST_F(ChannelControlTest, CreatingAChannelIsLogged) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject vb = embed();
        vb.call("createChannelObject", 0, 1, 2);
        vb.call("createChannelObject", 0, "abc", 2);
    });
    EXPECT_THAT(
        text, HasSubstr(logLine("VIDEOBCAST", "createChannelObject", "called With triplet. ChannelObj: 0x")));
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "createChannelObject", "String Length: 3 \n")));
    EXPECT_THAT(text,
                HasSubstr(logLine("VIDEOBCAST", "createChannelObject", "called with Dsd. ChannelObj: 0x")));
}

TEST_F(ChannelControlTest, TheChannelConfigurationIsOneObject) {
    const EmbeddedObject vb = embed();
    const ObjectRef config = vb.call("getChannelConfig").object();
    EXPECT_EQ(config.name(), "JSChannelConfig");
    EXPECT_EQ(vb.call("getChannelConfig").object(), config);
    EXPECT_EQ(config.pluginReferences(), 1);
    const EmbeddedObject other = embed("other");
    EXPECT_NE(other.call("getChannelConfig").object(), config);
    const std::string text = logOf(6, [&] { vb.call("getChannelConfig"); });
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "getChannelConfig", "is Called.VB Handle:7 \n")));
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "getChannelConfig", "configObj:0x")));
}

// ---- Programmes

TEST_F(ChannelControlTest, TheProgrammesAreTheFirstSnapshot) {
    const EmbeddedObject vb = embed();
    const ObjectRef programmes = vb.get("programmes").object();
    EXPECT_EQ(programmes.get("length"), 1);
    EXPECT_EQ(programmes.pluginReferences(), 1);
    programmeHandles = {22, 23};
    onPlatformThread([&] { callbacks.programmesChanged(7); });
    browser.pump();
    EXPECT_EQ(vb.get("programmes").object(), programmes);
    EXPECT_EQ(programmes.get("length"), 1);
    EXPECT_EQ(platform.TELIX_JS_SI_GetProgrammeHandles.count(), 1U);
    leftBehind("JSProgramme"); // its second reference, from the collection's filling
}

TEST_F(ChannelControlTest, NoProgrammesAreAskedForAgain) {
    const EmbeddedObject vb = embed();
    programmeHandles.clear();
    EXPECT_EQ(vb.get("programmes"), nullptr);
    platform.defaultResult = 1;
    platform.TELIX_JS_SI_GetProgrammeHandles = nullptr;
    EXPECT_EQ(vb.get("programmes"), nullptr);
    EXPECT_EQ(platform.TELIX_JS_SI_GetProgrammeHandles.count(), 2U);
    EXPECT_EQ(browser.liveCount("JSProgrammeCollection"), 0U);
}

// ---- Components

TEST_F(ChannelControlTest, EachTypeOfComponentsIsOneListForGood) {
    const EmbeddedObject vb = embed();
    std::vector<ObjectRef> lists;
    for (int type = 0; type < 3; ++type) {
        lists.push_back(vb.call("getComponents", type).object());
        EXPECT_EQ(lists.back().get("length"), 2);
        EXPECT_EQ(lists.back().call("item", 1).object().get("type"), type);
        EXPECT_EQ(lists.back().pluginReferences(), 1);
    }
    vb.call("setChannel", nullptr);
    onPlatformThread([&] { callbacks.channelChangeSucceeded(7, 0); });
    browser.pump();
    for (int type = 0; type < 3; ++type) {
        EXPECT_EQ(vb.call("getComponents", type).object(), lists[static_cast<size_t>(type)]);
    }
    EXPECT_EQ(platform.TELIX_JS_VB_GetComponents.count(), 3U);
    leftBehind("JSAVcomponent", 6); // the second references, from the lists' filling
    leftBehind("JSChannel");        // of the event
}

TEST_F(ChannelControlTest, ComponentsAskTheBroadcastFamilyOfCalls) {
    const EmbeddedObject vb = embed();
    const ObjectRef component = vb.call("getComponents", 1).object().call("item", 0).object();
    log.clear();
    component.get("language");
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_AVComponent_GetLanguage(31, 1, out)"));
    leftBehind("JSAVcomponent", 2);
}

TEST_F(ChannelControlTest, ThereAreNoComponentsOfAnotherType) {
    const EmbeddedObject vb = embed();
    log.clear();
    EXPECT_EQ(vb.call("getComponents", 3), nullptr);
    EXPECT_THAT(platformCalls(), IsEmpty());
}

TEST_F(ChannelControlTest, RefusedComponentsAreAskedForAgain) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_GetComponents = [](TELIX_JS_VB_HANDLE, TELIX_JS_AVCOMPTYPE, TELIX_JS_AVCOMPHANDLE**,
                                            uint32_t*) { return 1; };
    EXPECT_EQ(vb.call("getComponents", 0), nullptr);
    EXPECT_EQ(vb.call("getComponents", 0), nullptr);
    EXPECT_EQ(platform.TELIX_JS_VB_GetComponents.count(), 2U);
}

TEST_F(ChannelControlTest, ActiveComponentsAreANewListEachTimeThatStaysAlive) {
    const EmbeddedObject vb = embed();
    const ObjectRef first = vb.call("getCurrentActiveComponents", 0).object();
    const ObjectRef second = vb.call("getCurrentActiveComponents", 0).object();
    EXPECT_NE(first, second);
    EXPECT_EQ(first.get("length"), 2);
    // One reference is the page's, the other is left behind.
    EXPECT_EQ(first.pluginReferences(), 1);
    EXPECT_EQ(second.pluginReferences(), 1);
    leftBehind(first);
    leftBehind(second);
    leftBehind("JSAVcomponent", 8); // two each of four, whose lists stay
}

TEST_F(ChannelControlTest, ActiveComponentsOfAnUnknownTypeAreAskedFor) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_GetCurrActiveComponents = nullptr;
    platform.defaultResult = 1;
    log.clear();
    EXPECT_EQ(vb.call("getCurrentActiveComponents", 3), nullptr);
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_GetCurrActiveComponents(7, 3, out, out)"));
}

TEST_F(ChannelControlTest, AListWithoutArrayStopsTheProcess) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_GetComponents = nullptr;
    EXPECT_DEATH(vb.call("getComponents", 0), "pHandles");
}

TEST_F(ChannelControlTest, ComponentsAreLogged) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject vb = embed();
        vb.call("getCurrentActiveComponents", 1);
        vb.call("selectComponent", vb.call("getComponents", 1).object().call("item", 0).object());
    });
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "getCurrentActiveComponents", "Comp Type :: 1\n") +
                                logLine("VIDEOBCAST", "getComponentList", "Comp Type: 1 \n") +
                                logLine("VIDEOBCAST", "getComponentList", "count::2")));
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "selectComponent", "AVCompObj: 0x")));
}

} // namespace
