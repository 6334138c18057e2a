// Dispatch of the browser's calls on the kind of the embedded object.
#include "common/PluginEntryPoints.h"

#include <strings.h>

#include <cstdio>
#include <new>

#include "common/BrowserGates.h"
#include "common/Log.h"
#include "common/ObjectKind.h"

namespace {

constexpr int32_t kUnreadStreamChunk = 8192;

const char kBannerRule[] =
    "*******************************************************************************************\n";

// An instance that isn't there. A live instance never counts as invalid, whatever its data.
bool isInvalid(NPP instance) {
    return !instance;
}

PluginBase* modelOf(NPP instance) {
    return static_cast<PluginBase*>(instance->pdata);
}

// The kind of the instance's model; null if it has none, which no browser brings about.
const ObjectKind* kindOf(NPP instance) {
    const PluginBase* model = modelOf(instance);
    if (model) {
        for (const ObjectKind* const* kind = kObjectKinds; *kind; ++kind) {
            if ((*kind)->id == model->getObjectId()) {
                return *kind;
            }
        }
    }
    return nullptr;
}

const StreamOperations* streamsOf(NPP instance) {
    const ObjectKind* kind = kindOf(instance);
    return kind ? kind->streams : nullptr;
}

bool makes(const ObjectKind& kind, const char* mimeType) {
    for (const char* const* type = kind.mimeTypes; *type; ++type) {
        if (strcasecmp(*type, mimeType) == 0) {
            return true;
        }
    }
    return false;
}

// An instance whose model is being made. Script that this runs may take the element out of the page, and
// NPP_Destroy finds no model yet.
class Construction {
public:
    explicit Construction(NPP instance) : m_instance(instance), m_outer(s_innermost) { s_innermost = this; }
    Construction(const Construction&) = delete;
    Construction& operator=(const Construction&) = delete;
    ~Construction() { s_innermost = m_outer; }

    bool isCancelled() const { return m_isCancelled; }

    static void cancel(NPP instance) {
        for (Construction* running = s_innermost; running; running = running->m_outer) {
            running->m_isCancelled |= running->m_instance == instance;
        }
    }

private:
    static Construction* s_innermost;

    const NPP m_instance;
    Construction* const m_outer;
    bool m_isCancelled = false;
};

Construction* Construction::s_innermost = nullptr;

// The result of the model's own initialisation, or NPERR_INVALID_INSTANCE_ERROR if the instance has gone
// meanwhile.
NPError initialise(const ObjectKind& kind, PluginBase& model, const InstanceArguments& arguments,
                   const Construction& construction) {
    const NPError rv = kind.init ? kind.init(model, arguments)
                                 : model.init(arguments.mode, arguments.argc, arguments.argn, arguments.argv);
    if (construction.isCancelled()) {
        return NPERR_INVALID_INSTANCE_ERROR;
    }
    return rv;
}

} // namespace

PluginEntryPoints* PluginEntryPoints::m_instance = nullptr;

PluginEntryPoints* PluginEntryPoints::getInst() {
    if (!m_instance) {
        m_instance = new (std::nothrow) PluginEntryPoints;
    }
    return m_instance;
}

void PluginEntryPoints::deleteInst() {
    delete m_instance;
    m_instance = nullptr;
}

NPError PluginEntryPoints::initialize() {
    PLUGIN_LOG(COMMON, " is called \n");
    std::printf(
        "%s%s%s%s", kBannerRule,
        "                               :: ORDA :: PLUGIN :: START ::                               \n",
        "                            :: VERSION:1.25 :: DATE:21.03.2012 ::                           \n",
        kBannerRule);
    return NPERR_NO_ERROR;
}

void PluginEntryPoints::shutdown() {
    std::printf(
        "%s%s%s", kBannerRule,
        "                                 :: ORDA :: PLUGIN :: END ::                               \n",
        kBannerRule);
}

