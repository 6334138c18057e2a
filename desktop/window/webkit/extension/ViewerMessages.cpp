// The messages between the window's television and the platform library.
#include "desktop/window/webkit/extension/ViewerMessages.h"

#include <atomic>

#include "desktop/window/shared/LibrarySearch.h"
#include "desktop/window/shared/RemoteControl.h"
#include "desktop/window/webkit/Messages.h"
#include "desktop/window/webkit/SignallingMessage.h"

namespace desktop {

namespace {

// For the life of the process, as the platform library is.
TelevisionLibrary& library() {
    static auto* const kLibrary = new TelevisionLibrary;
    return *kLibrary;
}

// Set while a report is scheduled: at most one is.
std::atomic<bool> isReportScheduled{false};

gboolean reportSignalling(gpointer extension) {
    // Reset before the signalling is read, so that a change meanwhile schedules another report.
    isReportScheduled = false;
    webkit_web_extension_send_message_to_context(
        WEBKIT_WEB_EXTENSION(extension),
        webkit_user_message_new(kSignallingMessage, variantOf(library().signalling())), nullptr, nullptr,
        nullptr);
    return G_SOURCE_REMOVE;
}

// Threads of the library.
void onWakeup(void* extension) {
    if (!isReportScheduled.exchange(true)) {
        g_idle_add_full(G_PRIORITY_HIGH, reportSignalling, extension, nullptr);
    }
}

void replyWithChannel(WebKitUserMessage* message, const char* name, bool isFound) {
    GVariant* parameters = nullptr;
    if (isFound) {
        const TelevisionLibrary::Channel channel = library().channel();
        parameters = g_variant_new("(us)", channel.number, channel.name.c_str());
    }
    webkit_user_message_send_reply(message, webkit_user_message_new(name, parameters));
}

gboolean onMessage(WebKitWebPage*, WebKitUserMessage* message, gpointer) {
    const char* name = webkit_user_message_get_name(message);
    GVariant* parameters = webkit_user_message_get_parameters(message);
    const bool isFound = library().find();
    if (g_str_equal(name, kKeySetMessage)) {
        GVariant* keySet = isFound ? g_variant_new_uint32(library().keySet()) : nullptr;
        webkit_user_message_send_reply(message, webkit_user_message_new(kKeySetMessage, keySet));
    } else if (g_str_equal(name, kTuneMessage)) {
        if (isFound) {
            library().tune(g_variant_get_uint32(parameters));
        }
        replyWithChannel(message, kTuneMessage, isFound);
    } else if (g_str_equal(name, kStepMessage)) {
        if (isFound) {
            library().step(g_variant_get_int32(parameters));
        }
        replyWithChannel(message, kStepMessage, isFound);
    } else if (g_str_equal(name, kVolumeMessage)) {
        if (isFound) {
            library().setVolume(g_variant_get_uint32(parameters));
        }
    } else {
        return FALSE;
    }
    return TRUE;
}

} // namespace

void serveTelevision(WebKitWebExtension* extension, const std::string& plugin, const TelevisionStart& start) {
    g_signal_connect(extension, "page-created", G_CALLBACK(+[](WebKitWebExtension*, WebKitWebPage* page) {
                         g_signal_connect(page, "user-message-received", G_CALLBACK(onMessage), nullptr);
                     }),
                     nullptr);
    library().loadBeside(plugin);
    [[maybe_unused]] static auto* search = new LibrarySearch([extension, start] {
        if (!library().find()) {
            return false;
        }
        const std::string error = library().start(start, onWakeup, extension);
        if (!error.empty()) {
            g_printerr("telix-tv: %s\n", error.c_str());
        }
        return true;
    });
}

uint32_t keySetOfPages() {
    return library().find() ? library().keySet() : kAllPageKeys;
}

} // namespace desktop
