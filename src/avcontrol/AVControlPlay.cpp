// The commands of script and of the state machine, turned into calls of the platform.
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <utility>

#include "common/BrowserGates.h"
#include "common/Log.h"
#include "common/PluginUtils.h"
#include "common/ScriptValues.h"
#include "src/avcontrol/AVControl.h"
#include "src/avcontrol/Asx.h"

namespace {

constexpr unsigned int kMaxVolume = 100;
constexpr uint32_t kLastSecond = 1000; // milliseconds
constexpr int kReadyStateHaveFutureData = 3;
constexpr int kReadyStateRefilled = 5;

bool startsWith(const std::string& text, const char* prefix) {
    return text.rfind(prefix, 0) == 0;
}

// A speed the way the platform takes it.
struct PlatformSpeed {
    bool positive;
    int16_t integerPart;
    uint16_t tenths;
};

// False if the string has no decimal point.
bool parseSpeed(const std::string& text, PlatformSpeed& speed) {
    speed.positive = text[0] != '-';
    const std::string amount = speed.positive ? text : text.substr(1);
    const size_t point = amount.find('.');
    if (point == std::string::npos) {
        return false;
    }
    speed.integerPart = static_cast<int16_t>(std::atoi(amount.substr(0, point).c_str()));
    speed.tenths = static_cast<uint16_t>(std::atoi(amount.substr(point + 1).c_str()));
    return true;
}

// Whether script that a call has run has ended the object. A clip change that was posted before the end plays
// once more, so an object that was ending when the call began goes on.
class EndWatch {
public:
    explicit EndWatch(const AVControl& control) : m_control(control), m_wasEnding(isEnding()) {}

    bool hasEnded() const { return isEnding() && !m_wasEnding; }

private:
    bool isEnding() const { return m_control.getPluginState() == PLUGIN_STATE_DESTROYING; }

    const AVControl& m_control;
    const bool m_wasEnding;
};

std::string withOneDecimal(double number) {
    char text[400]; // the longest double has 309 digits before the point
    std::snprintf(text, sizeof(text), "%.1f", number);
    return text;
}

} // namespace

std::string AVControl::currentMedia() const {
    const std::lock_guard<std::mutex> lock(m_currentMediaMutex);
    return m_currentMedia;
}

void AVControl::setCurrentMedia(std::string url) {
    const std::lock_guard<std::mutex> lock(m_currentMediaMutex);
    m_currentMedia = std::move(url);
}

void AVControl::selectMedia() {
    setCurrentMedia(m_isPlayList ? asxShowClipFileName() : getURL());
}

bool AVControl::play(double speed) {
    PLUGIN_LOG(AVCONTROL, "called with Speed: %f and state: %d \n", speed, getPlayState());
    if (!m_playerHandle) {
        return false;
    }
    if (speed == 0.0) {
        pause();
        return true;
    }
    const EndWatch watch(*this);
    if (speed != 1.0 || m_requestedSpeed != 1.0) {
        setPlaySpeed(speed);
    }
    if (watch.hasEnded()) {
        return false;
    }
    if (m_memoryAudio) {
        playSound();
        return true;
    }
    selectMedia();
    PLUGIN_LOG(AVCONTROL, "Media File URL:: %s \n", currentMedia().c_str());
    if (waitsForStream()) {
        m_playPending = true;
        return false;
    }
    bool result = false;
    switch (getPlayState()) {
    case PLAY_STATE_STOPPED:
    case PLAY_STATE_FINISHED:
    case PLAY_STATE_ERROR:
    case PLAY_STATE_NEXT_CLIP:
        result = beginMedia();
        break;
    case PLAY_STATE_PAUSED:
        m_playSpeed = 1.0;
        // quirk 54: the play state changes whatever the platform said, and the result stays false.
        // The ready state changes without an event.
        if (TELIX_JS_AV_Resume(m_playerHandle) == 0 && m_readyState == kReadyStateRefilled) {
            m_readyState = kReadyStateHaveFutureData;
        }
        changePlayState(PLAY_STATE_PLAYING);
        break;
    case PLAY_STATE_PLAYING:
    case PLAY_STATE_CONNECTING:
    case PLAY_STATE_BUFFERING:
        break;
    }
    PLUGIN_LOG(AVCONTROL, "AVControl Call ended\n");
    return result;
}

// A clip of a playlist from the network plays once the object has had its stream.
bool AVControl::waitsForStream() {
    if (!m_isPlayList || m_streamState == StreamState::Ready || !startsWith(currentMedia(), "http://")) {
        return false;
    }
    if (m_streamState == StreamState::NotRequested) {
        getURLValue(currentMedia());
    }
    return true;
}

