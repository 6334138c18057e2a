// The commands of telixctl that the window carries out, whatever its toolkit.
#ifndef TELIX_DESKTOP_WINDOW_CONTROL_WINDOWCOMMANDS_H
#define TELIX_DESKTOP_WINDOW_CONTROL_WINDOWCOMMANDS_H

#include <functional>
#include <list>
#include <memory>
#include <string>

namespace desktop {

class ScriptedWindow;
class WindowCommand;

// Runs on GLib's main loop, main thread.
class WindowCommands {
public:
    // Gets the response, one line of JSON as ControlProtocol.h describes it, once.
    using Respond = std::function<void(const std::string& response)>;

    // The window must outlive the object.
    explicit WindowCommands(ScriptedWindow& window);
    // Requests that are not answered yet get no response.
    ~WindowCommands();
    WindowCommands(const WindowCommands&) = delete;
    WindowCommands& operator=(const WindowCommands&) = delete;

    // Handles a request, one line of JSON, which may come from a process that is not trusted. Requests are
    // carried out side by side.
    void handle(const std::string& line, const Respond& respond);

private:
    void step();

    ScriptedWindow& m_window;
    // Those that have not been answered.
    std::list<std::shared_ptr<WindowCommand>> m_requests;
    unsigned m_timer = 0;
};

} // namespace desktop

#endif
