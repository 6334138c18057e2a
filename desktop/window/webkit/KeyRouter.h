// The way of the remote control's keys: to the page, if it has asked for them, or to the television.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_KEYROUTER_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_KEYROUTER_H

#include <deque>
#include <functional>

#include "desktop/window/shared/RemoteControl.h"

namespace desktop {

class Application;

// The key set is in the web process, and the handler of one key may change it for the next. So the router
// asks for it before each key, and keys wait for the ones before. Main thread.
class KeyRouter {
public:
    // What the router needs of the window.
    struct Window {
        // The topmost application, or null.
        std::function<Application*()> topApplication;
        // A key that no page gets has been pressed. `top`: the topmost application, or null.
        std::function<void(const RemoteKey&, Application* top)> onTelevisionKey;
    };

    enum class Stroke { Press, Repeat, Release };

    explicit KeyRouter(Window window);
    KeyRouter(const KeyRouter&) = delete;
    KeyRouter& operator=(const KeyRouter&) = delete;

    // `done` may be null. It is called when the page has handled the key, see Application::waitForKeys(), or
    // the television has got it.
    void route(const RemoteKey& key, Stroke stroke, std::function<void()> done);

private:
    struct Entry {
        const RemoteKey* key;
        Stroke stroke;
        std::function<void()> done;
    };

    void routeFirst();
    void deliver(Application* application, bool isAskedFor);

    Window m_window;
    // The first is being routed.
    std::deque<Entry> m_entries;
    // Whether the page has got the last press, and so gets the release.
    bool m_hasPagePress = false;
};

} // namespace desktop

#endif
