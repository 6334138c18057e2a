// The video plane under the page: the newest frame of the platform library, in the page's display area.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_VIDEOPLANE_H
#define TELIX_DESKTOP_WINDOW_NPAPI_VIDEOPLANE_H

#include <QMetaObject>
#include <QWidget>

#include <atomic>

#include "desktop/window/shared/FrameSource.h"

namespace desktop {

// Has the size of the page and is transparent outside the display area. Shows nothing until the plug-in has
// loaded the platform library, and with a library that offers no frames.
class VideoPlane : public QWidget {
    Q_OBJECT

public:
    explicit VideoPlane(QWidget* parent);

    // Whether a frame is shown.
    bool hasFrame() const { return m_source.frame().visible && m_source.frame().pixels; }

protected:
    bool event(QEvent* event) override;
    void paintEvent(QPaintEvent* event) override;

private:
    static void onWakeup(void* view);
    void findSource();
    void showNewestFrame();
    QRect target() const;

    // Set while a wake-up event is queued for the window's thread: at most one is.
    std::atomic<bool> m_wakeupPosted{false};
    FrameSource m_source;
    QMetaObject::Connection m_searchConnection;
};

} // namespace desktop

#endif
