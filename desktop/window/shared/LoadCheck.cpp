// Checks whether a page can be loaded before the engine loads it, and reads what is not for the engine.
#include "desktop/window/shared/LoadCheck.h"

#include <libsoup/soup.h>
#include <unistd.h>

#include <array>

#include "desktop/platform/XmlAit.h"

namespace desktop {

namespace {

constexpr guint kServerTimeoutSeconds = 5;
constexpr guint kFirstHttpError = 400;
constexpr char kXmlAitType[] = "application/vnd.dvb.ait+xml";
constexpr char kXmlAitSuffix[] = ".aitx";

std::string withoutQuery(const std::string& url) {
    return url.substr(0, url.find_first_of("?#"));
}

// Reads to the end, and no more than makes the document too long. Returns the error.
std::string readAll(GInputStream* stream, std::string& document) {
    std::array<char, 4096> buffer{};
    while (document.size() <= kMaxXmlAitSize) {
        g_autoptr(GError) error = nullptr;
        const gssize size = g_input_stream_read(stream, buffer.data(), buffer.size(), nullptr, &error);
        if (size < 0) {
            return error->message;
        }
        if (size == 0) {
            return {};
        }
        document.append(buffer.data(), static_cast<std::size_t>(size));
    }
    return {};
}

LoadResult readXmlAit(GInputStream* stream) {
    std::string document;
    const std::string error = readAll(stream, document);
    return error.empty() ? LoadResult{{}, document} : LoadResult{error, std::nullopt};
}

// Sends a GET and closes the connection after the response headers of a page, because many servers reject
// HEAD.
LoadResult request(const std::string& url, const RequestOptions& options, ExpectedDocument expected) {
    g_autoptr(SoupSession) session = soup_session_new_with_options(
        "timeout", kServerTimeoutSeconds, "user-agent", options.userAgent.c_str(), nullptr);
    g_autoptr(SoupMessage) message = soup_message_new(SOUP_METHOD_GET, url.c_str());
    if (!message) {
        return {"malformed URL", std::nullopt};
    }
    if (options.ignoresCertificateErrors) {
        g_signal_connect(message, "accept-certificate",
                         G_CALLBACK(+[](SoupMessage*, GTlsCertificate*, GTlsCertificateFlags,
                                        gpointer) -> gboolean { return TRUE; }),
                         nullptr);
    }
    g_autoptr(GError) error = nullptr;
    g_autoptr(GInputStream) body = soup_session_send(session, message, nullptr, &error);
    if (g_error_matches(error, G_IO_ERROR, G_IO_ERROR_TIMED_OUT)) {
        return {"the server does not respond", std::nullopt};
    }
    if (error) {
        return {error->message, std::nullopt};
    }
    const guint status = soup_message_get_status(message);
    if (status >= kFirstHttpError) {
        return {"HTTP status " + std::to_string(status), std::nullopt};
    }
    const char* type =
        soup_message_headers_get_content_type(soup_message_get_response_headers(message), nullptr);
    const bool isXmlAit = expected == ExpectedDocument::XmlAit ||
                          (type && g_ascii_strcasecmp(type, kXmlAitType) == 0) ||
                          g_str_has_suffix(withoutQuery(url).c_str(), kXmlAitSuffix);
    return isXmlAit ? readXmlAit(body) : LoadResult{};
}

std::string checkFile(const std::string& url) {
    g_autoptr(GFile) location = g_file_new_for_uri(url.c_str());
    g_autofree char* file = g_file_get_path(location);
    if (!file) {
        return "malformed URL";
    }
    if (!g_file_test(file, G_FILE_TEST_EXISTS)) {
        return "No such file";
    }
    if (!g_file_test(file, G_FILE_TEST_IS_REGULAR)) {
        return "not a file";
    }
    return access(file, R_OK) == 0 ? "" : "not readable";
}

LoadResult loadFile(const std::string& url, ExpectedDocument expected) {
    const std::string file = withoutQuery(url);
    const std::string error = checkFile(file);
    const bool isXmlAit =
        expected == ExpectedDocument::XmlAit || g_str_has_suffix(file.c_str(), kXmlAitSuffix);
    if (!error.empty() || !isXmlAit) {
        return {error, std::nullopt};
    }
    g_autoptr(GFile) location = g_file_new_for_uri(file.c_str());
    g_autoptr(GError) openError = nullptr;
    g_autoptr(GFileInputStream) stream = g_file_read(location, nullptr, &openError);
    return stream ? readXmlAit(G_INPUT_STREAM(stream)) : LoadResult{openError->message, std::nullopt};
}

} // namespace

LoadResult load(const std::string& url, const RequestOptions& options, ExpectedDocument expected) {
    g_autofree char* schemeText = g_uri_parse_scheme(url.c_str());
    const std::string scheme = schemeText ? schemeText : "";
    if (scheme.empty()) {
        return {"malformed URL", std::nullopt};
    }
    if (scheme == "file") {
        return loadFile(url, expected);
    }
    if (scheme == "data" || scheme == "about") {
        return {};
    }
    if (scheme != "http" && scheme != "https") {
        return {"unsupported URL scheme", std::nullopt};
    }
    return request(url, options, expected);
}

std::string loadError(const std::string& url, const RequestOptions& options) {
    return load(url, options).error;
}

} // namespace desktop
