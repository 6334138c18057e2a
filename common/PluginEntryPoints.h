// The plug-in side of the browser interface: every NPP_* call of the browser comes here and is dispatched on
// the kind of the object that the instance holds. Browser thread only.
#ifndef TELIX_COMMON_PLUGINENTRYPOINTS_H
#define TELIX_COMMON_PLUGINENTRYPOINTS_H

#include <string>

#include "npapi/npfunctions.h"

class PluginEntryPoints {
public:
    PluginEntryPoints(const PluginEntryPoints&) = delete;
    PluginEntryPoints& operator=(const PluginEntryPoints&) = delete;

    // The one object, made at first use; deleteInst ends it until the next use.
    static PluginEntryPoints* getInst();
    static void deleteInst();

    NPError initialize();
    void shutdown();
    NPError getValue(NPP instance, NPPVariable variable, void* value);
    NPError setValue(NPP instance, NPNVariable variable, void* value);
    std::string mimeTypeString();
    NPError newInstance(NPMIMEType mimeType, NPP instance, uint16_t mode, int16_t argc, char* argn[],
                        char* argv[], NPSavedData* saved);
    NPError destroyInst(NPP instance, NPSavedData** saved);
    NPError setWindow(NPP instance, NPWindow* window);
    NPError newStream(NPP instance, NPMIMEType type, NPStream* stream, NPBool seekable, uint16_t* stype);
    NPError destroyStream(NPP instance, NPStream* stream, NPReason reason);
    int32_t writeReady(NPP instance, NPStream* stream);
    int32_t write(NPP instance, NPStream* stream, int32_t offset, int32_t length, void* buffer);
    void streamAsFile(NPP instance, NPStream* stream, const char* fileName);
    void print(NPP instance, NPPrint* printInfo);
    int16_t handleEvent(NPP instance, void* event);
    void urlNotify(NPP instance, const char* url, NPReason reason, void* notifyData);

private:
    PluginEntryPoints() = default;
    ~PluginEntryPoints() = default;

    static PluginEntryPoints* m_instance;
};

#endif
