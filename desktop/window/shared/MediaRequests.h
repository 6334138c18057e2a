// The HTTP requests of the platform library's media players, which the window makes requests of its browser.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_MEDIAREQUESTS_H
#define TELIX_DESKTOP_WINDOW_SHARED_MEDIAREQUESTS_H

#include <cstdint>
#include <functional>
#include <optional>
#include <string>

#include "desktop/platform/telix_http.h"
#include "desktop/window/shared/LibrarySearch.h"
#include "desktop/window/shared/MainThreadQueue.h"
#include "desktop/window/shared/PlatformLibrary.h"

namespace desktop {

// In the process of the platform library. Main thread, on GLib's default main context.
class MediaRequests {
public:
    // What a request carries, see telix_http.h. Empty strings: no such header.
    struct Identity {
        std::string userAgent;
        std::string referer;
        std::string cookies;
        bool acceptsAnyCertificate = false;
    };
    using Identify = std::function<void(const Identity& identity)>;

    // Strings are bytes as they are in HTTP, not always UTF-8.
    struct Browser {
        // A request to `url`, also one that follows a redirection, waits until `identify` is called, once,
        // then or later.
        std::function<void(const std::string& url, const Identify& identify)> onRequest;
        // The response of `url` has the header Set-Cookie with this value. A request that follows it comes
        // after this call.
        std::function<void(const std::string& url, const std::string& cookie)> onCookie;
    };

    // Waits for the library. One without the functions of telix_http.h makes requests of its own.
    explicit MediaRequests(Browser browser);
    // Afterwards the browser is not called any more.
    ~MediaRequests();
    MediaRequests(const MediaRequests&) = delete;
    MediaRequests& operator=(const MediaRequests&) = delete;

private:
    // A request, or without a number a cookie.
    struct Event {
        std::string url;
        std::optional<uint64_t> request;
        std::string cookie;
    };

    bool find();
    void handle(const Event& event);

    Browser m_browser;
    MainThreadQueue<Event> m_events;
    PlatformLibrary m_library;
    telix_desktop_set_http_handler_function m_setHandler = nullptr;
    telix_desktop_answer_http_request_function m_answer = nullptr;
    LibrarySearch m_search; // starts last: it uses the others
};

} // namespace desktop

#endif
