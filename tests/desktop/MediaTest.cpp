// Media players through the calls of the plug-in, with real media from files and from a server of the test's
// own.
#include "tests/desktop/MediaTest.h"

using namespace desktop;

namespace {

TELIX_RETCODE_ENUM_T onChannelChange(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE) {
    return messages.add({object, 0, "channel"});
}

// ---- Playing

struct Format {
    const char* name;
    const char* clip;
    uint32_t length; // milliseconds
    uint32_t tolerance;
    bool hasPicture;
};

void PrintTo(const Format& format, std::ostream* out) {
    *out << format.clip;
}

class MediaFormatTest : public MediaTest, public testing::WithParamInterface<std::tuple<Format, bool>> {};

TEST_P(MediaFormatTest, PlaysToItsEnd) {
    const auto& [format, isNetwork] = GetParam();
    std::optional<Server> server;
    if (isNetwork) {
        server.emplace();
    }
    play(isNetwork ? (*server)(format.clip) : file(format.clip));
    if (format.hasPicture) {
        EXPECT_TRUE(waitUntil([] { return takeShot().isVisible; }));
    }
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 300; })) << "the position does not move";
    // Where the media does not say, it is estimated from what has been played.
    EXPECT_TRUE(waitUntil([&] { return info().duration > 0; }));
    EXPECT_NEAR(info().duration, format.length, format.tolerance);
    EXPECT_EQ(takeShot().isVisible, format.hasPicture);
    const uint32_t target = format.length - 2000;
    {
        PlatformThreadBlock block;
        ASSERT_EQ(TELIX_JS_AV_Seek(m_player, target), 0);
        EXPECT_EQ(info().playPosition, target);
    }
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > target + 300; })) << "the rest is not played";
    expectMessages({kPlayStart, kPlayEnd});
    EXPECT_TRUE(waitUntil([] { return !takeShot().isVisible; }));
    EXPECT_EQ(stateOf(m_player).state, "finished");
    EXPECT_EQ(info().state, 0U);
}

INSTANTIATE_TEST_SUITE_P(Files, MediaFormatTest,
                         testing::Combine(testing::Values(Format{"mp4", "second.mp4", 8000, 100, true},
                                                          Format{"mp3", "tune.mp3", 3000, 150, false},
                                                          Format{"aac", "tune.aac", 3000, 150, false},
                                                          Format{"wav", "tune.wav", 3000, 50, false},
                                                          Format{"hls", "hls/index.m3u8", 6000, 200, true}),
                                          testing::Bool()),
                         [](const auto& each) {
                             return std::string(std::get<0>(each.param).name) +
                                    (std::get<1>(each.param) ? "OverHttp" : "FromAFile");
                         });

TEST_F(MediaTest, PlaysAsOftenAsItIsToldTo) {
    play(file("tune.wav"), 2);
    // Twice it comes beyond the first second, and from there back to the start or to the end.
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 1000; }));
    EXPECT_TRUE(waitUntil([&] { return info().playPosition < 1000; }));
    EXPECT_EQ(stateOf(m_player).state, "playing");
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 1000; }));
    expectMessages({kPlayStart, kPlayEnd});
}

TEST_F(MediaTest, GoesOnWithWhatIsQueued) {
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 18500), 0); // for the first clip
    {
        PlatformThreadBlock block;
        ASSERT_EQ(start(m_player, file("clip.mp4")), 0);
        ASSERT_EQ(queue(m_player, file("second.mp4")), 0);
        ASSERT_EQ(queue(m_player, file("tune.mp3")), 0);
    }
    expectMessages({kPlayStart, kPlayStart});
    EXPECT_TRUE(waitUntil([] { return showsSecondClip(takeShot()); }));
    EXPECT_EQ(stateOf(m_player).url, file("second.mp4"));
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 7200), 0);
    expectMessages({kPlayStart, kPlayStart, kPlayStart});
    EXPECT_FALSE(takeShot().isVisible);
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 2500), 0);
    expectMessages({kPlayStart, kPlayStart, kPlayStart, kPlayEnd});
}

TEST_F(MediaTest, ForgetsWhatWasQueuedWhenItIsWithdrawn) {
    startPaused(file("tune.wav"));
    ASSERT_EQ(queue(m_player, file("second.mp4")), 0);
    ASSERT_EQ(TELIX_JS_AV_Queue(m_player, nullptr, 1, 6, 512, 0, 0, 0), 0);
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 2500), 0);
    ASSERT_EQ(TELIX_JS_AV_Resume(m_player), 0);
    expectMessages({kPlayStart, kPlayEnd});
    ASSERT_EQ(queue(m_player, file("tune.mp3")), 0); // nothing plays: at once
    expectMessages({kPlayStart, kPlayEnd, kPlayStart});
}

