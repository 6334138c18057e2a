// The video/broadcast object: its life, geometry, play state and script handlers, and stream events.
#include "src/videobroadcast/VideoBroadcast.h"

#include <glib.h>
#include <strings.h>

#include <cassert>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "common/Log.h"
#include "common/ObjectKind.h"
#include "common/PluginUtils.h"
#include "common/ScriptReferences.h"
#include "common/ScriptValues.h"
#include "src/videobroadcast/JSVideoBroadcast.h"
#include "src/videobroadcast/VideoBroadcastUtils.h"
#include "telix/telix_platform.h"

InstanceList VideoBroadcast::VBInstanceList;
std::atomic<bool> VideoBroadcast::bCallbacksRegistered{false};

namespace {

constexpr int kScreenWidth = 1280;
constexpr int kScreenHeight = 720;

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
    kind.handleEvent = [](PluginBase& model, void* event) {
        return static_cast<VideoBroadcast&>(model).handleEvent(static_cast<void**>(event));
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
    return VBInstanceList.find(handle);
}

void VideoBroadcast::addInstance(VideoBroadcast* instance) {
    VBInstanceList.set(instance, 0);
    PLUGIN_LOG(VIDEOBCAST, "Added inst :: %p \n", static_cast<void*>(instance));
}

void VideoBroadcast::deleteInstance(VideoBroadcast* instance) {
    if (VBInstanceList.erase(instance)) {
        PLUGIN_LOG(VIDEOBCAST, "Deleted inst :: %p \n", static_cast<void*>(instance));
    }
    if (bCallbacksRegistered && VBInstanceList.handles().empty()) {
        unregisterCallbacks();
    }
}

bool VideoBroadcast::checkValidInstance(VideoBroadcast* instance) {
    PLUGIN_LOG(VIDEOBCAST, "VBInstanceList size : %d \n", static_cast<int>(VBInstanceList.handles().size()));
    for (const auto& entry : VBInstanceList.handles()) {
        PLUGIN_LOG(VIDEOBCAST, "VB Instance in List: %p \n", static_cast<void*>(entry.first));
        if (entry.first == instance) {
            return true;
        }
    }
    return false;
}

VideoBroadcast* VideoBroadcast::getActiveInst() {
    PLUGIN_LOG(VIDEOBCAST, "Size of Map:: %d \n", static_cast<int>(VBInstanceList.handles().size()));
    for (const auto& entry : VBInstanceList.handles()) {
        if (entry.first->isActive()) {
            return entry.first;
        }
    }
    return nullptr;
}

VideoBroadcast::VideoBroadcast(NPP npp, unsigned short objectId) : PluginBase(npp, objectId) {
    PLUGIN_LOG(VIDEOBCAST, "Constructor called, NPP instance: %p \n", static_cast<void*>(npp));
}

VideoBroadcast::~VideoBroadcast() {
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
    // Meant: the platform handle goes before the subscriptions that were made with it.
    release();
    deleteInstance(this);
    deleteStreamEventInfo();
    PLUGIN_LOG(VIDEOBCAST, "Destructor call Ended \n");
}

NPObject* VideoBroadcast::getJSObject() {
    return handOutOnce<JSVideoBroadcast>(getBrowser(), m_jsObject);
}

unsigned int VideoBroadcast::getHandle() {
    return VBInstanceList.handleOf(this);
}

void VideoBroadcast::setHandle(unsigned int handle) {
    VBInstanceList.set(this, handle);
    m_vbHandle = handle;
    if (!bCallbacksRegistered) {
        registerCallbacks();
    }
}

// Meant: three of the registrations name the object that happens to register for all, the removals name none.
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

void VideoBroadcast::setWidth(int width) {
    PLUGIN_LOG(VIDEOBCAST, ":: new Width= %d \n", width);
    m_nWidth = width;
    g_idle_add(shouldChangeWidth, this);
}

void VideoBroadcast::setHeight(int height) {
    PLUGIN_LOG(VIDEOBCAST, ":: new height= %d \n", height);
    m_nHeight = height;
    g_idle_add(shouldChangeHeight, this);
}

int VideoBroadcast::shouldChangeWidth(void* object) {
    auto* self = static_cast<VideoBroadcast*>(object);
    if (isListed(self)) {
        self->applySize(__func__, "TELIX_JS_VB_SetWidth", TELIX_JS_VB_SetWidth, self->m_nWidth,
                        self->m_pWidth);
    }
    return G_SOURCE_REMOVE;
}

int VideoBroadcast::shouldChangeHeight(void* object) {
    auto* self = static_cast<VideoBroadcast*>(object);
    if (isListed(self)) {
        self->applySize(__func__, "TELIX_JS_VB_SetHeight", TELIX_JS_VB_SetHeight, self->m_nHeight,
                        self->m_pHeight);
    }
    return G_SOURCE_REMOVE;
}

void VideoBroadcast::applySize(const char* step, const char* callName, SetSize call, int wanted,
                               int& applied) {
    if (!m_vbHandle) {
        // Meant: despite its words the step goes on without a handle.
        PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, step, "m_vbHandle is NULL. Nothing to do, return. \n");
    }
    if (wanted == applied) {
        return;
    }
    if (call(m_vbHandle, wanted) == 0) {
        applied = wanted;
        PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, step, "%s Succeeded \n", callName);
    } else {
        PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, step, "%s Failed \n", callName);
    }
}

