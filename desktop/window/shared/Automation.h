// Performs the automation steps of the command line: keys, conditions, evaluation, screenshot.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_AUTOMATION_H
#define TELIX_DESKTOP_WINDOW_SHARED_AUTOMATION_H

#include <functional>
#include <optional>
#include <string>

#include "desktop/window/shared/ScriptedWindow.h"

namespace desktop {

struct CommandLine;

// Runs on GLib's main loop. If the command line only shows a page, nothing but the window's reports ends it.
class Automation {
public:
    // `end` is called once with the exit status, when all steps are done or one fails. The references must
    // outlive the object.
    Automation(ScriptedWindow& window, const CommandLine& commandLine, std::function<void(int)> end);
    ~Automation();
    Automation(const Automation&) = delete;
    Automation& operator=(const Automation&) = delete;

    // The window reports that the user has closed it, that a document could not be loaded, and that the
    // process of the page has ended by itself. The last returns whether the automation ends the program.
    void onWindowClosed();
    void onLoadFailed(const std::string& url, const std::string& reason);
    bool onPageCrashed(const std::string& reason);

    // The value of --eval as JSON, if there is one.
    const std::optional<std::string>& evaluated() const { return m_evaluated; }

private:
    void step();
    void pressNextKey();
    void waitForExpression();
    void finish();
    void evaluateLast();
    void onTimeout();
    void reportUnmet(const std::string& timeout) const;
    void writeScreenshotAndEnd(int exitStatus);
    void end(int exitStatus);

    ScriptedWindow& m_window;
    const CommandLine& m_commandLine;
    std::function<void(int)> m_end;
    unsigned m_timer = 0;
    int64_t m_start = 0; // microseconds
    bool m_pageLoaded = false;
    // Whether a call of the window is not done yet.
    bool m_isBusy = false;
    bool m_hasEnded = false;
    std::size_t m_keysPressed = 0;
    // Whether --wait-for has been true.
    bool m_expressionTrue = false;
    std::optional<std::string> m_lastError;
    std::optional<std::string> m_evaluated;
};

} // namespace desktop

#endif
