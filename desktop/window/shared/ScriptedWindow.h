// What the automation of the command line, telixctl and recordings do with a window, whatever its toolkit.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_SCRIPTEDWINDOW_H
#define TELIX_DESKTOP_WINDOW_SHARED_SCRIPTEDWINDOW_H

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "desktop/window/shared/RemoteControl.h"

namespace desktop {

// All functions are for the window's thread. Each calls `done` once, at once or later; never when the window
// has been destroyed.
class ScriptedWindow {
public:
    struct Evaluation {
        bool truth = false;
        std::string json;
        // If the expression has no value.
        std::optional<std::string> error;
    };

    // An application of the stack.
    struct RunningApplication {
        std::string url;
        std::string id; // as in dvb://current.ait/ORG.APP; empty unless it is signalled
        bool isVisible = false;
    };

    virtual ~ScriptedWindow() = default;

    // Whether there is an application.
    virtual bool hasApplication() const = 0;
    // Whether the topmost application has a document and loads no other.
    virtual bool isTopLoaded() const = 0;
    // Whether there is no application and the channel that is on starts none by itself.
    virtual bool isIdle() const = 0;
    // Presses and releases a key, for the topmost application or the television. Done when the page has
    // handled both and, if it has gone to another page, loads that.
    virtual void press(const RemoteKey& key, std::function<void()> done) = 0;
    // Evaluates an expression in the topmost application.
    virtual void evaluate(const std::string& expression, std::function<void(Evaluation)> done) = 0;
    // Whether the video plane shows a frame.
    virtual bool hasPicture() const = 0;
    // Writes what the window shows to a PNG file. Done with the reason why it cannot; empty if it has.
    virtual void writeScreenshot(const std::string& file,
                                 std::function<void(const std::string& error)> done) = 0;
    // Paints what the window shows, as it has been drawn last, as 1280x720 pixels of 4 bytes: blue, green,
    // red, unused. `stride` is in bytes.
    virtual void paint(uint8_t* pixels, int stride) = 0;
    // Opens a page in place of all applications. Done with the reason why the page cannot be loaded, and then
    // nothing has changed; empty when it is being loaded.
    virtual void open(const std::string& url, std::function<void(const std::string& error)> done) = 0;
    // Loads the pages of all applications again, also after their process has ended by itself. Done with the
    // reason why the topmost page cannot be loaded, and then nothing has changed; empty when it is being
    // loaded.
    virtual void reload(std::function<void(const std::string& error)> done) = 0;
    // What runs, the topmost application first.
    virtual std::vector<RunningApplication> applications() const = 0;
};

} // namespace desktop

#endif
