// The A/V control object: creation from attributes, choice of media, `data`, display area, end.
#include <cstdlib>

#include "common/PluginUtils.h"
#include "src/avcontrol/AVControl.h"
#include "tests/unit/avcontrol/AVControlTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

namespace avcontrol {
namespace {

class AVControlObject : public AVControlTest {};

// Creation

TEST_F(AVControlObject, APlayerIsMadeAndBothCallbacksAreRegistered) {
    element("video/mp4", {{"id", "video"}});
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_CreatePlayer(out, 512, 0, 0)",
                                           "TELIX_JS_AV_RegisterOnPlayStateChange(7, callback)",
                                           "TELIX_JS_AV_RegisterOnDRMRightsError(7, callback)"));
}

TEST_F(AVControlObject, TheElementIsStyledBeforeItsAttributesAreRead) {
    const EmbeddedObject object = element("video/mp4", {{"data", "http://media.example/a.mp4"}});
    EXPECT_EQ(object.element().get("style").object().get("backgroundImage"), "url(tv:)");
    EXPECT_EQ(object.element().get("style").object().get("backgroundColor"), "transparent");
    log.expectInOrder({"NPN_SetProperty element.style.backgroundColor = \"transparent\"",
                       "TELIX_JS_AV_CreatePlayer(out, 512, 0, 0)"});
}

TEST_F(AVControlObject, WithoutAnAddressThereIsAPlayerAndNothingPlays) {
    const EmbeddedObject object = element("video/mp4", {});
    EXPECT_EQ(log.count("NPN_PluginThreadAsyncCall"), 1u);
    EXPECT_EQ(log.count("NPN_GetURLNotify"), 0u);
    browser.pump();
    EXPECT_EQ(platform.TELIX_JS_AV_Play.count(), 0u);
    EXPECT_EQ(object.call("play", 1), false);
    EXPECT_EQ(state(object), Stopped);
}

TEST_F(AVControlObject, APlayerThatIsRefusedFailsTheElement) {
    platform.TELIX_JS_AV_CreatePlayer = [](TELIX_JS_AV_HANDLE*, int32_t, int32_t, uint32_t) { return 9; };
    const EmbeddedObject object = element("video/mp4", {{"id", "video"}});
    EXPECT_EQ(object.error(), NPERR_GENERIC_ERROR);
    EXPECT_EQ(object.model(), nullptr);
    // The object is gone: it takes its callbacks back, which were never given.
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_CreatePlayer(out, 512, 0, 0)",
                                           "TELIX_JS_AV_UnregisterOnPlayStateChange(callback)",
                                           "TELIX_JS_AV_UnregisterOnDRMRightsError(callback)"));
    browser.pump(); // what was posted for it does nothing
}

TEST_F(AVControlObject, AnAddressOfTheNetworkIsFetchedByTheObject) {
    element("video/mp4", {{"src", "http://media.example/a.mp4"}});
    EXPECT_THAT(log.startingWith("NPN_GetURLNotify"),
                ElementsAre("NPN_GetURLNotify \"http://media.example/a.mp4\" null"));
    EXPECT_EQ(log.count("NPN_PluginThreadAsyncCall"), 0u);
    log.expectInOrder(
        {"NPN_GetURLNotify \"http://media.example/a.mp4\" null", "TELIX_JS_AV_CreatePlayer(out, 512, 0, 0)"});
}

TEST_F(AVControlObject, AnAddressWhoseSchemeIsInCapitalsIsNotFetched) {
    element("video/mp4", {{"src", "HTTP://media.example/a.mp4"}});
    EXPECT_EQ(log.count("NPN_GetURLNotify"), 0u);
    EXPECT_EQ(log.count("NPN_PluginThreadAsyncCall"), 1u);
}

TEST_F(AVControlObject, AnAddressOfAnotherSchemeIsNotFetched) {
    element("video/mp4", {{"src", "mms://media.example/a.wmv"}});
    EXPECT_EQ(log.count("NPN_GetURLNotify"), 0u);
}

