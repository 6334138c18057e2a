// Presents the service of one channel at a time: the steps of a tune from the request to its outcome, the
// tuner's pipeline, and what arrives for the service.
#ifndef TELIX_DESKTOP_PLATFORM_SERVICEPRESENTATION_H
#define TELIX_DESKTOP_PLATFORM_SERVICEPRESENTATION_H

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "desktop/platform/BroadcastComponents.h"
#include "desktop/platform/BroadcastSource.h"
#include "desktop/platform/Channels.h"
#include "desktop/platform/Clock.h"
#include "desktop/platform/Tuner.h"
#include "desktop/platform/TunerArbiter.h"

namespace desktop {

// Platform thread, and no lock but for the picture token. Every callback of the source, the tuner, the
// picture and the clock is posted here with the id of its tune; those of an earlier tune are dropped.
class ServicePresentation {
public:
    // What arrives for the service that is received, and for the one that is presented.
    struct Listener {
        std::function<void(TELIX_JS_CM_HANDLE channel)> onServiceSelected; // received from now on
        std::function<void()> onServiceLost; // nothing is received until the next service is selected
        std::function<void(TELIX_JS_CM_HANDLE channel, const ApplicationList& list)> onApplications;
        std::function<void(TELIX_JS_CM_HANDLE channel, const Eit& eit)> onEit;
        std::function<void(uint8_t componentTag, const StreamEvent& event)> onStreamEvent;
        std::function<void()> onHandOver;  // the service is presented on, for another object or for none
        std::function<void()> onEnd;       // the service is not presented any more
        std::function<void()> onEndLocked; // the same, with Platform::mutex() held
    };

    // All must outlive the presentation, which lives as long as the process.
    ServicePresentation(const Channels& channels, TunerArbiter& arbiter, BroadcastComponents& components,
                        Clock& clock, Listener listener);

    // Prepares the sources of the channels. Once, before the first tune, on the thread that makes this
    // object.
    void start();

    // Replaces what is presented. The outcome is reported to the arbiter.
    void tune(const Tune& tune);

    // Presents the service on, with the pipeline as it is, for another object or for the set itself. False,
    // with nothing changed, if another service is presented, or the same for that object already.
    bool handOver(const Tune& tune);

    // Ends what is presented.
    void stop();

    // Whether a channel is presented, or about to be.
    bool isActive() const { return m_pendingTune.id != 0 || m_tuner; }

    // Whether a tune has no outcome yet.
    bool isPending() const { return m_pendingTune.id != 0; }

    // Receives the signalling of a channel while nothing is presented.
    void receive(TELIX_JS_CM_HANDLE channel);

    // Whether changes to a multiplex that is received begin with what has been received before. Any thread.
    void setInstantZap(bool isOn);

    // What is received, by which tuners.
    const BroadcastSource& source() const { return m_source; }

    // Passes the active components on to the pipeline.
    void applySelection();

    // The PID of the audio that the pipeline lets through.
    std::optional<uint16_t> activeAudioPid() const;

    // How late picture and sound are (negative: they wait for their time); nothing before they are presented.
    struct Lateness {
        std::optional<std::chrono::milliseconds> video;
        std::optional<std::chrono::milliseconds> audio;
    };
    Lateness lateness() const;

    // Of the presentation's picture; 0: none. With Platform::mutex() held.
    Picture::Token pictureTokenLocked() const { return m_pictureToken; }

private:
    void onTestMultiplex();
    void end();
    void present(const Tune& tune);
    BroadcastSource::Result openSource(const Channel& channel, std::string& error);
    void followApplications(const Channel& channel);
    void loseService();
    Picture::View viewOf(const Tune& tune) const;
    void receiveNeighbours();
    void startTuner(const Tune& tune, uint16_t serviceId);
    void selectService(const Tune& tune, uint16_t serviceId);
    void onPmt(const Tune& tune, const Pmt& pmt);
    void onFirstAudio(uint64_t tuneId);
    void onPrerolled(uint64_t tuneId);
    void onTunerPreempted();
    void onTimeout(uint64_t tuneId);
    void fail(uint64_t tuneId, TELIX_ERR_STATE_ENUM_T error, const std::string& reason);
    void abortPendingTune();
    void stopTuner();

    Platform& m_platform;
    const Channels& m_channels;
    TunerArbiter& m_arbiter;
    BroadcastComponents& m_components;
    Clock& m_clock;
    const Listener m_listener;
    BroadcastSource m_source;

    std::unique_ptr<Tuner> m_tuner;
    Tune m_pendingTune;                       // without an outcome yet
    TELIX_JS_CM_HANDLE m_awaitedChannel = 0;  // to be received when the test multiplex is there; 0: none
    TELIX_JS_CM_HANDLE m_followedChannel = 0; // whose applications are followed; 0: none
    uint64_t m_activeTuneId = 0;              // the tune that has started the tuner; 0: there is none
    Tune m_presented;                         // the tune for which the tuner runs now
    Picture::Token m_pictureToken = 0; // changed on the platform thread alone, guarded by Platform::mutex()
};

} // namespace desktop

#endif
