// The commands that the window carries out. Each has a function that is called at intervals until it has
// responded or its time is over, because most of them wait for pages.
#include "desktop/window/control/WindowCommands.h"

#include <glib.h>

#include <utility>
#include <vector>

#include "desktop/platform/ControlJson.h"
#include "desktop/platform/ControlRequest.h"
#include "desktop/window/shared/ScriptedWindow.h"

namespace desktop {

namespace {

constexpr guint kStepMs = 20;

} // namespace

// A request on its way to the response.
class WindowCommand : public std::enable_shared_from_this<WindowCommand> {
public:
    using Step = void (*)(ScriptedWindow& window, WindowCommand& request);

    WindowCommand(ControlRequest request, Step step, WindowCommands::Respond respond)
        : parameters(std::move(request)), m_step(step), m_respond(std::move(respond)) {
        // What waits for nothing ends when the library gives it up.
        m_timeout = parameters.timeout() > 0 ? parameters.timeout() : kResponseTimeout;
        m_end = g_get_monotonic_time() + m_timeout * G_USEC_PER_SEC;
    }

    const ControlRequest parameters;
    size_t stepsDone = 0; // of the command's own count
    std::string unmet;    // what it waits for, for the error after the timeout

    bool hasEnded() const { return !m_respond; }
    void abandon() { m_respond = nullptr; }
    void finish(JsonObjectWriter results = {}) { respond(results.boolean("ok", true)); }
    void fail(const std::string& reason) {
        respond(JsonObjectWriter().boolean("ok", false).string("error", reason));
    }

    // Makes the next step, unless a call of the window is not done.
    void step(ScriptedWindow& window) {
        if (!m_isBusy && !hasEnded()) {
            try {
                m_step(window, *this);
            } catch (const ControlError& error) {
                fail(error.what());
            }
        }
        if (!hasEnded() && g_get_monotonic_time() > m_end) {
            fail(unmet + " within " + std::to_string(m_timeout) + " s");
        }
    }

    // A callback for a call of the window, which may be called after the end of the request.
    template <typename Function>
    auto whenDone(Function onDone) {
        m_isBusy = true;
        return [self = shared_from_this(), onDone](const auto&... results) {
            self->m_isBusy = false;
            if (!self->hasEnded()) {
                onDone(*self, results...);
            }
        };
    }

private:
    void respond(const JsonObjectWriter& response) { std::exchange(m_respond, nullptr)(response.toString()); }

