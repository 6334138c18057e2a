// The video plane under the page: the newest frame of the page's web process, in the page's display area.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_VIDEOWIDGET_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_VIDEOWIDGET_H

#include <gtk/gtk.h>
#include <webkit2/webkit2.h>

#include <memory>

#include "desktop/platform/telix_picture.h"

namespace desktop {

// Black where there is no video. Has the size of the page, so the parent gives it the same allocation as the
// web view above it. Paints with OpenGL if the display has it on a GPU, otherwise with cairo. Main thread.
class VideoWidget {
public:
    VideoWidget();
    ~VideoWidget();
    VideoWidget(const VideoWidget&) = delete;
    VideoWidget& operator=(const VideoWidget&) = delete;

    // The widget, for the parent's container. It may outlive this object and is black then.
    GtkWidget* widget() const;

    // Shows the frames of this context's web process from now on; they arrive when the extension
    // libtelix-tv-extension.so is in the process. Answers only its own message of "user-message-received". A
    // new web process replaces the previous one. Keeps the context.
    void showFramesOf(WebKitWebContext* context);

    // Shows black until a web process sends frames again: for one that has ended, which cannot say so.
    void dropFrames();

    // Whether a frame is shown.
    bool hasFrame() const;

    // Paints the video, black around it, into a rectangle of that size at the origin of `context`: for
    // screenshots and recordings.
    void paint(cairo_t* context, int width, int height) const;

private:
    class Private;
    std::unique_ptr<Private> m_private;
};

} // namespace desktop

#endif
