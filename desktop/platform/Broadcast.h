// Broadcast television: the video/broadcast objects, the one tuner for which they take turns, and what it
// receives.
#ifndef TELIX_DESKTOP_BROADCAST_H
#define TELIX_DESKTOP_BROADCAST_H

#include "desktop/platform/Callback.h"
#include "desktop/platform/Channels.h"
#include "desktop/platform/ComponentTraits.h"
#include "desktop/platform/HeadEnd.h"
#include "desktop/platform/Platform.h"
#include "desktop/platform/Programmes.h"
#include "desktop/platform/Receiver.h"
#include "desktop/platform/Tuner.h"

#include <list>
#include <map>
#include <memory>

namespace desktop {

// Why a channel is not presented; the numbers that pages know.
constexpr TELIX_ERR_STATE_ENUM_T errorNoSignal = 1;
constexpr TELIX_ERR_STATE_ENUM_T errorUnknownChannel = 5;
constexpr TELIX_ERR_STATE_ENUM_T errorInterrupted = 6;

// A component of broadcast. Handles are given for life: equal components have the same one.
struct Component : ComponentTraits {
    TELIX_JS_CM_HANDLE channel = 0;
    uint16_t pid = 0;
};

// The functions are called on any thread unless said otherwise, and answer at once. Those that take an object
// give false if there is none with that handle.
class Broadcast {
public:
    static Broadcast& instance(); // lives as long as the process, like the platform

    Broadcast(const Broadcast&) = delete;
    Broadcast& operator=(const Broadcast&) = delete;

    Channels& channels() { return m_channels; }
    Programmes& programmes() { return m_programmes; }

    // ---- Objects

    TELIX_JS_VB_HANDLE newObject();
    bool release(TELIX_JS_VB_HANDLE object);
    bool stop(TELIX_JS_VB_HANDLE object);
    bool bind(TELIX_JS_VB_HANDLE object);

    // Requests; 0 stands for no channel. False also for a channel that does not exist.
    bool tune(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel);

    // Tunes to a neighbour of the selected channel, which is given out as it was before; 0 if that is
    // impossible.
    TELIX_JS_CM_HANDLE step(TELIX_JS_VB_HANDLE object, int distance);

    // What an object presents, connects to, or stopped at; 0 if nothing.
    TELIX_JS_CM_HANDLE channelOf(TELIX_JS_VB_HANDLE object) const;

    // What the set as a whole presents, or would.
    TELIX_JS_CM_HANDLE currentChannel() const;

    bool exists(TELIX_JS_VB_HANDLE object) const;

    // Reads or changes how and where an object shows its picture.
    std::optional<Picture::View> viewOf(TELIX_JS_VB_HANDLE object) const;
    bool changeView(TELIX_JS_VB_HANDLE object, const std::function<void(Picture::View& view)>& change);

    std::optional<TELIX_PLAYSTATE_ENUM_T> playState(TELIX_JS_VB_HANDLE object) const;
    bool setPlayState(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state);

    // ---- Programmes

    // Of the channel that is presented, the present one first.
    std::vector<TELIX_JS_SI_HANDLE> currentProgrammes() const;

    // ---- Components

    // All of one kind, or those that are presented, of an object's channel.
    std::optional<std::vector<TELIX_JS_AVCOMPHANDLE>>
    components(TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPTYPE type, bool activeOnly) const;
    std::optional<ComponentTraits> findComponent(TELIX_JS_AVCOMPHANDLE component,
                                                 TELIX_JS_AVCOMPTYPE type) const;
    bool select(TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type,
                bool on);

    // ---- Stream events. Ids and tags are the texts of pages.

    bool watch(TELIX_JS_VB_HANDLE object, TELIX_JS_VB_STREAM_EVENT_CB callback, const std::string& eventId,
               const std::string& tag, const std::string& name);
    bool unwatch(TELIX_JS_VB_HANDLE object, TELIX_JS_VB_STREAM_EVENT_CB callback, const std::string& eventId,
                 const std::string& tag);

    // ---- What may be provoked from outside, as if broadcast or the viewer had done it. Each concerns the
    // object that holds the tuner, and is false if there is none.

    // Tunes to a channel. Without an object the set remembers it for the one that binds next: also true.
    bool zap(TELIX_JS_CM_HANDLE channel);

    bool injectChannelError(TELIX_ERR_STATE_ENUM_T error);
    bool injectFullScreen(bool on);

    // A rating as in EitRating: an age, or with any other number but 0 an error. With 0 there is none.
    bool injectRating(const std::string& region, uint8_t broadcast);
    bool injectRatingError(std::string contentId, std::string drmSystemId);

    // An event that reaches the watchers of all objects for which the criteria hold; it gives their number.
    // Platform thread.
    struct InjectedEvent {
        std::optional<uint16_t> id;
        std::optional<uint8_t> tag;
        std::optional<std::string> name;
        Bytes data;
        std::string status = "trigger";
    };
    size_t injectStreamEvent(const InjectedEvent& event);

    // ---- What there is now

