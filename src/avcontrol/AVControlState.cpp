// Play state and ready state: how a platform message is posted to the browser thread, what it means, and how
// a change of state reaches the page.
#include <cstdlib>
#include <new>

#include "common/LiveRef.h"
#include "common/Log.h"
#include "common/PluginUtils.h"
#include "src/avcontrol/AVControl.h"
#include "src/avcontrol/Asx.h"

std::atomic<uint32_t> g_lastReceivedMessage{0};

namespace {

// A platform message that is posted to the browser thread.
struct AVPlayStateEvent {
    unsigned int playerHandle = 0;
    TELIX_AV_CB_MSG message = 0;
};

// A change of state that is posted to the browser thread; a block of malloc.
struct PlayStateChange {
    LiveRef<AVControl> object;
    play_state from;
    play_state to;
};

// What the messages of the platform that report an error are to processError().
struct MessageError {
    TELIX_AV_CB_MSG message;
    avcontrol_ce_error error;
};

constexpr MessageError kMessageErrors[] = {
    {TELIX_AV_CB_MSG_ERR_PLAYING, AVCONTROL_ERROR_UNIDENTIFIED},
    {TELIX_AV_CB_MSG_ERR_NOT_FOUND, AVCONTROL_ERROR_CONTENT_NOT_AVAILABLE},
    {TELIX_AV_CB_MSG_ERR_CODEC_NOT_SUPPORTED, AVCONTROL_ERROR_FORMAT},
    {TELIX_AV_CB_MSG_ERR_NET_DISCONNECTED, AVCONTROL_ERROR_CONNECTION},
    {TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT, AVCONTROL_ERROR_CONNECTION},
    {TELIX_AV_CB_MSG_ERR_WMDRM_CANNOT_PROCESS, AVCONTROL_ERROR_DRM_CANNOT_PROCESS},
    {TELIX_AV_CB_MSG_ERR_WMDRM_LIC_FAILLOCAL, AVCONTROL_ERROR_DRM_LICENCE_LOCAL},
    {TELIX_AV_CB_MSG_ERR_WMDRM_LIC_FAILTRANSFER, AVCONTROL_ERROR_DRM_LICENCE_TRANSFER},
    {TELIX_AV_CB_MSG_ERR_WMDRM_LIC_EXPIRED, AVCONTROL_ERROR_DRM_LICENCE_EXPIRED},
};

// The value of the script property `error` for the reasons of an error. Other reasons leave it as it is.
struct ScriptError {
    avcontrol_ce_error first;
    avcontrol_ce_error last;
    int32_t value;
    const char* logText;
};

constexpr char kUnidentified[] = "error : AVControl_UnIdentified_Error\n";

constexpr ScriptError kScriptErrors[] = {
    {AVCONTROL_ERROR_FORMAT, AVCONTROL_ERROR_FORMAT, 0, "error : AVControl_Format_Error\n"},
    {AVCONTROL_ERROR_CONNECTION, AVCONTROL_ERROR_CONNECTION, 1, "error : AVControl_Connection_Error\n"},
    {AVCONTROL_ERROR_UNIDENTIFIED, AVCONTROL_ERROR_UNIDENTIFIED, 2, kUnidentified},
    {AVCONTROL_ERROR_CONTENT_NOT_AVAILABLE, AVCONTROL_ERROR_CONTENT_NOT_AVAILABLE, 5,
     "error : AVControl_Content_NotAvailable\n"},
    {AVCONTROL_ERROR_CONTENT_FIRST, AVCONTROL_ERROR_CONTENT_LAST, 2, kUnidentified},
    {AVCONTROL_ERROR_DRM_CANNOT_PROCESS, AVCONTROL_ERROR_DRM_LICENCE_EXPIRED, 2, kUnidentified},
};

} // namespace

// quirk 51: the handle selects nothing; a message is for the object that played last.
int AVControl::onPlayStateChangeCb(unsigned int handle, TELIX_AV_CB_MSG msg) {
    PLUGIN_LOG(AVCONTROL, "Received message from tv : (%x)\n", msg);
    auto* event = new AVPlayStateEvent;
    event->playerHandle = handle;
    event->message = msg;
    // The overload for the idle step is the one with a single argument.
    int (*idleStep)(void*) = onPlayStateChangeCb;
    postIdle(idleStep, event);
    return 0;
}

int AVControl::onPlayStateChangeCb(void* record) {
    auto* event = static_cast<AVPlayStateEvent*>(record);
    AVControl* instance = g_lastPlayedInstance;
    if (!event || !instance) {
        // The small record of a message after the last player has gone is not freed.
        return 0;
    }
    const CallGuard guard(*instance);
    instance->handlePlayStateChange(event->playerHandle, event->message);
    delete event;
    return 0;
}

void AVControl::handlePlayStateChange(unsigned int handle, TELIX_AV_CB_MSG msg) {
    AVControl* instance = g_lastPlayedInstance;
    if (!instance) {
        PLUGIN_LOG(AVCONTROL, "g_lastPlayedInstance not found\n");
        return;
    }
    if (instance != this && !isBrowserThread()) {
        // Another object may be about to end: its message is posted as the platform's are.
        onPlayStateChangeCb(handle, msg);
        return;
    }
    if (instance->getPluginState() == PLUGIN_STATE_DESTROYING) {
        PLUGIN_LOG(AVCONTROL, "Ignore message while destroying plugin \n");
        return;
    }
    if (msg == g_lastReceivedMessage && msg != TELIX_AV_CB_MSG_PLAYSTART) {
        PLUGIN_LOG(AVCONTROL, "Ignored duplicated message(%d)\n", msg);
        return;
    }
    g_lastReceivedMessage = msg;
    if (msg == TELIX_AV_CB_MSG_PLAYEND) {
        instance->endOfClip();
    } else if (msg == TELIX_AV_CB_MSG_PLAYSTART) {
        takeQueuedURL();
        instance->changePlayState(PLAY_STATE_PLAYING);
    } else if (msg == TELIX_AV_CB_MSG_ERR_NET_BUSY || msg == TELIX_AV_CB_MSG_ERR_NET_CANNOT_PROCESS) {
        PLUGIN_LOG(AVCONTROL, "Network message (%x)\n", msg);
    } else {
        for (const MessageError& row : kMessageErrors) {
            if (row.message == msg) {
                instance->processError(row.error);
            }
        }
    }
}

