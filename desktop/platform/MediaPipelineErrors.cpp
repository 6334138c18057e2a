// What a GStreamer error means to the plug-in.
#include "desktop/platform/HttpSource.h"
#include "desktop/platform/MediaPipeline.h"

namespace desktop {

namespace {

// A source reports a dropped connection as "internal data stream error", which other elements use as well.
bool isConnectionDropped(GstMessage* message, const GError& error) {
    return g_error_matches(&error, GST_STREAM_ERROR, GST_STREAM_ERROR_FAILED) &&
           GST_OBJECT_FLAG_IS_SET(GST_MESSAGE_SRC(message), GST_ELEMENT_FLAG_SOURCE);
}

} // namespace

void MediaPipeline::onError(GstMessage* message) {
    GError* error = nullptr;
    gst_message_parse_error(message, &error, nullptr);
    const TELIX_AV_CB_MSG kind = classifyError(message, *error);
    changeState(State::Failed);
    const std::string reason = error->message; // some elements append lines about themselves
    m_listener.onError(kind, reason.substr(0, reason.find('\n')));
    g_error_free(error);
}

// Media that the server refuses, or a file that is not there, is the same as a server that cannot be reached:
// if the browser requests the URL as well, it reports all of them to the plug-in as a network error, and
// pages are to see one error whichever report comes first.
TELIX_AV_CB_MSG MediaPipeline::classifyError(GstMessage* message, const GError& error) const {
    const bool isOfSource = GST_OBJECT_FLAG_IS_SET(GST_MESSAGE_SRC(message), GST_ELEMENT_FLAG_SOURCE);
    const bool isUnreachable = httpStatusOf(message) != 0 ||
                               (error.domain == GST_RESOURCE_ERROR && (m_source.isNetwork || isOfSource)) ||
                               (m_source.isNetwork && isConnectionDropped(message, error));
    if (isUnreachable) {
        return m_shared->hasData ? TELIX_AV_CB_MSG_ERR_NET_DISCONNECTED
                                 : TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT;
    }
    // A data flow error before playback starts comes from media that no element could parse.
    const bool isUnsupported = (error.domain == GST_STREAM_ERROR &&
                                (m_state != State::Started || error.code != GST_STREAM_ERROR_FAILED)) ||
                               g_error_matches(&error, GST_CORE_ERROR, GST_CORE_ERROR_MISSING_PLUGIN);
    return isUnsupported ? TELIX_AV_CB_MSG_ERR_CODEC_NOT_SUPPORTED : TELIX_AV_CB_MSG_ERR_PLAYING;
}

} // namespace desktop
