// The script engine on the GObject API of JavaScriptCore, the only one that WPE WebKit exports: a plug-in
// object is a proxy whose traps call natives of the engine (scripts/gobject.js).
#ifndef TELIX_BRIDGE_GOBJECTENGINE_H
#define TELIX_BRIDGE_GOBJECTENGINE_H

#include <initializer_list>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include <jsc/jsc.h>

#include "bridge/ScriptEngine.h"

namespace bridge {

// Owns a reference to a GObject.
struct ReleaseGObject {
    void operator()(gpointer object) const { g_object_unref(object); }
};
template <typename Type>
using GObjectRef = std::unique_ptr<Type, ReleaseGObject>;
using ValueRef = GObjectRef<JSCValue>;

class GObjectEngine : public ScriptEngine {
public:
    // The client outlives the engine; a reference to the context is kept until close().
    GObjectEngine(JSCContext* context, Client& client);
    ~GObjectEngine() override;

    void close() override;
    ScriptHandle globalObject() const override;
    void protect(ScriptHandle object) override;
    void unprotect(ScriptHandle object) override;
    bool invoke(ScriptHandle object, NPIdentifier method, const NPVariant* args, uint32_t count,
                NPVariant* result) override;
    bool invokeDefault(ScriptHandle function, const NPVariant* args, uint32_t count,
                       NPVariant* result) override;
    bool construct(ScriptHandle constructor, const NPVariant* args, uint32_t count,
                   NPVariant* result) override;
    bool evaluate(ScriptHandle scope, const std::string& source, const char* name,
                  NPVariant* result) override;
    bool hasProperty(ScriptHandle object, NPIdentifier name) override;
    bool hasMethod(ScriptHandle object, NPIdentifier name) override;
    bool getProperty(ScriptHandle object, NPIdentifier name, NPVariant* result) override;
    bool setProperty(ScriptHandle object, NPIdentifier name, const NPVariant& value) override;
    bool removeProperty(ScriptHandle object, NPIdentifier name) override;
    bool enumerate(ScriptHandle object, std::vector<NPIdentifier>& names) override;

private:
    class Wrapper;
    class Registry;
    struct Native;
    struct Target;

    // The functions of the page part of the script.
    struct PageFunctions {
        ValueRef failed; // what the operations return when they fail
        ValueRef makeObject;
        ValueRef makeMethod;
        ValueRef invoke;
        ValueRef invokeDefault;
        ValueRef construct;
        ValueRef get;
        ValueRef set;
        ValueRef has;
        ValueRef hasMethod;
        ValueRef remove;
        ValueRef enumerate;
        ValueRef evaluate;
        ValueRef log;
    };

    // The natives, which the traps call.
    static void onCollected(GPtrArray* values, gpointer);
    static Target targetOf(GPtrArray* values);
    static JSCValue* onRead(GPtrArray* values, gpointer);
    static JSCValue* onWrite(GPtrArray* values, gpointer);
    static JSCValue* onHas(GPtrArray* values, gpointer);
    static JSCValue* onRemove(GPtrArray* values, gpointer);
    static JSCValue* onNames(GPtrArray* values, gpointer);
    static JSCValue* onCall(GPtrArray* values, gpointer);
    static JSCValue* onCallDefault(GPtrArray* values, gpointer);
    static JSCValue* onConstruct(GPtrArray* values, gpointer);
    template <typename Call>
    static JSCValue* callPlugin(GPtrArray* values, unsigned first, Call call);
    static std::unordered_map<uint64_t, Wrapper*>& wrappers();

    void runScript();

    // Values across the border.
    NPVariant toVariant(JSCValue* value);
    NPVariant objectToVariant(JSCValue* value);
    ValueRef toValue(const NPVariant& variant);
    ValueRef textValue(std::string_view text) const;
    ValueRef nameValue(NPIdentifier name) const;
    ValueRef scriptObjectFor(NPObject* object);
    ValueRef makeScriptObject(PluginObject& object);
    JSCValue* methodFunction(NPIdentifier name);

    // Calls of the page's functions. The context's exception is cleared after each.
    ValueRef call(const ValueRef& function, const std::vector<JSCValue*>& values);
    bool isTrue(const ValueRef& function, std::initializer_list<JSCValue*> values);
    bool run(const ValueRef& function, std::vector<JSCValue*> values, const NPVariant* args, uint32_t count,
             NPVariant* result);
    bool takeResult(ValueRef value, NPVariant* result);
    bool logException();

    GObjectRef<JSCContext> m_context; // null when closed
    Client& m_client;
    std::shared_ptr<Registry> m_registry;
    ValueRef m_global;
    ValueRef m_missing; // what a read returns when the name is not the plug-in's
    PageFunctions m_functions;
    std::unordered_map<NPIdentifier, ValueRef> m_methods;
};

} // namespace bridge

#endif