TEST_F(MediaTest, StandsStillWhilePaused) {
    play(file("clip.mp4"));
    ASSERT_TRUE(waitUntil([&] { return info().playPosition > 200; }));
    ASSERT_EQ(TELIX_JS_AV_Pause(m_player), 0);
    EXPECT_EQ(stateOf(m_player).state, "paused");
    ASSERT_TRUE(waitUntil([] { return output()->state == GST_STATE_PAUSED; }));
    letPlatformThreadWork(); // reads the position where it has stopped
    const uint32_t position = info().playPosition;
    const Shot still = takeShot();
    EXPECT_TRUE(still.isVisible);
    letPlatformThreadWork();
    EXPECT_EQ(info().playPosition, position);
    EXPECT_EQ(takeShot().serial, still.serial);
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 10000), 0);
    EXPECT_TRUE(waitUntil([&] { return takeShot().serial > still.serial; }))
        << "shows no frame of the new position";
    EXPECT_EQ(stateOf(m_player).state, "paused");
    EXPECT_EQ(info().playPosition, 10000U);
    ASSERT_EQ(TELIX_JS_AV_Resume(m_player), 0);
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 10300; }));
    expectMessages({kPlayStart});
}

TEST_F(MediaTest, KeepsStillUntilItIsResumedWhenItIsPausedAtOnce) {
    startPaused(file("second.mp4"));
    EXPECT_TRUE(waitUntil([] { return takeShot().isVisible; })); // its first frame
    letPlatformThreadWork();
    expectMessages({});
    EXPECT_EQ(info().playPosition, 0U);
    ASSERT_EQ(TELIX_JS_AV_Resume(m_player), 0);
    expectMessages({kPlayStart});
}

TEST_F(MediaTest, PlaysAtOtherSpeedsForwardAndBackward) {
    Server server;
    play(server("clip.mp4"));
    EXPECT_FALSE(output()->isMuted);
    expectSpeed(true, 2, 0);
    expectSpeed(true, 0, 5);
    expectSpeed(true, 1, 5);
    expectSpeed(false, 1, 0);
    expectSpeed(true, 1, 0);
    expectMessages({kPlayStart});
}

// A seek that is still on its way when something else is started must not fix the position of that.
TEST_F(MediaTest, ShowsThePositionAfterASeekThatWasOvertaken) {
    {
        PlatformThreadBlock block;
        ASSERT_EQ(start(m_player, file("clip.mp4")), 0);
        ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 15000), 0);
        ASSERT_EQ(start(m_player, file("second.mp4")), 0);
    }
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 300 && info().playPosition < 8000; }));
    {
        PlatformThreadBlock block;
        ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 5000), 0);
        ASSERT_EQ(start(m_player, file("clip.mp4")), 0);
    }
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 300; }));
}

TEST_F(MediaTest, EndsAtTheStartWhenItPlaysBackward) {
    play(file("clip.mp4"), 3);
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 1500), 0);
    ASSERT_EQ(TELIX_JS_AV_SetPlaySpeed(m_player, 0, 2, 0), 0);
    expectMessages({kPlayStart, kPlayEnd});
}

TEST_F(MediaTest, RefusesSpeedsThatCannotBe) {
    EXPECT_NE(TELIX_JS_AV_SetPlaySpeed(m_player, 0, 1, 0), 0); // nothing to play backward
    play(file("clip.mp4"));
    EXPECT_NE(TELIX_JS_AV_SetPlaySpeed(m_player, 1, 100, 0), 0);
    EXPECT_NE(TELIX_JS_AV_SetPlaySpeed(m_player, 1, -1, 0), 0);
    EXPECT_NE(TELIX_JS_AV_SetPlaySpeed(m_player, 1, 1, 10), 0);
    EXPECT_EQ(stateOf(m_player).speed, 1.0);
    EXPECT_NE(TELIX_JS_AV_Seek(m_player, 20001), 0);
    Server server;
    play(server("hls/index.m3u8")); // of live streaming nothing is kept
    EXPECT_NE(TELIX_JS_AV_SetPlaySpeed(m_player, 0, 1, 0), 0);
}

// The server sends the first 600,000 bytes of clip.mp4, about 8 seconds, and then next to nothing.
constexpr const char* kTricklingClip = "clip.mp4?trickle=600000";

TEST_F(MediaTest, GoesToWhatIsNotHeldYet) {
    Server server;
    play(server(kTricklingClip));
    ASSERT_LT(info().bufferedEnd, 12U);
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 15000), 0);
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 15300; }));
    EXPECT_GT(info().bufferedEnd, 15U);
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 20000), 0); // the very end
    expectMessages({kPlayStart, kPlayEnd});
}

TEST_F(MediaTest, GoesNoFurtherThanWhatIsHeldWhereTheServerGivesNoParts) {
    Server server;
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 19000), 0); // as the start position
    play(server(std::string(kTricklingClip) + "&ranges=no"));
    EXPECT_LT(info().playPosition, 15000U);
    ASSERT_LT(info().bufferedEnd, 15U);
    EXPECT_NE(TELIX_JS_AV_Seek(m_player, 18000), 0);
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 200; })); // and plays on
    server.release();
    EXPECT_TRUE(waitUntil([&] { return info().bufferedEnd == 20; }));
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 19000), 0);
    expectMessages({kPlayStart, kPlayEnd});
}

