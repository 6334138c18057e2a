// The geometry of pages: always 1280x720 pixels, scaled to the window that shows them.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_PAGEGEOMETRY_H
#define TELIX_DESKTOP_WINDOW_SHARED_PAGEGEOMETRY_H

#include <algorithm>
#include <cstdint>

namespace desktop {

constexpr int kPageWidth = 1280;
constexpr int kPageHeight = 720;

struct PixelRect {
    int x = 0;
    int y = 0;
    int width = 0;
    int height = 0;

    bool isEmpty() const { return width <= 0 || height <= 0; }
    bool operator==(const PixelRect& other) const {
        return x == other.x && y == other.y && width == other.width && height == other.height;
    }
    bool operator!=(const PixelRect& other) const { return !(*this == other); }
};

// The rectangle of the page in a window of that size: centred, as large as its aspect ratio allows.
inline PixelRect pageRectIn(int windowWidth, int windowHeight) {
    const bool isWide = int64_t{windowWidth} * kPageHeight > int64_t{windowHeight} * kPageWidth;
    const int fullWidth = static_cast<int>(int64_t{windowHeight} * kPageWidth / kPageHeight);
    const int fullHeight = static_cast<int>(int64_t{windowWidth} * kPageHeight / kPageWidth);
    const int width = std::max(1, isWide ? fullWidth : windowWidth);
    const int height = std::max(1, isWide ? windowHeight : fullHeight);
    return {(windowWidth - width) / 2, (windowHeight - height) / 2, width, height};
}

} // namespace desktop

#endif
