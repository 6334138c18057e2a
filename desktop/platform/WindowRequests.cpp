// The requests that wait for the window.
#include "desktop/platform/WindowRequests.h"

#include <algorithm>
#include <utility>

#include "desktop/platform/ControlJson.h"
#include "desktop/platform/Platform.h"

namespace desktop {

namespace {

constexpr unsigned int kMillisecondsPerSecond = 1000;
constexpr int64_t kWindowTimeout = 5; // seconds until there is a window

std::string failure(const char* reason) {
    return JsonObjectWriter().boolean("ok", false).string("error", reason).toString();
}

} // namespace

WindowRequests& WindowRequests::instance() {
    static auto* requests = new WindowRequests; // lives until the process ends
    return *requests;
}

bool WindowRequests::hasWindow() {
    std::lock_guard<std::mutex> handlerLock(m_handlerMutex);
    return m_handler.onRequest != nullptr;
}

void WindowRequests::send(const std::string& line, int64_t timeout, Respond respond) {
    uint64_t id = 0;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        id = ++m_lastRequest;
        m_waiting[id] = {line, std::move(respond)};
    }
    failAfter(std::min(timeout, kWindowTimeout), id, false, "the television has no window");
    failAfter(timeout, id, true, "the window does not respond");
    std::lock_guard<std::mutex> handlerLock(m_handlerMutex);
    if (m_handler.onRequest) {
        passOn(id);
    }
}

void WindowRequests::failAfter(int64_t seconds, uint64_t id, bool alsoIfPassedOn, const char* reason) {
    Platform::instance().postDelayed(static_cast<unsigned int>(seconds) * kMillisecondsPerSecond,
                                     [this, id, alsoIfPassedOn, reason] {
                                         if (alsoIfPassedOn || !isPassedOn(id)) {
                                             answer(id, failure(reason));
                                         }
                                         return false;
                                     });
}

bool WindowRequests::isPassedOn(uint64_t id) {
    std::lock_guard<std::mutex> lock(m_mutex);
    const auto request = m_waiting.find(id);
    return request != m_waiting.end() && request->second.isPassedOn;
}

// Passes a request on that still waits for that. The handler is there, and its mutex locked.
void WindowRequests::passOn(uint64_t id) {
    std::string line;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        const auto request = m_waiting.find(id);
        if (request == m_waiting.end() || request->second.isPassedOn) {
            return;
        }
        request->second.isPassedOn = true;
        line = request->second.line;
    }
    m_handler.onRequest(id, line.c_str(), m_handler.data);
}

void WindowRequests::setHandler(const telix_desktop_control_handler* handler) {
    std::lock_guard<std::mutex> handlerLock(m_handlerMutex);
    m_handler = handler ? *handler : telix_desktop_control_handler{};
    std::map<uint64_t, bool> requests; // and whether they have been passed on
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        for (const auto& [id, request] : m_waiting) {
            requests[id] = request.isPassedOn;
        }
    }
    for (const auto& [id, isPassedOn] : requests) {
        if (isPassedOn) {
            answer(id, failure("the window has been closed"));
        } else if (m_handler.onRequest) {
            passOn(id);
        }
    }
}

void WindowRequests::answer(uint64_t request, const std::string& response) {
    Respond respond;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        const auto waiting = m_waiting.find(request);
        if (waiting == m_waiting.end()) {
            return;
        }
        respond = std::move(waiting->second.respond);
        m_waiting.erase(waiting);
    }
    Platform::instance().post([respond = std::move(respond), response] { respond(response); });
}

} // namespace desktop

void telix_desktop_set_control_handler(const telix_desktop_control_handler* handler) {
    desktop::WindowRequests::instance().setHandler(handler);
}

void telix_desktop_answer_control_request(uint64_t request, const char* response) {
    desktop::WindowRequests::instance().answer(request, response ? response : "");
}