TEST_F(MediaTest, GoesOnAtAPositionThatItWasGivenWhileStopped) {
    Server server;
    startPaused(server("tune.mp3"));
    ASSERT_EQ(queue(m_player, server("second.mp4")), 0);
    ASSERT_EQ(TELIX_JS_AV_Stop(m_player), 0);
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 1500), 0);
    startPaused(server("tune.mp3"));
    EXPECT_TRUE(waitUntil([&] { return info().playPosition >= 1500; }));
    ASSERT_EQ(TELIX_JS_AV_Resume(m_player), 0);
    expectMessages({kPlayStart, kPlayStart}); // the second one is what had been queued
    EXPECT_EQ(stateOf(m_player).url, server("second.mp4"));
    ASSERT_EQ(TELIX_JS_AV_Stop(m_player), 0);
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 1500), 0);
    ASSERT_EQ(TELIX_JS_AV_Stop(m_player), 0); // forgets it
    startPaused(server("tune.mp3"));
    EXPECT_LT(info().playPosition, 1500U);
}

TEST_F(MediaTest, GivesTheStartPositionToTheLastOfTwoRequests) {
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 1500), 0);
    {
        PlatformThreadBlock block;
        ASSERT_EQ(start(m_player, file("tune.mp3")), 0);
        ASSERT_EQ(start(m_player, file("tune.wav")), 0);
        ASSERT_EQ(TELIX_JS_AV_Pause(m_player), 0);
    }
    ASSERT_TRUE(waitUntil([&] { return info().state == 2; }));
    EXPECT_TRUE(waitUntil([&] { return info().playPosition >= 1500; }));
    EXPECT_EQ(stateOf(m_player).url, file("tune.wav"));
}

// ---- What goes wrong

class MediaErrorTest : public MediaTest {
protected:
    void expectError(const std::string& url, TELIX_AV_CB_MSG message) {
        const size_t before = received().size();
        ASSERT_EQ(start(m_player, url), 0);
        ASSERT_TRUE(waitUntil([&] { return received().size() > before; })) << url;
        EXPECT_EQ(received().back(), message) << url;
        EXPECT_EQ(stateOf(m_player).state, "error");
        ASSERT_EQ(TELIX_JS_AV_Stop(m_player), 0);
        EXPECT_EQ(received().size(), before + 1) << url;
    }
};

TEST_F(MediaErrorTest, TellsWhatIsWrong) {
    Server server;
    // As a browser that requests the media as well: whatever it cannot get is a network error.
    expectError(server("nothing.mp4"), TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT);
    expectError(server("nothing.m3u8"), TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT);
    expectError(file("nothing.mp4"), TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT);
    expectError(server("clip.mp4?status=503"), TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT);
    expectError(server("playlist.asx"), TELIX_AV_CB_MSG_ERR_CODEC_NOT_SUPPORTED);
    expectError("unheardof://somewhere/clip.mp4", TELIX_AV_CB_MSG_ERR_CODEC_NOT_SUPPORTED);
    ClosedPort port;
    expectError(port.url(), TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT);
    play(file("tune.wav")); // and is good for another
}

TEST_F(MediaErrorTest, TakesNoRubbishForMedia) {
    char name[] = "rubbish.XXXXXX";
    const int descriptor = mkstemp(name);
    ASSERT_GE(descriptor, 0);
    std::vector<uint8_t> rubbish(100000);
    uint32_t random = 1;
    for (uint8_t& byte : rubbish) {
        random = random * 1664525 + 1013904223;
        byte = static_cast<uint8_t>(random >> 24);
    }
    ASSERT_EQ(write(descriptor, rubbish.data(), rubbish.size()), static_cast<ssize_t>(rubbish.size()));
    gchar* path = g_canonicalize_filename(name, nullptr);
    expectError(std::string("file://") + path, TELIX_AV_CB_MSG_ERR_CODEC_NOT_SUPPORTED);
    ASSERT_EQ(ftruncate(descriptor, 0), 0);
    expectError(std::string("file://") + path, TELIX_AV_CB_MSG_ERR_CODEC_NOT_SUPPORTED);
    g_free(path);
    close(descriptor);
    unlink(name);
}

TEST_F(MediaErrorTest, TellsWhenTheConnectionIsLost) {
    Server server;
    play(server(kTricklingClip));
    server.end();
    expectMessages({kPlayStart, TELIX_AV_CB_MSG_ERR_NET_DISCONNECTED});
    EXPECT_EQ(stateOf(m_player).state, "error");
}

TEST_F(MediaErrorTest, MakesAnEqualErrorADifferentMessage) {
    ASSERT_EQ(start(m_player, file("nothing.mp4")), 0);
    expectMessages({TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT});
    ASSERT_EQ(start(m_player, file("nothing.mp4")), 0);
    expectMessages({TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT, 0, TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT});
}

// ---- Sound and picture

