/* The function tables that browser and plug-in exchange at initialisation.
 * Own declarations of the public binary interface; the browser's table includes its last public entry. */
#ifndef TELIX_NPAPI_NPFUNCTIONS_H
#define TELIX_NPAPI_NPFUNCTIONS_H

#include "npapi/npapi.h"
#include "npapi/npruntime.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Calls of the browser into a plug-in. */
typedef NPError (*NPP_NewProcPtr)(NPMIMEType type, NPP instance, uint16_t mode, int16_t argc, char* argn[],
                                  char* argv[], NPSavedData* saved);
typedef NPError (*NPP_DestroyProcPtr)(NPP instance, NPSavedData** saved);
typedef NPError (*NPP_SetWindowProcPtr)(NPP instance, NPWindow* window);
typedef NPError (*NPP_NewStreamProcPtr)(NPP instance, NPMIMEType type, NPStream* stream, NPBool seekable,
                                        uint16_t* stype);
typedef NPError (*NPP_DestroyStreamProcPtr)(NPP instance, NPStream* stream, NPReason reason);
typedef void (*NPP_StreamAsFileProcPtr)(NPP instance, NPStream* stream, const char* fileName);
typedef int32_t (*NPP_WriteReadyProcPtr)(NPP instance, NPStream* stream);
typedef int32_t (*NPP_WriteProcPtr)(NPP instance, NPStream* stream, int32_t offset, int32_t length,
                                    void* buffer);
typedef void (*NPP_PrintProcPtr)(NPP instance, NPPrint* platformPrint);
typedef int16_t (*NPP_HandleEventProcPtr)(NPP instance, void* event);
typedef void (*NPP_URLNotifyProcPtr)(NPP instance, const char* url, NPReason reason, void* notifyData);
typedef NPError (*NPP_GetValueProcPtr)(NPP instance, NPPVariable variable, void* value);
typedef NPError (*NPP_SetValueProcPtr)(NPP instance, NPNVariable variable, void* value);
typedef NPBool (*NPP_GotFocusProcPtr)(NPP instance, NPFocusDirection direction);
typedef void (*NPP_LostFocusProcPtr)(NPP instance);
typedef void (*NPP_URLRedirectNotifyProcPtr)(NPP instance, const char* url, int32_t status, void* notifyData);
typedef NPError (*NPP_ClearSiteDataProcPtr)(const char* site, uint64_t flags, uint64_t maxAge);
typedef char** (*NPP_GetSitesWithDataProcPtr)(void);
typedef void (*NPP_DidCompositeProcPtr)(NPP instance);

/* Calls of a plug-in into the browser. */
typedef NPError (*NPN_GetURLProcPtr)(NPP instance, const char* url, const char* target);
typedef NPError (*NPN_PostURLProcPtr)(NPP instance, const char* url, const char* target, uint32_t length,
                                      const char* buffer, NPBool isFile);
typedef NPError (*NPN_RequestReadProcPtr)(NPStream* stream, NPByteRange* ranges);
typedef NPError (*NPN_NewStreamProcPtr)(NPP instance, NPMIMEType type, const char* target, NPStream** stream);
typedef int32_t (*NPN_WriteProcPtr)(NPP instance, NPStream* stream, int32_t length, void* buffer);
typedef NPError (*NPN_DestroyStreamProcPtr)(NPP instance, NPStream* stream, NPReason reason);
typedef void (*NPN_StatusProcPtr)(NPP instance, const char* message);
typedef const char* (*NPN_UserAgentProcPtr)(NPP instance);
typedef void* (*NPN_MemAllocProcPtr)(uint32_t size);
typedef void (*NPN_MemFreeProcPtr)(void* address);
typedef uint32_t (*NPN_MemFlushProcPtr)(uint32_t size);
typedef void (*NPN_ReloadPluginsProcPtr)(NPBool reloadPages);
typedef void* (*NPN_GetJavaEnvProcPtr)(void);
typedef void* (*NPN_GetJavaPeerProcPtr)(NPP instance);
typedef NPError (*NPN_GetURLNotifyProcPtr)(NPP instance, const char* url, const char* target,
                                           void* notifyData);
typedef NPError (*NPN_PostURLNotifyProcPtr)(NPP instance, const char* url, const char* target,
                                            uint32_t length, const char* buffer, NPBool isFile,
                                            void* notifyData);