    Step m_step;
    WindowCommands::Respond m_respond; // null once it has been called
    int64_t m_timeout = 0;             // seconds
    int64_t m_end = 0;                 // microseconds
    bool m_isBusy = false;
};

namespace {

// ---- The functions of the command table

void pressKeys(ScriptedWindow& window, WindowCommand& request) {
    const auto& names = request.parameters.strings("names");
    std::vector<const RemoteKey*> keys;
    for (const std::string& name : names) {
        keys.push_back(remoteKeyByName(name));
        if (!keys.back()) {
            throw ControlError("unknown key \"" + name + "\"");
        }
    }
    const size_t next = request.stepsDone;
    request.unmet = names[next] + ": the page before it is not loaded";
    if (window.hasApplication() && !window.isTopLoaded()) {
        return;
    }
    ++request.stepsDone;
    window.press(*keys[next], request.whenDone([count = keys.size()](WindowCommand& pressed) {
        if (pressed.stepsDone == count) {
            pressed.finish();
        }
    }));
}

void writeScreenshot(ScriptedWindow& window, WindowCommand& request) {
    const std::string file = request.parameters.string("file");
    request.unmet = file + ": the page has not been painted";
    window.writeScreenshot(file, request.whenDone([file](WindowCommand& written, const std::string& error) {
        if (error.empty()) {
            written.finish();
        } else {
            written.fail(file + ": " + error);
        }
    }));
}

// Done when the topmost page, which the first step has begun to load, is there.
void waitForLoad(const ScriptedWindow& window, WindowCommand& request) {
    if (window.isTopLoaded()) {
        request.finish();
    } else if (!window.hasApplication()) {
        request.fail("the page cannot be loaded");
    }
}

// For the call that begins to load a page.
auto whenLoading(WindowCommand& request) {
    return request.whenDone([](WindowCommand& loading, const std::string& error) {
        loading.stepsDone = 1;
        if (!error.empty()) {
            loading.fail("the page cannot be loaded: " + error);
        }
    });
}

void openPage(ScriptedWindow& window, WindowCommand& request) {
    const std::string url = request.parameters.string("url");
    request.unmet = url + ": not loaded";
    if (request.stepsDone == 0) {
        window.open(url, whenLoading(request));
    } else {
        waitForLoad(window, request);
    }
}

void reloadPages(ScriptedWindow& window, WindowCommand& request) {
    request.unmet = "the page is not loaded";
    if (request.stepsDone == 0) {
        if (!window.hasApplication()) {
            throw ControlError("no application runs");
        }
        window.reload(whenLoading(request));
    } else {
        waitForLoad(window, request);
    }
}

void waitForExpression(ScriptedWindow& window, WindowCommand& request) {
    const std::string expression = request.parameters.string("expression");
    if (request.unmet.empty()) {
        request.unmet = "not true";
    }
    if (!window.isTopLoaded()) {
        return;
    }
    window.evaluate(expression, request.whenDone([](WindowCommand& evaluated,
                                                    const ScriptedWindow::Evaluation& evaluation) {
        evaluated.unmet = evaluation.error ? "not true (" + *evaluation.error + ")" : "not true";
        if (evaluation.truth) {
            evaluated.finish();
        }
    }));
}

void listRunningApplications(ScriptedWindow& window, WindowCommand& request) {
    JsonArrayWriter running;
    for (const ScriptedWindow::RunningApplication& each : window.applications()) {
        JsonObjectWriter application;
        application.string("url", each.url).string("id", each.id).boolean("visible", each.isVisible);
        running.add(std::move(application));
    }
    JsonObjectWriter results;
    results.array("running", std::move(running));
    request.finish(std::move(results));
}

// ---- Dispatch

// In the order of controlCommands(); null for commands that are the library's alone.
const WindowCommand::Step kSteps[] = {
#define CONTROL_COMMAND(name, handler, printer, help, ...) nullptr,
#define WINDOW_COMMAND(name, windowHandler, printer, help, ...) windowHandler,
#define JOINT_COMMAND(name, handler, windowHandler, printer, help, ...) windowHandler,
#include "desktop/platform/ControlCommands.h"
};

} // namespace

WindowCommands::WindowCommands(ScriptedWindow& window) : m_window(window) {}

WindowCommands::~WindowCommands() {
    if (m_timer != 0) {
        g_source_remove(m_timer);
    }
    for (const auto& request : m_requests) {
        request->abandon(); // calls of the window keep it
    }
}

void WindowCommands::handle(const std::string& line, const Respond& respond) {
    try {
        ControlRequest request = ControlRequest::parse(line);
        const auto step = kSteps[&request.command() - controlCommands().data()];
        require(step != nullptr, "not a command of the window");
        m_requests.push_back(std::make_shared<WindowCommand>(std::move(request), step, respond));
    } catch (const ControlError& error) {
        respond(JsonObjectWriter().boolean("ok", false).string("error", error.what()).toString());
        return;
    }
    step();
    if (m_timer == 0 && !m_requests.empty()) {
        m_timer = g_timeout_add(
            kStepMs,
            [](gpointer commands) -> gboolean {
                auto* self = static_cast<WindowCommands*>(commands);
                self->step();
                self->m_timer = self->m_requests.empty() ? 0 : self->m_timer;
                return self->m_timer != 0 ? G_SOURCE_CONTINUE : G_SOURCE_REMOVE;
            },
            this);
    }
}

void WindowCommands::step() {
    const auto requests = m_requests; // a step may run the main loop, which takes the next request
    for (const auto& request : requests) {
        request->step(m_window);
    }
    m_requests.remove_if([](const auto& request) { return request->hasEnded(); });
}

} // namespace desktop
