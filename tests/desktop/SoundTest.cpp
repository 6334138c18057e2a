// What is heard, as the window gets it.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <mutex>
#include <vector>

#include "desktop/platform/Platform.h"
#include "desktop/platform/SoundTap.h"
#include "desktop/platform/telix_sound.h"
#include "telix/telix_platform.h"
#include "tests/desktop/Received.h"

using namespace desktop;

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

// A sink that gets what the test pushes, as from the element before it.
class TappedSink {
public:
    // GStreamer must be initialised.
    TappedSink() {
        gst_object_ref_sink(m_sink);
        g_object_set(m_sink, "async", FALSE, nullptr);
        GstClock* clock = gst_system_clock_obtain();
        gst_element_set_clock(m_sink, clock);
        gst_object_unref(clock);
        tapSound(m_sink);
        GstPad* sinkPad = gst_element_get_static_pad(m_sink, "sink");
        gst_pad_link(m_source, sinkPad);
        gst_object_unref(sinkPad);
        gst_pad_set_active(m_source, TRUE);
        gst_element_set_state(m_sink, GST_STATE_PLAYING);
        push(gst_event_new_stream_start("test"));
        GstCaps* caps = gst_caps_from_string(
            "audio/x-raw,format=S16LE,rate=48000,channels=2,layout=interleaved,channel-mask=(bitmask)3");
        push(gst_event_new_caps(caps));
        gst_caps_unref(caps);
        pushSegment();
    }
    ~TappedSink() {
        gst_element_set_state(m_sink, GST_STATE_NULL);
        gst_object_unref(m_sink);
        gst_object_unref(m_source);
    }
    TappedSink(const TappedSink&) = delete;
    TappedSink& operator=(const TappedSink&) = delete;

    void push(GstEvent* event) { EXPECT_TRUE(gst_pad_push_event(m_source, event)); }
    void pushSegment() {
        GstSegment segment;
        gst_segment_init(&segment, GST_FORMAT_TIME);
        push(gst_event_new_segment(&segment));
    }
    void pushSound(size_t frames) {
        GstBuffer* buffer = gst_buffer_new_allocate(nullptr, frames * 2 * sizeof(int16_t), nullptr);
        gst_buffer_memset(buffer, 0, 0, frames * 2 * sizeof(int16_t));
        GST_BUFFER_PTS(buffer) = 0;
        EXPECT_EQ(gst_pad_push(m_source, buffer), GST_FLOW_OK);
    }

private:
    GstPad* m_source = gst_pad_new("src", GST_PAD_SRC);
    GstElement* m_sink = gst_element_factory_make("fakesink", nullptr);
};

TEST(SoundTapTest, LeavesOutWhatASeekHasDropped) {
    Platform::instance(); // initialises GStreamer
    TappedSink sink;
    std::vector<uint32_t> heard; // frames
    telix_desktop_set_sound_listener(
        [](const telix_desktop_sound* sound, void* data) {
            static_cast<std::vector<uint32_t>*>(data)->push_back(sound->frames);
        },
        &heard);
    sink.pushSound(10);
    EXPECT_EQ(heard, std::vector<uint32_t>{}); // before the next piece comes
    sink.pushSound(20);
    EXPECT_EQ(heard, std::vector<uint32_t>{10});
    sink.push(gst_event_new_flush_start());
    sink.push(gst_event_new_flush_stop(TRUE));
    sink.pushSegment();
    sink.pushSound(30);
    sink.push(gst_event_new_eos());
    EXPECT_EQ(heard, (std::vector<uint32_t>{10, 30}));
    telix_desktop_set_sound_listener(nullptr, nullptr);
}

} // namespace
