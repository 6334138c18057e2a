// The requests of the control socket, which is in the web process, on their way to the window.
#include "desktop/window/webkit/extension/ControlForwarder.h"

#include <memory>

#include "desktop/window/control/ControlSource.h"
#include "desktop/window/webkit/Messages.h"

namespace desktop {

namespace {

using Respond = ControlSource::Respond;

void onReply(GObject* extension, GAsyncResult* result, gpointer data) {
    const std::unique_ptr<Respond> respond(static_cast<Respond*>(data));
    WebKitUserMessage* reply =
        webkit_web_extension_send_message_to_context_finish(WEBKIT_WEB_EXTENSION(extension), result, nullptr);
    GVariant* parameters = reply ? webkit_user_message_get_parameters(reply) : nullptr;
    // A window that has not replied is given up by the library.
    if (parameters) {
        (*respond)(g_variant_get_string(parameters, nullptr));
    }
    g_clear_object(&reply);
}

} // namespace

void forwardControlRequests(WebKitWebExtension* extension) {
    // For the life of the process, as the platform library is.
    [[maybe_unused]] static auto* source =
        new ControlSource([extension](const std::string& line, const Respond& respond) {
            webkit_web_extension_send_message_to_context(
                extension, webkit_user_message_new(kControlMessage, g_variant_new_string(line.c_str())),
                nullptr, onReply, new Respond(respond));
        });
}

} // namespace desktop
