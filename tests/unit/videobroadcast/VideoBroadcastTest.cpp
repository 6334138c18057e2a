// The video/broadcast object: its life, the platform handle, geometry, play state and full screen.
#include <algorithm>

#include <gmock/gmock.h>

#include "common/ObjectKind.h"
#include "tests/unit/support/SameAddress.h"
#include "tests/unit/videobroadcast/BroadcastTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace {

using VideoBroadcastTest = BroadcastTest;

const BorderLog::Entries unregistrations = {"TELIX_JS_VB_UnRegisterOnFullScreenChange(callback)",
                                            "TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded(callback)",
                                            "TELIX_JS_VB_UnRegisterOnChannelChangeError(callback)",
                                            "TELIX_JS_VB_UnRegisterOnPlayStateChange(callback)",
                                            "TELIX_JS_VB_UnRegisterOnProgrammesChanged(callback)",
                                            "TELIX_JS_VB_UnRegisterOnParentalRatingChange(callback)",
                                            "TELIX_JS_VB_UnRegisterOnParentalRatingError(callback)"};

TEST_F(VideoBroadcastTest, AnObjectAsksForItsHandleAndRegistersTheSevenCallbacksInOrder) {
    embed();
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_GetHandle(out)", "TELIX_JS_VB_RegisterOnFullScreenChange(callback)",
                            "TELIX_JS_VB_RegisterOnChannelChangeSucceeded(callback)",
                            "TELIX_JS_VB_RegisterOnChannelChangeError(callback)",
                            "TELIX_JS_VB_RegisterOnPlayStateChange(callback)",
                            "TELIX_JS_VB_RegisterOnProgrammesChanged(7, callback)",
                            "TELIX_JS_VB_RegisterOnParentalRatingChange(7, callback)",
                            "TELIX_JS_VB_RegisterOnParentalRatingError(7, callback)"));
}

TEST_F(VideoBroadcastTest, AMimeTypeInCapitalsMakesTheObjectToo) {
    EXPECT_EQ(browser.embed("VIDEO/Broadcast").error(), NPERR_NO_ERROR);
    EXPECT_EQ(platform.TELIX_JS_VB_GetHandle.count(), 1U);
}

TEST_F(VideoBroadcastTest, TheElementShowsTheTelevisionPicture) {
    const EmbeddedObject vb = embed();
    const ObjectRef style = vb.element().get("style").object();
    EXPECT_EQ(style.get("backgroundImage"), "url(tv:)");
    EXPECT_EQ(style.get("backgroundColor"), "transparent");
}

TEST_F(VideoBroadcastTest, TheStartIsLoggedAsThePluginShellAndTheObject) {
    EXPECT_THAT(logOf(9, [&] { embed(); }),
                HasSubstr(logLine("COMMON", "newInstance", "After VideoBroadcast init. rv = 0 \n")));
    const std::string text = logOf(6, [&] { embed(); });
    EXPECT_THAT(text,
                HasSubstr(logLine("VIDEOBCAST", "VideoBroadcast", "Constructor called, NPP instance: 0x")));
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "addInstance", "Added inst :: 0x")));
    EXPECT_THAT(text,
                HasSubstr(logLine("VIDEOBCAST", "getInstance", "TELIX_JS_VB_GetHandle, Handle: ( 7 )\n")));
}

TEST_F(VideoBroadcastTest, AFailedHandleRequestIsLogged) {
    EXPECT_THAT(logOf(6, [&] { embedWithoutHandle(); }),
                HasSubstr(logLine("VIDEOBCAST", "getInstance", " TELIX_JS_VB_GetHandle returned error.\n")));
}

TEST_F(VideoBroadcastTest, AnObjectWithoutHandleAnswersFromZeroWithoutThePlatform) {
    const EmbeddedObject vb = embedWithoutHandle();
    EXPECT_EQ(vb.error(), NPERR_NO_ERROR);
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_GetHandle(out)"));
    log.clear();
    EXPECT_EQ(vb.get("width"), 0);
    EXPECT_EQ(vb.get("height"), 0);
    EXPECT_EQ(vb.get("playState"), 0);
    EXPECT_TRUE(vb.set("playState", 2));
    EXPECT_EQ(vb.get("playState"), 0);
    EXPECT_TRUE(vb.call("release"));
    vb.setRectangle(10, 20, 110, 220);
    vb.setWindow(0, 0, 100, 200);
    EXPECT_THAT(platformCalls(), IsEmpty());
    EXPECT_EQ(log.count("NPN_InvalidateRect"), 0U);
}

TEST_F(VideoBroadcastTest, AnObjectWithoutHandleStillAsksForFullScreenAndSize) {
    const EmbeddedObject vb = embedWithoutHandle();
    log.clear();
    EXPECT_EQ(vb.get("fullScreen"), false);
    EXPECT_TRUE(vb.call("setFullScreen", true));
    EXPECT_TRUE(vb.set("width", 640));
    EXPECT_TRUE(vb.set("height", 480));
    browser.pump();
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_IsFullScreen(0, out)", "TELIX_JS_VB_SetFullScreen(0, 1)",
                            "TELIX_JS_VB_SetWidth(0, 640)", "TELIX_JS_VB_SetHeight(0, 480)"));
}

