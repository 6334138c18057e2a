// Plays one piece of media: a pipeline from its address to picture and sound, made anew for each.
#ifndef TELIX_DESKTOP_PLATFORM_MEDIAPIPELINE_H
#define TELIX_DESKTOP_PLATFORM_MEDIAPIPELINE_H

#include "desktop/platform/ComponentTraits.h"
#include "desktop/platform/Picture.h"

#include <array>
#include <atomic>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace desktop {

// Of play-info: how much media is held ahead is not known, or does not matter.
constexpr uint32_t noBufferReport = 0xFFFFFFFF;

// Platform thread, unless said otherwise.
class MediaPipeline {
public:
    // One video, audio or subtitle stream. Streams of a kind are numbered from 0.
    // What needs a key cannot be played, and files do not tell what their sound is for, so no flag is set.
    struct Stream : ComponentTraits {
        int number = 0;
    };

    // What is known of the media as soon as it could be presented.
    struct Media {
        std::vector<Stream> streams;
        bool canSeek = false;
        bool canSeekAhead = false; // also beyond what is held: the server gives any part
        bool canReverse = false;   // what has been played is still there
    };

    // Called on the platform thread, inside of the player's own work: do not end the player in them.
    struct Listener {
        std::function<void(const Media& media)> known; // once, before `began`
        std::function<void()> began;                   // once, when presentation begins
        std::function<void(bool isHeld)> buffering;    // presentation waits for media, or goes on
        std::function<void()> ended;                   // at each end, also that of a repetition
        std::function<void(TELIX_AV_CB_MSG message, const std::string& reason)>
            failed; // once, nothing follows
    };

    // How it begins.
    struct Setup {
        std::string url;
        double speed = 1;
        uint32_t volume = 100;            // 0 to 100
        std::optional<uint32_t> position; // milliseconds
        bool isPaused = false;
    };

    struct Progress {
        uint32_t position = 0;              // milliseconds
        uint32_t duration = 0;              // milliseconds; 0 as long as it is not known
        uint32_t bufferedEnd = 0;           // seconds from the start of the media
        uint32_t buffered = noBufferReport; // seconds ahead of the position
    };

    // What the pipeline lets through.
    struct Sound {
        int audio = -1; // number of the stream; -1: none
        double volume = 0;
        bool isMuted = false;
    };

    explicit MediaPipeline(Listener listener);
    // Nothing is seen or heard of it any more.
    ~MediaPipeline();
    MediaPipeline(const MediaPipeline&) = delete;
    MediaPipeline& operator=(const MediaPipeline&) = delete;

    // Starts to present as `token`. False with the reason if that is impossible; otherwise the outcome goes
    // to the listener.
    bool start(Picture& picture, Picture::Token token, const Setup& setup, std::string& error);

    // What comes while a seek is at work waits for its end; of several seeks the last one counts. False if
    // the media turns out to refuse it.
    bool seek(uint32_t milliseconds);
    // Backward is negative; never 0.
    bool setSpeed(double speed);
    double speed() const { return m_speed; }
    // Plays from the start once more. False if the media cannot be wound back.
    bool repeat();

    void setPaused(bool isPaused);
    void setVolume(uint32_t volume);
    void selectAudio(std::optional<int> number);
    void selectSubtitle(std::optional<int> number);

    // True while the position is on its way to the goal of a seek.
    bool isSeeking() const { return m_isSeeking || !m_isReady; }
    Progress progress();
    Sound sound() const;

private:
    // What GStreamer's threads share. It may outlive the player.
    struct Shared {
        std::atomic<bool> showsSubtitle{false};
        std::atomic<bool> hasData{false}; // the source has given something
    };

    using SharedPointer = std::shared_ptr<Shared>;

    static gboolean onMessage(GstBus* bus, GstMessage* message, gpointer player);
    static void onSource(GstElement* playbin, GstElement* source, gpointer shared);
    static void onElement(GstElement* playbin, GstElement* element, gpointer shared);
    static void onStore(GObject* store, GParamSpec* property, gpointer data);
    bool isAsking() const;
    void handle(GstMessage* message);
    void handleError(GstMessage* message);
    TELIX_AV_CB_MSG kindOf(GstMessage* message, const GError& error) const;
    void takeBuffering(int percent);
    void settle();
    void becomeKnown();
    bool applySeek(double speed, uint32_t milliseconds);
    void applyState();
    void applySound();
    void applySubtitle();
    bool usesStore() const;
    bool canReach(uint32_t milliseconds);
    void readHeaders(const GstStructure* headers);
    void readBuffering(Progress& progress);

    Listener m_listener;
    GstElement* m_pipeline = nullptr;
    bool m_isNetwork = false;
    bool m_isLive = false;
    bool m_isHttp = false;
    bool m_hasAnswer = false; // the server has answered, to the first request at least
    bool m_hasRanges = false; // the server gives any part
    bool m_hasStore = false;  // what has been fetched is kept
    bool m_hasFailed = false;
    bool m_isKnown = false;
    bool m_isReady = false; // at the place and speed where it is to begin
    bool m_hasBegun = false;
    bool m_isSeeking = false;
    bool m_isPaused = false; // by wish, not by want of media
    bool m_isHeld = false;   // by want of media
    bool m_hasSound = true;
    double m_speed = 1;
    double m_volume = 1;
    std::optional<uint32_t> m_goal;    // of a seek that waits
    std::optional<double> m_newSpeed;  // that waits
    GstState m_state = GST_STATE_NULL; // that was asked for
    uint32_t m_position = 0;
    uint32_t m_duration = 0;
    SharedPointer m_shared = std::make_shared<Shared>();
};

} // namespace desktop

#endif
