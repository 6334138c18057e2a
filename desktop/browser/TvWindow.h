// The main window: the video plane and, above it, a stack of applications.
#ifndef TELIX_DESKTOP_BROWSER_TVWINDOW_H
#define TELIX_DESKTOP_BROWSER_TVWINDOW_H

#include <QString>
#include <QVector>
#include <QWidget>

#include "desktop/browser/NetworkAccess.h"

class QUrl;
class QWebInspector;

namespace desktop {

class ApplicationView;
class VideoPlane;

// The topmost application is visible. The video plane shows through where its page is transparent, and
// everywhere if there is no application. Both are scaled to the window, with black bars if the aspect ratios
// differ.
class TvWindow : public QWidget {
    Q_OBJECT

public:
    // `userAgent`: the User-Agent header of requests, and navigator.userAgent.
    explicit TvWindow(const QString& userAgent);
    ~TvWindow() override;

    // Pushes a new application and starts to load its page.
    void openApplication(const QUrl& url);
    // The same for an application that calls it. Returns false, without any change, if the page cannot be
    // loaded or the caller is no longer in the stack.
    bool createApplication(const ApplicationView& caller, const QUrl& url);
    // Pops the topmost application for an application that calls it; ignored if the caller is no longer in
    // the stack. Always the topmost: an application destroys either itself, while it is topmost, or the one
    // that it has created. The window stays open without an application and shows the video plane.
    void destroyTopApplication(const ApplicationView& caller);
    // The visible application, or null.
    ApplicationView* topApplication() const;
    // Opens the web inspector, which follows the topmost application.
    void inspect();
    // Whether the video plane shows a frame.
    bool hasPicture() const;

signals:
    // A document of an application could not be loaded. An application without any document is removed.
    void loadFailed(const QUrl& url, const QString& reason);

protected:
    void resizeEvent(QResizeEvent* event) override;

private:
    bool has(const ApplicationView& application) const;
    void remove(ApplicationView* application);
    void updateTop();
    void place(QWidget& view) const;

    QString m_userAgent;
    VideoPlane* m_videoPlane;
    // One for all applications, because they share cookies.
    NetworkAccess m_network;
    // The last one is the topmost.
    QVector<ApplicationView*> m_applications;
    QWebInspector* m_inspector = nullptr;
};

} // namespace desktop

#endif
