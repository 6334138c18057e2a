// Play-out: pacing by the clock references of the file, and its repetition.
#include "desktop/platform/HeadEnd.h"

#include "desktop/platform/Sections.h"

#include <algorithm>
#include <chrono>

namespace desktop {

namespace {

using Clock = std::chrono::steady_clock;

constexpr auto step = std::chrono::milliseconds(10);
constexpr int64_t longestGap = clockRate;      // of two clock references in order
constexpr int64_t unknownGap = clockRate / 25; // stands for a gap that makes no sense
constexpr size_t packetsSearched = 40000;      // for the next clock reference

Clock::duration durationOf(int64_t ticks) {
    return std::chrono::duration_cast<Clock::duration>(
        std::chrono::duration<double>(static_cast<double>(ticks) / static_cast<double>(clockRate)));
}

int64_t milliseconds() {
    return g_get_real_time() / 1000;
}

} // namespace

// A file while it is sent.
struct HeadEnd::Stream {
    Stream(std::string name, GMappedFile* mapped, size_t start, std::unique_ptr<Carousel> tables)
        : file(std::move(name)), mapping(mapped),
          packets(reinterpret_cast<const uint8_t*>(g_mapped_file_get_contents(mapped)) + start),
          count((g_mapped_file_get_length(mapped) - start) / packetSize), carousel(std::move(tables)) {}
    ~Stream() { g_mapped_file_unref(mapping); }
    Stream(const Stream&) = delete;
    Stream& operator=(const Stream&) = delete;

    const uint8_t* packet(size_t index) const { return packets + index * packetSize; }

    // The next packet from `from` on with a clock reference of the stream's clock; `count` if there is none
    // near.
    size_t nextReference(size_t from) {
        const size_t end = std::min(count, from + packetsSearched);
        for (size_t index = from; index < end; ++index) {
            const bool isClock = clockPid == nullPid || clockPid == pidOf(packet(index));
            if (isClock && clockReferenceOf(packet(index))) {
                clockPid = pidOf(packet(index));
                return index;
            }
        }
        return count;
    }

    std::string file;
    GMappedFile* mapping;
    const uint8_t* packets;
    size_t count;
    std::unique_ptr<Carousel> carousel;
    uint16_t clockPid = nullPid; // carries the clock by which everything is sent
    bool isWithdrawn = false;    // under the head-end's mutex
};

namespace {

// How long the file lasts by the frames that go with its clock, which meets the next run to the frame.
class FrameCount {
public:
    void see(const uint8_t* packet) {
        const auto time = presentationTimeOf(packet);
        if (!time) {
            return;
        }
        ++m_count;
        m_least = m_count == 1 ? *time : std::min(m_least, *time);
        m_most = std::max(m_most, *time);
    }
    int64_t duration() const { return m_count < 2 ? 0 : (m_most - m_least) * 300 * m_count / (m_count - 1); }

private:
    int64_t m_count = 0;
    int64_t m_least = 0;
    int64_t m_most = 0;
};

} // namespace

HeadEnd::HeadEnd(Sink sink) : m_sink(std::move(sink)), m_thread(&HeadEnd::run, this) {}

HeadEnd::~HeadEnd() {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_ends = true;
        if (m_stream) {
            m_stream->isWithdrawn = true;
        }
        m_stream.reset();
    }
    m_changed.notify_all();
    m_thread.join();
}

bool HeadEnd::play(const std::string& file, std::unique_ptr<Carousel> carousel, std::string& error) {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (m_stream && m_stream->file == file) {
            return true;
        }
    }
    stop();
    GError* reason = nullptr;
    GMappedFile* mapping = g_mapped_file_new(file.c_str(), FALSE, &reason);
    if (!mapping) {
        error = reason->message;
        g_error_free(reason);
        return false;
    }
    const auto start = findPackets(reinterpret_cast<const uint8_t*>(g_mapped_file_get_contents(mapping)),
                                   g_mapped_file_get_length(mapping));
    if (!start) {
        g_mapped_file_unref(mapping);
        error = file + " is no transport stream";
        return false;
    }
    auto stream = std::make_shared<Stream>(file, mapping, *start, std::move(carousel));
    if (stream->nextReference(0) == stream->count) {
        error = file + " has no clock reference";
        return false;
    }
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_stream = std::move(stream);
    }
    m_changed.notify_all();
    return true;
}

