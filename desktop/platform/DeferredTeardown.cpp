// Teardown of playbins.
#include "desktop/platform/DeferredTeardown.h"

namespace desktop {

bool isHttpHeadersMessage(GstMessage* message) {
    return GST_MESSAGE_TYPE(message) == GST_MESSAGE_ELEMENT && gst_message_has_name(message, "http-headers");
}

void tearDown(GstElement* pipeline) {
    GstBus* bus = gst_element_get_bus(pipeline);
    gst_bus_remove_watch(bus);
    gst_bus_set_flushing(bus, TRUE);
    gst_object_unref(bus);
    gst_element_set_state(pipeline, GST_STATE_NULL);
    gst_object_unref(pipeline);
}

void DeferredTeardown::schedule(GstElement* pipeline, guint timeoutSeconds) {
    new DeferredTeardown(pipeline, timeoutSeconds); // deletes itself
}

DeferredTeardown::DeferredTeardown(GstElement* pipeline, guint timeoutSeconds)
    : m_pipeline(pipeline), m_timeout(g_timeout_source_new_seconds(timeoutSeconds)) {
    GstBus* bus = gst_element_get_bus(pipeline);
    gst_bus_remove_watch(bus);
    gst_bus_add_watch(bus, onMessage, this);
    gst_object_unref(bus);
    g_source_set_callback(m_timeout, onTimeout, this, nullptr);
    g_source_attach(m_timeout, g_main_context_get_thread_default());
    gst_element_set_state(pipeline, GST_STATE_PAUSED);
}

DeferredTeardown::~DeferredTeardown() {
    g_source_destroy(m_timeout);
    g_source_unref(m_timeout);
    tearDown(m_pipeline);
}

gboolean DeferredTeardown::onMessage(GstBus* bus, GstMessage* message, gpointer teardown) {
    (void)bus;
    const GstMessageType type = GST_MESSAGE_TYPE(message);
    if (isHttpHeadersMessage(message) || type == GST_MESSAGE_ERROR || type == GST_MESSAGE_ASYNC_DONE ||
        type == GST_MESSAGE_EOS) {
        delete static_cast<DeferredTeardown*>(teardown);
        return G_SOURCE_REMOVE;
    }
    return G_SOURCE_CONTINUE;
}

gboolean DeferredTeardown::onTimeout(gpointer teardown) {
    delete static_cast<DeferredTeardown*>(teardown);
    return G_SOURCE_REMOVE;
}

} // namespace desktop
