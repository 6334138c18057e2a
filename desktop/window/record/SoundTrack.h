// The sound of a recording as one track without gaps.
#ifndef TELIX_DESKTOP_WINDOW_RECORD_SOUNDTRACK_H
#define TELIX_DESKTOP_WINDOW_RECORD_SOUNDTRACK_H

#include <cstdint>
#include <vector>

#include "desktop/platform/telix_sound.h"

namespace desktop {

// Frames have a number from the start of the track. For one thread.
class SoundTrack {
public:
    // The track starts at that time, in nanoseconds of CLOCK_MONOTONIC.
    explicit SoundTrack(int64_t start) : m_start(start) {}

    // Places a piece at its time, over what is there. A piece follows the one before without a gap if their
    // times differ by no more than the jitter of clocks. What lies before the frames that have been taken, or
    // far ahead of them, is dropped.
    void add(const telix_desktop_sound& sound);

    // The number of the first frame that take() returns.
    int64_t taken() const { return m_taken; }

    // Takes the samples up to a time, with silence where there is no sound; empty if they have been taken.
    std::vector<int16_t> take(int64_t until);

private:
    int64_t frameAt(int64_t time) const;

    int64_t m_start;
    int64_t m_taken = 0;            // frames
    int64_t m_end = -1;             // the frame after the last piece; negative: there is none
    std::vector<int16_t> m_samples; // from the frame `m_taken` on
};

} // namespace desktop

#endif
