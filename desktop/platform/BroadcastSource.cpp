// Changes of the multiplex, and the file of the test multiplex.
#include "desktop/platform/BroadcastSource.h"

#include <cstdio>
#include <thread>

#include "desktop/platform/Multiplex.h"

namespace desktop {

BroadcastSource::BroadcastSource(Clock& clock, std::function<void()> onTestMultiplex)
    : m_platform(Platform::instance()), m_onTestMultiplex(std::move(onTestMultiplex)), m_receiver(clock),
      m_playout(clock, [this](const uint8_t* packets, size_t size) { m_receiver.push(packets, size); }) {}

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

BroadcastSource::Result BroadcastSource::open(const Channel& channel, std::string& error) {
    const bool isTest = channel.origin == Channel::Origin::TestMultiplex;
    if (isTest && m_isMakingTestFile) {
        return Result::Pending;
    }
    const std::string file = isTest ? m_testFile : channel.file;
    if (file.empty()) {
        error = m_testError;
        return Result::Failed;
    }
    if (file == m_playedFile) {
        return Result::Open;
    }
    m_playout.stop();
    m_receiver.reset();
    m_playedFile.clear();
    const Configuration& configuration = m_platform.configuration();
    auto injector =
        isTest ? makeTestTableInjector(configuration.programmeSeconds, configuration.streamEventSeconds,
                                       configuration.applicationsUrl)
               : nullptr;
    if (!m_playout.play(file, std::move(injector), error)) {
        return Result::Failed;
    }
    m_playedFile = file;
    return Result::Open;
}

} // namespace desktop
