// Where the video is painted.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <ostream>

#include "desktop/window/shared/VideoArea.h"

namespace desktop {

static void PrintTo(const PixelRect& rect, std::ostream* out) {
    *out << rect.x << ' ' << rect.y << ' ' << rect.width << 'x' << rect.height;
}

namespace {

telix_desktop_frame frameAt(int32_t x, int32_t y, uint32_t width, uint32_t height) {
    static const uint8_t pixel[4] = {};
    telix_desktop_frame frame{};
    frame.pixels = pixel;
    frame.width = 720;
    frame.height = 576;
    frame.aspectWidth = 16;
    frame.aspectHeight = 9;
    frame.areaX = x;
    frame.areaY = y;
    frame.areaWidth = width;
    frame.areaHeight = height;
    frame.visible = 1;
    return frame;
}

TEST(VideoAreaTest, TheAreaOfThePageIsScaledToTheWidget) {
    const auto frame = frameAt(640, 180, 320, 180);
    EXPECT_EQ(videoArea(frame, 1280, 720), (PixelRect{640, 180, 320, 180}));
    EXPECT_EQ(videoArea(frame, 1920, 1080), (PixelRect{960, 270, 480, 270}));
    EXPECT_EQ(videoArea(frame, 320, 180), (PixelRect{160, 45, 80, 45}));
}

TEST(VideoAreaTest, EdgesAreRoundedSoThatNeighboursMeet) {
    const auto left = videoArea(frameAt(0, 0, 333, 720), 853, 480);
    const auto right = videoArea(frameAt(333, 0, 333, 720), 853, 480);
    EXPECT_EQ(left.x + left.width, right.x);
}

TEST(VideoAreaTest, FullScreenIsTheWholePageWhereverTheAreaIs) {
    auto frame = frameAt(900, 500, 32, 18);
    frame.fullScreen = 1;
    EXPECT_EQ(videoArea(frame, 1920, 1080), (PixelRect{0, 0, 1920, 1080}));
    frame.areaWidth = 0;
    EXPECT_EQ(videoArea(frame, 1280, 720), (PixelRect{0, 0, 1280, 720}));
}

TEST(VideoAreaTest, TheAspectRatioIsKeptInTheMiddleOfTheArea) {
    auto frame = frameAt(0, 0, 1280, 720);
    frame.aspectWidth = 4;
    frame.aspectHeight = 3;
    EXPECT_EQ(videoArea(frame, 1280, 720), (PixelRect{160, 0, 960, 720}));
    frame.aspectWidth = 32;
    frame.aspectHeight = 9;
    EXPECT_EQ(videoArea(frame, 1280, 720), (PixelRect{0, 180, 1280, 360}));
}

TEST(VideoAreaTest, WithoutAspectRatioThePixelsAreSquare) {
    auto frame = frameAt(0, 0, 1280, 720);
    frame.aspectWidth = frame.aspectHeight = 0;
    EXPECT_EQ(videoArea(frame, 1280, 720), (PixelRect{190, 0, 900, 720}));
}

TEST(VideoAreaTest, AnAreaMayReachBeyondThePage) {
    EXPECT_EQ(videoArea(frameAt(-320, -180, 640, 360), 1280, 720), (PixelRect{-320, -180, 640, 360}));
}

TEST(VideoAreaTest, NothingIsSeenWithoutFrameOrArea) {
    auto hidden = frameAt(0, 0, 1280, 720);
    hidden.visible = 0;
    EXPECT_TRUE(videoArea(hidden, 1280, 720).isEmpty());
    EXPECT_TRUE(videoArea(telix_desktop_frame{}, 1280, 720).isEmpty());
    EXPECT_TRUE(videoArea(frameAt(0, 0, 0, 720), 1280, 720).isEmpty());
    EXPECT_TRUE(videoArea(frameAt(0, 0, 1280, 0), 1280, 720).isEmpty());
    auto noPixels = frameAt(0, 0, 1280, 720);
    noPixels.pixels = nullptr;
    EXPECT_TRUE(videoArea(noPixels, 1280, 720).isEmpty());
}

TEST(VideoAreaTest, AnAspectRatioBeyondReasonIsNotSeenAndDoesNoHarm) {
    auto frame = frameAt(0, 0, 1280, 720);
    frame.aspectWidth = 1;
    frame.aspectHeight = UINT32_MAX;
    EXPECT_TRUE(videoArea(frame, 1280, 720).isEmpty());
}

} // namespace
} // namespace desktop
