// The source of the generated broadcast: plays out a transport stream file in real time, over and over, with
// tables injected.
#ifndef TELIX_DESKTOP_PLATFORM_PLAYOUT_H
#define TELIX_DESKTOP_PLATFORM_PLAYOUT_H

#include <chrono>
#include <condition_variable>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <thread>

#include "desktop/platform/Clock.h"
#include "desktop/platform/TableInjector.h"

namespace desktop {

class Playout {
public:
    // Called on the playout thread with the packets that are due, several at a time, and how long they have
    // been due.
    using Sink = std::function<void(const uint8_t* packets, size_t size, Clock::Duration age)>;

    // A transmission has begun before it is received. The packets of that time are sent at once: the first
    // keyframe takes most of it.
    static constexpr Clock::Duration kHeadStart = std::chrono::milliseconds(400);

    // `clock` paces the packets and must outlive the playout.
    Playout(Clock& clock, Sink sink);
    ~Playout();
    Playout(const Playout&) = delete;
    Playout& operator=(const Playout&) = delete;

    // Plays out `file` from its start, as if begun kHeadStart ago, until stop(), and starts again at its end;
    // does nothing if it plays already. Without an injector the file is played out as it is. False with the
    // reason in `error` if it cannot be read or is not a transport stream; nothing is played out then. One
    // thread at a time, not from the sink.
    bool play(const std::string& file, std::unique_ptr<TableInjector> injector, std::string& error);

    // When this returns, the sink is not running and is not called again. Not from the sink.
    void stop();

private:
    class Stream;
    class Run;

    void run();

    Clock& m_clock;
    Sink m_sink;

    std::mutex m_mutex; // guards what follows, and Stream::isWithdrawn()
    std::condition_variable m_changed;
    std::shared_ptr<Stream> m_stream; // what is played out; null: nothing
    bool m_isSending = false;         // the playout thread is inside of a run
    bool m_isClosing = false;

    std::thread m_thread; // last: it uses all of the above
};

} // namespace desktop

#endif
