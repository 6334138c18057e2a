// The broadcaster: plays a transport stream file out in real time, over and over, with tables put in between.
#ifndef TELIX_DESKTOP_HEADEND_H
#define TELIX_DESKTOP_HEADEND_H

#include "desktop/platform/Restamper.h"
#include "desktop/platform/TsTables.h"

#include <condition_variable>
#include <functional>
#include <glib.h>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <thread>

namespace desktop {

// Tables that are put into a stream, by the wall clock. Used on the head-end's thread alone.
class Carousel {
public:
    virtual ~Carousel() = default;

    // Appends the packets that are due. `now` is in milliseconds since 1970.
    virtual void appendDue(int64_t now, Bytes& packets) = 0;

    // The PIDs of the file that are sent; all others make room for the tables.
    virtual const std::set<uint16_t>& sentPids() const = 0;
};

class HeadEnd {
public:
    // Takes packets as they are sent, some at a time, on the head-end's thread.
    using Sink = std::function<void(const uint8_t* packets, size_t size)>;

    explicit HeadEnd(Sink sink);
    ~HeadEnd();
    HeadEnd(const HeadEnd&) = delete;
    HeadEnd& operator=(const HeadEnd&) = delete;

    // Sends `file` from now on, from its start; nothing changes if it is sent already. Without a carousel the
    // file is sent as it is. False with the reason in `error` if it cannot be read or is no transport stream;
    // then nothing is sent. One thread at a time.
    bool play(const std::string& file, std::unique_ptr<Carousel> carousel, std::string& error);

    // Sends nothing. When this returns, the sink is not running. Not from the sink.
    void stop();

private:
    struct Stream;

    void run();
    void send(Stream& stream);

    Sink m_sink;
    std::mutex m_mutex;
    std::condition_variable m_changed;
    std::shared_ptr<Stream> m_stream; // what is to be sent
    bool m_isSending = false;
    bool m_ends = false;
    std::thread m_thread;
};

} // namespace desktop

#endif
