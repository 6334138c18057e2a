// The gates to the browser: one function per entry of the browser's table, with the public names. Each logs
// its call and jumps through the table; nothing is checked. Browser thread only, but for
// NPN_PluginThreadAsyncCall. Results and ownership are those of the public interface (NPAPI, npruntime).
#ifndef TELIX_COMMON_BROWSERGATES_H
#define TELIX_COMMON_BROWSERGATES_H

#include "npapi/npfunctions.h"

// The browser's own table, set by NP_Initialize and cleared by NP_Shutdown.
extern NPNetscapeFuncs* NPNFuncs;

NPError NPN_GetURL(NPP instance, const char* url, const char* target);
NPError NPN_PostURL(NPP instance, const char* url, const char* target, uint32_t length, const char* buffer,
                    NPBool isFile);
NPError NPN_RequestRead(NPStream* stream, NPByteRange* ranges);
NPError NPN_NewStream(NPP instance, NPMIMEType type, const char* target, NPStream** stream);
int32_t NPN_Write(NPP instance, NPStream* stream, int32_t length, void* buffer);
NPError NPN_DestroyStream(NPP instance, NPStream* stream, NPReason reason);
void NPN_Status(NPP instance, const char* message);
const char* NPN_UserAgent(NPP instance);
void* NPN_MemAlloc(uint32_t size);
void NPN_MemFree(void* address);
uint32_t NPN_MemFlush(uint32_t size);
void NPN_ReloadPlugins(NPBool reloadPages);
NPError NPN_GetURLNotify(NPP instance, const char* url, const char* target, void* notifyData);
NPError NPN_PostURLNotify(NPP instance, const char* url, const char* target, uint32_t length,
                          const char* buffer, NPBool isFile, void* notifyData);
NPError NPN_GetValue(NPP instance, NPNVariable variable, void* value);
NPError NPN_SetValue(NPP instance, NPPVariable variable, void* value);
void NPN_InvalidateRect(NPP instance, NPRect* rect);
void NPN_InvalidateRegion(NPP instance, NPRegion region);
void NPN_ForceRedraw(NPP instance);
// Null if the browser's table has no such entry; the only gate with a check.
NPIdentifier NPN_GetStringIdentifier(const char* name);
void NPN_GetStringIdentifiers(const char** names, unsigned int count, NPIdentifier* identifiers);
// The integer form: an overload, so that it logs under the same name.
NPIdentifier NPN_GetStringIdentifier(int value);
bool NPN_IdentifierIsString(NPIdentifier identifier);
// The caller owns the string.
char* NPN_UTF8FromIdentifier(NPIdentifier identifier);
int32_t NPN_IntFromIdentifier(NPIdentifier identifier);
NPObject* NPN_CreateObject(NPP instance, NPClass* objectClass);
NPObject* NPN_RetainObject(NPObject* object);
void NPN_ReleaseObject(NPObject* object);
bool NPN_Invoke(NPP instance, NPObject* object, NPIdentifier name, const NPVariant* args, uint32_t argCount,
                NPVariant* result);
bool NPN_InvokeDefault(NPP instance, NPObject* object, const NPVariant* args, uint32_t argCount,
                       NPVariant* result);
bool NPN_Evaluate(NPP instance, NPObject* object, NPString* script, NPVariant* result);
bool NPN_GetProperty(NPP instance, NPObject* object, NPIdentifier name, NPVariant* result);
bool NPN_SetProperty(NPP instance, NPObject* object, NPIdentifier name, const NPVariant* value);
bool NPN_RemoveProperty(NPP instance, NPObject* object, NPIdentifier name);
bool NPN_HasProperty(NPP instance, NPObject* object, NPIdentifier name);
bool NPN_HasMethod(NPP instance, NPObject* object, NPIdentifier name);
void NPN_ReleaseVariantValue(NPVariant* variant);
void NPN_SetException(NPObject* object, const char* message);
// The one gate for other threads: has `function(data)` run on the browser thread.
void NPN_PluginThreadAsyncCall(NPP instance, void (*function)(void*), void* data);

#endif
