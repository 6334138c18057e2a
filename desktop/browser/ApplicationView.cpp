// One application of the stack: its page on the screen, and the keys that reach it.
#include "desktop/browser/ApplicationView.h"

#include "desktop/browser/ApplicationPage.h"
#include "desktop/browser/PageGeometry.h"
#include "desktop/browser/PageScript.h"
#include "desktop/browser/RemoteControl.h"
#include "desktop/browser/StyleSheet.h"

#include <QContextMenuEvent>
#include <QCoreApplication>
#include <QImage>
#include <QKeyEvent>
#include <QMouseEvent>
#include <QPaintEvent>
#include <QPainter>
#include <QPalette>
#include <QWebFrame>
#include <QWheelEvent>

namespace {

// The key of the remote control that a keyboard event stands for and that the engine knows no code for, or
// null.
const RemoteKey* keyUnknownToEngine(const QKeyEvent& event) {
    const auto shortcutModifiers = Qt::ControlModifier | Qt::AltModifier | Qt::MetaModifier;
    if (event.modifiers() & shortcutModifiers)
        return nullptr;
    const RemoteKey* key = remoteKeyByKeyboardKey(event.key());
    return key && !key->knownToEngine ? key : nullptr;
}

// The event as the engine should see it: the number pad is part of the remote control, so its keys have the
// codes of the ordinary ones.
QKeyEvent withoutNumberPad(const QKeyEvent& event) {
    return QKeyEvent(event.type(), event.key(), event.modifiers() & ~Qt::KeypadModifier, event.text(),
                     event.isAutoRepeat(), static_cast<ushort>(event.count()));
}

// The text that a keyboard would send along with the key.
QString textOf(const RemoteKey& key) {
    const bool hasText = key.keyCode == '\r' || (key.keyCode >= '0' && key.keyCode <= '9');
    return hasText ? QString(QChar(key.keyCode)) : QString();
}

// Tells the documents in the frame and in those within.
void tellUnloaded(QWebFrame& frame) {
    callPageScript(frame, QStringLiteral("unload"), {});
    for (QWebFrame* child : frame.childFrames())
        tellUnloaded(*child);
}

} // namespace

ApplicationView::ApplicationView(const QString& userAgent, QWidget* parent)
    : QWebView(parent), m_page(new ApplicationPage(userAgent, this)) {
    setPage(m_page);
    m_page->setViewportSize(pageSize);
    // Where a page has no background of its own, what lies beneath it shows. The page takes the view's
    // palette. The view would promise to paint every one of its pixels.
    QPalette transparent = palette();
    transparent.setBrush(QPalette::Base, Qt::transparent);
    setPalette(transparent);
    setAttribute(Qt::WA_OpaquePaintEvent, false);
    if (!m_page->settings()->testAttribute(QWebSettings::DeveloperExtrasEnabled))
        setContextMenuPolicy(Qt::NoContextMenu);
    connect(m_page, &QWebPage::loadStarted, this, [this] { m_loaded = false; });
    connect(m_page, &QWebPage::loadFinished, this, &ApplicationView::onLoadFinished);
    // The engine takes the pixels of the page for those of the view.
    connect(m_page, &QWebPage::repaintRequested, this,
            [this](const QRect& area) { update(aroundOnView(area, size())); });
    connect(m_page, &QWebPage::scrollRequested, this, [this] { update(); });
}

ApplicationView::~ApplicationView() {
    // While a page is taken apart, the engine tells plug-ins that their windows shrink, and they ask the page
    // where they stand. It would lay out what is half gone, and crash or forget some of the plug-ins, which
    // then never end. A page that asks for its layout when it is told of its end would crash the same way. So
    // it is told before, and then the plug-ins end: without a box, an element has none once the layout of all
    // frames is up to date, as it is when the page has been painted.
    tellUnloaded(*m_page->mainFrame());
    QWebSettings* settings = m_page->settings();
    settings->setAttribute(QWebSettings::JavascriptEnabled, false);
    settings->setUserStyleSheetUrl(
        styleSheetUrl(QStringLiteral("object, embed, applet { display: none !important; }")));
    QImage nowhere(1, 1, QImage::Format_ARGB32_Premultiplied);
    QPainter painter(&nowhere);
    m_page->mainFrame()->render(&painter, QRegion(nowhere.rect()));
}

void ApplicationView::onLoadFinished(bool ok) {
    m_loaded = ok || m_hasDocument;
    m_hasDocument = m_loaded;
    if (!m_page->loadFailure().isEmpty())
        emit loadFailed(m_page->loadFailure());
}

