// What is heard, as the window gets it.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <mutex>
#include <vector>

#include "desktop/platform/Platform.h"
#include "desktop/platform/telix_sound.h"
#include "telix/telix_platform.h"
#include "tests/desktop/Received.h"

namespace {

constexpr int64_t kSecond = 1000000000;

struct Piece {
    std::vector<int16_t> samples;
    int64_t time;
    int64_t received;

    size_t frames() const { return samples.size() / 2; }
    int loudest() const {
        int loudest = 0;
        for (const int16_t sample : samples) {
            loudest = std::max(loudest, std::abs(int{sample}));
        }
        return loudest;
    }
};

class SoundTest : public testing::Test {
protected:
    void SetUp() override {
        TELIX_JS_VB_GetHandle(&m_object);
        ASSERT_EQ(TELIX_JS_VB_SetChannel(m_object, 1, 0), 0);
    }
    void TearDown() override {
        telix_desktop_set_sound_listener(nullptr, nullptr);
        TELIX_JS_VB_Release(m_object);
    }

    void listen() { telix_desktop_set_sound_listener(onSound, this); }

    std::vector<Piece> pieces() {
        std::lock_guard<std::mutex> lock(m_mutex);
        return m_pieces;
    }

    // The frames that have been received.
    size_t frames() {
        size_t frames = 0;
        for (const Piece& each : pieces()) {
            frames += each.frames();
        }
        return frames;
    }

    TELIX_JS_VB_HANDLE m_object = 0;

private:
    static void onSound(const telix_desktop_sound* sound, void* data) {
        auto* test = static_cast<SoundTest*>(data);
        std::lock_guard<std::mutex> lock(test->m_mutex);
        test->m_pieces.push_back({{sound->samples, sound->samples + size_t{2} * sound->frames},
                                  sound->time,
                                  g_get_monotonic_time() * 1000});
    }

    std::mutex m_mutex;
    std::vector<Piece> m_pieces;
};

TEST_F(SoundTest, ReachesTheListenerPieceByPieceWithTheTimeAtWhichItIsHeard) {
    listen();
    ASSERT_TRUE(waitUntil([&] { return frames() > size_t{2} * TELIX_DESKTOP_SOUND_RATE; }));
    const std::vector<Piece> all = pieces();
    int loudest = 0;
    int64_t heard = 0; // frames before the last piece
    for (size_t index = 0; index < all.size(); ++index) {
        loudest = std::max(loudest, all[index].loudest());
        EXPECT_LT(std::abs(all[index].time - all[index].received), 10 * kSecond);
        if (index > 0) {
            EXPECT_GT(all[index].time, all[index - 1].time);
            heard += static_cast<int64_t>(all[index - 1].frames());
        }
    }
    EXPECT_GT(loudest, 500);
    // As much sound as time, whatever the load of the machine has left out.
    const auto time = all.back().time - all.front().time;
    EXPECT_LE(heard * kSecond / TELIX_DESKTOP_SOUND_RATE, time + kSecond / 10);
}

TEST_F(SoundTest, IsHeardByNobodyOnceTheListenerIsRemoved) {
    listen();
    ASSERT_TRUE(waitUntil([&] { return frames() > 0; }));
    telix_desktop_set_sound_listener(nullptr, nullptr);
    const size_t before = frames();
    g_usleep(300000);
    EXPECT_EQ(frames(), before);
}

TEST_F(SoundTest, EndsWithTheBroadcast) {
    listen();
    ASSERT_TRUE(waitUntil([&] { return frames() > 0; }));
    TELIX_JS_VB_Release(m_object);
    size_t before = 0;
    EXPECT_TRUE(waitUntil([&] { // what is on its way arrives before
        const size_t last = std::exchange(before, frames());
        g_usleep(300000);
        return last == frames();
    }));
    TELIX_JS_VB_GetHandle(&m_object);
}

} // namespace
