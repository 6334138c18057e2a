// The main window: the video plane and, above it, a stack of applications.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_TVWINDOW_H
#define TELIX_DESKTOP_WINDOW_NPAPI_TVWINDOW_H

#include <QString>
#include <QWidget>

#include <atomic>

#include "desktop/window/npapi/NetworkAccess.h"
#include "desktop/window/shared/ApplicationStack.h"
#include "desktop/window/shared/ApplicationTarget.h"
#include "desktop/window/shared/MediaRequests.h"
#include "desktop/window/shared/ScriptedWindow.h"
#include "desktop/window/shared/Television.h"
#include "desktop/window/shared/TelevisionLibrary.h"

class QUrl;
class QWebInspector;

namespace desktop {

class ApplicationView;
class OnScreenDisplay;
class VideoPlane;
struct CommandLine;

// The topmost application is visible. The video plane shows through where its page is transparent, and
// everywhere if there is no application. Both are scaled to the window, with black bars if the aspect ratios
// differ.
class TvWindow : public QWidget, public ScriptedWindow {
    Q_OBJECT

public:
    explicit TvWindow(const CommandLine& commandLine);
    ~TvWindow() override;

    // Pushes a new application and starts to load its page.
    ApplicationView& openApplication(const QUrl& url);
    // The same for an application that calls it. Returns false, without any change, if the page cannot be
    // loaded, the stack is full or the caller is no longer in it.
    bool createApplication(const ApplicationView& caller, const QUrl& url);
    // Ends the application that calls it; ignored if it is no longer in the stack. The window stays open
    // without an application and shows the video plane.
    void destroyApplication(ApplicationView& caller);
    // Warns of something in the page of an application, see Warnings.h; ignored if the application is no
    // longer in the stack.
    void warn(const ApplicationView& application, Warning warning, const std::string& subject);
    // The same for the application whose document has that URL.
    void warn(const std::string& page, Warning warning, const std::string& subject);
    // Opens the web inspector, which follows the topmost application.
    void inspect();

    bool hasApplication() const override { return m_stack.top() != nullptr; }
    bool isTopLoaded() const override;
    bool isIdle() const override;
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
    bool event(QEvent* event) override;
    void keyPressEvent(QKeyEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;

private:
    static void onWakeup(void* window);
    void startTelevision();
    Television::Library libraryCalls();
    SignalledApplications::Window stackCalls();
    MediaRequests::Browser mediaBrowser();
    ApplicationView& push();
    ApplicationView& openSignalled(const std::string& url);
    ApplicationTarget findTarget(const std::string& url);
    void openTarget(const ApplicationTarget& target);
    void onLoadFailed(ApplicationView& application, const QUrl& url, const QString& reason);
    void remove(ApplicationView* application);
    void removeFrom(const ApplicationView& lowest);
    void updateTop();
    void place(QWidget& view) const;

    RequestOptions m_requestOptions;
    bool m_isStrict;
    TelevisionStart m_start;
    TelevisionLibrary m_library;
    QMetaObject::Connection m_searchConnection;
    // Set while a wake-up event is queued for the window's thread: at most one is.
    std::atomic<bool> m_wakeupPosted{false};
    VideoPlane* m_videoPlane;
    OnScreenDisplay* m_display;
    Television m_television;
    // One for all applications, because they share cookies.
    NetworkAccess m_network;
    ApplicationStack<ApplicationView> m_stack;
    QWebInspector* m_inspector = nullptr;
    MediaRequests m_mediaRequests;
};

} // namespace desktop

#endif