TEST_F(AVControlObject, DataSrc1AndOneShotKeepTheObjectFromFetching) {
    for (const Attributes& attributes :
         {Attributes{{"data", "http://media.example/a.mp4"}},
          Attributes{{"src1", "http://media.example/a.mp4"}},
          Attributes{{"src", "http://media.example/a.mp4"}, {"ONESHOT_URL", "True"}}}) {
        element("video/mp4", attributes);
        EXPECT_EQ(log.count("NPN_GetURLNotify"), 0u) << attributes.back().first;
    }
    element("video/mp4", {{"src", "http://media.example/a.mp4"}, {"oneshot_url", "no"}});
    EXPECT_EQ(log.count("NPN_GetURLNotify"), 1u);
}

TEST_F(AVControlObject, Src1AndOneShotAreToldToThePlatform) {
    const EmbeddedObject one = element("video/mp4", {{"src1", "http://media.example/a.mp4"}});
    one.call("play", 1);
    EXPECT_TRUE(log.contains(playOf("http://media.example/a.mp4", 7, 1, 7)));
    const EmbeddedObject other =
        element("video/mp4", {{"src", "http://media.example/b.mp4"}, {"oneshot_url", "TRUE"}});
    other.call("play", 1);
    EXPECT_TRUE(log.contains(playOf("http://media.example/b.mp4", 8, 1, 7)));
}

TEST_F(AVControlObject, PlayCountIsHandedToThePlatform) {
    video(kClip, {{"PlayCount", "3"}}).call("play", 1);
    EXPECT_TRUE(log.contains(playOf(kClip, 7, 3)));
}

TEST_F(AVControlObject, AFullPageObjectSendsThePageToThePlayerAndMakesNone) {
    const EmbeddedObject object =
        browser.embed("video/mp4", {{"src", "http://media.example/a b.mp4"}}, NP_FULL);
    EXPECT_EQ(object.error(), NPERR_NO_ERROR);
    EXPECT_THAT(log.startingWith("NPN_GetURL"),
                ElementsAre("NPN_GetURL \"file:///mnt/browser/pages/player/index.html"
                            "?qv_media_url=http://media.example/a b.mp4\" \"_self\""));
    EXPECT_THAT(playerCalls(), IsEmpty());
    EXPECT_EQ(object.call("play", 1), false);
}

TEST_F(AVControlObject, ThePlayerPageComesFromTheEnvironment) {
    setenv("PLUGIN_PLAYER_URL", "http://set.example/player", 1);
    browser.refuse("NPN_GetURL"); // a log line only
    const EmbeddedObject object = browser.embed("video/mp4", {}, NP_FULL);
    EXPECT_EQ(object.error(), NPERR_NO_ERROR);
    EXPECT_THAT(log.startingWith("NPN_GetURL"),
                ElementsAre("NPN_GetURL \"http://set.example/player?qv_media_url=\" \"_self\""));
}

TEST_F(AVControlObject, BothNumbersOfAFailedPlayerPageAreInTheLog) {
    const std::string printed = logOf(5, [&] {
        browser.refuse("NPN_GetURL");
        browser.embed("video/mp4", {}, NP_FULL);
    });
    EXPECT_THAT(printed, HasSubstr("NPN_GetURL failed for URL:: file:///mnt/browser/pages/player/"
                                   "index.html?qv_media_url= "));
}

// Buffering limits, seen by the monitor: it pauses below the lower one and resumes at the upper one.

class AVControlLimits : public AVControlTest {
protected:
    // The lowest amounts at which the monitor doesn't pause, and resumes.
    std::pair<unsigned, unsigned> limits(const Attributes& attributes) {
        const EmbeddedObject object = playingVideo(kClip, attributes);
        clock.await(1);
        unsigned lower = 20;
        for (clock.second(); platform.TELIX_JS_AV_Pause.count() == 0; clock.second()) {
            report(info(--lower));
        }
        unsigned upper = lower;
        for (; platform.TELIX_JS_AV_Resume.count() == 0; clock.second()) {
            report(info(++upper));
        }
        destroy(object);
        return {lower + 1, upper};
    }
};

TEST_F(AVControlLimits, AreFourAndTenSeconds) {
    EXPECT_EQ(limits({}), std::make_pair(4u, 10u));
}