void HeadEnd::stop() {
    std::unique_lock<std::mutex> lock(m_mutex);
    if (m_stream) {
        m_stream->isWithdrawn = true;
        m_stream.reset();
    }
    m_changed.notify_all();
    m_changed.wait(lock, [this] { return !m_isSending; });
}

void HeadEnd::run() {
    std::unique_lock<std::mutex> lock(m_mutex);
    while (!m_ends) {
        if (const std::shared_ptr<Stream> stream = m_stream) {
            m_isSending = true;
            lock.unlock();
            send(*stream);
            lock.lock();
            m_isSending = false;
            m_changed.notify_all();
        } else {
            m_changed.wait(lock);
        }
    }
}

void HeadEnd::send(Stream& stream) {
    Restamper restamper;
    Bytes batch;
    const auto withdrawnAt = [&](Clock::time_point when) {
        std::unique_lock<std::mutex> lock(m_mutex);
        return m_changed.wait_until(lock, when, [&] { return stream.isWithdrawn; });
    };
    const auto append = [&](size_t index) {
        const uint8_t* packet = stream.packet(index);
        const bool isSent = packet[0] == packetStart && pidOf(packet) != nullPid &&
                            (!stream.carousel || stream.carousel->sentPids().count(pidOf(packet)) != 0);
        if (isSent) {
            batch.insert(batch.end(), packet, packet + packetSize);
            restamper.restamp(batch.data() + batch.size() - packetSize);
        }
    };
    const auto flush = [&] {
        if (stream.carousel) {
            stream.carousel->appendDue(milliseconds(), batch);
        }
        if (!batch.empty()) {
            m_sink(batch.data(), batch.size());
            batch.clear();
        }
    };

    Clock::time_point due = Clock::now(); // of the packet with the clock reference that was met last
    while (true) {
        FrameCount frames;
        const size_t first = stream.nextReference(0);
        for (size_t index = 0; index < first; ++index) {
            append(index);
        }
        int64_t elapsed = 0; // since the first clock reference of this run
        double rate = 0;     // ticks a packet
        size_t at = first;
        while (at < stream.count) {
            const size_t next = stream.nextReference(at + 1);
            int64_t gap =
                static_cast<int64_t>(rate * static_cast<double>(next - at)); // at the end of the file
            if (next < stream.count) {
                gap = *clockReferenceOf(stream.packet(next)) - *clockReferenceOf(stream.packet(at));
                gap = gap < 0 ? gap + clockPeriod : gap;
                gap = gap > longestGap ? unknownGap : gap;
                rate = static_cast<double>(gap) / static_cast<double>(next - at);
            }
            for (size_t index = at; index < next;) {
                const double share = static_cast<double>(index - at) / static_cast<double>(next - at);
                const Clock::time_point when =
                    due + durationOf(static_cast<int64_t>(share * static_cast<double>(gap)));
                if (when > Clock::now()) {
                    flush();
                    if (withdrawnAt(std::max(when, Clock::now() + step))) {
                        return;
                    }
                }
                if (pidOf(stream.packet(index)) == stream.clockPid) {
                    frames.see(stream.packet(index));
                }
                append(index++);
            }
            due += durationOf(gap);
            elapsed += gap;
            if (Clock::now() - due > std::chrono::seconds(1)) {
                due = Clock::now(); // the machine was asleep: no catching up
            }
            at = next;
        }
        const int64_t byFrames = frames.duration();
        const bool agrees = byFrames != 0 && std::abs(byFrames - elapsed) < clockRate / 2;
        due += durationOf(agrees ? byFrames - elapsed : 0);
        restamper.repeat(agrees ? byFrames : elapsed);
    }
}

} // namespace desktop
