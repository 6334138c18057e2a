// Where the packets of a channel come from: the playout of its multiplex, and the receiver of that multiplex.
#ifndef TELIX_DESKTOP_PLATFORM_BROADCASTSOURCE_H
#define TELIX_DESKTOP_PLATFORM_BROADCASTSOURCE_H

#include <functional>
#include <string>

#include "desktop/platform/Channels.h"
#include "desktop/platform/Platform.h"
#include "desktop/platform/Playout.h"
#include "desktop/platform/Receiver.h"

namespace desktop {

// Platform thread. The receiver runs on the playout thread and locks itself.
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

    // Plays out the multiplex of the channel unless it plays already. `error` has the reason of a failure.
    Result open(const Channel& channel, std::string& error);

    Receiver& receiver() { return m_receiver; }
    const Receiver& receiver() const { return m_receiver; }

private:
    void onTestFile(const std::string& file, const std::string& error);

    Platform& m_platform;
    std::function<void()> m_onTestMultiplex;
    Receiver m_receiver;
    Playout m_playout; // after the receiver, so that it is destroyed first

    std::string m_playedFile; // empty: none
    std::string m_testFile;   // empty: not made
    std::string m_testError;
    bool m_isMakingTestFile = false;
};

} // namespace desktop

#endif
