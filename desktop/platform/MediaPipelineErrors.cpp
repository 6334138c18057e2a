// What a GStreamer error means to the plug-in.
#include "desktop/platform/MediaPipeline.h"

namespace desktop {

namespace {

// The status of the response that is the reason of the error; 0 if the reason is another one.
uint32_t httpStatusOf(GstMessage* message) {
    const GstStructure* details = nullptr;
    gst_message_parse_error_details(message, &details);
    guint status = 0;
    if (details) {
        gst_structure_get_uint(details, "http-status-code", &status);
    }
    return status;
}

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
    m_listener.onError(kind, error->message);
    g_error_free(error);
}

TELIX_AV_CB_MSG MediaPipeline::classifyError(GstMessage* message, const GError& error) const {
    const uint32_t status = httpStatusOf(message);
    const bool isMissing =
        (status >= 400 && status < 500) ||
        (!m_source.isNetwork && g_error_matches(&error, GST_RESOURCE_ERROR, GST_RESOURCE_ERROR_NOT_FOUND));
    if (isMissing) {
        return TELIX_AV_CB_MSG_ERR_NOT_FOUND;
    }
    const bool isConnectionError =
        m_source.isNetwork && status == 0 &&
        (error.domain == GST_RESOURCE_ERROR || isConnectionDropped(message, error));
    if (isConnectionError) {
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
