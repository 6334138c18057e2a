// Measuring at the pad of the sink, where a buffer waits until its time has come.
#include "desktop/platform/SinkTiming.h"

#include <gst/base/gstbasesink.h>

namespace desktop {

namespace {

GstClockTime runningTimeOf(GstPad* pad, const GstBuffer* buffer) {
    GstEvent* event = gst_pad_get_sticky_event(pad, GST_EVENT_SEGMENT, 0);
    if (!event) {
        return GST_CLOCK_TIME_NONE;
    }
    const GstSegment* segment = nullptr;
    gst_event_parse_segment(event, &segment);
    const GstClockTime runningTime =
        gst_segment_to_running_time(segment, GST_FORMAT_TIME, GST_BUFFER_PTS(buffer));
    gst_event_unref(event);
    return runningTime;
}

} // namespace

void SinkTiming::observe(GstElement* sink) {
    m_sink = sink;
    GstPad* pad = gst_element_get_static_pad(sink, "sink");
    gst_pad_add_probe(pad, GST_PAD_PROBE_TYPE_BUFFER, onBuffer, this, nullptr);
    gst_object_unref(pad);
}

GstPadProbeReturn SinkTiming::onBuffer(GstPad* pad, GstPadProbeInfo* info, gpointer timing) {
    auto* self = static_cast<SinkTiming*>(timing);
    const GstClockTime runningTime = runningTimeOf(pad, GST_PAD_PROBE_INFO_BUFFER(info));
    const GstClockTime now = gst_element_get_current_running_time(self->m_sink);
    if (!GST_CLOCK_TIME_IS_VALID(runningTime) || !GST_CLOCK_TIME_IS_VALID(now)) {
        return GST_PAD_PROBE_OK;
    }
    const GstClockTime due = runningTime + gst_base_sink_get_latency(GST_BASE_SINK(self->m_sink));
    return self->onLateness(GST_CLOCK_DIFF(due, now), runningTime);
}

GstPadProbeReturn SinkTiming::onLateness(GstClockTimeDiff lateness, GstClockTime runningTime) {
    if (!m_isStarted) {
        if (!GST_CLOCK_TIME_IS_VALID(m_firstDropped)) {
            m_firstDropped = runningTime;
        }
        const bool isLate = std::chrono::nanoseconds(lateness) > kTolerance;
        const std::chrono::nanoseconds dropped(GST_CLOCK_DIFF(m_firstDropped, runningTime));
        if (isLate && dropped < kMaxDropped) {
            return GST_PAD_PROBE_DROP;
        }
        m_isStarted = true;
    }
    m_lateness = lateness;
    m_hasPresented = true;
    return GST_PAD_PROBE_OK;
}

std::optional<std::chrono::milliseconds> SinkTiming::lateness() const {
    if (!m_hasPresented) {
        return std::nullopt;
    }
    return std::chrono::duration_cast<std::chrono::milliseconds>(std::chrono::nanoseconds(m_lateness));
}

} // namespace desktop
