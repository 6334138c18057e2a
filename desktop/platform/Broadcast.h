// Broadcast television: the video/broadcast objects, the one tuner for which they take turns, and what it
// receives. This class puts the parts together; each has one concern and owns its state:
//   TunerArbiter        objects, ownership of the tuner, play states
//   ServicePresentation the steps of a tune, the pipeline that presents
//   BroadcastComponents components of the service and their selection
//   PresentFollowing    present and following programme
//   RatingMonitor       parental rating of the present programme
//   StreamEvents        subscriptions to stream events
//   FaultInjection      errors and events that a test provokes
//   BroadcastCallbacks  callbacks of the plug-in
//   Channels            the channel list
//   Programmes          programmes and ratings by handle
//   ApplicationSignalling  applications of the current channel, for the window
// Below them lie BroadcastSource (Playout with a TableInjector, Restamper, Receiver), Multiplex (the test
// multiplex), Sections and TsTables (reading and writing of tables, DvbConstants), ApplicationInformation
// (the AIT) and Tuner (the pipeline). Time comes from a Clock.
//
// Threads and locks: the plug-in calls on any thread, and these calls read or change plain data under
// Platform::mutex() and post the rest. Tunes, reports and all callbacks of the plug-in happen on the platform
// thread, in the order of the requests. The playout thread and GStreamer's threads only post. Lock order: the
// mutex of StreamEvents, then Platform::mutex(). No callback of the plug-in runs under Platform::mutex().
#ifndef TELIX_DESKTOP_PLATFORM_BROADCAST_H
#define TELIX_DESKTOP_PLATFORM_BROADCAST_H

#include <functional>
#include <optional>
#include <vector>

#include "desktop/platform/ApplicationSignalling.h"
#include "desktop/platform/BroadcastCallbacks.h"
#include "desktop/platform/BroadcastComponents.h"
#include "desktop/platform/Channels.h"
#include "desktop/platform/Clock.h"
#include "desktop/platform/FaultInjection.h"
#include "desktop/platform/Platform.h"
#include "desktop/platform/PresentFollowing.h"
#include "desktop/platform/Programmes.h"
#include "desktop/platform/RatingMonitor.h"
#include "desktop/platform/ServicePresentation.h"
#include "desktop/platform/StreamEvents.h"
#include "desktop/platform/TunerArbiter.h"

namespace desktop {

// The functions are called on any thread unless said otherwise, and return at once. Those that take an object
// refuse (false, or nothing) if there is none with that handle.
class Broadcast {
public:
    // Made by the first call; lives as long as the process, like the platform.
    static Broadcast& instance();

    // The clock of the instance, which must not exist yet and which the clock must outlive; otherwise it is
    // Clock::real(). For tests.
    static void useClock(Clock& clock);

    Broadcast(const Broadcast&) = delete;
    Broadcast& operator=(const Broadcast&) = delete;

    BroadcastCallbacks& callbacks() { return m_callbacks; }
    Channels& channels() { return m_channels; }
    Programmes& programmes() { return m_programmes; }
    TunerArbiter& arbiter() { return m_arbiter; }
    const PresentFollowing& presentFollowing() const { return m_presentFollowing; }
    RatingMonitor& ratings() { return m_ratings; }
    StreamEvents& streamEvents() { return m_streamEvents; }
    ApplicationSignalling& applications() { return m_applications; }
    FaultInjection& faults() { return m_faults; }

    // Receives the current channel even if no object has tuned to it yet, so that its applications are known.
    void followApplications();

    // From now on the current channel is presented on the whole video plane while neither an object nor a
    // player presents, unless an object has stopped its channel: what a set shows by itself.
    void presentInBackground();

    // Changes how and where an object shows its picture.
    bool changeView(TELIX_JS_VB_HANDLE object, const std::function<void(Picture::View& view)>& change);

    // Whether channel changes begin with what has been received since the last keyframe, if the multiplex is
    // received already.
    void setInstantZap(bool isOn) { m_presentation.setInstantZap(isOn); }

    // The components of one type of what the object presents, or the active ones of them. Empty if it does
    // not own the tuner.
    std::optional<std::vector<TELIX_JS_AVCOMPHANDLE>>
    components(TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPTYPE type, bool activeOnly) const;
    std::optional<ComponentTraits> findComponent(TELIX_JS_AVCOMPHANDLE component,
                                                 TELIX_JS_AVCOMPTYPE type) const;

    // Refuses a component that is not available, and an object that does not own the tuner.
    bool selectComponent(TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type,
                         bool isActive);

    // The PID of the audio that the pipeline lets through. Platform thread.
    std::optional<uint16_t> activeAudioPid() const { return m_presentation.activeAudioPid(); }

    // How late picture and sound are presented. Platform thread.
    ServicePresentation::Lateness lateness() const { return m_presentation.lateness(); }

    // Everything at one moment.
    struct State {
        struct Object {
            TELIX_JS_VB_HANDLE handle;
            TELIX_PLAYSTATE_ENUM_T playState;
            TELIX_JS_CM_HANDLE channel;
            Picture::View view;
            bool ownsTuner;
        };
        TELIX_JS_CM_HANDLE channel; // the current one
        std::vector<Object> objects;
        std::vector<BroadcastComponents::Available> components;
        std::vector<StreamEvents::Subscription> subscriptions;
        TELIX_JS_SI_HANDLE present; // 0: none
        TELIX_JS_SI_HANDLE following;
        bool instantZap;
        std::vector<BroadcastSource::Reception> tuners;
        size_t keptPackets; // bytes, of all tuners and services
    };
    State state() const;

private:
    explicit Broadcast(Clock& clock);

    TunerArbiter::Listener arbiterListener();
    ServicePresentation::Listener presentationListener();
    bool tuneInBackground();
    void onRelease();
    void fillBackground();

    Platform& m_platform;
    BroadcastCallbacks m_callbacks;
    Channels m_channels;
    Programmes m_programmes;
    StreamEvents m_streamEvents;
    ApplicationSignalling m_applications;
    RatingMonitor m_ratings;
    TunerArbiter m_arbiter;
    BroadcastComponents m_components;
    PresentFollowing m_presentFollowing;
    ServicePresentation m_presentation;
    FaultInjection m_faults;
    bool m_presentsInBackground = false; // platform thread
};

} // namespace desktop

#endif