TEST_F(VideoBroadcastTest, TheSizeStepSaysThereIsNothingToDoAndGoesOn) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject vb = embedWithoutHandle();
        vb.set("width", 640);
        browser.pump();
    });
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "setWidth", ":: new Width= 640 \n")));
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "shouldChangeWidth",
                                        "m_vbHandle is NULL. Nothing to do, return. \n")));
    EXPECT_THAT(text,
                HasSubstr(logLine("VIDEOBCAST", "shouldChangeWidth", "TELIX_JS_VB_SetWidth Succeeded \n")));
}

TEST_F(VideoBroadcastTest, ARefusedHeightIsLogged) {
    platform.TELIX_JS_VB_SetHeight = [](TELIX_JS_VB_HANDLE, int32_t) { return 1; };
    const std::string text = logOf(6, [&] {
        const EmbeddedObject vb = embed();
        vb.set("height", 480);
        browser.pump();
    });
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "setHeight", ":: new height= 480 \n")));
    EXPECT_THAT(text,
                HasSubstr(logLine("VIDEOBCAST", "shouldChangeHeight", "TELIX_JS_VB_SetHeight Failed \n")));
}

TEST_F(VideoBroadcastTest, AnObjectGetsItsHandleAtTheModel) {
    const EmbeddedObject first = embed();
    const EmbeddedObject second = embed("other");
    EXPECT_EQ(modelOf(first).getHandle(), 7U);
    EXPECT_EQ(modelOf(second).getHandle(), 8U);
    EXPECT_EQ(VideoBroadcast::getInstance(7U), first.model());
    EXPECT_EQ(VideoBroadcast::getInstance(8U), second.model());
    EXPECT_EQ(VideoBroadcast::getInstance(9U), nullptr);
}

TEST_F(VideoBroadcastTest, OfTwoObjectsWithOneHandleTheLowerAddressIsFound) {
    const EmbeddedObject first = embed();
    nextHandle = 7;
    const EmbeddedObject second = embed("other");
    EXPECT_EQ(VideoBroadcast::getInstance(7U), std::min(first.model(), second.model()));
    log.clear();
    first.destroy();
    second.destroy();
    EXPECT_EQ(log.count("TELIX_JS_VB_Release(7)"), 2U);
}

TEST_F(VideoBroadcastTest, AnObjectWithoutHandleIsListedUnderZero) {
    EXPECT_EQ(VideoBroadcast::getInstance(0U), nullptr);
    const EmbeddedObject vb = embedWithoutHandle();
    EXPECT_EQ(VideoBroadcast::getInstance(0U), vb.model());
    EXPECT_TRUE(VideoBroadcast::checkValidInstance(&modelOf(vb)));
}

TEST_F(VideoBroadcastTest, TheFirstObjectRegistersForAllAndTheLastOneUnregisters) {
    const EmbeddedObject first = embed();
    log.clear();
    const EmbeddedObject second = embed("other");
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_GetHandle(out)"));
    log.clear();
    first.destroy();
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_Release(7)"));
    EXPECT_TRUE(VideoBroadcast::callbacksRegistered());
    log.clear();
    second.destroy();
    BorderLog::Entries expected = unregistrations;
    expected.insert(expected.begin(), "TELIX_JS_VB_Release(8)");
    EXPECT_EQ(platformCalls(), expected);
    EXPECT_FALSE(VideoBroadcast::callbacksRegistered());
}

TEST_F(VideoBroadcastTest, RefusedRegistrationsCountAsMadeAndAreTakenBackAtTheEnd) {
    const auto refuse = [](auto...) { return 1; };
    platform.TELIX_JS_VB_RegisterOnFullScreenChange = refuse;
    platform.TELIX_JS_VB_RegisterOnChannelChangeSucceeded = refuse;
    platform.TELIX_JS_VB_RegisterOnProgrammesChanged = refuse;
    const EmbeddedObject first = embed();
    EXPECT_TRUE(VideoBroadcast::callbacksRegistered());
    EXPECT_EQ(platform.TELIX_JS_VB_RegisterOnParentalRatingError.count(), 1U);
    const EmbeddedObject second = embed("second");
    EXPECT_EQ(platform.TELIX_JS_VB_RegisterOnFullScreenChange.count(), 1U);
    first.destroy();
    second.destroy();
    EXPECT_EQ(platform.TELIX_JS_VB_UnRegisterOnFullScreenChange.count(), 1U);
    EXPECT_EQ(platform.TELIX_JS_VB_UnRegisterOnParentalRatingError.count(), 1U);
}

TEST_F(VideoBroadcastTest, AnObjectWithHandleRegistersAlsoAfterAFirstOneWithout) {
    const EmbeddedObject first = embedWithoutHandle();
    EXPECT_FALSE(VideoBroadcast::callbacksRegistered());
    platform.TELIX_JS_VB_GetHandle = [](TELIX_JS_VB_HANDLE* handle) {
        *handle = 9;
        return 0;
    };
    log.clear();
    const EmbeddedObject second = embed("second");
    EXPECT_TRUE(log.contains("TELIX_JS_VB_RegisterOnProgrammesChanged(9, callback)")) << log.text();
    second.destroy();
    EXPECT_TRUE(VideoBroadcast::callbacksRegistered()); // the first is still listed
    first.destroy();
    EXPECT_FALSE(VideoBroadcast::callbacksRegistered());
}

