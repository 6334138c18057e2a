// Paints video frames with cairo, without a window.
#include "desktop/window/webkit/FramePainting.h"

#include <cstring>

namespace desktop {

namespace {

constexpr uint32_t kOpaque = 0xFF000000;

// From cairo's pixels, whose fourth byte is unused, to those of ImageData. Both may be the same.
void swapColours(uint32_t* target, const uint32_t* source, size_t count) {
    static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__);
    for (size_t pixel = 0; pixel < count; ++pixel) {
        const uint32_t value = source[pixel];
        target[pixel] =
            kOpaque | (value & 0x0000FF00) | ((value >> 16) & 0x000000FF) | ((value << 16) & 0x00FF0000);
    }
}

} // namespace

void paintFrame(cairo_t* context, const telix_desktop_frame& frame, const PixelRect& area) {
    // Cairo writes into no surface that is a source.
    cairo_surface_t* pixels = cairo_image_surface_create_for_data(
        const_cast<uint8_t*>(frame.pixels), CAIRO_FORMAT_RGB24, static_cast<int>(frame.width),
        static_cast<int>(frame.height), static_cast<int>(frame.stride));
    const double scaleX = double(area.width) / frame.width;
    const double scaleY = double(area.height) / frame.height;
    cairo_save(context);
    cairo_rectangle(context, area.x, area.y, area.width, area.height);
    cairo_clip(context);
    cairo_translate(context, area.x, area.y);
    cairo_scale(context, scaleX, scaleY);
    cairo_set_source_surface(context, pixels, 0, 0);
    cairo_pattern_t* pattern = cairo_get_source(context);
    cairo_pattern_set_filter(pattern,
                             scaleX == 1 && scaleY == 1 ? CAIRO_FILTER_NEAREST : CAIRO_FILTER_BILINEAR);
    // The smoothing at the edges would mix in what is around the frame.
    cairo_pattern_set_extend(pattern, CAIRO_EXTEND_PAD);
    cairo_set_operator(context, CAIRO_OPERATOR_SOURCE);
    cairo_paint(context);
    cairo_restore(context);
    // The pixels change after the next refresh.
    cairo_surface_finish(pixels);
    cairo_surface_destroy(pixels);
}

void fillImage(uint8_t* pixels, int width, int height, const telix_desktop_frame& frame) {
    auto* const image = reinterpret_cast<uint32_t*>(pixels);
    const size_t count = size_t(width) * size_t(height);
    if (!frame.pixels) {
        std::memset(pixels, 0, count * sizeof(uint32_t));
        swapColours(image, image, count);
        return;
    }
    if (frame.width == uint32_t(width) && frame.height == uint32_t(height)) {
        for (size_t line = 0; line < frame.height; ++line) {
            swapColours(image + line * frame.width,
                        reinterpret_cast<const uint32_t*>(frame.pixels + line * frame.stride), frame.width);
        }
        return;
    }
    cairo_surface_t* surface =
        cairo_image_surface_create_for_data(pixels, CAIRO_FORMAT_RGB24, width, height, width * 4);
    cairo_t* context = cairo_create(surface);
    paintFrame(context, frame, {0, 0, width, height});
    cairo_destroy(context);
    cairo_surface_finish(surface);
    cairo_surface_destroy(surface);
    swapColours(image, image, count);
}

} // namespace desktop
