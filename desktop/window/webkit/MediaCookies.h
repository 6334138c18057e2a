// Which cookies requests of media send and set: the engine's rules for what a page embeds.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_MEDIACOOKIES_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_MEDIACOOKIES_H

#include <libsoup/soup.h>

#include <string>

namespace desktop {

// The value of the header Cookie of a request to `url` that a page makes; empty for none. `cookies`: those
// for that URL (SoupCookie), HttpOnly ones included. `page`: null for none. Those with SameSite go to the
// page's own site alone.
std::string cookieHeader(GList* cookies, GUri* url, GUri* page);

// The cookie that a response of `url` to a request of that page sets with the value of a header Set-Cookie.
// Null, if it is malformed, for another host, Secure without HTTPS, or of another site than the page. The
// caller owns it. One that has expired deletes another.
SoupCookie* cookieSetBy(const std::string& header, GUri* url, GUri* page);

} // namespace desktop

#endif
