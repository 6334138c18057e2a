// The end of a playbin: at once, or deferred until its HTTP request has a response.
#ifndef TELIX_DESKTOP_PLATFORM_DEFERREDTEARDOWN_H
#define TELIX_DESKTOP_PLATFORM_DEFERREDTEARDOWN_H

#include <gst/gst.h>

namespace desktop {

// Whether it is the message with which souphttpsrc reports the headers of a response.
bool isHttpHeadersMessage(GstMessage* message);

// Removes the bus watch, sets the pipeline to NULL and drops the caller's reference. Platform thread.
void tearDown(GstElement* pipeline);

// souphttpsrc can crash if a request is cancelled while its response arrives. A pipeline with a request
// outstanding is therefore kept, paused, until the response, an error or the end of the seek says that the
// moment is over.
class DeferredTeardown {
public:
    // Takes the caller's reference and the bus watch. A server that does not respond in `timeoutSeconds` will
    // not respond at the moment of the teardown either. Platform thread.
    static void schedule(GstElement* pipeline, guint timeoutSeconds);

    DeferredTeardown(const DeferredTeardown&) = delete;
    DeferredTeardown& operator=(const DeferredTeardown&) = delete;

private:
    DeferredTeardown(GstElement* pipeline, guint timeoutSeconds);
    ~DeferredTeardown();

    static gboolean onMessage(GstBus* bus, GstMessage* message, gpointer teardown);
    static gboolean onTimeout(gpointer teardown);

    GstElement* m_pipeline;
    GSource* m_timeout;
};

} // namespace desktop

#endif