TEST_F(MediaTest, IsAsLoudAsItIsToldTo) {
    ASSERT_EQ(TELIX_JS_AV_SetVolume(m_player, 30), 0);
    play(file("clip.mp4"));
    EXPECT_NEAR(output()->volume, 0.3, 0.001);
    ASSERT_EQ(TELIX_JS_AV_SetVolume(m_player, 100), 0);
    EXPECT_TRUE(waitUntil([] { return output()->volume > 0.999; }));
    ASSERT_EQ(TELIX_JS_AV_SetVolume(m_player, 0), 0);
    EXPECT_TRUE(waitUntil([] { return output()->volume < 0.001; }));
    EXPECT_NE(TELIX_JS_AV_SetVolume(m_player, 101), 0);
    EXPECT_EQ(stateOf(m_player).volume, 0U);
}

TEST_F(MediaTest, PlacesThePictureWhereThePageWantsIt) {
    TELIX_JS_DISPLAY_AREA area{100, 50, 640, 360};
    ASSERT_EQ(TELIX_JS_AV_SetDisplayArea(m_player, &area), 0);
    play(file("clip.mp4"));
    EXPECT_TRUE(waitUntil([] { return takeShot().isVisible; }));
    EXPECT_EQ(takeShot().areaX, 100);
    EXPECT_EQ(takeShot().areaY, 50);
    EXPECT_EQ(takeShot().areaWidth, 640U);
    EXPECT_EQ(takeShot().areaHeight, 360U);
    area.x = 200;
    ASSERT_EQ(TELIX_JS_AV_SetDisplayArea(m_player, &area), 0);
    EXPECT_EQ(takeShot().areaX, 200);
    ASSERT_EQ(TELIX_JS_AV_SetFullScreen(m_player, 1), 0);
    EXPECT_TRUE(takeShot().isFullScreen);
    ASSERT_EQ(TELIX_JS_AV_SetFullScreen(m_player, 0), 0);
    EXPECT_FALSE(takeShot().isFullScreen);
    const Shot shot = takeShot();
    EXPECT_TRUE(waitUntil([&] { return takeShot().serial > shot.serial + 20; })) << "there are no new frames";
    EXPECT_NE(takeShot().pixels, shot.pixels);
}

TEST_F(MediaTest, LetsTheComponentsBeSeenAndHeardThatAreSelected) {
    TELIX_JS_AVCOMPHANDLE* none = nullptr;
    uint32_t count = 0;
    EXPECT_NE(TELIX_JS_AV_GetComponents(m_player, TELIX_JS_AVCOMPTYPE_AUDIO, &none, &count), 0);
    Server server;
    play(server("languages.mp4"), 10); // so that it does not end during the test
    const auto video = components(TELIX_JS_AVCOMPTYPE_VIDEO);
    const auto audio = components(TELIX_JS_AVCOMPTYPE_AUDIO);
    const auto subtitles = components(TELIX_JS_AVCOMPTYPE_SUBTITLE);
    ASSERT_EQ(video.size(), 1U);
    ASSERT_EQ(audio.size(), 2U);
    ASSERT_EQ(subtitles.size(), 1U);
    EXPECT_TRUE(components(99).empty());

    const auto encodingOf = [](TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type) {
        char* text = nullptr;
        EXPECT_EQ(TELIX_JS_AV_AVComponent_GetEncoding(component, type, &text), 0);
        return textOf(text);
    };
    const auto languageOf = [](TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type) {
        char* text = nullptr;
        EXPECT_EQ(TELIX_JS_AV_AVComponent_GetLanguage(component, type, &text), 0);
        return textOf(text);
    };
    EXPECT_EQ(encodingOf(video[0], TELIX_JS_AVCOMPTYPE_VIDEO), "AVC");
    EXPECT_EQ(encodingOf(audio[0], TELIX_JS_AVCOMPTYPE_AUDIO), "HEAAC");
    EXPECT_EQ(languageOf(audio[0], TELIX_JS_AVCOMPTYPE_AUDIO), "deu");
    EXPECT_EQ(languageOf(audio[1], TELIX_JS_AVCOMPTYPE_AUDIO), "eng");
    EXPECT_EQ(languageOf(subtitles[0], TELIX_JS_AVCOMPTYPE_SUBTITLE), "eng");
    float aspectRatio = 0;
    EXPECT_EQ(TELIX_JS_AV_AVComponent_GetAspectRatio(video[0], TELIX_JS_AVCOMPTYPE_VIDEO, &aspectRatio), 0);
    EXPECT_NEAR(aspectRatio, 16.0 / 9.0, 0.001);
    uint32_t channels = 0;
    EXPECT_EQ(TELIX_JS_AV_AVComponent_GetAudioChannels(audio[0], TELIX_JS_AVCOMPTYPE_AUDIO, &channels), 0);
    EXPECT_EQ(channels, 2U);
    ___UINT8 flag = 7;
    EXPECT_EQ(TELIX_JS_AV_AVComponent_GetEncrypted(audio[0], TELIX_JS_AVCOMPTYPE_AUDIO, &flag), 0);
    EXPECT_EQ(flag, 0);
    char* text = nullptr;
    EXPECT_NE(TELIX_JS_AV_AVComponent_GetLanguage(audio[0], TELIX_JS_AVCOMPTYPE_VIDEO, &text), 0);

    EXPECT_EQ(output()->audioStream, 0);
    EXPECT_EQ(components(TELIX_JS_AVCOMPTYPE_AUDIO, true), std::vector{audio[0]});
    ASSERT_EQ(TELIX_JS_AV_SelectComponent(m_player, audio[1], TELIX_JS_AVCOMPTYPE_AUDIO), 0);
    EXPECT_TRUE(waitUntil([] { return output()->audioStream == 1; }));
    EXPECT_EQ(components(TELIX_JS_AVCOMPTYPE_AUDIO, true), std::vector{audio[1]});
    ASSERT_EQ(TELIX_JS_AV_UnselectComponent(m_player, audio[1], TELIX_JS_AVCOMPTYPE_AUDIO), 0);
    EXPECT_TRUE(waitUntil([] { return output()->isMuted; }));
    EXPECT_TRUE(components(TELIX_JS_AVCOMPTYPE_AUDIO, true).empty());

    ASSERT_EQ(TELIX_JS_AV_UnselectComponent(m_player, video[0], TELIX_JS_AVCOMPTYPE_VIDEO), 0);
    EXPECT_TRUE(waitUntil([] { return !takeShot().isVisible; }));
    ASSERT_EQ(TELIX_JS_AV_SelectComponent(m_player, video[0], TELIX_JS_AVCOMPTYPE_VIDEO), 0);
    EXPECT_TRUE(waitUntil([] { return takeShot().isVisible; }));
    EXPECT_NE(TELIX_JS_AV_SelectComponent(m_player, 4711, TELIX_JS_AVCOMPTYPE_VIDEO), 0);
    EXPECT_NE(TELIX_JS_AV_SelectComponent(m_player, audio[0], 99), 0);
    expectMessages({kPlayStart});
}

