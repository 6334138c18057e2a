// What the plug-in shell has to know of a kind of embedded object: which MIME types make it, how it is made
// and unmade, and which calls of the browser it sees. Each kind is described beside its model; a null means
// that the kind has no such thing.
#ifndef TELIX_COMMON_OBJECTKIND_H
#define TELIX_COMMON_OBJECTKIND_H

#include "common/PluginBase.h"

// What the browser gave to NPP_New.
struct InstanceArguments {
    NPMIMEType mimeType;
    uint16_t mode;
    int16_t argc;
    char** argn;
    char** argv;
};

// The stream calls of the browser, for a kind that takes streams.
struct StreamOperations {
    NPError (*newStream)(PluginBase& model, NPMIMEType type, NPStream* stream, NPBool seekable,
                         uint16_t* stype);
    NPError (*destroyStream)(PluginBase& model, NPStream* stream, NPReason reason);
    int32_t (*writeReady)(PluginBase& model, NPStream* stream);
    int32_t (*write)(PluginBase& model, NPStream* stream, int32_t offset, int32_t length, void* buffer);
    void (*urlNotify)(PluginBase& model, const char* url, NPReason reason, void* notifyData);
};

struct ObjectKind {
    unsigned short id;
    const char* destroyText;      // log line of NPP_Destroy, given the model's address; null for none
    const char* const* mimeTypes; // ends with null
    PluginBase* (*create)(NPP npp, unsigned short id);
    // Closes the model and deletes it through its concrete class, now or when the outermost call into it
    // returns.
    void (*dispose)(PluginBase* model);
    NPError (*init)(PluginBase& model, const InstanceArguments& arguments); // PluginBase::init if null
    bool (*deferDestruction)(PluginBase& model); // true: the model sees to its own end, on a later turn
    NPError (*setWindow)(PluginBase& model, const NPWindow* window);
    int16_t (*handleEvent)(PluginBase& model, void* event);
    const StreamOperations* streams;
};

// For ObjectKind::dispose. What the end of the model means to platform and browser takes effect at once:
// script that replaces an element sees the old object gone before the new one comes.
template <class Model>
void disposeOf(PluginBase* model) {
    auto* self = static_cast<Model*>(model);
    self->markClosed();
    self->close();
    deleteAfterCalls(*self);
}

// All kinds, in the order in which NPP_New compares their MIME types; ends with null.
extern const ObjectKind* const kObjectKinds[];

#endif
