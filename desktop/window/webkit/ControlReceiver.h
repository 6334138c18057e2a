// The requests of the control socket that come from the web process.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_CONTROLRECEIVER_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_CONTROLRECEIVER_H

#include <webkit2/webkit2.h>

#include "desktop/window/control/WindowCommands.h"

namespace desktop {

// Main thread.
class ControlReceiver {
public:
    // Carries out what the web processes of the context ask for. The window must outlive the object.
    ControlReceiver(WebKitWebContext* context, ScriptedWindow& window);
    ~ControlReceiver();
    ControlReceiver(const ControlReceiver&) = delete;
    ControlReceiver& operator=(const ControlReceiver&) = delete;

private:
    bool onMessage(WebKitUserMessage* message);

    WebKitWebContext* m_context; // owns a reference
    WindowCommands m_commands;
};

} // namespace desktop

#endif
