// The A/V control object: its kind, its creation and destruction, the display area and the play report.
#include "src/avcontrol/AVControl.h"

#include <glib.h>
#include <strings.h>
#include <unistd.h>

#include <cstdlib>
#include <vector>

#include "common/Log.h"
#include "common/ObjectKind.h"
#include "common/PluginUtils.h"
#include "common/ScriptReferences.h"
#include "src/avcontrol/JSAVControl.h"

namespace {

const char* const kMimeTypes[] = {"audio/mpeg",
                                  "video/mp4",
                                  "video/mpeg",
                                  "audio/mp4",
                                  "video/mpeg4",
                                  "video/x-ms-ism",
                                  "application/vnd.ms-sstr+xml",
                                  "application/vnd.apple.mpegurl",
                                  "audio/mpegurl",
                                  nullptr};

constexpr int kMaxDestructionWaits = 3;
constexpr uint32_t kLeastReportedDuration = 1000; // milliseconds
// A step that the browser thread has not run after this time has been dropped. If it has not, because the
// page keeps the thread busy as long, it finds its object gone.
constexpr gint64 kLongestDelay = G_TIME_SPAN_MINUTE;

AVControl& controlOf(PluginBase& model) {
    return static_cast<AVControl&>(model);
}

const StreamOperations kStreamOperations = {
    [](PluginBase& model, NPMIMEType type, NPStream* stream, NPBool seekable, uint16_t* stype) {
        return controlOf(model).newStream(type, stream, seekable, stype);
    },
    [](PluginBase& model, NPStream* stream, NPReason reason) {
        return controlOf(model).destroyStream(stream, reason);
    },
    [](PluginBase& model, NPStream* stream) { return controlOf(model).writeReady(stream); },
    [](PluginBase& model, NPStream* stream, int32_t offset, int32_t length, void* buffer) {
        return controlOf(model).write(stream, offset, length, buffer);
    },
    [](PluginBase& model, const char* url, NPReason reason, void* notifyData) {
        controlOf(model).urlNotify(url, reason, notifyData);
    }};

// The length of a clip, for the log. A clip of less than an hour leaves the hours of an earlier one, and one
// that is not longer than a second leaves all three.
struct ReportedLength {
    std::atomic<int> hours{0};
    std::atomic<int> minutes{0};
    std::atomic<int> seconds{0};

    void take(uint32_t milliseconds) {
        if (milliseconds <= kLeastReportedDuration) {
            return;
        }
        const div_t bySeconds = std::div(static_cast<int>(milliseconds / 1000), 60);
        seconds = bySeconds.rem;
        if (bySeconds.quot < 60) {
            minutes = bySeconds.quot;
            return;
        }
        const div_t byMinutes = std::div(bySeconds.quot, 60);
        minutes = byMinutes.rem;
        hours = byMinutes.quot;
    }
};

ReportedLength reportedLength;

// The end of a control's instance, in the time of g_get_monotonic_time().
struct EndedControl {
    LiveRef<AVControl> control;
    gint64 time;
};

// In the order of their ends, those of the last minute at least. Browser thread.
std::vector<EndedControl> s_endedControls;

} // namespace

const ObjectKind kAvControlKind = [] {
    ObjectKind kind{};
    kind.id = 300;
    kind.destroyText = "AVCONTROL_OBJ_ID delete :: %p \n";
    kind.mimeTypes = kMimeTypes;
    kind.create = [](NPP npp, unsigned short id) -> PluginBase* {
        AVControl::deleteAbandoned();
        return new AVControl(npp, id);
    };
    kind.dispose = [](PluginBase* model) { deleteAfterCalls(controlOf(*model)); };
    kind.init = [](PluginBase& model, const InstanceArguments& given) {
        return controlOf(model).initAV(given.mode, given.argc, given.argn, given.argv, given.mimeType);
    };
    kind.deferDestruction = [](PluginBase& model) { return controlOf(model).destroyAV() != 0; };
    kind.setWindow = [](PluginBase& model, const NPWindow* window) {
        return controlOf(model).setWindow(window, false);
    };
    kind.streams = &kStreamOperations;
    return kind;
}();

std::atomic<AVControl*> g_lastPlayedInstance{nullptr};