std::string PluginEntryPoints::mimeTypeString() {
    return "application/oipfapplicationmanager::TELIX JS Plug-in for Application Manager;"
           "application/oipfconfiguration::TELIX JS Plug-in for Configuration;"
           "application/oipfparentalcontrolmanager::TELIX JS Plug-in for Parental Control Manager;"
           "application/oipfcapabilities::TELIX JS Plug-in for Capabilities;"
           "video/broadcast::TELIX JS Plug-in for Video Broadcast;"
           "audio/mpeg:mp3:TELIX JS Plug-in for AVControl;"
           "audio/mp4:mp4:TELIX JS Plug-in for AVControl;"
           "video/mp4:mp4:TELIX JS Plug-in for AVControl;"
           "video/mpeg:mpg:TELIX JS Plug-in for AVControl;"
           "video/mpeg4:mp4:TELIX JS Plug-in for AVControl;"
           "video/x-ms-ism:ism:TELIX JS Plug-in for AVControl;"
           "application/vnd.ms-sstr+xml:ism:TELIX JS Plug-in for AVControl;"
           "application/vnd.apple.mpegurl:m3u8:TELIX JS Plug-in for AVControl;"
           "audio/mpegurl:m3u8:TELIX JS Plug-in for AVControl;"
           "application/oipfdrmagent::TELIX JS Plug-in for DRMAgent;";
}

NPError PluginEntryPoints::getValue(NPP instance, NPPVariable variable, void* value) {
    PLUGIN_LOG(COMMON, "NPP inst=( %p ), NPPVariable: %d \n", static_cast<void*>(instance), variable);
    if (instance && !instance->pdata) {
        return NPERR_GENERIC_ERROR;
    }
    switch (variable) {
    case NPPVpluginNameString:
        *static_cast<const char**>(value) = "TELIX Scriptable Plugin";
        return NPERR_NO_ERROR;
    case NPPVpluginDescriptionString:
        *static_cast<const char**>(value) = "TELIX Scriptable Plugin (Browser Plug-in for TELIX JS API's)";
        return NPERR_NO_ERROR;
    // Flags are answered as whole 32-bit words.
    case NPPVpluginWindowBool:
    case NPPVpluginNeedsXEmbed:
        *static_cast<uint32_t*>(value) = 0;
        return NPERR_NO_ERROR;
    case NPPVpluginTransparentBool:
        *static_cast<uint32_t*>(value) = 1;
        return NPERR_NO_ERROR;
    case NPPVpluginScriptableNPObject:
        if (!instance || !kindOf(instance)) {
            return NPERR_GENERIC_ERROR;
        }
        *static_cast<NPObject**>(value) =
            modelOf(instance)->getJSObject(); // handed out: retained for the browser
        return NPERR_NO_ERROR;
    default:
        return NPERR_GENERIC_ERROR;
    }
}

NPError PluginEntryPoints::setValue(NPP, NPNVariable, void*) {
    PLUGIN_LOG(COMMON, " is called \n");
    return NPERR_NO_ERROR;
}

NPError PluginEntryPoints::newInstance(NPMIMEType mimeType, NPP instance, uint16_t mode, int16_t argc,
                                       char* argn[], char* argv[], NPSavedData*) {
    PLUGIN_LOG(COMMON, "NPP inst=(%p), Mime Type:( %s )  \n", static_cast<void*>(instance), mimeType);
    if (isInvalid(instance)) {
        return NPERR_INVALID_INSTANCE_ERROR;
    }
    const InstanceArguments arguments{mimeType, mode, argc, argn, argv};
    for (const ObjectKind* const* row = kObjectKinds; *row; ++row) {
        const ObjectKind& kind = **row;
        if (!makes(kind, mimeType)) {
            continue;
        }
        const Construction construction(instance);
        PluginBase* model = kind.create(instance, kind.id);
        if (!model) {
            return NPERR_NO_ERROR;
        }
        const NPError rv = initialise(kind, *model, arguments, construction);
        if (rv == NPERR_NO_ERROR) {
            instance->pdata = model;
        } else {
            if (construction.isCancelled() && kind.deferDestruction) {
                kind.deferDestruction(*model); // gives the player back; nothing of the model is on its way
            }
            kind.dispose(model);
        }
        return rv;
    }
    // A type that no kind claims is not an error: the instance stays without a model.
    return NPERR_NO_ERROR;
}

