// The buffering monitor: a detached thread of each playing object that asks the platform once a second how
// much media it has buffered, pauses the player when that runs low and resumes it when there is enough again.
// It also ends a playlist's clip at its time and reports the ready state after a seek.
//
// A monitor is cancelled and never joined, and a call of the platform can keep it for as long as it likes. It
// owns what it needs to survive its object: between two calls of the platform it asks its link for the
// object, and the end of the object waits for no more than that.
#include <sched.h>
#include <unistd.h>

#include <utility>

#include "common/Log.h"
#include "src/avcontrol/AVControl.h"
#include "src/avcontrol/Asx.h"

// Never locked: what the threads share has atomics and locks of its own.
pthread_mutex_t g_bufferingMutex = PTHREAD_MUTEX_INITIALIZER;

namespace {

constexpr uint32_t kNoBufferReport = 0xFFFFFFFF;
constexpr uint32_t kFlagged = 0xFF; // in the top byte: end the monitoring; in the one below: a short amount
constexpr uint32_t kAmountMask = 0xFFFF;
constexpr int kReadyStateRefilled = 5;

void thread_clean_up(void*) {
    PLUGIN_LOG(AVCONTROL, " is called");
}

} // namespace

// An object and all of its monitors own their link together.
class AVControl::MonitorLink {
public:
    explicit MonitorLink(AVControl& control) : m_control(control) {}
    MonitorLink(const MonitorLink&) = delete;
    MonitorLink& operator=(const MonitorLink&) = delete;

    // The object, which does not end during an access; no object once it has ended. Any thread. Never held
    // during a call of the platform, for the browser thread may be waiting.
    class Access {
    public:
        explicit Access(MonitorLink& link) : m_link(link) {
            // Counted in before the look: whoever closes the link looks at the count afterwards.
            ++m_link.m_accesses;
            m_granted = !m_link.m_closed;
        }
        Access(const Access&) = delete;
        Access& operator=(const Access&) = delete;
        ~Access() { --m_link.m_accesses; }

        explicit operator bool() const { return m_granted; }
        AVControl* operator->() const { return &m_link.m_control; }

    private:
        MonitorLink& m_link;
        bool m_granted;
    };

    // Grants no further access, and waits until those that were granted are over. Browser thread.
    void close() {
        m_closed = true;
        while (m_accesses != 0) {
            sched_yield();
        }
    }

private:
    AVControl& m_control;
    std::atomic<int> m_accesses{0};
    std::atomic<bool> m_closed{false};
};

// What a monitor thread owns: its link, and what it remembers from poll to poll.
class AVControl::Monitor {
public:
    explicit Monitor(std::shared_ptr<MonitorLink> link) : m_link(std::move(link)) {}

    bool isToGoOn();
    void poll();
    void leave();

private:
    using Access = MonitorLink::Access;
    enum class Action { None, Pause, Resume };

    void pollPlayer(uint32_t player);
    bool readPlayInfo(uint32_t player, TELIX_JS_AV_PLAY_INFO& info);
    void reportStart(uint32_t player);
    bool isPastClipEnd(const TELIX_JS_AV_PLAY_INFO& info);
    void endClip(uint32_t player);
    Action actionFor(const TELIX_JS_AV_PLAY_INFO& info);
    void take(Action action, uint32_t player);

    const std::shared_ptr<MonitorLink> m_link;
    bool m_hasPaused = false; // the monitor itself has paused the player
    bool m_startReported = false;
};

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
    if (!m_monitorLink) {
        m_monitorLink = std::make_shared<MonitorLink>(*this);
    }
    auto monitor = std::make_unique<Monitor>(m_monitorLink);
    pthread_t thread = 0;
    m_monitorStarting = true;
    // A failure is ignored: playback goes on without a monitor.
    if (pthread_create(&thread, nullptr, bufferingThread, monitor.get()) == 0) {
        static_cast<void>(monitor.release()); // the thread's own
        pthread_detach(thread);
        setBufferingThreadId(thread);
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

// Part of the object's end: from here on no monitor finds it.
void AVControl::endMonitors() {
    if (m_bufferingThread) {
        // Started by a change of state that had been posted before the object began to go.
        destroyBufferingThread();
    }
    if (m_monitorLink) {
        m_monitorLink->close();
    }
}

void* AVControl::bufferingThread(void* given) {
    const std::unique_ptr<Monitor> monitor(static_cast<Monitor*>(given));
    sleep(1);
    pthread_cleanup_push(thread_clean_up, nullptr);
    pthread_setcanceltype(PTHREAD_CANCEL_DEFERRED, nullptr);
    while (monitor->isToGoOn()) {
        pthread_testcancel();
        sleep(1);
        monitor->poll();
    }
    pthread_cleanup_pop(0);
    monitor->leave();
    return nullptr;
}

bool AVControl::Monitor::isToGoOn() {
    if (const Access control{*m_link}) {
        return control->getRunBufferingThread();
    }
    // The object's end has cancelled this thread: the next cancellation point is its last.
    pthread_setcancelstate(PTHREAD_CANCEL_ENABLE, nullptr);
    return true;
}

// The end of a monitor that hasn't been cancelled.
void AVControl::Monitor::leave() {
    if (const Access control{*m_link}) {
        if (control->giveUpMonitor(pthread_self())) {
            return;
        }
    }
    for (;;) {
        ::pause(); // until the cancellation arrives
    }
}

// False if somebody else has taken the monitor's id out of its place, to cancel it.
bool AVControl::giveUpMonitor(pthread_t monitor) {
    while (m_monitorStarting) {
        sched_yield(); // the id isn't in its place yet
    }
    return m_bufferingThread.compare_exchange_strong(monitor, 0);
}

void AVControl::Monitor::poll() {
    uint32_t player = 0;
    {
        const Access control{*m_link};
        if (!control || !control->isWatched(m_hasPaused)) {
            return;
        }
        player = control->m_playerHandle;
    }
    pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, nullptr);
    if (!player) {
        return; // cancellation stays disabled on this way out
    }
    pollPlayer(player);
    pthread_setcancelstate(PTHREAD_CANCEL_ENABLE, nullptr);
}