int VideoBroadcast::getWidth() {
    if (m_pWidth == 0 && m_vbHandle) {
        int32_t width = 0;
        if (TELIX_JS_VB_GetWidth(m_vbHandle, &width) == 0) {
            m_pWidth = width;
        }
    }
    return m_pWidth;
}

int VideoBroadcast::getHeight() {
    if (m_pHeight == 0 && m_vbHandle) {
        int32_t height = 0;
        if (TELIX_JS_VB_GetHeight(m_vbHandle, &height) == 0) {
            m_pHeight = height;
        }
    }
    return m_pHeight;
}

void VideoBroadcast::setPluginRegionFromDOM() {
    NPVariant rectangle{};
    if (!NPN_Invoke(m_npp, getNPPluginObj(), NPN_GetStringIdentifier("getBoundingClientRect"), nullptr, 0,
                    &rectangle)) {
        return;
    }
    const auto readEdge = [&](const char* name, int& edge, int origin) {
        NPVariant value{};
        // The type of the result is not tested: the page's function of this name gives an object.
        if (NPN_GetProperty(m_npp, rectangle.value.objectValue, NPN_GetStringIdentifier(name), &value)) {
            edge = toInt32(numberValue(value)) - origin;
            NPN_ReleaseVariantValue(&value);
        }
    };
    readEdge("left", m_region.x, 0);
    readEdge("top", m_region.y, 0);
    readEdge("right", m_region.width, m_region.x);
    readEdge("bottom", m_region.height, m_region.y);
    NPN_ReleaseVariantValue(&rectangle);
}

void VideoBroadcast::setWindow(const NPWindow*, bool bForceReset) {
    setPluginRegionFromDOM();
    Area area = m_isFullScreen ? Area{0, 0, kScreenWidth, kScreenHeight} : m_region;
    if (area == Area{}) {
        setPluginRegionFromDOM();
        area = m_region;
        if (area.width == kScreenWidth && area.height == kScreenHeight) {
            area.x = 0;
            area.y = 0;
        }
    }
    PLUGIN_LOG(VIDEOBCAST, "Window Values:: m_X: %d, m_Y: %d, m_width: %d, m_height: %d, bForceReset: %d \n",
               area.x, area.y, area.width, area.height, bForceReset);
    if (!m_vbHandle || (!bForceReset && area == m_displayArea)) {
        PLUGIN_LOG(VIDEOBCAST, "setWindow Condition failed::m_vbHandle ( %d )\n", m_vbHandle);
    } else {
        NPRect stale{};
        stale.top = static_cast<uint16_t>(area.y);
        stale.left = static_cast<uint16_t>(area.x);
        stale.bottom = static_cast<uint16_t>(area.y + area.height);
        stale.right = static_cast<uint16_t>(area.x + area.width);
        NPN_InvalidateRect(m_npp, &stale);
        const TELIX_JS_DISPLAY_AREA record{static_cast<uint16_t>(area.x), static_cast<uint16_t>(area.y),
                                           static_cast<uint16_t>(area.width),
                                           static_cast<uint16_t>(area.height)};
        if (TELIX_JS_VB_SetDisplayArea(m_vbHandle, &record) == 0) {
            m_displayArea = area;
        } else {
            // The old area stays, so that the next call tries again.
            PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_SetDisplayArea failed: \n");
        }
    }
    PLUGIN_LOG(VIDEOBCAST, "Call Ended \n");
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

bool VideoBroadcast::isFullScreen() {
    ___UINT8 fullScreen = 0;
    if (TELIX_JS_VB_IsFullScreen(m_vbHandle, &fullScreen) == 0) {
        m_isFullScreen = fullScreen != 0;
        PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_IsFullScreen is called. FullScreen = %d \n", m_isFullScreen);
    } else {
        PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_IsFullScreen is not called %d \n", m_isFullScreen);
    }
    return m_isFullScreen;
}

void VideoBroadcast::setFullScreenChange(bool bFullScreen) {
    PLUGIN_LOG(VIDEOBCAST, "is called m_isFullScreen = %d, bFullScreen = %d \n", m_isFullScreen, bFullScreen);
    if (bFullScreen == m_isFullScreen) {
        return;
    }
    if (TELIX_JS_VB_SetFullScreen(m_vbHandle, bFullScreen) != 0) {
        PLUGIN_LOG(VIDEOBCAST,
                   "TELIX_JS_VB_SetFullScreen is not called :: bFullScreen: %d :: m_isFullScreen :%d \n",
                   bFullScreen, m_isFullScreen);
        return;
    }
    m_isFullScreen = bFullScreen;
    PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_SetFullScreen is called :: bFullScreen: %d :: m_isFullScreen :%d \n",
               bFullScreen, m_isFullScreen);
    setFullScreen(bFullScreen);
    // Meant: the platform's own report of the change calls the handler once more.
    if (NPObject* handler = getOnFullScreenChange()) {
        NPVariant state{};
        setResult(state, bFullScreen);
        invokeJScriptFunc(handler, &state, 1);
        NPN_ReleaseObject(handler); // held during the call: the handler may take itself out of the slot
    }
}

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

