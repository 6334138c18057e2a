// The header Referer of requests that the engine does not make itself.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_REFERER_H
#define TELIX_DESKTOP_WINDOW_SHARED_REFERER_H

#include <string>

namespace desktop {

// What engines do for pages that do not choose: policies of W3C Referrer Policy.
enum class ReferrerPolicy {
    // The URL of the document.
    NoReferrerWhenDowngrade,
    // To other origins, the origin alone.
    StrictOriginWhenCrossOrigin
};

// The value for a request to `url` that a document makes; empty for none: the document is not of HTTP, or the
// request is not encrypted although the document was. Any thread.
std::string refererOf(const std::string& document, const std::string& url, ReferrerPolicy policy);

} // namespace desktop

#endif
