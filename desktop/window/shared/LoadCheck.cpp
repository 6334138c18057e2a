// Checks whether a page can be loaded before the engine loads it.
#include "desktop/window/shared/LoadCheck.h"

#include <libsoup/soup.h>
#include <unistd.h>

namespace desktop {

namespace {

constexpr guint kServerTimeoutSeconds = 5;
constexpr guint kFirstHttpError = 400;

// Sends a GET and closes the connection after the response headers, because many servers reject HEAD.
std::string requestPage(const std::string& url, const std::string& userAgent) {
    g_autoptr(SoupSession) session = soup_session_new_with_options("timeout", kServerTimeoutSeconds,
                                                                   "user-agent", userAgent.c_str(), nullptr);
    g_autoptr(SoupMessage) message = soup_message_new(SOUP_METHOD_GET, url.c_str());
    if (!message) {
        return "malformed URL";
    }
    g_autoptr(GError) error = nullptr;
    g_autoptr(GInputStream) body = soup_session_send(session, message, nullptr, &error);
    if (g_error_matches(error, G_IO_ERROR, G_IO_ERROR_TIMED_OUT)) {
        return "the server does not respond";
    }
    if (error) {
        return error->message;
    }
    const guint status = soup_message_get_status(message);
    return status >= kFirstHttpError ? "HTTP status " + std::to_string(status) : "";
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

} // namespace

std::string loadError(const std::string& url, const std::string& userAgent) {
    g_autofree char* schemeText = g_uri_parse_scheme(url.c_str());
    const std::string scheme = schemeText ? schemeText : "";
    if (scheme.empty()) {
        return "malformed URL";
    }
    if (scheme == "file") {
        // A file has neither.
        return checkFile(url.substr(0, url.find_first_of("?#")));
    }
    if (scheme == "data" || scheme == "about") {
        return {};
    }
    if (scheme != "http" && scheme != "https") {
        return "unsupported URL scheme";
    }
    return requestPage(url, userAgent);
}

} // namespace desktop
