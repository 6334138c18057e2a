// Shows the video where the page puts its element: on the window's video plane or painted by the page.
#include "desktop/window/webkit/extension/VideoPlacement.h"

#include <memory>
#include <string>
#include <utility>

#include "desktop/window/shared/PageScript.h"
#include "desktop/window/webkit/FramePainting.h"
#include "desktop/window/webkit/Messages.h"

namespace desktop {

namespace {

constexpr char kScript[] = "scripts/videoplacement.js";
// Of the document, for CSS.
constexpr char kCanvasName[] = "telix-video";

int integerProperty(JSCValue* object, const char* name) {
    g_autoptr(JSCValue) value = jsc_value_object_get_property(object, name);
    return jsc_value_to_int32(value);
}

double aspectOf(const telix_desktop_frame& frame) {
    if (frame.aspectWidth > 0 && frame.aspectHeight > 0) {
        return double(frame.aspectWidth) / frame.aspectHeight;
    }
    return frame.width > 0 && frame.height > 0 ? double(frame.width) / frame.height : 16.0 / 9;
}

// `image` is an ImageData.
void fill(JSCValue* image, const telix_desktop_frame& frame) {
    const int width = integerProperty(image, "width");
    const int height = integerProperty(image, "height");
    g_autoptr(JSCValue) data = jsc_value_object_get_property(image, "data");
    gsize length = 0;
    auto* pixels = static_cast<uint8_t*>(jsc_value_typed_array_get_data(data, &length));
    if (pixels && width > 0 && height > 0 && length == gsize(width) * gsize(height) * 4) {
        fillImage(pixels, width, height, frame);
    }
}

} // namespace

// A message to the window on its way.
struct VideoPlacement::Request {
    VideoPlacement* placement;
    unsigned number;
    bool isInPage;
};

VideoPlacement::VideoPlacement(WebKitWebExtension* extension, FramePublisher& publisher)
    : m_extension(extension), m_publisher(publisher), m_elements([this](uint64_t presenter) {
          if (presenter == m_presenter) {
              stop();
          }
      }) {
    m_publisher.setOnChange([this] { onChange(); });
}

// One message at a time: a page that is busy paints the newest frame.
void VideoPlacement::onChange() {
    if (m_isPosted.exchange(true)) {
        return;
    }
    g_idle_add_full(
        G_PRIORITY_DEFAULT,
        [](gpointer self) -> gboolean {
            static_cast<VideoPlacement*>(self)->m_isPosted = false;
            static_cast<VideoPlacement*>(self)->update();
            return G_SOURCE_REMOVE;
        },
        this, nullptr);
}

void VideoPlacement::update() {
    if (!m_source.find()) {
        return;
    }
    m_source.refresh();
    const uint64_t presenter = m_source.frame().presenter;
    const bool isFullScreen = m_source.frame().fullScreen != 0;
    m_source.drop();
    if (presenter != m_presenter || isFullScreen != m_isFullScreen) {
        stop();
        start(presenter, isFullScreen);
    } else if (m_isWatched) {
        paint();
    }
}

void VideoPlacement::start(uint64_t presenter, bool isFullScreen) {
    m_presenter = presenter;
    m_isFullScreen = isFullScreen;
    JSCValue* element = m_elements.find(presenter);
    // Full screen lies behind the page, whatever the element.
    if (isFullScreen || !element) {
        return;
    }
    JSCContext* context = jsc_value_get_context(element);
    const std::string source = resourceText(kScript);
    g_autoptr(JSCValue) function = jsc_context_evaluate(context, source.c_str(), gssize(source.size()));
    g_autoptr(JSCValue) canvasName = jsc_value_new_string(context, kCanvasName);
    g_autoptr(JSCValue) host = newHost(context);
    m_script = jsc_value_function_call(function, JSC_TYPE_VALUE, element, JSC_TYPE_VALUE, canvasName,
                                       JSC_TYPE_VALUE, host, G_TYPE_NONE);
    g_autoptr(JSCValue) result = jsc_value_object_invoke_method(m_script, "start", G_TYPE_NONE);
}

JSCValue* VideoPlacement::newHost(JSCContext* context) {
    JSCValue* host = jsc_value_new_object(context, nullptr, nullptr);
    const auto add = [&](const char* name, JSCValue* function) {
        jsc_value_object_set_property(host, name, function);
        g_object_unref(function);
    };
    const auto call = +[](gpointer self) { static_cast<VideoPlacement*>(self)->paint(); };
    add("paint", jsc_value_new_function(context, "paint", G_CALLBACK(call), this, nullptr, G_TYPE_NONE, 0));
    const auto watch = +[](gboolean on, gpointer self) { static_cast<VideoPlacement*>(self)->watch(on); };
    add("watch", jsc_value_new_function(context, "watch", G_CALLBACK(watch), this, nullptr, G_TYPE_NONE, 1,
                                        G_TYPE_BOOLEAN));
    const auto set = +[](gboolean on, gpointer self) { static_cast<VideoPlacement*>(self)->setInPage(on); };
    add("setInPage", jsc_value_new_function(context, "setInPage", G_CALLBACK(set), this, nullptr, G_TYPE_NONE,
                                            1, G_TYPE_BOOLEAN));
    return host;
}

void VideoPlacement::stop() {
    m_presenter = 0;
    if (JSCValue* script = std::exchange(m_script, nullptr)) {
        g_autoptr(JSCValue) result = jsc_value_object_invoke_method(script, "stop", G_TYPE_NONE);
        g_object_unref(script);
        setInPage(false);
    }
}

// The newest frame, or black if there is none.
void VideoPlacement::paint() {
    m_source.refresh();
    const telix_desktop_frame& frame = m_source.frame();
    if (m_script && frame.presenter == m_presenter) {
        g_autoptr(JSCValue) image =
            jsc_value_object_invoke_method(m_script, "image", G_TYPE_DOUBLE, aspectOf(frame), G_TYPE_NONE);
        if (jsc_value_is_object(image)) {
            fill(image, frame);
            g_autoptr(JSCValue) result = jsc_value_object_invoke_method(m_script, "paint", G_TYPE_NONE);
        }
    }
    m_source.drop();
}

void VideoPlacement::watch(bool isWatched) {
    m_isWatched = isWatched;
    m_publisher.watch(isWatched ? m_presenter : 0);
}

// The connection keeps the order: what the page has drawn before arrives before the message, and what it
// draws after the reply arrives after the plane is shown.
void VideoPlacement::setInPage(bool isInPage) {
    if (!isInPage) {
        m_publisher.leaveOut(0);
    }
    auto* request = new Request{this, ++m_lastRequest, isInPage};
    const guint64 pagePresenter = isInPage ? m_presenter : 0;
    WebKitUserMessage* message =
        webkit_user_message_new(kPagePresenterMessage, g_variant_new("(t)", pagePresenter));
    webkit_web_extension_send_message_to_context(
        m_extension, message, nullptr,
        [](GObject* extension, GAsyncResult* result, gpointer data) {
            const std::unique_ptr<Request> request(static_cast<Request*>(data));
            WebKitUserMessage* reply = webkit_web_extension_send_message_to_context_finish(
                WEBKIT_WEB_EXTENSION(extension), result, nullptr);
            g_clear_object(&reply);
            request->placement->onWindowReply(request->number, request->isInPage);
        },
        request);
}

void VideoPlacement::onWindowReply(unsigned request, bool isInPage) {
    if (request != m_lastRequest || !m_script) {
        return;
    }
    if (isInPage) {
        m_publisher.leaveOut(m_presenter);
    } else {
        g_autoptr(JSCValue) result = jsc_value_object_invoke_method(m_script, "planeShown", G_TYPE_NONE);
    }
}

} // namespace desktop