typedef NPError (*NPN_GetValueProcPtr)(NPP instance, NPNVariable variable, void* value);
typedef NPError (*NPN_SetValueProcPtr)(NPP instance, NPPVariable variable, void* value);
typedef void (*NPN_InvalidateRectProcPtr)(NPP instance, NPRect* rect);
typedef void (*NPN_InvalidateRegionProcPtr)(NPP instance, NPRegion region);
typedef void (*NPN_ForceRedrawProcPtr)(NPP instance);
typedef NPIdentifier (*NPN_GetStringIdentifierProcPtr)(const char* name);
typedef void (*NPN_GetStringIdentifiersProcPtr)(const char** names, int32_t count, NPIdentifier* identifiers);
typedef NPIdentifier (*NPN_GetIntIdentifierProcPtr)(int32_t value);
typedef bool (*NPN_IdentifierIsStringProcPtr)(NPIdentifier identifier);
typedef char* (*NPN_UTF8FromIdentifierProcPtr)(NPIdentifier identifier);
typedef int32_t (*NPN_IntFromIdentifierProcPtr)(NPIdentifier identifier);
typedef NPObject* (*NPN_CreateObjectProcPtr)(NPP instance, NPClass* aClass);
typedef NPObject* (*NPN_RetainObjectProcPtr)(NPObject* object);
typedef void (*NPN_ReleaseObjectProcPtr)(NPObject* object);
typedef bool (*NPN_InvokeProcPtr)(NPP instance, NPObject* object, NPIdentifier name, const NPVariant* args,
                                  uint32_t argCount, NPVariant* result);
typedef bool (*NPN_InvokeDefaultProcPtr)(NPP instance, NPObject* object, const NPVariant* args,
                                         uint32_t argCount, NPVariant* result);
typedef bool (*NPN_EvaluateProcPtr)(NPP instance, NPObject* object, NPString* script, NPVariant* result);
typedef bool (*NPN_GetPropertyProcPtr)(NPP instance, NPObject* object, NPIdentifier name, NPVariant* result);
typedef bool (*NPN_SetPropertyProcPtr)(NPP instance, NPObject* object, NPIdentifier name,
                                       const NPVariant* value);
typedef bool (*NPN_RemovePropertyProcPtr)(NPP instance, NPObject* object, NPIdentifier name);
typedef bool (*NPN_HasPropertyProcPtr)(NPP instance, NPObject* object, NPIdentifier name);
typedef bool (*NPN_HasMethodProcPtr)(NPP instance, NPObject* object, NPIdentifier name);
typedef void (*NPN_ReleaseVariantValueProcPtr)(NPVariant* variant);
typedef void (*NPN_SetExceptionProcPtr)(NPObject* object, const char* message);
typedef void (*NPN_PushPopupsEnabledStateProcPtr)(NPP instance, NPBool enabled);
typedef void (*NPN_PopPopupsEnabledStateProcPtr)(NPP instance);
typedef bool (*NPN_EnumerateProcPtr)(NPP instance, NPObject* object, NPIdentifier** names, uint32_t* count);
typedef void (*NPN_PluginThreadAsyncCallProcPtr)(NPP instance, void (*function)(void*), void* data);
typedef bool (*NPN_ConstructProcPtr)(NPP instance, NPObject* object, const NPVariant* args, uint32_t argCount,
                                     NPVariant* result);
typedef NPError (*NPN_GetValueForURLProcPtr)(NPP instance, NPNURLVariable variable, const char* url,
                                             char** value, uint32_t* length);
typedef NPError (*NPN_SetValueForURLProcPtr)(NPP instance, NPNURLVariable variable, const char* url,
                                             const char* value, uint32_t length);
typedef NPError (*NPN_GetAuthenticationInfoProcPtr)(NPP instance, const char* protocol, const char* host,
                                                    int32_t port, const char* scheme, const char* realm,
                                                    char** username, uint32_t* usernameLength,
                                                    char** password, uint32_t* passwordLength);
typedef uint32_t (*NPN_ScheduleTimerProcPtr)(NPP instance, uint32_t interval, NPBool repeat,
                                             void (*function)(NPP instance, uint32_t timer));
typedef void (*NPN_UnscheduleTimerProcPtr)(NPP instance, uint32_t timer);
typedef NPError (*NPN_PopUpContextMenuProcPtr)(NPP instance, NPMenu* menu);
typedef NPBool (*NPN_ConvertPointProcPtr)(NPP instance, double sourceX, double sourceY,
                                          NPCoordinateSpace sourceSpace, double* targetX, double* targetY,
                                          NPCoordinateSpace targetSpace);
