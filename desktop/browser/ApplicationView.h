// One application of the stack: its page on the screen, and the keys that reach it.
#ifndef TELIX_DESKTOP_BROWSER_APPLICATIONVIEW_H
#define TELIX_DESKTOP_BROWSER_APPLICATIONVIEW_H

#include <QWebView>

class ApplicationPage;
struct RemoteKey;

// The page is laid out on 1280 by 720 pixels whatever the view's size, and painted enlarged or reduced:
// script and plug-ins see the same geometry in every window.
class ApplicationView : public QWebView {
    Q_OBJECT

public:
    // `userAgent`: what the page says it is, to servers and to its scripts.
    ApplicationView(const QString& userAgent, QWidget* parent);
    ~ApplicationView() override;

    ApplicationPage& applicationPage() const { return *m_page; }
    // Whether a document is loaded and no other on its way.
    bool isLoaded() const { return m_loaded; }
    // Whether there is a document, even if the next is on its way or could not be loaded.
    bool hasDocument() const { return m_hasDocument; }
    // An application that isn't shown paints nothing; it goes on running and has the keys, so that it can
    // show itself again at the press of one.
    void setShown(bool shown);
    // Presses and releases a key as if it came from the keyboard.
    void press(const RemoteKey& key);

signals:
    // A document could not be loaded; the one before it stays.
    void loadFailed(const QString& reason);

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
    void tellVisibility();
    QMouseEvent onPage(const QMouseEvent& event) const;
    bool dispatch(const char* type, const RemoteKey& key);

    ApplicationPage* m_page;
    bool m_loaded = false;
    bool m_hasDocument = false;
    bool m_shown = true;
};

#endif
