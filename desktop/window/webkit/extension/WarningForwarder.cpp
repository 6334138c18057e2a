// What the bridge reports of pages, on its way to the window.
#include "desktop/window/webkit/extension/WarningForwarder.h"

#include <cstdint>

#include "desktop/window/webkit/Messages.h"

namespace desktop {

namespace {

// The function that the bridge takes from the window object.
constexpr char kReporter[] = "telixBridgeReporter";

struct Reporter {
    WebKitWebExtension* extension;
    uint64_t page;
};

void report(const char* name, const char* subject, gpointer data) {
    const auto* reporter = static_cast<Reporter*>(data);
    g_autofree char* validName = g_utf8_make_valid(name, -1);
    g_autofree char* validSubject = g_utf8_make_valid(subject, -1);
    webkit_web_extension_send_message_to_context(
        reporter->extension,
        webkit_user_message_new(kWarningMessage,
                                g_variant_new("(tss)", reporter->page, validName, validSubject)),
        nullptr, nullptr, nullptr);
}

void onWindowObjectCleared(WebKitScriptWorld* world, WebKitWebPage* page, WebKitFrame* frame,
                           gpointer extension) {
    g_autoptr(JSCContext) context = webkit_frame_get_js_context_for_script_world(frame, world);
    g_autoptr(JSCValue) reporter = jsc_value_new_function(
        context, kReporter, G_CALLBACK(report),
        new Reporter{WEBKIT_WEB_EXTENSION(extension), webkit_web_page_get_id(page)},
        [](gpointer data) { delete static_cast<Reporter*>(data); }, G_TYPE_NONE, 2, G_TYPE_STRING,
        G_TYPE_STRING);
    jsc_context_set_value(context, kReporter, reporter);
}

} // namespace

void forwardWarnings(WebKitWebExtension* extension) {
    g_signal_connect(webkit_script_world_get_default(), "window-object-cleared",
                     G_CALLBACK(onWindowObjectCleared), extension);
}

} // namespace desktop
