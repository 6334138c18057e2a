// Where the video is painted in a window.
#include "desktop/window/shared/VideoArea.h"

#include <algorithm>
#include <cmath>

namespace desktop {

namespace {

struct Area {
    double x;
    double y;
    double width;
    double height;
};

// The area of the frame in `area`: centred, as large as its aspect ratio allows.
Area letterboxed(const Area& area, const telix_desktop_frame& frame) {
    const bool hasAspect = frame.aspectWidth > 0 && frame.aspectHeight > 0;
    const double aspect =
        hasAspect ? double(frame.aspectWidth) / frame.aspectHeight : double(frame.width) / frame.height;
    const double width = std::min(area.width, area.height * aspect);
    const double height = std::min(area.height, area.width / aspect);
    return {area.x + (area.width - width) / 2, area.y + (area.height - height) / 2, width, height};
}

int roundToPixel(double position) {
    return static_cast<int>(std::floor(position + 0.5));
}

} // namespace

PixelRect videoArea(const telix_desktop_frame& frame, int widgetWidth, int widgetHeight) {
    const Area page{0, 0, kPageWidth, kPageHeight};
    const Area area = frame.fullScreen ? page
                                       : Area{double(frame.areaX), double(frame.areaY),
                                              double(frame.areaWidth), double(frame.areaHeight)};
    if (!frame.visible || !frame.pixels || frame.width == 0 || frame.height == 0 || area.width <= 0 ||
        area.height <= 0) {
        return {};
    }
    const Area video = letterboxed(area, frame);
    const double scaleX = double(widgetWidth) / kPageWidth;
    const double scaleY = double(widgetHeight) / kPageHeight;
    const int left = roundToPixel(video.x * scaleX);
    const int top = roundToPixel(video.y * scaleY);
    return {left, top, roundToPixel((video.x + video.width) * scaleX) - left,
            roundToPixel((video.y + video.height) * scaleY) - top};
}

} // namespace desktop
