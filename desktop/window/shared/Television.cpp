// What a television does by itself, whatever its window's toolkit.
#include "desktop/window/shared/Television.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace desktop {

namespace {

constexpr uint32_t kFullVolume = 100;
constexpr uint32_t kVolumeStep = 5;

// The keys that are not digits.
enum class Action { ChannelUp, ChannelDown, VolumeUp, VolumeDown, Mute, Exit, Start, StartUnlessRunning };
struct KeyAction {
    const char* key;
    Action action;
};
// RED is the key with which applications announce themselves.
constexpr KeyAction kActions[] = {{"channel-up", Action::ChannelUp},
                                  {"channel-down", Action::ChannelDown},
                                  {"volume-up", Action::VolumeUp},
                                  {"volume-down", Action::VolumeDown},
                                  {"mute", Action::Mute},
                                  {"exit", Action::Exit},
                                  {"text", Action::Start},
                                  {"red", Action::StartUnlessRunning}};

} // namespace

Television::Television(Library library, SignalledApplications::Window window,
                       std::function<void(const std::string& text)> display)
    : m_library(std::move(library)), m_display(std::move(display)), m_applications(std::move(window)) {}

void Television::onKey(const RemoteKey& key) {
    const auto showChannel = [this](uint32_t number, const std::string& name) {
        if (number > 0) {
            m_display(std::to_string(number) + "   " + name);
        }
    };
    if (key.group == KeyGroupNumeric) {
        m_library.tune(static_cast<uint32_t>(key.keyCode - '0'), showChannel);
        return;
    }
    const std::string name = key.name;
    const auto* found = std::find_if(std::begin(kActions), std::end(kActions),
                                     [&name](const KeyAction& each) { return name == each.key; });
    if (found == std::end(kActions)) {
        return;
    }
    switch (found->action) {
    case Action::ChannelUp:
    case Action::ChannelDown:
        m_library.step(found->action == Action::ChannelUp ? 1 : -1, showChannel);
        break;
    case Action::VolumeUp:
        setVolume(std::min(std::max(m_volume, m_volumeBeforeMute) + kVolumeStep, kFullVolume));
        break;
    case Action::VolumeDown:
        setVolume(std::max(std::max(m_volume, m_volumeBeforeMute), kVolumeStep) - kVolumeStep);
        break;
    case Action::Mute: {
        const uint32_t before = m_volume;
        setVolume(m_volumeBeforeMute);
        m_volumeBeforeMute = before;
        break;
    }
    case Action::Exit:
        m_applications.stop();
        break;
    case Action::Start:
        m_applications.start();
        break;
    case Action::StartUnlessRunning:
        if (!m_applications.hasApplication()) {
            m_applications.start();
        }
        break;
    }
}

void Television::setVolume(uint32_t volume) {
    m_volume = volume;
    m_volumeBeforeMute = 0;
    m_library.setVolume(volume);
    m_display(volume > 0 ? "Volume " + std::to_string(volume) : "Mute");
}

} // namespace desktop
