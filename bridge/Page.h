// One document with its instances of the plug-in: what the web process extension makes for each window object
// of a frame.
//
// The page script (scripts/page.js) watches the document and calls the page through the host object; the page
// calls back through the functions that the script has attached. The page ends with its document, or when the
// frame gets another window object. It is deleted later, from the main loop, when neither the plug-in nor
// script can be using it. Main thread only.
#ifndef TELIX_BRIDGE_PAGE_H
#define TELIX_BRIDGE_PAGE_H

#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>

#include "bridge/Instance.h"
#include "bridge/Objects.h"
#include "bridge/ScriptEngine.h"
#include "bridge/Streams.h"
#include "bridge/Variants.h"

namespace bridge {

class Plugin;

class Page : public ScriptEngine::Client, public std::enable_shared_from_this<Page> {
public:
    using MakeEngine = std::function<std::unique_ptr<ScriptEngine>(ScriptEngine::Client&)>;

    // The plug-in outlives the page. `idPrefix`: how the ids begin that elements without one get before the
    // plug-in sees them; empty if they get none. The page script does not run yet.
    static std::shared_ptr<Page> create(Plugin& plugin, const std::string& idPrefix,
                                        const MakeEngine& makeEngine);
    ~Page() override;

    // Runs the page script, before any script of the page's own. False when it does not run.
    bool start();
    // Ends the instances now, or from the main loop when the plug-in is on the stack, and the engine from the
    // main loop. Does nothing the second time.
    void end();

    ScriptEngine& engine() const { return *m_engine; }
    Streams& streams() { return m_streams; }
    Plugin& plugin() const { return m_plugin; }

    // The window of the page with a reference for the caller; null when the page has ended.
    NPObject* window();
    NPObject* retainedObjectFor(ScriptHandle object) override;

    // For the host object.
    // A new instance; its number, or 0 when the plug-in refuses it.
    uint32_t createInstance(NPObject* element, const std::string& mimeType,
                            const std::vector<Instance::Parameter>& parameters);
    std::shared_ptr<Instance> instance(uint32_t number) const;
    // Now, or from the main loop when the plug-in is on the stack.
    void endInstance(uint32_t number);
    // The script's functions by name; replaces what was there.
    void attachScript(NPObject* functions);

    // Calls one of these functions. False when there is none, when it throws, and when the page has ended.
    bool callScript(const char* function, const Arguments& arguments);
    bool callScript(const char* function, const Arguments& arguments, NPVariant* result);

    // Reports what the page is not told, see `warn` in scripts/page.js.
    void warn(const char* what, const std::string& subject);

private:
    Page(Plugin& plugin, std::string idPrefix)
        : m_plugin(plugin), m_idPrefix(std::move(idPrefix)), m_streams(*this) {}

    void endInstances();
    void close();

    Plugin& m_plugin;
    const std::string m_idPrefix;
    std::unique_ptr<ScriptEngine> m_engine;
    std::unique_ptr<ScriptObjects> m_scriptObjects;
    Streams m_streams;
    std::shared_ptr<Instance> m_host; // owns the host object; no instance of the plug-in
    NPObject* m_script = nullptr;
    std::map<uint32_t, std::shared_ptr<Instance>> m_instances;
    uint32_t m_lastNumber = 0;
    bool m_hasEnded = false;
};

// Runs the function from the main loop, when the plug-in is not on the stack.
void runWithoutPlugin(std::function<void()> function);

} // namespace bridge

#endif
