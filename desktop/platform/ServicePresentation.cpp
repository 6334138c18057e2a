// The steps of a tune.
#include "desktop/platform/ServicePresentation.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <mutex>
#include <thread>
#include <utility>

namespace desktop {

namespace {

// A viewer who goes through the channels does not stay that long on any of them.
constexpr auto kSettled = std::chrono::seconds(1);

// A thread that loads the decoders. The process waits for it when it ends: libraries that are loaded
// afterwards would find those that they need without their state.
class DecoderLoader {
public:
    DecoderLoader() : m_thread(Tuner::loadDecoders) {}
    ~DecoderLoader() { m_thread.join(); }
    DecoderLoader(const DecoderLoader&) = delete;
    DecoderLoader& operator=(const DecoderLoader&) = delete;

private:
    std::thread m_thread;
};

} // namespace

ServicePresentation::ServicePresentation(const Channels& channels, TunerArbiter& arbiter,
                                         BroadcastComponents& components, Clock& clock, Listener listener)
    : m_platform(Platform::instance()), m_channels(channels), m_arbiter(arbiter), m_components(components),
      m_clock(clock), m_listener(std::move(listener)), m_source(clock, [this] { onTestMultiplex(); }) {}

// Not in the constructor, because the platform thread may use this object as soon as the file is there.
void ServicePresentation::start() {
    setInstantZap(m_platform.configuration().instantZap);
    static const DecoderLoader kLoader; // while the browser loads its first page
    if (m_channels.usesTestMultiplex()) {
        m_source.makeTestMultiplexFile();
    }
}

void ServicePresentation::onTestMultiplex() {
    if (m_pendingTune.id != 0) {
        if (!m_tuner) { // a channel of a file does not wait for the test multiplex
            present(m_pendingTune);
        }
    } else if (m_awaitedChannel != 0) {
        receive(m_awaitedChannel);
    }
}

void ServicePresentation::tune(const Tune& tune) {
    if (handOver(tune)) {
        return;
    }
    end();
    m_awaitedChannel = 0;
    m_pendingTune = tune;
    m_arbiter.reportConnecting(tune);
    const uint32_t delay = m_platform.configuration().zapDelay;
    if (delay == 0) {
        present(tune);
        return;
    }
    m_clock.callAfter(std::chrono::milliseconds(delay), [this, tune] {
        if (m_pendingTune.id == tune.id && m_activeTuneId != tune.id) {
            present(tune);
        }
    });
}

bool ServicePresentation::handOver(const Tune& tune) {
    if (!m_tuner || m_presented.channel != tune.channel || m_presented.object == tune.object) {
        return false;
    }
    const bool isPrerolled = m_pendingTune.id == 0;
    abortPendingTune();
    m_pendingTune = tune;
    m_presented = tune;
    m_platform.picture().setView(m_pictureToken, viewOf(tune)); // no lock: this thread alone changes it
    m_arbiter.reportConnecting(tune);
    m_components.selectDefaults();
    applySelection();
    m_listener.onHandOver();
    if (isPrerolled) {
        onPrerolled(m_activeTuneId);
    }
    return true;
}

void ServicePresentation::stop() {
    end();
    receiveNeighbours();
}

void ServicePresentation::end() {
    abortPendingTune();
    stopTuner();
}

void ServicePresentation::abortPendingTune() {
    if (m_pendingTune.id != 0) {
        m_arbiter.reportAborted(std::exchange(m_pendingTune, {}));
    }
}

// ---- Reception

void ServicePresentation::receive(TELIX_JS_CM_HANDLE handle) {
    if (isActive()) {
        return; // the channel is received already
    }
    const Channel channel = m_channels.find(handle).value_or(Channel());
    std::string error = "unknown channel";
    const auto result = channel.origin == Channel::Origin::None ? BroadcastSource::Result::Failed
                                                                : openSource(channel, error);
    m_awaitedChannel = result == BroadcastSource::Result::Pending ? handle : 0;
    if (result == BroadcastSource::Result::Failed) {
        std::fprintf(stderr, "libtelix: channel: %s\n", error.c_str());
        loseService();
    }
}

// Follows the applications of the channel, too, if it is received.
BroadcastSource::Result ServicePresentation::openSource(const Channel& channel, std::string& error) {
    const auto result = m_source.open(channel, error);
    if (result == BroadcastSource::Result::Open) {
        followApplications(channel);
    }
    return result;
}

// A channel that is tuned to again keeps what is known of it.
void ServicePresentation::followApplications(const Channel& channel) {
    if (m_followedChannel == channel.handle) {
        return;
    }
    m_followedChannel = channel.handle;
    m_listener.onServiceSelected(channel.handle);
    const auto onApplications = [this, handle = channel.handle](const ApplicationList& list) {
        m_platform.post([this, handle, list] {
            if (m_followedChannel == handle) {
                m_listener.onApplications(handle, list);
            }
        });
    };
    m_source.receiver().followApplications(static_cast<uint16_t>(channel.sid), onApplications);
}

void ServicePresentation::loseService() {
    m_followedChannel = 0;
    m_listener.onServiceLost();
}

void ServicePresentation::setInstantZap(bool isOn) {
    m_source.keepPackets(isOn);
    m_platform.post([this] { receiveNeighbours(); });
}

// While a channel is on, whose picture the neighbours could follow without waiting for a keyframe.
void ServicePresentation::receiveNeighbours() {
    std::vector<Channel> neighbours;
    if (m_tuner && m_pendingTune.id == 0 && m_source.keepsPackets()) {
        for (const TELIX_JS_CM_HANDLE handle : m_arbiter.neighbours()) {
            neighbours.push_back(m_channels.find(handle).value_or(Channel()));
        }
    }
    m_source.receiveBesides(neighbours);
}

// ---- From the channel to the running pipeline

void ServicePresentation::present(const Tune& tune) {
    if (!m_arbiter.isLatest(tune)) {
        return; // the later request aborts this one in its turn
    }
    const Channel channel = m_channels.find(tune.channel).value_or(Channel());
    if (channel.origin == Channel::Origin::None) {
        loseService();
        fail(tune.id, kErrorUnknownChannel, "unknown channel");
        return;
    }
    std::string error;
    switch (openSource(channel, error)) {
    case BroadcastSource::Result::Pending:
        return;
    case BroadcastSource::Result::Failed:
        loseService();
        fail(tune.id, kErrorNoSignal, error);
        return;
    case BroadcastSource::Result::Open:
        startTuner(tune, static_cast<uint16_t>(channel.sid));
        return;
    }
}

Picture::View ServicePresentation::viewOf(const Tune& tune) const {
    return tune.object == 0 ? m_arbiter.backgroundView()
                            : m_arbiter.viewOf(tune.object).value_or(Picture::View());
}

void ServicePresentation::startTuner(const Tune& tune, uint16_t serviceId) {
    const auto post = [this](auto function) { m_platform.post(std::move(function)); };
    Tuner::Listener listener;
    listener.onError = [this, id = tune.id, post](const std::string& reason) {
        post([this, id, reason] { fail(id, kErrorNoSignal, reason); });
    };
    listener.onFirstAudio = [this, id = tune.id, post] { post([this, id] { onFirstAudio(id); }); };
    listener.onAudioFormat = [this, channel = tune.channel, post](uint16_t pid, uint32_t audioChannels) {
        post(
            [this, channel, pid, audioChannels] { m_components.onAudioFormat(channel, pid, audioChannels); });
    };
    m_tuner = std::make_unique<Tuner>(serviceId, listener);
    m_activeTuneId = tune.id;
    m_presented = tune;

    const Picture::Token token = m_platform.picture().acquire(
        viewOf(tune), [this] { onTunerPreempted(); },
        [this, id = tune.id, post] { post([this, id] { onPrerolled(id); }); });
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        m_pictureToken = token;
    }
    std::string error;
    // What has not arrived yet may be that old if the transmission begins now.
    const Clock::Duration age = std::max(m_source.receiver().keptAge(serviceId), Playout::kHeadStart);
    if (!m_tuner->start(m_platform.picture(), token, age, error)) {
        fail(tune.id, kErrorNoSignal, error);
        return;
    }
    selectService(tune, serviceId);
    const std::chrono::seconds timeout(m_platform.configuration().signalTimeout);
    m_clock.callAfter(timeout, [this, id = tune.id] { onTimeout(id); });
}

