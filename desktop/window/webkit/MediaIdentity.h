// What requests of media carry, so that they are those of the window's browser: its user agent, the page as
// Referer, its cookies and its trust.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_MEDIAIDENTITY_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_MEDIAIDENTITY_H

#include <webkit2/webkit2.h>

#include <functional>
#include <string>

namespace desktop {

// Answers the web process, which asks for each request. Main thread.
class MediaIdentity {
public:
    // `page` returns the URL of the page that media is played for; empty if there is none.
    MediaIdentity(WebKitWebContext* context, std::string userAgent, std::function<std::string()> page);
    ~MediaIdentity();
    MediaIdentity(const MediaIdentity&) = delete;
    MediaIdentity& operator=(const MediaIdentity&) = delete;

private:
    struct Request;

    bool onMessage(WebKitUserMessage* message);
    void onRequest(WebKitUserMessage* message, const std::string& url);
    void onCookie(const std::string& url, const std::string& cookie);
    bool acceptsAnyCertificate() const;

    WebKitWebContext* m_context; // owns a reference
    std::string m_userAgent;
    std::function<std::string()> m_page;
    GCancellable* m_calls; // cancelled in the destructor
};

} // namespace desktop

#endif
