// The video/broadcast objects, and the one tuner for which they take turns: who owns it, which channel it was
// last asked for, and what each object's page may know of its state at once.
#ifndef TELIX_DESKTOP_PLATFORM_TUNERARBITER_H
#define TELIX_DESKTOP_PLATFORM_TUNERARBITER_H

#include <array>
#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "desktop/platform/BroadcastCallbacks.h"
#include "desktop/platform/Channels.h"
#include "desktop/platform/Platform.h"

namespace desktop {

// Why a channel is not presented; the numbers that pages know (OIPF DAE, onChannelChangeError).
constexpr TELIX_ERR_STATE_ENUM_T kErrorNoSignal = 1;
constexpr TELIX_ERR_STATE_ENUM_T kErrorUnknownChannel = 5;
constexpr TELIX_ERR_STATE_ENUM_T kErrorInterrupted = 6;

// A request to tune. Each has a higher id than the one before; 0 stands for no tune.
struct Tune {
    uint64_t id = 0;
    TELIX_JS_VB_HANDLE object = 0; // 0: the set itself
    TELIX_JS_CM_HANDLE channel = 0;
};

// Platform::mutex() guards all data. Functions whose name ends in Locked need it held; all others take it
// themselves. Functions return at once; what follows from a request happens on the platform thread, in the
// order of the requests.
class TunerArbiter {
public:
    // Platform thread.
    struct Listener {
        std::function<void(const Tune& tune)> onTune;              // the owner asks for a channel
        std::function<void()> onRelease;                           // the owner gives the tuner up
        std::function<void()> onUnbound;                           // an object has given its channel up
        std::function<void(TELIX_JS_CM_HANDLE channel)> onChannel; // the current one changes without an owner
    };

    struct Object {
        Picture::View view;
        TELIX_PLAYSTATE_ENUM_T playState = TELIX_PLAYSTATE_UNREALIZED;
        TELIX_JS_CM_HANDLE channel = 0; // presented, tuned to, or presented until stop; 0: none
    };

    // `channels` and `callbacks` must outlive the arbiter. The first channel becomes the current one.
    TunerArbiter(const Channels& channels, BroadcastCallbacks& callbacks, Listener listener);

    // ---- Requests of objects. Any thread. They are refused (false, or 0) for a handle without an object.

    TELIX_JS_VB_HANDLE newObject();

    // Ends what the object presents; it may tune again. release() also forgets its channel.
    bool release(TELIX_JS_VB_HANDLE object);
    bool stop(TELIX_JS_VB_HANDLE object);

    // Tunes to the current channel, unless the object presents already.
    bool bind(TELIX_JS_VB_HANDLE object);

    // Takes the tuner for the object. Channel 0 releases it. Refuses an unknown channel.
    bool tune(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel);

    // Tunes to the neighbour of the current channel. Returns the channel that was current before.
    TELIX_JS_CM_HANDLE step(TELIX_JS_VB_HANDLE object, int offset);

    // The viewer changes the channel: the owner tunes. Without an owner the channel becomes the current one,
    // to which the next object binds. Refuses an unknown channel.
    bool zap(TELIX_JS_CM_HANDLE channel);

    // A request of the set itself for the current channel, which owns nothing and is reported to nobody: any
    // request of an object replaces it. Nothing while an object owns the tuner, or has stopped its channel
    // and not released it: then the page wants no broadcast.
    std::optional<Tune> backgroundTune();

    // ---- State. Any thread.

    bool exists(TELIX_JS_VB_HANDLE object) const;
    TELIX_JS_CM_HANDLE channelOf(TELIX_JS_VB_HANDLE object) const; // 0: none
    std::optional<Picture::View> viewOf(TELIX_JS_VB_HANDLE object) const;
    // That of what the set presents by itself.
    const Picture::View& backgroundView() const { return m_backgroundView; }
    std::optional<TELIX_PLAYSTATE_ENUM_T> playState(TELIX_JS_VB_HANDLE object) const;
    bool setPlayState(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state);

    // The channel that the tuner presents, or presents next. It stays the same when the tuner is released.
    TELIX_JS_CM_HANDLE currentChannel() const;
    TELIX_JS_CM_HANDLE currentChannelLocked() const { return m_currentChannel; }

    // The channels before and after the current one, beginning with the one that comes next if the viewer
    // goes on in the same direction.
    std::array<TELIX_JS_CM_HANDLE, 2> neighbours() const;

    // The object that presents or tunes; 0 if none does.
    TELIX_JS_VB_HANDLE owner() const;
    TELIX_JS_VB_HANDLE ownerLocked() const { return m_tunerOwner; }

    Object* findLocked(TELIX_JS_VB_HANDLE object);
    const Object* findLocked(TELIX_JS_VB_HANDLE object) const;
    const std::map<TELIX_JS_VB_HANDLE, Object>& objectsLocked() const { return m_objects; }

    // ---- Reports of the presentation: they change the object's state and call the plug-in. Platform thread.

    // False if a later request has replaced the tune.
    bool isLatest(const Tune& tune) const;

    void reportConnecting(const Tune& tune);
    void reportPresenting(const Tune& tune);
    void reportAborted(const Tune& tune); // another request replaced it before it had an outcome
    void reportFailed(const Tune& tune, TELIX_ERR_STATE_ENUM_T error);

    // The presentation broke down after it had begun.
    void reportBroken(TELIX_JS_VB_HANDLE object, TELIX_ERR_STATE_ENUM_T error);

    // A media player has taken the pipeline. The first function drops the ownership, the second one reports
    // that; the presentation ends in between.
    void preemptLocked(TELIX_JS_VB_HANDLE object);
    void reportPreempted(TELIX_JS_VB_HANDLE object);

private:
    bool end(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state);
    void selectLocked(TELIX_JS_CM_HANDLE channel);
    void requestLocked(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel);
    void reportOutcome(const Tune& tune, TELIX_PLAYSTATE_ENUM_T state, TELIX_ERR_STATE_ENUM_T error);
    void changeState(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state, TELIX_ERR_STATE_ENUM_T error);

    Platform& m_platform;
    const Channels& m_channels;
    BroadcastCallbacks& m_callbacks;
    const Listener m_listener;

    // Guarded by Platform::mutex().
    std::map<TELIX_JS_VB_HANDLE, Object>
        m_objects; // kept for the life of the process: a released one may tune
    TELIX_JS_VB_HANDLE m_lastObject = 0;
    Picture::View m_backgroundView; // constant
    TELIX_JS_VB_HANDLE m_tunerOwner = 0;
    TELIX_JS_CM_HANDLE m_currentChannel = 0;
    int m_direction = 1; // in which the viewer goes through the list; -1: to its beginning
    Tune m_latestTune;   // object and channel are 0 after a release
};

} // namespace desktop

#endif
