// The source element of the media players for http and https.
#ifndef TELIX_DESKTOP_PLATFORM_HTTPSOURCE_H
#define TELIX_DESKTOP_PLATFORM_HTTPSOURCE_H

#include <gst/gst.h>

#include <optional>

namespace desktop {

// Registers the element in this process, as the one that GStreamer chooses for URLs of these schemes: for
// players and for the playlists and segments of HTTP live streaming. After gst_init(); once.
void registerHttpSource();

// What a response says, from the message on the bus with which the element reports it; nothing for any other
// message.
struct HttpResponseReport {
    bool acceptsByteRanges;
};
std::optional<HttpResponseReport> httpResponseReport(GstMessage* message);

// The status of the response that is the reason of an error message; 0 if the reason is another one.
guint httpStatusOf(GstMessage* error);

} // namespace desktop

#endif
