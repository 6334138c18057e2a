// The sound of a recording: pieces at their times, silence between them.
#include "desktop/window/record/SoundTrack.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <limits>

using namespace desktop;
using testing::Each;
using testing::IsEmpty;
using testing::SizeIs;

namespace {

constexpr int64_t kSecond = 1000000000;
constexpr int64_t kStart = 5000 * kSecond;
constexpr size_t kRate = TELIX_DESKTOP_SOUND_RATE;

// A piece of that many frames, whose samples all have that value.
class Piece {
public:
    Piece(int64_t time, size_t frames, int16_t value) : m_samples(2 * frames, value), m_time(time) {}
    operator telix_desktop_sound() const {
        return {m_samples.data(), static_cast<uint32_t>(m_samples.size() / 2), m_time};
    }

private:
    std::vector<int16_t> m_samples;
    int64_t m_time;
};

class SoundTrackTest : public testing::Test {
protected:
    // The left samples up to a time after the start.
    std::vector<int16_t> take(int64_t time) {
        std::vector<int16_t> left;
        const std::vector<int16_t> samples = m_track.take(kStart + time);
        for (size_t index = 0; index < samples.size(); index += 2) {
            EXPECT_EQ(samples[index], samples[index + 1]);
            left.push_back(samples[index]);
        }
        return left;
    }

    SoundTrack m_track{kStart};
};

TEST_F(SoundTrackTest, IsSilentWhereThereIsNoSound) {
    const auto samples = take(kSecond / 2);
    EXPECT_THAT(samples, SizeIs(kRate / 2));
    EXPECT_THAT(samples, Each(0));
    EXPECT_EQ(m_track.taken(), static_cast<int64_t>(kRate / 2));
    EXPECT_THAT(take(kSecond / 2), IsEmpty());
    EXPECT_THAT(take(kSecond / 4), IsEmpty());
}

TEST_F(SoundTrackTest, HasEachPieceAtItsTime) {
    m_track.add(Piece(kStart + kSecond / 4, kRate / 4, 7));
    m_track.add(Piece(kStart + kSecond, 10, 8));
    auto samples = take(2 * kSecond);
    ASSERT_THAT(samples, SizeIs(2 * kRate));
    EXPECT_EQ(samples[kRate / 4 - 1], 0);
    EXPECT_EQ(samples[kRate / 4], 7);
    EXPECT_EQ(samples[kRate / 2 - 1], 7);
    EXPECT_EQ(samples[kRate / 2], 0);
    EXPECT_EQ(samples[kRate - 1], 0);
    EXPECT_EQ(samples[kRate], 8);
    EXPECT_EQ(samples[kRate + 10], 0);
}

TEST_F(SoundTrackTest, JoinsPiecesWhoseTimesDifferByTheJitterOfAClock) {
    m_track.add(Piece(kStart, 480, 1));
    m_track.add(Piece(kStart + 12 * kSecond / 1000, 480, 2)); // 2 ms late
    m_track.add(Piece(kStart + 19 * kSecond / 1000, 480, 3)); // 1 ms early
    m_track.add(Piece(kStart + 60 * kSecond / 1000, 480, 4)); // a gap of 30 ms
    const auto samples = take(kSecond / 10);
    EXPECT_EQ(samples[479], 1);
    EXPECT_EQ(samples[480], 2);
    EXPECT_EQ(samples[959], 2);
    EXPECT_EQ(samples[960], 3);
    EXPECT_EQ(samples[1440], 0);
    EXPECT_EQ(samples[2880], 4);
}

TEST_F(SoundTrackTest, KeepsItsPlaceWhatHasBeenTakenBefore) {
    m_track.add(Piece(kStart + kSecond, kRate, 5));
    EXPECT_EQ(take(kSecond + kSecond / 2).back(), 5);
    const auto rest = take(3 * kSecond);
    ASSERT_THAT(rest, SizeIs(kRate + kRate / 2));
    EXPECT_EQ(rest[0], 5);
    EXPECT_EQ(rest[kRate / 2 - 1], 5);
    EXPECT_EQ(rest[kRate / 2], 0);
}

TEST_F(SoundTrackTest, DropsOfALatePieceWhatHasBeenTaken) {
    take(kSecond);
    m_track.add(Piece(kStart + kSecond / 2, kRate, 6)); // half of it is too late
    m_track.add(Piece(kStart, 100, 9));                 // all of it
    const auto samples = take(2 * kSecond);
    EXPECT_EQ(samples[0], 6);
    EXPECT_EQ(samples[kRate / 2 - 1], 6);
    EXPECT_EQ(samples[kRate / 2], 0);
}

TEST_F(SoundTrackTest, IgnoresTimesThatCannotBe) {
    for (const int64_t time : {std::numeric_limits<int64_t>::min(), int64_t{0}, kStart - 100 * kSecond,
                               kStart + 100 * kSecond, std::numeric_limits<int64_t>::max()}) {
        m_track.add(Piece(time, 100, 9));
    }
    EXPECT_THAT(take(kSecond), Each(0));
}

} // namespace
