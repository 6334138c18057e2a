// The desktop's platform library as the window uses it.
#include "desktop/window/shared/TelevisionLibrary.h"

#include <array>

namespace desktop {

namespace {

// Where a plug-in's library is: in a build folder, and as installed.
constexpr const char* kPlaces[] = {"platform/libtelix.so", "libtelix.so"};
// A function that only the desktop's library has.
constexpr char kOwnFunction[] = "telix_desktop_present_channel";
constexpr size_t kMaxName = 256;

} // namespace

void TelevisionLibrary::loadBeside(const std::string& plugin) {
    const std::string folder = plugin.substr(0, plugin.rfind('/') + 1);
    for (const char* place : kPlaces) {
        void* library = dlopen((folder + place).c_str(), RTLD_LAZY | RTLD_LOCAL);
        if (library && dlsym(library, kOwnFunction)) {
            return; // stays loaded, as the plug-in loads it
        }
        if (library) {
            dlclose(library);
        }
    }
}

bool TelevisionLibrary::find() {
    if (!m_hasFunctions && m_library.find()) {
        m_hasFunctions = m_library.bind("telix_desktop_key_set", m_keySet) &&
                         m_library.bind("telix_desktop_channel", m_channel) &&
                         m_library.bind("telix_desktop_channel_count", m_channelCount) &&
                         m_library.bind("telix_desktop_channel_name", m_channelName) &&
                         m_library.bind("telix_desktop_tune", m_tune) &&
                         m_library.bind(kOwnFunction, m_present) &&
                         m_library.bind("telix_desktop_set_volume", m_setVolume) &&
                         m_library.bind("telix_desktop_set_applications_wakeup", m_setWakeup) &&
                         m_library.bind("telix_desktop_acquire_applications", m_acquire) &&
                         m_library.bind("telix_desktop_release_applications", m_release) &&
                         m_library.bind("telix_desktop_signal_application", m_signal);
    }
    return m_hasFunctions;
}

std::string TelevisionLibrary::start(const TelevisionStart& start, telix_desktop_applications_wakeup wakeup,
                                     void* data) {
    std::string error;
    if (start.channel != 0 && m_tune(start.channel) == 0) {
        error =
            "no channel " + std::to_string(start.channel) + ", there are " + std::to_string(m_channelCount());
    } else if (!start.signalUrl.empty() && m_signal(start.signalUrl.c_str(), start.signalChannel) == 0) {
        error = "cannot signal " + start.signalUrl + ": no channel";
    }
    m_setVolume(start.volume);
    m_setWakeup(wakeup, data);
    m_present();
    return error;
}

void TelevisionLibrary::stop() {
    if (m_hasFunctions) {
        m_setWakeup(nullptr, nullptr);
    }
}

TelevisionLibrary::Channel TelevisionLibrary::channel() const {
    std::array<char, kMaxName> name{};
    const uint32_t number = m_channel();
    m_channelName(number, name.data(), name.size());
    return {number, name.data()};
}

void TelevisionLibrary::step(int positions) const {
    const auto count = static_cast<int64_t>(m_channelCount());
    if (count > 0) {
        const int64_t index = (static_cast<int64_t>(m_channel()) - 1 + positions) % count;
        m_tune(static_cast<uint32_t>((index + count) % count + 1));
    }
}

Signalling TelevisionLibrary::signalling() const {
    telix_desktop_applications applications{};
    m_acquire(&applications);
    Signalling signalling;
    signalling.state = applications.state;
    signalling.service = applications.service;
    signalling.serial = applications.serial;
    signalling.channel = m_channel();
    for (size_t index = 0; index < applications.applicationCount; ++index) {
        const telix_desktop_application& each = applications.applications[index];
        SignalledApplication application;
        application.id = {each.organisationId, each.applicationId};
        application.controlCode = each.controlCode;
        application.name = each.name;
        application.url = each.url;
        application.isServiceBound = each.serviceBound != 0;
        application.visibility = each.visibility;
        application.priority = each.priority;
        application.usage = each.usage;
        signalling.applications.push_back(std::move(application));
    }
    signalling.skipped.assign(applications.skipped, applications.skipped + applications.skippedCount);
    m_release(&applications);
    return signalling;
}

} // namespace desktop