TEST_F(VideoBroadcastTest, AnObjectAfterTheLastOneRegistersAnewWithItsOwnHandle) {
    embed().destroy();
    log.clear();
    embed();
    EXPECT_TRUE(log.contains("TELIX_JS_VB_RegisterOnFullScreenChange(callback)"));
    EXPECT_TRUE(log.contains("TELIX_JS_VB_RegisterOnProgrammesChanged(8, callback)"));
    EXPECT_TRUE(VideoBroadcast::callbacksRegistered());
}

TEST_F(VideoBroadcastTest, AnObjectWithoutHandleAloneUnregistersNothing) {
    embedWithoutHandle().destroy();
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_GetHandle(out)"));
}

TEST_F(VideoBroadcastTest, TheEndOfAnObjectReleasesTheHandleBeforeItsSubscriptions) {
    const EmbeddedObject vb = embed();
    vb.call("addStreamEventListener", "dvb://1.2.3", "goal", "5", "31");
    log.clear();
    vb.destroy();
    BorderLog::Entries expected = unregistrations;
    expected.insert(expected.begin(), "TELIX_JS_VB_Release(7)");
    expected.emplace_back("TELIX_JS_VB_UnRegisterStreamEvent(7, callback, \"5\", \"31\", \"goal\")");
    EXPECT_EQ(platformCalls(), expected);
}

TEST_F(VideoBroadcastTest, TheEndIsLogged) {
    const std::string text = logOf(6, [&] { embed().destroy(); });
    EXPECT_THAT(text, HasSubstr("Destructor is called, VB Handle:7 \n"));
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "release", "TELIX_JS_VB_Release is called :7 \n")));
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "deleteInstance", "Deleted inst :: 0x")));
    EXPECT_THAT(text, HasSubstr("Destructor call Ended \n"));
    EXPECT_THAT(logOf(9, [&] { embed().destroy(); }),
                HasSubstr(logLine("COMMON", "destroyInst", "VIDEOBROADCAST_OBJ_ID delete :: 0x")));
}

TEST_F(VideoBroadcastTest, TheObjectReleasesWhatItHoldsTheWrapperLast) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_GetComponents = [](TELIX_JS_VB_HANDLE, TELIX_JS_AVCOMPTYPE,
                                            TELIX_JS_AVCOMPHANDLE** components, uint32_t* count) {
        static TELIX_JS_AVCOMPHANDLE none[1];
        *components = none;
        *count = 0;
        return 0;
    };
    platform.TELIX_JS_SI_GetProgrammeHandles = [](uint32_t* count, TELIX_JS_SI_HANDLE** programmes) {
        static TELIX_JS_SI_HANDLE handles[1] = {3};
        *programmes = handles;
        *count = 1;
        return 0;
    };
    for (const char* name :
         {"onFullScreenChange", "onPlayStateChange", "onChannelChangeSucceeded", "onChannelChangeError",
          "onProgrammesChanged", "onParentalRatingChange", "onParentalRatingError"}) {
        EXPECT_TRUE(vb.set(name, browser.function(name)));
    }
    vb.call("getChannelConfig");
    vb.get("programmes");
    vb.get("currentChannel");
    for (int type : {2, 1, 0}) { // made in another order than they are released in
        vb.call("getComponents", type);
    }
    const ObjectRef wrapper = vb.scriptObject();
    log.clear();
    vb.destroy();
    EXPECT_THAT(log.startingWith("NPN_ReleaseObject"),
                ElementsAre("NPN_ReleaseObject JSChannelConfig", "NPN_ReleaseObject JSProgrammeCollection",
                            "NPN_ReleaseObject JSProgramme", "NPN_ReleaseObject JSChannel",
                            "NPN_ReleaseObject onFullScreenChange", "NPN_ReleaseObject onPlayStateChange",
                            "NPN_ReleaseObject onChannelChangeSucceeded",
                            "NPN_ReleaseObject onChannelChangeError", "NPN_ReleaseObject onProgrammesChanged",
                            "NPN_ReleaseObject JSAVcomponentList#3", "NPN_ReleaseObject JSAVcomponentList#2",
                            "NPN_ReleaseObject JSAVcomponentList", "NPN_ReleaseObject onParentalRatingChange",
                            "NPN_ReleaseObject onParentalRatingError", "NPN_ReleaseObject " + wrapper.name(),
                            "NPN_ReleaseObject " + vb.element().name()));
    EXPECT_EQ(wrapper.pluginReferences(), 0);
    leftBehind("JSProgramme"); // its second reference, from the collection's filling
}

TEST_F(VideoBroadcastTest, TheWrapperIsMadeOnceAndEachCallerGetsAReference) {
    const EmbeddedObject vb = embed();
    EXPECT_EQ(browser.liveCount("JSVideoBroadcast"), 0U);
    const ObjectRef wrapper = vb.scriptObject();
    EXPECT_EQ(wrapper.pluginReferences(), 1);
    EXPECT_EQ(ObjectRef::adopt(modelOf(vb).getJSObject()), wrapper);
    EXPECT_EQ(browser.liveCount("JSVideoBroadcast"), 1U);
    EXPECT_EQ(wrapper.pluginReferences(), 1);
}

