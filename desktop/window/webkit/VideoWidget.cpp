// The video plane under the page: receives the ring of the web process, follows it and repaints what changes.
#include "desktop/window/webkit/VideoWidget.h"

#include <gio/gunixfdlist.h>
#include <glib-unix.h>

#include <string>
#include <utility>

#include "desktop/window/frames/FrameReader.h"
#include "desktop/window/shared/VideoArea.h"
#include "desktop/window/webkit/FramePainting.h"
#include "desktop/window/webkit/GlPainter.h"
#include "desktop/window/webkit/Messages.h"

namespace desktop {

namespace {

// Paints what of a widget of that size is not video.
void paintBlackAround(cairo_t* context, const PixelRect& video, int width, int height) {
    const cairo_rectangle_int_t widget{0, 0, width, height};
    const cairo_rectangle_int_t hole{video.x, video.y, video.width, video.height};
    cairo_region_t* region = cairo_region_create_rectangle(&widget);
    cairo_region_subtract_rectangle(region, &hole);
    gdk_cairo_region(context, region);
    cairo_region_destroy(region);
    cairo_set_source_rgb(context, 0, 0, 0);
    cairo_fill(context);
}

} // namespace

class VideoWidget::Private {
public:
    Private();
    ~Private();
    Private(const Private&) = delete;
    Private& operator=(const Private&) = delete;

    GtkWidget* widget() const { return m_widget; }
    void showFramesOf(WebKitWebContext* context);
    void dropFrames();
    bool hasFrame() const { return frame().visible != 0; }
    void paint(cairo_t* context, int width, int height) const;

private:
    static gboolean onMessage(WebKitWebContext*, WebKitUserMessage* message, gpointer self);
    static gboolean onPublished(gint, GIOCondition, gpointer self);
    static gboolean onDraw(GtkWidget* widget, cairo_t* context, gpointer self);
    static void onRealize(GtkWidget* widget, gpointer self);
    static void onUnrealize(GtkWidget* widget, gpointer self);

    bool isInPage() const;
    void leaveToPage(uint64_t presenter);
    telix_desktop_frame frame() const { return m_reader ? m_reader->frame() : telix_desktop_frame{}; }
    PixelRect areaIn(int width, int height) const;
    PixelRect areaInWidget() const;
    void paintWith(GlPainter* painter, cairo_t* context, int width, int height) const;
    void replaceReader(std::unique_ptr<FrameReader> reader);
    void takeNewestFrame();
    void repaint(const PixelRect& area);

