// Uploads and scales video frames with OpenGL, for displays on a GPU.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_GLPAINTER_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_GLPAINTER_H

#include <gdk/gdk.h>

#include <memory>

#include "desktop/platform/telix_picture.h"
#include "desktop/window/shared/VideoArea.h"

namespace desktop {

// Main thread.
class GlPainter {
public:
    // A painter for a realised window; null if its display has no OpenGL on a GPU, where cairo is faster. The
    // environment variable TELIX_VIDEO decides instead if it is "gl" (also in software) or "cairo". Ends
    // before the window.
    static std::unique_ptr<GlPainter> create(GdkWindow* window);
    ~GlPainter();
    GlPainter(const GlPainter&) = delete;
    GlPainter& operator=(const GlPainter&) = delete;

    // Paints the frame into `area` of a widget that is being drawn. False, with no effect, for an area of
    // which OpenGL makes no texture.
    bool paint(cairo_t* context, const telix_desktop_frame& frame, const PixelRect& area);

    // The next frame is another one, whatever its serial.
    void forgetFrame() { m_hasFrame = false; }

private:
    GlPainter(GdkWindow* window, GdkGLContext* context);

    bool upload(const telix_desktop_frame& frame);
    bool scale(const telix_desktop_frame& frame, int width, int height);

    GdkWindow* m_window;
    GdkGLContext* m_context; // owns a reference
    unsigned m_textures[2] = {};
    unsigned m_framebuffers[2] = {};
    bool m_hasFrame = false;
    uint64_t m_serial = 0; // of the frame in the texture
};

} // namespace desktop

#endif
