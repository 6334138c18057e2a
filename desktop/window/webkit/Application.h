// One application of the WebKit window: the view of its page, its state, its keys and its scripts.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_APPLICATION_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_APPLICATION_H

#include <webkit2/webkit2.h>

#include <functional>
#include <list>
#include <string>
#include <vector>

#include "desktop/window/shared/ScriptedWindow.h"
#include "desktop/window/shared/Television.h"

namespace desktop {

class Engine;

// Main thread. Callbacks are not called after the destruction, and in it only where the function says so.
class Application {
public:
    class Listener {
    public:
        virtual ~Listener() = default;
        // A document could not be loaded; the previous one stays.
        virtual void onLoadFailed(Application& application, const std::string& url,
                                  const std::string& reason) = 0;
        // A document has taken the place of the previous one.
        virtual void onCommitted(Application& application) = 0;
        // The web process has ended by itself.
        virtual void onCrashed(Application& application, WebKitWebProcessTerminationReason reason) = 0;
        // The WebDriver session has closed the application.
        virtual void onClosed(Application& application) = 0;
    };

    // `related`: an application whose web process this one shares, or null. Both references must outlive the
    // object.
    Application(const Engine& engine, const Application* related, Listener& listener);
    ~Application();
    Application(const Application&) = delete;
    Application& operator=(const Application&) = delete;

    // The widget for the window; owned by its container.
    GtkWidget* widget() const { return m_bin; }
    WebKitWebView* view() const { return m_view; }
    // Whether a WebDriver session controls the application.
    bool isAutomated() const { return webkit_web_view_is_controlled_by_automation(m_view); }
    uint64_t pageId() const { return webkit_web_view_get_page_id(m_view); }

    void load(const std::string& url) { webkit_web_view_load_uri(m_view, url.c_str()); }
    // Whether a document is loaded and no other is being loaded.
    bool isLoaded() const { return m_isLoaded; }
    // Whether there is a document, even if the next one is being loaded or could not be loaded.
    bool hasDocument() const { return m_hasDocument; }

    // Whether the application is the visible one of the stack.
    void setOnTop(bool isOnTop);
    // A hidden application paints nothing. It keeps running and receiving keys, so that it can show itself
    // again on a key press.
    void setShown(bool isShown);
    // Whether the page is to be seen.
    bool isVisible() const { return m_isOnTop && m_isShown; }

    // Reads the mask of the key groups that pages receive; all if the platform library has no key set. Called
    // also if the application ends before, with null.
    void readKeySet(std::function<void(Application*, uint32_t keySet)> done);
    // Functions of the platform library, see Television::Library. `done` is not called if the application
    // ends before.
    void tune(uint32_t number, const Television::OnChannel& done);
    void stepChannel(int positions, const Television::OnChannel& done);
    void setVolume(uint32_t volume);
    // Sends the press (`isRepeat`: a repeated one) or the release of a key to the page.
    void sendPress(const RemoteKey& key, bool isRepeat);
    void sendRelease(const RemoteKey& key);
    // Done when the page has handled all keys that have been sent, and has begun to load the page that it has
    // gone to, or when the application has ended.
    void waitForKeys(std::function<void()> done);
    // Done with an error if the application ends before.
    void evaluate(const std::string& expression, std::function<void(ScriptedWindow::Evaluation)> done);
    // An image of the page, transparent where it is; null if there is none. The caller owns it. By then the
    // newest frame of the video is in the image, or in the ring if the page does not paint it.
    void takeSnapshot(std::function<void(cairo_surface_t*)> done);
    // Ends the page, with its unload events. Done when its objects have ended, or after a time limit.
    void unload(std::function<void()> done);
    // Shows a page of the window's own in place of the document, which reload() brings back.
    void showNotice(const std::string& html);
    void reload();
    // Calls no callback in the destructor.
    void forgetCalls() { m_onGone.clear(); }

private:
    using OnGone = std::list<std::function<void()>>;

    void connectSignals();
    void onLoadChanged(WebKitLoadEvent event);
    bool onLoadFailed(const char* url, const GError& error);
    bool onScriptDialog(WebKitScriptDialog& dialog);
    void updateVisibility();
    // Sends a message to the page. `done` gets the parameters of the reply, null if there are none, and is
    // not called if the application ends before.
    void askPage(const char* name, GVariant* parameters, std::function<void(GVariant* reply)> done);
    void changeChannel(const char* message, GVariant* parameters, const Television::OnChannel& done);
    void dispatchKeyEvent(const char* type, const RemoteKey& key, bool isRepeat);
    void sendKeyEvent(GdkEventType type, const RemoteKey& key);
    void onUnloaded();
    void passTurns(int count, std::function<void()> done);
    void takePageSnapshot(std::function<void(cairo_surface_t*)> done);

    Listener& m_listener;
    GtkWidget* m_bin;
    WebKitWebView* m_view;
    // Cancelled in the destructor.
    GCancellable* m_calls;
    // What the destructor calls.
    OnGone m_onGone;
    bool m_isLoaded = false;
    bool m_hasDocument = false;
    bool m_isOnTop = false;
    bool m_isShown = true;
    std::vector<std::function<void()>> m_onUnloaded;
    bool m_isUnloaded = false;
    unsigned m_unloadTimeout = 0;
};

} // namespace desktop

#endif