TEST_F(AVControlLimits, ComeFromTheEnvironment) {
    setenv("PLUGIN_BUFFERING_LOWER_LIMIT", "6", 1);
    setenv("PLUGIN_BUFFERING_UPPER_LIMIT", "13", 1);
    EXPECT_EQ(limits({}), std::make_pair(6u, 13u));
}

TEST_F(AVControlLimits, OfAnAttributeOverruleTheEnvironment) {
    setenv("PLUGIN_BUFFERING_LOWER_LIMIT", "6", 1);
    setenv("PLUGIN_BUFFERING_UPPER_LIMIT", "13", 1);
    EXPECT_EQ(limits({{"bufferinglowerlimit", "3"}, {"bufferingUpperLimit", "15"}}), std::make_pair(3u, 15u));
}

TEST_F(AVControlLimits, AreToldInTheLog) {
    const std::string byDefault = logOf(5, [&] { element("video/mp4", {}); });
    EXPECT_THAT(byDefault, HasSubstr("Lower limit obtained from default value 4"));
    EXPECT_THAT(byDefault, HasSubstr("Upper limit obtained from default value 10"));
    setenv("PLUGIN_BUFFERING_LOWER_LIMIT", "1", 1);
    setenv("PLUGIN_BUFFERING_UPPER_LIMIT", "2", 1);
    const std::string given = logOf(5, [&] { element("video/mp4", {}); });
    EXPECT_THAT(given, HasSubstr("Lower limit obtained from system: 1"));
    EXPECT_THAT(given, HasSubstr("Upper limit obtained from system: 2"));
}

// MIME types

struct MimeType {
    const char* type;
    int container;
    int codec;
    int source;
};

class AVControlMimeType : public AVControlTest, public ::testing::WithParamInterface<MimeType> {};

TEST_P(AVControlMimeType, SaysWhatThePlatformIsToldOfTheMedia) {
    const MimeType& row = GetParam();
    const EmbeddedObject object = element(row.type, {{"id", "video"}, {"data", kClip}});
    EXPECT_TRUE(log.contains("TELIX_JS_AV_CreatePlayer(out, " + std::to_string(row.container) + ", " +
                             std::to_string(row.codec) + ", 0)"));
    EXPECT_EQ(object.call("play", 1), true);
    EXPECT_TRUE(log.contains(playOf(kClip, 7, 1, row.source, row.container, row.codec)));
}

INSTANTIATE_TEST_SUITE_P(
    Rows, AVControlMimeType,
    ::testing::Values(MimeType{"audio/mpeg", 2, 1, 6}, MimeType{"audio/mp4", 512, 4, 6},
                      MimeType{"video/mp4", 512, 0, 6}, MimeType{"video/mpeg", 512, 0, 6},
                      MimeType{"video/mpeg4", 512, 0, 6}, MimeType{"video/x-ms-ism", 512, 0, 23},
                      MimeType{"application/vnd.ms-sstr+xml", 512, 0, 23},
                      MimeType{"application/vnd.apple.mpegurl", 512, 0, 25},
                      MimeType{"audio/mpegurl", 512, 0, 25}, MimeType{"VIDEO/MP4", 512, 0, 6},
                      MimeType{"Audio/MpegURL", 512, 0, 25}));

TEST_F(AVControlObject, AnUnknownTypeStaysUnknownWhateverItsAddressEndsIn) {
    const EmbeddedObject object =
        element("video/mp4", {{"id", "video"}, {"src", "http://media.example/a.mp4"}});
    // The headers of a stream take the place of the MIME type.
    object.newStream("http://other.example/a", "Content-Type: application/octet-stream\r\n").write("data");
    object.set("data", "http://media.example/b.mp4");
    object.call("play", 1);
    EXPECT_TRUE(log.contains(playOf("http://media.example/b.mp4", 7, 1, 6, 1280, 0)));
}

// data

TEST_F(AVControlObject, ARelativeAddressReadsBackAbsoluteAndEncoded) {
    browser.setAddress("http://page.example/app/index.html");
    const EmbeddedObject object = video();
    object.set("data", "films/a clip.mp4");
    EXPECT_EQ(object.get("data"), "http://page.example/app/films/a%20clip.mp4");
}

TEST_F(AVControlObject, AnEncodedAddressIsTheOnePlayed) {
    const EmbeddedObject object = video("http://media.example/a clip.mp4");
    object.call("play", 1);
    EXPECT_TRUE(log.contains(playOf("http://media.example/a%20clip.mp4")));
}

