// The players of the A/V control objects: a table of them, the one pipeline for which they take turns, and
// what pages may know at once.
#ifndef TELIX_DESKTOP_PLATFORM_PLAYERREGISTRY_H
#define TELIX_DESKTOP_PLATFORM_PLAYERREGISTRY_H

#include <deque>
#include <map>
#include <memory>
#include <tuple>

#include "desktop/platform/Callback.h"
#include "desktop/platform/ComponentTable.h"
#include "desktop/platform/MediaPipeline.h"
#include "desktop/platform/Platform.h"

namespace desktop {

// The functions are called on any thread unless said otherwise, and answer at once. Those that take a player
// give false if there is none with that handle.
class PlayerRegistry {
public:
    struct State {
        TELIX_JS_AV_HANDLE player;
        std::string url;   // the last one given; empty if there was none
        std::string state; // stopped, connecting, buffering, playing, paused, finished, error
        uint32_t position; // milliseconds, as the duration
        uint32_t duration;
        uint32_t bufferedEnd; // seconds
        uint32_t buffered;    // as in play-info, injected numbers included
        double speed;         // backward is negative
        uint32_t volume;
    };

    static PlayerRegistry& instance(); // lives as long as the process, like the platform

    PlayerRegistry(const PlayerRegistry&) = delete;
    PlayerRegistry& operator=(const PlayerRegistry&) = delete;

    TELIX_JS_AV_HANDLE create();

    // Ends a player and its registrations. When this returns, its callbacks are not running any more.
    bool destroy(TELIX_JS_AV_HANDLE player);

    // The last one registered is called; null counts as none.
    bool setCallback(TELIX_JS_AV_HANDLE player, TELIX_JS_AV_PLAYSTATE_CB callback);
    bool setCallback(TELIX_JS_AV_HANDLE player, TELIX_JS_AV_DRM_RIGHTS_CB callback);

    // ---- Requests. The outcome follows through the callback.

    // Takes the pipeline from broadcast and from any other player; that one gets no message, for the plug-in
    // would take it for this player's. What had been queued is forgotten, unless the player goes on at
    // another position (Stop, Seek, Play). False also without a URL.
    bool play(TELIX_JS_AV_HANDLE player, const std::string& url, uint32_t playCount);

    // Plays at once if nothing plays.
    bool queue(TELIX_JS_AV_HANDLE player, const std::string& url, uint32_t playCount);
    bool withdraw(TELIX_JS_AV_HANDLE player);

    bool stop(TELIX_JS_AV_HANDLE player);

    // False also if nothing plays.
    bool pause(TELIX_JS_AV_HANDLE player);
    bool resume(TELIX_JS_AV_HANDLE player);

    // If nothing plays, for what will be played next. False also where the media has no such position, or
    // none to go to.
    bool seek(TELIX_JS_AV_HANDLE player, uint32_t milliseconds);

    // Backward is negative; 0 pauses. There is sound at the speed of 1 alone. False also for a speed that the
    // media, or the set, does not have.
    bool setSpeed(TELIX_JS_AV_HANDLE player, double speed);

    bool setVolume(TELIX_JS_AV_HANDLE player, uint32_t volume);

    // Changes how and where a player shows its picture.
    bool changeView(TELIX_JS_AV_HANDLE player, const std::function<void(Picture::View& view)>& change);

    // Fills in the record of a player and gives it out; null if there is no such player. It stays good for
    // ever: whoever reads it may be late.
    TELIX_JS_AV_PLAY_INFO* playInfo(TELIX_JS_AV_HANDLE player);

    // ---- Components

    // All of one kind, or those that are presented. Nothing as long as the media is not known.
    std::optional<std::vector<TELIX_JS_AVCOMPHANDLE>>
    components(TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPTYPE type, bool activeOnly) const;
    std::optional<ComponentTraits> findComponent(TELIX_JS_AVCOMPHANDLE component,
                                                 TELIX_JS_AVCOMPTYPE type) const;
    bool selectComponent(TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type,
                         bool isActive);

    // ---- What may be provoked from outside

    // To the player that presents, else to the one last given a URL; false if there is none.
    bool injectMessage(TELIX_AV_CB_MSG message);
    bool injectRightsError(TELIX_AV_DRM_ERR_STATE_ENUM_T state, const std::string& contentId,
                           const std::string& drmSystemId, const std::string& rightsIssuerUrl);

