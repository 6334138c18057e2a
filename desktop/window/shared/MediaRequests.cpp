// The HTTP requests of the platform library's media players, which the window makes requests of its browser.
#include "desktop/window/shared/MediaRequests.h"

#include <utility>

namespace desktop {

namespace {

// Of an empty string null, which stands for no header.
const char* headerOf(const std::string& value) {
    return value.empty() ? nullptr : value.c_str();
}

} // namespace

MediaRequests::MediaRequests(Browser browser)
    : m_browser(std::move(browser)), m_events([this](const Event& event) { handle(event); }),
      m_search([this] { return find(); }) {}

MediaRequests::~MediaRequests() {
    if (m_setHandler) {
        m_setHandler(nullptr);
    }
}

bool MediaRequests::find() {
    if (!m_library.find()) {
        return false;
    }
    telix_desktop_set_http_handler_function setHandler = nullptr;
    if (m_library.bind("telix_desktop_answer_http_request", m_answer) &&
        m_library.bind("telix_desktop_set_http_handler", setHandler)) {
        m_setHandler = setHandler;
        // Called on threads of the library.
        const telix_desktop_http_handler handler{
            [](uint64_t request, const char* url, void* self) {
                static_cast<MediaRequests*>(self)->m_events.post({url, request, {}});
            },
            [](const char* url, const char* cookie, void* self) {
                static_cast<MediaRequests*>(self)->m_events.post({url, std::nullopt, cookie});
            },
            this};
        m_setHandler(&handler);
    }
    return true;
}

void MediaRequests::handle(const Event& event) {
    if (!event.request) {
        m_browser.onCookie(event.url, event.cookie);
        return;
    }
    // The library stays loaded, so its function may be called after the end of this object.
    m_browser.onRequest(event.url, [answer = m_answer, request = *event.request](const Identity& identity) {
        const telix_desktop_http_identity record{
            headerOf(identity.userAgent), headerOf(identity.referer), headerOf(identity.cookies), nullptr,
            static_cast<uint8_t>(identity.acceptsAnyCertificate ? 1 : 0)};
        answer(request, &record);
    });
}

} // namespace desktop