typedef NPBool (*NPN_HandleEventProcPtr)(NPP instance, void* event, NPBool handled);
typedef NPBool (*NPN_UnfocusInstanceProcPtr)(NPP instance, NPFocusDirection direction);
typedef void (*NPN_URLRedirectResponseProcPtr)(NPP instance, void* notifyData, NPBool allow);
typedef NPError (*NPN_InitAsyncSurfaceProcPtr)(NPP instance, NPSize* size, NPImageFormat format,
                                               void* initialData, NPAsyncSurface* surface);
typedef NPError (*NPN_FinalizeAsyncSurfaceProcPtr)(NPP instance, NPAsyncSurface* surface);
typedef void (*NPN_SetCurrentAsyncSurfaceProcPtr)(NPP instance, NPAsyncSurface* surface, NPRect* changed);

/* Filled in by the plug-in at NP_Initialize. */
typedef struct _NPPluginFuncs {
    uint16_t size;
    uint16_t version;
    NPP_NewProcPtr newp;
    NPP_DestroyProcPtr destroy;
    NPP_SetWindowProcPtr setwindow;
    NPP_NewStreamProcPtr newstream;
    NPP_DestroyStreamProcPtr destroystream;
    NPP_StreamAsFileProcPtr asfile;
    NPP_WriteReadyProcPtr writeready;
    NPP_WriteProcPtr write;
    NPP_PrintProcPtr print;
    NPP_HandleEventProcPtr event;
    NPP_URLNotifyProcPtr urlnotify;
    void* javaClass;
    NPP_GetValueProcPtr getvalue;
    NPP_SetValueProcPtr setvalue;
    NPP_GotFocusProcPtr gotfocus;
    NPP_LostFocusProcPtr lostfocus;
    NPP_URLRedirectNotifyProcPtr urlredirectnotify;
    NPP_ClearSiteDataProcPtr clearsitedata;
    NPP_GetSitesWithDataProcPtr getsiteswithdata;
    NPP_DidCompositeProcPtr didComposite;
} NPPluginFuncs;

/* Filled in by the browser; valid from NP_Initialize to NP_Shutdown. */
typedef struct _NPNetscapeFuncs {
    uint16_t size;
    uint16_t version;
    NPN_GetURLProcPtr geturl;
    NPN_PostURLProcPtr posturl;
    NPN_RequestReadProcPtr requestread;
    NPN_NewStreamProcPtr newstream;
    NPN_WriteProcPtr write;
    NPN_DestroyStreamProcPtr destroystream;
    NPN_StatusProcPtr status;
    NPN_UserAgentProcPtr uagent;
    NPN_MemAllocProcPtr memalloc;
    NPN_MemFreeProcPtr memfree;
    NPN_MemFlushProcPtr memflush;
    NPN_ReloadPluginsProcPtr reloadplugins;
    NPN_GetJavaEnvProcPtr getJavaEnv;
    NPN_GetJavaPeerProcPtr getJavaPeer;
    NPN_GetURLNotifyProcPtr geturlnotify;
    NPN_PostURLNotifyProcPtr posturlnotify;
    NPN_GetValueProcPtr getvalue;
    NPN_SetValueProcPtr setvalue;
    NPN_InvalidateRectProcPtr invalidaterect;
    NPN_InvalidateRegionProcPtr invalidateregion;
    NPN_ForceRedrawProcPtr forceredraw;
    NPN_GetStringIdentifierProcPtr getstringidentifier;
    NPN_GetStringIdentifiersProcPtr getstringidentifiers;
    NPN_GetIntIdentifierProcPtr getintidentifier;
    NPN_IdentifierIsStringProcPtr identifierisstring;
    NPN_UTF8FromIdentifierProcPtr utf8fromidentifier;
    NPN_IntFromIdentifierProcPtr intfromidentifier;
    NPN_CreateObjectProcPtr createobject;
    NPN_RetainObjectProcPtr retainobject;
    NPN_ReleaseObjectProcPtr releaseobject;
    NPN_InvokeProcPtr invoke;
    NPN_InvokeDefaultProcPtr invokeDefault;
    NPN_EvaluateProcPtr evaluate;
    NPN_GetPropertyProcPtr getproperty;
    NPN_SetPropertyProcPtr setproperty;
    NPN_RemovePropertyProcPtr removeproperty;
    NPN_HasPropertyProcPtr hasproperty;
    NPN_HasMethodProcPtr hasmethod;
    NPN_ReleaseVariantValueProcPtr releasevariantvalue;
    NPN_SetExceptionProcPtr setexception;
    NPN_PushPopupsEnabledStateProcPtr pushpopupsenabledstate;
    NPN_PopPopupsEnabledStateProcPtr poppopupsenabledstate;
    NPN_EnumerateProcPtr enumerate;
    NPN_PluginThreadAsyncCallProcPtr pluginthreadasynccall;
    NPN_ConstructProcPtr construct;
    NPN_GetValueForURLProcPtr getvalueforurl;
    NPN_SetValueForURLProcPtr setvalueforurl;
    NPN_GetAuthenticationInfoProcPtr getauthenticationinfo;
    NPN_ScheduleTimerProcPtr scheduletimer;
    NPN_UnscheduleTimerProcPtr unscheduletimer;
    NPN_PopUpContextMenuProcPtr popupcontextmenu;
    NPN_ConvertPointProcPtr convertpoint;
    NPN_HandleEventProcPtr handleevent;
    NPN_UnfocusInstanceProcPtr unfocusinstance;
    NPN_URLRedirectResponseProcPtr urlredirectresponse;
    NPN_InitAsyncSurfaceProcPtr initasyncsurface;
    NPN_FinalizeAsyncSurfaceProcPtr finalizeasyncsurface;
    NPN_SetCurrentAsyncSurfaceProcPtr setcurrentasyncsurface;
} NPNetscapeFuncs;

