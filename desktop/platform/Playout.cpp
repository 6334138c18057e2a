// Pacing by the PCR of the file, and its repetition.
#include "desktop/platform/Playout.h"

#include <glib.h>

#include <algorithm>
#include <chrono>

#include "desktop/platform/Restamper.h"
#include "desktop/platform/Sections.h"

namespace desktop {

namespace {

constexpr auto kStep = std::chrono::milliseconds(10); // packets are sent in steps of this length, at least
constexpr auto kMaxDelay = std::chrono::seconds(1);   // beyond that, playout does not catch up
constexpr int64_t kMaxPcrGap = kSystemClockFrequency; // between two PCRs in a row
constexpr int64_t kDefaultPcrGap = kSystemClockFrequency / 25; // instead of a gap that is longer or negative
constexpr size_t kPacketsSearched = 40000;                     // for the following PCR

Clock::Duration durationOf(int64_t ticks) {
    return std::chrono::duration_cast<Clock::Duration>(std::chrono::duration<double>(
        static_cast<double>(ticks) / static_cast<double>(kSystemClockFrequency)));
}

struct UnrefMapping {
    void operator()(GMappedFile* mapping) const { g_mapped_file_unref(mapping); }
};
using Mapping = std::unique_ptr<GMappedFile, UnrefMapping>;

// The duration of the file in whole frames, so that the next repetition begins where the following frame
// would be. It cannot be derived from PCRs, which stand between frames.
class FrameCount {
public:
    void add(const uint8_t* packet) {
        const auto pts = ptsOf(packet);
        if (!pts) {
            return;
        }
        ++m_count;
        m_first = m_count == 1 ? *pts : std::min(m_first, *pts);
        m_last = m_count == 1 ? *pts : std::max(m_last, *pts);
    }

    // 27 MHz; 0 if there are too few frames.
    int64_t duration() const {
        return m_count < 2 ? 0 : (m_last - m_first) * kSystemClockTicksPerBaseTick * m_count / (m_count - 1);
    }

private:
    int64_t m_count = 0;
    int64_t m_first = 0; // 90 kHz
    int64_t m_last = 0;
};

} // namespace

// A file that is played out.
class Playout::Stream {
public:
    Stream(std::string file, Mapping mapping, size_t start, std::unique_ptr<TableInjector> injector)
        : m_file(std::move(file)), m_mapping(std::move(mapping)),
          m_packets(reinterpret_cast<const uint8_t*>(g_mapped_file_get_contents(m_mapping.get())) + start),
          m_count((g_mapped_file_get_length(m_mapping.get()) - start) / kPacketSize),
          m_injector(std::move(injector)) {}

    const std::string& file() const { return m_file; }
    size_t count() const { return m_count; }
    const uint8_t* packet(size_t index) const { return m_packets + index * kPacketSize; }
    TableInjector* injector() const { return m_injector.get(); }

    // Of several PIDs with a PCR, the first one in the file paces everything.
    bool isPcrPid(uint16_t pid) const { return pid == m_pcrPid; }

    // The first packet from `from` on with a PCR; count() if none is near.
    size_t findPcr(size_t from) {
        const size_t end = std::min(m_count, from + kPacketsSearched);
        for (size_t index = from; index < end; ++index) {
            const uint16_t pid = pidOf(packet(index));
            if ((m_pcrPid == kPidNullPacket || pid == m_pcrPid) && pcrOf(packet(index))) {
                m_pcrPid = pid;
                return index;
            }
        }
        return m_count;
    }

    bool passes(const uint8_t* packet) const {
        return packet[0] == kSyncByte && pidOf(packet) != kPidNullPacket &&
               (!m_injector || m_injector->passedPids().count(pidOf(packet)) != 0);
    }

    // With the playout's mutex held.
    bool isWithdrawn() const { return m_isWithdrawn; }
    void withdraw() { m_isWithdrawn = true; }

private:
    std::string m_file;
    Mapping m_mapping;
    const uint8_t* m_packets; // in the mapping
    size_t m_count;
    std::unique_ptr<TableInjector> m_injector;
    uint16_t m_pcrPid = kPidNullPacket;
    bool m_isWithdrawn = false; // guarded by the playout's mutex
};

// Sends a stream until it is withdrawn. Playout thread.
class Playout::Run {
public:
    Run(Playout& playout, Stream& stream)
        : m_playout(playout), m_stream(stream), m_due(playout.m_clock.now()) {}

    void send() {
        while (sendFile()) {
        }
    }

private:
    // Sends the file once. False if it was withdrawn.
    bool sendFile() {
        m_frames = FrameCount();
        m_elapsed = 0;
        m_ticksPerPacket = 0;
        size_t at = m_stream.findPcr(0);
        for (size_t index = 0; index < at; ++index) {
            append(index);
        }
        while (at < m_stream.count()) {
            const size_t next = m_stream.findPcr(at + 1);
            if (!sendInterval(at, next)) {
                return false;
            }
            at = next;
        }
        const int64_t byFrames = m_frames.duration();
        const bool isPlausible = byFrames != 0 && std::abs(byFrames - m_elapsed) < kSystemClockFrequency / 2;
        const int64_t duration = isPlausible ? byFrames : m_elapsed;
        m_restamper.repeat(duration);
        // A file whose clock stands still must not be sent without end at one instant.
        m_due += duration > 0 ? durationOf(duration - m_elapsed) : kStep;
        return true;
    }

