// The keys of a WebDriver session: to the page, as those of the remote control, or to the television.
#include "desktop/window/webkit/extension/SessionKeys.h"

#include <webkit2/webkit-web-extension.h>

#include <cstdint>

#include "desktop/window/shared/PageScript.h"
#include "desktop/window/webkit/extension/PageFunctions.h"
#include "desktop/window/webkit/extension/ViewerMessages.h"

namespace desktop {

namespace {

// The object that scripts/sessionkeys.js takes from the window object.
constexpr char kRemoteObject[] = "telixTvRemote";

gboolean isKeyOfPages(guint group, gpointer) {
    return (keySetOfPages() & group) != 0;
}

void pressTelevisionKey(const char* name, gpointer page) {
    callWindow(*static_cast<uint64_t*>(page), "key", name);
}

void onWindowObjectCleared(WebKitScriptWorld* world, WebKitWebPage* page, WebKitFrame* frame, gpointer) {
    g_autoptr(JSCContext) context = webkit_frame_get_js_context_for_script_world(frame, world);
    g_autoptr(JSCValue) remote = jsc_value_new_object(context, nullptr, nullptr);
    g_autoptr(JSCValue) query = jsc_value_new_function(context, "isKeyOfPages", G_CALLBACK(isKeyOfPages),
                                                       nullptr, nullptr, G_TYPE_BOOLEAN, 1, G_TYPE_UINT);
    g_autoptr(JSCValue) press = jsc_value_new_function(
        context, "pressTelevisionKey", G_CALLBACK(pressTelevisionKey),
        new uint64_t(webkit_web_page_get_id(page)), [](gpointer id) { delete static_cast<uint64_t*>(id); },
        G_TYPE_NONE, 1, G_TYPE_STRING);
    jsc_value_object_set_property(remote, "isKeyOfPages", query);
    jsc_value_object_set_property(remote, "pressTelevisionKey", press);
    jsc_context_set_value(context, kRemoteObject, remote);
    g_autoptr(JSCValue) result = jsc_context_evaluate(context, sessionKeysScript().c_str(), -1);
}

} // namespace

void addSessionKeys() {
    g_signal_connect(webkit_script_world_get_default(), "window-object-cleared",
                     G_CALLBACK(onWindowObjectCleared), nullptr);
}

} // namespace desktop
