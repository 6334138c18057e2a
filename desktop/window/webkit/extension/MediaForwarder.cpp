// The requests of media players, which are in the web process, on their way to the window.
#include "desktop/window/webkit/extension/MediaForwarder.h"

#include <memory>

#include "desktop/window/shared/MediaRequests.h"
#include "desktop/window/webkit/Messages.h"

namespace desktop {

namespace {

using Identify = MediaRequests::Identify;

void onReply(GObject* extension, GAsyncResult* result, gpointer data) {
    const std::unique_ptr<Identify> identify(static_cast<Identify*>(data));
    WebKitUserMessage* reply =
        webkit_web_extension_send_message_to_context_finish(WEBKIT_WEB_EXTENSION(extension), result, nullptr);
    // A window that has not replied is given up by the library.
    if (GVariant* parameters = reply ? webkit_user_message_get_parameters(reply) : nullptr) {
        const char* userAgent = nullptr;
        const char* referer = nullptr;
        const char* cookies = nullptr;
        gboolean acceptsAnyCertificate = FALSE;
        g_variant_get(parameters, "(^&ay^&ay^&ayb)", &userAgent, &referer, &cookies, &acceptsAnyCertificate);
        (*identify)({userAgent, referer, cookies, acceptsAnyCertificate != FALSE});
    }
    g_clear_object(&reply);
}

} // namespace

void forwardMediaRequests(WebKitWebExtension* extension) {
    // For the life of the process, as the platform library is. The engine keeps the order of messages.
    [[maybe_unused]] static auto* requests = new MediaRequests(
        {[extension](const std::string& url, const Identify& identify) {
             webkit_web_extension_send_message_to_context(
                 extension,
                 webkit_user_message_new(kMediaRequestMessage, g_variant_new_bytestring(url.c_str())),
                 nullptr, onReply, new Identify(identify));
         },
         [extension](const std::string& url, const std::string& cookie) {
             webkit_web_extension_send_message_to_context(
                 extension,
                 webkit_user_message_new(kMediaCookieMessage,
                                         g_variant_new("(^ay^ay)", url.c_str(), cookie.c_str())),
                 nullptr, nullptr, nullptr);
         }});
}

} // namespace desktop