    struct State {
        struct Object {
            TELIX_JS_VB_HANDLE handle;
            TELIX_PLAYSTATE_ENUM_T playState;
            TELIX_JS_CM_HANDLE channel;
            Picture::View view;
            bool holdsTuner;
        };
        struct Available {
            TELIX_JS_AVCOMPHANDLE handle;
            Component component;
            bool isActive;
        };
        struct Watch {
            TELIX_JS_VB_HANDLE object;
            uint16_t eventId;
            uint8_t tag;
            std::string name;
        };
        TELIX_JS_CM_HANDLE channel; // of the set
        std::vector<Object> objects;
        std::vector<Available> components;
        std::vector<Watch> watches;
        TELIX_JS_SI_HANDLE present; // 0: none
        TELIX_JS_SI_HANDLE following;
    };
    State state() const;

    // The PID of the audio that the pipeline lets through. Platform thread.
    std::optional<uint16_t> heardAudio() const;

    // ---- Callbacks

    Callback<TELIX_JS_VB_CHANNEL_CHANGE_CB> onChannelChange;
    Callback<TELIX_JS_VB_CHANNEL_ERROR_CB> onChannelError;
    Callback<TELIX_JS_VB_FULLSCREEN_CB> onFullScreen;
    Callback<TELIX_JS_VB_PLAYSTATE_CB> onPlayState;
    Callback<TELIX_JS_VB_PROGRAMMES_CB> onProgrammes;
    Callback<TELIX_JS_VB_PARENTAL_RATING_CB> onRatingChange;
    Callback<TELIX_JS_VB_PARENTAL_RATING_CB> onRatingError;

private:
    struct Object {
        Picture::View view;
        TELIX_PLAYSTATE_ENUM_T state = TELIX_PLAYSTATE_UNREALIZED;
        TELIX_JS_CM_HANDLE channel = 0;
    };

    struct Subscription {
        TELIX_JS_VB_HANDLE object;
        TELIX_JS_VB_STREAM_EVENT_CB callback;
        uint16_t eventId;
        uint8_t tag;
        std::string name;
        int lastVersion; // -1: none yet
    };

    // A wish to tune, on its way or at work.
    struct Request {
        uint64_t number = 0; // 0: none
        TELIX_JS_VB_HANDLE object = 0;
        TELIX_JS_CM_HANDLE channel = 0;
    };

    Broadcast();

    Object* findLocked(TELIX_JS_VB_HANDLE object);
    const Object* findLocked(TELIX_JS_VB_HANDLE object) const;
    void requestLocked(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel);
    bool end(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state);

    // Platform thread.
    void begin(const Request& request);
    void present(const Request& request);
    void succeed(uint64_t number);
    void fail(uint64_t number, TELIX_ERR_STATE_ENUM_T error, const std::string& reason);
    void interrupt();
    void loseTuner(TELIX_JS_VB_HANDLE object);
    void stopTuner();
    void changeState(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state, TELIX_ERR_STATE_ENUM_T error);
    void takeMap(uint64_t number, const Pmt& map);
    void takeProgrammes(uint64_t number, const Eit& eit);
    void tellRating(TELIX_JS_SI_PARENTALRATING_HANDLE rating);
    void deliverEvent(uint8_t tag, const StreamEvent& event);
    void deliver(const std::vector<Subscription>& due, const Bytes& data, std::string status);
    void applySelection();
    void readShape();
    void makeTestFile();

    TELIX_JS_AVCOMPHANDLE internLocked(const Component& component);
    std::vector<TELIX_JS_AVCOMPHANDLE> ofKindLocked(TELIX_JS_AVCOMPTYPE type, bool activeOnly) const;

    Platform& m_platform;
    Channels m_channels;
    Programmes m_programmes;
    Receiver m_receiver;
    HeadEnd m_headEnd; // behind the receiver: it ends first

    // Under the platform's mutex.
    std::map<TELIX_JS_VB_HANDLE, Object> m_objects;
    TELIX_JS_VB_HANDLE m_lastObject = 0;
    TELIX_JS_VB_HANDLE m_holder = 0;  // the object that holds the tuner, or will
    TELIX_JS_CM_HANDLE m_current = 0; // the channel of the set
    Request m_request;                // the last one that was made
    TELIX_JS_SI_HANDLE m_present = 0; // programmes of the channel that is presented
    TELIX_JS_SI_HANDLE m_following = 0;
    std::vector<Component> m_components; // all that ever were; the handle is the index and 1
    std::vector<TELIX_JS_AVCOMPHANDLE> m_available;
    TELIX_JS_AVCOMPHANDLE m_active[3] = {0, 0, 0}; // by kind
    Picture::Token m_token = 0;

    // Held while a stream event is delivered, so that none comes after its end.
    mutable std::recursive_mutex m_subscriptionsMutex;
    std::list<Subscription> m_subscriptions;

    // Platform thread.
    std::unique_ptr<Tuner> m_tuner;
    Request m_working;        // at work, without an outcome
    uint64_t m_presented = 0; // the request to which the tuner belongs
    std::string m_sentFile;
    bool m_hasRating = false;
    TELIX_JS_SI_PARENTALRATING_HANDLE m_rating = 0;
    std::string m_testFile; // empty as long as there is none
    std::string m_testError;
    bool m_isMakingTest = false;
};

} // namespace desktop

#endif
