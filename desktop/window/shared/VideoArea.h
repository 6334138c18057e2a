// Where the video is painted in a window. Knows no toolkit.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_VIDEOAREA_H
#define TELIX_DESKTOP_WINDOW_SHARED_VIDEOAREA_H

#include "desktop/platform/telix_picture.h"
#include "desktop/window/shared/PageGeometry.h"

namespace desktop {

// The pixels that the frame takes in a widget of that size, which shows the whole page of 1280 by 720: in the
// page's area for it or the whole page, centred, as large as its aspect ratio allows. May reach beyond the
// widget as the area may reach beyond the page. Empty if there is nothing to see.
PixelRect videoArea(const telix_desktop_frame& frame, int widgetWidth, int widgetHeight);

} // namespace desktop

#endif
