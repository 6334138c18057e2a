// What the shared object shows to the browser: the four NP_* functions and the NPP_* gates, with the
// signatures and the meaning of the public plug-in interface (NPAPI). Browser thread only.
#ifndef TELIX_COMMON_PLUGINEXPORTS_H
#define TELIX_COMMON_PLUGINEXPORTS_H

#include "npapi/npfunctions.h"

#define TELIX_EXPORT __attribute__((visibility("default")))

extern "C" {

// Keeps the browser's table and fills in the plug-in's. Refuses a null table, a plug-in table that is too
// small (NPERR_INVALID_FUNCTABLE_ERROR) and another major version (NPERR_INCOMPATIBLE_VERSION_ERROR).
TELIX_EXPORT NPError NP_Initialize(NPNetscapeFuncs* browserFuncs, NPPluginFuncs* pluginFuncs);
// Name, description and flags of the plug-in, or of the instance `future` if it is not null.
TELIX_EXPORT NPError NP_GetValue(void* future, NPPVariable variable, void* value);
TELIX_EXPORT NPError NP_Shutdown();
// Zero-terminated list of MIME types, valid for the life of the process.
TELIX_EXPORT const char* NP_GetMIMEDescription();

TELIX_EXPORT NPError NPP_Initialize();
TELIX_EXPORT const char* NPP_GetMIMEDescription();
TELIX_EXPORT void NPP_Shutdown();
TELIX_EXPORT NPError NPP_GetValue(NPP instance, NPPVariable variable, void* value);
TELIX_EXPORT NPError NPP_SetValue(NPP instance, NPNVariable variable, void* value);
TELIX_EXPORT NPError NPP_New(NPMIMEType mimeType, NPP instance, uint16_t mode, int16_t argc, char* argn[],
                             char* argv[], NPSavedData* saved);
TELIX_EXPORT NPError NPP_Destroy(NPP instance, NPSavedData** saved);
TELIX_EXPORT NPError NPP_SetWindow(NPP instance, NPWindow* window);
TELIX_EXPORT NPError NPP_NewStream(NPP instance, NPMIMEType type, NPStream* stream, NPBool seekable,
                                   uint16_t* stype);
TELIX_EXPORT NPError NPP_DestroyStream(NPP instance, NPStream* stream, NPReason reason);
TELIX_EXPORT int32_t NPP_WriteReady(NPP instance, NPStream* stream);
TELIX_EXPORT int32_t NPP_Write(NPP instance, NPStream* stream, int32_t offset, int32_t length, void* buffer);
TELIX_EXPORT void NPP_StreamAsFile(NPP instance, NPStream* stream, const char* fileName);
TELIX_EXPORT void NPP_Print(NPP instance, NPPrint* printInfo);
TELIX_EXPORT int16_t NPP_HandleEvent(NPP instance, void* event);
TELIX_EXPORT void NPP_URLNotify(NPP instance, const char* url, NPReason reason, void* notifyData);

} // extern "C"

#endif
