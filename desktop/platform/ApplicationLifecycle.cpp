// The rules.
#include "desktop/platform/ApplicationLifecycle.h"

#include <algorithm>

namespace desktop {

namespace {

// Of several applications with the highest priority, the first one in the signalling.
std::optional<size_t> autostartOf(const std::vector<SignalledApplication>& signalled,
                                  const std::vector<ApplicationId>& failed) {
    std::optional<size_t> best;
    for (size_t index = 0; index < signalled.size(); ++index) {
        const SignalledApplication& each = signalled[index];
        const bool hasFailed = std::find(failed.begin(), failed.end(), each.id) != failed.end();
        if (each.controlCode == kControlCodeAutostart && !hasFailed &&
            (!best || each.priority > signalled[*best].priority)) {
            best = index;
        }
    }
    return best;
}

// An application that is signalled twice may run if one of the entries allows it.
bool mayGoOn(const ApplicationId& id, const std::vector<SignalledApplication>& signalled) {
    return std::any_of(signalled.begin(), signalled.end(),
                       [&](const SignalledApplication& each) { return each.id == id && each.isStartable(); });
}

// Broadcast-independent applications are not subject to the signalling.
LifecycleDecision onSignallingChanged(const LifecycleState& state) {
    if (state.running && (!state.running->id || mayGoOn(*state.running->id, state.signalled))) {
        return {};
    }
    return {state.running.has_value(), autostartOf(state.signalled, state.failed)};
}

LifecycleDecision onLoadFailed(const LifecycleState& state) {
    std::vector<ApplicationId> failed = state.failed;
    if (state.running && state.running->id) {
        failed.push_back(*state.running->id);
    }
    return {state.running.has_value(), autostartOf(state.signalled, failed)};
}

LifecycleDecision onStartedByViewer(const LifecycleState& state) {
    if (state.running && state.running->id) {
        return {};
    }
    const auto started = autostartOf(state.signalled, {}); // the network may be there again
    return {state.running && started, started};
}

} // namespace

LifecycleDecision decide(LifecycleEvent event, const LifecycleState& state) {
    const bool isRunning = state.running.has_value();
    switch (event) {
    case LifecycleEvent::ServiceSelected:
        return {isRunning && state.running->id && state.running->isServiceBound, std::nullopt};
    case LifecycleEvent::SignallingChanged:
        return onSignallingChanged(state);
    case LifecycleEvent::LoadFailed:
        return onLoadFailed(state);
    case LifecycleEvent::StartedByViewer:
        return onStartedByViewer(state);
    default: // nothing starts until the service or its signalling changes
        return {isRunning, std::nullopt};
    }
}

} // namespace desktop
