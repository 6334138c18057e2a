// Ownership of the tuner, and the play states of the video/broadcast objects.
#include "desktop/platform/TunerArbiter.h"

#include <algorithm>
#include <mutex>

namespace desktop {

TunerArbiter::TunerArbiter(const Channels& channels, BroadcastCallbacks& callbacks, Listener listener)
    : m_platform(Platform::instance()), m_channels(channels), m_callbacks(callbacks),
      m_listener(std::move(listener)) {
    m_backgroundView.presenter = m_platform.picture().newPresenter();
    if (!m_channels.list().empty()) {
        m_currentChannel = m_channels.list().front();
    }
}

// ---- Requests

const TunerArbiter::Object* TunerArbiter::findLocked(TELIX_JS_VB_HANDLE object) const {
    const auto found = m_objects.find(object);
    return found == m_objects.end() ? nullptr : &found->second;
}

TunerArbiter::Object* TunerArbiter::findLocked(TELIX_JS_VB_HANDLE object) {
    const auto found = m_objects.find(object);
    return found == m_objects.end() ? nullptr : &found->second;
}

TELIX_JS_VB_HANDLE TunerArbiter::newObject() {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    m_objects[++m_lastObject].view.presenter = m_platform.picture().newPresenter();
    return m_lastObject;
}

bool TunerArbiter::release(TELIX_JS_VB_HANDLE object) {
    return end(object, TELIX_PLAYSTATE_UNREALIZED);
}

bool TunerArbiter::stop(TELIX_JS_VB_HANDLE object) {
    return end(object, TELIX_PLAYSTATE_STOPPED);
}

bool TunerArbiter::end(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Object* found = findLocked(object);
    if (!found) {
        return false;
    }
    const bool isOwner = m_tunerOwner == object;
    const bool changesState =
        found->playState != state && (isOwner || found->playState != TELIX_PLAYSTATE_UNREALIZED);
    if (state == TELIX_PLAYSTATE_UNREALIZED) {
        found->channel = 0;
    }
    if (changesState) {
        found->playState = state;
    }
    if (isOwner) {
        m_tunerOwner = 0;
        m_latestTune = {m_latestTune.id + 1, 0, 0};
        m_platform.post([this] { m_listener.onRelease(); });
    }
    if (changesState) {
        m_platform.post(
            [this, object, state] { m_callbacks.onPlayState.call(object, 0U, state, TELIX_ERR_STATE_NONE); });
    }
    if (state == TELIX_PLAYSTATE_UNREALIZED) {
        m_platform.post([this] { m_listener.onUnbound(); });
    }
    return true;
}

void TunerArbiter::selectLocked(TELIX_JS_CM_HANDLE channel) {
    if (channel != m_currentChannel) {
        m_direction = channel == m_channels.neighbour(m_currentChannel, -1) ? -1 : 1;
        m_currentChannel = channel;
    }
}

void TunerArbiter::requestLocked(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel) {
    const TELIX_JS_VB_HANDLE preempted = m_tunerOwner;
    if (preempted != 0 && preempted != object) {
        m_platform.post([this, preempted] {
            {
                std::lock_guard<std::mutex> lock(m_platform.mutex());
                m_objects[preempted].channel = 0;
            }
            changeState(preempted, TELIX_PLAYSTATE_UNREALIZED, TELIX_ERR_STATE_NONE);
        });
    }
    m_tunerOwner = object;
    selectLocked(channel);
    m_objects[object].channel = channel;
    m_objects[object].playState = TELIX_PLAYSTATE_CONNECTING;
    m_latestTune = {m_latestTune.id + 1, object, channel};
    m_platform.post([this, tune = m_latestTune] { m_listener.onTune(tune); });
}

bool TunerArbiter::tune(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel) {
    if (channel == 0) {
        if (!release(object)) {
            return false;
        }
        m_platform.post([this, object] { m_callbacks.onChannelChange.call(object, TELIX_JS_CM_HANDLE{0}); });
        return true;
    }
    const bool isKnown = m_channels.find(channel).has_value();
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    if (!isKnown || !findLocked(object)) {
        return false;
    }
    requestLocked(object, channel);
    return true;
}

TELIX_JS_CM_HANDLE TunerArbiter::step(TELIX_JS_VB_HANDLE object, int offset) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const TELIX_JS_CM_HANDLE before = m_currentChannel;
    const TELIX_JS_CM_HANDLE next = m_channels.neighbour(before, offset);
    if (!findLocked(object) || next == 0) {
        return 0;
    }
    requestLocked(object, next);
    return before;
}

bool TunerArbiter::bind(TELIX_JS_VB_HANDLE object) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Object* found = findLocked(object);
    if (!found || m_currentChannel == 0) {
        return false;
    }
    if (m_tunerOwner == object && found->playState == TELIX_PLAYSTATE_PRESENTING) {
        return true;
    }
    requestLocked(object, m_currentChannel);
    return true;
}

