// The video plane under the page: the newest frame of the platform library, in the page's display area.
#include "desktop/window/npapi/VideoPlane.h"

#include <QAbstractEventDispatcher>
#include <QCoreApplication>
#include <QEvent>
#include <QImage>
#include <QPainter>

#include "desktop/window/shared/VideoArea.h"

namespace desktop {

namespace {

QEvent::Type wakeupEvent() {
    static const auto kType = static_cast<QEvent::Type>(QEvent::registerEventType());
    return kType;
}

} // namespace

VideoPlane::VideoPlane(QWidget* parent) : QWidget(parent), m_source(onWakeup, this) {
    wakeupEvent();
    // The plug-in loads the library during a call of a page on this thread, so the event loop runs after it.
    m_searchConnection = connect(QAbstractEventDispatcher::instance(),
                                 &QAbstractEventDispatcher::aboutToBlock, this, &VideoPlane::findSource);
}

void VideoPlane::findSource() {
    if (m_source.find()) {
        disconnect(m_searchConnection);
    }
}

// Called on threads of the platform library.
void VideoPlane::onWakeup(void* view) {
    auto* self = static_cast<VideoPlane*>(view);
    if (!self->m_wakeupPosted.exchange(true)) {
        QCoreApplication::postEvent(self, new QEvent(wakeupEvent()));
    }
}

bool VideoPlane::event(QEvent* event) {
    if (event->type() != wakeupEvent()) {
        return QWidget::event(event);
    }
    // Reset before the frame is acquired, so that a frame that arrives meanwhile posts another event.
    m_wakeupPosted = false;
    showNewestFrame();
    return true;
}

void VideoPlane::showNewestFrame() {
    const QRect before = target();
    const auto serialBefore = m_source.frame().serial;
    m_source.refresh();
    const QRect now = target();
    if (now != before || m_source.frame().serial != serialBefore) {
        update(QRegion(before) + now);
    }
}

// Where the frame is painted; empty if nothing is shown.
QRect VideoPlane::target() const {
    const PixelRect area = videoArea(m_source.frame(), width(), height());
    return {area.x, area.y, area.width, area.height};
}

void VideoPlane::paintEvent(QPaintEvent*) {
    const QRect area = target();
    if (area.isEmpty()) {
        return;
    }
    const telix_desktop_frame& frame = m_source.frame();
    const QImage image(frame.pixels, static_cast<int>(frame.width), static_cast<int>(frame.height),
                       static_cast<int>(frame.stride), QImage::Format_RGB32);
    QPainter painter(this);
    painter.setRenderHint(QPainter::SmoothPixmapTransform);
    painter.drawImage(area, image);
}

} // namespace desktop
