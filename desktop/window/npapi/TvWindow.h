// The main window: the video plane and, above it, a stack of applications.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_TVWINDOW_H
#define TELIX_DESKTOP_WINDOW_NPAPI_TVWINDOW_H

#include <QString>
#include <QWidget>

#include "desktop/window/npapi/NetworkAccess.h"
#include "desktop/window/shared/ApplicationStack.h"
#include "desktop/window/shared/ScriptedWindow.h"

class QUrl;
class QWebInspector;

namespace desktop {

class ApplicationView;
class VideoPlane;

// The topmost application is visible. The video plane shows through where its page is transparent, and
// everywhere if there is no application. Both are scaled to the window, with black bars if the aspect ratios
// differ.
class TvWindow : public QWidget, public ScriptedWindow {
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
    // Opens the web inspector, which follows the topmost application.
    void inspect();

    bool hasApplication() const override { return m_stack.top() != nullptr; }
    bool isTopLoaded() const override;
    void press(const RemoteKey& key, std::function<void()> done) override;
    void evaluate(const std::string& expression, std::function<void(Evaluation)> done) override;
    bool hasPicture() const override;
    void writeScreenshot(const std::string& file,
                         std::function<void(const std::string& error)> done) override;
    void paint(uint8_t* pixels, int stride) override;
    void open(const std::string& url, std::function<void(const std::string& error)> done) override;
    void reload(std::function<void(const std::string& error)> done) override;
    std::vector<RunningApplication> applications() const override;

signals:
    // A document of an application could not be loaded. An application without any document is removed.
    void loadFailed(const QUrl& url, const QString& reason);

protected:
    void resizeEvent(QResizeEvent* event) override;

private:
    void remove(ApplicationView* application);
    void updateTop();
    void place(QWidget& view) const;

    QString m_userAgent;
    VideoPlane* m_videoPlane;
    // One for all applications, because they share cookies.
    NetworkAccess m_network;
    ApplicationStack<ApplicationView> m_stack;
    QWebInspector* m_inspector = nullptr;
};

} // namespace desktop

#endif
