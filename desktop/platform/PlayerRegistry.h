// The players of the A/V control objects: a table of them, the one media pipeline, which plays for one player
// at a time, and what the calls of the plug-in return at once. Its implementation has one file for each
// concern:
//   PlayerRegistry.cpp           the table, callbacks, phases
//   PlayerRegistryRequests.cpp   play, queue, stop, pause, seek, speed, volume, view
//   PlayerRegistrySession.cpp    the pipeline, and what it reports
//   PlayerRegistryProgress.cpp   play info, inspection
//   PlayerRegistryComponents.cpp lists and selection of components
//   PlayerRegistryInjection.cpp  what the control tool injects
//
// A request changes the table at once, under the platform's mutex, and posts the work on the pipeline to the
// platform thread. Each request to play or stop starts a new session, by whose number work that comes too
// late is recognised and dropped.
#ifndef TELIX_DESKTOP_PLATFORM_PLAYERREGISTRY_H
#define TELIX_DESKTOP_PLATFORM_PLAYERREGISTRY_H

#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "desktop/platform/Callback.h"
#include "desktop/platform/ComponentTable.h"
#include "desktop/platform/MediaPipeline.h"
#include "desktop/platform/Platform.h"

namespace desktop {

// The functions are called on any thread unless they say otherwise, and never block on the pipeline. Those
// that take a player return false if no player has this handle.
class PlayerRegistry {
public:
    struct State {
        TELIX_JS_AV_HANDLE player;
        std::string url;      // the last one that was requested; empty if there was none
        std::string state;    // stopped, connecting, buffering, playing, paused, finished, error
        uint32_t position;    // milliseconds
        uint32_t duration;    // milliseconds
        uint32_t bufferedEnd; // seconds
        uint32_t buffered;    // as in the play info, injected values included
        double speed;         // negative: backward
        uint32_t volume;      // 0 to 100
    };

    static PlayerRegistry& instance(); // lives as long as the process, like the platform

    PlayerRegistry(const PlayerRegistry&) = delete;
    PlayerRegistry& operator=(const PlayerRegistry&) = delete;

    TELIX_JS_AV_HANDLE create();

    // Removes a player and its callbacks. When this returns, no callback is running for it.
    bool destroy(TELIX_JS_AV_HANDLE player);

    // Replaces the callback; null removes it.
    bool setCallback(TELIX_JS_AV_HANDLE player, TELIX_JS_AV_PLAYSTATE_CB callback);
    bool setCallback(TELIX_JS_AV_HANDLE player, TELIX_JS_AV_DRM_RIGHTS_CB callback);

    // ---- Requests. The callback reports the outcome.

    // Preempts broadcast and any other player. That player gets no message, because the plug-in would take it
    // for one to this player. Clears the queue, unless the player continues at another position (Stop, Seek,
    // Play). False also without a URL.
    bool play(TELIX_JS_AV_HANDLE player, const std::string& url, uint32_t playCount);

    // Plays at once if nothing plays.
    bool queue(TELIX_JS_AV_HANDLE player, const std::string& url, uint32_t playCount);
    bool clearQueue(TELIX_JS_AV_HANDLE player);

    bool stop(TELIX_JS_AV_HANDLE player);

    // False also if nothing plays.
    bool pause(TELIX_JS_AV_HANDLE player);
    bool resume(TELIX_JS_AV_HANDLE player);

    // If nothing plays, this is the start position of what plays next. False also if the media does not have
    // this position or cannot seek to it.
    bool seek(TELIX_JS_AV_HANDLE player, uint32_t milliseconds);

    // Negative speeds play backward; 0 pauses. Audio is muted at any speed but 1. False also for a speed that
    // the media or the platform does not support.
    bool setSpeed(TELIX_JS_AV_HANDLE player, double speed);

    bool setVolume(TELIX_JS_AV_HANDLE player, uint32_t volume);

    // Changes where on the page a player shows its video.
    bool changeView(TELIX_JS_AV_HANDLE player, const std::function<void(Picture::View& view)>& change);

    // Fills in the record of a player and returns it; null if no player has this handle. The record is valid
    // for the life of the process, because another thread of the plug-in may still read it.
    TELIX_JS_AV_PLAY_INFO* playInfo(TELIX_JS_AV_HANDLE player);

    // ---- Components

    // All of one type, or the active ones. Nothing before the media has prerolled.
    std::optional<std::vector<TELIX_JS_AVCOMPHANDLE>>
    components(TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPTYPE type, bool activeOnly) const;
    std::optional<ComponentTraits> findComponent(TELIX_JS_AVCOMPHANDLE component,
                                                 TELIX_JS_AVCOMPTYPE type) const;
    bool selectComponent(TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type,
                         bool isActive);

    // ---- Injection

    // To the player that owns the pipeline, or else to the last one that did. False if there is none.
    bool injectMessage(TELIX_AV_CB_MSG message);
    bool injectRightsError(TELIX_AV_DRM_ERR_STATE_ENUM_T state, const std::string& contentId,
                           const std::string& drmSystemId, const std::string& rightsIssuerUrl);

    // Overrides the field `buffered` in the play info of every player; without a value it is the real one
    // again. Always true.
    bool injectBuffered(std::optional<uint32_t> raw);

    // ---- Inspection, for the control tool and for tests

    std::vector<State> states() const;

