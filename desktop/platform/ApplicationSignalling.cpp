// The state of the signalling, and its exported functions.
#include "desktop/platform/ApplicationSignalling.h"

#include <algorithm>
#include <memory>
#include <utility>

namespace desktop {

namespace {

// Injected applications have ids of their own: one per URL, so that an application goes on when the channel
// changes to another one on which the same URL is signalled.
constexpr uint32_t kInjectedOrganisation = 0x7FFFFFFF;
constexpr uint8_t kInjectedPriority = 0xFF;
constexpr size_t kMaxInjectedUrls = 0xFFFF;

} // namespace

void ApplicationSignalling::onServiceSelected(TELIX_JS_CM_HANDLE channel) {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (m_received.channel == channel && m_received.state != State::NoService) {
            return;
        }
        if (m_received.channel != channel) {
            ++m_received.serviceSerial;
        }
        m_received.channel = channel;
        m_received.state = State::Awaited;
        m_received.list = {};
        ++m_received.serial;
    }
    wakeUp();
}

void ApplicationSignalling::onApplications(TELIX_JS_CM_HANDLE channel, const ApplicationList& list) {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (m_received.channel != channel || m_received.state == State::NoService) {
            return; // of an earlier service
        }
        m_received.state = State::Known;
        m_received.list = list;
        ++m_received.serial;
    }
    wakeUp();
}

void ApplicationSignalling::onServiceLost() {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (m_received.state == State::NoService) {
            return;
        }
        m_received.state = State::NoService;
        m_received.list = {};
        ++m_received.serial;
    }
    wakeUp();
}

ApplicationSignalling::Snapshot ApplicationSignalling::snapshot() const {
    std::lock_guard<std::mutex> lock(m_mutex);
    Snapshot snapshot = m_received;
    const auto injected = m_injected.find(snapshot.channel);
    if (snapshot.state == State::Known && injected != m_injected.end()) {
        snapshot.list.applications.push_back(injected->second);
    }
    return snapshot;
}

bool ApplicationSignalling::signal(TELIX_JS_CM_HANDLE channel, const std::string& url, uint8_t controlCode,
                                   bool isServiceBound) {
    SignalledApplication application;
    application.controlCode = controlCode;
    application.name = url;
    application.url = url;
    application.isServiceBound = isServiceBound;
    application.priority = kInjectedPriority;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (url.empty()) {
            m_injected.erase(channel);
        } else if (!findFault(application).empty() || m_injectedUrls.size() >= kMaxInjectedUrls) {
            return false;
        } else {
            application.id = idOfLocked(url);
            m_injected[channel] = std::move(application);
        }
        if (m_received.channel != channel) {
            return true; // seen when the channel is selected
        }
        ++m_received.serial;
    }
    wakeUp();
    return true;
}

ApplicationId ApplicationSignalling::idOfLocked(const std::string& url) {
    auto found = std::find(m_injectedUrls.begin(), m_injectedUrls.end(), url);
    if (found == m_injectedUrls.end()) {
        found = m_injectedUrls.insert(found, url);
    }
    return {kInjectedOrganisation, static_cast<uint16_t>(found - m_injectedUrls.begin() + 1)};
}

void ApplicationSignalling::setWakeup(telix_desktop_applications_wakeup wakeup, void* data) {
    {
        std::lock_guard<std::mutex> lock(m_wakeupMutex);
        m_wakeup = wakeup;
        m_wakeupData = data;
    }
    if (snapshot().serial != 0) {
        wakeUp();
    }
}

void ApplicationSignalling::wakeUp() {
    std::lock_guard<std::mutex> lock(m_wakeupMutex);
    if (m_wakeup) {
        m_wakeup(m_wakeupData);
    }
}

} // namespace desktop
