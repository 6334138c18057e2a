// What the bridge needs of a JavaScript engine: values cross as NPVariants, script objects of the page as
// NPObjects and the plug-in's NPObjects as script objects. The two implementations are JscApiEngine (the
// engine's C API) and GObjectEngine (its GObject API with proxies); everything else of the bridge knows this
// interface alone.
//
// One engine belongs to one page (the document of a frame) and is used on the main thread only. It works
// until close(); the page deletes it later, when neither the plug-in nor script that the plug-in has called
// is on the stack. All engines of a process are of the same kind.
#ifndef TELIX_BRIDGE_SCRIPTENGINE_H
#define TELIX_BRIDGE_SCRIPTENGINE_H

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "npapi/npruntime.h"

namespace bridge {

class PluginObject;

// A script object of the page in the form of the engine that handed it out. It is the identity of the object
// as well: as long as an engine protects it, equal handles mean the same object.
struct OpaqueScriptValue;
using ScriptHandle = OpaqueScriptValue*;

// The script object that stands for one of the plug-in's. Its PluginObject owns this record; script owns the
// script object. Deleting the record cuts the two: the script object stays with whoever holds it, and each
// use of it throws (PluginObject::kEndedText).
//
// For its part the script object asks the PluginObject (read, write, call, construct, remove, names) and
// reports its own garbage collection with PluginObject::scriptObjectCollected(), at most once.
class ScriptWrapper {
public:
    ScriptWrapper() : m_serial(++lastSerial) {}
    ScriptWrapper(const ScriptWrapper&) = delete;
    ScriptWrapper& operator=(const ScriptWrapper&) = delete;
    virtual ~ScriptWrapper() = default;

    // Keeps the script object alive, although no script may hold it: the plug-in holds the NPObject too, and
    // may give it to script again, which has to get the same object with the names that it has added. False
    // when the script object has been collected; a fresh wrapper is in order then. A new wrapper is strong.
    virtual bool makeStrong() = 0;
    // Leaves the script object to the garbage collection from now on.
    virtual void makeWeak() = 0;

    // No two wrappers of a process have the same.
    uint64_t serial() const { return m_serial; }

private:
    static inline uint64_t lastSerial = 0;
    uint64_t m_serial;
};

class ScriptEngine {
public:
    // The engine's own way to the identities of the page; the page implements it.
    class Client {
    public:
        virtual ~Client() = default;
        // The NPObject of a script object of the page that is not a plug-in object's, with one reference for
        // the caller; null when the page has ended. The same handle gives the same NPObject while the plug-in
        // holds it.
        virtual NPObject* retainedObjectFor(ScriptHandle object) = 0;
    };

    ScriptEngine() = default;
    ScriptEngine(const ScriptEngine&) = delete;
    ScriptEngine& operator=(const ScriptEngine&) = delete;
    virtual ~ScriptEngine() = default;

    // Lets go of everything in the page. Each call from then on fails.
    virtual void close() = 0;

    // The window, owned by the engine; null when closed.
    virtual ScriptHandle globalObject() const = 0;
    // Keeps a script object alive, and its handle valid, from protect() to unprotect(). Pairs nest.
    virtual void protect(ScriptHandle object) = 0;
    virtual void unprotect(ScriptHandle object) = 0;

    // The operations of the plug-in on script objects of the page. True when done; `result` then owns what it
    // holds (see releaseVariant()). False, with `result` void, when there is no such thing, when script
    // throws, and when closed. What script throws is reported to the page like an uncaught exception, because
    // the plug-in has no means to take it.
    virtual bool invoke(ScriptHandle object, NPIdentifier method, const NPVariant* args, uint32_t count,
                        NPVariant* result) = 0;
    virtual bool invokeDefault(ScriptHandle function, const NPVariant* args, uint32_t count,
                               NPVariant* result) = 0;
    virtual bool construct(ScriptHandle constructor, const NPVariant* args, uint32_t count,
                           NPVariant* result) = 0;
    // Runs a program in the scope of the window with `scope` as `this`. `source` is UTF-8; `name` stands for
    // it in the messages of the page's console. The result is that of the last expression.
    virtual bool evaluate(ScriptHandle scope, const std::string& source, const char* name,
                          NPVariant* result) = 0;
    virtual bool hasProperty(ScriptHandle object, NPIdentifier name) = 0;
    // Whether the property is a function.
    virtual bool hasMethod(ScriptHandle object, NPIdentifier name) = 0;
    virtual bool getProperty(ScriptHandle object, NPIdentifier name, NPVariant* result) = 0;
    virtual bool setProperty(ScriptHandle object, NPIdentifier name, const NPVariant& value) = 0;
    virtual bool removeProperty(ScriptHandle object, NPIdentifier name) = 0;
    // The enumerable names, inherited ones included, as `for (name in object)` gives them.
    virtual bool enumerate(ScriptHandle object, std::vector<NPIdentifier>& names) = 0;

    // How a value of the plug-in reaches script, for both implementations:
    //  - a script object's NPObject (see ScriptObject) is the script object; one whose page has ended is
    //  null;
    //  - another NPObject is the script object of its PluginObject::of(), which the engine makes when there
    //  is none and
    //    gives to PluginObject::setWrapper(). It is made in the page of its instance, PluginObject::engine();
    //    for an object that has ended (no engine) script gets an object of which each use throws;
    //  - strings are UTF-8 with each invalid sequence replaced, never ended by a zero inside.
    // How a value of script reaches the plug-in: numbers are doubles, strings are UTF-8 with lone surrogates
    // replaced and stand in malloc()'s memory followed by a zero; a symbol or big integer is void. How the
    // names of a plug-in object behave: they come before the script object's own, methods are functions that
    // exist once per page and name and find their object by `this` (the script object or what inherits from
    // it, such as an element). Names that the plug-in does not have are the page's to add.
};

} // namespace bridge

#endif