/* The offset of an entry after two 16-bit words and `index` pointers. */
#define NPAPI_TABLE_OFFSET(index) NPAPI_BY_WORD(4 + 4 * (index), 8 + 8 * (index))

NPAPI_STATIC_ASSERT(offsetof(NPPluginFuncs, version) == 2);
NPAPI_STATIC_ASSERT(offsetof(NPPluginFuncs, newp) == NPAPI_TABLE_OFFSET(0));
NPAPI_STATIC_ASSERT(offsetof(NPPluginFuncs, asfile) == NPAPI_TABLE_OFFSET(5));
NPAPI_STATIC_ASSERT(offsetof(NPPluginFuncs, urlnotify) == NPAPI_TABLE_OFFSET(10));
NPAPI_STATIC_ASSERT(offsetof(NPPluginFuncs, getvalue) == NPAPI_TABLE_OFFSET(12));
NPAPI_STATIC_ASSERT(offsetof(NPPluginFuncs, setvalue) == NPAPI_TABLE_OFFSET(13));
NPAPI_STATIC_ASSERT(offsetof(NPPluginFuncs, gotfocus) == NPAPI_TABLE_OFFSET(14));
NPAPI_STATIC_ASSERT(sizeof(NPPluginFuncs) == NPAPI_TABLE_OFFSET(20));

NPAPI_STATIC_ASSERT(offsetof(NPNetscapeFuncs, geturl) == NPAPI_TABLE_OFFSET(0));
NPAPI_STATIC_ASSERT(offsetof(NPNetscapeFuncs, memalloc) == NPAPI_TABLE_OFFSET(8));
NPAPI_STATIC_ASSERT(offsetof(NPNetscapeFuncs, geturlnotify) == NPAPI_TABLE_OFFSET(14));
NPAPI_STATIC_ASSERT(offsetof(NPNetscapeFuncs, getstringidentifier) == NPAPI_TABLE_OFFSET(21));
NPAPI_STATIC_ASSERT(offsetof(NPNetscapeFuncs, createobject) == NPAPI_TABLE_OFFSET(27));
NPAPI_STATIC_ASSERT(offsetof(NPNetscapeFuncs, evaluate) == NPAPI_TABLE_OFFSET(32));
NPAPI_STATIC_ASSERT(offsetof(NPNetscapeFuncs, setexception) == NPAPI_TABLE_OFFSET(39));
NPAPI_STATIC_ASSERT(offsetof(NPNetscapeFuncs, pluginthreadasynccall) == NPAPI_TABLE_OFFSET(43));
NPAPI_STATIC_ASSERT(offsetof(NPNetscapeFuncs, urlredirectresponse) == NPAPI_TABLE_OFFSET(54));
NPAPI_STATIC_ASSERT(sizeof(NPNetscapeFuncs) == NPAPI_TABLE_OFFSET(58));

#ifdef __cplusplus
}
#endif

#endif