TEST_F(MediaTest, ShowsSubtitlesOnlyWhileTheyAreSelected) {
    const auto whitePixels = [] {
        telix_desktop_frame frame{};
        telix_desktop_acquire_frame(&frame);
        size_t count = 0;
        for (uint32_t y = frame.height / 2; frame.pixels && y < frame.height; ++y) {
            for (uint32_t x = 0; x < frame.width; ++x) {
                const uint8_t* pixel = frame.pixels + size_t{y} * frame.stride + size_t{x} * 4;
                count += pixel[0] > 200 && pixel[1] > 200 && pixel[2] > 200 ? 1 : 0;
            }
        }
        telix_desktop_release_frame(&frame);
        return count;
    };
    play(file("languages.mp4"), 10); // the lower half has nothing white
    const auto subtitles = components(TELIX_JS_AVCOMPTYPE_SUBTITLE);
    ASSERT_EQ(subtitles.size(), 1U);
    EXPECT_TRUE(waitUntil([] { return takeShot().isVisible; }));
    EXPECT_EQ(whitePixels(), 0U);
    ASSERT_EQ(TELIX_JS_AV_SelectComponent(m_player, subtitles[0], TELIX_JS_AVCOMPTYPE_SUBTITLE), 0);
    EXPECT_TRUE(waitUntil([&] { return whitePixels() > 200; }));
    ASSERT_EQ(TELIX_JS_AV_UnselectComponent(m_player, subtitles[0], TELIX_JS_AVCOMPTYPE_SUBTITLE), 0);
    EXPECT_TRUE(waitUntil([&] { return whitePixels() == 0; }));
    EXPECT_TRUE(takeShot().isVisible);
    // And so it stays: one subtitle a second would come.
    const uint64_t serial = takeShot().serial;
    EXPECT_TRUE(waitUntil([&] { return takeShot().serial > serial + 30 || whitePixels() > 0; }));
    EXPECT_EQ(whitePixels(), 0U);
}

// ---- Buffering

TEST_F(MediaTest, TellsHowMuchIsHeldAhead) {
    Server server;
    {
        PlatformThreadBlock block;
        ASSERT_EQ(start(m_player, server(kTricklingClip)), 0);
        EXPECT_EQ(info().state, 1U);
        EXPECT_EQ(info().duration, 0U);
        EXPECT_EQ(info().buffered, 0U);
    }
    ASSERT_TRUE(waitUntil([&] { return info().duration > 0; }));
    EXPECT_EQ(info().state, 2U);
    EXPECT_TRUE(waitUntil([&] { return info().bufferedEnd > 5; }));
    EXPECT_LT(info().bufferedEnd, 12U);
    server.release();
    EXPECT_TRUE(waitUntil([&] { return info().bufferedEnd == 20; }));
    const TELIX_JS_AV_PLAY_INFO all = info();
    EXPECT_NEAR(all.buffered, 20 - all.playPosition / 1000.0, 1.5);
    expectMessages({kPlayStart});
    play(file("clip.mp4"));
    EXPECT_EQ(info().buffered, kNoBufferReport);
}

