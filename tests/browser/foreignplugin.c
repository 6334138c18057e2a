/* A third-party browser plug-in: it registers one MIME type and rejects every
 * instance. */
#include "npapi/npfunctions.h"

#define EXPORT __attribute__((visibility("default")))

EXPORT NPError NP_Initialize(NPNetscapeFuncs* browser, NPPluginFuncs* plugin);
EXPORT NPError NP_Shutdown(void);
EXPORT NPError NP_GetValue(void* future, NPPVariable variable, void* value);
EXPORT const char* NP_GetMIMEDescription(void);

static NPError rejectInstance(NPMIMEType type, NPP instance, uint16_t mode, int16_t argc, char* argn[],
                              char* argv[], NPSavedData* saved) {
    (void)type, (void)instance, (void)mode, (void)argc, (void)argn, (void)argv, (void)saved;
    return NPERR_GENERIC_ERROR;
}

static NPError destroyInstance(NPP instance, NPSavedData** saved) {
    (void)instance, (void)saved;
    return NPERR_NO_ERROR;
}

NPError NP_Initialize(NPNetscapeFuncs* browser, NPPluginFuncs* plugin) {
    (void)browser;
    plugin->version = NP_VERSION_MINOR;
    plugin->newp = rejectInstance;
    plugin->destroy = destroyInstance;
    return NPERR_NO_ERROR;
}

NPError NP_Shutdown(void) {
    return NPERR_NO_ERROR;
}

NPError NP_GetValue(void* future, NPPVariable variable, void* value) {
    (void)future;
    switch (variable) {
    case NPPVpluginNameString:
    case NPPVpluginDescriptionString:
        *(const char**)value = "Foreign Plug-in";
        return NPERR_NO_ERROR;
    default:
        return NPERR_INVALID_PARAM;
    }
}

const char* NP_GetMIMEDescription(void) {
    return "application/x-telix-foreign::Nothing;";
}