TEST_F(AVControlObject, APageThatCannotEncodeKeepsTheAddressBefore) {
    const EmbeddedObject object = video();
    browser.refuse("NPN_Invoke");
    object.set("data", "http://media.example/other.mp4");
    browser.permit("NPN_Invoke");
    EXPECT_EQ(object.get("data"), kClip);
}

TEST_F(AVControlObject, AnEncoderThatGivesNoTextKeepsTheAddressBefore) {
    const EmbeddedObject object = video();
    const ScriptObject wrong = browser.scriptObject("wrong");
    browser.whenEvaluatingTextFrom("window.getEncodedURL = ").does([this, wrong](const Evaluation&) {
        browser.window().method("getEncodedURL", [wrong](const Values&) { return Value(wrong); });
        return undefined;
    });
    object.set("data", "http://media.example/other.mp4");
    EXPECT_EQ(object.get("data"), kClip);
    EXPECT_EQ(wrong.pluginReferences(), 0); // the result was released
}

TEST_F(AVControlObject, AnEmptyAddressReadsAsNull) {
    const EmbeddedObject object = video();
    object.set("data", "");
    EXPECT_EQ(object.get("data"), nullptr);
    EXPECT_EQ(object.call("play", 1), false);
    EXPECT_EQ(platform.TELIX_JS_AV_Play.count(), 0u);
}

TEST_F(AVControlObject, ANewAddressStopsWhatPlays) {
    const EmbeddedObject object = playingVideo();
    object.set("data", "http://media.example/other.mp4");
    EXPECT_EQ(state(object), Stopped);
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_Stop(7)"));
}

TEST_F(AVControlObject, ANewAddressIsResolvedAfterTheStopThenEncodedThenFetched) {
    const EmbeddedObject object = element("video/mp4", {{"id", "video"}, {"src", kClip}});
    object.call("play", 1);
    log.clear();
    object.set("data", "next one.mp4");
    const std::string url = "http://page.example/app/next one.mp4";
    log.expectInOrder({"TELIX_JS_AV_Stop(7)", "event PlayStateChange at video",
                       "NPN_Evaluate window \"document.location.href\"",
                       "NPN_Evaluate window \"" + getEncodedURL(url) + "\"",
                       "NPN_Invoke window.getEncodedURL()",
                       "NPN_GetURLNotify \"http://page.example/app/next%20one.mp4\" null"});
    EXPECT_EQ(log.count("NPN_Invoke window"), 1u);
    EXPECT_EQ(log.count("NPN_GetURLNotify"), 1u);
}

TEST_F(AVControlObject, ANewAddressIsFetchedUnlessTheElementHadData) {
    const EmbeddedObject plain = element("video/mp4", {{"id", "plain"}});
    plain.set("data", "rtsp://media.example/a");
    EXPECT_THAT(log.startingWith("NPN_GetURLNotify"),
                ElementsAre("NPN_GetURLNotify \"rtsp://media.example/a\" null"));
    plain.set("data", ""); // an empty one isn't
    EXPECT_EQ(log.count("NPN_GetURLNotify"), 1u);
    const EmbeddedObject withData = video();
    withData.set("data", "http://media.example/other.mp4");
    EXPECT_EQ(log.count("NPN_GetURLNotify"), 0u);
}

TEST_F(AVControlObject, AShortSoundMarksTheObjectForGood) {
    for (const char* sound : {"http://media.example/a.wav", "http://media.example/a.AAC"}) {
        const EmbeddedObject object = video(sound);
        object.set("data", kClip);
        EXPECT_EQ(object.call("play", 1), true) << sound;
        EXPECT_EQ(state(object), Stopped) << sound; // sounds change no state
        destroy(object);
    }
}

TEST_F(AVControlObject, AShortSoundInTheDataIsToldWhenThePlayerIsMade) {
    element("audio/mp4", {{"data", "http://media.example/a.wav"}});
    EXPECT_TRUE(log.contains("TELIX_JS_AV_CreatePlayer(out, 512, 4, 1)"));
}

