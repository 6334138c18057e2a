// NPObjects: their life, and the identity of each on both sides. An NPObject is either the plug-in's
// (PluginObject keeps the account of it) or stands for a script object of a page (ScriptObject).
//
// References. The plug-in counts its own with NPN_RetainObject and NPN_ReleaseObject. While script has an
// object of the plug-in, the PluginObject holds one reference more for it; it goes when the script object has
// been garbage collected or the instance has ended. While the plug-in holds a ScriptObject, that protects its
// script object. Main thread only, but for PluginObject::scriptObjectCollected().
#ifndef TELIX_BRIDGE_OBJECTS_H
#define TELIX_BRIDGE_OBJECTS_H

#include <memory>
#include <string>
#include <unordered_map>
#include <vector>

#include "bridge/ScriptEngine.h"
#include "npapi/npruntime.h"

namespace bridge {

class Arguments;
class Instance;

// A new object of the plug-in's with one reference for the caller; null when the class's allocate function
// refuses, or when there is no such instance.
NPObject* createObject(NPP npp, NPClass* objectClass);
// Both do nothing for null. The last reference deletes the object with its class's deallocate function.
NPObject* retainObject(NPObject* object);
void releaseObject(NPObject* object);

// What the bridge knows of an object of the plug-in: the instance that it belongs to and its script object.
// It exists from NPN_CreateObject until the object is deleted.
class PluginObject {
public:
    // What script is told that uses the object after its instance.
    static const char kEndedText[];
    // What script is told that calls a method on what is not, and does not inherit from, an object.
    static const char kNoObjectText[];

    // The record of an object that is not a ScriptObject. The plug-in made it with NPN_CreateObject; one that
    // it made otherwise is treated as if it had ended.
    static PluginObject& of(NPObject* object);

    PluginObject(NPObject* object, std::shared_ptr<Instance> instance);
    PluginObject(const PluginObject&) = delete;
    PluginObject& operator=(const PluginObject&) = delete;
    ~PluginObject();

    // For script. Failed: an exception with takeError() as its text is to be thrown.
    enum class Read { Missing, Value, Method, Failed };
    // The value goes to `result`, owned by the caller; void unless the answer is Value.
    Read read(NPIdentifier name, NPVariant* result);
    // Whether the object has that property or method.
    bool has(NPIdentifier name);
    // Missing: the name is not the plug-in's, so that script may have it for itself.
    enum class Write { Missing, Done, Failed };
    Write write(NPIdentifier name, const NPVariant& value);
    // Whether the object had the name and has let go of it.
    bool remove(NPIdentifier name);
    std::vector<NPIdentifier> names();
    // False: throw takeError(). `result` as in read().
    bool call(NPIdentifier method, const Arguments& arguments, NPVariant* result);
    bool callDefault(const Arguments& arguments, NPVariant* result);
    bool construct(const Arguments& arguments, NPVariant* result);
    // Whether script may call the object itself and use it with `new`: it has no names, so that it is nothing
    // but a function. An object with names is no function to `typeof`, although its class may have the
    // entries for both, as all classes of some plug-ins do.
    bool isFunction() const;
    // The text of the last failure.
    static std::string takeError();

    // For the engine, which alone looks into its wrapper; null when script has no object for it.
    ScriptWrapper* wrapper() const { return m_wrapper.get(); }
    // Script has the object now. Replaces what was there.
    void setWrapper(std::unique_ptr<ScriptWrapper> wrapper);
    // That of the page of its instance; null when the instance has ended.
    ScriptEngine* engine() const;
    // The script object of the wrapper with that serial number is garbage. Any thread, also in the middle of
    // a collection: the reference of script is released on a later turn of the main loop, if it is still
    // held.
    static void scriptObjectCollected(NPObject* object, uint64_t wrapperSerial);

    NPObject* object() const { return m_object; }

    // For Instance: it has ended. Cuts the script object off; the NPObject stays with the plug-in. May delete
    // this.
    void end();
    // For this module: the NPObject is about to be deleted.
    void cut() { m_wrapper = nullptr; }
    // The number of references has changed: the wrapper is strong while the plug-in holds one.
    void updateHold();
    // For this module: script has let go of the wrapper with that serial number, if it is still the current
    // one.
    void wrapperCollected(uint64_t serial);

private:
    class Use;

    void dropWrapper();
    template <typename Call>
    bool run(NPVariant* result, Call call);
    void warnOfRefusal(NPIdentifier method, const Arguments& arguments) const;
    bool finish(bool done, NPVariant* result);

    NPObject* m_object;
    std::shared_ptr<Instance> m_instance; // null when the instance has ended
    std::unique_ptr<ScriptWrapper> m_wrapper;
    bool m_isStrong = false;
};

// What the plug-in gives to NPN_SetException: thrown when its current call returns to script.
void setPendingException(const char* text);

// A script object of a page as the plug-in has it. The class's functions are NPN_Invoke and the like on it.
struct ScriptObject : NPObject {
    ScriptEngine* engine; // null when it has been cut off
    ScriptHandle handle;  // the same
    class ScriptObjects* table;
    Instance* evaluatedFor; // which alone has it, as the result of a script; else null

    // Null for an object of the plug-in.
    static ScriptObject* from(NPObject* object);

    // From now on, or no longer with null, the object ends with the instance unless the plug-in has retained
    // it: plug-ins forget to release results.
    void setEvaluatedFor(Instance* instance);
    // Cuts it off from the page; the plug-in may keep and release it.
    void cutOff();
};

// The ScriptObjects of a page, each once.
class ScriptObjects {
public:
    explicit ScriptObjects(ScriptEngine& engine) : m_engine(engine) {}
    ScriptObjects(const ScriptObjects&) = delete;
    ScriptObjects& operator=(const ScriptObjects&) = delete;
    ~ScriptObjects() { end(); }

    // With one reference for the caller.
    NPObject* retained(ScriptHandle handle);
    // Cuts all of them off from the page; the plug-in may keep and release them.
    void end();
    void remove(ScriptHandle handle) { m_objects.erase(handle); }

private:
    ScriptEngine& m_engine;
    std::unordered_map<ScriptHandle, ScriptObject*> m_objects;
};

} // namespace bridge

#endif
