// The WebKit window: the video plane and, above it, a stack of applications.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_TVWINDOW_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_TVWINDOW_H

#include <gtk/gtk.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "desktop/window/shared/ApplicationStack.h"
#include "desktop/window/shared/ApplicationTarget.h"
#include "desktop/window/shared/ScriptedWindow.h"
#include "desktop/window/shared/Television.h"
#include "desktop/window/shared/TelevisionLibrary.h"
#include "desktop/window/webkit/Application.h"
#include "desktop/window/webkit/KeyRouter.h"
#include "desktop/window/webkit/OnScreenDisplay.h"
#include "desktop/window/webkit/PageChannel.h"
#include "desktop/window/webkit/VideoWidget.h"

namespace desktop {

class Engine;
struct CommandLine;

// The topmost application is visible. The video plane shows through where its page is transparent, and
// everywhere if there is no application. Both are scaled to the window, with black bars if the aspect ratios
// differ. Main thread.
class TvWindow : public ScriptedWindow, public Application::Listener {
public:
    // What the window reports. The functions may be null.
    struct Reports {
        // The user has closed the window, or the WebDriver session its last application.
        std::function<void()> closed;
        // A document of an application could not be loaded. An application without any document is removed.
        std::function<void(const std::string& url, const std::string& reason)> loadFailed;
        // The web process of the applications has ended by itself.
        std::function<void(WebKitWebProcessTerminationReason)> crashed;
    };

    // The references must outlive the object.
    TvWindow(Engine& engine, PageChannel& channel, const CommandLine& commandLine);
    ~TvWindow() override;
    TvWindow(const TvWindow&) = delete;
    TvWindow& operator=(const TvWindow&) = delete;

    void setReports(Reports reports) { m_reports = std::move(reports); }

    // Pushes a new application and starts to load its page.
    void openApplication(const std::string& url);
    // Shows the channel and starts what it signals.
    void showChannel();
    // Pushes a new application without a document. The window owns it.
    Application& pushApplication();
    // Shows a notice in place of the applications, whose web process has ended by itself. OK loads them
    // again.
    void showNotice(const std::string& reason);
    // Opens the web inspector, which follows the topmost application.
    void inspect();
    // Ends all applications. Done when their pages have ended.
    void unload(const std::function<void()>& done);

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

private:
    void onLoadFailed(Application& application, const std::string& url, const std::string& reason) override;
    void onCommitted(Application& application) override;
    void onCrashed(Application& application, WebKitWebProcessTerminationReason reason) override;
    void onClosed(Application& application) override;
    void onPageCall(uint64_t page, const std::string& function, const std::string& argument,
                    const PageChannel::Reply& reply);
    void removeFrom(const Application& lowest);
    void createApplication(uint64_t caller, const std::string& url, const PageChannel::Reply& reply);
    bool onMessage(WebKitUserMessage& message);
    void onWarning(uint64_t page, const std::string& name, const std::string& subject);
    bool onKey(const GdkEventKey& event);
    Television::Library libraryCalls();
    SignalledApplications::Window stackCalls();
    TelevisionStart televisionStart() const;
    Application& addApplication();
    Application* openSignalled(const std::string& url);
    void openTarget(const ApplicationTarget& target);
    void restart();
    void place(GtkAllocation& area) const;
    void show(const CommandLine& commandLine);
    Application* applicationOf(uint64_t page) const;
    void remove(Application& application);
    void erase(const Application& application);
    void removeAll(const std::function<void()>& done);
    void updateInspector();
    std::string paintScreenshot(const std::string& file, cairo_surface_t* page) const;

    Engine& m_engine;
    PageChannel& m_channel;
    RequestOptions m_requestOptions;
    Reports m_reports;
    GtkWidget* m_window;
    GtkWidget* m_overlay;
    VideoWidget m_video;
    // All applications, also those that are ending.
    std::vector<std::unique_ptr<Application>> m_applications;
    ApplicationStack<Application> m_stack;
    bool m_isInspected = false;
    // The application whose inspector is open, or null.
    Application* m_inspected = nullptr;
    KeyRouter m_keys;
    // The key that is held down, or null.
    const RemoteKey* m_heldKey = nullptr;
    Television m_television;
    OnScreenDisplay m_display;
    TelevisionStart m_start;
    // Whether the web process has ended by itself and the applications have not been loaded again.
    bool m_hasCrashed = false;
    // Cancelled in the destructor.
    GCancellable* m_calls;
};

} // namespace desktop

#endif
