// The page of a television, 1280 by 720 pixels whatever the window, and where its pixels stand in a widget
// that shows it enlarged or reduced.
#ifndef TELIX_DESKTOP_BROWSER_PAGEGEOMETRY_H
#define TELIX_DESKTOP_BROWSER_PAGEGEOMETRY_H

#include <QPointF>
#include <QRect>
#include <QRectF>
#include <QSize>

const QSize pageSize(1280, 720);

// The largest rectangle of the page's shape in the middle of a window of that size.
inline QRect pageAreaIn(const QSize& window) {
    QRect area(QPoint(), pageSize.scaled(window, Qt::KeepAspectRatio).expandedTo(QSize(1, 1)));
    area.moveCenter(QRect(QPoint(), window).center());
    return area;
}

// The pixels of a widget of size `view` that an area of the page covers, to the nearest edges.
inline QRect fromPage(const QRectF& area, const QSize& view) {
    const qreal x = qreal(view.width()) / pageSize.width();
    const qreal y = qreal(view.height()) / pageSize.height();
    const QPoint first(qRound(area.left() * x), qRound(area.top() * y));
    const QPoint behindLast(qRound(area.right() * x), qRound(area.bottom() * y));
    return {first, QSize(behindLast.x() - first.x(), behindLast.y() - first.y())};
}

// The pixels of a widget of size `view` that show anything of an area of the page, and one more on each side,
// which smoothing may touch.
inline QRect aroundOnView(const QRect& area, const QSize& view) {
    const qreal x = qreal(view.width()) / pageSize.width();
    const qreal y = qreal(view.height()) / pageSize.height();
    return QRectF(area.x() * x, area.y() * y, area.width() * x, area.height() * y)
        .toAlignedRect()
        .adjusted(-1, -1, 1, 1);
}

// The same in the other direction: what of the page shows in an area of the widget.
inline QRect aroundOnPage(const QRect& area, const QSize& view) {
    const qreal x = qreal(pageSize.width()) / view.width();
    const qreal y = qreal(pageSize.height()) / view.height();
    return QRectF(area.x() * x, area.y() * y, area.width() * x, area.height() * y)
        .toAlignedRect()
        .adjusted(-1, -1, 1, 1);
}

// The point of the page that is shown at a point of the widget.
inline QPointF toPage(const QPointF& point, const QSize& view) {
    return {point.x() * pageSize.width() / view.width(), point.y() * pageSize.height() / view.height()};
}

#endif