// quirk 53: a refusal leaves the buffering state until a message comes.
bool AVControl::beginMedia() {
    if (currentMedia().empty()) {
        return false;
    }
    const EndWatch watch(*this);
    m_playStartCounter = 0;
    changePlayState(PLAY_STATE_CONNECTING);
    changePlayState(PLAY_STATE_BUFFERING);
    if (watch.hasEnded()) {
        return false;
    }
    const bool taken = handOverMedia();
    g_lastPlayedInstance = this; // also if the platform refused
    if (m_isPlayList && asxGetStartTime() != 0) {
        seek(1000 * asxGetStartTime());
    }
    if (!watch.hasEnded()) {
        startBufferingThread();
    }
    return taken;
}

bool AVControl::handOverMedia() {
    return TELIX_JS_AV_Play(m_playerHandle, currentMedia().c_str(), m_playCount,
                            static_cast<int32_t>(m_sourceCode), m_containerCode, m_audioCodecCode, 0, 0) == 0;
}

void AVControl::pause() {
    const play_state state = getPlayState();
    if (state != PLAY_STATE_PLAYING && state != PLAY_STATE_CONNECTING && state != PLAY_STATE_BUFFERING) {
        return;
    }
    m_playSpeed = 0.0; // stays so after a refusal
    if (!m_playerHandle) {
        return;
    }
    const TELIX_RETCODE_ENUM_T result = TELIX_JS_AV_Pause(m_playerHandle);
    if (result == TELIX_RETCODE_SUCCESS || result == TELIX_RETCODE_PAUSE_TAKEN) {
        changePlayState(PLAY_STATE_PAUSED);
    }
}

void AVControl::stop() {
    if (beginStop() && TELIX_JS_AV_Stop(m_playerHandle) == 0) {
        completeStop();
    }
}

bool AVControl::beginStop() {
    PLUGIN_LOG_FOR(LogModule::AVCONTROL, "stop", "PlayerHandle: %u, g_lastPlayedInstance: %p, This: %p \n",
                   m_playerHandle, static_cast<void*>(g_lastPlayedInstance), static_cast<void*>(this));
    m_playStartCounter = 0;
    m_durationLast = 0;
    m_currentPositionLast = 0;
    destroyBufferingThread();
    // quirk 51: the pipeline of another object is not stopped.
    return m_playerHandle && g_lastPlayedInstance == this;
}

void AVControl::completeStop() {
    changePlayState(PLAY_STATE_STOPPED);
    g_lastReceivedMessage = 0;
}

bool AVControl::seek(unsigned int ms) {
    if (!m_playerHandle || currentMedia().empty()) {
        return false;
    }
    const EndWatch watch(*this);
    // quirk 58: a stream of these kinds starts again at the seek target; the page stands still meanwhile.
    const bool restart = m_containerCode == kContainerMp3 || startsWith(currentMedia(), "mms://");
    if (restart) {
        changePlayState(PLAY_STATE_BUFFERING);
        destroyBufferingThread();
        if (watch.hasEnded()) {
            return false;
        }
        if (TELIX_JS_AV_Stop(m_playerHandle) == 0) {
            sleep(1); // also on the browser thread: lets the pipeline settle
        }
    }
    const bool taken = TELIX_JS_AV_Seek(m_playerHandle, ms) == 0;
    if (taken) {
        m_currentPositionLast = ms;
        handlePlayPositionChanged();
        if (restart && !watch.hasEnded() && handOverMedia()) {
            createBufferingThread();
        }
    }
    setNotifyReadyState(true);
    return taken;
}

void AVControl::setPlaySpeed(double speed) {
    if (speed != 0.0) {
        m_requestedSpeed = speed;
    }
    if (!m_playerHandle) {
        return;
    }
    // quirk 55: what is sent is the speed in force until now; a change reaches the platform one call late.
    const std::string text = withOneDecimal(m_playSpeed);
    PlatformSpeed sent{};
    if (!parseSpeed(text, sent)) {
        PLUGIN_LOG(AVCONTROL, "Play Speed: [%s] parsing failed\n", text.c_str());
        return;
    }
    if (TELIX_JS_AV_SetPlaySpeed(m_playerHandle, sent.positive, sent.integerPart, sent.tenths) != 0) {
        PLUGIN_LOG(AVCONTROL, "Trying to change PlaySpeed from [%.1f -> %.1f]. Not supported in platform\n",
                   getPlaySpeed(), speed);
        return;
    }
    PLUGIN_LOG(AVCONTROL, "Set Play Speed succeed\n");
    m_playSpeed = speed;
    handlePlaySpeedChanged();
    if (getPlayState() == PLAY_STATE_BUFFERING) {
        changePlayState(PLAY_STATE_PLAYING);
    }
}

