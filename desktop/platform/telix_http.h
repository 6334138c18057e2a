/* The HTTP requests of the desktop's media players, for the window, which makes them requests of its browser:
 * with its user agent, cookies, Referer and trust.
 *
 * The window finds these functions as those of telix_picture.h: in the loaded library, with dlsym, by the
 * names below. Without a handler, requests have the library's own user agent, no cookies and no Referer, and
 * trust the certificate authorities of the system.
 *
 * All functions may be called on any thread, also concurrently. */
#ifndef TELIX_DESKTOP_PLATFORM_TELIX_HTTP_H
#define TELIX_DESKTOP_PLATFORM_TELIX_HTTP_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* NOLINTBEGIN(modernize-use-using): the header is C. */

/* What a request carries. Strings are null-terminated; one with a control character counts as null. */
typedef struct telix_desktop_http_identity {
    const char* userAgent;         /* header User-Agent; null: the library's own */
    const char* referer;           /* header Referer; null: none */
    const char* cookies;           /* header Cookie, as "name=value; name=value"; null: none */
    const char* certificates;      /* file (PEM) of the trusted certificate authorities; null: the system's */
    uint8_t acceptsAnyCertificate; /* 1: HTTPS with whatever certificate, as the browser was told to */
} telix_desktop_http_identity;

/* The callbacks run on threads of the library, one at a time, and must return at once. They may call
 * telix_desktop_answer_http_request, and none of the other functions. */
typedef struct telix_desktop_http_handler {
    /* A request to `url` waits for its identity, also each one that follows a redirection. Each `request` is
     * to be answered once, in this call or later. After five seconds, or if it is cancelled, the request does
     * not wait any longer. */
    void (*onRequest)(uint64_t request, const char* url, void* data);
    /* The response of `url` has set a cookie: the value of one header Set-Cookie. May be null. */
    void (*onCookie)(const char* url, const char* cookie, void* data);
    void* data; /* of the callbacks */
} telix_desktop_http_handler;

typedef void (*telix_desktop_set_http_handler_function)(const telix_desktop_http_handler* handler);
typedef void (*telix_desktop_answer_http_request_function)(uint64_t request,
                                                           const telix_desktop_http_identity* identity);

/* NOLINTEND(modernize-use-using) */

#ifndef TELIX_DESKTOP_API
#define TELIX_DESKTOP_API __attribute__((visibility("default")))
#endif

/* Sets the handler, of which there is one, and copies the record; null removes it. When this returns, no
 * callback of the previous handler is running or is called again, and what waited for it goes on without an
 * identity. */
TELIX_DESKTOP_API void telix_desktop_set_http_handler(const telix_desktop_http_handler* handler);

/* Answers a request, and copies the record; null: no identity. Does nothing if the request does not wait. */
TELIX_DESKTOP_API void telix_desktop_answer_http_request(uint64_t request,
                                                         const telix_desktop_http_identity* identity);

#ifdef __cplusplus
}
#endif

#endif
