// What the automation of the command line does with a window, whatever its toolkit.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_SCRIPTEDWINDOW_H
#define TELIX_DESKTOP_WINDOW_SHARED_SCRIPTEDWINDOW_H

#include <functional>
#include <optional>
#include <string>

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

    virtual ~ScriptedWindow() = default;

    // Whether there is an application.
    virtual bool hasApplication() const = 0;
    // Whether the topmost application has a document and loads no other.
    virtual bool isTopLoaded() const = 0;
    // Presses and releases a key, for the topmost application. Done when the page has handled both and, if it
    // has gone to another page, loads that.
    virtual void press(const RemoteKey& key, std::function<void()> done) = 0;
    // Evaluates an expression in the topmost application.
    virtual void evaluate(const std::string& expression, std::function<void(Evaluation)> done) = 0;
    // Whether the video plane shows a frame.
    virtual bool hasPicture() const = 0;
    // Writes what the window shows to a PNG file. Done with whether that has succeeded.
    virtual void writeScreenshot(const std::string& file, std::function<void(bool)> done) = 0;
};

} // namespace desktop

#endif
