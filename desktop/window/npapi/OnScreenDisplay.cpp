// The television's own display above all applications.
#include "desktop/window/npapi/OnScreenDisplay.h"

#include <QFontMetrics>
#include <QPainter>

#include "desktop/window/npapi/PageGeometry.h"
#include "desktop/window/shared/OnScreenText.h"

namespace desktop {

OnScreenDisplay::OnScreenDisplay(QWidget* parent) : QWidget(parent) {
    setAttribute(Qt::WA_TransparentForMouseEvents);
    setVisible(false);
    m_timer.setSingleShot(true);
    connect(&m_timer, &QTimer::timeout, this, &QWidget::hide);
}

void OnScreenDisplay::show(const QString& text) {
    m_text = text;
    m_timer.start(kOnScreenMilliseconds);
    raise();
    setVisible(true);
    update();
}

void OnScreenDisplay::paintEvent(QPaintEvent*) {
    QPainter painter(this);
    painter.scale(qreal(width()) / kPageSize.width(), qreal(height()) / kPageSize.height());
    QFont font(QStringLiteral("sans"));
    font.setPixelSize(kOnScreenFontSize);
    painter.setFont(font);
    const QRect text = QFontMetrics(font).boundingRect(m_text);
    QRect box(0, kOnScreenMargin, text.width() + 2 * kOnScreenPadding, text.height() + 2 * kOnScreenPadding);
    box.moveRight(kPageSize.width() - kOnScreenMargin);
    const auto& colour = kOnScreenBackground;
    painter.fillRect(box, QColor(colour.red, colour.green, colour.blue, int(kOnScreenOpacity * 255)));
    painter.setPen(Qt::white);
    painter.drawText(box, Qt::AlignCenter, m_text);
}

} // namespace desktop
