// What requests of media carry, so that they are those of the window's browser.
#include "desktop/window/webkit/MediaIdentity.h"

#include <memory>
#include <utility>

#include "desktop/window/shared/Referer.h"
#include "desktop/window/webkit/MediaCookies.h"
#include "desktop/window/webkit/Messages.h"

namespace desktop {

namespace {

// Null for what is no URL.
GUri* uriOf(const std::string& url) {
    const auto flags = static_cast<GUriFlags>(SOUP_HTTP_URI_FLAGS | G_URI_FLAGS_PARSE_RELAXED);
    return g_uri_parse(url.c_str(), flags, nullptr);
}

} // namespace

// A request whose cookies are being read.
struct MediaIdentity::Request {
    Request(const Request&) = delete;
    Request& operator=(const Request&) = delete;
    ~Request() { g_object_unref(message); }

    void reply(GList* cookies) const;

    WebKitUserMessage* message; // owns a reference
    std::string url;
    std::string page;
    std::string userAgent;
    bool acceptsAnyCertificate;
};

void MediaIdentity::Request::reply(GList* cookies) const {
    g_autoptr(GUri) to = uriOf(url);
    g_autoptr(GUri) from = uriOf(page);
    const std::string referer = refererOf(page, url, ReferrerPolicy::StrictOriginWhenCrossOrigin);
    const std::string header = to ? cookieHeader(cookies, to, from) : "";
    webkit_user_message_send_reply(
        message, webkit_user_message_new(kMediaRequestMessage,
                                         g_variant_new("(^ay^ay^ayb)", userAgent.c_str(), referer.c_str(),
                                                       header.c_str(), acceptsAnyCertificate)));
}

MediaIdentity::MediaIdentity(WebKitWebContext* context, std::string userAgent,
                             std::function<std::string()> page)
    : m_context(WEBKIT_WEB_CONTEXT(g_object_ref(context))), m_userAgent(std::move(userAgent)),
      m_page(std::move(page)), m_calls(g_cancellable_new()) {
    g_signal_connect(
        m_context, "user-message-received",
        G_CALLBACK(+[](WebKitWebContext*, WebKitUserMessage* message, gpointer identity) -> gboolean {
            return static_cast<MediaIdentity*>(identity)->onMessage(message);
        }),
        this);
}

MediaIdentity::~MediaIdentity() {
    g_signal_handlers_disconnect_by_data(m_context, this);
    g_cancellable_cancel(m_calls);
    g_object_unref(m_calls);
    g_object_unref(m_context);
}

// Returns whether the message is about media. The web process is not trusted.
bool MediaIdentity::onMessage(WebKitUserMessage* message) {
    const char* name = webkit_user_message_get_name(message);
    GVariant* parameters = webkit_user_message_get_parameters(message);
    const auto is = [&](const char* expected, const char* type) {
        return g_strcmp0(name, expected) == 0 && parameters &&
               g_variant_is_of_type(parameters, G_VARIANT_TYPE(type));
    };
    if (is(kMediaRequestMessage, "ay")) {
        onRequest(message, g_variant_get_bytestring(parameters));
        return true;
    }
    if (is(kMediaCookieMessage, "(ayay)")) {
        const char* url = nullptr;
        const char* cookie = nullptr;
        g_variant_get(parameters, "(^&ay^&ay)", &url, &cookie);
        onCookie(url, cookie);
        return true;
    }
    return false;
}

void MediaIdentity::onRequest(WebKitUserMessage* message, const std::string& url) {
    auto* request = new Request{WEBKIT_USER_MESSAGE(g_object_ref(message)), url, m_page(), m_userAgent,
                                acceptsAnyCertificate()};
    webkit_cookie_manager_get_cookies(
        webkit_web_context_get_cookie_manager(m_context), url.c_str(), m_calls,
        [](GObject* manager, GAsyncResult* result, gpointer data) {
            const std::unique_ptr<Request> request(static_cast<Request*>(data));
            GList* cookies =
                webkit_cookie_manager_get_cookies_finish(WEBKIT_COOKIE_MANAGER(manager), result, nullptr);
            request->reply(cookies);
            g_list_free_full(cookies, reinterpret_cast<GDestroyNotify>(soup_cookie_free));
        },
        request);
}

void MediaIdentity::onCookie(const std::string& url, const std::string& cookie) {
    g_autoptr(GUri) from = uriOf(url);
    g_autoptr(GUri) page = uriOf(m_page());
    g_autoptr(SoupCookie) set = from ? cookieSetBy(cookie, from, page) : nullptr;
    if (set) {
        webkit_cookie_manager_add_cookie(webkit_web_context_get_cookie_manager(m_context), set, nullptr,
                                         nullptr, nullptr);
    }
}

// A WebDriver session may have said so.
bool MediaIdentity::acceptsAnyCertificate() const {
    return webkit_website_data_manager_get_tls_errors_policy(
               webkit_web_context_get_website_data_manager(m_context)) == WEBKIT_TLS_ERRORS_POLICY_IGNORE;
}

} // namespace desktop