TEST_F(MediaTest, WaitsForMediaThatComesSlowlyAndGoesOn) {
    Server server;
    ASSERT_EQ(start(m_player, server("second.mp4?trickle=60000")),
              0); // less than it buffers before it starts
    EXPECT_TRUE(waitUntil([&] { return stateOf(m_player).state == "buffering"; }));
    ASSERT_EQ(TELIX_JS_AV_Pause(m_player), 0);
    EXPECT_EQ(stateOf(m_player).state, "paused");
    ASSERT_EQ(TELIX_JS_AV_Resume(m_player), 0);
    EXPECT_EQ(stateOf(m_player).state, "buffering");
    expectMessages({});
    server.release();
    expectMessages({kPlayStart});
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 1000; }));
    EXPECT_EQ(stateOf(m_player).state, "playing");
}

TEST_F(MediaTest, AnswersOtherThreadsWhileItPlays) {
    Server server;
    ASSERT_EQ(start(m_player, server("clip.mp4")), 0);
    std::atomic<bool> isOver{false};
    std::atomic<unsigned int> calls{0};
    std::vector<std::thread> callers;
    for (int index = 0; index < 3; ++index) {
        callers.emplace_back([&, index] {
            while (!isOver) {
                TELIX_JS_AV_PLAY_INFO* record = nullptr;
                TELIX_JS_AV_GetPlayInfo(m_player, &record);
                TELIX_JS_AV_Pause(m_player);
                TELIX_JS_AV_Resume(m_player);
                if (index == 0 && ++calls % 100 == 0) {
                    TELIX_JS_AV_Stop(m_player);
                }
            }
        });
    }
    for (int round = 0; round < 20; ++round) {
        start(m_player, server("clip.mp4"));
        TELIX_JS_AV_Seek(m_player, 5000);
        TELIX_JS_AV_SetPlaySpeed(m_player, 1, 2, 0);
        const unsigned int before = calls;
        EXPECT_TRUE(waitUntil([&] { return calls > before + 10; })) << "the calls do not return";
        flushPlatformThread();
    }
    TELIX_JS_AV_PLAY_INFO* record = nullptr;
    ASSERT_EQ(TELIX_JS_AV_GetPlayInfo(m_player, &record), 0);
    TELIX_JS_AV_DestroyPlayer(m_player);
    isOver = true;
    for (std::thread& caller : callers) {
        caller.join();
    }
    EXPECT_LE(record->playPosition, 20000U); // the record is valid longer than its player
    m_player = newPlayer();
    const size_t before = received().size();
    ASSERT_EQ(start(m_player, file("tune.wav")), 0);
    EXPECT_TRUE(waitUntil([&] { return received().size() > before && received().back() == kPlayStart; }));
}

// ---- Who owns the pipeline

TEST_F(MediaTest, TakesThePipelineFromAnotherPlayer) {
    const TELIX_JS_AV_HANDLE other = newPlayer();
    play(file("clip.mp4"));
    ASSERT_EQ(start(other, file("second.mp4")), 0);
    expectMessages({kPlayStart, kPlayStart}); // and nothing of the first: it would be taken for the second's
    EXPECT_EQ(messages.all().back().player, other);
    EXPECT_TRUE(waitUntil([] { return showsSecondClip(takeShot()); }));
    EXPECT_EQ(stateOf(m_player).state, "stopped");
    EXPECT_NE(TELIX_JS_AV_Pause(m_player), 0);
    EXPECT_EQ(TELIX_JS_AV_Stop(m_player), 0); // of one that has nothing
    flushPlatformThread();
    EXPECT_EQ(stateOf(other).state, "playing");
    ASSERT_EQ(TELIX_JS_AV_DestroyPlayer(m_player), 0);
    TELIX_JS_AV_UnregisterOnPlayStateChange(onMessage); // the other goes on expecting its messages
    ASSERT_EQ(TELIX_JS_AV_Seek(other, 7000), 0);
    expectMessages({kPlayStart, kPlayStart, kPlayEnd});
}

TEST_F(MediaTest, TheFrameNamesTheObjectThatPresents) {
    const uint64_t before = telix_desktop_newest_presenter();
    TELIX_JS_VB_HANDLE object = 0;
    ASSERT_EQ(TELIX_JS_VB_GetHandle(&object), 0);
    const uint64_t broadcast = telix_desktop_newest_presenter();
    EXPECT_GT(broadcast, before);
    TELIX_JS_AV_HANDLE other = 0;
    ASSERT_EQ(TELIX_JS_AV_CreatePlayer(&other, 0, 0, 0), 0);
    const uint64_t player = telix_desktop_newest_presenter();
    EXPECT_EQ(player, broadcast + 1);
    const auto isPresentedBy = [](uint64_t presenter) {
        return waitUntil([=] { return takeShot().isVisible && takeShot().presenter == presenter; });
    };
    ASSERT_EQ(TELIX_JS_AV_Play(other, file("second.mp4").c_str(), 10, 6, 1280, 0, 0, 0), 0);
    EXPECT_TRUE(isPresentedBy(player));
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(object), 0);
    EXPECT_TRUE(isPresentedBy(broadcast));
    // One player after the other on one presentation.
    ASSERT_EQ(TELIX_JS_AV_Play(other, file("second.mp4").c_str(), 10, 6, 1280, 0, 0, 0), 0);
    EXPECT_TRUE(isPresentedBy(player));
    play(file("clip.mp4"));
    EXPECT_TRUE(waitUntil([=] { return takeShot().isVisible && takeShot().presenter <= before; }));
    EXPECT_NE(takeShot().presenter, 0U);
    ASSERT_EQ(TELIX_JS_AV_Stop(m_player), 0);
    EXPECT_EQ(TELIX_JS_AV_DestroyPlayer(other), 0);
    TELIX_JS_VB_Release(object);
    EXPECT_TRUE(waitUntil([] { return takeShot().presenter == 0; }));
}