    GtkWidget* m_widget;                   // owns a reference
    WebKitWebContext* m_context = nullptr; // owns a reference
    gulong m_messageHandler = 0;
    std::unique_ptr<FrameReader> m_reader; // null: no web process has sent a ring
    guint m_watch = 0;
    uint64_t m_pagePresenter = 0;         // whose video the page shows; 0: none
    std::unique_ptr<GlPainter> m_painter; // null: paint with cairo
};

// ---- The widget

VideoWidget::Private::Private() : m_widget(gtk_drawing_area_new()) {
    g_object_ref_sink(m_widget);
    g_signal_connect(m_widget, "draw", G_CALLBACK(onDraw), this);
    g_signal_connect(m_widget, "realize", G_CALLBACK(onRealize), this);
    g_signal_connect(m_widget, "unrealize", G_CALLBACK(onUnrealize), this);
}

VideoWidget::Private::~Private() {
    replaceReader(nullptr);
    if (m_context) {
        g_signal_handler_disconnect(m_context, m_messageHandler);
        g_object_unref(m_context);
    }
    g_signal_handlers_disconnect_by_data(m_widget, this);
    g_object_unref(m_widget);
}

void VideoWidget::Private::onRealize(GtkWidget* widget, gpointer self) {
    static_cast<Private*>(self)->m_painter = GlPainter::create(gtk_widget_get_window(widget));
}

void VideoWidget::Private::onUnrealize(GtkWidget*, gpointer self) {
    static_cast<Private*>(self)->m_painter.reset();
}

gboolean VideoWidget::Private::onDraw(GtkWidget* widget, cairo_t* context, gpointer self) {
    const auto& video = *static_cast<Private*>(self);
    video.paintWith(video.m_painter.get(), context, gtk_widget_get_allocated_width(widget),
                    gtk_widget_get_allocated_height(widget));
    return TRUE;
}

// With OpenGL if there is a painter.
void VideoWidget::Private::paintWith(GlPainter* painter, cairo_t* context, int width, int height) const {
    const PixelRect area = areaIn(width, height);
    paintBlackAround(context, area, width, height);
    if (!area.isEmpty() && !(painter && painter->paint(context, frame(), area))) {
        paintFrame(context, frame(), area);
    }
}

void VideoWidget::Private::paint(cairo_t* context, int width, int height) const {
    cairo_save(context);
    cairo_rectangle(context, 0, 0, width, height);
    cairo_clip(context);
    paintWith(nullptr, context, width, height);
    cairo_restore(context);
}

PixelRect VideoWidget::Private::areaIn(int width, int height) const {
    return isInPage() ? PixelRect{} : videoArea(frame(), width, height);
}

PixelRect VideoWidget::Private::areaInWidget() const {
    return areaIn(gtk_widget_get_allocated_width(m_widget), gtk_widget_get_allocated_height(m_widget));
}

// ---- The frames

void VideoWidget::Private::showFramesOf(WebKitWebContext* context) {
    g_assert(!m_context);
    m_context = WEBKIT_WEB_CONTEXT(g_object_ref(context));
    m_messageHandler = g_signal_connect(context, "user-message-received", G_CALLBACK(onMessage), this);
}

gboolean VideoWidget::Private::onMessage(WebKitWebContext*, WebKitUserMessage* message, gpointer self) {
    auto& video = *static_cast<Private*>(self);
    const char* name = webkit_user_message_get_name(message);
    if (g_strcmp0(name, kPagePresenterMessage) == 0) {
        uint64_t presenter = 0;
        g_variant_get(webkit_user_message_get_parameters(message), "(t)", &presenter);
        video.leaveToPage(presenter);
        webkit_user_message_send_reply(message, webkit_user_message_new(kPagePresenterMessage, nullptr));
        return TRUE;
    }
    if (g_strcmp0(name, kFramesMessage) != 0) {
        return FALSE;
    }
    GUnixFDList* descriptors = webkit_user_message_get_fd_list(message);
    if (!descriptors || g_unix_fd_list_get_length(descriptors) != 2) {
        g_printerr("telix-tv: frames: wrong number of descriptors\n");
        return TRUE;
    }
    std::string error;
    const int memory = g_unix_fd_list_get(descriptors, 0, nullptr);
    const int wakeup = g_unix_fd_list_get(descriptors, 1, nullptr);
    auto reader = FrameReader::open(memory, wakeup, error);
    if (!reader) {
        g_printerr("telix-tv: %s\n", error.c_str());
        return TRUE;
    }
    video.replaceReader(std::move(reader));
    return TRUE;
}

// Full screen lies behind the page.
bool VideoWidget::Private::isInPage() const {
    return m_pagePresenter != 0 && frame().presenter == m_pagePresenter && !frame().fullScreen;
}

void VideoWidget::Private::leaveToPage(uint64_t presenter) {
    const PixelRect before = areaInWidget();
    m_pagePresenter = presenter;
    if (m_reader) {
        m_reader->refresh();
    }
    repaint(before);
    repaint(areaInWidget());
}

void VideoWidget::Private::dropFrames() {
    m_pagePresenter = 0;
    replaceReader(nullptr);
}

void VideoWidget::Private::replaceReader(std::unique_ptr<FrameReader> reader) {
    if (m_watch != 0) {
        g_source_remove(m_watch);
        m_watch = 0;
    }
    const PixelRect before = areaInWidget();
    m_reader = std::move(reader);
    if (m_painter) {
        m_painter->forgetFrame(); // another process may use the same serial
    }
    if (m_reader) {
        m_reader->refresh();
        // Before other sources: frames are due at a time.
        m_watch = g_unix_fd_add_full(G_PRIORITY_HIGH, m_reader->pollDescriptor(), G_IO_IN, onPublished, this,
                                     nullptr);
    }
    repaint(before);
    repaint(areaInWidget());
}

gboolean VideoWidget::Private::onPublished(gint, GIOCondition, gpointer self) {
    static_cast<Private*>(self)->takeNewestFrame();
    return G_SOURCE_CONTINUE;
}

void VideoWidget::Private::takeNewestFrame() {
    const PixelRect before = areaInWidget();
    const uint64_t serialBefore = frame().serial;
    m_reader->refresh();
    const PixelRect now = areaInWidget();
    if (now == before && frame().serial == serialBefore) {
        return;
    }
    repaint(before);
    repaint(now);
}

void VideoWidget::Private::repaint(const PixelRect& area) {
    if (!area.isEmpty()) {
        gtk_widget_queue_draw_area(m_widget, area.x, area.y, area.width, area.height);
    }
}

// ---- The public class

VideoWidget::VideoWidget() : m_private(std::make_unique<Private>()) {}
VideoWidget::~VideoWidget() = default;

GtkWidget* VideoWidget::widget() const {
    return m_private->widget();
}
void VideoWidget::showFramesOf(WebKitWebContext* context) {
    m_private->showFramesOf(context);
}
void VideoWidget::dropFrames() {
    m_private->dropFrames();
}
bool VideoWidget::hasFrame() const {
    return m_private->hasFrame();
}
void VideoWidget::paint(cairo_t* context, int width, int height) const {
    m_private->paint(context, width, height);
}

} // namespace desktop
