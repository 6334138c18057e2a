// What an HTTP request carries to be one of the window's browser, and the window's handler that knows it.
#ifndef TELIX_DESKTOP_PLATFORM_HTTPIDENTITY_H
#define TELIX_DESKTOP_PLATFORM_HTTPIDENTITY_H

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <string>

#include "desktop/platform/telix_http.h"

namespace desktop {

// Empty strings: as null in telix_desktop_http_identity.
struct HttpIdentity {
    std::string userAgent;
    std::string referer;
    std::string cookies;
    std::string certificates;
    bool acceptsAnyCertificate = false;

    static HttpIdentity from(const telix_desktop_http_identity* identity);
};

// The handler and the requests that wait for it. Any thread.
class HttpIdentities {
public:
    static HttpIdentities& instance(); // lives as long as the process, like the streaming threads that wait

    HttpIdentities(const HttpIdentities&) = delete;
    HttpIdentities& operator=(const HttpIdentities&) = delete;

    void setHandler(const telix_desktop_http_handler* handler);
    void answer(uint64_t request, const HttpIdentity& identity);

    // Blocks until the handler has answered, `isCancelled` returns true or the timeout has passed. Without an
    // answer, the identity that says nothing.
    HttpIdentity ask(const std::string& url, const std::function<bool()>& isCancelled);

    // Makes each ask() look at `isCancelled`, which must hold already.
    void cancel();

    void reportCookie(const std::string& url, const std::string& cookie);

private:
    HttpIdentities() = default;

    std::mutex m_handlerMutex; // guards what follows; held while a callback runs
    telix_desktop_http_handler m_handler{};

    std::mutex m_mutex; // guards what follows; locked after m_handlerMutex
    std::condition_variable m_changed;
    uint64_t m_lastRequest = 0;
    std::map<uint64_t, std::optional<HttpIdentity>> m_waiting;
};

} // namespace desktop

#endif
