// Joins the repetitions of a transport stream file without a seam: PCR, PTS, DTS and continuity counters
// continue where the preceding repetition ended.
#ifndef TELIX_DESKTOP_PLATFORM_RESTAMPER_H
#define TELIX_DESKTOP_PLATFORM_RESTAMPER_H

#include <cstdint>
#include <map>
#include <optional>

namespace desktop {

// The PCR of a packet, in ticks of 27 MHz; nothing if it has none.
std::optional<int64_t> pcrOf(const uint8_t* packet);

// The PTS of a packet in which a PES packet begins, in ticks of 90 kHz; nothing if it has none.
std::optional<int64_t> ptsOf(const uint8_t* packet);

class Restamper {
public:
    // The file starts again. All times in it are shifted by `ticks` of 27 MHz more, rounded down to ticks of
    // 90 kHz, so that PCR and PTS shift alike.
    void repeat(int64_t ticks);

    // Changes one packet of the file in place.
    void restamp(uint8_t* packet);

    int64_t shift() const { return m_shift; }

private:
    struct Counter {
        uint8_t offset = 0;
        uint8_t last = 0;
        bool isRestarted = false; // no packet of the PID since the file started again
    };

    void restampContinuity(uint8_t* packet);
    void restampPcr(uint8_t* packet) const;
    void restampPes(uint8_t* packet) const;

    int64_t m_shift = 0;
    std::map<uint16_t, Counter> m_counters; // by PID
};

} // namespace desktop

#endif
