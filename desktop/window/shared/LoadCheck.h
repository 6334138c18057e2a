// Checks whether a page can be loaded before the engine loads it, and reads what is not for the engine.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_LOADCHECK_H
#define TELIX_DESKTOP_WINDOW_SHARED_LOADCHECK_H

#include <optional>
#include <string>

namespace desktop {

// What the requests of the window share with those of its engine.
struct RequestOptions {
    std::string userAgent;
    // Whether servers may have any certificate.
    bool ignoresCertificateErrors = false;
};

struct LoadResult {
    // The reason why the document cannot be loaded, as the end of a message; empty if it can.
    std::string error;
    // The document if it is an XML AIT: by its content type, or by the name *.aitx.
    std::optional<std::string> xmlAit;
};

// What a document is taken as whose type is another one.
enum class ExpectedDocument { Page, XmlAit };

// A local file must be readable; a server must start a successful response within 5 seconds. Blocks the
// calling thread, and runs no event of it meanwhile. Any thread.
LoadResult load(const std::string& url, const RequestOptions& options,
                ExpectedDocument expected = ExpectedDocument::Page);

// The error alone.
std::string loadError(const std::string& url, const RequestOptions& options);

} // namespace desktop

#endif
