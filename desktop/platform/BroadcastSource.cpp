// Changes of the multiplex, and the file of the test multiplex.
#include "desktop/platform/BroadcastSource.h"

#include <algorithm>
#include <cstdio>
#include <map>
#include <thread>

#include "desktop/platform/Multiplex.h"

namespace desktop {

BroadcastSource::Frontend::Frontend(Clock& clock)
    : receiver(clock), playout(clock, [this](const uint8_t* packets, size_t size, Clock::Duration age) {
          receiver.push(packets, size, age);
      }) {}

BroadcastSource::BroadcastSource(Clock& clock, std::function<void()> onTestMultiplex)
    : m_platform(Platform::instance()), m_onTestMultiplex(std::move(onTestMultiplex)) {
    for (uint32_t tuner = 0; tuner < m_platform.configuration().tuners; ++tuner) {
        m_frontends.push_back(std::make_unique<Frontend>(clock));
    }
    m_selected = m_frontends.front().get();
}

// ---- The file of the test multiplex

void BroadcastSource::makeTestMultiplexFile() {
    m_isMakingTestFile = true;
    const auto make = [this] {
        std::string error;
        const std::string file = makeTestMultiplex(error);
        if (file.empty()) {
            std::fprintf(stderr, "libtelix: test multiplex: %s\n", error.c_str());
        }
        m_platform.post([this, file, error] { onTestFile(file, error); });
    };
    std::thread(make).detach(); // this object lives as long as the process
}

void BroadcastSource::onTestFile(const std::string& file, const std::string& error) {
    m_isMakingTestFile = false;
    m_testFile = file;
    m_testError = error;
    m_onTestMultiplex();
}

// Empty if there is none, or none yet.
std::string BroadcastSource::fileOf(const Channel& channel) const {
    return channel.origin == Channel::Origin::TestMultiplex ? m_testFile : channel.file;
}

// ---- Reception

BroadcastSource::Result BroadcastSource::open(const Channel& channel, std::string& error) {
    if (channel.origin == Channel::Origin::TestMultiplex && m_isMakingTestFile) {
        return Result::Pending;
    }
    const std::string file = fileOf(channel);
    if (file.empty()) {
        error = m_testError;
        return Result::Failed;
    }
    Frontend* const receiving = findReceiving(file);
    if (!receiving) {
        return switchTo(*m_selected, channel, error) ? Result::Open : Result::Failed;
    }
    std::lock_guard<std::mutex> lock(m_mutex);
    m_selected = receiving;
    return Result::Open;
}

void BroadcastSource::receiveBesides(const std::vector<Channel>& channels) {
    std::map<std::string, const Channel*> wanted; // by file
    for (const Channel& channel : channels) {
        const std::string file = fileOf(channel);
        if (!file.empty() && file != m_selected->file && wanted.size() + 1 < m_frontends.size()) {
            wanted.emplace(file, &channel);
        }
    }
    std::vector<Frontend*> idle; // as many as are wanted, at least
    for (const auto& frontend : m_frontends) {
        if (frontend.get() != m_selected && wanted.erase(frontend->file) == 0) {
            switchOff(*frontend);
            idle.push_back(frontend.get());
        }
    }
    auto frontend = idle.begin();
    for (const auto& [file, channel] : wanted) {
        std::string error; // reported if somebody tunes to the channel
        switchTo(**frontend++, *channel, error);
    }
}

// Null if no tuner receives it.
BroadcastSource::Frontend* BroadcastSource::findReceiving(const std::string& file) {
    const auto found = std::find_if(m_frontends.begin(), m_frontends.end(),
                                    [&](const auto& frontend) { return frontend->file == file; });
    return found == m_frontends.end() ? nullptr : found->get();
}

bool BroadcastSource::switchTo(Frontend& frontend, const Channel& channel, std::string& error) {
    switchOff(frontend);
    const Configuration& configuration = m_platform.configuration();
    auto injector =
        channel.origin == Channel::Origin::TestMultiplex
            ? makeTestTableInjector(configuration.programmeSeconds, configuration.streamEventSeconds,
                                    configuration.applicationsUrl)
            : nullptr;
    const std::string file = fileOf(channel);
    if (!frontend.playout.play(file, std::move(injector), error)) {
        return false;
    }
    std::lock_guard<std::mutex> lock(m_mutex);
    frontend.file = file;
    return true;
}

void BroadcastSource::switchOff(Frontend& frontend) {
    frontend.playout.stop();
    frontend.receiver.reset();
    std::lock_guard<std::mutex> lock(m_mutex);
    frontend.file.clear();
}

// ---- All tuners

void BroadcastSource::keepPackets(bool isOn) {
    for (const auto& frontend : m_frontends) {
        frontend->receiver.keepPackets(isOn);
    }
}

bool BroadcastSource::keepsPackets() const {
    return m_frontends.front()->receiver.keepsPackets();
}

std::vector<BroadcastSource::Reception> BroadcastSource::receptions() const {
    std::lock_guard<std::mutex> lock(m_mutex);
    std::vector<Reception> receptions;
    for (const auto& frontend : m_frontends) {
        receptions.push_back({frontend->file, frontend.get() == m_selected, frontend->receiver.keptSize()});
    }
    return receptions;
}

} // namespace desktop
