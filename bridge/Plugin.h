// The plug-in: its file, its two function tables, and what it says of itself. One for the process; main
// thread only.
#ifndef TELIX_BRIDGE_PLUGIN_H
#define TELIX_BRIDGE_PLUGIN_H

#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "npapi/npfunctions.h"

namespace bridge {

struct MimeType {
    std::string type;
    std::string suffixes;
    std::string description;
};

// What a plug-in file exports.
struct PluginEntries {
    NPError (*initialize)(NPNetscapeFuncs* browser, NPPluginFuncs* plugin);
    NPError (*shutdown)();
    const char* (*mimeDescription)();
    NPError (*getValue)(void* future, NPPVariable variable, void* value); // may be null
};

class Plugin {
public:
    // Loads and initialises a plug-in. On failure null, and in `error` the reason. The file stays loaded for
    // good, because threads and main loop of its own may still run through it.
    static std::unique_ptr<Plugin> load(const std::string& file, std::string& error);
    // The same with entries that are there already.
    static std::unique_ptr<Plugin> initialize(const PluginEntries& entries, std::string& error);

    Plugin(const Plugin&) = delete;
    Plugin& operator=(const Plugin&) = delete;
    // NP_Shutdown; calls that are posted and have not run are dropped. All pages have ended.
    ~Plugin();

    const NPPluginFuncs& calls() const { return m_calls; }
    const std::string& name() const { return m_name; }
    const std::string& description() const { return m_description; }
    const std::vector<MimeType>& mimeTypes() const { return m_mimeTypes; }
    // The last part of the file's name; empty for a plug-in without a file.
    const std::string& fileName() const { return m_fileName; }

    // NPN_PluginThreadAsyncCall: runs the function on the main thread in a later turn of GLib's default main
    // loop, whatever has become of the instance that it was posted for, as long as there is a plug-in. Any
    // thread.
    static void postCall(void (*function)(void*), void* data);

private:
    explicit Plugin(const PluginEntries& entries) : m_entries(entries) {}

    std::string askForText(NPPVariable variable) const;

    PluginEntries m_entries;
    NPPluginFuncs m_calls = {};
    std::string m_name;
    std::string m_description;
    std::string m_fileName;
    std::vector<MimeType> m_mimeTypes;
};

// Reads the text of NP_GetMIMEDescription: entries of type, suffixes and description with colons between,
// each ended by a semicolon. Entries without a type are left out.
std::vector<MimeType> readMimeDescription(std::string_view text);

} // namespace bridge

#endif