void ApplicationView::setShown(bool shown) {
    m_shown = shown;
    tellVisibility();
    update();
}

void ApplicationView::press(const RemoteKey& key) {
    const QString text = textOf(key);
    QKeyEvent press(QEvent::KeyPress, key.keyboardKeys.first(), Qt::NoModifier, text);
    QCoreApplication::sendEvent(this, &press);
    QKeyEvent release(QEvent::KeyRelease, key.keyboardKeys.first(), Qt::NoModifier, text);
    QCoreApplication::sendEvent(this, &release);
}

void ApplicationView::paintEvent(QPaintEvent* event) {
    if (!m_shown)
        return;
    QPainter painter(this);
    painter.setRenderHints(renderHints() | QPainter::SmoothPixmapTransform);
    painter.scale(qreal(width()) / pageSize.width(), qreal(height()) / pageSize.height());
    QRegion onPage;
    for (const QRect& area : event->region())
        onPage += aroundOnPage(area, size());
    m_page->mainFrame()->render(&painter, onPage);
}

// The engine would lay the page out anew.
void ApplicationView::resizeEvent(QResizeEvent*) {}

// The event as the engine should see it.
QMouseEvent ApplicationView::onPage(const QMouseEvent& event) const {
    return QMouseEvent(event.type(), toPage(event.localPos(), size()), event.windowPos(), event.screenPos(),
                       event.button(), event.buttons(), event.modifiers(), event.source());
}

void ApplicationView::mousePressEvent(QMouseEvent* event) {
    QMouseEvent onPage = this->onPage(*event);
    QWebView::mousePressEvent(&onPage);
}

void ApplicationView::mouseReleaseEvent(QMouseEvent* event) {
    QMouseEvent onPage = this->onPage(*event);
    QWebView::mouseReleaseEvent(&onPage);
}

void ApplicationView::mouseMoveEvent(QMouseEvent* event) {
    QMouseEvent onPage = this->onPage(*event);
    QWebView::mouseMoveEvent(&onPage);
}

void ApplicationView::mouseDoubleClickEvent(QMouseEvent* event) {
    QMouseEvent onPage = this->onPage(*event);
    QWebView::mouseDoubleClickEvent(&onPage);
}

void ApplicationView::wheelEvent(QWheelEvent* event) {
    QWheelEvent onPage(toPage(event->position(), size()), event->globalPosition(), event->pixelDelta(),
                       event->angleDelta(), event->buttons(), event->modifiers(), event->phase(),
                       event->inverted(), event->source());
    QWebView::wheelEvent(&onPage);
}

void ApplicationView::contextMenuEvent(QContextMenuEvent* event) {
    QContextMenuEvent onPage(event->reason(), toPage(event->pos(), size()).toPoint(), event->globalPos(),
                             event->modifiers());
    QWebView::contextMenuEvent(&onPage);
}

void ApplicationView::showEvent(QShowEvent* event) {
    QWebView::showEvent(event);
    tellVisibility();
}

void ApplicationView::hideEvent(QHideEvent* event) {
    QWebView::hideEvent(event);
    tellVisibility();
}

void ApplicationView::keyPressEvent(QKeyEvent* event) {
    const RemoteKey* key = keyUnknownToEngine(*event);
    if (!key) {
        QKeyEvent plain = withoutNumberPad(*event);
        QWebView::keyPressEvent(&plain);
        return;
    }
    if (dispatch("keydown", *key))
        dispatch("keypress", *key);
}

void ApplicationView::keyReleaseEvent(QKeyEvent* event) {
    const RemoteKey* key = keyUnknownToEngine(*event);
    if (!key) {
        QKeyEvent plain = withoutNumberPad(*event);
        QWebView::keyReleaseEvent(&plain);
    } else if (!event->isAutoRepeat()) {
        dispatch("keyup", *key);
    }
}

void ApplicationView::tellVisibility() {
    m_page->setVisibilityState(isVisible() && m_shown ? QWebPage::VisibilityStateVisible
                                                      : QWebPage::VisibilityStateHidden);
}

// False when the page prevented the default action.
bool ApplicationView::dispatch(const char* type, const RemoteKey& key) {
    return callPageScript(*m_page->currentFrame(), QStringLiteral("dispatchkey"),
                          {QLatin1String(type), key.keyCode})
        .toBool();
}
