// The picture beneath the page: the newest frame of the platform library, where the page wants it.
#include "desktop/browser/PictureView.h"

#include "desktop/browser/PageGeometry.h"

#include <QAbstractEventDispatcher>
#include <QCoreApplication>
#include <QEvent>
#include <QImage>
#include <QPainter>

namespace {

QEvent::Type wakeupEvent() {
    static const auto type = static_cast<QEvent::Type>(QEvent::registerEventType());
    return type;
}

// Where a frame of that shape stands in `area`: as large as fits, in the middle.
QRectF letterboxed(const QRectF& area, const telix_desktop_frame& frame) {
    const bool hasAspect = frame.aspectWidth > 0 && frame.aspectHeight > 0;
    const QSizeF shape(hasAspect ? frame.aspectWidth : frame.width,
                       hasAspect ? frame.aspectHeight : frame.height);
    QRectF result(QPointF(), shape.scaled(area.size(), Qt::KeepAspectRatio));
    result.moveCenter(area.center());
    return result;
}

} // namespace

PictureView::PictureView(QWidget* parent) : QWidget(parent), m_source(onWakeup, this) {
    wakeupEvent();
    // The plug-in opens the library in a call of a page, on this thread: the loop turns afterwards.
    m_search = connect(QAbstractEventDispatcher::instance(), &QAbstractEventDispatcher::aboutToBlock, this,
                       &PictureView::findSource);
}

void PictureView::findSource() {
    if (m_source.find())
        disconnect(m_search);
}

// On the library's threads.
void PictureView::onWakeup(void* view) {
    auto* self = static_cast<PictureView*>(view);
    if (!self->m_wakeupPosted.exchange(true))
        QCoreApplication::postEvent(self, new QEvent(wakeupEvent()));
}

bool PictureView::event(QEvent* event) {
    if (event->type() != wakeupEvent())
        return QWidget::event(event);
    // Before the frame is taken: what becomes new meanwhile wakes again.
    m_wakeupPosted = false;
    takeNewest();
    return true;
}

void PictureView::takeNewest() {
    const QRect before = target();
    const auto serialBefore = m_source.frame().serial;
    m_source.refresh();
    const QRect now = target();
    if (now != before || m_source.frame().serial != serialBefore)
        update(QRegion(before) + now);
}

// Empty when there is nothing to be seen.
QRect PictureView::target() const {
    const telix_desktop_frame& frame = m_source.frame();
    const QRectF page(QPointF(), pageSize);
    const QRectF area =
        frame.fullScreen ? page : QRectF(frame.areaX, frame.areaY, frame.areaWidth, frame.areaHeight);
    if (!hasPicture() || frame.width == 0 || frame.height == 0 || area.isEmpty())
        return {};
    return fromPage(letterboxed(area, frame), size());
}

void PictureView::paintEvent(QPaintEvent*) {
    const QRect area = target();
    if (area.isEmpty())
        return;
    const telix_desktop_frame& frame = m_source.frame();
    const QImage image(frame.pixels, static_cast<int>(frame.width), static_cast<int>(frame.height),
                       static_cast<int>(frame.stride), QImage::Format_RGB32);
    QPainter painter(this);
    painter.setRenderHint(QPainter::SmoothPixmapTransform);
    painter.drawImage(area, image);
}