bool TunerArbiter::zap(TELIX_JS_CM_HANDLE channel) {
    const bool isKnown = m_channels.find(channel).has_value();
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    if (!isKnown) {
        return false;
    }
    if (m_tunerOwner != 0) {
        requestLocked(m_tunerOwner, channel);
    } else {
        selectLocked(channel);
        m_platform.post([this, channel] { m_listener.onChannel(channel); });
    }
    return true;
}

std::optional<Tune> TunerArbiter::backgroundTune() {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const bool hasStopped = std::any_of(m_objects.begin(), m_objects.end(), [](const auto& each) {
        return each.second.playState == TELIX_PLAYSTATE_STOPPED;
    });
    if (m_tunerOwner != 0 || hasStopped || m_currentChannel == 0) {
        return std::nullopt;
    }
    m_latestTune = {m_latestTune.id + 1, 0, m_currentChannel};
    return m_latestTune;
}

// ---- State

bool TunerArbiter::exists(TELIX_JS_VB_HANDLE object) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    return findLocked(object) != nullptr;
}

TELIX_JS_CM_HANDLE TunerArbiter::channelOf(TELIX_JS_VB_HANDLE object) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Object* found = findLocked(object);
    return found ? found->channel : 0;
}

std::optional<Picture::View> TunerArbiter::viewOf(TELIX_JS_VB_HANDLE object) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Object* found = findLocked(object);
    return found ? std::optional(found->view) : std::nullopt;
}

std::optional<TELIX_PLAYSTATE_ENUM_T> TunerArbiter::playState(TELIX_JS_VB_HANDLE object) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Object* found = findLocked(object);
    return found ? std::optional(found->playState) : std::nullopt;
}

bool TunerArbiter::setPlayState(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Object* found = findLocked(object);
    if (found) {
        found->playState = state;
    }
    return found != nullptr;
}

TELIX_JS_CM_HANDLE TunerArbiter::currentChannel() const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    return m_currentChannel;
}

std::array<TELIX_JS_CM_HANDLE, 2> TunerArbiter::neighbours() const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    return {m_channels.neighbour(m_currentChannel, m_direction),
            m_channels.neighbour(m_currentChannel, -m_direction)};
}

TELIX_JS_VB_HANDLE TunerArbiter::owner() const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    return m_tunerOwner;
}

// ---- Reports of the presentation

bool TunerArbiter::isLatest(const Tune& tune) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    return m_latestTune.id == tune.id;
}

void TunerArbiter::reportConnecting(const Tune& tune) {
    if (tune.object != 0) {
        m_callbacks.onPlayState.call(tune.object, 0U, TELIX_PLAYSTATE_CONNECTING, TELIX_ERR_STATE_NONE);
    }
}

void TunerArbiter::reportPresenting(const Tune& tune) {
    if (tune.object != 0) {
        reportOutcome(tune, TELIX_PLAYSTATE_PRESENTING, TELIX_ERR_STATE_NONE);
        m_callbacks.onChannelChange.call(tune.object, tune.channel);
    }
}

void TunerArbiter::reportAborted(const Tune& tune) {
    if (tune.object != 0) {
        m_callbacks.onChannelError.call(tune.object, tune.channel, kErrorInterrupted);
    }
}

void TunerArbiter::reportFailed(const Tune& tune, TELIX_ERR_STATE_ENUM_T error) {
    if (tune.object != 0) {
        m_callbacks.onChannelError.call(tune.object, tune.channel, error);
        reportOutcome(tune, TELIX_PLAYSTATE_UNREALIZED, error);
    }
}

void TunerArbiter::reportBroken(TELIX_JS_VB_HANDLE object, TELIX_ERR_STATE_ENUM_T error) {
    changeState(object, TELIX_PLAYSTATE_UNREALIZED, error);
}

void TunerArbiter::preemptLocked(TELIX_JS_VB_HANDLE object) {
    if (m_tunerOwner == object) {
        m_tunerOwner = 0;
    }
}

void TunerArbiter::reportPreempted(TELIX_JS_VB_HANDLE object) {
    changeState(object, TELIX_PLAYSTATE_STOPPED, TELIX_ERR_STATE_NONE);
}

// After a later request, which has set the state that it leads to, only the plug-in is told.
void TunerArbiter::reportOutcome(const Tune& tune, TELIX_PLAYSTATE_ENUM_T state,
                                 TELIX_ERR_STATE_ENUM_T error) {
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Object* found = findLocked(tune.object);
        if (found && m_latestTune.id == tune.id) {
            found->playState = state;
        }
    }
    m_callbacks.onPlayState.call(tune.object, 0U, state, error);
}

void TunerArbiter::changeState(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state,
                               TELIX_ERR_STATE_ENUM_T error) {
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Object* found = findLocked(object);
        if (!found) {
            return;
        }
        found->playState = state;
    }
    m_callbacks.onPlayState.call(object, 0U, state, error);
}

} // namespace desktop
