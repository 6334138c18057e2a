// The video plane.
#include <gst/app/gstappsrc.h>
#include <gtest/gtest.h>

#include <atomic>

#include "desktop/platform/Picture.h"
#include "desktop/platform/Platform.h"
#include "tests/desktop/Received.h"

using namespace desktop;

namespace {

constexpr gsize kFrameSize = 16 * 16 * 4;

uint64_t shownFrames(Picture& picture) {
    telix_desktop_frame frame{};
    picture.acquireFrame(frame);
    const uint64_t serial = frame.visible != 0 ? frame.serial : 0;
    telix_desktop_release_frame(&frame);
    return serial;
}

// Live, and playing from the start: as soon as it is decoded, a viewer sees what a tune has found.
TEST(PictureTest, ShowsTheFirstFrameOfALivePipelineBeforeItsTime) {
    Picture& picture = Platform::instance().picture(); // initialises GStreamer
    std::atomic<int> firstFrames{0};
    const Picture::Token token = picture.acquire({}, nullptr, [&] { ++firstFrames; });
    GstElement* pipeline = gst_pipeline_new(nullptr);
    GstElement* source = gst_element_factory_make("appsrc", nullptr);
    GstElement* sink = picture.makeSink(token);
    gst_bin_add_many(GST_BIN(pipeline), source, sink, nullptr);
    GstCaps* caps = gst_caps_from_string("video/x-raw,format=BGRx,width=16,height=16,framerate=25/1");
    g_object_set(source, "caps", caps, "format", GST_FORMAT_TIME, "is-live", TRUE, nullptr);
    gst_caps_unref(caps);
    ASSERT_TRUE(gst_element_link(source, sink));
    gst_element_set_state(pipeline, GST_STATE_PLAYING);
    for (const GstClockTime time : {3600 * GST_SECOND, 3601 * GST_SECOND}) {
        GstBuffer* buffer = gst_buffer_new_allocate(nullptr, kFrameSize, nullptr);
        GST_BUFFER_PTS(buffer) = time;
        gst_app_src_push_buffer(GST_APP_SRC(source), buffer);
    }
    EXPECT_TRUE(waitUntil([&] { return firstFrames == 1; }));
    EXPECT_EQ(shownFrames(picture), 1U);
    gst_element_set_state(pipeline, GST_STATE_NULL);
    gst_object_unref(pipeline);
    picture.release(token);
}

TEST(PictureTest, TellsTheWindowWhenSomethingElseIsToBeSeen) {
    Picture& picture = Platform::instance().picture();
    std::atomic<int> wakeups{0};
    picture.setWakeup([](void* count) { ++*static_cast<std::atomic<int>*>(count); }, &wakeups);
    const Picture::Token token = picture.acquire({}, nullptr, nullptr);
    EXPECT_EQ(wakeups, 1);
    Picture::View view;
    view.width = 640;
    picture.setView(token, view);
    EXPECT_EQ(wakeups, 2);
    picture.setHidden(token, true);
    EXPECT_EQ(wakeups, 3);
    picture.setHidden(token, true); // as it was
    EXPECT_EQ(wakeups, 3);
    EXPECT_TRUE(picture.release(token));
    EXPECT_EQ(wakeups, 4);
    EXPECT_FALSE(picture.release(token)); // of nothing
    picture.setView(token, view);
    EXPECT_EQ(wakeups, 4);
    picture.setWakeup(nullptr, nullptr);
}

} // namespace
