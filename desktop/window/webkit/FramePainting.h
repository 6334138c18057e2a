// Paints video frames with cairo, without a window.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_FRAMEPAINTING_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_FRAMEPAINTING_H

#include <cairo.h>

#include <cstddef>
#include <cstdint>

#include "desktop/platform/telix_picture.h"
#include "desktop/window/shared/PageGeometry.h"

namespace desktop {

// Copies the pixels of a frame that has some, scaled to `area`, from where they are. Any thread.
void paintFrame(cairo_t* context, const telix_desktop_frame& frame, const PixelRect& area);

// Fills an image of the format of ImageData (four bytes a pixel: red, green, blue, alpha) with the frame,
// scaled to it, or with black if the frame has no pixels. `pixels` has room for width * height pixels. Any
// thread.
void fillImage(uint8_t* pixels, int width, int height, const telix_desktop_frame& frame);

} // namespace desktop

#endif