NPObject* VideoBroadcast::getOnFullScreenChange() {
    return handOut(m_onFullScreenChangeObj);
}

NPObject* VideoBroadcast::getOnPlayStateChange() {
    return handOut(m_onPlayStateChangeObj);
}

NPObject* VideoBroadcast::getOnChannelChangeSucceeded() {
    return handOut(m_onChannelChangeSucceededObj);
}

NPObject* VideoBroadcast::getOnChannelChangeError() {
    return handOut(m_onChannelChangeErrorObj);
}

NPObject* VideoBroadcast::getOnProgrammesChanged() {
    return handOut(m_onProgrammesChangedObj);
}

NPObject* VideoBroadcast::getOnParentalRatingChange() {
    return handOut(m_onParentalRatingChangeObj);
}

NPObject* VideoBroadcast::getOnParentalRatingError() {
    return handOut(m_onParentalRatingErrorObj);
}

void VideoBroadcast::setOnFullScreenChange(NPObject* handler) {
    replaceListener(m_onFullScreenChangeObj, handler);
}

void VideoBroadcast::setOnPlayStateChange(NPObject* handler) {
    replaceListener(m_onPlayStateChangeObj, handler);
}

void VideoBroadcast::setOnChannelChangeSucceeded(NPObject* handler) {
    replaceListener(m_onChannelChangeSucceededObj, handler);
}

void VideoBroadcast::setOnChannelChangeError(NPObject* handler) {
    replaceListener(m_onChannelChangeErrorObj, handler);
}

void VideoBroadcast::setOnProgrammesChanged(NPObject* handler) {
    replaceListener(m_onProgrammesChangedObj, handler);
}

void VideoBroadcast::setOnParentalRatingChange(NPObject* handler) {
    replaceListener(m_onParentalRatingChangeObj, handler);
}

void VideoBroadcast::setOnParentalRatingError(NPObject* handler) {
    replaceListener(m_onParentalRatingErrorObj, handler);
}

namespace {

bool startsWithIgnoringCase(const std::string& text, const char* start) {
    return strncasecmp(text.c_str(), start, std::strlen(start)) == 0;
}

// Calls the element's addEventListener or removeEventListener for stream events.
void changeDOMListener(NPP npp, NPObject* element, const char* operation, NPObject* listener) {
    static const NPString eventType{"StreamEvent", 11};
    NPVariant args[3]{};
    args[0].type = NPVariantType_String;
    args[0].value.stringValue = eventType;
    setResult(args[1], listener); // borrowed: the page keeps its listener
    setResult(args[2], false);
    NPVariant result{};
    if (NPN_Invoke(npp, element, NPN_GetStringIdentifier(operation), args, 3, &result)) {
        NPN_ReleaseVariantValue(&result);
    }
}

} // namespace

void VideoBroadcast::addStreamEventListener(const std::string& targetUrl, const std::string& eventName,
                                            NPObject* streamEventListener) {
    PLUGIN_LOG(VIDEOBCAST, "VBHandle:-- %d --, TargetURL: %s\n", m_vbHandle, targetUrl.c_str());
    assert(streamEventListener);
    const std::string script = parseStreamEventXMLScript(targetUrl, eventName, getId(), true);
    NPObject* window = getNPWindowObj();
    if (!window) {
        return;
    }
    NPString text{script.data(), static_cast<uint32_t>(script.size())};
    NPVariant result{};
    if (!NPN_Evaluate(m_npp, window, &text, &result)) {
        return;
    }
    NPN_ReleaseVariantValue(&result);
    NPObject* element = getNPPluginObj();
    if (!element) {
        return;
    }
    PLUGIN_LOG(VIDEOBCAST, "::PluginObject:-- %p -- , StreamEvent Listener: %p \n",
               static_cast<void*>(element), static_cast<void*>(streamEventListener));
    changeDOMListener(m_npp, element, "addEventListener", streamEventListener);
}

