// The geometry of pages in Qt's types.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_PAGEGEOMETRY_H
#define TELIX_DESKTOP_WINDOW_NPAPI_PAGEGEOMETRY_H

#include <QPointF>
#include <QRect>
#include <QRectF>
#include <QSize>

#include "desktop/window/shared/PageGeometry.h"

namespace desktop {

const QSize kPageSize(kPageWidth, kPageHeight);

// The rectangle of the page in a window of that size: centred, as large as its aspect ratio allows.
inline QRect pageRectIn(const QSize& window) {
    const PixelRect area = pageRectIn(window.width(), window.height());
    return {area.x, area.y, area.width, area.height};
}

// The pixels of a widget of size `view` that show any part of a rectangle of the page, and one more on each
// side for the smoothing.
inline QRect viewRectAround(const QRect& area, const QSize& view) {
    const qreal x = qreal(view.width()) / kPageSize.width();
    const qreal y = qreal(view.height()) / kPageSize.height();
    return QRectF(area.x() * x, area.y() * y, area.width() * x, area.height() * y)
        .toAlignedRect()
        .adjusted(-1, -1, 1, 1);
}

// The reverse: the pixels of the page that any part of a rectangle of the widget shows.
inline QRect pageRectAround(const QRect& area, const QSize& view) {
    const qreal x = qreal(kPageSize.width()) / view.width();
    const qreal y = qreal(kPageSize.height()) / view.height();
    return QRectF(area.x() * x, area.y() * y, area.width() * x, area.height() * y)
        .toAlignedRect()
        .adjusted(-1, -1, 1, 1);
}

// A point of the widget in coordinates of the page.
inline QPointF toPage(const QPointF& point, const QSize& view) {
    return {point.x() * kPageSize.width() / view.width(), point.y() * kPageSize.height() / view.height()};
}

} // namespace desktop

#endif
