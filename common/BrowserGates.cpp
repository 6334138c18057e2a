// The gates to the browser, in the order of the browser's table.
#include "common/BrowserGates.h"

#include "common/Log.h"

NPNetscapeFuncs* NPNFuncs = nullptr;

NPError NPN_GetURL(NPP instance, const char* url, const char* target) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->geturl(instance, url, target);
}

NPError NPN_PostURL(NPP instance, const char* url, const char* target, uint32_t length, const char* buffer,
                    NPBool isFile) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->posturl(instance, url, target, length, buffer, isFile);
}

NPError NPN_RequestRead(NPStream* stream, NPByteRange* ranges) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->requestread(stream, ranges);
}

NPError NPN_NewStream(NPP instance, NPMIMEType type, const char* target, NPStream** stream) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->newstream(instance, type, target, stream);
}

int32_t NPN_Write(NPP instance, NPStream* stream, int32_t length, void* buffer) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->write(instance, stream, length, buffer);
}

NPError NPN_DestroyStream(NPP instance, NPStream* stream, NPReason reason) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->destroystream(instance, stream, reason);
}

void NPN_Status(NPP instance, const char* message) {
    PLUGIN_LOG(COMMON, " is called\n");
    NPNFuncs->status(instance, message);
}

const char* NPN_UserAgent(NPP instance) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->uagent(instance);
}

void* NPN_MemAlloc(uint32_t size) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->memalloc(size);
}

void NPN_MemFree(void* address) {
    PLUGIN_LOG(COMMON, " is called\n");
    NPNFuncs->memfree(address);
}

uint32_t NPN_MemFlush(uint32_t size) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->memflush(size);
}

void NPN_ReloadPlugins(NPBool reloadPages) {
    PLUGIN_LOG(COMMON, " is called\n");
    NPNFuncs->reloadplugins(reloadPages);
}

NPError NPN_GetURLNotify(NPP instance, const char* url, const char* target, void* notifyData) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->geturlnotify(instance, url, target, notifyData);
}

NPError NPN_PostURLNotify(NPP instance, const char* url, const char* target, uint32_t length,
                          const char* buffer, NPBool isFile, void* notifyData) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->posturlnotify(instance, url, target, length, buffer, isFile, notifyData);
}

NPError NPN_GetValue(NPP instance, NPNVariable variable, void* value) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->getvalue(instance, variable, value);
}

NPError NPN_SetValue(NPP instance, NPPVariable variable, void* value) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->setvalue(instance, variable, value);
}

void NPN_InvalidateRect(NPP instance, NPRect* rect) {
    PLUGIN_LOG(COMMON, " is called\n");
    NPNFuncs->invalidaterect(instance, rect);
}

void NPN_InvalidateRegion(NPP instance, NPRegion region) {
    PLUGIN_LOG(COMMON, " is called\n");
    NPNFuncs->invalidateregion(instance, region);
}

void NPN_ForceRedraw(NPP instance) {
    PLUGIN_LOG(COMMON, " is called\n");
    NPNFuncs->forceredraw(instance);
}

NPIdentifier NPN_GetStringIdentifier(const char* name) {
    PLUGIN_LOG(COMMON, " is called\n");
    if (!NPNFuncs->getstringidentifier) {
        return nullptr;
    }
    return NPNFuncs->getstringidentifier(name);
}

void NPN_GetStringIdentifiers(const char** names, unsigned int count, NPIdentifier* identifiers) {
    PLUGIN_LOG(COMMON, " is called\n");
    NPNFuncs->getstringidentifiers(names, count, identifiers);
}

NPIdentifier NPN_GetStringIdentifier(int value) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->getintidentifier(value);
}

bool NPN_IdentifierIsString(NPIdentifier identifier) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->identifierisstring(identifier);
}

char* NPN_UTF8FromIdentifier(NPIdentifier identifier) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->utf8fromidentifier(identifier);
}

int32_t NPN_IntFromIdentifier(NPIdentifier identifier) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->intfromidentifier(identifier);
}

NPObject* NPN_CreateObject(NPP instance, NPClass* objectClass) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->createobject(instance, objectClass);
}

NPObject* NPN_RetainObject(NPObject* object) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->retainobject(object);
}

void NPN_ReleaseObject(NPObject* object) {
    PLUGIN_LOG(COMMON, " is called\n");
    NPNFuncs->releaseobject(object);
}

bool NPN_Invoke(NPP instance, NPObject* object, NPIdentifier name, const NPVariant* args, uint32_t argCount,
                NPVariant* result) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->invoke(instance, object, name, args, argCount, result);
}

bool NPN_InvokeDefault(NPP instance, NPObject* object, const NPVariant* args, uint32_t argCount,
                       NPVariant* result) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->invokeDefault(instance, object, args, argCount, result);
}

bool NPN_Evaluate(NPP instance, NPObject* object, NPString* script, NPVariant* result) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->evaluate(instance, object, script, result);
}

bool NPN_GetProperty(NPP instance, NPObject* object, NPIdentifier name, NPVariant* result) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->getproperty(instance, object, name, result);
}

bool NPN_SetProperty(NPP instance, NPObject* object, NPIdentifier name, const NPVariant* value) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->setproperty(instance, object, name, value);
}

bool NPN_RemoveProperty(NPP instance, NPObject* object, NPIdentifier name) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->removeproperty(instance, object, name);
}

bool NPN_HasProperty(NPP instance, NPObject* object, NPIdentifier name) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->hasproperty(instance, object, name);
}

bool NPN_HasMethod(NPP instance, NPObject* object, NPIdentifier name) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPNFuncs->hasmethod(instance, object, name);
}

void NPN_ReleaseVariantValue(NPVariant* variant) {
    PLUGIN_LOG(COMMON, " is called\n");
    NPNFuncs->releasevariantvalue(variant);
}

void NPN_SetException(NPObject* object, const char* message) {
    PLUGIN_LOG(COMMON, " is called\n");
    NPNFuncs->setexception(object, message);
}

void NPN_PluginThreadAsyncCall(NPP instance, void (*function)(void*), void* data) {
    PLUGIN_LOG(COMMON, " is called\n");
    NPNFuncs->pluginthreadasynccall(instance, function, data);
}
