// The WebDriver session that opens and controls the applications of the window.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_AUTOMATIONSESSION_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_AUTOMATIONSESSION_H

#include <webkit2/webkit2.h>

#include <functional>

namespace desktop {

// WebKitWebDriver connects to the engine, which does what the session's commands say; the window only opens
// an application when the session wants one. Main thread.
class AutomationSession {
public:
    // Both are called on GLib's main loop.
    struct Window {
        // Opens an application without a document above the others. Returns its view, which the window owns.
        std::function<WebKitWebView*()> openApplication;
        // The session has ended, also because the driver has.
        std::function<void()> onEnded;
    };

    // The context must allow automation and outlive the object.
    AutomationSession(WebKitWebContext* context, Window window);
    ~AutomationSession();
    AutomationSession(const AutomationSession&) = delete;
    AutomationSession& operator=(const AutomationSession&) = delete;

private:
    void onStarted(WebKitAutomationSession* session);

    WebKitWebContext* m_context;
    Window m_window;
    // Null before it starts. The engine has one at a time.
    WebKitAutomationSession* m_session = nullptr;
};

} // namespace desktop

#endif
