// Plays one piece of media: a playbin from its URL to the video plane and the audio sink. A new one is made
// for each piece. Its implementation has one file for each concern:
//   MediaPipeline.cpp         creation, bus messages, state
//   MediaPipelineSeek.cpp     seeks and speeds
//   MediaPipelineStreams.cpp  streams and their selection, audio
//   MediaPipelineProgress.cpp position, duration, buffering, inspection
//   MediaPipelineErrors.cpp   what a GStreamer error means to the plug-in
//   HttpSource.h              the source of media at http and https URLs
//
// Everything runs on the platform thread but for the callbacks from GStreamer's threads, which touch only
// what is in Shared.
#ifndef TELIX_DESKTOP_PLATFORM_MEDIAPIPELINE_H
#define TELIX_DESKTOP_PLATFORM_MEDIAPIPELINE_H

#include <gst/gst.h>

#include <atomic>
#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "desktop/platform/ComponentTraits.h"
#include "desktop/platform/Picture.h"

namespace desktop {

// `buffered` of the play info if it is not known how far ahead media is buffered, or if that does not matter.
constexpr uint32_t kNoBufferReport = 0xFFFFFFFF;

class MediaPipeline {
public:
    // A video, audio or subtitle stream. Media that needs a key cannot be played, and files do not say what
    // their audio is for, so no flag of ComponentTraits is ever set.
    struct Stream : ComponentTraits {
        int number = 0; // among the streams of its type, from 0
    };

    // What is known of the media after preroll.
    struct Media {
        std::vector<Stream> streams;
        bool canSeek = false;
        bool canSeekBeyondBuffer = false; // the server accepts byte ranges, or there is no server
        bool canPlayBackward = false;     // what has been played is still there
    };

    // Runs on the platform thread, inside a function of the pipeline: must not delete the pipeline.
    struct Listener {
        std::function<void(const Media& media)> onPrerolled; // once, before onStarted
        std::function<void()> onStarted;                     // once, when playback starts
        std::function<void(bool isBuffering)> onBuffering;   // playback stalls for data, or goes on
        std::function<void()> onEos;                         // at each end, also before repeat()
        std::function<void(TELIX_AV_CB_MSG message, const std::string& reason)>
            onError; // once, nothing follows
    };

    struct Setup {
        std::string url;
        double speed = 1;
        uint32_t volume = 100;            // 0 to 100
        std::optional<uint32_t> position; // milliseconds; default: the start
        bool isPaused = false;
    };

    struct Progress {
        uint32_t position = 0;               // milliseconds
        uint32_t duration = 0;               // milliseconds; 0 until it is known
        uint32_t bufferedEnd = 0;            // seconds from the start of the media
        uint32_t buffered = kNoBufferReport; // seconds from the position
    };

    // What GStreamer plays at the moment, as it reports itself; for tests.
    struct Output {
        GstState state = GST_STATE_NULL; // VOID_PENDING during a change of state or a seek
        double rate = 1;                 // of the segment at the sinks
        int audioStream = -1;            // its number; -1: none
        double volume = 0;
        bool isMuted = false;
    };

    explicit MediaPipeline(Listener listener);

    // Nothing is seen or heard of the media any more when this returns.
    ~MediaPipeline();

    MediaPipeline(const MediaPipeline&) = delete;
    MediaPipeline& operator=(const MediaPipeline&) = delete;

    // Starts to play, with the video presented as `token`. Called once. False with the reason if that is
    // impossible; otherwise the listener hears how it goes on.
    bool start(Picture& picture, Picture::Token token, const Setup& setup, std::string& error);

    // A request during a seek stays pending until that has ended; only the last pending one is carried out.
    // False if the media refuses at once.
    bool seek(uint32_t milliseconds);

    // Negative speeds play backward; never 0. Otherwise as seek().
    bool setSpeed(double speed);
    double speed() const { return m_speed; }

    // Plays again from the start. False if the media cannot seek.
    bool repeat();

    void setPaused(bool isPaused);
    void setVolume(uint32_t volume); // 0 to 100