TEST_F(AVControlObject, ASmoothStreamingAddressMarksTheObjectForGood) {
    const EmbeddedObject object = video("http://media.example/film.ISM/manifest");
    object.call("play", 1);
    EXPECT_TRUE(log.contains(playOf("http://media.example/film.ISM/manifest", 7, 1, 23)));
    object.set("data", kClip);
    object.call("play", 1);
    EXPECT_TRUE(log.contains(playOf(kClip, 7, 1, 23)));
}

TEST_F(AVControlObject, AnExtensionBeforeTheLastDotDoesNotCount) {
    const EmbeddedObject object = video("http://media.example/a.ism/b.mp4");
    object.call("play", 1);
    EXPECT_TRUE(log.contains(playOf("http://media.example/a.ism/b.mp4")));
}

TEST_F(AVControlObject, WhatMarksAnAddressIsInTheLog) {
    EXPECT_THAT(logOf(5, [&] { video("http://media.example/a.wav"); }),
                HasSubstr("Memory audio with file extension .aac or .wav "));
    EXPECT_THAT(logOf(5, [&] { video("http://media.example/a.ism"); }), HasSubstr("Smooth streaming URL "));
    EXPECT_THAT(logOf(5, [&] { element("audio/mpegurl", {}); }), HasSubstr("HLS mimetype "));
    EXPECT_THAT(logOf(5, [&] { element("video/x-ms-ism", {}); }),
                HasSubstr("video/x-ms-ism mimetype or application/vnd.ms-sstr+xml mimetype "));
    EXPECT_THAT(logOf(5, [&] { element("video/mp4", {}); }),
                HasSubstr("TELIX_JS_AV_CreatePlayer returned the PlayerHandle:: 7 "));
}

// Display area

TEST_F(AVControlObject, TheElementsPlaceIsGivenToThePlatform) {
    const EmbeddedObject object = video();
    object.setRectangle(100.9, 50.2, 740, 410);
    EXPECT_EQ(object.setWindow(1, 2, 3, 4), NPERR_NO_ERROR); // the record itself isn't read
    log.expectInOrder({"NPN_InvalidateRect top 50 left 100 bottom 410 right 740",
                       "TELIX_JS_AV_SetDisplayArea(7, {100,50,640,360})"});
    EXPECT_EQ(object.get("width"), 640);
    EXPECT_EQ(object.get("height"), 360);
}

TEST_F(AVControlObject, TheEdgesAreReadInOrderAndReleased) {
    const EmbeddedObject object = video();
    object.setRectangle(0, 0, 640, 360);
    object.setWindow(0, 0, 0, 0);
    log.expectInOrder({"NPN_Invoke video.getBoundingClientRect()", "NPN_GetProperty rectangle.left",
                       "NPN_GetProperty rectangle.top", "NPN_GetProperty rectangle.right",
                       "NPN_GetProperty rectangle.bottom"});
    EXPECT_EQ(browser.liveCount("rectangle"), 0u);
}

TEST_F(AVControlObject, AnUnchangedPlaceIsNotToldAgain) {
    const EmbeddedObject object = video();
    object.setRectangle(0, 0, 640, 360);
    object.setWindow(0, 0, 0, 0);
    object.setWindow(0, 0, 0, 0);
    EXPECT_EQ(platform.TELIX_JS_AV_SetDisplayArea.count(), 1u);
    EXPECT_EQ(log.count("NPN_InvalidateRect"), 1u);
    object.setRectangle(0, 0, 641, 360);
    object.setWindow(0, 0, 0, 0);
    EXPECT_EQ(platform.TELIX_JS_AV_SetDisplayArea.count(), 2u);
}

TEST_F(AVControlObject, AForcedResetTellsAnUnchangedPlaceAgain) {
    const EmbeddedObject object = video();
    object.setRectangle(0, 0, 640, 360);
    object.setWindow(0, 0, 0, 0);
    log.clear();
    EXPECT_EQ(static_cast<AVControl*>(object.model())->setWindow(nullptr, true), NPERR_NO_ERROR);
    log.expectInOrder({"NPN_InvalidateRect top 0 left 0 bottom 360 right 640",
                       "TELIX_JS_AV_SetDisplayArea(7, {0,0,640,360})"});
}

