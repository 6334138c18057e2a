// Pacing by the PCR of the file, and its repetition.
#include "desktop/platform/Playout.h"

#include <algorithm>
#include <array>
#include <chrono>

#include "desktop/platform/RegularFile.h"
#include "desktop/platform/Restamper.h"
#include "desktop/platform/Sections.h"

namespace desktop {

namespace {

constexpr auto kStep = std::chrono::milliseconds(10); // packets are sent in steps of this length, at least
constexpr auto kMaxDelay = std::chrono::seconds(1);   // beyond that, playout does not catch up
constexpr int64_t kMaxPcrGap = kSystemClockFrequency; // between two PCRs in a row
constexpr int64_t kDefaultPcrGap = kSystemClockFrequency / 25; // instead of a gap that is longer or negative
constexpr size_t kPacketsSearched = 40000;                     // for the following PCR
constexpr size_t kPacketsRead = 1024;                          // at once
constexpr auto kRetryInterval = std::chrono::seconds(1);       // while the file has no PCR any more

Clock::Duration durationOf(int64_t ticks) {
    return std::chrono::duration_cast<Clock::Duration>(std::chrono::duration<double>(
        static_cast<double>(ticks) / static_cast<double>(kSystemClockFrequency)));
}

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

// A file that is played out. It may be written to meanwhile: the same packet may differ when it is read
// again.
class Playout::Stream {
public:
    Stream(std::string name, std::unique_ptr<RegularFile> file, std::unique_ptr<TableInjector> injector)
        : m_name(std::move(name)), m_file(std::move(file)), m_injector(std::move(injector)) {}

    // Looks for the packets that the file has now. False, with nothing to play out, if it has none.
    bool rewind() {
        readWindow(0);
        const auto start = findPackets(m_window.data(), m_window.size());
        m_start = start.value_or(0);
        const uint64_t size = m_file->size();
        m_count = start && size > m_start ? (size - m_start) / kPacketSize : 0;
        m_window.clear();
        m_pcrPid = kPidNullPacket;
        return start.has_value();
    }

    const std::string& name() const { return m_name; }
    size_t count() const { return m_count; }

    // A null packet if the file has become shorter.
    const uint8_t* packet(size_t index) {
        if (index < m_windowBegin || index >= m_windowBegin + m_window.size() / kPacketSize) {
            m_windowBegin = index;
            readWindow(m_start + index * kPacketSize);
        }
        const size_t at = (index - m_windowBegin) * kPacketSize;
        return at + kPacketSize <= m_window.size() ? m_window.data() + at : kNullPacket.data();
    }

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
    static constexpr std::array<uint8_t, kPacketSize> kNullPacket{kSyncByte, kPidNullPacket >> 8,
                                                                  kPidNullPacket & 0xFF, kPayloadFlag};

    void readWindow(uint64_t offset) {
        m_window.resize(kPacketsRead * kPacketSize);
        m_window.resize(m_file->read(m_window.data(), m_window.size(), offset));
    }

    std::string m_name;
    std::unique_ptr<RegularFile> m_file;
    size_t m_start = 0;       // bytes before the first packet
    size_t m_count = 0;       // of packets when the file was last rewound
    Bytes m_window;           // packets that have been read
    size_t m_windowBegin = 0; // index of the first of them
    std::unique_ptr<TableInjector> m_injector;
    uint16_t m_pcrPid = kPidNullPacket;
    bool m_isWithdrawn = false; // guarded by the playout's mutex
};

// Sends a stream until it is withdrawn. Playout thread.
class Playout::Run {
public:
    Run(Playout& playout, Stream& stream)
        : m_playout(playout), m_stream(stream), m_due(playout.m_clock.now() - kHeadStart) {}

    void send() {
        while (sendFile()) {
        }
    }

private:
    // Sends the file once. False if it was withdrawn.
    bool sendFile() {
        if (!m_stream.rewind() || m_stream.findPcr(0) == m_stream.count()) {
            return !isWithdrawnAt(m_playout.m_clock.now() + kRetryInterval);
        }
        m_frames = FrameCount();
        m_elapsed = 0;
        m_ticksPerPacket = 0;
        size_t at = m_stream.findPcr(0);
        for (size_t index = 0; index < at; ++index) {
            append(index, m_due);
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
            const bool isEarly = when > m_playout.m_clock.now();
            if (isEarly || (!m_batch.empty() && when - m_batchDue >= kStep)) {
                flush();
            }
            if (isEarly && isWithdrawnAt(std::max(when, m_playout.m_clock.now() + kStep))) {
                return false;
            }
            if (m_stream.isPcrPid(pidOf(m_stream.packet(index)))) {
                m_frames.add(m_stream.packet(index));
            }
            append(index, when);
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
        const auto last = pcrOf(m_stream.packet(end));
        const auto first = pcrOf(m_stream.packet(begin));
        int64_t gap = last && first ? *last - *first : kDefaultPcrGap; // the file may have been overwritten
        gap = gap < 0 ? gap + kPcrPeriod : gap;
        gap = gap > kMaxPcrGap ? kDefaultPcrGap : gap;
        m_ticksPerPacket = static_cast<double>(gap) / static_cast<double>(end - begin);
        return gap;
    }

    void append(size_t index, Clock::Instant due) {
        const uint8_t* packet = m_stream.packet(index);
        if (m_stream.passes(packet)) {
            m_batchDue = m_batch.empty() ? due : m_batchDue;
            m_batch.insert(m_batch.end(), packet, packet + kPacketSize);
            m_restamper.restamp(m_batch.data() + m_batch.size() - kPacketSize);
        }
    }

    void flush() {
        const Clock::Instant now = m_playout.m_clock.now();
        const Clock::Duration age = m_batch.empty() ? Clock::Duration::zero() : now - m_batchDue;
        if (TableInjector* injector = m_stream.injector()) {
            injector->appendDue(now, m_playout.m_clock.utcSeconds(), m_batch);
        }
        if (!m_batch.empty()) {
            m_playout.m_sink(m_batch.data(), m_batch.size(), age);
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
    Clock::Instant m_batchDue;   // of the first of them
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
        if (m_stream && m_stream->name() == file) {
            return true;
        }
    }
    stop();
    std::string reason;
    auto opened = RegularFile::open(file, reason);
    if (!opened) {
        error = file + ": " + reason;
        return false;
    }
    auto stream = std::make_shared<Stream>(file, std::move(opened), std::move(injector));
    if (!stream->rewind()) {
        error = file + ": not a transport stream";
        return false;
    }
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
