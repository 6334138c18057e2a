// Starts and ends the applications that the broadcast signals, in a window of any toolkit.
#include "desktop/window/shared/SignalledApplications.h"

#include <algorithm>
#include <utility>

namespace desktop {

SignalledApplications::SignalledApplications(Window window) : m_window(std::move(window)) {}

void SignalledApplications::update(Signalling signalling) {
    const bool isFirst = std::exchange(m_isFirst, false);
    const bool isOtherService = signalling.service != m_signalling.service && !isFirst;
    const bool hasChanged = signalling.serial != m_signalling.serial || isFirst;
    m_signalling = std::move(signalling);
    if (isOtherService) {
        decideOn(LifecycleEvent::ServiceSelected);
    }
    if (hasChanged && m_signalling.state == TELIX_DESKTOP_SIGNALLING_KNOWN) {
        m_failed.clear();
        updateRunning();
        decideOn(LifecycleEvent::SignallingChanged);
    }
}

void SignalledApplications::onLibraryEnded() {
    m_isFirst = true;
    m_signalling = {};
}

// What the signalling says of an application may change while it runs.
void SignalledApplications::updateRunning() {
    for (Running& running : m_running) {
        for (const SignalledApplication& each : m_signalling.applications) {
            if (each.id == running.id) {
                running.isServiceBound = each.isServiceBound;
            }
        }
    }
}

void SignalledApplications::decideOn(LifecycleEvent event) {
    LifecycleState state{m_signalling.applications, std::nullopt, m_failed};
    if (!m_running.empty()) {
        state.running = RunningApplication{m_running.back().id, m_running.back().isServiceBound};
    } else if (m_window.hasApplication()) {
        state.running = RunningApplication();
    }
    const LifecycleDecision decision = decide(event, state);
    const bool endsOne = !decision.started && !m_running.empty() && event != LifecycleEvent::StoppedByViewer;
    if (decision.endsRunning && endsOne) {
        m_window.end(m_running.back().application);
    } else if (decision.endsRunning) {
        m_window.endAll();
    }
    if (decision.started) {
        const SignalledApplication started = m_signalling.applications[*decision.started];
        onOpened(m_window.open(started.url), started);
    }
}

void SignalledApplications::onOpened(Application application, const SignalledApplication& signalled) {
    m_running.push_back({application, signalled.id, signalled.isServiceBound});
}

void SignalledApplications::onEnded(Application application) {
    const auto found = find(application);
    if (found != m_running.end()) {
        m_running.erase(found);
    }
}

bool SignalledApplications::onLoadFailed(Application application) {
    const auto found = find(application);
    if (found == m_running.end()) {
        return false;
    }
    // The decision is about the last one.
    m_failed.push_back(found->id);
    std::rotate(m_running.begin() + (found - m_running.cbegin()),
                m_running.begin() + (found - m_running.cbegin()) + 1, m_running.end());
    decideOn(LifecycleEvent::LoadFailed);
    return true;
}

void SignalledApplications::stop() {
    decideOn(LifecycleEvent::StoppedByViewer);
}

void SignalledApplications::start() {
    decideOn(LifecycleEvent::StartedByViewer);
}

std::string SignalledApplications::idOf(Application application) const {
    const auto found = find(application);
    return found == m_running.end() ? "" : toString(found->id);
}

std::vector<SignalledApplications::Running>::const_iterator
SignalledApplications::find(Application application) const {
    return std::find_if(m_running.begin(), m_running.end(),
                        [application](const Running& running) { return running.application == application; });
}

} // namespace desktop
