// Which cookies requests of media send and set. A cookie jar of libsoup, which the engine has as well, knows
// the rules; each call has one of its own.
#include "desktop/window/webkit/MediaCookies.h"

namespace desktop {

std::string cookieHeader(GList* cookies, GUri* url, GUri* page) {
    g_autoptr(SoupCookieJar) jar = soup_cookie_jar_new();
    for (GList* each = cookies; each; each = each->next) {
        soup_cookie_jar_add_cookie(jar, soup_cookie_copy(static_cast<SoupCookie*>(each->data)));
    }
    // A GET of something else than a document.
    GSList* sent =
        soup_cookie_jar_get_cookie_list_with_same_site_info(jar, url, page, page, TRUE, TRUE, FALSE);
    g_autofree char* header = sent ? soup_cookies_to_cookie_header(sent) : nullptr;
    g_slist_free_full(sent, reinterpret_cast<GDestroyNotify>(soup_cookie_free));
    return header ? header : "";
}

SoupCookie* cookieSetBy(const std::string& header, GUri* url, GUri* page) {
    SoupCookie* cookie = soup_cookie_parse(header.c_str(), url);
    if (!cookie) {
        return nullptr;
    }
    // The jar drops an expired cookie.
    SoupCookie* lasting = soup_cookie_copy(cookie);
    soup_cookie_set_expires(lasting, nullptr);
    g_autoptr(SoupCookieJar) jar = soup_cookie_jar_new();
    soup_cookie_jar_set_accept_policy(jar, SOUP_COOKIE_JAR_ACCEPT_NO_THIRD_PARTY);
    soup_cookie_jar_add_cookie_full(jar, lasting, url, page);
    GSList* accepted = soup_cookie_jar_all_cookies(jar);
    if (!accepted) {
        soup_cookie_free(cookie);
        cookie = nullptr;
    }
    g_slist_free_full(accepted, reinterpret_cast<GDestroyNotify>(soup_cookie_free));
    return cookie;
}

} // namespace desktop