// quirk 65: short sounds change no state, have no monitor and don't take the pipeline over.
void AVControl::playSound() {
    const EndWatch watch(*this);
    invokeJScript(getPlayCountVal(getId()));
    NPVariant count{};
    if (NPN_Invoke(m_npp, getNPWindowObj(), NPN_GetStringIdentifier("getPlayCountVal"), nullptr, 0, &count)) {
        if (count.type == NPVariantType_String) {
            m_playCount = static_cast<uint32_t>(std::atoi(stringValue(count.value.stringValue).c_str()));
        }
        NPN_ReleaseVariantValue(&count);
    }
    selectMedia();
    PLUGIN_LOG(AVCONTROL, "Media File URL:: %s, PlayCount:: %d \n", currentMedia().c_str(), m_playCount);
    // Not the platform's function for sounds, whatever the log says.
    if (!currentMedia().empty() && !watch.hasEnded() && handOverMedia()) {
        PLUGIN_LOG(AVCONTROL, " Called:: IF API TELIX_JS_AV_PlaySound returned success \n");
    }
}

bool AVControl::setVolume(unsigned int volume) {
    return m_playerHandle && volume <= kMaxVolume && TELIX_JS_AV_SetVolume(m_playerHandle, volume) == 0;
}

bool AVControl::queue(const std::string& url) {
    if (!m_playerHandle) {
        return false;
    }
    if (url.empty()) {
        PLUGIN_LOG(AVCONTROL, " is called with url value as NULL\n");
    }
    // Without a URL the platform drops its queue.
    if (TELIX_JS_AV_Queue(m_playerHandle, url.empty() ? nullptr : url.c_str(), m_playCount,
                          static_cast<int32_t>(m_sourceCode), m_containerCode, m_audioCodecCode, 0, 0) != 0) {
        PLUGIN_LOG(AVCONTROL, " AVControl call ended \n");
        return false;
    }
    PLUGIN_LOG(AVCONTROL, " AVControl TELIX_JS_AV_Queue Success\n");
    if (!url.empty()) {
        m_urlQueue.push(url);
    } else if (!m_urlQueue.empty()) {
        // quirk 59: the front one goes, not the last.
        m_urlQueue.pop();
    }
    return true;
}

void AVControl::changeClip(int direction) {
    const bool moved = (direction == 1 && asxNextClip()) || (direction == -1 && asxPrevClip());
    if (!moved) {
        return;
    }
    setCurrentMedia(asxShowClipFileName());
    // If the platform refuses, the playlist has moved and playback hasn't.
    if (m_playerHandle && TELIX_JS_AV_Stop(m_playerHandle) == 0) {
        changePlayState(PLAY_STATE_NEXT_CLIP);
    }
}

bool AVControl::setCurTrackIndex(unsigned int index) {
    if (!m_playerHandle || index == 0 || !asxSetCurrentClipIndex(index)) {
        return false;
    }
    TELIX_JS_AV_Stop(m_playerHandle);
    changePlayState(PLAY_STATE_NEXT_CLIP);
    return true;
}

unsigned int AVControl::getCurTrackIndex() const {
    return asxGetCurrentClipIndex();
}

unsigned int AVControl::getNrTracks() const {
    return asxGetClipCount();
}

void AVControl::getPlayInfo(unsigned int* duration, unsigned int* position) {
    *duration = 0;
    *position = 0;
    // quirk 57: after the end of a clip both read 0.
    if (!m_playerHandle || g_lastReceivedMessage == TELIX_AV_CB_MSG_PLAYEND) {
        PLUGIN_LOG(AVCONTROL, "Error:m_playerHandle=( %d ), g_lastReceivedMessage=( %d )\n", m_playerHandle,
                   g_lastReceivedMessage.load());
        return;
    }
    TELIX_JS_AV_PLAY_INFO* info = nullptr; // stays the platform's
    if (TELIX_JS_AV_GetPlayInfo(m_playerHandle, &info) == 0 && info &&
        !(info->state == 1 && info->duration == 0 && info->playPosition == 0)) {
        m_durationLast = info->duration;
        // quirk 56: within the last second a clip reads as complete.
        m_currentPositionLast =
            info->duration - info->playPosition < kLastSecond ? info->duration : info->playPosition;
    }
    *duration = m_durationLast;
    *position = m_currentPositionLast;
}

void AVControl::setFullScreenChange(bool on) {
    if (!m_playerHandle || TELIX_JS_AV_SetFullScreen(m_playerHandle, on) != 0) {
        return;
    }
    setFullScreen(on);
    if (m_onFullScreenChange) {
        NPVariant argument{};
        setResult(argument, isFullScreen());
        invokeJScriptFunc(m_onFullScreenChange, &argument, 1);
    }
}
