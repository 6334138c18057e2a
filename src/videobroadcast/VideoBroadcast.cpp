// The video/broadcast object: its kind, the list of instances, its creation and destruction, the platform's
// callbacks and the play state.
#include "src/videobroadcast/VideoBroadcast.h"

#include "common/Log.h"
#include "common/ObjectKind.h"
#include "common/ScriptReferences.h"
#include "src/videobroadcast/JSVideoBroadcast.h"
#include "src/videobroadcast/VideoBroadcastUtils.h"
#include "telix/telix_platform.h"

InstanceList VideoBroadcast::VBInstanceList;
std::atomic<bool> VideoBroadcast::bCallbacksRegistered{false};

namespace {

const char* const kMimeTypes[] = {"video/broadcast", nullptr};

NPError initVideoBroadcast(PluginBase& model, const InstanceArguments& arguments) {
    const NPError rv = model.init(arguments.mode, arguments.argc, arguments.argn, arguments.argv);
    PLUGIN_LOG_FOR(LogModule::COMMON, "newInstance", "After VideoBroadcast init. rv = %d \n", rv);
    // The set shows the television picture where it finds this background.
    model.setObjectStyle("url(tv:)");
    return rv;
}

} // namespace

const ObjectKind kVideoBroadcastKind = [] {
    ObjectKind kind{};
    kind.id = 400;
    kind.destroyText = "VIDEOBROADCAST_OBJ_ID delete :: %p \n";
    kind.mimeTypes = kMimeTypes;
    kind.create = [](NPP npp, unsigned short id) -> PluginBase* {
        return VideoBroadcast::getInstance(npp, id);
    };
    kind.dispose = disposeOf<VideoBroadcast>;
    kind.init = initVideoBroadcast;
    kind.setWindow = [](PluginBase& model, const NPWindow* window) -> NPError {
        static_cast<VideoBroadcast&>(model).setWindow(window, false);
        return NPERR_NO_ERROR;
    };
    return kind;
}();

VideoBroadcast* VideoBroadcast::getInstance(NPP npp, unsigned short objectId) {
    auto* instance = new VideoBroadcast(npp, objectId);
    addInstance(instance);
    TELIX_JS_VB_HANDLE handle = 0;
    if (TELIX_JS_VB_GetHandle(&handle) != 0) {
        PLUGIN_LOG(VIDEOBCAST, " TELIX_JS_VB_GetHandle returned error.\n");
        return instance;
    }
    PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_GetHandle, Handle: ( %d )\n", handle);
    instance->setHandle(handle);
    return instance;
}

VideoBroadcast* VideoBroadcast::getInstance(unsigned int handle) {
    return refOf(handle).address();
}

LiveRef<VideoBroadcast> VideoBroadcast::refOf(unsigned int handle) {
    return VBInstanceList.find(handle);
}

void VideoBroadcast::addInstance(VideoBroadcast* instance) {
    VBInstanceList.set(instance->ref(), 0);
    PLUGIN_LOG(VIDEOBCAST, "Added inst :: %p \n", static_cast<void*>(instance));
}

void VideoBroadcast::deleteInstance(VideoBroadcast* instance) {
    if (VBInstanceList.erase(instance)) {
        PLUGIN_LOG(VIDEOBCAST, "Deleted inst :: %p \n", static_cast<void*>(instance));
    }
    if (bCallbacksRegistered && VBInstanceList.entries().empty()) {
        unregisterCallbacks();
    }
}

bool VideoBroadcast::checkValidInstance(VideoBroadcast* instance) {
    PLUGIN_LOG(VIDEOBCAST, "VBInstanceList size : %d \n", static_cast<int>(VBInstanceList.entries().size()));
    for (const auto& entry : VBInstanceList.entries()) {
        PLUGIN_LOG(VIDEOBCAST, "VB Instance in List: %p \n", static_cast<void*>(entry.first));
        if (entry.first == instance) {
            return true;
        }
    }
    return false;
}

VideoBroadcast* VideoBroadcast::getActiveInst() {
    PLUGIN_LOG(VIDEOBCAST, "Size of Map:: %d \n", static_cast<int>(VBInstanceList.entries().size()));
    for (const auto& entry : VBInstanceList.entries()) {
        if (entry.first->isActive()) {
            return entry.first;
        }
    }
    return nullptr;
}

VideoBroadcast::VideoBroadcast(NPP npp, unsigned short objectId) : PluginBase(npp, objectId) {
    PLUGIN_LOG(VIDEOBCAST, "Constructor called, NPP instance: %p \n", static_cast<void*>(npp));
}