    // Sends the packets from one PCR to the following one, spread evenly over the time between the two.
    bool sendInterval(size_t begin, size_t end) {
        const int64_t gap = gapBetween(begin, end);
        for (size_t index = begin; index < end; ++index) {
            const double share = static_cast<double>(index - begin) / static_cast<double>(end - begin);
            const Clock::Instant when =
                m_due + durationOf(static_cast<int64_t>(share * static_cast<double>(gap)));
            if (when > m_playout.m_clock.now()) {
                flush();
                if (isWithdrawnAt(std::max(when, m_playout.m_clock.now() + kStep))) {
                    return false;
                }
            }
            if (m_stream.isPcrPid(pidOf(m_stream.packet(index)))) {
                m_frames.add(m_stream.packet(index));
            }
            append(index);
        }
        m_due += durationOf(gap);
        m_elapsed += gap;
        if (m_playout.m_clock.now() - m_due > kMaxDelay) {
            m_due = m_playout.m_clock.now(); // the machine was suspended
        }
        return true;
    }

    // At the end of the file there is no following PCR: the rate of the interval before goes on.
    int64_t gapBetween(size_t begin, size_t end) {
        if (end >= m_stream.count()) {
            return static_cast<int64_t>(m_ticksPerPacket * static_cast<double>(end - begin));
        }
        int64_t gap = *pcrOf(m_stream.packet(end)) - *pcrOf(m_stream.packet(begin));
        gap = gap < 0 ? gap + kPcrPeriod : gap;
        gap = gap > kMaxPcrGap ? kDefaultPcrGap : gap;
        m_ticksPerPacket = static_cast<double>(gap) / static_cast<double>(end - begin);
        return gap;
    }

    void append(size_t index) {
        const uint8_t* packet = m_stream.packet(index);
        if (m_stream.passes(packet)) {
            m_batch.insert(m_batch.end(), packet, packet + kPacketSize);
            m_restamper.restamp(m_batch.data() + m_batch.size() - kPacketSize);
        }
    }

    void flush() {
        if (TableInjector* injector = m_stream.injector()) {
            injector->appendDue(m_playout.m_clock.now(), m_playout.m_clock.utcSeconds(), m_batch);
        }
        if (!m_batch.empty()) {
            m_playout.m_sink(m_batch.data(), m_batch.size());
            m_batch.clear();
        }
    }

    bool isWithdrawnAt(Clock::Instant when) {
        std::unique_lock<std::mutex> lock(m_playout.m_mutex);
        return m_playout.m_clock.waitUntil(lock, m_playout.m_changed, when,
                                           [this] { return m_stream.isWithdrawn(); });
    }

    Playout& m_playout;
    Stream& m_stream;
    Restamper m_restamper;
    FrameCount m_frames;
    Bytes m_batch;               // packets that are due and not sent yet
    Clock::Instant m_due;        // of the packet with the PCR that was reached last
    int64_t m_elapsed = 0;       // 27 MHz, since the first PCR of this repetition
    double m_ticksPerPacket = 0; // between the last two PCRs
};

Playout::Playout(Clock& clock, Sink sink)
    : m_clock(clock), m_sink(std::move(sink)), m_thread(&Playout::run, this) {}

Playout::~Playout() {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_isClosing = true;
        if (m_stream) {
            m_stream->withdraw();
        }
        m_stream.reset();
    }
    m_changed.notify_all();
    m_thread.join();
}

bool Playout::play(const std::string& file, std::unique_ptr<TableInjector> injector, std::string& error) {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (m_stream && m_stream->file() == file) {
            return true;
        }
    }
    stop();
    GError* reason = nullptr;
    Mapping mapping(g_mapped_file_new(file.c_str(), FALSE, &reason));
    if (!mapping) {
        error = reason->message;
        g_error_free(reason);
        return false;
    }
    const auto start =
        findPackets(reinterpret_cast<const uint8_t*>(g_mapped_file_get_contents(mapping.get())),
                    g_mapped_file_get_length(mapping.get()));
    if (!start) {
        error = file + ": not a transport stream";
        return false;
    }
    auto stream = std::make_shared<Stream>(file, std::move(mapping), *start, std::move(injector));
    if (stream->findPcr(0) == stream->count()) {
        error = file + ": no PCR";
        return false;
    }
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_stream = std::move(stream);
    }
    m_changed.notify_all();
    return true;
}

void Playout::stop() {
    std::unique_lock<std::mutex> lock(m_mutex);
    if (m_stream) {
        m_stream->withdraw();
        m_stream.reset();
    }
    m_changed.notify_all();
    m_changed.wait(lock, [this] { return !m_isSending; });
}

void Playout::run() {
    std::unique_lock<std::mutex> lock(m_mutex);
    while (!m_isClosing) {
        if (const std::shared_ptr<Stream> stream = m_stream) {
            m_isSending = true;
            lock.unlock();
            Run(*this, *stream).send();
            lock.lock();
            m_isSending = false;
            m_changed.notify_all();
        } else {
            m_changed.wait(lock);
        }
    }
}

} // namespace desktop
