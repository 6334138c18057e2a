// The plug-in's file: whether it is one, and which MIME types it handles.
#include "desktop/window/shared/PluginFile.h"

#include <dlfcn.h>
#include <glib.h>

namespace desktop {

namespace {

// The description has the form `type:suffixes:description;type:suffixes:description;`.
std::vector<std::string> mimeTypesOf(const char* mimeDescription) {
    std::vector<std::string> types;
    g_auto(GStrv) entries = g_strsplit(mimeDescription, ";", -1);
    for (char** entry = entries; *entry; ++entry) {
        g_auto(GStrv) fields = g_strsplit(*entry, ":", 2);
        const char* type = fields[0] ? g_strstrip(fields[0]) : "";
        if (*type) {
            types.emplace_back(type);
        }
    }
    return types;
}

} // namespace

PluginFile::PluginFile(const std::string& file) {
    g_autofree char* path = g_canonicalize_filename(file.c_str(), nullptr);
    m_path = path;
    if (!g_file_test(path, G_FILE_TEST_IS_REGULAR)) {
        m_failure = "No such file";
        return;
    }
    load();
}

void PluginFile::load() {
    // The reference is kept, because an idle callback of the plug-in may run after the engine has closed
    // the library.
    void* library = dlopen(m_path.c_str(), RTLD_LAZY | RTLD_LOCAL);
    if (!library) {
        m_failure = dlerror();
        return;
    }
    for (const char* name : {"NP_Initialize", "NP_Shutdown", "NP_GetValue", "NP_GetMIMEDescription"}) {
        if (!dlsym(library, name)) {
            m_failure = std::string("not an NPAPI plug-in, ") + name + " is missing";
            return;
        }
    }
    const auto mimeDescription = reinterpret_cast<const char* (*)()>(dlsym(library, "NP_GetMIMEDescription"));
    m_mimeTypes = mimeTypesOf(mimeDescription());
}

std::string PluginFile::styleSheet(const std::string& declarations) const {
    std::string style;
    for (const auto& type : m_mimeTypes) {
        style += "object[type=\"" + type + "\" i], embed[type=\"" + type + "\" i] { " + declarations + " }\n";
    }
    return style;
}

} // namespace desktop
