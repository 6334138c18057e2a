// How the parts of broadcast work together.
#include "desktop/platform/Broadcast.h"

#include <atomic>
#include <cassert>
#include <mutex>

namespace desktop {

namespace {

std::atomic<Clock*> injectedClock{nullptr}; // what useClock() was given
std::atomic<bool> hasInstance{false};

} // namespace

Broadcast& Broadcast::instance() {
    static auto* broadcast = [] {
        hasInstance = true;
        Clock* clock = injectedClock;
        return new Broadcast(clock ? *clock : Clock::real()); // kept until the process ends
    }();
    return *broadcast;
}

void Broadcast::useClock(Clock& clock) {
    assert(!hasInstance && "the clock comes before the first use of broadcast");
    injectedClock = &clock;
}

Broadcast::Broadcast(Clock& clock)
    : m_platform(Platform::instance()), m_channels(m_platform.configuration().sources),
      m_ratings(m_programmes, m_callbacks), m_arbiter(m_channels, m_callbacks, arbiterListener()),
      m_presentFollowing(m_programmes, m_arbiter, m_ratings, m_callbacks),
      m_presentation(m_channels, m_arbiter, m_components, clock, presentationListener()), m_faults(*this) {
    m_platform.picture().setOnFree([this] { m_platform.post([this] { fillBackground(); }); });
    m_presentation.start();
}

TunerArbiter::Listener Broadcast::arbiterListener() {
    TunerArbiter::Listener listener;
    listener.onTune = [this](const Tune& tune) { m_presentation.tune(tune); };
    listener.onRelease = [this] { onRelease(); };
    listener.onUnbound = [this] { fillBackground(); };
    listener.onChannel = [this](TELIX_JS_CM_HANDLE channel) {
        if (!tuneInBackground()) {
            m_presentation.receive(channel);
        }
    };
    return listener;
}

ServicePresentation::Listener Broadcast::presentationListener() {
    ServicePresentation::Listener listener;
    listener.onServiceSelected = [this](TELIX_JS_CM_HANDLE channel) {
        m_applications.onServiceSelected(channel);
    };
    listener.onServiceLost = [this] { m_applications.onServiceLost(); };
    listener.onApplications = [this](TELIX_JS_CM_HANDLE channel, const ApplicationList& list) {
        m_applications.onApplications(channel, list);
    };
    listener.onEit = [this](TELIX_JS_CM_HANDLE channel, const Eit& eit) {
        m_presentFollowing.onEit(channel, eit);
    };
    listener.onStreamEvent = [this](uint8_t componentTag, const StreamEvent& event) {
        m_streamEvents.dispatch(m_arbiter.owner(), componentTag, event);
    };
    listener.onHandOver = [this] {
        m_ratings.reset();
        m_presentFollowing.repeat();
    };
    listener.onEnd = [this] { m_ratings.reset(); };
    listener.onEndLocked = [this] { m_presentFollowing.clearLocked(); };
    return listener;
}

void Broadcast::followApplications() {
    m_platform.post([this] { m_presentation.receive(m_arbiter.currentChannel()); });
}

void Broadcast::presentInBackground() {
    m_platform.post([this] {
        m_presentsInBackground = true;
        fillBackground();
    });
}

// The set goes on with the channel that the object has presented, so that the picture stays while one page
// follows the other.
void Broadcast::onRelease() {
    if (m_presentsInBackground && !m_presentation.isPending()) {
        if (m_arbiter.owner() != 0) {
            return; // the tune of the next object follows
        }
        const auto tune = m_arbiter.backgroundTune();
        if (tune && m_presentation.handOver(*tune)) {
            return;
        }
    }
    m_presentation.stop();
}

void Broadcast::fillBackground() {
    if (!m_presentation.isActive()) {
        tuneInBackground();
    }
}

// Whatever is presented then, which is the background's or nothing, is replaced.
bool Broadcast::tuneInBackground() {
    const bool isPictureAvailable = m_presentation.isActive() || m_platform.picture().isFree();
    const auto tune =
        m_presentsInBackground && isPictureAvailable ? m_arbiter.backgroundTune() : std::nullopt;
    if (tune) {
        m_presentation.tune(*tune);
    }
    return tune.has_value();
}

bool Broadcast::changeView(TELIX_JS_VB_HANDLE object,
                           const std::function<void(Picture::View& view)>& change) {
    Picture::View view;
    Picture::Token token = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        TunerArbiter::Object* found = m_arbiter.findLocked(object);
        if (!found) {
            return false;
        }
        change(found->view);
        view = found->view;
        token = m_arbiter.ownerLocked() == object ? m_presentation.pictureTokenLocked() : 0;
    }
    m_platform.picture().setView(token, view);
    return true;
}

std::optional<std::vector<TELIX_JS_AVCOMPHANDLE>>
Broadcast::components(TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPTYPE type, bool activeOnly) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    if (!m_arbiter.findLocked(object)) {
        return std::nullopt;
    }
    return m_arbiter.ownerLocked() == object ? m_components.listLocked(type, activeOnly)
                                             : std::vector<TELIX_JS_AVCOMPHANDLE>();
}

std::optional<ComponentTraits> Broadcast::findComponent(TELIX_JS_AVCOMPHANDLE component,
                                                        TELIX_JS_AVCOMPTYPE type) const {
    return m_components.find(component, type);
}

bool Broadcast::selectComponent(TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPHANDLE component,
                                TELIX_JS_AVCOMPTYPE type, bool isActive) {
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        if (object == 0 || m_arbiter.ownerLocked() != object ||
            !m_components.selectLocked(component, type, isActive)) {
            return false;
        }
    }
    m_platform.post([this] { m_presentation.applySelection(); });
    return true;
}

Broadcast::State Broadcast::state() const {
    State state{};
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        state.channel = m_arbiter.currentChannelLocked();
        for (const auto& [handle, object] : m_arbiter.objectsLocked()) {
            state.objects.push_back(
                {handle, object.playState, object.channel, object.view, handle == m_arbiter.ownerLocked()});
        }
        state.components = m_components.availableLocked();
        state.present = m_presentFollowing.presentLocked();
        state.following = m_presentFollowing.followingLocked();
    }
    state.instantZap = m_presentation.source().keepsPackets();
    state.tuners = m_presentation.source().receptions();
    for (const BroadcastSource::Reception& tuner : state.tuners) {
        state.keptPackets += tuner.keptSize;
    }
    state.subscriptions = m_streamEvents.subscriptions();
    return state;
}

} // namespace desktop
