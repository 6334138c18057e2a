// The window: a stack of applications, the topmost on the screen.
#ifndef TELIX_DESKTOP_BROWSER_TVWINDOW_H
#define TELIX_DESKTOP_BROWSER_TVWINDOW_H

#include "desktop/browser/NetworkAccess.h"

#include <QString>
#include <QVector>
#include <QWidget>

class ApplicationView;
class PictureView;
class QUrl;
class QWebInspector;

// The window is black. On it lies the picture of the platform library, and on that lie the applications'
// views: the picture shows through wherever the page on top is transparent, and everywhere when there is no
// application. A window of another size than the page's shows both enlarged or reduced, with black bars if
// its shape is another.
class TvWindow : public QWidget {
    Q_OBJECT

public:
    // `userAgent`: what servers and pages are told that this is.
    explicit TvWindow(const QString& userAgent);
    ~TvWindow() override;

    // Puts a new application on top and starts to load its page.
    void openApplication(const QUrl& url);
    // The same at the wish of an application. False, and nothing changes, when the page can't be loaded.
    bool createApplication(const ApplicationView& caller, const QUrl& url);
    // Takes the topmost application off the stack at the wish of an application and brings back the one
    // beneath. The topmost, whichever asks: an application asks either for its own end, when it is the
    // topmost, or for that of the one that it has put on top of itself. After the last the window stays,
    // without an application: a viewer who leaves an application is back at the picture.
    void destroyTopApplication(const ApplicationView& caller);
    // The application on the screen, or null.
    ApplicationView* topApplication() const;
    // Opens the engine's inspector, which looks into the topmost application from then on.
    void inspect();
    // Whether there is a picture beneath the page.
    bool hasPicture() const;

signals:
    // A document of an application could not be loaded. An application without any has left the stack.
    void loadFailed(const QUrl& url, const QString& reason);

protected:
    void resizeEvent(QResizeEvent* event) override;

private:
    bool has(const ApplicationView& application) const;
    void remove(ApplicationView* application);
    void bringUpTop();
    void place(QWidget& view) const;

    QString m_userAgent;
    PictureView* m_picture;
    // Shared by all applications, as the cookies are.
    NetworkAccess m_network;
    // The topmost last.
    QVector<ApplicationView*> m_applications;
    QWebInspector* m_inspector = nullptr;
};

#endif
