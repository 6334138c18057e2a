// The requests of the control socket that come from the web process.
#include "desktop/window/webkit/ControlReceiver.h"

#include "desktop/window/webkit/Messages.h"

namespace desktop {

ControlReceiver::ControlReceiver(WebKitWebContext* context, ScriptedWindow& window)
    : m_context(WEBKIT_WEB_CONTEXT(g_object_ref(context))), m_commands(window) {
    g_signal_connect(
        m_context, "user-message-received",
        G_CALLBACK(+[](WebKitWebContext*, WebKitUserMessage* message, gpointer receiver) -> gboolean {
            return static_cast<ControlReceiver*>(receiver)->onMessage(message);
        }),
        this);
}

ControlReceiver::~ControlReceiver() {
    g_signal_handlers_disconnect_by_data(m_context, this);
    g_object_unref(m_context);
}

// Returns whether the message is a request. The web process is not trusted.
bool ControlReceiver::onMessage(WebKitUserMessage* message) {
    GVariant* parameters = webkit_user_message_get_parameters(message);
    if (g_strcmp0(webkit_user_message_get_name(message), kControlMessage) != 0 || !parameters ||
        !g_variant_is_of_type(parameters, G_VARIANT_TYPE_STRING)) {
        return false;
    }
    const std::shared_ptr<WebKitUserMessage> request(WEBKIT_USER_MESSAGE(g_object_ref(message)),
                                                     g_object_unref);
    m_commands.handle(g_variant_get_string(parameters, nullptr), [request](const std::string& response) {
        webkit_user_message_send_reply(
            request.get(), webkit_user_message_new(kControlMessage, g_variant_new_string(response.c_str())));
    });
    return true;
}

} // namespace desktop