NPError PluginEntryPoints::destroyInst(NPP instance, NPSavedData**) {
    PLUGIN_LOG(COMMON, " is called \n");
    if (isInvalid(instance)) {
        return NPERR_INVALID_INSTANCE_ERROR;
    }
    Construction::cancel(instance);
    if (const ObjectKind* kind = kindOf(instance)) {
        PluginBase* model = modelOf(instance);
        if (kind->destroyText) {
            PLUGIN_LOG(COMMON, kind->destroyText, static_cast<void*>(model));
        }
        if (!kind->deferDestruction || !kind->deferDestruction(*model)) {
            kind->dispose(model);
        }
    }
    instance->pdata = nullptr;
    return NPERR_NO_ERROR;
}

NPError PluginEntryPoints::setWindow(NPP instance, NPWindow* window) {
    if (isInvalid(instance)) {
        PLUGIN_LOG(COMMON, "is called. instance: %p, instance->pdata: %p \n", nullptr, nullptr);
        PLUGIN_LOG(COMMON, " Invalid Instance Error \n");
        return NPERR_INVALID_INSTANCE_ERROR;
    }
    PLUGIN_LOG(COMMON, "is called. instance: %p, instance->pdata: %p \n", static_cast<void*>(instance),
               instance->pdata);
    const ObjectKind* kind = kindOf(instance);
    if (!window || !kind || !kind->setWindow) {
        return NPERR_NO_ERROR;
    }
    PLUGIN_LOG(COMMON, "NPWindow* Value:( %p )\n", static_cast<void*>(window));
    const CallGuard guard(*modelOf(instance));
    return kind->setWindow(*modelOf(instance), window);
}

NPError PluginEntryPoints::newStream(NPP instance, NPMIMEType type, NPStream* stream, NPBool seekable,
                                     uint16_t* stype) {
    if (isInvalid(instance)) {
        return NPERR_INVALID_INSTANCE_ERROR;
    }
    if (const StreamOperations* streams = streamsOf(instance)) {
        const CallGuard guard(*modelOf(instance));
        return streams->newStream(*modelOf(instance), type, stream, seekable, stype);
    }
    NPN_DestroyStream(instance, stream, NPRES_DONE);
    return NPERR_NO_ERROR;
}

NPError PluginEntryPoints::destroyStream(NPP instance, NPStream* stream, NPReason reason) {
    if (isInvalid(instance)) {
        return NPERR_INVALID_INSTANCE_ERROR;
    }
    if (const StreamOperations* streams = streamsOf(instance)) {
        const CallGuard guard(*modelOf(instance));
        return streams->destroyStream(*modelOf(instance), stream, reason);
    }
    NPN_DestroyStream(instance, stream, NPRES_DONE);
    return NPERR_NO_ERROR;
}

int32_t PluginEntryPoints::writeReady(NPP instance, NPStream* stream) {
    if (isInvalid(instance)) {
        return NPERR_INVALID_INSTANCE_ERROR;
    }
    const StreamOperations* streams = streamsOf(instance);
    if (!streams) {
        return kUnreadStreamChunk;
    }
    const CallGuard guard(*modelOf(instance));
    return streams->writeReady(*modelOf(instance), stream);
}

int32_t PluginEntryPoints::write(NPP instance, NPStream* stream, int32_t offset, int32_t length,
                                 void* buffer) {
    if (isInvalid(instance)) {
        return NPERR_INVALID_INSTANCE_ERROR;
    }
    const StreamOperations* streams = streamsOf(instance);
    if (!streams) {
        return kUnreadStreamChunk;
    }
    const CallGuard guard(*modelOf(instance));
    return streams->write(*modelOf(instance), stream, offset, length, buffer);
}

void PluginEntryPoints::streamAsFile(NPP, NPStream*, const char*) {
    PLUGIN_LOG(COMMON, " is called \n");
}

void PluginEntryPoints::print(NPP, NPPrint*) {
    PLUGIN_LOG(COMMON, " is called \n");
}

int16_t PluginEntryPoints::handleEvent(NPP instance, void* event) {
    if (isInvalid(instance)) {
        return 0;
    }
    const ObjectKind* kind = kindOf(instance);
    return kind && kind->handleEvent ? kind->handleEvent(*modelOf(instance), event) : 0;
}

void PluginEntryPoints::urlNotify(NPP instance, const char* url, NPReason reason, void* notifyData) {
    if (isInvalid(instance)) {
        return;
    }
    if (const StreamOperations* streams = streamsOf(instance)) {
        const CallGuard guard(*modelOf(instance));
        streams->urlNotify(*modelOf(instance), url, reason, notifyData);
    }
}