TEST_F(VideoBroadcastTest, EventsOfTheBrowserAreNotHandled) {
    EXPECT_EQ(embed().handleEvent(), 0);
    // Nor do they reach the object: only one kind of object is given them.
    for (const ObjectKind* const* kind = kObjectKinds; *kind; ++kind) {
        EXPECT_EQ((*kind)->handleEvent != nullptr, (*kind)->id == 200) << (*kind)->id;
    }
}

TEST_F(VideoBroadcastTest, TheActiveObjectIsTheFirstThatIs) {
    const EmbeddedObject first = embed();
    const EmbeddedObject second = embed("other");
    EXPECT_EQ(VideoBroadcast::getActiveInst(), nullptr);
    modelOf(second).setActive(true);
    EXPECT_EQ(VideoBroadcast::getActiveInst(), second.model());
    modelOf(first).setActive(true);
    EXPECT_EQ(VideoBroadcast::getActiveInst(), std::min(&modelOf(first), &modelOf(second)));
}

TEST_F(VideoBroadcastTest, LookingForAnInstanceIsLogged) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject vb = embed();
        VideoBroadcast::checkValidInstance(nullptr);
        VideoBroadcast::getActiveInst();
    });
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "checkValidInstance", "VBInstanceList size : 1 \n")));
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "checkValidInstance", "VB Instance in List: 0x")));
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "getActiveInst", "Size of Map:: 1 \n")));
}

// ---- Size

TEST_F(VideoBroadcastTest, AWidthReadsBackOnlyAfterTheIdleStep) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_GetWidth = [](TELIX_JS_VB_HANDLE, int32_t* width) {
        *width = 100;
        return 0;
    };
    log.clear();
    EXPECT_TRUE(vb.set("width", 640));
    EXPECT_EQ(vb.get("width"), 100);
    EXPECT_EQ(platformCalls(), BorderLog::Entries{"TELIX_JS_VB_GetWidth(7, out)"});
    browser.pump();
    EXPECT_EQ(vb.get("width"), 640);
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_GetWidth(7, out)", "TELIX_JS_VB_SetWidth(7, 640)"));
}

TEST_F(VideoBroadcastTest, AHeightReadsBackOnlyAfterTheIdleStep) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_GetHeight = [](TELIX_JS_VB_HANDLE, int32_t* height) {
        *height = 100;
        return 0;
    };
    log.clear();
    EXPECT_TRUE(vb.set("height", 480));
    EXPECT_EQ(vb.get("height"), 100);
    browser.pump();
    EXPECT_EQ(vb.get("height"), 480);
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_GetHeight(7, out)", "TELIX_JS_VB_SetHeight(7, 480)"));
}

TEST_F(VideoBroadcastTest, ARefusedWidthIsForgotten) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_SetWidth = [](TELIX_JS_VB_HANDLE, int32_t) { return 1; };
    platform.TELIX_JS_VB_GetWidth = [](TELIX_JS_VB_HANDLE, int32_t* width) {
        *width = 320;
        return 0;
    };
    vb.set("width", 640);
    browser.pump();
    EXPECT_EQ(vb.get("width"), 320);
}

TEST_F(VideoBroadcastTest, ARefusedReadOfTheSizeGivesTheLastValueAndIsTriedAgain) {
    const EmbeddedObject vb = embed();
    platform.defaultResult = 1;
    EXPECT_EQ(vb.get("width"), 0);
    EXPECT_EQ(vb.get("width"), 0);
    EXPECT_EQ(vb.get("height"), 0);
    EXPECT_EQ(platform.TELIX_JS_VB_GetWidth.count(), 2U);
    EXPECT_EQ(platform.TELIX_JS_VB_GetHeight.count(), 1U);
}

TEST_F(VideoBroadcastTest, AKnownWidthIsNeverAskedForAgain) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_GetWidth = [](TELIX_JS_VB_HANDLE, int32_t* width) {
        *width = 320;
        return 0;
    };
    EXPECT_EQ(vb.get("width"), 320);
    EXPECT_EQ(vb.get("width"), 320);
    EXPECT_EQ(platform.TELIX_JS_VB_GetWidth.count(), 1U);
}

TEST_F(VideoBroadcastTest, TwoWritesInARowMakeOnePlatformCallWithTheLast) {
    const EmbeddedObject vb = embed();
    log.clear();
    vb.set("width", 640);
    vb.set("width", 800);
    vb.set("height", 1);
    vb.set("height", 2);
    browser.pump();
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_SetWidth(7, 800)", "TELIX_JS_VB_SetHeight(7, 2)"));
}

TEST_F(VideoBroadcastTest, ASizeThatIsWrittenAndWrittenBackInOneTurnIsNotApplied) {
    const EmbeddedObject vb = embed();
    vb.set("width", 640);
    browser.pump();
    log.clear();
    vb.set("width", 800);
    vb.set("width", 640);
    browser.pump();
    EXPECT_THAT(platformCalls(), IsEmpty());
    EXPECT_EQ(vb.get("width"), 640);
}

