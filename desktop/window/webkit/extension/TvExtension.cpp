// The television's web process extension, beside the bridge. All of it runs on the main thread of the web
// process.
#include <unistd.h>
#include <webkit2/webkit-web-extension.h>

#include "desktop/window/webkit/extension/ControlForwarder.h"
#include "desktop/window/webkit/extension/FrameSender.h"
#include "desktop/window/webkit/extension/MediaForwarder.h"
#include "desktop/window/webkit/extension/PageFunctions.h"
#include "desktop/window/webkit/extension/SessionKeys.h"
#include "desktop/window/webkit/extension/SoundSender.h"
#include "desktop/window/webkit/extension/ViewerMessages.h"
#include "desktop/window/webkit/extension/WarningForwarder.h"

namespace desktop {

namespace {

// An inherited descriptor from the window; -1 if there is none.
int descriptorFrom(GVariant* data, const char* name) {
    gint32 descriptor = -1;
    if (data && g_variant_is_of_type(data, G_VARIANT_TYPE_VARDICT)) {
        g_variant_lookup(data, name, "i", &descriptor);
    }
    return descriptor;
}

// Whether a WebDriver session controls the pages.
bool isAutomated(GVariant* data) {
    gboolean automation = FALSE;
    if (data && g_variant_is_of_type(data, G_VARIANT_TYPE_VARDICT)) {
        g_variant_lookup(data, "automation", "b", &automation);
    }
    return automation;
}

std::string stringFrom(GVariant* data, const char* name) {
    const char* text = nullptr;
    if (data && g_variant_is_of_type(data, G_VARIANT_TYPE_VARDICT)) {
        g_variant_lookup(data, name, "&s", &text);
    }
    return text ? text : "";
}

TelevisionStart startFrom(GVariant* data) {
    TelevisionStart start;
    start.signalUrl = stringFrom(data, "signal");
    if (data && g_variant_is_of_type(data, G_VARIANT_TYPE_VARDICT)) {
        g_variant_lookup(data, "signal-channel", "u", &start.signalChannel);
        g_variant_lookup(data, "tune", "u", &start.channel);
        g_variant_lookup(data, "volume", "u", &start.volume);
    }
    return start;
}

// What the process prints goes to the window.
void redirect(int descriptor, int inherited) {
    if (inherited >= 0) {
        dup2(inherited, descriptor);
    }
}

} // namespace

} // namespace desktop

extern "C" __attribute__((visibility("default"))) void
webkit_web_extension_initialize_with_user_data(WebKitWebExtension* extension, const GVariant* userData) {
    auto* const data = const_cast<GVariant*>(userData);
    desktop::redirect(STDOUT_FILENO, desktop::descriptorFrom(data, "output"));
    desktop::redirect(STDERR_FILENO, desktop::descriptorFrom(data, "errors"));
    desktop::addPageFunctions(desktop::descriptorFrom(data, "channel"));
    if (desktop::isAutomated(data)) {
        desktop::addSessionKeys();
    }
    desktop::sendFrames(extension);
    desktop::serveTelevision(extension, desktop::stringFrom(data, "plugin"), desktop::startFrom(data));
    desktop::forwardControlRequests(extension);
    desktop::forwardMediaRequests(extension);
    desktop::forwardWarnings(extension);
    desktop::sendSound(desktop::descriptorFrom(data, "sound"));
}
