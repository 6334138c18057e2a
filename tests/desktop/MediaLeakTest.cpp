// What playback leaves behind: GStreamer's tracer of leaks reports the elements that are made and freed.
#include <gst/gst.h>

#include "tests/desktop/MediaTest.h"

namespace {

class MediaLeakTest : public MediaTest {
protected:
    MediaLeakTest() { setenv("GST_TRACERS", "leaks", 1); } // before the library initialises GStreamer

    void SetUp() override {
        MediaTest::SetUp();
        flushPlatformThread();
        m_tracers = gst_tracing_get_active_tracers();
        ASSERT_TRUE(m_tracers);
        g_signal_emit_by_name(m_tracers->data, "activity-start-tracking");
    }

    void TearDown() override {
        g_list_free_full(m_tracers, gst_object_unref);
        MediaTest::TearDown();
    }

    // The elements made since SetUp() that are alive.
    int liveElements() {
        GstStructure* activity = nullptr; // since the last one
        g_signal_emit_by_name(m_tracers->data, "activity-get-checkpoint", &activity);
        m_made += elementsIn(gst_structure_get_value(activity, "objects-created-list"));
        m_freed += elementsIn(gst_structure_get_value(activity, "objects-removed-list"));
        gst_structure_free(activity);
        return m_made - m_freed;
    }

private:
    static int elementsIn(const GValue* objects) {
        int elements = 0;
        for (guint index = 0; index < gst_value_list_get_size(objects); ++index) {
            const GstStructure* each = gst_value_get_structure(gst_value_list_get_value(objects, index));
            elements +=
                g_type_is_a(g_type_from_name(gst_structure_get_string(each, "type-name")), GST_TYPE_ELEMENT);
        }
        return elements;
    }

    GList* m_tracers = nullptr;
    int m_made = 0;
    int m_freed = 0;
};

TEST_F(MediaLeakTest, AClipThatHasEndedLeavesNoElement) {
    play(file("clip.mp4"));
    EXPECT_GT(liveElements(), 10); // of the pipeline
    ASSERT_EQ(TELIX_JS_AV_Stop(m_player), 0);
    flushPlatformThread();
    EXPECT_TRUE(waitUntil([this] { return liveElements() == 0; })) << liveElements() << " are alive";
}

} // namespace