    // Nothing selects no stream.
    void selectAudio(std::optional<int> stream);
    void selectSubtitle(std::optional<int> stream);

    Progress progress();
    Output output() const;

private:
    enum class State {
        Null,        // start() has not been called
        Prerolling,  // connects, and decodes the first data of each stream
        InitialSeek, // has prerolled, and moves to the position and speed where playback starts
        Prerolled,   // is there; playback starts unless it is paused or buffering
        Started,     // playback has started; it may be paused, buffering or seeking
        Failed,      // an error has been reported; the messages after it are consequences
    };

    // What the URL and the responses tell of the source.
    struct Source {
        bool isNetwork = false;
        bool isLive = false;            // does not preroll, and does not wait for data
        bool acceptsByteRanges = false; // of HTTP
        bool hasDownloadBuffer = false; // what has been received is kept in a file
    };

    // Requests that wait for preroll or for the end of the seek in progress.
    struct PendingSeek {
        std::optional<uint32_t> position;
        std::optional<double> speed;
    };

    // What GStreamer's threads use. It may outlive the pipeline.
    struct Shared {
        std::atomic<bool> showsSubtitle{false};
        std::atomic<bool> hasData{false}; // the source has produced a buffer
    };

    using SharedPointer = std::shared_ptr<Shared>;

    static constexpr GstClockTime kBufferDuration = 2 * GST_SECOND; // buffered before playback goes on

    static constexpr const char* kSubtitleElement = "subtitleoverlay"; // draws subtitles into the video

    // MediaPipeline.cpp
    static gboolean onMessage(GstBus* bus, GstMessage* message, gpointer pipeline);
    static void onSourceSetup(GstElement* playbin, GstElement* source, gpointer shared);
    static void onElementSetup(GstElement* playbin, GstElement* element, gpointer shared);
    static void onDownloadFile(GObject* downloadBuffer, GParamSpec* property, gpointer data);
    bool createPlaybin(Picture& picture, Picture::Token token, std::string& error);
    void connectSignals();
    void changeState(State state);
    void handleMessage(GstMessage* message);
    void onStateChanged(GstMessage* message);
    void onBuffering(int percent);
    void onPrerolled();
    void settle();
    void applyTargetState();
    bool isAtStart() const;
    bool usesDownloadBuffer() const;

    // MediaPipelineSeek.cpp
    bool isSeeking() const;
    bool isBuffered(uint32_t milliseconds);
    bool isReachable(uint32_t milliseconds);
    bool sendSeek(double speed, uint32_t milliseconds);
    bool sendPendingSeek();

    // MediaPipelineStreams.cpp
    std::vector<Stream> readStreams() const;
    void applyAudio();
    void applySubtitle();

    // MediaPipelineProgress.cpp
    bool isPositionKnown() const;
    void readBufferedRanges(Progress& progress);
    void endStaleBuffering(const Progress& progress);

    // MediaPipelineErrors.cpp
    void onError(GstMessage* message);
    TELIX_AV_CB_MSG classifyError(GstMessage* message, const GError& error) const;

    Listener m_listener;
    GstElement* m_playbin = nullptr;
    GstElement* m_volumeFilter = nullptr; // of playbin
    State m_state = State::Null;
    Source m_source;
    PendingSeek m_pendingSeek;
    bool m_isSeeking = false;                                  // a flushing seek is in progress
    bool m_isPaused = false;                                   // by the user, not for buffering
    bool m_isBuffering = false;                                // paused until enough data is there
    std::chrono::steady_clock::time_point m_bufferingReported; // when the level was reported last
    bool m_hasVideo = false;                                   // after preroll
    bool m_isAudioSelected = true;
    double m_speed = 1;
    double m_volume = 1;                     // 0 to 1
    GstState m_targetState = GST_STATE_NULL; // the last one that was set
    uint32_t m_position = 0;                 // milliseconds, as last read or requested
    uint32_t m_duration = 0;                 // milliseconds
    SharedPointer m_shared = std::make_shared<Shared>();
};

} // namespace desktop

#endif