AVControl::AVControl(NPP npp, unsigned short objectKind)
    : PluginBase(npp, objectKind), m_mainThread(pthread_self()) {
    if (const char* limit = std::getenv("PLUGIN_BUFFERING_LOWER_LIMIT")) {
        m_lowerLimit = static_cast<uint32_t>(std::atoi(limit));
        PLUGIN_LOG(AVCONTROL, "Lower limit obtained from system: %u", m_lowerLimit);
    } else {
        PLUGIN_LOG(AVCONTROL, "Lower limit obtained from default value %u", m_lowerLimit);
    }
    if (const char* limit = std::getenv("PLUGIN_BUFFERING_UPPER_LIMIT")) {
        m_upperLimit = static_cast<uint32_t>(std::atoi(limit));
        PLUGIN_LOG(AVCONTROL, "Upper limit obtained from system: %u", m_upperLimit);
    } else {
        PLUGIN_LOG(AVCONTROL, "Upper limit obtained from default value %u", m_upperLimit);
    }
}

AVControl::~AVControl() {
    PLUGIN_LOG(AVCONTROL, " Exiting\n");
    TELIX_JS_AV_UnregisterOnPlayStateChange(onPlayStateChangeCb);
    TELIX_JS_AV_UnregisterOnDRMRightsError(onDRMRightsErrorCb);
    endMonitors();
    for (int i = 0; i < kMaxDestructionWaits && m_workingAsyncCalls != 0; ++i) {
        sleep(1);
    }
    // A clip that began after destroyAV() was a change of state already posted then.
    AVControl* self = this;
    g_lastPlayedInstance.compare_exchange_strong(self, nullptr);
    releaseHeld(m_onPlayStateChange);
    releaseHeld(m_onPlaySpeedChanged);
    releaseHeld(m_onPlayPositionChanged);
    releaseHeld(m_jsObject);
    releaseHeld(m_videoComponents);
    releaseHeld(m_audioComponents);
    releaseHeld(m_subtitleComponents);
    releaseHeld(m_onDRMRightsError);
}

NPError AVControl::initAV(unsigned short mode, int argc, char** argn, char** argv, char* mimeType) {
    const NPError rv = init(mode, argc, argn, argv);
    setObjectStyle("url(tv:)");
    if (rv == NPERR_NO_ERROR) {
        m_mimeType = mimeType;
        for (int i = 0; i < argc; ++i) {
            if (argn[i]) {
                readAttribute(argn[i], argv[i] ? argv[i] : "");
            }
        }
        if (getPluginMode() == NP_FULL) {
            openPlayerPage();
            return NPERR_NO_ERROR;
        }
        lookAtMedia(mimeType);
    }
    if (TELIX_JS_AV_CreatePlayer(&m_playerHandle, m_containerCode, m_audioCodecCode, m_memoryAudio) != 0) {
        return NPERR_GENERIC_ERROR;
    }
    PLUGIN_LOG(AVCONTROL, "TELIX_JS_AV_CreatePlayer returned the PlayerHandle:: %d ", m_playerHandle);
    TELIX_JS_AV_RegisterOnPlayStateChange(m_playerHandle, onPlayStateChangeCb);
    TELIX_JS_AV_RegisterOnDRMRightsError(m_playerHandle, onDRMRightsErrorCb);
    return rv;
}

void AVControl::readAttribute(const char* name, const char* value) {
    const auto named = [name](const char* wanted) { return strcasecmp(name, wanted) == 0; };
    const auto saying = [value](const char* wanted) { return strcasecmp(value, wanted) == 0; };
    if (named("downloadable") && saying("true")) {
        m_downloadable = true;
    } else if (named("buffering") && saying("false")) {
        m_buffering = false;
    } else if (named("bufferingLowerLimit")) {
        m_lowerLimit = static_cast<uint32_t>(std::atoi(value));
    } else if (named("bufferingUpperLimit")) {
        m_upperLimit = static_cast<uint32_t>(std::atoi(value));
    } else if (named("playCount")) {
        m_playCount = static_cast<uint32_t>(std::atoi(value));
    } else if (named("data")) {
        m_fetchStream = false;
        setData(value);
    } else if (named("src1") || (named("oneshot_url") && saying("true"))) {
        m_sourceCode = SourceCode::OneShot;
        m_fetchStream = false;
        m_streamState = StreamState::Ready;
    }
}

void AVControl::openPlayerPage() {
    const char* page = std::getenv("PLUGIN_PLAYER_URL");
    // The URL is appended as it is, without escaping.
    const std::string url = std::string(page ? page : "file:///mnt/browser/pages/player/index.html") +
                            "?qv_media_url=" + getURL();
    if (NPN_GetURL(m_npp, url.c_str(), "_self") != NPERR_NO_ERROR) {
        PLUGIN_LOG_FOR(LogModule::AVCONTROL, "initAV", "NPN_GetURL failed for URL:: %s ", url.c_str());
    }
}

