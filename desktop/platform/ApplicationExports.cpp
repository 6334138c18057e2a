// The functions of telix_applications.h.
#include "desktop/platform/telix_applications.h"

#include <algorithm>
#include <utility>

#include "desktop/platform/ApplicationLifecycle.h"
#include "desktop/platform/ApplicationSignalling.h"
#include "desktop/platform/Broadcast.h"
#include "desktop/platform/XmlAit.h"

namespace desktop {

namespace {

// A list, and the C records that refer to its strings. Neither copied nor moved.
class ListRecord {
public:
    explicit ListRecord(ApplicationList list) : m_list(std::move(list)) {
        m_boundaries.resize(m_list.applications.size());
        for (size_t index = 0; index < m_list.applications.size(); ++index) {
            m_boundaries[index] = pointersTo(m_list.applications[index].boundaries);
            m_applications.push_back(record(m_list.applications[index], m_boundaries[index]));
        }
        m_skipped = pointersTo(m_list.skipped);
    }
    ListRecord(const ListRecord&) = delete;
    ListRecord& operator=(const ListRecord&) = delete;

    const ApplicationList& list() const { return m_list; }

    // The record is the owner from now on.
    void describe(telix_desktop_applications& out) {
        out = {};
        out.applications = m_applications.data();
        out.applicationCount = m_applications.size();
        out.skipped = m_skipped.data();
        out.skippedCount = m_skipped.size();
        out.owner = this;
    }

private:
    using Pointers = std::vector<const char*>;

    static Pointers pointersTo(const std::vector<std::string>& strings) {
        Pointers pointers;
        for (const std::string& each : strings) {
            pointers.push_back(each.c_str());
        }
        return pointers;
    }

    static telix_desktop_application record(const SignalledApplication& application,
                                            const Pointers& boundaries) {
        telix_desktop_application record{};
        record.organisationId = application.id.organisation;
        record.applicationId = application.id.application;
        record.controlCode = application.controlCode;
        record.serviceBound = application.isServiceBound ? 1 : 0;
        record.visibility = application.visibility;
        record.priority = application.priority;
        record.usage = application.usage;
        record.name = application.name.c_str();
        record.url = application.url.c_str();
        record.boundaries = boundaries.data();
        record.boundaryCount = boundaries.size();
        return record;
    }

    ApplicationList m_list; // not changed after construction, like what follows
    std::vector<telix_desktop_application> m_applications;
    std::vector<Pointers> m_boundaries; // by application
    Pointers m_skipped;
};

telix_desktop_signalling_state stateOf(ApplicationSignalling::State state) {
    switch (state) {
    case ApplicationSignalling::State::Known:
        return TELIX_DESKTOP_SIGNALLING_KNOWN;
    case ApplicationSignalling::State::Awaited:
        return TELIX_DESKTOP_SIGNALLING_AWAITED;
    default:
        return TELIX_DESKTOP_SIGNALLING_NONE;
    }
}

// In the order of telix_desktop_application_event.
constexpr LifecycleEvent kEvents[] = {
    LifecycleEvent::ServiceSelected, LifecycleEvent::SignallingChanged, LifecycleEvent::LoadFailed,
    LifecycleEvent::Exited,          LifecycleEvent::StoppedByViewer,   LifecycleEvent::StartedByViewer,
};

ApplicationId idOf(const telix_desktop_application_id& id) {
    return {id.organisationId, id.applicationId};
}

std::optional<RunningApplication> runningOf(const telix_desktop_running_application& record) {
    if (record.isRunning == 0) {
        return std::nullopt;
    }
    RunningApplication running;
    if (record.isBroadcastRelated != 0) {
        running.id = idOf(record.id);
    }
    running.isServiceBound = record.serviceBound != 0;
    return running;
}

} // namespace

} // namespace desktop

void telix_desktop_set_applications_wakeup(telix_desktop_applications_wakeup wakeup, void* data) {
    desktop::Broadcast& broadcast = desktop::Broadcast::instance();
    broadcast.applications().setWakeup(wakeup, data);
    if (wakeup) {
        broadcast.followApplications();
    }
}

void telix_desktop_acquire_applications(telix_desktop_applications* applications) {
    auto snapshot = desktop::Broadcast::instance().applications().snapshot();
    auto* record = new desktop::ListRecord(std::move(snapshot.list)); // deleted by the release
    record->describe(*applications);
    applications->state = desktop::stateOf(snapshot.state);
    applications->service = snapshot.serviceSerial;
    applications->serial = snapshot.serial;
}

int telix_desktop_parse_xml_ait(const char* document, size_t size, telix_desktop_applications* applications) {
    std::string error;
    auto list = desktop::parseXmlAit({document, size}, error);
    const bool isParsed = list.has_value();
    if (!isParsed) {
        list = desktop::ApplicationList{{}, {error}};
    }
    auto* record = new desktop::ListRecord(std::move(*list)); // deleted by the release
    record->describe(*applications);
    return isParsed ? 1 : 0;
}

void telix_desktop_release_applications(telix_desktop_applications* applications) {
    delete static_cast<desktop::ListRecord*>(applications->owner);
    *applications = {};
}

void telix_desktop_decide_application(telix_desktop_application_event event,
                                      const telix_desktop_applications* applications,
                                      const telix_desktop_running_application* running,
                                      const telix_desktop_application_id* failed, size_t failedCount,
                                      telix_desktop_application_decision* decision) {
    *decision = {};
    const auto* record = static_cast<const desktop::ListRecord*>(applications->owner);
    if (!record || event < 0 || static_cast<size_t>(event) >= std::size(desktop::kEvents)) {
        return;
    }
    desktop::LifecycleState state{record->list().applications, desktop::runningOf(*running), {}};
    for (size_t index = 0; index < failedCount; ++index) {
        state.failed.push_back(desktop::idOf(failed[index]));
    }
    const auto decided = desktop::decide(desktop::kEvents[event], state);
    decision->endsRunning = decided.endsRunning ? 1 : 0;
    decision->started = decided.started ? applications->applications + *decided.started : nullptr;
}

int telix_desktop_signal_application(const char* url, uint32_t channel) {
    desktop::Broadcast& broadcast = desktop::Broadcast::instance();
    const auto& list = broadcast.channels().list();
    if (channel > list.size()) {
        return 0;
    }
    const TELIX_JS_CM_HANDLE handle = channel == 0 ? broadcast.arbiter().currentChannel() : list[channel - 1];
    const bool isSignalled =
        handle != 0 &&
        broadcast.applications().signal(handle, url ? url : "", desktop::kControlCodeAutostart, false);
    return isSignalled ? 1 : 0;
}
