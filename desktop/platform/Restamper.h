// Makes the repetitions of a transport stream file one stream without a seam: clock references, time stamps
// and continuity counters run on.
#ifndef TELIX_DESKTOP_RESTAMPER_H
#define TELIX_DESKTOP_RESTAMPER_H

#include <cstdint>
#include <map>
#include <optional>

namespace desktop {

// Time is counted in ticks of the stream's clock of 27 MHz and wraps as the stream's does.
constexpr int64_t clockRate = 27000000;
constexpr int64_t clockPeriod = (int64_t{1} << 33) * 300;

// The clock reference that a packet carries.
std::optional<int64_t> clockReferenceOf(const uint8_t* packet);

// The presentation time stamp of a packet in which an elementary stream's packet begins, in ticks of 90 kHz.
std::optional<int64_t> presentationTimeOf(const uint8_t* packet);

class Restamper {
public:
    // The file starts anew, and its times are moved by `ticks` more, which are rounded to those of time
    // stamps.
    void repeat(int64_t ticks);

    // Changes one packet of the file.
    void restamp(uint8_t* packet);

    int64_t shift() const { return m_shift; }

private:
    struct Counter {
        uint8_t offset = 0;
        uint8_t last = 0;
        bool isFresh = false; // no packet since the file started anew
    };

    int64_t m_shift = 0;
    std::map<uint16_t, Counter> m_counters;
};

} // namespace desktop

#endif
