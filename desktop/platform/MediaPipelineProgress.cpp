// Position and duration, which part of the media is buffered, and what is played.
#include "desktop/platform/MediaPipeline.h"

#include <algorithm>

namespace desktop {

MediaPipeline::Progress MediaPipeline::progress() {
    gint64 value = 0;
    if (!isSeeking() && gst_element_query_position(m_playbin, GST_FORMAT_TIME, &value) && value >= 0) {
        m_position = static_cast<uint32_t>(value / GST_MSECOND);
    }
    if (gst_element_query_duration(m_playbin, GST_FORMAT_TIME, &value) && value > 0) {
        m_duration = static_cast<uint32_t>(value / GST_MSECOND);
        m_position = std::min(m_position, m_duration);
    }
    Progress progress;
    progress.position = m_position;
    progress.duration = m_duration;
    if (m_source.isNetwork && m_duration > 0) {
        readBufferedRanges(progress);
    }
    return progress;
}

// Reports the range around the position; without one, nothing is buffered at the position.
void MediaPipeline::readBufferedRanges(Progress& progress) {
    GstQuery* query = gst_query_new_buffering(GST_FORMAT_PERCENT);
    if (gst_element_query(m_playbin, query)) {
        const double millisecondsPerUnit = static_cast<double>(m_duration) / GST_FORMAT_PERCENT_MAX;
        const guint count = gst_query_get_n_buffering_ranges(query);
        for (guint index = 0; index < count; ++index) {
            gint64 start = 0;
            gint64 stop = 0;
            gst_query_parse_nth_buffering_range(query, index, &start, &stop);
            const double startTime = static_cast<double>(start) * millisecondsPerUnit;
            const double stopTime = static_cast<double>(stop) * millisecondsPerUnit;
            if (startTime <= m_position && m_position <= stopTime) {
                // Rounded down, so that it never exceeds the duration.
                progress.bufferedEnd = static_cast<uint32_t>(stopTime / 1000);
                progress.buffered = static_cast<uint32_t>((stopTime - m_position) / 1000);
            }
        }
        if (count > 0 && progress.buffered == kNoBufferReport) {
            progress.bufferedEnd = m_position / 1000;
            progress.buffered = 0;
        }
    }
    gst_query_unref(query);
}

MediaPipeline::Output MediaPipeline::output() const {
    Output output;
    if (gst_element_get_state(m_playbin, &output.state, nullptr, 0) != GST_STATE_CHANGE_SUCCESS) {
        output.state = GST_STATE_VOID_PENDING;
    }
    GstQuery* query = gst_query_new_segment(GST_FORMAT_TIME);
    if (gst_element_query(m_playbin, query)) {
        gst_query_parse_segment(query, &output.rate, nullptr, nullptr, nullptr);
    }
    gst_query_unref(query);
    gboolean isMuted = FALSE;
    g_object_get(m_playbin, "current-audio", &output.audioStream, "volume", &output.volume, "mute", &isMuted,
                 nullptr);
    output.isMuted = isMuted != FALSE;
    return output;
}

} // namespace desktop
