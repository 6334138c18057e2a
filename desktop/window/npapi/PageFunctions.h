// What the browser adds to the window object of every page: the functions that create, destroy, show and hide
// applications, and the key codes of the remote control.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_PAGEFUNCTIONS_H
#define TELIX_DESKTOP_WINDOW_NPAPI_PAGEFUNCTIONS_H

#include <QObject>

class QWebFrame;

namespace desktop {

class ApplicationView;
class TvWindow;

// One per frame, a child of the frame.
class PageFunctions : public QObject {
    Q_OBJECT

public:
    // `application` is the one that the frame belongs to.
    PageFunctions(QWebFrame& frame, ApplicationView& application, TvWindow& window);

    // Called by scripts/pagefunctions.js.
    Q_INVOKABLE bool createApplication(const QString& url);
    Q_INVOKABLE void destroyApplication();
    Q_INVOKABLE void showApplication();
    Q_INVOKABLE void hideApplication();
    // Called by scripts/watchobjects.js.
    Q_INVOKABLE void warn(const QString& name, const QString& subject);

private:
    void install();

    QWebFrame& m_frame;
    ApplicationView& m_application;
    TvWindow& m_window;
};

} // namespace desktop

#endif