void VideoBroadcast::addStreamEventListener(const std::string& targetUrl, const std::string& eventName,
                                            const std::string& eventId, const std::string& componentTag) {
    PLUGIN_LOG(VIDEOBCAST, "VBHandle:-- %d -- \n", m_vbHandle);
    assert(m_vbHandle);
    std::string tag = componentTag;
    if (!targetUrl.empty()) {
        const std::string urlPath = getBaseURL(targetUrl);
        PLUGIN_LOG(VIDEOBCAST, "urlPath:-- %s \n", urlPath.c_str());
        if (startsWithIgnoringCase(urlPath, "http")) {
            const std::string targetUrlSubStr = targetUrl.substr(0, 6);
            PLUGIN_LOG(VIDEOBCAST, "targetUrlSubStr:-- %s \n", targetUrlSubStr.c_str());
            // A description that came over http writes the tag in decimal; the platform wants it in hex.
            if (strcasecmp(targetUrlSubStr.c_str(), "dvb://") != 0) {
                const int number = std::atoi(tag.c_str());
                PLUGIN_LOG(VIDEOBCAST, "comp_tag value: Decimal value:-- %d \n", number);
                char hex[2 * sizeof(number) + 1];
                std::snprintf(hex, sizeof(hex), "%x", static_cast<unsigned int>(number));
                PLUGIN_LOG(VIDEOBCAST, "comp_tag value: Hex value:-- %s \n", hex);
                tag = hex;
            }
        }
    }
    m_StreamEventList.push_back({targetUrl, tag, eventId, eventName});
    PLUGIN_LOG(VIDEOBCAST, "Event Name: %s , Id: %s , CTag: %s \n", eventName.c_str(), eventId.c_str(),
               tag.c_str());
    // The subscription stays whatever the platform answers.
    TELIX_JS_VB_RegisterStreamEvent(m_vbHandle, streamEventHandler, eventId.c_str(), tag.c_str(),
                                    eventName.c_str());
}

unsigned int VideoBroadcast::getStreamEventInfo(const std::string& targetUrl) {
    PLUGIN_LOG(VIDEOBCAST, "size of m_StreamEventList: %d \n", static_cast<int>(m_StreamEventList.size()));
    unsigned int found = static_cast<unsigned int>(-1);
    for (unsigned int i = 0; i < m_StreamEventList.size(); ++i) {
        if (m_StreamEventList[i].targetUrl == targetUrl) {
            found = i;
        }
    }
    return found;
}

void VideoBroadcast::removeStreamEventListener(const std::string& targetUrl, const std::string& eventName,
                                               NPObject* streamEventListener) {
    PLUGIN_LOG(VIDEOBCAST, "VBHandle:-- %d --, TargetURL: %s\n", m_vbHandle, targetUrl.c_str());
    assert(streamEventListener);
    if (NPObject* element = getNPPluginObj()) {
        PLUGIN_LOG(VIDEOBCAST, "::PluginObject:-- %p -- , StreamEvent Listener: %p \n",
                   static_cast<void*>(element), static_cast<void*>(streamEventListener));
        changeDOMListener(m_npp, element, "removeEventListener", streamEventListener);
    }
    const unsigned int count = getStreamEventInfo(targetUrl);
    if (count == static_cast<unsigned int>(-1)) {
        return;
    }
    PLUGIN_LOG(VIDEOBCAST, "count value returned is: %d \n", count);
    const StreamEventInfo removed = m_StreamEventList[count];
    m_StreamEventList.erase(m_StreamEventList.begin() + count);
    if (m_vbHandle) {
        PLUGIN_LOG(VIDEOBCAST, "Event Name: %s, Id: %s, CTag: %s \n", eventName.c_str(),
                   removed.eventId.c_str(), removed.componentTag.c_str());
        // Meant: the caller's name, which need not be that of the subscription that went.
        TELIX_JS_VB_UnRegisterStreamEvent(m_vbHandle, streamEventHandler, removed.eventId.c_str(),
                                          removed.componentTag.c_str(), eventName.c_str());
    }
}

void VideoBroadcast::deleteStreamEventInfo() {
    PLUGIN_LOG(VIDEOBCAST, "Size of m_StreamEventList List: %d \n",
               static_cast<int>(m_StreamEventList.size()));
    while (!m_StreamEventList.empty()) {
        const StreamEventInfo& last = m_StreamEventList.back();
        PLUGIN_LOG(VIDEOBCAST, "m_StreamEventList[%u] TargetURL: %s \n",
                   static_cast<unsigned int>(m_StreamEventList.size() - 1), last.targetUrl.c_str());
        TELIX_JS_VB_UnRegisterStreamEvent(m_vbHandle, streamEventHandler, last.eventId.c_str(),
                                          last.componentTag.c_str(), last.eventName.c_str());
        m_StreamEventList.pop_back();
    }
}
