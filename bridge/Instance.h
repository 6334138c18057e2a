// One embedded object of the plug-in: the NPP, what the plug-in has asked for on its behalf, and its calls.
//
// The page owns its instances. Each object, timer and posted call of the plug-in that names the instance
// keeps the record after the page has let go of it, because the plug-in looks into an NPP after NPP_Destroy;
// find() gives null for one that is gone. Main thread only.
#ifndef TELIX_BRIDGE_INSTANCE_H
#define TELIX_BRIDGE_INSTANCE_H

#include <memory>
#include <set>
#include <string>
#include <unordered_set>
#include <vector>

#include "npapi/npfunctions.h"

namespace bridge {

class Page;
class PluginObject;
class ScriptEngine;
struct ScriptObject;

// The place of an element in the window, in CSS pixels, and what of it is visible.
struct Place {
    int x = 0;
    int y = 0;
    int width = 0;
    int height = 0;
    int clipLeft = 0;
    int clipTop = 0;
    int clipRight = 0;
    int clipBottom = 0;
};

class Instance : public std::enable_shared_from_this<Instance> {
public:
    using Parameter = std::pair<std::string, std::string>;

    // The instance of an NPP that the plug-in names; null for one that has ended and is gone, and for no NPP
    // at all.
    static std::shared_ptr<Instance> find(NPP npp);

    // `calls` outlives the instance. `element`: the script object of the element, of which a reference is
    // kept.
    Instance(Page& page, const NPPluginFuncs& calls, NPObject* element);
    Instance(const Instance&) = delete;
    Instance& operator=(const Instance&) = delete;
    ~Instance();

    // NPP_New with the attributes and parameters as they stand. When the plug-in refuses, the instance has
    // ended.
    bool start(const std::string& mimeType, const std::vector<Parameter>& parameters);
    // The object of NPPVpluginScriptableNPObject with a reference for the caller; null when there is none.
    NPObject* scriptableObject();
    void setWindow(const Place& place);
    // NPP_Destroy, after the streams and timers have ended and script has been cut off from the objects. Does
    // nothing the second time. The plug-in must not be on the stack.
    void end();
    // Cuts script off from the objects; the first part of end(), for when the plug-in is on the stack.
    void disconnect();

    NPP npp() { return &m_npp; }
    // Both null from disconnect() on.
    Page* page() const { return m_page; }
    ScriptEngine* engine() const;
    NPObject* element() const { return m_element; }
    const NPPluginFuncs& calls() const { return m_calls; }

    // What NPN_SetValue accepts: the plug-in paints nothing of its own here, in a window or without.
    NPError setValue(NPPVariable variable);

    // The timers of NPN_ScheduleTimer; 0 when there is none. They end with the instance. A repeating one has
    // a shortest interval.
    uint32_t scheduleTimer(uint32_t milliseconds, bool repeats, void (*function)(NPP, uint32_t));
    void unscheduleTimer(uint32_t timer);

    // For PluginObject.
    void add(PluginObject& object) { m_objects.insert(&object); }
    void remove(PluginObject& object) { m_objects.erase(&object); }
    // For ScriptObject.
    void addResult(ScriptObject& object) { m_results.insert(&object); }
    void removeResult(ScriptObject& object) { m_results.erase(&object); }

private:
    struct Timer;
    enum class State { New, Running, Refused, Ended };

    static int onTimer(void* data);
    void dropResults();

    NPP_t m_npp = {};
    const NPPluginFuncs& m_calls;
    Page* m_page;
    NPObject* m_element;
    State m_state = State::New;
    NPWindow m_window = {}; // the plug-in may keep the address
    std::unordered_set<PluginObject*> m_objects;
    std::unordered_set<ScriptObject*> m_results; // of scripts, which nobody else has
    std::set<uint32_t> m_timers;                 // sources of the main loop
};

} // namespace bridge

#endif
