// The requests of the control socket that the platform library passes on.
#ifndef TELIX_DESKTOP_WINDOW_CONTROL_CONTROLSOURCE_H
#define TELIX_DESKTOP_WINDOW_CONTROL_CONTROLSOURCE_H

#include <cstdint>
#include <functional>
#include <string>

#include "desktop/platform/telix_control.h"
#include "desktop/window/shared/LibrarySearch.h"
#include "desktop/window/shared/MainThreadQueue.h"
#include "desktop/window/shared/PlatformLibrary.h"

namespace desktop {

// In the process of the platform library. Main thread, on GLib's default main context.
class ControlSource {
public:
    using Respond = std::function<void(const std::string& response)>;
    // Gets a request, and a function that takes its response once, then or later.
    using Handler = std::function<void(const std::string& line, const Respond& respond)>;

    // Waits for the library. One without the functions of telix_control.h has no requests.
    explicit ControlSource(Handler handler);
    // Afterwards the handler is not called any more.
    ~ControlSource();
    ControlSource(const ControlSource&) = delete;
    ControlSource& operator=(const ControlSource&) = delete;

private:
    struct Request {
        uint64_t id;
        std::string line;
    };

    static void onRequest(uint64_t request, const char* line, void* source);
    bool find();
    void handle(const Request& request);

    Handler m_handler;
    MainThreadQueue<Request> m_requests;
    PlatformLibrary m_library;
    telix_desktop_set_control_handler_function m_setHandler = nullptr;
    telix_desktop_answer_control_request_function m_answer = nullptr;
    LibrarySearch m_search; // starts last: it uses the others
};

} // namespace desktop

#endif