void AVControl::takeQueuedURL() {
    if (!m_urlQueue.empty()) {
        m_data = m_urlQueue.front();
        PLUGIN_LOG_FOR(LogModule::AVCONTROL, "handlePlayStateChange", "Queued URL is (%s)\n", m_data.c_str());
        m_urlQueue.pop();
    }
}

void AVControl::endOfClip() {
    m_durationLast = 0;
    m_currentPositionLast = 0;
    handlePlayPositionChanged();
    printMonitoringInfo(2);
    if (!m_isPlayList) {
        destroyBufferingThread();
        changePlayState(PLAY_STATE_FINISHED);
        PLUGIN_LOG_FOR(LogModule::AVCONTROL, "handlePlayStateChange",
                       "Normal Mode :: TELIX_AV_CB_MSG_PLAYEND :: destroyBufferingThread :: "
                       "changePlayState(Finished)\n");
        return;
    }
    if (asxIsEndofRepeat()) {
        asxGotoStartofRepeat();
    } else if (!asxNextClip()) {
        // In the reverse order of a single clip.
        changePlayState(PLAY_STATE_FINISHED);
        destroyBufferingThread();
        return;
    }
    setCurrentMedia(asxShowClipFileName());
    // quirk 52: a state of its own until the clip plays.
    changePlayState(PLAY_STATE_NEXT_CLIP);
}

void AVControl::processError(avcontrol_ce_error code) {
    PLUGIN_LOG(AVCONTROL, "Error Number = %d \n", code);
    if (code == AVCONTROL_ERROR_NONE) {
        return;
    }
    for (const ScriptError& row : kScriptErrors) {
        if (code >= row.first && code <= row.last) {
            PLUGIN_LOG(AVCONTROL, "%s", row.logText);
            m_error = row.value;
        }
    }
    changePlayState(PLAY_STATE_ERROR);
}

void AVControl::changePlayState(play_state to) {
    PLUGIN_LOG(AVCONTROL, " called with playstate %d", to);
    if (getPluginState() == PLUGIN_STATE_DESTROYING) {
        PLUGIN_LOG(AVCONTROL, "ignore this function while plugin is destroying\n");
        return;
    }
    changePlayState(m_playState, to);
}

void AVControl::changePlayState(play_state from, play_state to) {
    if (from == to) {
        return;
    }
    if (!isBrowserThread()) {
        PLUGIN_LOG(AVCONTROL, "(Not Main Thread) called(%d->%d)", from, to);
        void* block = std::malloc(sizeof(PlayStateChange));
        if (!block) {
            PLUGIN_LOG(AVCONTROL, "malloc failed\n");
            return;
        }
        ++m_workingAsyncCalls;
        postAsyncCall(m_npp, changePlayStateCb, new (block) PlayStateChange{m_live.ref(), from, to});
        return;
    }
    PLUGIN_LOG(AVCONTROL, "(Main Thread) called(%d->%d \n)", from, to);
    m_playState = to;
    if (to == PLAY_STATE_NEXT_CLIP) {
        play(m_playSpeed);
        return;
    }
    // quirk 47: without an id neither events nor the listener.
    if (getId().empty()) {
        return;
    }
    // quirk 49: "Error", "Buffering" and the two of the ready state are of the plug-in's own.
    if (to == PLAY_STATE_ERROR) {
        dispatchDomEvent("Error", false);
    }
    if (to == PLAY_STATE_BUFFERING) {
        dispatchDomEvent("Buffering", true);
    } else if (from == PLAY_STATE_BUFFERING) {
        dispatchDomEvent("Buffering", false);
    }
    dispatchDomEvent("PlayStateChange", false);
    // quirk 48: listeners of this object read the new value themselves.
    if (m_onPlayStateChange) {
        invokeJScriptFunc(m_onPlayStateChange, nullptr, 0);
    }
}

// A change that was posted before the teardown of the object began still runs.
void AVControl::changePlayStateCb(void* record) {
    auto* change = static_cast<PlayStateChange*>(record);
    if (AVControl* object = change->object.get()) {
        const CallGuard guard(*object);
        object->changePlayState(change->from, change->to);
        object->decrementWorkingAsyncCall();
    }
    std::free(change);
}

void AVControl::changeReadyState(int value) {
    m_readyState = value;
    if (!isBrowserThread()) {
        postAsyncCallIfAlive(m_npp, m_live.ref(), changeReadyStateCb);
        return;
    }
    if (!getId().empty()) {
        dispatchDomEvent("ReadyStateChange", true);
        dispatchDomEvent("onReadyStateChange", true);
    }
}

void AVControl::changeReadyStateCb(void* object) {
    auto* control = static_cast<AVControl*>(object);
    const CallGuard guard(*control);
    control->changeReadyState(control->getReadyState());
}

void AVControl::dispatchDomEvent(const char* event, bool bubbles) {
    invokeJScript(domEventScript(getId(), event, bubbles, false));
}
