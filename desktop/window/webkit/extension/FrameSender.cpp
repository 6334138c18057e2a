// The television's web process extension, beside the bridge: sends the window the video frames of the
// platform library that the plug-in loads, unless the page paints them. All of it runs on the main thread of
// the web process, unless it says otherwise.
#include <gio/gunixfdlist.h>
#include <webkit2/webkit-web-extension.h>

#include "desktop/window/frames/FramePublisher.h"
#include "desktop/window/frames/FrameRing.h"
#include "desktop/window/shared/LibrarySearch.h"
#include "desktop/window/webkit/Messages.h"
#include "desktop/window/webkit/extension/VideoPlacement.h"

namespace desktop {

namespace {

// A message on its way to the main thread.
struct Message {
    WebKitWebExtension* extension;
    WebKitUserMessage* message; // floating
};

gboolean sendMessage(gpointer data) {
    const auto* message = static_cast<Message*>(data);
    webkit_web_extension_send_message_to_context(message->extension, message->message, nullptr, nullptr,
                                                 nullptr);
    return G_SOURCE_REMOVE;
}

// Any thread.
void sendRing(WebKitWebExtension* extension, int memory, int wakeup) {
    GUnixFDList* descriptors = g_unix_fd_list_new();
    GError* error = nullptr;
    if (g_unix_fd_list_append(descriptors, memory, &error) == -1 ||
        g_unix_fd_list_append(descriptors, wakeup, &error) == -1) {
        g_printerr("telix-tv: frames: %s\n", error->message);
        g_error_free(error);
    } else {
        auto* message = new Message{
            extension, webkit_user_message_new_with_fd_list(kFramesMessage, nullptr, descriptors)};
        g_idle_add_full(G_PRIORITY_HIGH, sendMessage, message,
                        [](gpointer data) { delete static_cast<Message*>(data); });
    }
    g_object_unref(descriptors);
}

// Where frames go: what the message for a screenshot brings up to date.
struct Frames {
    FramePublisher& publisher;
    VideoPlacement& placement;
};

gboolean onMessage(WebKitWebPage*, WebKitUserMessage* message, gpointer data) {
    if (!g_str_equal(webkit_user_message_get_name(message), kNewestFrameMessage)) {
        return FALSE;
    }
    auto* frames = static_cast<Frames*>(data);
    frames->publisher.publishNewest();
    frames->placement.update();
    webkit_user_message_send_reply(message, webkit_user_message_new(kNewestFrameMessage, nullptr));
    return TRUE;
}

void onPageCreated(WebKitWebExtension*, WebKitWebPage* page, gpointer frames) {
    g_signal_connect(page, "user-message-received", G_CALLBACK(onMessage), frames);
}

} // namespace

void sendFrames(WebKitWebExtension* extension) {
    // For the life of the process, as the platform library is.
    auto* publisher =
        new FramePublisher([extension](int memory, int wakeup) { sendRing(extension, memory, wakeup); });
    auto* frames = new Frames{*publisher, *new VideoPlacement(extension, *publisher)};
    g_signal_connect(extension, "page-created", G_CALLBACK(onPageCreated), frames);
    [[maybe_unused]] static auto* search = new LibrarySearch([publisher] { return publisher->start(); });
}

} // namespace desktop
