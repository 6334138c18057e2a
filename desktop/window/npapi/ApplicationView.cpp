// The widget of one application: paints its page and gives it keys and mouse events.
#include "desktop/window/npapi/ApplicationView.h"

#include <QContextMenuEvent>
#include <QCoreApplication>
#include <QHash>
#include <QImage>
#include <QKeyEvent>
#include <QMouseEvent>
#include <QPaintEvent>
#include <QPainter>
#include <QPalette>
#include <QPointer>
#include <QWebElement>
#include <QWebFrame>
#include <QWheelEvent>

#include "desktop/window/npapi/ApplicationPage.h"
#include "desktop/window/npapi/PageGeometry.h"
#include "desktop/window/npapi/StyleSheet.h"
#include "desktop/window/shared/PageScript.h"
#include "desktop/window/shared/RemoteControl.h"

namespace desktop {

namespace {

// The same, but null if the engine has a key code for it.
const RemoteKey* keyWithoutEngineCode(const QKeyEvent& event) {
    const RemoteKey* key = remoteKeyOf(event);
    return key && !key->hasEngineCode ? key : nullptr;
}

// The event for the engine. Pages expect VK_0 to VK_9 also from the keypad, whose keys have other codes.
QKeyEvent withoutKeypadModifier(const QKeyEvent& event) {
    return QKeyEvent(event.type(), event.key(), event.modifiers() & ~Qt::KeypadModifier, event.text(),
                     event.isAutoRepeat(), static_cast<ushort>(event.count()));
}

// Qt's name of a key that the engine has a code for.
int qtKeyOf(const RemoteKey& key) {
    static const QHash<int, int> kKeys = {
        {37, Qt::Key_Left}, {38, Qt::Key_Up}, {39, Qt::Key_Right}, {40, Qt::Key_Down}, {13, Qt::Key_Return}};
    return kKeys.value(key.keyCode, key.keyCode); // those of digits are equal
}

// The key event that a keyboard would send.
QKeyEvent keyboardEvent(QEvent::Type type, const RemoteKey& key) {
    return QKeyEvent(type, key.hasEngineCode ? qtKeyOf(key) : Qt::Key_unknown, Qt::NoModifier, 0,
                     key.keyboardKeys.front(), 0, QString::fromStdString(textOf(key)));
}

// Dispatches the unload events to the documents of the frame and of its descendants. Their listeners may
// remove frames, also their own: the frame itself must not evaluate the script then.
void dispatchUnload(const QPointer<QWebFrame>& frame) {
    frame->documentElement().evaluateJavaScript(QString::fromStdString(pageScriptCall("unload", {})));
    const auto children = [&frame] { return frame ? frame->childFrames() : QList<QWebFrame*>(); };
    for (QWebFrame* child : children()) {
        if (children().contains(child)) {
            dispatchUnload(child);
        }
    }
}

} // namespace

const RemoteKey* remoteKeyOf(const QKeyEvent& event) {
    const auto shortcutModifiers = Qt::ControlModifier | Qt::AltModifier | Qt::MetaModifier;
    return event.modifiers() & shortcutModifiers ? nullptr : remoteKeyByKeyboardKey(event.nativeVirtualKey());
}

ApplicationView::ApplicationView(const QString& userAgent, std::function<uint32_t()> keySet, QWidget* parent)
    : QWebView(parent), m_page(new ApplicationPage(userAgent, this)), m_keySet(std::move(keySet)) {
    setPage(m_page);
    m_page->setViewportSize(kPageSize);
    // Where a page has no background, the video plane shows through. The page takes the palette of the
    // view, which by default declares that it paints every pixel of its own.
    QPalette transparent = palette();
    transparent.setBrush(QPalette::Base, Qt::transparent);
    setPalette(transparent);
    setAttribute(Qt::WA_OpaquePaintEvent, false);
    if (!m_page->settings()->testAttribute(QWebSettings::DeveloperExtrasEnabled)) {
        setContextMenuPolicy(Qt::NoContextMenu);
    }
    connect(m_page, &QWebPage::loadStarted, this, [this] { m_loaded = false; });
    connect(m_page, &QWebPage::loadFinished, this, &ApplicationView::onLoadFinished);
    // The engine assumes that page and view have the same coordinates.
    connect(m_page, &QWebPage::repaintRequested, this,
            [this](const QRect& area) { update(viewRectAround(area, size())); });
    connect(m_page, &QWebPage::scrollRequested, this, [this] { update(); });
}

ApplicationView::~ApplicationView() {
    // In the teardown of a page the engine loses plug-in instances, which are then never destroyed. So the
    // unload events are dispatched here, before the teardown, and then all plug-in instances are destroyed:
    // an element without a layout box has no instance once the layout of all frames is up to date, which
    // painting the page ensures.
    dispatchUnload(m_page->mainFrame());
    QWebSettings* settings = m_page->settings();
    settings->setAttribute(QWebSettings::JavascriptEnabled, false);
    settings->setUserStyleSheetUrl(
        styleSheetUrl(QStringLiteral("object, embed, applet { display: none !important; }")));
    QImage discarded(1, 1, QImage::Format_ARGB32_Premultiplied);
    QPainter painter(&discarded);
    m_page->mainFrame()->render(&painter, QRegion(discarded.rect()));
}

void ApplicationView::onLoadFinished(bool ok) {
    m_loaded = ok || m_hasDocument;
    m_hasDocument = m_loaded;
    if (!m_page->loadFailure().isEmpty()) {
        emit loadFailed(m_page->loadFailure());
    }
}

void ApplicationView::setOnTop(bool isOnTop) {
    setVisible(isOnTop);
}

void ApplicationView::setShown(bool shown) {
    m_shown = shown;
    updateVisibilityState();
    update();
}

void ApplicationView::press(const RemoteKey& key) {
    for (const auto type : {QEvent::KeyPress, QEvent::KeyRelease}) {
        QKeyEvent event = keyboardEvent(type, key);
        QCoreApplication::sendEvent(this, &event);
    }
}

void ApplicationView::paintEvent(QPaintEvent* event) {
    if (!m_shown) {
        return;
    }
    QPainter painter(this);
    painter.setRenderHints(renderHints() | QPainter::SmoothPixmapTransform);
    painter.scale(qreal(width()) / kPageSize.width(), qreal(height()) / kPageSize.height());
    QRegion pageRegion;
    for (const QRect& area : event->region()) {
        pageRegion += pageRectAround(area, size());
    }
    m_page->mainFrame()->render(&painter, pageRegion);
}

// The base class would change the layout size of the page.
void ApplicationView::resizeEvent(QResizeEvent*) {}

QMouseEvent ApplicationView::inPageCoordinates(const QMouseEvent& event) const {
    return QMouseEvent(event.type(), toPage(event.localPos(), size()), event.windowPos(), event.screenPos(),
                       event.button(), event.buttons(), event.modifiers(), event.source());
}

void ApplicationView::mousePressEvent(QMouseEvent* event) {
    QMouseEvent pageEvent = inPageCoordinates(*event);
    QWebView::mousePressEvent(&pageEvent);
}

void ApplicationView::mouseReleaseEvent(QMouseEvent* event) {
    QMouseEvent pageEvent = inPageCoordinates(*event);
    QWebView::mouseReleaseEvent(&pageEvent);
}

void ApplicationView::mouseMoveEvent(QMouseEvent* event) {
    QMouseEvent pageEvent = inPageCoordinates(*event);
    QWebView::mouseMoveEvent(&pageEvent);
}

void ApplicationView::mouseDoubleClickEvent(QMouseEvent* event) {
    QMouseEvent pageEvent = inPageCoordinates(*event);
    QWebView::mouseDoubleClickEvent(&pageEvent);
}

void ApplicationView::wheelEvent(QWheelEvent* event) {
    QWheelEvent pageEvent(toPage(event->position(), size()), event->globalPosition(), event->pixelDelta(),
                          event->angleDelta(), event->buttons(), event->modifiers(), event->phase(),
                          event->inverted(), event->source());
    QWebView::wheelEvent(&pageEvent);
}

void ApplicationView::contextMenuEvent(QContextMenuEvent* event) {
    QContextMenuEvent pageEvent(event->reason(), toPage(event->pos(), size()).toPoint(), event->globalPos(),
                                event->modifiers());
    QWebView::contextMenuEvent(&pageEvent);
}

void ApplicationView::showEvent(QShowEvent* event) {
    QWebView::showEvent(event);
    updateVisibilityState();
}

void ApplicationView::hideEvent(QHideEvent* event) {
    QWebView::hideEvent(event);
    updateVisibilityState();
}

// Returns whether the television has got the key, because the page has not asked for it.
bool ApplicationView::takePress(const QKeyEvent& event) {
    const RemoteKey* key = remoteKeyOf(event);
    m_hasPagePress = !key || (m_keySet() & key->group) != 0;
    if (!m_hasPagePress) {
        emit televisionKey(*key);
    }
    return !m_hasPagePress;
}

void ApplicationView::keyPressEvent(QKeyEvent* event) {
    if (takePress(*event)) {
        return;
    }
    const RemoteKey* key = keyWithoutEngineCode(*event);
    if (!key) {
        QKeyEvent plain = withoutKeypadModifier(*event);
        QWebView::keyPressEvent(&plain);
        return;
    }
    dispatchKeyEvent("keydown", *key, event->isAutoRepeat());
}

void ApplicationView::keyReleaseEvent(QKeyEvent* event) {
    if (!m_hasPagePress && remoteKeyOf(*event)) {
        return;
    }
    const RemoteKey* key = keyWithoutEngineCode(*event);
    if (!key) {
        QKeyEvent plain = withoutKeypadModifier(*event);
        QWebView::keyReleaseEvent(&plain);
    } else if (!event->isAutoRepeat()) {
        dispatchKeyEvent("keyup", *key, false);
    }
}

void ApplicationView::updateVisibilityState() {
    m_page->setVisibilityState(isVisible() && m_shown ? QWebPage::VisibilityStateVisible
                                                      : QWebPage::VisibilityStateHidden);
}

void ApplicationView::dispatchKeyEvent(const char* type, const RemoteKey& key, bool isRepeat) {
    m_page->currentFrame()->evaluateJavaScript(
        QString::fromStdString(dispatchKeyScript(type, key, isRepeat)));
}

} // namespace desktop
