// Position and duration, which part of the media is buffered, and what is played.
#include "desktop/platform/MediaPipeline.h"

#include <algorithm>

namespace desktop {

namespace {

// How far the estimated times of a buffered range may be from the real ones.
constexpr double kRangeDistance = 0.05;      // of the duration
constexpr double kMinRangeDistance = 2000.0; // milliseconds

constexpr auto kStaleBuffering = std::chrono::seconds(1); // without a new report of the level

} // namespace

MediaPipeline::Progress MediaPipeline::progress() {
    gint64 value = 0;
    if (isPositionKnown() && gst_element_query_position(m_playbin, GST_FORMAT_TIME, &value) && value >= 0) {
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
        endStaleBuffering(progress);
    }
    return progress;
}

// After a seek, the sinks count from the running time before it until they have changed their state.
bool MediaPipeline::isPositionKnown() const {
    return !isSeeking() && gst_element_get_state(m_playbin, nullptr, nullptr, 0) != GST_STATE_CHANGE_ASYNC;
}

// downloadbuffer does not always update the level that it reports while nothing reads from it, and nothing
// does while playback waits for that level.
void MediaPipeline::endStaleBuffering(const Progress& progress) {
    const bool isStale =
        m_isBuffering && std::chrono::steady_clock::now() - m_bufferingReported >= kStaleBuffering;
    const bool hasEnough =
        progress.buffered != kNoBufferReport &&
        (progress.buffered * GST_SECOND >= kBufferDuration || progress.bufferedEnd == m_duration / 1000);
    if (isStale && hasEnough) {
        onBuffering(100);
    }
}

// Reports the buffered range around the position. Ranges are known in bytes, and their times are estimated
// from the average bit rate: after a seek, the range that is played can seem to begin after the position or
// to end before it. So the nearest range counts, unless it is too far away for that.
void MediaPipeline::readBufferedRanges(Progress& progress) {
    GstQuery* query = gst_query_new_buffering(GST_FORMAT_PERCENT);
    const guint count = gst_element_query(m_playbin, query) ? gst_query_get_n_buffering_ranges(query) : 0;
    const double millisecondsPerUnit = static_cast<double>(m_duration) / GST_FORMAT_PERCENT_MAX;
    double nearest = std::max(kMinRangeDistance, m_duration * kRangeDistance);
    if (count > 0) {
        progress.bufferedEnd = m_position / 1000;
        progress.buffered = 0;
    }
    for (guint index = 0; index < count; ++index) {
        gint64 first = 0;
        gint64 last = 0;
        gst_query_parse_nth_buffering_range(query, index, &first, &last);
        const double start = static_cast<double>(first) * millisecondsPerUnit;
        const double stop = static_cast<double>(last) * millisecondsPerUnit;
        const double distance = std::max({start - m_position, m_position - stop, 0.0});
        if (distance < nearest) {
            nearest = distance;
            const double begin = std::clamp<double>(m_position, start, stop);
            // Rounded down, so that it never exceeds the duration.
            progress.buffered = static_cast<uint32_t>((stop - begin) / 1000);
            progress.bufferedEnd = static_cast<uint32_t>(std::max<double>(stop, m_position) / 1000);
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
    g_object_get(m_playbin, "current-audio", &output.audioStream, nullptr);
    g_object_get(m_volumeFilter, "volume", &output.volume, "mute", &isMuted, nullptr);
    output.isMuted = isMuted != FALSE;
    return output;
}

} // namespace desktop
