// The requests of the control socket that wait for the window. The functions that are exported to the window
// are in telix_control.h.
#ifndef TELIX_DESKTOP_PLATFORM_WINDOWREQUESTS_H
#define TELIX_DESKTOP_PLATFORM_WINDOWREQUESTS_H

#include <cstdint>
#include <map>
#include <mutex>
#include <string>

#include "desktop/platform/Control.h"
#include "desktop/platform/telix_control.h"

namespace desktop {

class WindowRequests {
public:
    static WindowRequests& instance(); // lives as long as the process, like the threads that answer

    WindowRequests(const WindowRequests&) = delete;
    WindowRequests& operator=(const WindowRequests&) = delete;

    // Whether there is a window. Any thread.
    bool hasWindow();

    // Passes a request on to the window, which may appear a little later: the page of a window loads the
    // library before the window knows. `respond` gets the response as the window has given it, or one that
    // says why there is none within `timeout` seconds; once. Platform thread.
    void send(const std::string& line, int64_t timeout, Respond respond);

    // The exported functions. Any thread.
    void setHandler(const telix_desktop_control_handler* handler);
    void answer(uint64_t request, const std::string& response);

private:
    struct Request {
        std::string line;
        Respond respond;
        bool isPassedOn = false;
    };

    WindowRequests() = default;
    void passOn(uint64_t id);
    void failAfter(int64_t seconds, uint64_t id, bool alsoIfPassedOn, const char* reason);
    bool isPassedOn(uint64_t id);

    std::mutex m_handlerMutex; // guards what follows; held while the callback runs
    telix_desktop_control_handler m_handler{};

    std::mutex m_mutex; // guards what follows; locked after m_handlerMutex
    uint64_t m_lastRequest = 0;
    std::map<uint64_t, Request> m_waiting;
};

} // namespace desktop

#endif