TEST_F(AVControlObject, APlaceThatThePlatformRefusedIsToldAgain) {
    const EmbeddedObject object = video();
    object.setRectangle(0, 0, 640, 360);
    platform.TELIX_JS_AV_SetDisplayArea = [](TELIX_JS_AV_HANDLE, const TELIX_JS_DISPLAY_AREA*) { return 1; };
    object.setWindow(0, 0, 0, 0);
    platform.TELIX_JS_AV_SetDisplayArea = nullptr;
    object.setWindow(0, 0, 0, 0);
    EXPECT_EQ(platform.TELIX_JS_AV_SetDisplayArea.count(), 2u);
}

TEST_F(AVControlObject, InFullScreenTheAreaIsTheScreenOfThePage) {
    const EmbeddedObject object = video();
    object.setRectangle(100, 50, 740, 410);
    object.call("setFullScreen", true);
    object.setWindow(0, 0, 0, 0);
    EXPECT_TRUE(log.contains("TELIX_JS_AV_SetDisplayArea(7, {0,0,1280,720})"));
    object.call("setFullScreen", false);
    object.setWindow(0, 0, 0, 0);
    EXPECT_TRUE(log.contains("TELIX_JS_AV_SetDisplayArea(7, {100,50,640,360})"));
}

TEST_F(AVControlObject, AnEmptyPlaceIsReadAgain) {
    const EmbeddedObject object = video();
    int reads = 0;
    const auto answers = [&](double left, double top, double right, double bottom) {
        object.element().method("getBoundingClientRect", [=, &reads](const Values&) {
            const bool first = ++reads == 1;
            const ScriptObject rectangle = ScriptObject::make("rectangle");
            rectangle.set("left", first ? 0 : left);
            rectangle.set("top", first ? 0 : top);
            rectangle.set("right", first ? 0 : right);
            rectangle.set("bottom", first ? 0 : bottom);
            return Value(rectangle);
        });
    };
    answers(5, 6, 105, 206);
    object.setWindow(0, 0, 0, 0);
    EXPECT_EQ(reads, 2);
    EXPECT_TRUE(log.contains("TELIX_JS_AV_SetDisplayArea(7, {5,6,100,200})"));
    reads = 0;
    answers(5, 6, 1285, 726); // as large as the page's screen: at its origin
    object.setWindow(0, 0, 0, 0);
    EXPECT_TRUE(log.contains("TELIX_JS_AV_SetDisplayArea(7, {0,0,1280,720})"));
}

TEST_F(AVControlObject, AScreenSizedPlaceThatWasNotEmptyKeepsItsOrigin) {
    const EmbeddedObject object = video();
    object.setRectangle(5, 6, 1285, 726);
    object.setWindow(0, 0, 0, 0);
    EXPECT_TRUE(log.contains("TELIX_JS_AV_SetDisplayArea(7, {5,6,1280,720})"));
}

TEST_F(AVControlObject, AnElementWithoutAPlaceIsNoChange) {
    const EmbeddedObject object = video();
    object.setWindow(0, 0, 0, 0);
    EXPECT_EQ(platform.TELIX_JS_AV_SetDisplayArea.count(), 0u);
}

TEST_F(AVControlObject, WhatCannotBeReadStaysAsItWas) {
    const EmbeddedObject object = video();
    object.setRectangle(10, 20, 110, 220);
    object.setWindow(0, 0, 0, 0);
    log.clear();
    object.element().method("getBoundingClientRect", [](const Values&) {
        const ScriptObject rectangle = ScriptObject::make("rectangle");
        rectangle.refuse("left");
        rectangle.set("top", 30);
        rectangle.set("right", 310);
        rectangle.refuse("bottom");
        return Value(rectangle);
    });
    object.setWindow(0, 0, 0, 0);
    EXPECT_TRUE(log.contains("TELIX_JS_AV_SetDisplayArea(7, {10,30,300,200})"));
    log.clear();
    object.element().refuse("getBoundingClientRect");
    object.setWindow(0, 0, 0, 0);
    EXPECT_EQ(log.count("TELIX_JS_AV_SetDisplayArea"), 0u);
}

