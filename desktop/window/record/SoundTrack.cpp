// The sound of a recording as one track without gaps.
#include "desktop/window/record/SoundTrack.h"

#include <algorithm>
#include <cstddef>
#include <cstdlib>

namespace desktop {

namespace {

constexpr int64_t kRate = TELIX_DESKTOP_SOUND_RATE;
constexpr int64_t kChannels = TELIX_DESKTOP_SOUND_CHANNELS;
constexpr int64_t kNanoseconds = 1000000000; // in a second
constexpr int64_t kJitter = kRate / 50;      // frames
constexpr int64_t kFarthest = 10 * kRate;    // frames after those that have been taken

} // namespace

// Split, so that no recording is too long for the numbers.
int64_t SoundTrack::frameAt(int64_t time) const {
    const int64_t elapsed = time - m_start;
    return elapsed / kNanoseconds * kRate + elapsed % kNanoseconds * kRate / kNanoseconds;
}

void SoundTrack::add(const telix_desktop_sound& sound) {
    // Compared as times, because a wrong one must not overflow.
    const int64_t now = m_start + m_taken / kRate * kNanoseconds;
    const int64_t farthest = kFarthest / kRate * kNanoseconds;
    if (sound.time < now - farthest || sound.time > now + farthest || sound.frames > kFarthest) {
        return;
    }
    int64_t first = frameAt(sound.time);
    if (m_end >= 0 && std::abs(first - m_end) <= kJitter) {
        first = m_end;
    }
    m_end = first + sound.frames;
    const int64_t skipped = std::min<int64_t>(std::max<int64_t>(m_taken - first, 0), sound.frames);
    if (skipped == sound.frames) {
        return;
    }
    m_samples.resize(std::max(m_samples.size(), static_cast<size_t>((m_end - m_taken) * kChannels)));
    std::copy(sound.samples + skipped * kChannels, sound.samples + sound.frames * kChannels,
              m_samples.begin() + static_cast<ptrdiff_t>((first + skipped - m_taken) * kChannels));
}

std::vector<int16_t> SoundTrack::take(int64_t until) {
    const int64_t frames = std::max<int64_t>(frameAt(until) - m_taken, 0);
    const auto count = static_cast<size_t>(frames * kChannels);
    m_samples.resize(std::max(m_samples.size(), count));
    const auto end = m_samples.begin() + static_cast<ptrdiff_t>(count);
    std::vector<int16_t> taken(m_samples.begin(), end);
    m_samples.erase(m_samples.begin(), end);
    m_taken += frames;
    return taken;
}

} // namespace desktop
