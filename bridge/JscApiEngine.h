// The script engine on the C API of JavaScriptCore: a plug-in object is an object of a JSClass, so that its
// names are looked up by the engine itself, without script in between.
#ifndef TELIX_BRIDGE_JSCAPIENGINE_H
#define TELIX_BRIDGE_JSCAPIENGINE_H

#include <unordered_map>

#include <JavaScriptCore/JavaScript.h>

#include "bridge/ScriptEngine.h"

namespace bridge {

class JscApiEngine : public ScriptEngine {
public:
    // Both outlive the engine; the context is retained until close().
    JscApiEngine(JSGlobalContextRef context, Client& client);
    ~JscApiEngine() override;

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
    struct Link;
    struct Method;

    // Calls of script into plug-in objects, in the form of the JSClass.
    static JSClassRef wrapperClass(bool isFunction);
    static JSValueRef onGet(JSContextRef context, JSObjectRef object, JSStringRef name,
                            JSValueRef* exception);
    static bool onSet(JSContextRef context, JSObjectRef object, JSStringRef name, JSValueRef value,
                      JSValueRef* exception);
    static bool onDelete(JSContextRef context, JSObjectRef object, JSStringRef name, JSValueRef* exception);
    static void onNames(JSContextRef context, JSObjectRef object, JSPropertyNameAccumulatorRef names);
    static JSValueRef onCall(JSContextRef context, JSObjectRef function, JSObjectRef self, size_t count,
                             const JSValueRef values[], JSValueRef* exception);
    static JSObjectRef onConstruct(JSContextRef context, JSObjectRef constructor, size_t count,
                                   const JSValueRef values[], JSValueRef* exception);
    static JSValueRef onMethod(JSContextRef context, JSObjectRef function, JSObjectRef self, size_t count,
                               const JSValueRef values[], JSValueRef* exception);
    static void onFinalize(JSObjectRef object);
    template <typename Call>
    static JSValueRef callPlugin(JSContextRef context, const Link& link, size_t count,
                                 const JSValueRef values[], JSValueRef* exception, Call call);
    static Link& linkOf(JSObjectRef object);
    static Link* findLink(JSContextRef context, JSObjectRef object);
    static Link* findLinkBehind(JSContextRef context, JSObjectRef object);
    static std::unordered_map<JSObjectRef, Method>& methods();

    // Values across the border.
    NPVariant toVariant(JSValueRef value);
    JSValueRef toValue(const NPVariant& variant);
    JSObjectRef scriptObjectFor(NPObject* object);
    JSObjectRef makeScriptObject(PluginObject& object);
    JSObjectRef methodFunction(NPIdentifier name);
    bool takeResult(JSValueRef value, JSValueRef exception, JSObjectRef report, NPVariant* result);

    JSGlobalContextRef m_context; // null when closed
    Client& m_client;
    JSObjectRef m_reportError = nullptr; // the page's, as it was before page script
    JSObjectRef m_logError = nullptr;    // console.error, likewise
    JSObjectRef m_makeWeak = nullptr;    // object => new WeakRef(object)
    JSObjectRef m_fromWeak = nullptr;    // reference => reference.deref()
    std::unordered_map<NPIdentifier, JSObjectRef> m_methods;
};

} // namespace bridge

#endif
