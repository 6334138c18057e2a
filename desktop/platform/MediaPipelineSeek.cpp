// Seeks and speeds: both are flushing seeks, of which one is in progress at a time.
#include "desktop/platform/MediaPipeline.h"

#include <utility>

namespace desktop {

bool MediaPipeline::seek(uint32_t milliseconds) {
    if (isSeeking()) {
        m_pendingSeek.position = milliseconds;
        return true;
    }
    return sendSeek(m_speed, milliseconds);
}

bool MediaPipeline::setSpeed(double speed) {
    if (isSeeking()) {
        m_pendingSeek.speed = speed;
        return true;
    }
    return speed == m_speed || sendSeek(speed, progress().position);
}

bool MediaPipeline::repeat() {
    return sendSeek(m_speed, 0);
}

// The pipeline's position is then not the one that was asked for.
bool MediaPipeline::isSeeking() const {
    return m_isSeeking || !isAtStart();
}

bool MediaPipeline::isBuffered(uint32_t milliseconds) {
    return !m_source.hasDownloadBuffer || milliseconds / 1000 <= progress().bufferedEnd;
}

// A server that does not accept byte ranges is not asked for one: it would end the response early, or never.
bool MediaPipeline::isReachable(uint32_t milliseconds) {
    return m_source.acceptsByteRanges || isBuffered(milliseconds);
}

bool MediaPipeline::sendSeek(double speed, uint32_t milliseconds) {
    if (!isReachable(milliseconds)) {
        return false;
    }
    if (m_targetState == GST_STATE_PLAYING && !m_source.isLive) {
        // A change to PAUSED while the pipeline returns to PLAYING after a seek, as for buffering, would add
        // the running time before the seek to the position.
        m_targetState = GST_STATE_PAUSED;
        gst_element_set_state(m_playbin, m_targetState);
    }
    const auto position = static_cast<gint64>(milliseconds) * GST_MSECOND;
    // To find a position accurately in audio without an index, all of the audio before it is read.
    const bool isAccurate = m_hasVideo || isBuffered(milliseconds);
    const GstSeekFlags accuracy = isAccurate ? GST_SEEK_FLAG_ACCURATE : GST_SEEK_FLAG_NONE;
    const auto flags = static_cast<GstSeekFlags>(GST_SEEK_FLAG_FLUSH | accuracy);
    const bool isForward = speed > 0;
    // A segment with a negative rate is played from its stop position.
    const bool isAccepted =
        gst_element_seek(m_playbin, speed, GST_FORMAT_TIME, flags, GST_SEEK_TYPE_SET,
                         isForward ? position : 0, GST_SEEK_TYPE_SET, isForward ? -1 : position) != FALSE;
    if (isAccepted) {
        m_isSeeking = true;
        m_speed = speed;
        m_position = milliseconds;
        applyAudio();
    } else {
        applyTargetState();
    }
    return isAccepted;
}

// False if nothing is pending, or if it cannot be reached any more.
bool MediaPipeline::sendPendingSeek() {
    const PendingSeek pending = std::exchange(m_pendingSeek, {});
    const bool hasTarget = pending.position && isReachable(*pending.position);
    if (!hasTarget && !pending.speed) {
        return false;
    }
    return sendSeek(pending.speed.value_or(m_speed), hasTarget ? *pending.position : progress().position);
}

} // namespace desktop