TEST_F(VideoBroadcastTest, AWidthOfZeroOnAnUnknownWidthIsNotAppliedAndIsAskedForLater) {
    const EmbeddedObject vb = embed();
    log.clear();
    vb.set("width", 0);
    browser.pump();
    EXPECT_THAT(platformCalls(), IsEmpty());
    vb.get("width");
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_GetWidth(7, out)"));
}

TEST_F(VideoBroadcastTest, ASizeStepForADeadObjectDoesNothing) {
    const EmbeddedObject vb = embed();
    vb.set("width", 640);
    vb.set("height", 480);
    vb.destroy();
    log.clear();
    browser.pump();
    EXPECT_THAT(platformCalls(), IsEmpty());
}

TEST_F(VideoBroadcastTest, ASizeStepIsNotTakenForTheNextObjectAtTheSameAddress) {
    const SameAddress place(sizeof(VideoBroadcast));
    const EmbeddedObject first = embed();
    first.set("width", 640);
    first.set("height", 480);
    first.destroy();
    const EmbeddedObject second = embed();
    ASSERT_EQ(second.model(), place.address());
    // Its own steps find these sizes refused, and another step would ask once more.
    platform.TELIX_JS_VB_SetWidth = [](TELIX_JS_VB_HANDLE, int32_t) { return 1; };
    platform.TELIX_JS_VB_SetHeight = [](TELIX_JS_VB_HANDLE, int32_t) { return 1; };
    second.set("width", 320);
    second.set("height", 240);
    log.clear();
    browser.pump();
    EXPECT_THAT(platformCalls(),
                ElementsAre("TELIX_JS_VB_SetWidth(8, 320)", "TELIX_JS_VB_SetHeight(8, 240)"));
}

// ---- Play state

TEST_F(VideoBroadcastTest, ThePlayStateIsAskedForAtEachRead) {
    const EmbeddedObject vb = embed();
    int32_t state = 1;
    platform.TELIX_JS_VB_GetPlayBackState = [&](TELIX_JS_VB_HANDLE, TELIX_PLAYSTATE_ENUM_T* out) {
        *out = state;
        return 0;
    };
    EXPECT_EQ(vb.get("playState"), 1);
    state = 2;
    EXPECT_EQ(vb.get("playState"), 2);
    platform.TELIX_JS_VB_GetPlayBackState = [](TELIX_JS_VB_HANDLE, TELIX_PLAYSTATE_ENUM_T* out) {
        *out = 3;
        return 1;
    };
    EXPECT_EQ(vb.get("playState"), 2);
}

TEST_F(VideoBroadcastTest, AWrittenPlayStateGoesToThePlatformOnceWhateverTheAnswer) {
    const EmbeddedObject vb = embed();
    platform.defaultResult = 1;
    log.clear();
    EXPECT_TRUE(vb.set("playState", 2));
    EXPECT_TRUE(vb.set("playState", 2));
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_SetPlayBackState(7, 2)"));
    EXPECT_EQ(vb.get("playState"), 2);
}

TEST_F(VideoBroadcastTest, ThePlayStateAlreadyKnownIsNotWrittenEvenIfThePlatformHasMovedOn) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_GetPlayBackState = [](TELIX_JS_VB_HANDLE, TELIX_PLAYSTATE_ENUM_T* out) {
        *out = 1;
        return 0;
    };
    vb.get("playState");
    log.clear();
    vb.set("playState", 1);
    EXPECT_THAT(platformCalls(), IsEmpty());
}

// ---- Full screen

TEST_F(VideoBroadcastTest, FullScreenIsAskedForAtEachRead) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_IsFullScreen = [](TELIX_JS_VB_HANDLE, ___UINT8* fullScreen) {
        *fullScreen = 2; // any value but 0 is full screen
        return 0;
    };
    EXPECT_EQ(vb.get("fullScreen"), true);
    platform.TELIX_JS_VB_IsFullScreen = [](TELIX_JS_VB_HANDLE, ___UINT8* fullScreen) {
        *fullScreen = 0;
        return 1;
    };
    EXPECT_EQ(vb.get("fullScreen"), true);
    EXPECT_EQ(platform.TELIX_JS_VB_IsFullScreen.count(), 2U);
}

TEST_F(VideoBroadcastTest, AStateOfFullScreenThatWasReadNeedsNoChangeAndPlacesThePicture) {
    const EmbeddedObject vb = embed();
    platform.TELIX_JS_VB_IsFullScreen = [](TELIX_JS_VB_HANDLE, ___UINT8* on) {
        *on = 1;
        return 0;
    };
    EXPECT_EQ(vb.get("fullScreen"), true);
    log.clear();
    EXPECT_TRUE(vb.call("setFullScreen", true));
    EXPECT_THAT(platformCalls(), IsEmpty());
    vb.setRectangle(10, 20, 110, 220);
    vb.setWindow(0, 0, 0, 0);
    EXPECT_TRUE(log.contains("TELIX_JS_VB_SetDisplayArea(7, {0,0,1280,720})")) << log.text();
}