TEST_F(MediaTest, TakesThePictureFromBroadcastAndLosesItToATune) {
    TELIX_JS_VB_HANDLE object = 0;
    ASSERT_EQ(TELIX_JS_VB_GetHandle(&object), 0);
    TELIX_JS_VB_RegisterOnChannelChangeSucceeded(onChannelChange);
    const auto isTuned = [&](long times) {
        const std::vector<Message> all = messages.all();
        return std::count_if(all.begin(), all.end(),
                             [](const Message& each) { return each.text == "channel"; }) == times;
    };
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(object), 0);
    ASSERT_TRUE(waitUntil([&] { return isTuned(1); }));
    play(file("second.mp4"), 10); // so that it does not end during the test
    EXPECT_TRUE(waitUntil([] { return showsSecondClip(takeShot()); }));
    TELIX_PLAYSTATE_ENUM_T state = -1;
    EXPECT_EQ(TELIX_JS_VB_GetPlayBackState(object, &state), 0);
    EXPECT_EQ(state, TELIX_PLAYSTATE_STOPPED);
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(object), 0);
    ASSERT_TRUE(waitUntil([&] { return isTuned(2); }));
    EXPECT_EQ(stateOf(m_player).state, "error");
    EXPECT_FALSE(showsSecondClip(takeShot()));
    expectMessages({0, kPlayStart, TELIX_AV_CB_MSG_ERR_PLAYING, 0});
    play(file("second.mp4")); // and back, cleanly
    ASSERT_EQ(TELIX_JS_AV_Stop(m_player), 0);
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(object), 0);
    ASSERT_TRUE(waitUntil([&] { return isTuned(3); }));
    EXPECT_TRUE(takeShot().isVisible);
    expectMessages({0, kPlayStart, TELIX_AV_CB_MSG_ERR_PLAYING, 0, kPlayStart, 0});
    TELIX_JS_VB_Release(object);
    TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded(onChannelChange);
}

TEST_F(MediaTest, StartsAndStopsThirtyTimesAndPlaysTheLast) {
    Server server;
    constexpr int kTimes = 30;
    for (int index = 0; index < kTimes; ++index) {
        ASSERT_EQ(start(m_player, index % 2 == 0 ? server("clip.mp4") : file("second.mp4")), 0);
        // Each gets further than the one before; how far does not matter.
        std::this_thread::sleep_for(std::chrono::milliseconds(index * 5));
        ASSERT_EQ(TELIX_JS_AV_Stop(m_player), 0);
    }
    const size_t before = received().size();
    ASSERT_EQ(start(m_player, server("second.mp4")), 0);
    EXPECT_TRUE(waitUntil([&] { return received().size() > before; }));
    EXPECT_EQ(received().back(), kPlayStart);
    EXPECT_TRUE(waitUntil([] { return showsSecondClip(takeShot()); }));
}

TEST_F(MediaTest, IsSilentAfterItWasDestroyed) {
    startPaused(file("tune.wav"));
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 2700), 0);
    ASSERT_EQ(TELIX_JS_AV_Resume(m_player), 0);
    {
        PlatformThreadBlock block; // at its end, playback is about to start, or has started
        messages.clear();
        ASSERT_EQ(TELIX_JS_AV_DestroyPlayer(m_player), 0);
        TELIX_JS_AV_UnregisterOnPlayStateChange(onMessage);
    }
    EXPECT_FALSE(output()) << "the pipeline is still there";
    letPlatformThreadWork();
    expectMessages({});
    EXPECT_FALSE(takeShot().isVisible);
    EXPECT_NE(start(m_player, file("tune.wav")), 0);
}

