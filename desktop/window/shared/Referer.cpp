// The header Referer of requests that the engine does not make itself.
#include "desktop/window/shared/Referer.h"

#include <libsoup/soup.h>

namespace desktop {

namespace {

constexpr auto kUriFlags = static_cast<GUriFlags>(SOUP_HTTP_URI_FLAGS | G_URI_FLAGS_PARSE_RELAXED);
constexpr char kHttp[] = "http";
constexpr char kHttps[] = "https";

bool isOf(GUri* url, const char* scheme) {
    return g_strcmp0(g_uri_get_scheme(url), scheme) == 0;
}

std::string hostOf(GUri* url) {
    const char* host = g_uri_get_host(url);
    g_autofree char* lower = g_ascii_strdown(host ? host : "", -1);
    return lower;
}

bool isSameOrigin(GUri* left, GUri* right) {
    return isOf(left, g_uri_get_scheme(right)) && g_uri_get_port(left) == g_uri_get_port(right) &&
           hostOf(left) == hostOf(right);
}

} // namespace

std::string refererOf(const std::string& document, const std::string& url, ReferrerPolicy policy) {
    g_autoptr(GUri) from = g_uri_parse(document.c_str(), kUriFlags, nullptr);
    g_autoptr(GUri) to = g_uri_parse(url.c_str(), kUriFlags, nullptr);
    if (!from || !to || !(isOf(from, kHttp) || isOf(from, kHttps)) ||
        (isOf(from, kHttps) && !isOf(to, kHttps))) {
        return {};
    }
    if (policy == ReferrerPolicy::StrictOriginWhenCrossOrigin && !isSameOrigin(from, to)) {
        g_autofree char* origin = g_uri_join(kUriFlags, g_uri_get_scheme(from), nullptr, g_uri_get_host(from),
                                             g_uri_get_port(from), "/", nullptr, nullptr);
        return origin;
    }
    g_autofree char* referer =
        g_uri_to_string_partial(from, static_cast<GUriHideFlags>(G_URI_HIDE_USERINFO | G_URI_HIDE_FRAGMENT));
    return referer;
}

} // namespace desktop
