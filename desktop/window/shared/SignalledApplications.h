// Starts and ends the applications that the broadcast signals, in a window of any toolkit.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_SIGNALLEDAPPLICATIONS_H
#define TELIX_DESKTOP_WINDOW_SHARED_SIGNALLEDAPPLICATIONS_H

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "desktop/platform/ApplicationInformation.h"
#include "desktop/platform/ApplicationLifecycle.h"
#include "desktop/platform/telix_applications.h"

namespace desktop {

// What the platform library signals, copied: see telix_desktop_applications.
struct Signalling {
    telix_desktop_signalling_state state = TELIX_DESKTOP_SIGNALLING_NONE;
    uint64_t service = 0;
    uint64_t serial = 0;
    uint32_t channel = 0; // position in the channel list, from 1; 0: none
    std::vector<SignalledApplication> applications;
    std::vector<std::string> skipped; // per entry that was left out: which, and why
};

// Keeps which of the window's applications are signalled, and follows from each change of the signalling and
// of the stack what ends and what starts. Main thread.
class SignalledApplications {
public:
    // One of the window's applications.
    using Application = const void*;

    // What the window does. It calls onEnded() for each application that leaves its stack.
    struct Window {
        std::function<bool()> hasApplication;
        // Opens an application above all others.
        std::function<Application(const std::string& url)> open;
        // Ends an application and those above it.
        std::function<void(Application)> end;
        std::function<void()> endAll;
    };

    explicit SignalledApplications(Window window);
    SignalledApplications(const SignalledApplications&) = delete;
    SignalledApplications& operator=(const SignalledApplications&) = delete;

    // The signalling has changed, or a channel is selected.
    void update(Signalling signalling);
    // The library has ended with its process. What runs goes on when the next one signals.
    void onLibraryEnded();
    const Signalling& signalling() const { return m_signalling; }

    // An application has opened another one by its signalled id.
    void onOpened(Application application, const SignalledApplication& signalled);
    void onEnded(Application application);
    // An application could not be loaded. Returns whether it was a signalled one, which has ended then.
    bool onLoadFailed(Application application);

    // The viewer ends what runs, and starts what the channel signals.
    void stop();
    void start();

    // Whether any application runs, signalled or not.
    bool hasApplication() const { return m_window.hasApplication(); }
    // The id of a signalled application, as in dvb://current.ait/ORG.APP; empty for any other.
    std::string idOf(Application application) const;

private:
    struct Running {
        Application application;
        ApplicationId id;
        bool isServiceBound;
    };

    std::vector<Running>::const_iterator find(Application application) const;
    void updateRunning();
    void decideOn(LifecycleEvent event);

    Window m_window;
    Signalling m_signalling;
    bool m_isFirst = true;               // the next signalling is the first one of a library
    std::vector<Running> m_running;      // the last one started last
    std::vector<ApplicationId> m_failed; // since the signalling changed
};

} // namespace desktop

#endif
