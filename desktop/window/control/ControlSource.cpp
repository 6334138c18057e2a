// The requests of the control socket that the platform library passes on.
#include "desktop/window/control/ControlSource.h"

#include <glib.h>

#include <utility>

namespace desktop {

ControlSource::ControlSource(Handler handler)
    : m_handler(std::move(handler)), m_search([this] { return find(); }) {}

ControlSource::~ControlSource() {
    if (m_setHandler) {
        m_setHandler(nullptr);
    }
    if (m_idle != 0) {
        g_source_remove(m_idle);
    }
}

bool ControlSource::find() {
    if (!m_library.find()) {
        return false;
    }
    telix_desktop_set_control_handler_function setHandler = nullptr;
    if (m_library.bind("telix_desktop_answer_control_request", m_answer) &&
        m_library.bind("telix_desktop_set_control_handler", setHandler)) {
        m_setHandler = setHandler;
        const telix_desktop_control_handler handler{onRequest, this};
        m_setHandler(&handler);
    }
    return true;
}

// Called on a thread of the platform library.
void ControlSource::onRequest(uint64_t request, const char* line, void* source) {
    auto* self = static_cast<ControlSource*>(source);
    const std::lock_guard<std::mutex> lock(self->m_mutex);
    self->m_requests.push_back({request, line});
    if (self->m_idle == 0) {
        self->m_idle = g_idle_add_full(
            G_PRIORITY_DEFAULT,
            [](gpointer data) -> gboolean {
                static_cast<ControlSource*>(data)->handleRequests();
                return G_SOURCE_REMOVE;
            },
            self, nullptr);
    }
}

void ControlSource::handleRequests() {
    std::vector<Request> requests;
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        requests.swap(m_requests);
        m_idle = 0;
    }
    for (const Request& each : requests) {
        // The library stays loaded, so its function may be called after the end of this object.
        m_handler(each.line, [answer = m_answer, id = each.id](const std::string& response) {
            answer(id, response.c_str());
        });
    }
}

} // namespace desktop