    // Of the pipeline; nothing if there is none. Platform thread.
    std::optional<MediaPipeline::Output> output() const;

private:
    // Means nothing to the plug-in, but separates two equal messages.
    static constexpr TELIX_AV_CB_MSG kSeparatorMessage = 0;

    struct Callbacks {
        Callback<TELIX_JS_AV_PLAYSTATE_CB> message;
        Callback<TELIX_JS_AV_DRM_RIGHTS_CB> rights;
    };

    struct Item {
        std::string url;
        uint32_t playCount = 1;
    };

    // Of a player. The owner of the pipeline is in one of the middle three, every other player in another
    // one.
    enum class Phase { Stopped, Connecting, Prerolled, Presenting, Finished, Error };

    // What can be done with the media, once it has prerolled.
    struct SeekSupport {
        bool canSeek = false;
        bool canSeekBeyondBuffer = false;
        bool canPlayBackward = false;
    };

    struct Entry {
        TELIX_JS_AV_PLAY_INFO* record = nullptr;
        std::shared_ptr<Callbacks> callbacks;
        Picture::View view;
        uint32_t volume = 100;
        double speed = 1;
        std::string url;
        Phase phase = Phase::Stopped; // written by changePhase() alone
        bool isPaused = false;        // by the user
        bool isBuffering = false;
        SeekSupport seekSupport;
        unsigned int pendingSeeks = 0; // requested, and not yet carried out by the platform thread
        MediaPipeline::Progress progress;
        std::optional<uint32_t> startPosition; // milliseconds; of what plays next
        std::deque<Item> queue;
        ComponentSelection components;
    };

    // A stream of the media at one URL in one player.
    struct Component : MediaPipeline::Stream {
        Component(const MediaPipeline::Stream& stream, TELIX_JS_AV_HANDLE player, std::string url)
            : Stream(stream), player(player), url(std::move(url)) {}

        // The file may change between two requests for one URL: then its streams are other components.
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

    // PlayerRegistry.cpp. Functions whose name ends in Locked are called with the platform's mutex held.
    Entry* findLocked(TELIX_JS_AV_HANDLE player);
    const Entry* findLocked(TELIX_JS_AV_HANDLE player) const;
    static void changePhase(Entry& entry, Phase phase);
    static bool hasPrerolled(const Entry& entry);
    std::shared_ptr<Callbacks> callbacksOf(TELIX_JS_AV_HANDLE player) const;
    void notify(TELIX_JS_AV_HANDLE player, TELIX_AV_CB_MSG message);

    // PlayerRegistryRequests.cpp
    static void clearMedia(Entry& entry);
    void requestLocked(TELIX_JS_AV_HANDLE player, Entry& entry, const Item& item);
    void releaseLocked(TELIX_JS_AV_HANDLE player, Phase phase);
    bool apply(TELIX_JS_AV_HANDLE player, const std::function<bool(Entry& entry)>& change,
               std::function<void(MediaPipeline& pipeline)> follow);
    static bool canSeekTo(const Entry& entry, uint32_t milliseconds);
    static bool canPlayAt(const Entry& entry, double speed);

    // PlayerRegistrySession.cpp: platform thread.
    void startPipeline(uint64_t session, const Item& item);
    void stopPipeline();
    MediaPipeline::Listener listenerFor(uint64_t session);
    Picture::Token acquirePicture(Picture::Token token, const Picture::View& view);
    void onPipelinePreempted();
    void onPrerolled(uint64_t session, const MediaPipeline::Media& media);
    void onStarted(uint64_t session);
    void onBuffering(uint64_t session, bool isBuffering);
    void onEos(uint64_t session);
    void onError(uint64_t session, TELIX_AV_CB_MSG message, const std::string& reason);
    bool isCurrentLocked(uint64_t session) const {
        return session == m_session && session == m_pipelineSession;
    }

    // PlayerRegistryProgress.cpp
    uint32_t bufferedOf(const Entry& entry) const;
    void startReadingProgress();
    void readProgress();

    // PlayerRegistryComponents.cpp
    void setComponentsLocked(Entry& entry, const std::vector<MediaPipeline::Stream>& streams);
    void applySelection();

    // PlayerRegistryInjection.cpp
    TELIX_JS_AV_HANDLE injectionTargetLocked() const;

    Platform& m_platform;

    // Guarded by the platform's mutex.
    std::map<TELIX_JS_AV_HANDLE, Entry> m_entries;
    std::deque<TELIX_JS_AV_PLAY_INFO> m_records; // kept when their players are destroyed
    TELIX_JS_AV_HANDLE m_lastHandle = 0;
    TELIX_JS_AV_HANDLE m_owner = 0; // of the pipeline, also while the pipeline is still to be made; 0: none
    TELIX_JS_AV_HANDLE m_lastOwner = 0;
    uint64_t m_session = 0; // the number of the last request to play or stop
    ComponentTable<Component> m_components;
    std::optional<uint32_t> m_injectedBuffered;
    Picture::Token m_token = 0;

    // Platform thread.
    std::unique_ptr<MediaPipeline> m_pipeline;
    uint64_t m_pipelineSession = 0; // the session of the pipeline; 0: none
    Item m_item;
    bool m_isReadingProgress = false; // a timer is running
    TELIX_AV_CB_MSG m_lastMessage = kSeparatorMessage;
};

} // namespace desktop

#endif
