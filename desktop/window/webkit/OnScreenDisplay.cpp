// The television's own display above all applications.
#include "desktop/window/webkit/OnScreenDisplay.h"

#include <utility>

#include "desktop/window/shared/OnScreenText.h"
#include "desktop/window/shared/PageGeometry.h"

namespace desktop {

OnScreenDisplay::OnScreenDisplay() : m_widget(gtk_drawing_area_new()) {
    g_object_ref_sink(m_widget);
    gtk_widget_set_no_show_all(m_widget, TRUE);
    g_signal_connect(
        m_widget, "draw", G_CALLBACK(+[](GtkWidget* widget, cairo_t* context, gpointer display) -> gboolean {
            static_cast<OnScreenDisplay*>(display)->paint(context, gtk_widget_get_allocated_width(widget),
                                                          gtk_widget_get_allocated_height(widget));
            return TRUE;
        }),
        this);
}

OnScreenDisplay::~OnScreenDisplay() {
    if (m_timer) {
        g_source_remove(m_timer);
    }
    g_signal_handlers_disconnect_by_data(m_widget, this);
    g_object_unref(m_widget);
}

void OnScreenDisplay::show(const std::string& text) {
    m_text = text;
    gtk_widget_show(m_widget);
    gtk_widget_queue_draw(m_widget);
    if (m_timer) {
        g_source_remove(m_timer);
    }
    m_timer = g_timeout_add(
        kOnScreenMilliseconds,
        [](gpointer display) -> gboolean {
            static_cast<OnScreenDisplay*>(display)->hide();
            return G_SOURCE_REMOVE;
        },
        this);
}

void OnScreenDisplay::hide() {
    m_timer = 0;
    m_text.clear();
    gtk_widget_hide(m_widget);
}

void OnScreenDisplay::paint(cairo_t* context, int width, int height) const {
    if (m_text.empty()) {
        return;
    }
    cairo_save(context);
    cairo_scale(context, static_cast<double>(width) / kPageWidth, static_cast<double>(height) / kPageHeight);
    g_autoptr(PangoLayout) layout = pango_cairo_create_layout(context);
    PangoFontDescription* font = pango_font_description_from_string("sans");
    pango_font_description_set_absolute_size(font, kOnScreenFontSize * PANGO_SCALE);
    pango_layout_set_font_description(layout, font);
    pango_font_description_free(font);
    pango_layout_set_text(layout, m_text.c_str(), -1);
    int textWidth = 0;
    int textHeight = 0;
    pango_layout_get_pixel_size(layout, &textWidth, &textHeight);
    const int left = kPageWidth - kOnScreenMargin - 2 * kOnScreenPadding - textWidth;
    cairo_rectangle(context, left, kOnScreenMargin, textWidth + 2 * kOnScreenPadding,
                    textHeight + 2 * kOnScreenPadding);
    cairo_set_source_rgba(context, kOnScreenBackground.red / 255.0, kOnScreenBackground.green / 255.0,
                          kOnScreenBackground.blue / 255.0, kOnScreenOpacity);
    cairo_fill(context);
    cairo_move_to(context, left + kOnScreenPadding, kOnScreenMargin + kOnScreenPadding);
    cairo_set_source_rgb(context, 1, 1, 1);
    pango_cairo_show_layout(context, layout);
    cairo_restore(context);
}

} // namespace desktop