    // From now on the field `buffered` of every player is this number as it is; without a value it is the
    // real one again. True.
    bool injectBuffered(std::optional<uint32_t> raw);

    std::vector<State> states() const;

    // What the pipeline lets through; nothing if there is none. Platform thread.
    std::optional<MediaPipeline::Sound> sound() const;

private:
    struct Callbacks {
        Callback<TELIX_JS_AV_PLAYSTATE_CB> message;
        Callback<TELIX_JS_AV_DRM_RIGHTS_CB> rights;
    };

    struct Item {
        std::string url;
        uint32_t playCount = 1;
    };

    enum class Phase { stopped, connecting, presenting, finished, error };

    struct Entry {
        TELIX_JS_AV_PLAY_INFO* record = nullptr;
        std::shared_ptr<Callbacks> callbacks;
        Picture::View view;
        uint32_t volume = 100;
        double speed = 1;
        std::string url;
        Phase phase = Phase::stopped;
        bool isPaused = false;
        bool isHeld = false; // waits for media
        bool isKnown = false;
        bool canSeek = false;
        bool canSeekAhead = false;
        bool canReverse = false;
        unsigned int seeksOnTheWay = 0;
        MediaPipeline::Progress progress;
        std::optional<uint32_t> nextPosition; // where what is played next begins
        std::deque<Item> waiting;
        ComponentSelection components;
    };

    // A stream of the media at one URL in one player.
    struct Component : MediaPipeline::Stream {
        Component(const MediaPipeline::Stream& stream, TELIX_JS_AV_HANDLE player, std::string url)
            : Stream(stream), player(player), url(std::move(url)) {}

        // A file may have changed between two requests: then its streams are other components.
        bool operator==(const Component& other) const {
            const auto key = [](const Component& each) {
                return std::tie(each.player, each.url, each.type, each.number, each.encoding, each.language,
                                each.audioChannels, each.aspectRatio);
            };
            return key(*this) == key(other);
        }

        TELIX_JS_AV_HANDLE player;
        std::string url;
    };

    PlayerRegistry();

    Entry* findLocked(TELIX_JS_AV_HANDLE player);
    const Entry* findLocked(TELIX_JS_AV_HANDLE player) const;
    void requestLocked(TELIX_JS_AV_HANDLE player, Entry& entry, const Item& item);
    void releaseLocked(TELIX_JS_AV_HANDLE player, Phase phase);
    static void forgetMedia(Entry& entry);
    uint32_t bufferedOf(const Entry& entry) const;
    TELIX_JS_AV_HANDLE addresseeLocked() const;
    std::shared_ptr<Callbacks> callbacksOf(TELIX_JS_AV_HANDLE player) const;
    bool apply(TELIX_JS_AV_HANDLE player, const std::function<bool(Entry& entry)>& change,
               std::function<void(MediaPipeline& pipeline)> follow);

    // Platform thread.
    void begin(uint64_t session, const Item& item);
    void end();
    void lose();
    void takeMedia(uint64_t session, const MediaPipeline::Media& media);
    void tellBegin(uint64_t session);
    void takeEnd(uint64_t session);
    void fail(uint64_t session, TELIX_AV_CB_MSG message, const std::string& reason);
    void readProgress();
    void applySelection();
    bool isCurrentLocked(uint64_t session) const { return session == m_session && session == m_working; }
    void tell(TELIX_JS_AV_HANDLE player, TELIX_AV_CB_MSG message);

    Platform& m_platform;

    // Under the platform's mutex.
    std::map<TELIX_JS_AV_HANDLE, Entry> m_entries;
    std::deque<TELIX_JS_AV_PLAY_INFO> m_records; // kept, also of players that have ended
    TELIX_JS_AV_HANDLE m_lastHandle = 0;
    TELIX_JS_AV_HANDLE m_owner = 0; // the player that has the pipeline, or will
    TELIX_JS_AV_HANDLE m_lastPlayed = 0;
    uint64_t m_session = 0; // changes with each wish to play or stop
    ComponentTable<Component> m_components;
    std::optional<uint32_t> m_injectedBuffered;
    Picture::Token m_token = 0;

    // Platform thread.
    std::unique_ptr<MediaPipeline> m_pipeline;
    uint64_t m_working = 0; // the session to which the pipeline belongs; 0: none
    Item m_item;
    bool m_isReading = false; // progress is read at intervals
    TELIX_AV_CB_MSG m_lastMessage = 0;
};

} // namespace desktop

#endif
