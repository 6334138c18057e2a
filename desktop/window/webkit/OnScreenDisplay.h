// The television's own display above all applications: a line of text for some seconds.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_ONSCREENDISPLAY_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_ONSCREENDISPLAY_H

#include <gtk/gtk.h>

#include <string>

namespace desktop {

// Main thread.
class OnScreenDisplay {
public:
    OnScreenDisplay();
    ~OnScreenDisplay();
    OnScreenDisplay(const OnScreenDisplay&) = delete;
    OnScreenDisplay& operator=(const OnScreenDisplay&) = delete;

    // The widget for the parent's container, which gives it the allocation of the page. It takes no input.
    GtkWidget* widget() const { return m_widget; }

    void show(const std::string& text);

    // Paints what is shown into a page of that size at the origin of `context`: for screenshots.
    void paint(cairo_t* context, int width, int height) const;

private:
    void hide();

    GtkWidget* m_widget; // owns a reference
    std::string m_text;  // empty: nothing is shown
    unsigned m_timer = 0;
};

} // namespace desktop

#endif
