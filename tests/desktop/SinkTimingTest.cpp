// The beginning of a sink whose first buffers are late.
#include <gst/app/gstappsrc.h>
#include <gtest/gtest.h>

#include <atomic>

#include "desktop/platform/Platform.h"
#include "desktop/platform/SinkTiming.h"
#include "tests/desktop/Received.h"

using namespace desktop;

namespace {

constexpr GstClockTime kStep = 20 * GST_MSECOND;
constexpr GstClockTime kAge = GST_SECOND; // running time at the start
constexpr unsigned int kBuffers = 120;    // 2.4 seconds

// A pipeline whose running time begins at `age`, and the time of the first buffer that its sink presents.
class LatePipeline {
public:
    explicit LatePipeline(SinkTiming::LateStart lateStart, GstClockTime age = kAge) : m_timing(lateStart) {
        Platform::instance(); // initialises GStreamer
        m_pipeline =
            gst_parse_launch("appsrc name=source is-live=true format=time caps=audio/x-raw ! fakesink "
                             "name=sink sync=true signal-handoffs=true",
                             nullptr);
        GstElement* sink = gst_bin_get_by_name(GST_BIN(m_pipeline), "sink");
        m_timing.observe(sink);
        const auto onHandoff = +[](GstElement*, GstBuffer* buffer, GstPad*, gpointer self) {
            auto* pipeline = static_cast<LatePipeline*>(self);
            GstClockTime none = GST_CLOCK_TIME_NONE;
            pipeline->m_first.compare_exchange_strong(none, GST_BUFFER_PTS(buffer));
            pipeline->m_last = GST_BUFFER_PTS(buffer);
        };
        g_signal_connect(sink, "handoff", G_CALLBACK(onHandoff), this);
        gst_object_unref(sink);
        gst_element_set_state(m_pipeline, GST_STATE_PAUSED);
        gst_element_set_start_time(m_pipeline, age);
        gst_element_set_state(m_pipeline, GST_STATE_PLAYING);
        GstElement* source = gst_bin_get_by_name(GST_BIN(m_pipeline), "source");
        for (unsigned int index = 0; index < kBuffers; ++index) {
            GstBuffer* buffer = gst_buffer_new_allocate(nullptr, 4, nullptr);
            GST_BUFFER_PTS(buffer) = index * kStep;
            gst_app_src_push_buffer(GST_APP_SRC(source), buffer);
        }
        gst_object_unref(source);
    }
    ~LatePipeline() {
        gst_element_set_state(m_pipeline, GST_STATE_NULL);
        gst_object_unref(m_pipeline);
    }
    LatePipeline(const LatePipeline&) = delete;
    LatePipeline& operator=(const LatePipeline&) = delete;

    bool waitForLast() {
        return waitUntil([this] { return m_last == (kBuffers - 1) * kStep; });
    }
    GstClockTime first() const { return m_first; }
    const SinkTiming& timing() const { return m_timing; }

private:
    SinkTiming m_timing;
    GstElement* m_pipeline = nullptr;
    std::atomic<GstClockTime> m_first{GST_CLOCK_TIME_NONE};
    std::atomic<GstClockTime> m_last{0};
};

TEST(SinkTimingTest, LeavesOutTheSoundThatIsTooLate) {
    LatePipeline pipeline(SinkTiming::LateStart::Drop);
    ASSERT_TRUE(pipeline.waitForLast());
    EXPECT_GE(pipeline.first(), kAge - 2 * kStep); // later if the machine is slow
    ASSERT_TRUE(pipeline.timing().lateness());
}

TEST(SinkTimingTest, PresentsSoundThatNeverCatchesUp) {
    LatePipeline pipeline(SinkTiming::LateStart::Drop, 3600 * GST_SECOND);
    ASSERT_TRUE(pipeline.waitForLast());
    EXPECT_EQ(pipeline.first(), 2 * GST_SECOND);
}

TEST(SinkTimingTest, PresentsLatePicturesAtOnce) {
    LatePipeline pipeline(SinkTiming::LateStart::Present);
    ASSERT_TRUE(pipeline.waitForLast());
    EXPECT_EQ(pipeline.first(), 0U);
}

} // namespace
