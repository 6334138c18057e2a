// The picture beneath the page: the newest frame of the platform library, where the page wants it.
#ifndef TELIX_DESKTOP_BROWSER_PICTUREVIEW_H
#define TELIX_DESKTOP_BROWSER_PICTUREVIEW_H

#include "desktop/browser/PictureSource.h"

#include <QMetaObject>
#include <QWidget>

#include <atomic>

// Lies where the page lies and is transparent outside the picture. The platform library is one that the
// plug-in opens at some time; until then, and with one that has no picture, there is nothing to be seen.
class PictureView : public QWidget {
    Q_OBJECT

public:
    explicit PictureView(QWidget* parent);

    // Whether a frame is on the screen.
    bool hasPicture() const { return m_source.frame().visible && m_source.frame().pixels; }

protected:
    bool event(QEvent* event) override;
    void paintEvent(QPaintEvent* event) override;

private:
    static void onWakeup(void* view);
    void findSource();
    void takeNewest();
    QRect target() const;

    // Set while a wake-up is on its way to the window's thread, so that there is never more than one.
    std::atomic<bool> m_wakeupPosted{false};
    PictureSource m_source;
    QMetaObject::Connection m_search;
};

#endif