void ServicePresentation::selectService(const Tune& tune, uint16_t serviceId) {
    const auto postIfActive = [this, id = tune.id](std::function<void()> function) {
        m_platform.post([this, id, function = std::move(function)] {
            if (m_activeTuneId == id) {
                function();
            }
        });
    };
    Receiver::Service service;
    service.serviceId = serviceId;
    service.feed = m_tuner->feed();
    service.onPmt = [this, tune, postIfActive](const Pmt& pmt) {
        postIfActive([this, tune, pmt] { onPmt(tune, pmt); });
    };
    service.onMissing = [this, tune, postIfActive] {
        postIfActive([this, tune] {
            loseService();
            fail(tune.id, kErrorUnknownChannel, "the multiplex has no such service");
        });
    };
    service.onEit = [this, tune, postIfActive](const Eit& eit) {
        postIfActive([this, tune, eit] { m_listener.onEit(tune.channel, eit); });
    };
    service.onStreamEvent = [this, postIfActive](uint8_t componentTag, const StreamEvent& event) {
        postIfActive([this, componentTag, event] { m_listener.onStreamEvent(componentTag, event); });
    };
    m_source.receiver().select(service);
}

// ---- What happens to it

void ServicePresentation::onPmt(const Tune& tune, const Pmt& pmt) {
    m_components.onPmt(tune.channel, pmt);
    applySelection();
}

