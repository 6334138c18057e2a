// The road from the browser's class record to a wrapper's virtual operations, and the operations' own bodies.
#include "common/JSPluginBase.h"

#include "common/Log.h"

JSPluginBase::~JSPluginBase() = default;

void JSPluginBase::Invalidate() {
    PLUGIN_LOG(COMMON, " JSPluginBase class\n");
}

bool JSPluginBase::HasMethod(NPIdentifier) {
    PLUGIN_LOG(COMMON, " JSPluginBase class\n");
    return false;
}

bool JSPluginBase::Invoke(NPIdentifier, const NPVariant*, unsigned int, NPVariant*) {
    PLUGIN_LOG(COMMON, " JSPluginBase class\n");
    return false;
}

bool JSPluginBase::InvokeDefault(const NPVariant*, unsigned int, NPVariant*) {
    PLUGIN_LOG(COMMON, " JSPluginBase class\n");
    return false;
}

bool JSPluginBase::HasProperty(NPIdentifier) {
    PLUGIN_LOG(COMMON, " JSPluginBase class\n");
    return false;
}

bool JSPluginBase::GetProperty(NPIdentifier, NPVariant* result) {
    PLUGIN_LOG(COMMON, " JSPluginBase class\n");
    result->type = NPVariantType_Void;
    return false;
}

bool JSPluginBase::SetProperty(NPIdentifier, const NPVariant*) {
    PLUGIN_LOG(COMMON, " JSPluginBase class\n");
    return false;
}

// quirk 2: no wrapper lets script delete, enumerate or construct.
bool JSPluginBase::RemoveProperty(NPIdentifier) {
    PLUGIN_LOG(COMMON, " JSPluginBase class\n");
    return false;
}

bool JSPluginBase::Enumerate(NPIdentifier**, unsigned int*) {
    PLUGIN_LOG(COMMON, " JSPluginBase class\n");
    return false;
}

bool JSPluginBase::Construct(const NPVariant*, unsigned int, NPVariant*) {
    PLUGIN_LOG(COMMON, " JSPluginBase class\n");
    return false;
}

namespace {

JSPluginBase* wrapperOf(NPObject* object) {
    return static_cast<JSPluginBase*>(object);
}

} // namespace

void JSPluginBase::_Deallocate(NPObject* object) {
    if (object) {
        deleteAfterCalls(*wrapperOf(object));
    }
}

void JSPluginBase::_Invalidate(NPObject* object) {
    wrapperOf(object)->Invalidate();
}

bool JSPluginBase::_HasMethod(NPObject* object, NPIdentifier name) {
    return wrapperOf(object)->HasMethod(name);
}

bool JSPluginBase::_Invoke(NPObject* object, NPIdentifier name, const NPVariant* args, unsigned int argCount,
                           NPVariant* result) {
    JSPluginBase* wrapper = wrapperOf(object);
    const CallGuard guard(*wrapper);
    return wrapper->Invoke(name, args, argCount, result);
}

bool JSPluginBase::_InvokeDefault(NPObject* object, const NPVariant* args, unsigned int argCount,
                                  NPVariant* result) {
    JSPluginBase* wrapper = wrapperOf(object);
    const CallGuard guard(*wrapper);
    return wrapper->InvokeDefault(args, argCount, result);
}

bool JSPluginBase::_HasProperty(NPObject* object, NPIdentifier name) {
    return wrapperOf(object)->HasProperty(name);
}

bool JSPluginBase::_GetProperty(NPObject* object, NPIdentifier name, NPVariant* result) {
    JSPluginBase* wrapper = wrapperOf(object);
    const CallGuard guard(*wrapper);
    return wrapper->GetProperty(name, result);
}

bool JSPluginBase::_SetProperty(NPObject* object, NPIdentifier name, const NPVariant* value) {
    JSPluginBase* wrapper = wrapperOf(object);
    const CallGuard guard(*wrapper);
    return wrapper->SetProperty(name, value);
}

bool JSPluginBase::_RemoveProperty(NPObject* object, NPIdentifier name) {
    return wrapperOf(object)->RemoveProperty(name);
}

bool JSPluginBase::_Enumerate(NPObject* object, NPIdentifier** names, unsigned int* count) {
    return wrapperOf(object)->Enumerate(names, count);
}

bool JSPluginBase::_Construct(NPObject* object, const NPVariant* args, unsigned int argCount,
                              NPVariant* result) {
    return wrapperOf(object)->Construct(args, argCount, result);
}
