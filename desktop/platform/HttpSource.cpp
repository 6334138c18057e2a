// A GstPushSrc whose create() does all of the work: the element has no thread of its own, so that nothing is
// left to end when it stops. GstBaseSrc serialises create(), start(), stop() and do_seek(), and calls
// unlock() to end one that blocks.
#include "desktop/platform/HttpSource.h"

#include <gst/base/gstpushsrc.h>

#include <algorithm>
#include <atomic>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "desktop/platform/HttpClient.h"

namespace desktop {

namespace {

constexpr const char* kElement = "telixhttpsrc";
constexpr guint kRank = GST_RANK_PRIMARY + 1000; // above the sources that a web engine registers
constexpr const char* kResponseMessage = "telix-http-response";
constexpr const char* kAcceptsByteRanges = "accepts-byte-ranges";
constexpr const char* kHttpStatus = "http-status-code";
constexpr unsigned int kMaxRedirections = 10;
constexpr uint64_t kUnknownSize = GST_CLOCK_TIME_NONE;

struct Source {
    // For GstURIHandler and queries, on any thread.
    std::mutex mutex; // guards the URLs
    std::string url;
    std::string redirectedUrl; // where the last response came from, if from another URL
    std::atomic<uint64_t> size{kUnknownSize};
    std::atomic<bool> canSeek{true}; // until a response says otherwise

    // In the calls that GstBaseSrc serialises.
    HttpClient client; // interrupt() on any thread
    uint64_t position = 0;
    std::optional<uint64_t> end; // of the range to be read, exclusive