// Radio has no frame that would show that it is presented.
void ServicePresentation::onFirstAudio(uint64_t tuneId) {
    if (!m_components.hasVideo()) {
        onPrerolled(tuneId);
    }
}

void ServicePresentation::onPrerolled(uint64_t tuneId) {
    if (m_pendingTune.id == 0 || m_activeTuneId != tuneId) {
        return;
    }
    const Tune presented = std::exchange(m_pendingTune, {});
    m_components.updateAspectRatio();
    m_arbiter.reportPresenting(presented);
    m_clock.callAfter(kSettled, [this, id = m_activeTuneId] {
        if (m_activeTuneId == id) {
            receiveNeighbours();
        }
    });
}

void ServicePresentation::onTimeout(uint64_t tuneId) {
    if (m_pendingTune.id != 0 && m_activeTuneId == tuneId) {
        fail(tuneId, kErrorNoSignal, "no picture and no sound within the timeout");
    }
}

// Either the tune fails, or what it presents breaks down later.
void ServicePresentation::fail(uint64_t tuneId, TELIX_ERR_STATE_ENUM_T error, const std::string& reason) {
    const bool isPending = m_pendingTune.id != 0;
    if (tuneId == 0 || (tuneId != m_pendingTune.id && tuneId != m_activeTuneId)) {
        return;
    }
    std::fprintf(stderr, "libtelix: channel: %s\n", reason.c_str());
    const TELIX_JS_VB_HANDLE owner = m_arbiter.owner();
    const Tune failed = std::exchange(m_pendingTune, {});
    stopTuner();
    if (isPending) {
        m_arbiter.reportFailed(failed, error);
    } else {
        m_arbiter.reportBroken(owner, error);
    }
}

// Called by the picture, inside of the player's request for it.
void ServicePresentation::onTunerPreempted() {
    const TELIX_JS_VB_HANDLE object = m_presented.object;
    abortPendingTune();
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        m_pictureToken = 0;
        m_arbiter.preemptLocked(object);
    }
    stopTuner();
    receiveNeighbours();
    m_arbiter.reportPreempted(object);
}

void ServicePresentation::stopTuner() {
    m_source.receiver().deselect();
    m_tuner.reset();
    m_activeTuneId = 0;
    m_listener.onEnd();
    Picture::Token token = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        token = std::exchange(m_pictureToken, Picture::Token{0});
        m_components.clearLocked();
        m_listener.onEndLocked();
    }
    m_platform.picture().release(token);
}

void ServicePresentation::applySelection() {
    if (!m_tuner) {
        return;
    }
    const BroadcastComponents::ActivePids pids = m_components.activePids();
    m_tuner->selectVideo(pids.video.has_value());
    m_tuner->selectAudio(pids.audio);
    m_tuner->selectSubtitle(pids.subtitle);
    if (!pids.video && m_pendingTune.id == 0) {
        m_platform.picture().blank(m_pictureToken); // no lock: this thread alone changes it
    }
}

ServicePresentation::Lateness ServicePresentation::lateness() const {
    return m_tuner ? Lateness{m_tuner->videoTiming().lateness(), m_tuner->audioTiming().lateness()}
                   : Lateness{};
}

std::optional<uint16_t> ServicePresentation::activeAudioPid() const {
    return m_tuner ? m_tuner->activeAudioPid() : std::nullopt;
}

} // namespace desktop