TEST_F(MediaTest, RefusesHandlesThatItNeverGave) {
    for (const uint32_t nonsense : {0U, 4711U, 0xFFFFFFFFU}) {
        uint32_t number = 0;
        float ratio = 0;
        ___UINT8 flag = 0;
        char* text = nullptr;
        uint32_t* array = nullptr;
        TELIX_JS_AV_PLAY_INFO own{};
        TELIX_JS_AV_PLAY_INFO* record = &own;
        const TELIX_JS_DISPLAY_AREA area{};
        EXPECT_NE(TELIX_JS_AV_DestroyPlayer(nonsense), 0);
        EXPECT_NE(TELIX_JS_AV_RegisterOnPlayStateChange(nonsense, onMessage), 0);
        EXPECT_NE(TELIX_JS_AV_RegisterOnDRMRightsError(nonsense, onRights), 0);
        EXPECT_NE(start(nonsense, file("clip.mp4")), 0);
        EXPECT_NE(queue(nonsense, file("clip.mp4")), 0);
        EXPECT_NE(TELIX_JS_AV_Queue(nonsense, nullptr, 1, 6, 512, 0, 0, 0), 0);
        EXPECT_NE(TELIX_JS_AV_Stop(nonsense), 0);
        EXPECT_NE(TELIX_JS_AV_Pause(nonsense), 0);
        EXPECT_NE(TELIX_JS_AV_Resume(nonsense), 0);
        EXPECT_NE(TELIX_JS_AV_SetVolume(nonsense, 50), 0);
        EXPECT_NE(TELIX_JS_AV_SetFullScreen(nonsense, 1), 0);
        EXPECT_NE(TELIX_JS_AV_SetPlaySpeed(nonsense, 1, 1, 0), 0);
        EXPECT_NE(TELIX_JS_AV_SetPlaySpeed(nonsense, 1, 0, 0), 0);
        EXPECT_NE(TELIX_JS_AV_SetDisplayArea(nonsense, &area), 0);
        EXPECT_NE(TELIX_JS_AV_GetPlayInfo(nonsense, &record), 0);
        EXPECT_NE(TELIX_JS_AV_Seek(nonsense, 0), 0);
        EXPECT_NE(TELIX_JS_AV_GetComponents(nonsense, 0, &array, &number), 0);
        EXPECT_NE(TELIX_JS_AV_GetCurrActiveComponents(nonsense, 0, &array, &number), 0);
        EXPECT_NE(TELIX_JS_AV_SelectComponent(nonsense, nonsense, nonsense), 0);
        EXPECT_NE(TELIX_JS_AV_UnselectComponent(nonsense, nonsense, nonsense), 0);
        EXPECT_NE(TELIX_JS_AV_AVComponent_GetEncoding(nonsense, 0, &text), 0);
        EXPECT_NE(TELIX_JS_AV_AVComponent_GetLanguage(nonsense, 1, &text), 0);
        EXPECT_NE(TELIX_JS_AV_AVComponent_GetAspectRatio(nonsense, nonsense, &ratio), 0);
        EXPECT_NE(TELIX_JS_AV_AVComponent_GetAudioChannels(nonsense, 1, &number), 0);
        EXPECT_NE(TELIX_JS_AV_AVComponent_GetEncrypted(nonsense, 1, &flag), 0);
        EXPECT_EQ(text, nullptr);
        EXPECT_EQ(array, nullptr);
        EXPECT_EQ(record, &own);
    }
    EXPECT_NE(start(m_player, ""), 0);
    EXPECT_NE(TELIX_JS_AV_Pause(m_player), 0); // nothing to pause
    EXPECT_NE(TELIX_JS_AV_Resume(m_player), 0);
    EXPECT_EQ(TELIX_JS_AV_PlaySound(0, 0, 0, 0, 0, 0, 0), TELIX_RETCODE_NOT_AVAILABLE);
    expectMessages({});
}

// ---- Injection

TEST_F(MediaTest, GivesOnWhatIsProvoked) {
    PlayerRegistry& players = PlayerRegistry::instance();
    EXPECT_FALSE(players.injectMessage(TELIX_AV_CB_MSG_ERR_NET_BUSY));
    EXPECT_FALSE(players.injectRightsError(1, "", "", ""));
    play(file("clip.mp4"));
    EXPECT_TRUE(players.injectMessage(TELIX_AV_CB_MSG_ERR_NET_BUSY));
    expectMessages({kPlayStart, TELIX_AV_CB_MSG_ERR_NET_BUSY});
    EXPECT_TRUE(players.injectRightsError(2, "content", "system", "issuer"));
    expectMessages({kPlayStart, TELIX_AV_CB_MSG_ERR_NET_BUSY, 0});
    EXPECT_EQ(messages.all().back().text, "2/content/system/issuer");
    EXPECT_EQ(messages.all().back().player, m_player);
    EXPECT_TRUE(players.injectBuffered(0xFF000003));
    EXPECT_EQ(info().buffered, 0xFF000003U);
    EXPECT_TRUE(players.injectBuffered(std::nullopt));
    EXPECT_EQ(info().buffered, kNoBufferReport);
    ASSERT_EQ(TELIX_JS_AV_Stop(m_player), 0);
    EXPECT_TRUE(players.injectMessage(TELIX_AV_CB_MSG_ERR_NET_BUSY)); // to the one that played last
    expectMessages({kPlayStart, TELIX_AV_CB_MSG_ERR_NET_BUSY, 0, TELIX_AV_CB_MSG_ERR_NET_BUSY});
}

} // namespace
