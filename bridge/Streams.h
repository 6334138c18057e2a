// The streams of a page's instances: what NPN_GetURL, NPN_PostURL and the element's own URL bring.
//
// The page script makes the requests (see scripts/page.js), so that they are the page's: its cookies, its
// cache, its redirects. It hands over the head of a response, then one piece of data each time that it is
// asked for the next, then the end. Main thread only.
#ifndef TELIX_BRIDGE_STREAMS_H
#define TELIX_BRIDGE_STREAMS_H

#include <map>
#include <memory>
#include <string>
#include <string_view>

#include "npapi/npfunctions.h"

namespace bridge {

class Instance;
class Page;

// A request of the plug-in's.
struct StreamRequest {
    std::string url;
    std::string target; // a window or frame that is to show the response; empty: the plug-in takes it
    bool isPost = false;
    std::string headers; // of a POST request, lines of "name: value"
    std::string body;
    bool notifies = false; // NPP_URLNotify at the end
    void* notifyData = nullptr;
};

// The head of a response.
struct StreamResponse {
    std::string url; // after redirects
    std::string mimeType;
    std::string
        headers; // the status line and one line "name: value" for each header; empty when there is none
    uint32_t length = 0;   // 0: unknown
    uint32_t modified = 0; // seconds since 1970; 0: unknown
};

class Streams {
public:
    explicit Streams(Page& page) : m_page(page) {}
    Streams(const Streams&) = delete;
    Streams& operator=(const Streams&) = delete;
    ~Streams();

    // Begins a request. Nothing comes of it before the caller has returned to the main loop.
    NPError open(Instance& instance, const StreamRequest& request);
    // NPN_DestroyStream. An error for a stream that is not, or no longer, the instance's.
    NPError destroy(const Instance& instance, const NPStream* stream, NPReason reason);
    // The instance ends: so do its streams, with NPRES_USER_BREAK.
    void endAll(const Instance& instance);

    // From the page script. Unknown numbers are those of streams that have ended, and do nothing.
    void onResponse(uint32_t number, const StreamResponse& response);
    void onData(uint32_t number, std::string_view bytes);
    void onEnd(uint32_t number, NPReason reason);

private:
    struct Stream;
    using StreamPointer = std::shared_ptr<Stream>;

    StreamPointer find(uint32_t number) const;
    void deliver(const StreamPointer& stream);
    bool deliverPiece(const StreamPointer& stream);
    void retryLater(const StreamPointer& stream);
    void finish(const StreamPointer& stream, NPReason reason);
    void saveAsFile(Stream& stream);

    Page& m_page;
    uint32_t m_lastNumber = 0;
    std::map<uint32_t, StreamPointer> m_streams; // those that have not ended
};

} // namespace bridge

#endif
