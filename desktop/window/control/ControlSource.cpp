// The requests of the control socket that the platform library passes on.
#include "desktop/window/control/ControlSource.h"

#include <utility>

namespace desktop {

ControlSource::ControlSource(Handler handler)
    : m_handler(std::move(handler)), m_requests([this](const Request& request) { handle(request); }),
      m_search([this] { return find(); }) {}

ControlSource::~ControlSource() {
    if (m_setHandler) {
        m_setHandler(nullptr);
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
    static_cast<ControlSource*>(source)->m_requests.post({request, line});
}

void ControlSource::handle(const Request& request) {
    // The library stays loaded, so its function may be called after the end of this object.
    m_handler(request.line, [answer = m_answer, id = request.id](const std::string& response) {
        answer(id, response.c_str());
    });
}

} // namespace desktop