    std::string currentUrl() {
        std::lock_guard<std::mutex> lock(mutex);
        return url;
    }
};

struct Instance {
    GstPushSrc parent;
    Source* source; // from init to finalize
};

GstPushSrcClass* parentClass = nullptr; // set once, when the type is initialised

Source& sourceOf(gpointer element) {
    return *static_cast<Instance*>(element)->source;
}

// ---- Requests

GstFlowReturn postError(gpointer element, GstResourceError code, const std::string& reason, guint status) {
    GstStructure* details =
        gst_structure_new("details", kHttpStatus, G_TYPE_UINT, status, nullptr); // given to the message
    gst_element_message_full_with_details(GST_ELEMENT(element), GST_MESSAGE_ERROR, GST_RESOURCE_ERROR, code,
                                          g_strdup(reason.c_str()), nullptr, __FILE__, __func__, __LINE__,
                                          details);
    return GST_FLOW_ERROR;
}

// Blocks until the headers of a response to the URL have come, which may be a redirection.
HttpClient::Result request(Source& source, const std::string& url) {
    HttpIdentities& identities = HttpIdentities::instance();
    HttpClient& client = source.client;
    const HttpIdentity identity = identities.ask(url, [&] { return client.isInterrupted(); });
    if (client.isInterrupted()) {
        return HttpClient::Result::Interrupted;
    }
    if (!client.begin({url, source.position, source.end, identity})) {
        return HttpClient::Result::Failed;
    }
    const HttpClient::Result result = client.readHeaders();
    if (result == HttpClient::Result::Ok) {
        for (const std::string& cookie : client.response().cookies) {
            identities.reportCookie(url, cookie);
        }
    }
    return result;
}

// What the response says of the resource, for seeks and queries.
void takeResponse(gpointer element, Source& source, const HttpClient::Response& response,
                  const std::string& url) {
    source.canSeek = response.acceptsByteRanges && response.size.has_value();
    const uint64_t size = response.size.value_or(kUnknownSize);
    if (source.size.exchange(size) != size) {
        if (response.size) { // what GstBaseSrc answers queries with
            GST_OBJECT_LOCK(element);
            GST_BASE_SRC(element)->segment.duration = size;
            GST_OBJECT_UNLOCK(element);
        }
        gst_element_post_message(GST_ELEMENT(element), gst_message_new_duration_changed(GST_OBJECT(element)));
    }
    {
        std::lock_guard<std::mutex> lock(source.mutex);
        source.redirectedUrl = url == source.url ? "" : url;
    }
    gst_element_post_message(
        GST_ELEMENT(element),
        gst_message_new_element(GST_OBJECT(element),
                                gst_structure_new(kResponseMessage, kAcceptsByteRanges, G_TYPE_BOOLEAN,
                                                  response.acceptsByteRanges ? TRUE : FALSE, nullptr)));
}

// Requests the bytes from the position on, following redirections.
GstFlowReturn open(gpointer element, Source& source) {
    HttpClient& client = source.client;
    std::string url = source.currentUrl();
    for (unsigned int redirections = 0; redirections <= kMaxRedirections; ++redirections) {
        const HttpClient::Result result = request(source, url);
        if (result != HttpClient::Result::Ok) {
            const std::string reason = client.error();
            client.close();
            return result == HttpClient::Result::Interrupted
                       ? GST_FLOW_FLUSHING
                       : postError(element, GST_RESOURCE_ERROR_OPEN_READ, reason, 0);
        }
        const HttpClient::Response& response = client.response();
        if (response.location.empty()) {
            if (response.status < 200 || response.status >= 300) {
                const auto status = static_cast<guint>(response.status);
                client.close();
                return postError(element, GST_RESOURCE_ERROR_NOT_FOUND,
                                 "HTTP status " + std::to_string(status), status);
            }
            takeResponse(element, source, response, url);
            return GST_FLOW_OK;
        }
        url = std::string(response.location);
    }
    client.close();
    return postError(element, GST_RESOURCE_ERROR_OPEN_READ, "too many redirections", 0);
}

// ---- GstPushSrc

bool isAtEnd(const Source& source) {
    return source.position >= source.end.value_or(kUnknownSize) || source.position == source.size;
}

GstFlowReturn create(GstPushSrc* element, GstBuffer** buffer) {
    Source& source = sourceOf(element);
    if (isAtEnd(source)) {
        return GST_FLOW_EOS;
    }
    if (!source.client.isOpen()) {
        const GstFlowReturn result = open(element, source);
        if (result != GST_FLOW_OK) {
            return result;
        }
    }
    std::vector<uint8_t> data;
    switch (source.client.readBody(data)) {
    case HttpClient::Result::Ok:
        break;
    case HttpClient::Result::End:
        return GST_FLOW_EOS;
    case HttpClient::Result::Interrupted:
        return GST_FLOW_FLUSHING;
    case HttpClient::Result::Failed: {
        const std::string reason = source.client.error();
        source.client.close();
        return postError(element, GST_RESOURCE_ERROR_READ, reason, 0);
    }
    }
    const uint64_t left = source.end.value_or(kUnknownSize) - source.position; // the server may send more
    const size_t size = std::min<uint64_t>(data.size(), left);
    *buffer = gst_buffer_new_allocate(nullptr, size, nullptr);
    gst_buffer_fill(*buffer, 0, data.data(), size);
    GST_BUFFER_OFFSET(*buffer) = source.position;
    source.position += size;
    GST_BUFFER_OFFSET_END(*buffer) = source.position;
    return GST_FLOW_OK;
}

gboolean start(GstBaseSrc* element) {
    Source& source = sourceOf(element);
    source.size = kUnknownSize;
    source.canSeek = true;
    source.position = 0;
    source.end.reset();
    source.client.resume();
    if (source.currentUrl().empty()) {
        postError(element, GST_RESOURCE_ERROR_OPEN_READ, "no URL", 0);
        return FALSE;
    }
    return TRUE;
}

gboolean stop(GstBaseSrc* element) {
    Source& source = sourceOf(element);
    source.client.close();
    std::lock_guard<std::mutex> lock(source.mutex);
    source.redirectedUrl.clear();
    return TRUE;
}

gboolean unlock(GstBaseSrc* element) {
    sourceOf(element).client.interrupt();
    HttpIdentities::instance().cancel();
    return TRUE;
}

gboolean unlockStop(GstBaseSrc* element) {
    sourceOf(element).client.resume();
    return TRUE;
}

gboolean isSeekable(GstBaseSrc* element) {
    return sourceOf(element).canSeek ? TRUE : FALSE;
}

gboolean getSize(GstBaseSrc* element, guint64* size) {
    *size = sourceOf(element).size;
    return *size != kUnknownSize ? TRUE : FALSE;
}

// The request follows in create(). A response that goes on at the position is kept.
gboolean doSeek(GstBaseSrc* element, GstSegment* segment) {
    Source& source = sourceOf(element);
    const std::optional<uint64_t> end =
        segment->stop == kUnknownSize ? std::nullopt : std::optional<uint64_t>(segment->stop);
    if (segment->rate < 0 || segment->start > source.size) {
        return FALSE;
    }
    if (segment->start != source.position || end != source.end) {
        source.client.close();
        source.position = segment->start;
        source.end = end;
    }
    return TRUE;
}

gboolean query(GstBaseSrc* element, GstQuery* query) {
    Source& source = sourceOf(element);
    if (GST_QUERY_TYPE(query) == GST_QUERY_URI) {
        std::lock_guard<std::mutex> lock(source.mutex);
        gst_query_set_uri(query, source.url.c_str());
        if (!source.redirectedUrl.empty()) {
            gst_query_set_uri_redirection(query, source.redirectedUrl.c_str());
        }
        return TRUE;
    }
    const gboolean isAnswered = GST_BASE_SRC_CLASS(parentClass)->query(element, query);
    if (isAnswered && GST_QUERY_TYPE(query) == GST_QUERY_SCHEDULING) {
        GstSchedulingFlags flags{};
        gint minimum = 0;
        gint maximum = 0;
        gint alignment = 0;
        gst_query_parse_scheduling(query, &flags, &minimum, &maximum, &alignment);
        flags = static_cast<GstSchedulingFlags>(flags | GST_SCHEDULING_FLAG_BANDWIDTH_LIMITED);
        gst_query_set_scheduling(query, flags, minimum, maximum, alignment);
    }
    return isAnswered;
}

// ---- GstURIHandler

GstURIType uriType(GType type) {
    (void)type;
    return GST_URI_SRC;
}

const gchar* const* protocols(GType type) {
    (void)type;
    static const gchar* const kProtocols[] = {"http", "https", nullptr};
    return kProtocols;
}

gchar* getUri(GstURIHandler* handler) {
    return g_strdup(sourceOf(handler).currentUrl().c_str());
}

gboolean setUri(GstURIHandler* handler, const gchar* uri, GError** error) {
    (void)error;
    Source& source = sourceOf(handler);
    std::lock_guard<std::mutex> lock(source.mutex);
    source.url = uri;
    return TRUE;
}

void initialiseUriHandler(gpointer interface, gpointer data) {
    (void)data;
    auto* handler = static_cast<GstURIHandlerInterface*>(interface);
    handler->get_type = uriType;
    handler->get_protocols = protocols;
    handler->get_uri = getUri;
    handler->set_uri = setUri;
}

// ---- GObject

void finalize(GObject* object) {
    delete reinterpret_cast<Instance*>(object)->source;
    G_OBJECT_CLASS(parentClass)->finalize(object);
}

void initialiseClass(gpointer gClass, gpointer data) {
    (void)data;
    parentClass = static_cast<GstPushSrcClass*>(g_type_class_peek_parent(gClass));
    G_OBJECT_CLASS(gClass)->finalize = finalize;
    auto* elementClass = GST_ELEMENT_CLASS(gClass);
    static GstStaticPadTemplate pad =
        GST_STATIC_PAD_TEMPLATE("src", GST_PAD_SRC, GST_PAD_ALWAYS, GST_STATIC_CAPS_ANY);
    gst_element_class_add_static_pad_template(elementClass, &pad);
    gst_element_class_set_static_metadata(elementClass, "HTTP source", "Source/Network",
                                          "Reads media over HTTP as the browser of the television does",
                                          "libtelix");
    auto* baseClass = GST_BASE_SRC_CLASS(gClass);
    baseClass->start = start;
    baseClass->stop = stop;
    baseClass->unlock = unlock;
    baseClass->unlock_stop = unlockStop;
    baseClass->is_seekable = isSeekable;
    baseClass->get_size = getSize;
    baseClass->do_seek = doSeek;
    baseClass->query = query;
    GST_PUSH_SRC_CLASS(gClass)->create = create;
}

void initialise(GTypeInstance* instance, gpointer gClass) {
    (void)gClass;
    reinterpret_cast<Instance*>(instance)->source = new Source;
    gst_base_src_set_automatic_eos(GST_BASE_SRC(instance), FALSE); // create() knows the end
}

GType registerType() {
    const GType type =
        g_type_register_static_simple(GST_TYPE_PUSH_SRC, "TelixHttpSource", sizeof(GstPushSrcClass),
                                      initialiseClass, sizeof(Instance), initialise, {});
    const GInterfaceInfo uriHandler{initialiseUriHandler, nullptr, nullptr};
    g_type_add_interface_static(type, GST_TYPE_URI_HANDLER, &uriHandler);
    return type;
}

} // namespace

void registerHttpSource() {
    curl_global_init(CURL_GLOBAL_DEFAULT); // until the process ends
    gst_element_register(nullptr, kElement, kRank, registerType());
}

std::optional<HttpResponseReport> httpResponseReport(GstMessage* message) {
    if (GST_MESSAGE_TYPE(message) != GST_MESSAGE_ELEMENT ||
        !gst_message_has_name(message, kResponseMessage)) {
        return std::nullopt;
    }
    gboolean acceptsByteRanges = FALSE;
    gst_structure_get_boolean(gst_message_get_structure(message), kAcceptsByteRanges, &acceptsByteRanges);
    return HttpResponseReport{acceptsByteRanges != FALSE};
}

guint httpStatusOf(GstMessage* error) {
    const GstStructure* details = nullptr;
    gst_message_parse_error_details(error, &details);
    guint status = 0;
    if (details) {
        gst_structure_get_uint(details, kHttpStatus, &status);
    }
    return status;
}

} // namespace desktop