bool AVControl::isWatched(bool monitorHasPaused) const {
    const double speed = getPlaySpeed();
    if (getPluginState() == PLUGIN_STATE_DESTROYING || (speed != 1.0 && speed != 0.0) ||
        g_lastReceivedMessage == TELIX_AV_CB_MSG_PLAYEND) {
        return false;
    }
    // While the monitor itself has paused the player it goes on in any state.
    return monitorHasPaused || getPlayState() == PLAY_STATE_PLAYING;
}

// Each call of the platform may take any time: what comes after it asks for the object again.
void AVControl::Monitor::pollPlayer(uint32_t player) {
    TELIX_JS_AV_PLAY_INFO info{};
    if (!readPlayInfo(player, info)) {
        return;
    }
    if (!m_startReported) {
        reportStart(player);
        m_startReported = true;
    }
    if (isPastClipEnd(info)) {
        endClip(player);
        return;
    }
    take(actionFor(info), player);
}

// False if there is nothing to go by.
bool AVControl::Monitor::readPlayInfo(uint32_t player, TELIX_JS_AV_PLAY_INFO& info) {
    TELIX_JS_AV_PLAY_INFO* record = nullptr; // stays the platform's
    if (TELIX_JS_AV_GetPlayInfo(player, &record) != 0 || !record) {
        return false;
    }
    const Access control{*m_link};
    if (!control) {
        return false; // the player has gone as well, and its record with it
    }
    const bool hasReport = record->buffered != kNoBufferReport;
    if (hasReport && record->buffered >> 24 == kFlagged) {
        record->buffered &= kAmountMask; // in the platform's own record
        control->setRunBufferingThread(false);
        return false;
    }
    info = *record;
    if (hasReport && (info.buffered >> 16 & 0xFF) == kFlagged) {
        info.buffered &= kAmountMask;
    }
    const bool isUnknown =
        info.state == 1 && info.duration == 0 && info.playPosition == 0 && info.buffered == 0;
    return info.state != 0 && !isUnknown;
}

void AVControl::Monitor::reportStart(uint32_t player) {
    takeReportedLength(player);
    if (const Access control{*m_link}) {
        control->reportClip("Start");
    }
}

bool AVControl::Monitor::isPastClipEnd(const TELIX_JS_AV_PLAY_INFO& info) {
    const Access control{*m_link};
    return control && control->isPastClipEnd(info.playPosition);
}

bool AVControl::isPastClipEnd(uint32_t position) const {
    if (!m_isPlayList) {
        return false;
    }
    const unsigned int duration = asxGetDuration();
    return duration != 0 && 1000 * (asxGetStartTime() + duration) <= position;
}

// What stop() and the end of a clip are on this thread. It cancels this very thread, which thus ends after
// its poll.
void AVControl::Monitor::endClip(uint32_t player) {
    bool ownsPipeline = false;
    if (const Access control{*m_link}) {
        ownsPipeline = control->beginStop();
    }
    const bool isStopped = ownsPipeline && TELIX_JS_AV_Stop(player) == 0;
    if (const Access control{*m_link}) {
        if (isStopped) {
            control->completeStop();
        }
        control->handlePlayStateChange(player, TELIX_AV_CB_MSG_PLAYEND);
    }
}

AVControl::Monitor::Action AVControl::Monitor::actionFor(const TELIX_JS_AV_PLAY_INFO& info) {
    const Access control{*m_link};
    if (!control) {
        return Action::None;
    }
    const play_state state = control->getPlayState();
    if ((state == PLAY_STATE_PAUSED && !control->getNotifyReadyState()) || state == PLAY_STATE_FINISHED ||
        state == PLAY_STATE_STOPPED) {
        return Action::None;
    }
    if (info.buffered == kNoBufferReport) {
        return m_hasPaused ? Action::Resume : Action::None;
    }
    const uint32_t upperLimit = control->getUpperLimit();
    if (info.buffered < control->getLowerLimit() && !m_hasPaused) {
        // With little left to fetch the upper limit would never be reached, and the pause never end.
        const bool isNearlyFetched =
            info.duration != 0 && info.duration / 1000 - info.bufferedEnd < upperLimit;
        return isNearlyFetched ? Action::None : Action::Pause;
    }
    if (control->getNotifyReadyState() && info.buffered > upperLimit) {
        control->changeReadyState(kReadyStateRefilled);
        control->setNotifyReadyState(false);
        return Action::None;
    }
    return info.buffered >= upperLimit && m_hasPaused ? Action::Resume : Action::None;
}

void AVControl::Monitor::take(Action action, uint32_t player) {
    if (action == Action::None) {
        return;
    }
    const bool pauses = action == Action::Pause;
    if (pauses) {
        TELIX_JS_AV_Pause(player);
    } else {
        TELIX_JS_AV_Resume(player);
    }
    m_hasPaused = pauses;
    if (const Access control{*m_link}) {
        control->changePlayState(pauses ? PLAY_STATE_BUFFERING : PLAY_STATE_PLAYING);
    }
}