TEST_F(VideoBroadcastTest, AReadOfFullScreenIsLogged) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject vb = embed();
        vb.get("fullScreen");
        platform.defaultResult = 1;
        vb.get("fullScreen");
    });
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "isFullScreen",
                                        "TELIX_JS_VB_IsFullScreen is called. FullScreen = 0 \n")));
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "isFullScreen",
                                        "TELIX_JS_VB_IsFullScreen is not called 0 \n")));
}

TEST_F(VideoBroadcastTest, AChangeOfFullScreenCallsTheHandlerAtOnceWithTheNewState) {
    const EmbeddedObject vb = embed();
    const ScriptFunction handler = browser.function("handler");
    vb.set("onFullScreenChange", handler);
    log.clear();
    EXPECT_TRUE(vb.call("setFullScreen", true).value.isUndefined());
    EXPECT_THAT(handler.last(), ElementsAre(Value(true)));
    log.expectInOrder({"TELIX_JS_VB_SetFullScreen(7, 1)", "NPN_InvokeDefault handler(true)"});
    vb.call("setFullScreen", false);
    EXPECT_THAT(handler.last(), ElementsAre(Value(false)));
    EXPECT_EQ(handler.pluginReferences(), 1);
    EXPECT_FALSE(modelOf(vb).PluginBase::isFullScreen());
}

TEST_F(VideoBroadcastTest, TheFullScreenHandlerMayTakeItselfOut) {
    const EmbeddedObject vb = embed();
    const ScriptFunction handler = browser.function("handler");
    handler.does([&](const Values&) {
        vb.set("onFullScreenChange", nullptr);
        return Value();
    });
    vb.set("onFullScreenChange", handler);
    vb.call("setFullScreen", true);
    EXPECT_EQ(handler.count(), 1U);
    EXPECT_EQ(handler.pluginReferences(), 0);
}

TEST_F(VideoBroadcastTest, TheFullScreenHandlerMayTakeTheObjectOut) {
    const EmbeddedObject vb = embed();
    const ScriptFunction handler = browser.function("handler");
    handler.does([&](const Values&) {
        vb.destroy();
        return Value();
    });
    vb.set("onFullScreenChange", handler);
    EXPECT_TRUE(vb.call("setFullScreen", true));
    EXPECT_EQ(handler.count(), 1U);
}

TEST_F(VideoBroadcastTest, TheFullScreenStateAlreadyKnownChangesNothing) {
    const EmbeddedObject vb = embed();
    const ScriptFunction handler = browser.function("handler");
    vb.set("onFullScreenChange", handler);
    log.clear();
    EXPECT_TRUE(vb.call("setFullScreen", false));
    EXPECT_THAT(platformCalls(), IsEmpty());
    EXPECT_EQ(handler.count(), 0U);
}

TEST_F(VideoBroadcastTest, ARefusedChangeOfFullScreenChangesNothing) {
    const EmbeddedObject vb = embed();
    const ScriptFunction handler = browser.function("handler");
    vb.set("onFullScreenChange", handler);
    platform.defaultResult = 1;
    EXPECT_TRUE(vb.call("setFullScreen", true));
    EXPECT_EQ(handler.count(), 0U);
    EXPECT_EQ(vb.get("fullScreen"), false);
    EXPECT_FALSE(modelOf(vb).PluginBase::isFullScreen());
}

TEST_F(VideoBroadcastTest, AChangeOfFullScreenIsLogged) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject vb = embed();
        platform.TELIX_JS_VB_SetFullScreen = [](TELIX_JS_VB_HANDLE, ___UINT8) { return 1; };
        vb.call("setFullScreen", true);
        platform.TELIX_JS_VB_SetFullScreen = nullptr;
        vb.call("setFullScreen", true);
    });
    EXPECT_THAT(text, HasSubstr(logLine("VIDEOBCAST", "setFullScreenChange",
                                        "is called m_isFullScreen = 0, bFullScreen = 1 \n")));
    EXPECT_THAT(text,
                HasSubstr(logLine(
                    "VIDEOBCAST", "setFullScreenChange",
                    "TELIX_JS_VB_SetFullScreen is not called :: bFullScreen: 1 :: m_isFullScreen :0 \n")));
    EXPECT_THAT(text, HasSubstr(logLine(
                          "VIDEOBCAST", "setFullScreenChange",
                          "TELIX_JS_VB_SetFullScreen is called :: bFullScreen: 1 :: m_isFullScreen :1 \n")));
}

// ---- Display area

TEST_F(VideoBroadcastTest, TheDisplayAreaFollowsTheElementNotTheBrowsersRecord) {
    const EmbeddedObject vb = embed();
    vb.setRectangle(10, 20.9, 110.5, 220);
    log.clear();
    vb.setWindow(1, 2, 3, 4);
    // The edges are cut to integers one by one.
    log.expectInOrder({"TELIX_JS_VB_SetDisplayArea(7, {10,20,100,200})"});
    EXPECT_EQ(platform.TELIX_JS_VB_SetDisplayArea.count(), 1U);
    vb.setRectangle(30, 20, 130, 220);
    vb.setWindow(1, 2, 3, 4);
    EXPECT_TRUE(log.contains("TELIX_JS_VB_SetDisplayArea(7, {30,20,100,200})"));
}

