// Uploads and scales video frames with OpenGL, for displays on a GPU.
#include "desktop/window/webkit/GlPainter.h"

#include <epoxy/gl.h>

#include <cstring>
#include <string>

#include "desktop/window/webkit/GpuDevice.h"

namespace desktop {

namespace {

// What the textures and framebuffers of those numbers hold: the frame, and what is painted of it.
enum Role { kFrame, kScaled };

bool isSoftwareRenderer() {
    const auto* name = reinterpret_cast<const char*>(glGetString(GL_RENDERER));
    const std::string renderer = name ? name : "";
    for (const char* software : {"llvmpipe", "softpipe", "swrast", "Software", "SWR"}) {
        if (renderer.find(software) != std::string::npos) {
            return true;
        }
    }
    return renderer.empty();
}

GdkGLContext* makeContext(GdkWindow* window) {
    GError* error = nullptr;
    GdkGLContext* context = gdk_window_create_gl_context(window, &error);
    if (context && !gdk_gl_context_realize(context, &error)) {
        g_clear_object(&context);
    }
    g_clear_error(&error); // no OpenGL: not an error, it is painted with cairo
    return context;
}

} // namespace

std::unique_ptr<GlPainter> GlPainter::create(GdkWindow* window) {
    const char* const wanted = g_getenv("TELIX_VIDEO");
    const bool isForced = g_strcmp0(wanted, "gl") == 0;
    if (!isForced && (g_strcmp0(wanted, "cairo") == 0 || !hasGpuDevice())) {
        return nullptr;
    }
    GdkGLContext* context = makeContext(window);
    if (!context) {
        return nullptr;
    }
    gdk_gl_context_make_current(context);
    // OpenGL ES has no textures of the frames' format without extensions.
    if (gdk_gl_context_get_use_es(context) || (!isForced && isSoftwareRenderer())) {
        gdk_gl_context_clear_current();
        g_object_unref(context);
        return nullptr;
    }
    return std::unique_ptr<GlPainter>(new GlPainter(window, context));
}

GlPainter::GlPainter(GdkWindow* window, GdkGLContext* context) : m_window(window), m_context(context) {
    glGenTextures(2, m_textures);
    glGenFramebuffers(2, m_framebuffers);
}

GlPainter::~GlPainter() {
    gdk_gl_context_make_current(m_context);
    glDeleteFramebuffers(2, m_framebuffers);
    glDeleteTextures(2, m_textures);
    gdk_gl_context_clear_current();
    g_object_unref(m_context);
}

bool GlPainter::paint(cairo_t* context, const telix_desktop_frame& frame, const PixelRect& area) {
    const int pixelScale = gdk_window_get_scale_factor(m_window);
    const int width = area.width * pixelScale;
    const int height = area.height * pixelScale;
    gdk_gl_context_make_current(m_context);
    if (!upload(frame) || !scale(frame, width, height)) {
        return false;
    }
    cairo_save(context);
    cairo_translate(context, area.x, area.y);
    gdk_cairo_draw_from_gl(context, m_window, static_cast<int>(m_textures[kScaled]), GL_TEXTURE, pixelScale,
                           0, 0, width, height);
    cairo_restore(context);
    return true;
}

// Makes the frame the image of its texture.
bool GlPainter::upload(const telix_desktop_frame& frame) {
    if (m_hasFrame && frame.serial == m_serial) {
        return true;
    }
    GLint largest = 0;
    glGetIntegerv(GL_MAX_TEXTURE_SIZE, &largest);
    const auto width = static_cast<GLsizei>(frame.width);
    const auto height = static_cast<GLsizei>(frame.height);
    if (width > largest || height > largest) {
        return false;
    }
    glBindTexture(GL_TEXTURE_2D, m_textures[kFrame]);
    glPixelStorei(GL_UNPACK_ROW_LENGTH, static_cast<GLint>(frame.stride / 4));
    // Without alpha: the fourth byte of the pixels is unused.
    glTexImage2D(GL_TEXTURE_2D, 0, GL_RGB8, width, height, 0, GL_BGRA, GL_UNSIGNED_BYTE, frame.pixels);
    glPixelStorei(GL_UNPACK_ROW_LENGTH, 0);
    m_hasFrame = true;
    m_serial = frame.serial;
    return true;
}

// Scales the frame's texture to the other one, upside down, as the origin of OpenGL's images is at the
// bottom.
bool GlPainter::scale(const telix_desktop_frame& frame, int width, int height) {
    GLint largest = 0;
    glGetIntegerv(GL_MAX_RENDERBUFFER_SIZE, &largest);
    if (width > largest || height > largest) {
        return false;
    }
    glBindTexture(GL_TEXTURE_2D, m_textures[kScaled]);
    glTexImage2D(GL_TEXTURE_2D, 0, GL_RGB8, width, height, 0, GL_BGRA, GL_UNSIGNED_BYTE, nullptr);
    glBindFramebuffer(GL_READ_FRAMEBUFFER, m_framebuffers[kFrame]);
    glFramebufferTexture2D(GL_READ_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, m_textures[kFrame], 0);
    glBindFramebuffer(GL_DRAW_FRAMEBUFFER, m_framebuffers[kScaled]);
    glFramebufferTexture2D(GL_DRAW_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, m_textures[kScaled], 0);
    const bool isComplete = glCheckFramebufferStatus(GL_DRAW_FRAMEBUFFER) == GL_FRAMEBUFFER_COMPLETE &&
                            glCheckFramebufferStatus(GL_READ_FRAMEBUFFER) == GL_FRAMEBUFFER_COMPLETE;
    if (isComplete) {
        glBlitFramebuffer(0, 0, static_cast<GLint>(frame.width), static_cast<GLint>(frame.height), 0, height,
                          width, 0, GL_COLOR_BUFFER_BIT, GL_LINEAR);
    }
    glBindFramebuffer(GL_FRAMEBUFFER, 0);
    return isComplete;
}

} // namespace desktop
