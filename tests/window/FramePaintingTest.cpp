// What a page gets of a frame: the pixels in the order of ImageData, scaled.
#include <cstdint>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "desktop/window/webkit/FramePainting.h"

namespace desktop {
namespace {

using testing::ElementsAre;

// Two pixels with unused fourth bytes, and one of padding.
constexpr uint8_t kPixels[] = {1, 2, 3, 99, 4, 5, 6, 98, 77, 77, 77, 77};

telix_desktop_frame frameOf(uint32_t width, uint32_t height) {
    telix_desktop_frame frame{};
    frame.pixels = kPixels;
    frame.width = width;
    frame.height = height;
    frame.stride = sizeof kPixels;
    frame.visible = 1;
    return frame;
}

TEST(FramePaintingTest, ColoursAreInTheOrderOfImageDataAndOpaque) {
    std::vector<uint8_t> image(8);
    fillImage(image.data(), 2, 1, frameOf(2, 1));
    EXPECT_THAT(image, ElementsAre(3, 2, 1, 255, 6, 5, 4, 255));
}

TEST(FramePaintingTest, AFrameOfAnotherSizeIsScaled) {
    std::vector<uint8_t> image(size_t{4} * 4 * 4);
    fillImage(image.data(), 4, 4, frameOf(1, 1));
    for (size_t pixel = 0; pixel < image.size(); pixel += 4) {
        EXPECT_THAT(std::vector<uint8_t>(&image[pixel], &image[pixel] + 4), ElementsAre(3, 2, 1, 255))
            << pixel;
    }
}

TEST(FramePaintingTest, WithoutAFrameTheImageIsBlack) {
    std::vector<uint8_t> image(8, 1);
    fillImage(image.data(), 2, 1, telix_desktop_frame{});
    EXPECT_THAT(image, ElementsAre(0, 0, 0, 255, 0, 0, 0, 255));
}

} // namespace
} // namespace desktop