TEST_F(VideoBroadcastTest, TheRectangleIsReadAndTheAreaInvalidatedBeforeThePlatformIsTold) {
    const EmbeddedObject vb = embed();
    vb.setRectangle(10, 20, 110, 220);
    log.clear();
    vb.setWindow(0, 0, 0, 0);
    const std::string element = vb.element().name();
    EXPECT_THAT(log.calls(),
                ElementsAre("NPN_Invoke " + element + ".getBoundingClientRect()",
                            "NPN_GetProperty rectangle.left", "NPN_GetProperty rectangle.top",
                            "NPN_GetProperty rectangle.right", "NPN_GetProperty rectangle.bottom",
                            "NPN_InvalidateRect top 20 left 10 bottom 220 right 110",
                            "TELIX_JS_VB_SetDisplayArea(7, {10,20,100,200})"));
}

TEST_F(VideoBroadcastTest, AnUnchangedRectangleIsToldOnce) {
    const EmbeddedObject vb = embed();
    vb.setRectangle(10, 20, 110, 220);
    log.clear();
    vb.setWindow(0, 0, 0, 0);
    vb.setWindow(0, 0, 0, 0);
    EXPECT_EQ(platform.TELIX_JS_VB_SetDisplayArea.count(), 1U);
    EXPECT_EQ(log.count("NPN_InvalidateRect"), 1U);
}

TEST_F(VideoBroadcastTest, ARefusedRectangleIsTriedAgain) {
    const EmbeddedObject vb = embed();
    vb.setRectangle(10, 20, 110, 220);
    platform.TELIX_JS_VB_SetDisplayArea = [](TELIX_JS_VB_HANDLE, const TELIX_JS_DISPLAY_AREA*) { return 1; };
    log.clear();
    vb.setWindow(0, 0, 0, 0);
    platform.TELIX_JS_VB_SetDisplayArea = nullptr;
    vb.setWindow(0, 0, 0, 0);
    vb.setWindow(0, 0, 0, 0);
    EXPECT_EQ(platform.TELIX_JS_VB_SetDisplayArea.count(), 2U);
    EXPECT_EQ(log.count("NPN_InvalidateRect"), 2U);
}

TEST_F(VideoBroadcastTest, AForcedResetTellsThePlatformAgain) {
    const EmbeddedObject vb = embed();
    vb.setRectangle(10, 20, 110, 220);
    vb.setWindow(0, 0, 0, 0);
    const NPWindow window{};
    modelOf(vb).setWindow(&window, true);
    EXPECT_EQ(platform.TELIX_JS_VB_SetDisplayArea.count(), 2U);
}

TEST_F(VideoBroadcastTest, AFullScreenObjectTakesTheWholeScreen) {
    const EmbeddedObject vb = embed();
    vb.setRectangle(10, 20, 110, 220);
    vb.call("setFullScreen", true);
    log.clear();
    vb.setWindow(0, 0, 0, 0);
    EXPECT_TRUE(log.contains("TELIX_JS_VB_SetDisplayArea(7, {0,0,1280,720})"));
}

TEST_F(VideoBroadcastTest, AnEmptyRectangleIsReadTwiceAndTheWholeScreenIsPlacedAtTheOrigin) {
    const EmbeddedObject vb = embed();
    int readings = 0;
    vb.element().method("getBoundingClientRect", [&](const Values&) {
        const ScriptObject rectangle = browser.scriptObject("rectangle");
        const bool first = readings++ == 0;
        rectangle.set("left", first ? 0 : 8);
        rectangle.set("top", first ? 0 : 9);
        rectangle.set("right", first ? 0 : 8 + 1280);
        rectangle.set("bottom", first ? 0 : 9 + 720);
        return Value(rectangle);
    });
    log.clear();
    vb.setWindow(0, 0, 0, 0);
    EXPECT_EQ(readings, 2);
    EXPECT_TRUE(log.contains("TELIX_JS_VB_SetDisplayArea(7, {0,0,1280,720})")) << log.text();
}

TEST_F(VideoBroadcastTest, AnotherSizeOfTheSecondReadingStaysWhereItIs) {
    const EmbeddedObject vb = embed();
    int readings = 0;
    vb.element().method("getBoundingClientRect", [&](const Values&) {
        const ScriptObject rectangle = browser.scriptObject("rectangle");
        const bool first = readings++ == 0;
        rectangle.set("left", first ? 0 : 8);
        rectangle.set("top", first ? 0 : 9);
        rectangle.set("right", first ? 0 : 8 + 1280);
        rectangle.set("bottom", first ? 0 : 9 + 719);
        return Value(rectangle);
    });
    vb.setWindow(0, 0, 0, 0);
    EXPECT_TRUE(log.contains("TELIX_JS_VB_SetDisplayArea(7, {8,9,1280,719})")) << log.text();
}

TEST_F(VideoBroadcastTest, AWholeScreenOfTheFirstReadingStaysWhereItIs) {
    const EmbeddedObject vb = embed();
    vb.setRectangle(8, 9, 8 + 1280, 9 + 720);
    vb.setWindow(0, 0, 0, 0);
    EXPECT_TRUE(log.contains("TELIX_JS_VB_SetDisplayArea(7, {8,9,1280,720})"));
}