TEST_F(AVControlObject, ARectangleThatIsNotAnObjectIsNotRead) {
    const EmbeddedObject object = video();
    object.setRectangle(10, 20, 110, 220);
    object.setWindow(0, 0, 0, 0);
    for (const Value& value : {Value(nullptr), Value(undefined), Value(5), Value("text")}) {
        object.element().method("getBoundingClientRect", [&](const Values&) { return value; });
        log.clear();
        object.setWindow(0, 0, 0, 0);
        EXPECT_EQ(log.count("NPN_GetProperty"), 0u) << value;
    }
    EXPECT_EQ(platform.TELIX_JS_AV_SetDisplayArea.count(), 1u);
}

TEST_F(AVControlObject, EdgesFarApartWrapAround) {
    const EmbeddedObject object = video();
    object.setRectangle(-2147483648.0, 20, 2147483647, 220);
    object.setWindow(0, 0, 0, 0);
    EXPECT_EQ(object.get("width"), -1);
    EXPECT_TRUE(log.contains("TELIX_JS_AV_SetDisplayArea(7, {0,20,65535,200})"));
}

TEST_F(AVControlObject, AFullPageObjectHasNoPlayerToPlace) {
    const EmbeddedObject object = browser.embed("video/mp4", {}, NP_FULL);
    object.setRectangle(0, 0, 640, 360);
    EXPECT_EQ(object.setWindow(0, 0, 0, 0), NPERR_NO_ERROR);
    EXPECT_THAT(playerCalls(), IsEmpty());
}

// The end

TEST_F(AVControlObject, TheObjectOutlivesItsInstanceByOneTurn) {
    const EmbeddedObject object = video();
    log.clear();
    object.destroy();
    EXPECT_EQ(object.model(), nullptr);
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_Stop(7)", "TELIX_JS_AV_DestroyPlayer(7)"));
    log.clear();
    browser.pump();
    EXPECT_THAT(playerCalls(), ElementsAre("TELIX_JS_AV_UnregisterOnPlayStateChange(callback)",
                                           "TELIX_JS_AV_UnregisterOnDRMRightsError(callback)"));
    EXPECT_EQ(clock.browserSleeps(), 0u);
}

TEST_F(AVControlObject, ListenersAreReleasedInOrderButForTheOneOfFullScreen) {
    const EmbeddedObject object = video();
    const char* const properties[] = {"onPlayStateChange", "onPlaySpeedChanged", "onPlayPositionChanged",
                                      "onFullScreenChange", "onDRMRightsError"};
    std::vector<ScriptFunction> listeners;
    for (const char* property : properties) {
        listeners.push_back(browser.function(property));
        object.set(property, listeners.back());
        EXPECT_EQ(listeners.back().pluginReferences(), 1) << property;
    }
    platform.TELIX_JS_AV_GetComponents = [](TELIX_JS_AV_HANDLE, TELIX_JS_AVCOMPTYPE,
                                            TELIX_JS_AVCOMPHANDLE** out, uint32_t*) {
        static TELIX_JS_AVCOMPHANDLE none[1];
        *out = none;
        return 0;
    };
    for (const int type : {2, 0, 1}) { // so that the order of their creation is not that of their release
        object.call("getComponents", type);
    }
    object.dropScriptObject();
    object.destroy();
    log.clear();
    browser.pump();
    const BorderLog::Entries released = log.startingWith("NPN_ReleaseObject");
    EXPECT_THAT(released,
                ElementsAre("NPN_ReleaseObject onPlayStateChange", "NPN_ReleaseObject onPlaySpeedChanged",
                            "NPN_ReleaseObject onPlayPositionChanged", "NPN_ReleaseObject JSAVControl",
                            "NPN_ReleaseObject JSAVcomponentList#2", "NPN_ReleaseObject JSAVcomponentList#3",
                            "NPN_ReleaseObject JSAVcomponentList", "NPN_ReleaseObject onDRMRightsError",
                            "NPN_ReleaseObject video"));
    leftBehind(listeners[3]);
}

TEST_F(AVControlObject, AWrapperThatOutlivesItsObjectAnswersNothing) {
    const EmbeddedObject object = video();
    const ObjectRef wrapper = object.scriptObject();
    destroy(object);
    EXPECT_FALSE(wrapper.call("play", 1).succeeded);
    EXPECT_FALSE(wrapper.get("playState").succeeded);
    EXPECT_FALSE(wrapper.set("data", kClip).succeeded);
    EXPECT_THAT(logOf(5, [&] { wrapper.call("play", 1); }), HasSubstr("Can't find plugin pointer\n"));
}

