// What the browser adds to the window of every page: the functions that open, close, show and hide
// applications, and the key codes of the remote control.
#ifndef TELIX_DESKTOP_BROWSER_PAGEFUNCTIONS_H
#define TELIX_DESKTOP_BROWSER_PAGEFUNCTIONS_H

#include <QObject>

class ApplicationView;
class QWebFrame;
class TvWindow;

// One for each frame, as the frame's child.
class PageFunctions : public QObject {
    Q_OBJECT

public:
    // `application` is the one that the frame belongs to; it calls what the page calls.
    PageFunctions(QWebFrame& frame, ApplicationView& application, TvWindow& window);

    // Called by scripts/pagefunctions.js.
    Q_INVOKABLE bool createApplication(const QString& address);
    Q_INVOKABLE void destroyApplication();
    Q_INVOKABLE void showApplication();
    Q_INVOKABLE void hideApplication();

private:
    void install();

    QWebFrame& m_frame;
    ApplicationView& m_application;
    TvWindow& m_window;
};

#endif
