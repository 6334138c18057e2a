// The widget of one application: paints its page and gives it keys and mouse events.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_APPLICATIONVIEW_H
#define TELIX_DESKTOP_WINDOW_NPAPI_APPLICATIONVIEW_H

#include <QWebView>

#include <cstdint>
#include <functional>

namespace desktop {

class ApplicationPage;
struct RemoteKey;

// The key of the remote control that a keyboard event is mapped to; null if it is mapped to none.
const RemoteKey* remoteKeyOf(const QKeyEvent& event);

// The page is laid out for 1280x720 pixels whatever the size of the widget, and painted scaled: scripts and
// plug-ins see the same geometry in every window.
class ApplicationView : public QWebView {
    Q_OBJECT

public:
    // `userAgent`: the User-Agent header of requests, and navigator.userAgent. `keySet` returns the mask of
    // the key groups that pages receive.
    ApplicationView(const QString& userAgent, std::function<uint32_t()> keySet, QWidget* parent);
    ~ApplicationView() override;

    ApplicationPage& applicationPage() const { return *m_page; }
    // Whether a document is loaded and no other is being loaded.
    bool isLoaded() const { return m_loaded; }
    // Whether there is a document, even if the next one is being loaded or could not be loaded.
    bool hasDocument() const { return m_hasDocument; }
    // Whether the application is the visible one of the stack.
    void setOnTop(bool isOnTop);
    // A hidden application paints nothing. It keeps running and receiving keys, so that it can show itself
    // again on a key press.
    void setShown(bool shown);
    bool isShown() const { return m_shown; }
    // Sends the press and the release of a key, as the keyboard would.
    void press(const RemoteKey& key);

signals:
    // A document could not be loaded; the previous one stays.
    void loadFailed(const QString& reason);
    // A key has been pressed that the page does not get.
    void televisionKey(const desktop::RemoteKey& key);

protected:
    void paintEvent(QPaintEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;
    void mousePressEvent(QMouseEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;
    void mouseMoveEvent(QMouseEvent* event) override;
    void mouseDoubleClickEvent(QMouseEvent* event) override;
    void wheelEvent(QWheelEvent* event) override;
    void contextMenuEvent(QContextMenuEvent* event) override;
    void showEvent(QShowEvent* event) override;
    void hideEvent(QHideEvent* event) override;
    void keyPressEvent(QKeyEvent* event) override;
    void keyReleaseEvent(QKeyEvent* event) override;

private:
    void onLoadFinished(bool ok);
    void updateVisibilityState();
    QMouseEvent inPageCoordinates(const QMouseEvent& event) const;
    void dispatchKeyEvent(const char* type, const RemoteKey& key, bool isRepeat);

    bool takePress(const QKeyEvent& event);

    ApplicationPage* m_page;
    std::function<uint32_t()> m_keySet;
    // Whether the page has got the last press, and so gets the release.
    bool m_hasPagePress = false;
    bool m_loaded = false;
    bool m_hasDocument = false;
    bool m_shown = true;
};

} // namespace desktop

#endif