TEST_F(AVControlObject, AWrapperThatOutlivesItsObjectHasItsConstantsAndRefusesValuesOfAnotherType) {
    const EmbeddedObject object = video();
    const ObjectRef wrapper = object.scriptObject();
    destroy(object);
    EXPECT_EQ(wrapper.get("COMPONENT_TYPE_VIDEO"), 0);
    EXPECT_EQ(wrapper.get("COMPONENT_TYPE_AUDIO"), 1);
    EXPECT_EQ(wrapper.get("COMPONENT_TYPE_SUBTITLE"), 2);
    EXPECT_FALSE(wrapper.set("COMPONENT_TYPE_VIDEO", 1).succeeded);
    EXPECT_FALSE(wrapper.set("data", 1).succeeded);
    EXPECT_FALSE(wrapper.set("persist", 1).succeeded);
    for (const char* number : {"currentTrackIndex", "width", "height"}) {
        EXPECT_FALSE(wrapper.set(number, "1").succeeded) << number;
    }
}

TEST_F(AVControlObject, TheWrapperIsMadeOnceAndHandedOutWithAReference) {
    const EmbeddedObject object = video();
    const ObjectRef first = object.scriptObject();
    object.dropScriptObject();
    EXPECT_EQ(object.scriptObject(), first);
    EXPECT_EQ(first.pluginReferences(), 1);
    EXPECT_EQ(log.count("NPN_CreateObject"), 1u);
}

TEST_F(AVControlObject, EventsOfThePageAreNotHandled) {
    EXPECT_EQ(video().handleEvent(), 0);
}

// The play report

class AVControlReport : public AVControlTest {
protected:
    // What the log says of a clip of this length, from its first poll to its end.
    std::string reportOf(const std::vector<uint32_t>& durations, bool withInfo = true) {
        return logOf(5, [&] {
            for (const uint32_t duration : durations) {
                const EmbeddedObject object = playingVideo();
                if (withInfo) {
                    report(info(20, 1500, duration));
                }
                clock.await(1);
                clock.seconds(2);
                send(TELIX_AV_CB_MSG_PLAYEND);
                destroy(object);
            }
        });
    }
};

TEST_F(AVControlReport, TellsStartAndEndWithTheLengthOfTheClip) {
    const std::string printed = reportOf({65000});
    EXPECT_THAT(printed, HasSubstr("TELIX_JS_AV_GetPlayInfo -(state:2, duration:65000, playPosition:1500)"));
    const std::string file = "<File>http://media.example/clip.mp4,00:01:05</File></Play>";
    EXPECT_THAT(printed, HasSubstr("<Play><Status>Start</Status>" + file));
    EXPECT_THAT(printed, HasSubstr("<Play><Status>End</Status>" + file));
}

TEST_F(AVControlReport, SplitsHours) {
    EXPECT_THAT(reportOf({7384000}),
                HasSubstr("<Status>End</Status><File>http://media.example/clip.mp4,02:03:04<"));
}

TEST_F(AVControlReport, KeepsTheHoursOfAnEarlierClip) {
    EXPECT_THAT(reportOf({7384000, 65000}),
                HasSubstr("<Status>End</Status><File>http://media.example/clip.mp4,02:01:05<"));
}

TEST_F(AVControlReport, KeepsTheLengthOfAnEarlierClipForOneOfASecond) {
    EXPECT_THAT(reportOf({65000, 1000}),
                HasSubstr("duration:1000, playPosition:1500) PLUGIN >>> AVCONTROL :: printMonitoringInfo :: "
                          "<Play><Status>Start</Status><File>http://media.example/clip.mp4,00:01:05<"));
}

TEST_F(AVControlReport, TellsAnEndWithoutAStart) {
    const std::string printed = reportOf({0}, false);
    EXPECT_THAT(printed, Not(HasSubstr("Start")));
    EXPECT_THAT(printed, HasSubstr("<Status>End</Status><File>http://media.example/clip.mp4,"));
}

} // namespace
} // namespace avcontrol
