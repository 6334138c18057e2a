// The identity of HTTP requests.
#include "desktop/platform/HttpIdentity.h"

#include <algorithm>
#include <cstdio>
#include <utility>

namespace desktop {

namespace {

constexpr auto kTimeout = std::chrono::seconds(5);

// Empty for null, and for a string that would end its header.
std::string headerValue(const char* string) {
    const std::string value = string ? string : "";
    const bool hasControl = std::any_of(value.begin(), value.end(), [](char each) {
        const auto code = static_cast<unsigned char>(each);
        return (code < 0x20 && each != '\t') || code == 0x7F;
    });
    return hasControl ? "" : value;
}

} // namespace

HttpIdentity HttpIdentity::from(const telix_desktop_http_identity* identity) {
    if (!identity) {
        return {};
    }
    return {headerValue(identity->userAgent), headerValue(identity->referer), headerValue(identity->cookies),
            headerValue(identity->certificates), identity->acceptsAnyCertificate != 0};
}

HttpIdentities& HttpIdentities::instance() {
    static auto* identities = new HttpIdentities; // lives until the process ends
    return *identities;
}

void HttpIdentities::setHandler(const telix_desktop_http_handler* handler) {
    std::lock_guard<std::mutex> handlerLock(m_handlerMutex);
    m_handler = handler ? *handler : telix_desktop_http_handler{};
    std::lock_guard<std::mutex> lock(m_mutex);
    for (auto& [request, identity] : m_waiting) {
        if (!identity) {
            identity.emplace();
        }
    }
    m_changed.notify_all();
}

void HttpIdentities::answer(uint64_t request, const HttpIdentity& identity) {
    std::lock_guard<std::mutex> lock(m_mutex);
    const auto waiting = m_waiting.find(request);
    if (waiting != m_waiting.end() && !waiting->second) {
        waiting->second = identity;
        m_changed.notify_all();
    }
}

HttpIdentity HttpIdentities::ask(const std::string& url, const std::function<bool()>& isCancelled) {
    uint64_t request = 0;
    {
        std::lock_guard<std::mutex> handlerLock(m_handlerMutex);
        if (!m_handler.onRequest) {
            return {};
        }
        {
            std::lock_guard<std::mutex> lock(m_mutex);
            request = ++m_lastRequest;
            m_waiting[request];
        }
        m_handler.onRequest(request, url.c_str(), m_handler.data);
    }
    std::unique_lock<std::mutex> lock(m_mutex);
    std::optional<HttpIdentity>& identity = m_waiting[request];
    const bool isAnswered =
        m_changed.wait_for(lock, kTimeout, [&] { return identity.has_value() || isCancelled(); });
    if (!isAnswered) {
        std::fprintf(stderr, "libtelix: media: %s: the window has not said who requests it\n", url.c_str());
    }
    HttpIdentity result = std::move(identity).value_or(HttpIdentity());
    m_waiting.erase(request);
    return result;
}

void HttpIdentities::cancel() {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_changed.notify_all();
}

void HttpIdentities::reportCookie(const std::string& url, const std::string& cookie) {
    std::lock_guard<std::mutex> lock(m_handlerMutex);
    if (m_handler.onCookie) {
        m_handler.onCookie(url.c_str(), cookie.c_str(), m_handler.data);
    }
}

} // namespace desktop

void telix_desktop_set_http_handler(const telix_desktop_http_handler* handler) {
    desktop::HttpIdentities::instance().setHandler(handler);
}

void telix_desktop_answer_http_request(uint64_t request, const telix_desktop_http_identity* identity) {
    desktop::HttpIdentities::instance().answer(request, desktop::HttpIdentity::from(identity));
}
