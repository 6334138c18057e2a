// The base of every object that a page script can touch: an NPObject whose table of plain functions leads to
// virtual operations. Browser thread only.
#ifndef TELIX_COMMON_JSPLUGINBASE_H
#define TELIX_COMMON_JSPLUGINBASE_H

#include "common/CallGuard.h"
#include "npapi/npruntime.h"

class JSPluginBase : public NPObject, public CallGuarded {
public:
    JSPluginBase(const JSPluginBase&) = delete;
    JSPluginBase& operator=(const JSPluginBase&) = delete;

    virtual ~JSPluginBase();
    virtual void Invalidate();
    virtual bool HasMethod(NPIdentifier name) = 0;
    virtual bool Invoke(NPIdentifier name, const NPVariant* args, unsigned int argCount,
                        NPVariant* result) = 0;
    virtual bool InvokeDefault(const NPVariant* args, unsigned int argCount, NPVariant* result) = 0;
    virtual bool HasProperty(NPIdentifier name) = 0;
    virtual bool GetProperty(NPIdentifier name, NPVariant* result) = 0;
    virtual bool SetProperty(NPIdentifier name, const NPVariant* value) = 0;
    virtual bool RemoveProperty(NPIdentifier name);
    virtual bool Enumerate(NPIdentifier** names, unsigned int* count);
    virtual bool Construct(const NPVariant* args, unsigned int argCount, NPVariant* result);

    // The functions of the class record. Each makes the virtual call of its name; _Deallocate of null does
    // nothing, and that of an object which a call is in waits for the call to return.
    static void _Deallocate(NPObject* object);
    static void _Invalidate(NPObject* object);
    static bool _HasMethod(NPObject* object, NPIdentifier name);
    static bool _Invoke(NPObject* object, NPIdentifier name, const NPVariant* args, unsigned int argCount,
                        NPVariant* result);
    static bool _InvokeDefault(NPObject* object, const NPVariant* args, unsigned int argCount,
                               NPVariant* result);
    static bool _HasProperty(NPObject* object, NPIdentifier name);
    static bool _GetProperty(NPObject* object, NPIdentifier name, NPVariant* result);
    static bool _SetProperty(NPObject* object, NPIdentifier name, const NPVariant* value);
    static bool _RemoveProperty(NPObject* object, NPIdentifier name);
    static bool _Enumerate(NPObject* object, NPIdentifier** names, unsigned int* count);
    static bool _Construct(NPObject* object, const NPVariant* args, unsigned int argCount, NPVariant* result);

    // The class record of the wrapper class `Wrapper`, whose constructor takes the NPP. All records are alike
    // but for the allocate function.
    template <class Wrapper>
    static NPClass* classOf();

protected:
    // The browser fills in the NPObject after the allocate function has returned.
    JSPluginBase() : NPObject{} {}
};

template <class Wrapper>
NPClass* JSPluginBase::classOf() {
    static NPClass record = {NP_CLASS_STRUCT_VERSION,
                             [](NPP npp, NPClass*) -> NPObject* { return new Wrapper(npp); },
                             _Deallocate,
                             _Invalidate,
                             _HasMethod,
                             _Invoke,
                             _InvokeDefault,
                             _HasProperty,
                             _GetProperty,
                             _SetProperty,
                             _RemoveProperty,
                             _Enumerate,
                             _Construct};
    return &record;
}

#endif