void VideoBroadcast::close() {
    PLUGIN_LOG(VIDEOBCAST, "Destructor is called, VB Handle:%d \n", m_vbHandle);
    releaseHeld(m_configObj);
    releaseHeld(m_programmesObj);
    releaseHeld(m_pCurChannel);
    releaseHeld(m_onFullScreenChangeObj);
    releaseHeld(m_onPlayStateChangeObj);
    releaseHeld(m_onChannelChangeSucceededObj);
    releaseHeld(m_onChannelChangeErrorObj);
    releaseHeld(m_onProgrammesChangedObj);
    releaseHeld(m_videoComponents);
    releaseHeld(m_audioComponents);
    releaseHeld(m_subtitleComponents);
    releaseHeld(m_onParentalRatingChangeObj);
    releaseHeld(m_onParentalRatingErrorObj);
    releaseHeld(m_jsObject);
    // The platform handle goes before the subscriptions that were made with it.
    release();
    deleteInstance(this);
    deleteStreamEventInfo();
    m_live.end();
    PLUGIN_LOG(VIDEOBCAST, "Destructor call Ended \n");
}

NPObject* VideoBroadcast::getJSObject() {
    return handOutOnce<JSVideoBroadcast>(getBrowser(), m_jsObject);
}

unsigned int VideoBroadcast::getHandle() {
    return VBInstanceList.handleOf(this);
}

void VideoBroadcast::setHandle(unsigned int handle) {
    VBInstanceList.set(ref(), handle);
    m_vbHandle = handle;
    if (!bCallbacksRegistered) {
        registerCallbacks();
    }
}

// Three of the registrations name the object that happens to register for all, the removals name none.
void VideoBroadcast::registerCallbacks() {
    if (bCallbacksRegistered) {
        return;
    }
    TELIX_JS_VB_RegisterOnFullScreenChange(onFullScreenChangeCb);
    TELIX_JS_VB_RegisterOnChannelChangeSucceeded(onChannelChangeSuccededCb);
    TELIX_JS_VB_RegisterOnChannelChangeError(onChannelChangeErrorCb);
    TELIX_JS_VB_RegisterOnPlayStateChange(onPlayStateChangeCb);
    TELIX_JS_VB_RegisterOnProgrammesChanged(m_vbHandle, onProgrammesChangedCb);
    TELIX_JS_VB_RegisterOnParentalRatingChange(m_vbHandle, onParentalRatingChangeCb);
    TELIX_JS_VB_RegisterOnParentalRatingError(m_vbHandle, onParentalRatingErrorCb);
    bCallbacksRegistered = true;
}

void VideoBroadcast::unregisterCallbacks() {
    if (!bCallbacksRegistered) {
        return;
    }
    TELIX_JS_VB_UnRegisterOnFullScreenChange(onFullScreenChangeCb);
    TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded(onChannelChangeSuccededCb);
    TELIX_JS_VB_UnRegisterOnChannelChangeError(onChannelChangeErrorCb);
    TELIX_JS_VB_UnRegisterOnPlayStateChange(onPlayStateChangeCb);
    TELIX_JS_VB_UnRegisterOnProgrammesChanged(onProgrammesChangedCb);
    TELIX_JS_VB_UnRegisterOnParentalRatingChange(onParentalRatingChangeCb);
    TELIX_JS_VB_UnRegisterOnParentalRatingError(onParentalRatingErrorCb);
    bCallbacksRegistered = false;
}

void VideoBroadcast::setPlayState(int state) {
    if (m_vbHandle && state != m_playState) {
        TELIX_JS_VB_SetPlayBackState(m_vbHandle, state);
        m_playState = state;
    }
}

int VideoBroadcast::getPlayState() {
    if (m_vbHandle) {
        TELIX_PLAYSTATE_ENUM_T state = 0;
        if (TELIX_JS_VB_GetPlayBackState(m_vbHandle, &state) == 0) {
            m_playState = state;
        }
    }
    return m_playState;
}

// quirk 88: the handle stays, and with it the events.
void VideoBroadcast::release() {
    if (m_vbHandle) {
        TELIX_JS_VB_Release(m_vbHandle);
        PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_Release is called :%d \n", m_vbHandle);
    } else {
        PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_Release is not called :%d \n", m_vbHandle);
    }
}

int16_t VideoBroadcast::handleEvent(void**) {
    return 0;
}
