// What a television does by itself, whatever its window's toolkit.
#include "desktop/window/shared/Television.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace desktop {

namespace {

constexpr uint32_t kFullVolume = 100;
constexpr uint32_t kVolumeStep = 5;

// The longest logical channel numbers have four digits.
constexpr std::size_t kMostDigits = 4;

} // namespace

// The keys that are not digits. RED is the key with which applications announce themselves.
const Television::KeyAction Television::kActions[] = {{"ok", Action::SelectTyped},
                                                      {"channel-up", Action::ChannelUp},
                                                      {"channel-down", Action::ChannelDown},
                                                      {"volume-up", Action::VolumeUp},
                                                      {"volume-down", Action::VolumeDown},
                                                      {"mute", Action::Mute},
                                                      {"exit", Action::Exit},
                                                      {"text", Action::Start},
                                                      {"red", Action::StartUnlessRunning}};

Television::Television(Library library, SignalledApplications::Window window,
                       std::function<void(const std::string& text)> display, Timer timer)
    : m_library(std::move(library)), m_display(std::move(display)), m_timer(std::move(timer)),
      m_applications(std::move(window)) {}

Television::~Television() {
    m_timer.stop();
}

void Television::onSignalling(Signalling signalling) {
    const std::string channel = "channel " + std::to_string(signalling.channel);
    for (const std::string& each : signalling.skipped) {
        m_warnings.print({}, Warning::SkippedEntry, channel + ": " + each);
    }
    m_applications.update(std::move(signalling));
}

void Television::onEnded(SignalledApplications::Application application) {
    m_warnings.forget(application);
    m_applications.onEnded(application);
}

void Television::onKey(const RemoteKey& key, const Warnings::Page& page) {
    if (page.application && key.group != KeyGroupTelevision) {
        m_warnings.print(page, Warning::KeyNotInSet, key.name);
    }
    if (key.group == KeyGroupNumeric) {
        onDigit(static_cast<char>(key.keyCode));
        return;
    }
    const std::string name = key.name;
    const auto* found = std::find_if(std::begin(kActions), std::end(kActions),
                                     [&name](const KeyAction& each) { return name == each.key; });
    const bool isKnown = found != std::end(kActions);
    if (!isKnown || found->action != Action::SelectTyped) {
        m_timer.stop();
        m_digits.clear();
    }
    if (isKnown) {
        perform(found->action);
    }
}

void Television::onDigit(char digit) {
    m_digits += digit;
    m_display(m_digits);
    if (m_digits.size() == kMostDigits) {
        selectTypedChannel();
    } else {
        m_timer.start(kDigitMilliseconds, [this] { selectTypedChannel(); });
    }
}

void Television::selectTypedChannel() {
    m_timer.stop();
    const std::string digits = std::exchange(m_digits, {});
    if (!digits.empty()) {
        m_library.tune(static_cast<uint32_t>(std::stoul(digits)), showChannel());
    }
}

Television::OnChannel Television::showChannel() const {
    return [this](uint32_t number, const std::string& name) {
        if (number > 0) {
            m_display(std::to_string(number) + "   " + name);
        }
    };
}

void Television::perform(Action action) {
    switch (action) {
    case Action::SelectTyped:
        selectTypedChannel();
        break;
    case Action::ChannelUp:
    case Action::ChannelDown:
        m_library.step(action == Action::ChannelUp ? 1 : -1, showChannel());
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
