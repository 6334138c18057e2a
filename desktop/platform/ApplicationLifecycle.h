// The life cycle of signalled applications: which one starts, goes on or ends, TS 102 796, 6.2.2.
#ifndef TELIX_DESKTOP_PLATFORM_APPLICATIONLIFECYCLE_H
#define TELIX_DESKTOP_PLATFORM_APPLICATIONLIFECYCLE_H

#include <optional>
#include <vector>

#include "desktop/platform/ApplicationInformation.h"

namespace desktop {

// What can change the running application besides scripts.
enum class LifecycleEvent {
    ServiceSelected,   // another service is received; its signalling is not known yet
    SignallingChanged, // the signalling of the service is known, or has changed
    LoadFailed,        // the running application could not be loaded
    Exited,            // it ended itself
    StoppedByViewer,
    StartedByViewer, // the viewer asks for the autostart application
};

struct RunningApplication {
    std::optional<ApplicationId> id; // nothing: broadcast-independent
    bool isServiceBound = false;     // as signalled when it started, or later while it runs
};

// Signalling and running applications at the moment of an event.
struct LifecycleState {
    const std::vector<SignalledApplication>& signalled;
    std::optional<RunningApplication> running;
    std::vector<ApplicationId> failed; // could not be loaded since the signalling changed
};

struct LifecycleDecision {
    bool endsRunning = false;
    std::optional<size_t> started; // index among the signalled applications
};

// A pure function. An application ends before another one starts.
LifecycleDecision decide(LifecycleEvent event, const LifecycleState& state);

} // namespace desktop

#endif
