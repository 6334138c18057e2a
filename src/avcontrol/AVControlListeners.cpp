// The script listeners, the notification of a new speed and position, and DRM rights errors from the
// platform to the page.
#include <cstdlib>
#include <cstring>

#include "common/LiveRef.h"
#include "common/Log.h"
#include "common/PluginUtils.h"
#include "common/ScriptReferences.h"
#include "common/ScriptValues.h"
#include "src/avcontrol/AVControl.h"

namespace {

// A rights error that is posted to the browser thread, with copies of the platform's strings.
class DRMRgtsErrEvtData {
public:
    // The strings must not be null. If memory runs out, a string and those after it stay null.
    DRMRgtsErrEvtData(unsigned int handle, TELIX_AV_DRM_ERR_STATE_ENUM_T state, const char* contentId,
                      const char* drmSystemId, const char* rightsIssuerUrl)
        : m_playerHandle(handle), m_errorState(state) {
        const char* const strings[] = {contentId, drmSystemId, rightsIssuerUrl};
        for (size_t i = 0; i < kStrings && (m_strings[i] = strdup(strings[i])); ++i) {
        }
    }
    DRMRgtsErrEvtData(const DRMRgtsErrEvtData&) = delete;
    DRMRgtsErrEvtData& operator=(const DRMRgtsErrEvtData&) = delete;
    ~DRMRgtsErrEvtData() {
        for (char*& string : m_strings) {
            std::free(string);
            string = nullptr;
        }
    }

    static constexpr size_t kStrings = 3;

    TELIX_AV_DRM_ERR_STATE_ENUM_T errorState() const { return m_errorState; }
    // Content id, DRM system id, rights issuer URL.
    const char* string(size_t index) const { return m_strings[index]; }

private:
    const unsigned int m_playerHandle; // selects nothing: the event is the last played object's
    const TELIX_AV_DRM_ERR_STATE_ENUM_T m_errorState;
    char* m_strings[kStrings] = {};
};

int handleDRMRightsErrorEvent(void* record) {
    PLUGIN_LOG(DRMAGENT, " handleDRMRightsErrorEvent \n");
    AVControl* instance = g_lastPlayedInstance;
    auto* event = static_cast<DRMRgtsErrEvtData*>(record);
    if (!instance || !event) {
        return 0; // the record is not freed
    }
    const CallGuard guard(*instance);
    // quirk 75: an element without an id stops the process here.
    instance->invokeJScript(domEventScript(instance->getId(), "DRMRightsError", false, false));
    // The getter's reference is never released, and the strings stay with whoever took the arguments.
    if (NPObject* listener = instance->getOnDRMRightsError()) {
        NPVariant arguments[1 + DRMRgtsErrEvtData::kStrings] = {};
        setResult(arguments[0], event->errorState());
        for (size_t i = 0; i < DRMRgtsErrEvtData::kStrings; ++i) {
            const char* string = event->string(i);
            NPVariant& argument = arguments[1 + i];
            if (!string || !setText(argument, string, std::strlen(string))) {
                setNull(argument);
            }
        }
        instance->invokeJScriptFunc(listener, arguments, 1 + DRMRgtsErrEvtData::kStrings);
    }
    delete event;
    return 0;
}

const char* stringOf(const unsigned char* bytes) {
    return reinterpret_cast<const char*>(bytes);
}

} // namespace

int AVControl::onDRMRightsErrorCb(unsigned int handle, TELIX_AV_DRM_ERR_STATE_ENUM_T state,
                                  unsigned char* contentId, unsigned char* drmSystemId,
                                  unsigned char* rightsIssuerUrl) {
    PLUGIN_LOG(DRMAGENT,
               " Received Callback from system. Player Handle: %u, Error State: (%u), Content Id: (%s), DRM "
               "System Id: (%s),  RightsIssuerURL: (%s) \n",
               handle, state, stringOf(contentId), stringOf(drmSystemId), stringOf(rightsIssuerUrl));
    postIdle(handleDRMRightsErrorEvent,
             new DRMRgtsErrEvtData(handle, state, stringOf(contentId), stringOf(drmSystemId),
                                   stringOf(rightsIssuerUrl)));
    return 0;
}

void AVControl::setOnPlayStateChange(NPObject* listener) {
    replaceListener(m_onPlayStateChange, listener);
}

void AVControl::setOnFullScreenChange(NPObject* listener) {
    replaceListener(m_onFullScreenChange, listener);
}

void AVControl::setOnPlaySpeedChanged(NPObject* listener) {
    replaceListener(m_onPlaySpeedChanged, listener);
}

void AVControl::setOnPlayPositionChanged(NPObject* listener) {
    replaceListener(m_onPlayPositionChanged, listener);
}

void AVControl::setOnDRMRightsError(NPObject* listener) {
    replaceListener(m_onDRMRightsError, listener);
}

NPObject* AVControl::getOnPlayStateChange() {
    return handOut(m_onPlayStateChange);
}

NPObject* AVControl::getOnFullScreenChange() {
    return handOut(m_onFullScreenChange);
}

NPObject* AVControl::getOnPlaySpeedChanged() {
    return handOut(m_onPlaySpeedChanged);
}

NPObject* AVControl::getOnPlayPositionChanged() {
    return handOut(m_onPlayPositionChanged);
}

NPObject* AVControl::getOnDRMRightsError() {
    return handOut(m_onDRMRightsError);
}

void AVControl::handlePlaySpeedChanged() {
    if (m_onPlaySpeedChanged) {
        invokeJScriptFunc(m_onPlaySpeedChanged, nullptr, 0);
    }
}

void AVControl::handlePlayPositionChanged() {
    if (!isBrowserThread()) {
        postAsyncCallIfAlive(m_npp, m_live.ref(), playPositionChangedCb);
        return;
    }
    if (m_onPlayPositionChanged) {
        invokeJScriptFunc(m_onPlayPositionChanged, nullptr, 0);
    }
}

void AVControl::playPositionChangedCb(void* object) {
    auto* control = static_cast<AVControl*>(object);
    const CallGuard guard(*control);
    control->handlePlayPositionChanged();
}
