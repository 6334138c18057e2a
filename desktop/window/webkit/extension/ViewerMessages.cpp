// The messages between the window's remote control and the platform library.
#include "desktop/window/webkit/extension/ViewerMessages.h"

#include "desktop/platform/telix_viewer.h"
#include "desktop/window/shared/PlatformLibrary.h"
#include "desktop/window/shared/RemoteControl.h"
#include "desktop/window/webkit/Messages.h"

namespace desktop {

namespace {

// The platform library has no notification of a channel change for the window.
constexpr guint kChannelIntervalSeconds = 1;

// The functions of telix_viewer.h.
class Viewer {
public:
    // Whether the library is loaded and has the functions.
    bool find() {
        return m_library.find() && m_library.bind("telix_desktop_key_set", keySet) &&
               m_library.bind("telix_desktop_channel", channel) &&
               m_library.bind("telix_desktop_channel_count", channelCount) &&
               m_library.bind("telix_desktop_tune", tune);
    }

    telix_desktop_key_set_function keySet = nullptr;
    telix_desktop_channel_function channel = nullptr;
    telix_desktop_channel_count_function channelCount = nullptr;
    telix_desktop_tune_function tune = nullptr;

private:
    PlatformLibrary m_library;
};

Viewer& viewer() {
    static Viewer viewer;
    return viewer;
}

// After the last channel follows the first.
void step(gint32 positions) {
    const auto count = static_cast<gint64>(viewer().channelCount());
    if (count > 0) {
        const gint64 index = (static_cast<gint64>(viewer().channel()) - 1 + positions) % count;
        viewer().tune(static_cast<uint32_t>((index + count) % count + 1));
    }
}

gboolean onMessage(WebKitWebPage*, WebKitUserMessage* message, gpointer) {
    const char* name = webkit_user_message_get_name(message);
    GVariant* parameters = webkit_user_message_get_parameters(message);
    const bool isFound = viewer().find();
    if (g_str_equal(name, kKeySetMessage)) {
        GVariant* keySet = isFound ? g_variant_new_uint32(viewer().keySet()) : nullptr;
        webkit_user_message_send_reply(message, webkit_user_message_new(kKeySetMessage, keySet));
    } else if (g_str_equal(name, kTuneMessage)) {
        if (isFound) {
            viewer().tune(g_variant_get_uint32(parameters));
        }
    } else if (g_str_equal(name, kStepMessage)) {
        if (isFound) {
            step(g_variant_get_int32(parameters));
        }
    } else {
        return FALSE;
    }
    return TRUE;
}

gboolean reportChannel(gpointer extension) {
    static uint32_t reported = 0;
    const uint32_t channel = viewer().find() ? viewer().channel() : 0;
    if (channel != reported) {
        reported = channel;
        webkit_web_extension_send_message_to_context(
            WEBKIT_WEB_EXTENSION(extension),
            webkit_user_message_new(kChannelMessage, g_variant_new_uint32(channel)), nullptr, nullptr,
            nullptr);
    }
    return G_SOURCE_CONTINUE;
}

} // namespace

void answerViewerMessages(WebKitWebExtension* extension) {
    g_signal_connect(extension, "page-created", G_CALLBACK(+[](WebKitWebExtension*, WebKitWebPage* page) {
                         g_signal_connect(page, "user-message-received", G_CALLBACK(onMessage), nullptr);
                     }),
                     nullptr);
    g_timeout_add_seconds(kChannelIntervalSeconds, reportChannel, extension);
}

uint32_t keySetOfPages() {
    return viewer().find() ? viewer().keySet() : kAllPageKeys;
}

} // namespace desktop
