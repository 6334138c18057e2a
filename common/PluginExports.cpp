// The exports of the shared object: initialisation, and one gate a call to the entry points.
#include "common/PluginExports.h"

#include <cstring>

#include "common/BrowserGates.h"
#include "common/Log.h"
#include "common/PluginEntryPoints.h"

namespace {

// The size of the plug-in's table through `setvalue` on a 32-bit set. The same number on every
// machine.
constexpr uint16_t kPluginTableSize = 60;
constexpr uint16_t kInterfaceVersion = 24;

} // namespace

NPError NP_Initialize(NPNetscapeFuncs* browserFuncs, NPPluginFuncs* pluginFuncs) {
    PLUGIN_LOG(COMMON, " is called\n");
    if (!browserFuncs || !pluginFuncs) {
        return NPERR_INVALID_FUNCTABLE_ERROR;
    }
    if (browserFuncs->version >> 8 != NP_VERSION_MAJOR) {
        return NPERR_INCOMPATIBLE_VERSION_ERROR;
    }
    if (pluginFuncs->size < kPluginTableSize) {
        return NPERR_INVALID_FUNCTABLE_ERROR;
    }
    NPNFuncs = browserFuncs;
    pluginFuncs->size = kPluginTableSize;
    pluginFuncs->version = kInterfaceVersion;
    pluginFuncs->newp = NPP_New;
    pluginFuncs->destroy = NPP_Destroy;
    pluginFuncs->setwindow = NPP_SetWindow;
    pluginFuncs->newstream = NPP_NewStream;
    pluginFuncs->destroystream = NPP_DestroyStream;
    pluginFuncs->asfile = NPP_StreamAsFile;
    pluginFuncs->writeready = NPP_WriteReady;
    pluginFuncs->write = NPP_Write;
    pluginFuncs->print = NPP_Print;
    pluginFuncs->event = NPP_HandleEvent;
    pluginFuncs->urlnotify = NPP_URLNotify;
    pluginFuncs->javaClass = nullptr;
    pluginFuncs->getvalue = NPP_GetValue;
    pluginFuncs->setvalue = NPP_SetValue;
    NPP_Initialize();
    return NPERR_NO_ERROR;
}

NPError NP_GetValue(void* future, NPPVariable variable, void* value) {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPP_GetValue(static_cast<NPP>(future), variable, value);
}

NPError NP_Shutdown() {
    PLUGIN_LOG(COMMON, " is called\n");
    NPP_Shutdown();
    NPNFuncs = nullptr;
    return NPERR_NO_ERROR;
}

const char* NP_GetMIMEDescription() {
    PLUGIN_LOG(COMMON, " is called\n");
    return NPP_GetMIMEDescription();
}

NPError NPP_Initialize() {
    PluginEntryPoints* entryPoints = PluginEntryPoints::getInst();
    return entryPoints ? entryPoints->initialize() : static_cast<NPError>(NPERR_GENERIC_ERROR);
}

const char* NPP_GetMIMEDescription() {
    // Never freed: browsers keep the address beyond NP_Shutdown.
    static const char* const kDescription = strdup(PluginEntryPoints::getInst()->mimeTypeString().c_str());
    return kDescription;
}

void NPP_Shutdown() {
    if (PluginEntryPoints* entryPoints = PluginEntryPoints::getInst()) {
        entryPoints->shutdown();
        PluginEntryPoints::deleteInst();
    }
}

NPError NPP_GetValue(NPP instance, NPPVariable variable, void* value) {
    return PluginEntryPoints::getInst()->getValue(instance, variable, value);
}

NPError NPP_SetValue(NPP instance, NPNVariable variable, void* value) {
    return PluginEntryPoints::getInst()->setValue(instance, variable, value);
}

NPError NPP_New(NPMIMEType mimeType, NPP instance, uint16_t mode, int16_t argc, char* argn[], char* argv[],
                NPSavedData* saved) {
    return PluginEntryPoints::getInst()->newInstance(mimeType, instance, mode, argc, argn, argv, saved);
}

NPError NPP_Destroy(NPP instance, NPSavedData** saved) {
    return PluginEntryPoints::getInst()->destroyInst(instance, saved);
}

NPError NPP_SetWindow(NPP instance, NPWindow* window) {
    return PluginEntryPoints::getInst()->setWindow(instance, window);
}

NPError NPP_NewStream(NPP instance, NPMIMEType type, NPStream* stream, NPBool seekable, uint16_t* stype) {
    return PluginEntryPoints::getInst()->newStream(instance, type, stream, seekable, stype);
}

NPError NPP_DestroyStream(NPP instance, NPStream* stream, NPReason reason) {
    return PluginEntryPoints::getInst()->destroyStream(instance, stream, reason);
}

int32_t NPP_WriteReady(NPP instance, NPStream* stream) {
    return PluginEntryPoints::getInst()->writeReady(instance, stream);
}

int32_t NPP_Write(NPP instance, NPStream* stream, int32_t offset, int32_t length, void* buffer) {
    return PluginEntryPoints::getInst()->write(instance, stream, offset, length, buffer);
}

void NPP_StreamAsFile(NPP instance, NPStream* stream, const char* fileName) {
    PluginEntryPoints::getInst()->streamAsFile(instance, stream, fileName);
}

void NPP_Print(NPP instance, NPPrint* printInfo) {
    PluginEntryPoints::getInst()->print(instance, printInfo);
}

int16_t NPP_HandleEvent(NPP instance, void* event) {
    return PluginEntryPoints::getInst()->handleEvent(instance, event);
}

void NPP_URLNotify(NPP instance, const char* url, NPReason reason, void* notifyData) {
    PluginEntryPoints::getInst()->urlNotify(instance, url, reason, notifyData);
}
