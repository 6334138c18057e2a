// The elements of pages by the objects of the platform library that present for them.
#include "desktop/window/webkit/extension/PresenterElements.h"

#include <string>
#include <utility>

namespace desktop {

namespace {

// What the bridge takes from the window object, see bridge/scripts/page.js.
constexpr char kObserver[] = "telixBridgeObserver";

// The element as a value of another world; null if it is not one of the frame's.
JSCValue* valueInWorld(WebKitFrame* frame, JSCValue* element, WebKitScriptWorld* world) {
    // Deprecated without a replacement. The engine keeps the node for the life of the page unless the
    // reference is given back, although it is not the caller's.
    G_GNUC_BEGIN_IGNORE_DEPRECATIONS
    WebKitDOMNode* node = webkit_dom_node_for_js_value(element);
    JSCValue* value =
        node ? webkit_frame_get_js_value_for_dom_object_in_script_world(frame, WEBKIT_DOM_OBJECT(node), world)
             : nullptr;
    G_GNUC_END_IGNORE_DEPRECATIONS
    g_clear_object(&node);
    return value;
}

} // namespace

// The observer of one window object, which owns it.
class PresenterElements::Window {
public:
    Window(PresenterElements& elements, WebKitFrame* frame) : m_elements(elements) {
        g_weak_ref_init(&m_frame, frame);
    }
    // Within a garbage collection, in which no script may run. Has presenters if the window has gone without
    // its events.
    ~Window() {
        for (const auto& [instance, presenter] : m_presenters) {
            m_elements.removeLater(presenter);
        }
        g_weak_ref_clear(&m_frame);
    }
    Window(const Window&) = delete;
    Window& operator=(const Window&) = delete;

    // Called by the bridge, see bridge/scripts/page.js.
    static void onInstance(JSCValue* element, const char* event, double instance, gpointer window) {
        auto& self = *static_cast<Window*>(window);
        const std::string name = event;
        if (name == "creating") {
            self.m_elements.onCreating();
        } else if (name == "created") {
            self.onCreated(element, instance);
        } else if (name == "destroyed") {
            const auto node = self.m_presenters.extract(instance);
            if (!node.empty()) {
                self.m_elements.remove(node.mapped());
            }
        }
    }

private:
    void onCreated(JSCValue* element, double instance) {
        auto* frame = static_cast<WebKitFrame*>(g_weak_ref_get(&m_frame));
        if (const uint64_t presenter = m_elements.onCreated(frame, element)) {
            m_presenters.emplace(instance, presenter);
        }
        g_clear_object(&frame);
    }

    PresenterElements& m_elements;
    GWeakRef m_frame;
    std::map<double, uint64_t> m_presenters; // by the number that the bridge gives an instance
};

PresenterElements::PresenterElements(std::function<void(uint64_t presenter)> onGone)
    : m_onGone(std::move(onGone)), m_world(webkit_script_world_new_with_name("telix-tv")) {
    g_signal_connect(webkit_script_world_get_default(), "window-object-cleared",
                     G_CALLBACK(onWindowObjectCleared), this);
}

void PresenterElements::onWindowObjectCleared(WebKitScriptWorld* defaultWorld, WebKitWebPage*,
                                              WebKitFrame* frame, gpointer self) {
    g_autoptr(JSCContext) context = webkit_frame_get_js_context_for_script_world(frame, defaultWorld);
    auto* window = new Window(*static_cast<PresenterElements*>(self), frame);
    g_autoptr(JSCValue) observer = jsc_value_new_function(
        context, kObserver, G_CALLBACK(Window::onInstance), window,
        [](gpointer data) { delete static_cast<Window*>(data); }, G_TYPE_NONE, 3, JSC_TYPE_VALUE,
        G_TYPE_STRING, G_TYPE_DOUBLE);
    jsc_context_set_value(context, kObserver, observer);
}

// 0 also for a library without this function.
uint64_t PresenterElements::newestPresenter() {
    if (!m_newest && m_library.find()) {
        m_library.bind("telix_desktop_newest_presenter", m_newest);
    }
    return m_newest ? m_newest() : 0;
}

void PresenterElements::onCreating() {
    m_before.push_back(newestPresenter());
}

// Returns the number of the element's object; 0 if it has none. An instance that was made within the making
// of this one has got its element already.
uint64_t PresenterElements::onCreated(WebKitFrame* frame, JSCValue* element) {
    if (m_before.empty()) {
        return 0;
    }
    const uint64_t before = m_before.back();
    m_before.pop_back();
    uint64_t presenter = newestPresenter();
    while (presenter > before && m_elements.count(presenter) > 0) {
        presenter--;
    }
    JSCValue* value = presenter > before && frame ? valueInWorld(frame, element, m_world) : nullptr;
    if (!value) {
        return 0;
    }
    m_elements.emplace(presenter, value);
    return presenter;
}

void PresenterElements::remove(uint64_t presenter) {
    const auto node = m_elements.extract(presenter);
    if (!node.empty()) {
        m_onGone(presenter);
        g_object_unref(node.mapped());
    }
}

void PresenterElements::removeLater(uint64_t presenter) {
    using Left = std::pair<PresenterElements*, uint64_t>;
    g_idle_add_full(
        G_PRIORITY_DEFAULT,
        [](gpointer data) -> gboolean {
            const auto& [elements, presenter] = *static_cast<Left*>(data);
            elements->remove(presenter);
            return G_SOURCE_REMOVE;
        },
        new Left(this, presenter), [](gpointer data) { delete static_cast<Left*>(data); });
}

JSCValue* PresenterElements::find(uint64_t presenter) const {
    const auto found = m_elements.find(presenter);
    return found == m_elements.end() ? nullptr : found->second;
}

} // namespace desktop