void AVControl::lookAtMedia(const std::string& mimeType) {
    detectMediaType(mimeType);
    if (m_mediaType == 0) {
        return;
    }
    const std::string url = getURL();
    if (m_fetchStream && url.rfind("http://", 0) == 0) {
        getURLValue(url);
    } else {
        postAsyncCall(m_npp, startMediaCb, this);
    }
}

// Playback itself starts from script only, or from the end of a playlist's stream. The address is logged and
// not followed, so the step needs no live object.
void AVControl::startMediaCb(void* address) {
    PLUGIN_LOG(AVCONTROL, "Instance: %p \n", address);
}

int AVControl::destroyAV() {
    PLUGIN_LOG(AVCONTROL, "Data: %s, PlayerHandle: %u, g_lastPlayedInstance: %p, This: %p \n", m_data.c_str(),
               m_playerHandle, static_cast<void*>(g_lastPlayedInstance), static_cast<void*>(this));
    setPluginState(PLUGIN_STATE_DESTROYING);
    destroyBufferingThread();
    if (m_playerHandle && m_mediaType != 0) {
        TELIX_JS_AV_Stop(m_playerHandle);
        TELIX_JS_AV_DestroyPlayer(m_playerHandle);
        if (g_lastPlayedInstance == this) {
            g_lastPlayedInstance = nullptr;
        }
    }
    s_endedControls.push_back({m_live.ref(), g_get_monotonic_time()});
    postAsyncCallIfAlive(m_npp, m_live.ref(), destroyMediaCB);
    return 1;
}

void AVControl::destroyMediaCB(void* object) {
    deleteAfterCalls(*static_cast<AVControl*>(object));
}

// NPAPI lets an engine drop what was posted for an instance that has ended, and some do.
void AVControl::deleteAbandoned() {
    const gint64 now = g_get_monotonic_time();
    while (!s_endedControls.empty() && now - s_endedControls.front().time > kLongestDelay) {
        AVControl* const control = s_endedControls.front().control.get();
        s_endedControls.erase(s_endedControls.begin());
        if (control) {
            control->m_workingAsyncCalls = 0; // dropped as well: nothing to wait for
            deleteAfterCalls(*control);
        }
    }
}

bool AVControl::isBrowserThread() const {
    return pthread_self() == m_mainThread;
}

NPObject* AVControl::getJSObject() {
    return handOutOnce<JSAVControl>(m_npp, m_jsObject);
}

NPError AVControl::setWindow(const NPWindow*, bool forceReset) {
    setPluginRegionFromDOM();
    if (m_mediaType == 0) {
        return NPERR_NO_ERROR;
    }
    const Area area = m_displayArea.choose(*this, isFullScreen());
    const bool isEnding = getPluginState() == PLUGIN_STATE_DESTROYING; // by script, since this call began
    if (m_playerHandle && !isEnding && (forceReset || !m_displayArea.isAccepted(area))) {
        m_displayArea.present(m_npp, area, m_playerHandle, TELIX_JS_AV_SetDisplayArea);
    }
    return NPERR_NO_ERROR;
}

void AVControl::setPluginRegionFromDOM() {
    m_displayArea.readRegion(*this);
}

void AVControl::printMonitoringInfo(int kind) {
    if (kind == 1 && m_playerHandle) {
        takeReportedLength(m_playerHandle);
        reportClip("Start");
    } else if (kind == 2) {
        reportClip("End");
    }
}

void AVControl::takeReportedLength(uint32_t player) {
    TELIX_JS_AV_PLAY_INFO* info = nullptr; // stays the platform's
    if (TELIX_JS_AV_GetPlayInfo(player, &info) == 0 && info) {
        PLUGIN_LOG_FOR(LogModule::AVCONTROL, "printMonitoringInfo",
                       "TELIX_JS_AV_GetPlayInfo -(state:%d, duration:%d, playPosition:%d)", info->state,
                       info->duration, info->playPosition);
        reportedLength.take(info->duration);
    }
}

void AVControl::reportClip(const char* status) const {
    PLUGIN_LOG_FOR(LogModule::AVCONTROL, "printMonitoringInfo",
                   "<Play><Status>%s</Status><File>%s,%02d:%02d:%02d</File></Play>", status,
                   currentMedia().c_str(), reportedLength.hours.load(), reportedLength.minutes.load(),
                   reportedLength.seconds.load());
}
