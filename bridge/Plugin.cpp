// The plug-in: its file, its two function tables, and what it says of itself.
#include "bridge/Plugin.h"

#include <atomic>

#include <gmodule.h>

#include "bridge/BrowserFunctions.h"
#include "bridge/CallDepth.h"

namespace bridge {

namespace {

// What posted calls belong to: grows with each plug-in that ends, so that calls from before find another
// number.
std::atomic<unsigned> currentGeneration{0};

struct PostedCall {
    void (*function)(void*);
    void* data;
    unsigned generation;
};

gboolean runPostedCall(gpointer data) {
    const auto* const call = static_cast<PostedCall*>(data);
    if (call->generation == currentGeneration) {
        const CallDepth depth;
        call->function(call->data);
    }
    return G_SOURCE_REMOVE;
}

std::string_view takeUpTo(std::string_view& text, char separator) {
    const size_t end = text.find(separator);
    const std::string_view taken = text.substr(0, end);
    text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
    return taken;
}

template <typename Function>
bool findSymbol(GModule* module, const char* name, Function& function) {
    gpointer symbol = nullptr;
    const bool isFound = g_module_symbol(module, name, &symbol);
    function = reinterpret_cast<Function>(symbol);
    return isFound && symbol;
}

} // namespace

std::vector<MimeType> readMimeDescription(std::string_view text) {
    std::vector<MimeType> types;
    while (!text.empty()) {
        std::string_view entry = takeUpTo(text, ';');
        const std::string_view type = takeUpTo(entry, ':');
        const std::string_view suffixes = takeUpTo(entry, ':');
        if (!type.empty()) {
            types.push_back({std::string(type), std::string(suffixes), std::string(entry)});
        }
    }
    return types;
}

std::unique_ptr<Plugin> Plugin::load(const std::string& file, std::string& error) {
    GModule* const module = g_module_open(file.c_str(), G_MODULE_BIND_LOCAL);
    if (!module) {
        error = g_module_error();
        return nullptr;
    }
    g_module_make_resident(module);
    PluginEntries entries = {};
    findSymbol(module, "NP_GetValue", entries.getValue);
    if (!findSymbol(module, "NP_Initialize", entries.initialize) ||
        !findSymbol(module, "NP_Shutdown", entries.shutdown) ||
        !findSymbol(module, "NP_GetMIMEDescription", entries.mimeDescription)) {
        error = "not a browser plug-in, the entry points are missing";
        return nullptr;
    }
    auto plugin = initialize(entries, error);
    if (plugin) {
        plugin->m_fileName = file.substr(file.rfind('/') + 1);
    }
    return plugin;
}

std::unique_ptr<Plugin> Plugin::initialize(const PluginEntries& entries, std::string& error) {
    std::unique_ptr<Plugin> plugin(new Plugin(entries));
    plugin->m_calls.size = sizeof(NPPluginFuncs);
    plugin->m_calls.version = (NP_VERSION_MAJOR << 8) | NP_VERSION_MINOR;
    const NPError result = entries.initialize(browserFunctions(), &plugin->m_calls);
    if (result != NPERR_NO_ERROR) {
        error = "the plug-in refuses, error " + std::to_string(result);
        plugin->m_entries.shutdown = nullptr;
        return nullptr;
    }
    // The size that it writes says nothing: some plug-ins know that of another machine. What is missing is
    // null.
    if (!plugin->m_calls.newp || !plugin->m_calls.destroy) {
        error = "the plug-in's function table is incomplete";
        return nullptr;
    }
    const char* const types = entries.mimeDescription();
    plugin->m_mimeTypes = readMimeDescription(types ? types : "");
    plugin->m_name = plugin->askForText(NPPVpluginNameString);
    plugin->m_description = plugin->askForText(NPPVpluginDescriptionString);
    return plugin;
}

Plugin::~Plugin() {
    currentGeneration++;
    if (m_entries.shutdown) {
        m_entries.shutdown();
    }
}

std::string Plugin::askForText(NPPVariable variable) const {
    const char* text = nullptr;
    if (!m_entries.getValue || m_entries.getValue(nullptr, variable, &text) != NPERR_NO_ERROR || !text) {
        return {};
    }
    return text;
}

void Plugin::postCall(void (*function)(void*), void* data) {
    if (function) {
        g_idle_add_full(G_PRIORITY_DEFAULT, runPostedCall, new PostedCall{function, data, currentGeneration},
                        [](gpointer call) { delete static_cast<PostedCall*>(call); });
    }
}

} // namespace bridge