TEST_F(VideoBroadcastTest, ARectangleBeyondTheScreenIsCutTo16Bits) {
    const EmbeddedObject vb = embed();
    vb.setRectangle(-1, 65536 + 5, 99, 65536 + 15);
    vb.setWindow(0, 0, 0, 0);
    EXPECT_TRUE(log.contains("TELIX_JS_VB_SetDisplayArea(7, {65535,5,100,10})")) << log.text();
}

TEST_F(VideoBroadcastTest, AnElementThatTellsNoRectangleKeepsTheFormerOne) {
    const EmbeddedObject vb = embed();
    vb.setRectangle(10, 20, 110, 220);
    vb.setWindow(0, 0, 0, 0);
    vb.element().refuse("getBoundingClientRect");
    log.clear();
    vb.setWindow(0, 0, 0, 0);
    EXPECT_THAT(platformCalls(), IsEmpty());
}

TEST_F(VideoBroadcastTest, AnElementWhoseRectangleIsNoObjectKeepsTheFormerOne) {
    const EmbeddedObject vb = embed();
    vb.setRectangle(10, 20, 110, 220);
    vb.setWindow(0, 0, 0, 0);
    log.clear();
    for (const Value& other :
         {Value(undefined), Value(nullptr), Value(true), Value(7), Value(5e-310), Value("text")}) {
        vb.element().method("getBoundingClientRect", [other](const Values&) { return other; });
        vb.setWindow(0, 0, 0, 0);
    }
    EXPECT_THAT(platformCalls(), IsEmpty());
    EXPECT_THAT(log.startingWith("NPN_GetProperty"), IsEmpty());
}

TEST_F(VideoBroadcastTest, AnEdgeThatCannotBeReadKeepsItsFormerValue) {
    const EmbeddedObject vb = embed();
    vb.setRectangle(10, 20, 110, 220);
    vb.setWindow(0, 0, 0, 0);
    vb.element().method("getBoundingClientRect", [&](const Values&) {
        const ScriptObject rectangle = browser.scriptObject("rectangle");
        rectangle.refuse("left");
        rectangle.set("top", 30);
        rectangle.set("right", 60);
        rectangle.refuse("bottom");
        return Value(rectangle);
    });
    vb.setWindow(0, 0, 0, 0);
    EXPECT_TRUE(log.contains("TELIX_JS_VB_SetDisplayArea(7, {10,30,50,200})")) << log.text();
}

TEST_F(VideoBroadcastTest, ThePlacingIsLogged) {
    const std::string text = logOf(6, [&] {
        const EmbeddedObject vb = embed();
        vb.setRectangle(10, 20, 110, 220);
        platform.TELIX_JS_VB_SetDisplayArea = [](TELIX_JS_VB_HANDLE, const TELIX_JS_DISPLAY_AREA*) {
            return 1;
        };
        vb.setWindow(0, 0, 0, 0);
        platform.TELIX_JS_VB_SetDisplayArea = nullptr;
        vb.setWindow(0, 0, 0, 0);
        vb.setWindow(0, 0, 0, 0);
    });
    const auto line = [](const std::string& statement) {
        return logLine("VIDEOBCAST", "setWindow", statement);
    };
    const std::string values =
        line("Window Values:: m_X: 10, m_Y: 20, m_width: 100, m_height: 200, bForceReset: 0 \n");
    EXPECT_THAT(text,
                HasSubstr(values + line("TELIX_JS_VB_SetDisplayArea failed: \n") + line("Call Ended \n") +
                          values + line("Call Ended \n") + values +
                          line("setWindow Condition failed::m_vbHandle ( 7 )\n") + line("Call Ended \n")));
}

TEST_F(VideoBroadcastTest, ANullWindowPlacesNothing) {
    const EmbeddedObject vb = embed();
    vb.setRectangle(10, 20, 110, 220);
    EXPECT_EQ(vb.setNullWindow(), NPERR_NO_ERROR);
    EXPECT_EQ(platform.TELIX_JS_VB_SetDisplayArea.count(), 0U);
}

// ---- Release

TEST_F(VideoBroadcastTest, AReleaseByScriptIsFollowedByAnotherAtTheEnd) {
    const EmbeddedObject vb = embed();
    log.clear();
    EXPECT_TRUE(vb.call("release"));
    vb.destroy();
    EXPECT_EQ(log.count("TELIX_JS_VB_Release(7)"), 2U);
}

TEST_F(VideoBroadcastTest, AReleasedObjectStillCallsThePlatformWithItsHandle) {
    const EmbeddedObject vb = embed();
    vb.call("release");
    log.clear();
    vb.call("stop");
    EXPECT_THAT(platformCalls(), ElementsAre("TELIX_JS_VB_Stop(7)"));
}

TEST_F(VideoBroadcastTest, AReleaseWithoutHandleIsLogged) {
    EXPECT_THAT(logOf(6, [&] { embedWithoutHandle().call("release"); }),
                HasSubstr(logLine("VIDEOBCAST", "release", "TELIX_JS_VB_Release is not called :0 \n")));
}

} // namespace
