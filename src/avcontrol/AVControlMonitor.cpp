// The buffering monitor: a detached thread of each playing object that asks the platform once a second how
// much media it holds, pauses the player when that runs low and lets it go on when there is enough again. It
// also ends a playlist's clip at its time and reports the ready state after a seek.
//
// A monitor is cancelled and never joined. It looks at cancellation only while it sleeps and before that: a
// poll, once begun, is completed. So that it never meets a dead object, the object's end awaits its monitors.
#include <sched.h>
#include <unistd.h>

#include "common/Log.h"
#include "src/avcontrol/AVControl.h"
#include "src/avcontrol/Asx.h"

// Never locked: nothing that the threads share needs more than an atomic.
pthread_mutex_t g_bufferingMutex = PTHREAD_MUTEX_INITIALIZER;

namespace {

constexpr uint32_t kNoBufferReport = 0xFFFFFFFF;
constexpr uint32_t kAmountMask = 0xFFFF;
constexpr int kReadyStateRefilled = 5;

void thread_clean_up(void*) {
    PLUGIN_LOG(AVCONTROL, " is called");
}

// Counts a monitor thread as ended at whatever end it comes to, a cancellation included. The last that a
// monitor does with its object.
class MonitorPresence {
public:
    explicit MonitorPresence(std::atomic<int>& threads) : m_threads(threads) {}
    MonitorPresence(const MonitorPresence&) = delete;
    MonitorPresence& operator=(const MonitorPresence&) = delete;
    ~MonitorPresence() { --m_threads; }

private:
    std::atomic<int>& m_threads;
};

} // namespace

void AVControl::startBufferingThread() {
    if (m_buffering && m_mediaType != 0) {
        setRunBufferingThread(true);
        createBufferingThread();
    }
}

void AVControl::createBufferingThread() {
    if (m_bufferingThread) {
        return;
    }
    pthread_t thread = 0;
    ++m_monitorThreads;
    m_monitorStarting = true;
    if (pthread_create(&thread, nullptr, bufferingThread, this) == 0) {
        pthread_detach(thread);
        setBufferingThreadId(thread);
    } else {
        --m_monitorThreads; // playback goes on unwatched
    }
    m_monitorStarting = false;
}

// Whoever takes the id out of its place is the one that cancels: a thread that finds its id gone waits for
// that, so that an id is never used after its thread.
void AVControl::destroyBufferingThread() {
    PLUGIN_LOG(AVCONTROL, " called. \n");
    const pthread_t thread = m_bufferingThread.exchange(0);
    if (thread && pthread_cancel(thread) != 0) {
        setBufferingThreadId(thread);
    }
}

void AVControl::endMonitors() {
    if (m_bufferingThread) {
        // Started by a change of state that had been posted before the object began to go.
        destroyBufferingThread();
    }
    while (m_monitorThreads > 0) {
        sched_yield(); // a poll that was under way when its thread was cancelled
    }
}

void* AVControl::bufferingThread(void* object) {
    auto* control = static_cast<AVControl*>(object);
    const MonitorPresence presence(control->m_monitorThreads);
    sleep(1);
    pthread_cleanup_push(thread_clean_up, object);
    pthread_setcanceltype(PTHREAD_CANCEL_DEFERRED, nullptr);
    Monitor monitor;
    while (control->getRunBufferingThread()) {
        pthread_testcancel();
        sleep(1);
        control->poll(monitor);
    }
    pthread_cleanup_pop(0);
    control->leaveMonitor();
    return nullptr;
}

// The end of a monitor that hasn't been cancelled.
void AVControl::leaveMonitor() {
    while (m_monitorStarting) {
        sched_yield(); // the id isn't in its place yet
    }
    pthread_t own = pthread_self();
    if (m_bufferingThread.compare_exchange_strong(own, 0)) {
        return;
    }
    for (;;) {
        ::pause(); // until the cancellation arrives
    }
}

void AVControl::poll(Monitor& monitor) {
    const double speed = getPlaySpeed();
    if (getPluginState() == PLUGIN_STATE_DESTROYING || (speed != 1.0 && speed != 0.0) ||
        g_lastReceivedMessage == TELIX_AV_CB_MSG_PLAYEND) {
        return;
    }
    // While the monitor itself has paused the player it goes on in any state.
    if (!monitor.bufferingPaused && getPlayState() != PLAY_STATE_PLAYING) {
        return;
    }
    pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, nullptr);
    if (!m_playerHandle) {
        return; // meant: cancellation stays disabled
    }
    pollPlayer(monitor);
    pthread_setcancelstate(PTHREAD_CANCEL_ENABLE, nullptr);
}

void AVControl::pollPlayer(Monitor& monitor) {
    TELIX_JS_AV_PLAY_INFO* record = nullptr; // stays the platform's
    if (TELIX_JS_AV_GetPlayInfo(m_playerHandle, &record) != 0 || !record) {
        return;
    }
    TELIX_JS_AV_PLAY_INFO info = *record;
    const bool hasReport = info.buffered != kNoBufferReport;
    if (hasReport && info.buffered >> 24 == 0xFF) {
        setRunBufferingThread(false); // the platform asks for no more watching
        return;
    }
    if (hasReport && (info.buffered >> 16 & 0xFF) == 0xFF) {
        info.buffered &= kAmountMask;
    }
    if (info.state == 0 ||
        (info.state == 1 && info.duration == 0 && info.playPosition == 0 && info.buffered == 0)) {
        return;
    }
    if (!monitor.startReported) {
        printMonitoringInfo(1);
        monitor.startReported = true;
    }
    if (isPastClipEnd(info.playPosition)) {
        stop(); // cancels this very thread, which thus ends after this poll
        if (m_playerHandle) {
            handlePlayStateChange(m_playerHandle, TELIX_AV_CB_MSG_PLAYEND);
        }
        return;
    }
    const play_state state = getPlayState();
    if ((state == PLAY_STATE_PAUSED && !getNotifyReadyState()) || state == PLAY_STATE_FINISHED ||
        state == PLAY_STATE_STOPPED) {
        return;
    }
    if (!hasReport) {
        if (monitor.bufferingPaused) {
            resumePlayer(monitor);
        }
    } else if (info.buffered < m_lowerLimit && !monitor.bufferingPaused) {
        // With little left to fetch the upper limit would never be reached, and the pause never end.
        if (info.duration == 0 || info.duration / 1000 - info.bufferedEnd >= m_upperLimit) {
            TELIX_JS_AV_Pause(m_playerHandle);
            monitor.bufferingPaused = true;
            changePlayState(PLAY_STATE_BUFFERING);
        }
    } else if (getNotifyReadyState() && info.buffered > m_upperLimit) {
        changeReadyState(kReadyStateRefilled);
        setNotifyReadyState(false);
    } else if (info.buffered >= m_upperLimit && monitor.bufferingPaused) {
        resumePlayer(monitor);
    }
}

bool AVControl::isPastClipEnd(unsigned int position) const {
    if (!m_isPlayList) {
        return false;
    }
    const unsigned int duration = asxGetDuration();
    return duration != 0 && 1000 * (asxGetStartTime() + duration) <= position;
}

void AVControl::resumePlayer(Monitor& monitor) {
    TELIX_JS_AV_Resume(m_playerHandle);
    monitor.bufferingPaused = false;
    changePlayState(PLAY_STATE_PLAYING);
}
