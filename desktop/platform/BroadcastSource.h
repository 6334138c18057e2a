// Where broadcast comes from: the tuners of the set, each with the playout of the multiplex that it receives.
#ifndef TELIX_DESKTOP_PLATFORM_BROADCASTSOURCE_H
#define TELIX_DESKTOP_PLATFORM_BROADCASTSOURCE_H

#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "desktop/platform/Channels.h"
#include "desktop/platform/Platform.h"
#include "desktop/platform/Playout.h"
#include "desktop/platform/Receiver.h"

namespace desktop {

// One tuner receives the multiplex of the channel that is selected; the others, if the configuration has
// them, those of its neighbours in the channel list. A change to one of these takes its tuner over.
//
// Platform thread, unless said otherwise. The receivers run on playout threads and lock themselves.
class BroadcastSource {
public:
    enum class Result {
        Open,    // the receiver gets the multiplex of the channel
        Pending, // the test multiplex is being made; `onTestMultiplex` follows
        Failed,  // there is no signal, or the channel has no source
    };

    // `onTestMultiplex` is called once after makeTestMultiplexFile(), whether it succeeded or not.
    BroadcastSource(Clock& clock, std::function<void()> onTestMultiplex);

    // Makes the file of the test multiplex in the background. At most once, before the first open().
    void makeTestMultiplexFile();

    // Receives the multiplex of the channel unless it is received already. No service of the receiver may be
    // selected. `error` has the reason of a failure.
    Result open(const Channel& channel, std::string& error);

    // Uses the other tuners for those of `channels` whose multiplex is not the selected one, as far as the
    // tuners go, the first channels first. What they receive already is kept; the rest of them is switched
    // off. A channel that cannot be received is left out.
    void receiveBesides(const std::vector<Channel>& channels);

    // Of the multiplex of the selected channel. Another one after each open().
    Receiver& receiver() { return m_selected->receiver; }
    const Receiver& receiver() const { return m_selected->receiver; }

    // Whether all tuners keep packets (Receiver::keepPackets). Any thread.
    void keepPackets(bool isOn);
    bool keepsPackets() const;

    // What a tuner does.
    struct Reception {
        std::string file; // of the multiplex; empty: none
        bool isSelected;  // it has the selected channel, or had it last
        size_t keptSize;  // bytes
    };
    // Of all tuners. Any thread.
    std::vector<Reception> receptions() const;

private:
    // A tuner with its demodulator, and what it receives.
    struct Frontend {
        explicit Frontend(Clock& clock);

        Receiver receiver;
        Playout playout;  // after the receiver, so that it is destroyed first
        std::string file; // that is played out; empty: none. Changed by switchTo() alone
    };

    void onTestFile(const std::string& file, const std::string& error);
    std::string fileOf(const Channel& channel) const;
    Frontend* findReceiving(const std::string& file);
    bool switchTo(Frontend& frontend, const Channel& channel, std::string& error);
    void switchOff(Frontend& frontend);

    Platform& m_platform;
    std::function<void()> m_onTestMultiplex;
    std::vector<std::unique_ptr<Frontend>> m_frontends; // constant

    // Changed on the platform thread alone; the mutex guards them, and Frontend::file, against receptions().
    mutable std::mutex m_mutex;
    Frontend* m_selected; // never null

    std::string m_testFile; // empty: not made
    std::string m_testError;
    bool m_isMakingTestFile = false;
};

} // namespace desktop

#endif
