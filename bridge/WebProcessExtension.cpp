// The web process extension: loads the plug-in and makes a Page for each window object of each frame.
// Compiled once for WebKitGTK and once for WPE WebKit. All of it runs on the main thread of the web process.
#include <dlfcn.h>

#include <cstdio>
#include <memory>
#include <string>
#include <unordered_map>

#if TELIX_BRIDGE_WPE
#include <wpe/webkit-web-extension.h>
#else
#include <webkit2/webkit-web-extension.h>
#endif

#include "bridge/GObjectEngine.h"
#include "bridge/Page.h"
#include "bridge/Plugin.h"
#if !TELIX_BRIDGE_WPE
#include "bridge/JscApiEngine.h"
#endif

namespace bridge {

namespace {

constexpr char kProgram[] = "telix-webkit-bridge";
constexpr char kDefaultPluginFile[] = "nptelixjs.so";

// Initialisation data, a dictionary of strings, and the environment variables that stand for its entries.
struct Setting {
    const char* key;
    const char* variable;
};
constexpr Setting kPluginSetting = {"plugin", "TELIX_PLUGIN"};
// "gobject" selects the GObject API where the C API is the default.
constexpr Setting kEngineSetting = {"engine", "TELIX_BRIDGE_ENGINE"};
constexpr char kGObjectEngine[] = "gobject";
// How the ids begin that elements without one get.
constexpr Setting kIdsSetting = {"ids", "TELIX_BRIDGE_IDS"};

std::string readSetting(GVariant* data, const Setting& setting) {
    const gchar* text = nullptr;
    if (data && g_variant_is_of_type(data, G_VARIANT_TYPE_VARDICT) &&
        g_variant_lookup(data, setting.key, "&s", &text)) {
        return text;
    }
    text = g_getenv(setting.variable);
    return text ? text : "";
}

// The folder of this library.
std::string ownFolder() {
    Dl_info info = {};
    if (!dladdr(reinterpret_cast<void*>(ownFolder), &info) || !info.dli_fname) {
        return ".";
    }
    const std::string file = info.dli_fname;
    return file.substr(0, file.rfind('/'));
}

// The pages of a web process.
class Extension {
public:
    Extension(std::unique_ptr<Plugin> plugin, std::string idPrefix, bool usesGObjectEngine)
        : m_plugin(std::move(plugin)), m_idPrefix(std::move(idPrefix)),
          m_usesGObjectEngine(usesGObjectEngine) {}

    void onWindowObjectCleared(WebKitFrame* frame, WebKitScriptWorld* world);

private:
    static void onFrameGone(gpointer extension, GObject* frame);
    void endPage(WebKitFrame* frame);
    std::unique_ptr<ScriptEngine> makeEngine(WebKitFrame* frame, WebKitScriptWorld* world,
                                             ScriptEngine::Client& client) const;

    std::unique_ptr<Plugin> m_plugin;
    std::string m_idPrefix;
    bool m_usesGObjectEngine;
    std::unordered_map<WebKitFrame*, std::shared_ptr<Page>> m_pages; // the current one of each frame
};

std::unique_ptr<ScriptEngine> Extension::makeEngine(WebKitFrame* frame, WebKitScriptWorld* world,
                                                    ScriptEngine::Client& client) const {
#if !TELIX_BRIDGE_WPE
    if (!m_usesGObjectEngine) {
        // Deprecated for the GObject API, which has no way to the C API's context.
        G_GNUC_BEGIN_IGNORE_DEPRECATIONS
        const JSGlobalContextRef context = webkit_frame_get_javascript_context_for_script_world(frame, world);
        G_GNUC_END_IGNORE_DEPRECATIONS
        return std::make_unique<JscApiEngine>(context, client);
    }
#endif
    const GObjectRef<JSCContext> context(webkit_frame_get_js_context_for_script_world(frame, world));
    return std::make_unique<GObjectEngine>(context.get(), client);
}

void Extension::onWindowObjectCleared(WebKitFrame* frame, WebKitScriptWorld* world) {
    endPage(frame);
    const auto page = Page::create(*m_plugin, m_idPrefix, [&](ScriptEngine::Client& client) {
        return makeEngine(frame, world, client);
    });
    if (page->start()) {
        m_pages.emplace(frame, page);
        g_object_weak_ref(G_OBJECT(frame), onFrameGone, this);
    } else {
        page->end();
    }
}

void Extension::endPage(WebKitFrame* frame) {
    const auto node = m_pages.extract(frame);
    if (!node.empty()) {
        g_object_weak_unref(G_OBJECT(frame), onFrameGone, this);
        node.mapped()->end();
    }
}

void Extension::onFrameGone(gpointer extension, GObject* frame) {
    const auto node =
        static_cast<Extension*>(extension)->m_pages.extract(reinterpret_cast<WebKitFrame*>(frame));
    if (!node.empty()) {
        node.mapped()->end();
    }
}

std::unique_ptr<Plugin> loadPlugin(GVariant* data) {
    std::string file = readSetting(data, kPluginSetting);
    if (file.empty()) {
        file = ownFolder() + '/' + kDefaultPluginFile;
    }
    std::string error;
    auto plugin = Plugin::load(file, error);
    if (!plugin) {
        // The loader names the file itself.
        const bool isNamed = error.compare(0, file.size() + 1, file + ':') == 0;
        std::fprintf(stderr, "%s: %s%s%s\n", kProgram, isNamed ? "" : file.c_str(), isNamed ? "" : ": ",
                     error.c_str());
    }
    return plugin;
}

} // namespace

} // namespace bridge

extern "C" __attribute__((visibility("default"))) void
webkit_web_extension_initialize_with_user_data(WebKitWebExtension*, const GVariant* userData) {
    auto* const data = const_cast<GVariant*>(userData);
    // The process ends without flushing what the plug-in has printed.
    std::setvbuf(stdout, nullptr, _IOLBF, 0);
    auto plugin = bridge::loadPlugin(data);
    if (!plugin) {
        return;
    }
    const bool usesGObjectEngine =
        bridge::readSetting(data, bridge::kEngineSetting) == bridge::kGObjectEngine;
    // For the life of the process, as the plug-in's own threads and main loop sources are.
    auto* const extension = new bridge::Extension(
        std::move(plugin), bridge::readSetting(data, bridge::kIdsSetting), usesGObjectEngine);
    // After other extensions, which may leave an observer for the page script.
    g_signal_connect_after(
        webkit_script_world_get_default(), "window-object-cleared",
        G_CALLBACK(+[](WebKitScriptWorld* world, WebKitWebPage*, WebKitFrame* frame, gpointer data) {
            static_cast<bridge::Extension*>(data)->onWindowObjectCleared(frame, world);
        }),
        extension);
}
