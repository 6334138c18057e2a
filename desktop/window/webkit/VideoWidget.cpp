// The video plane under the page: receives the ring of the web process, follows it and repaints what changes.
#include "desktop/window/webkit/VideoWidget.h"

#include <gio/gunixfdlist.h>
#include <glib-unix.h>

#include <string>
#include <utility>

#include "desktop/window/frames/FrameReader.h"
#include "desktop/window/shared/VideoArea.h"
#include "desktop/window/webkit/GlPainter.h"

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

// Copies the pixels of the frame, scaled to `area`, from where they are.
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
    // The ring is written again after the next refresh.
    cairo_surface_finish(pixels);
    cairo_surface_destroy(pixels);
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
    void dropFrames() { replaceReader(nullptr); }
    bool hasFrame() const { return frame().visible != 0; }
    void setOnChange(std::function<void()> onChange) { m_onChange = std::move(onChange); }
    void paint(cairo_t* context, int width, int height) const;

private:
    static gboolean onMessage(WebKitWebContext*, WebKitUserMessage* message, gpointer self);
    static gboolean onPublished(gint, GIOCondition, gpointer self);
    static gboolean onDraw(GtkWidget* widget, cairo_t* context, gpointer self);
    static void onRealize(GtkWidget* widget, gpointer self);
    static void onUnrealize(GtkWidget* widget, gpointer self);

    telix_desktop_frame frame() const { return m_reader ? m_reader->frame() : telix_desktop_frame{}; }
    PixelRect areaInWidget() const;
    void paintWith(GlPainter* painter, cairo_t* context, int width, int height) const;
    void replaceReader(std::unique_ptr<FrameReader> reader);
    void takeNewestFrame();
    void repaint(const PixelRect& area);
    void notifyChange();

    GtkWidget* m_widget;                   // owns a reference
    WebKitWebContext* m_context = nullptr; // owns a reference
    gulong m_messageHandler = 0;
    std::unique_ptr<FrameReader> m_reader; // null: no web process has sent a ring
    guint m_watch = 0;
    std::unique_ptr<GlPainter> m_painter; // null: paint with cairo
    std::function<void()> m_onChange;
};

// ---- The widget

VideoWidget::Private::Private() : m_widget(gtk_drawing_area_new()) {
    g_object_ref_sink(m_widget);
    g_signal_connect(m_widget, "draw", G_CALLBACK(onDraw), this);
    g_signal_connect(m_widget, "realize", G_CALLBACK(onRealize), this);
    g_signal_connect(m_widget, "unrealize", G_CALLBACK(onUnrealize), this);
}

VideoWidget::Private::~Private() {
    m_onChange = nullptr;
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
    const PixelRect area = videoArea(frame(), width, height);
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

PixelRect VideoWidget::Private::areaInWidget() const {
    return videoArea(frame(), gtk_widget_get_allocated_width(m_widget),
                     gtk_widget_get_allocated_height(m_widget));
}

// ---- The frames

void VideoWidget::Private::showFramesOf(WebKitWebContext* context) {
    g_assert(!m_context);
    m_context = WEBKIT_WEB_CONTEXT(g_object_ref(context));
    m_messageHandler = g_signal_connect(context, "user-message-received", G_CALLBACK(onMessage), this);
}

gboolean VideoWidget::Private::onMessage(WebKitWebContext*, WebKitUserMessage* message, gpointer self) {
    if (g_strcmp0(webkit_user_message_get_name(message), kFramesMessage) != 0) {
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
    static_cast<Private*>(self)->replaceReader(std::move(reader));
    return TRUE;
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
    notifyChange();
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
    notifyChange();
}

void VideoWidget::Private::repaint(const PixelRect& area) {
    if (!area.isEmpty()) {
        gtk_widget_queue_draw_area(m_widget, area.x, area.y, area.width, area.height);
    }
}

void VideoWidget::Private::notifyChange() {
    if (m_onChange) {
        m_onChange();
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
void VideoWidget::setOnChange(std::function<void()> onChange) {
    m_private->setOnChange(std::move(onChange));
}
void VideoWidget::paint(cairo_t* context, int width, int height) const {
    m_private->paint(context, width, height);
}

} // namespace desktop
