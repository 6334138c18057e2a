// Presents one service: a pipeline from packets to picture and sound. Each tune has one of its own.
#ifndef TELIX_DESKTOP_PLATFORM_TUNER_H
#define TELIX_DESKTOP_PLATFORM_TUNER_H

#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <string>

#include "desktop/platform/Clock.h"
#include "desktop/platform/Picture.h"
#include "desktop/platform/SinkTiming.h"
#include "desktop/platform/TsTables.h"

namespace desktop {

// Platform thread, unless said otherwise.
class Tuner {
public:
    struct Listener {
        std::function<void(const std::string& reason)> onError; // platform thread; may come several times
        std::function<void()> onFirstAudio; // of each stream, once it is decoded; GStreamer's thread
        std::function<void(uint16_t pid, uint32_t channels)> onAudioFormat; // GStreamer's thread
    };

    // Loads the decoders, whose libraries take a large part of the time to the first picture, if a tune has
    // not yet. Any thread.
    static void loadDecoders();

    Tuner(uint16_t serviceId, Listener listener);
    // The listener is not called any more when this returns.
    ~Tuner();
    Tuner(const Tuner&) = delete;
    Tuner& operator=(const Tuner&) = delete;

    // Starts to present as `token` what has arrived up to `age` ago, as if it had been started then. False
    // with the reason in `error` if that is impossible. Once.
    bool start(Picture& picture, Picture::Token token, Clock::Duration age, std::string& error);

    // A function that takes the packets of the service and its tables, and how long ago they arrived. It may
    // be called on any thread, also during the tuner's teardown and later. After start().
    std::function<void(const Bytes& packets, Clock::Duration age)> feed() const;

    // What is presented; a stream may be selected before the demultiplexer finds it. Nothing is silence, no
    // video, no subtitles.
    void selectVideo(bool on);
    void selectAudio(std::optional<uint16_t> pid);
    void selectSubtitle(std::optional<uint16_t> pid);

    // The PID of the audio that the pipeline lets through; nothing if it is muted.
    std::optional<uint16_t> activeAudioPid() const;

    // How late picture and sound are.
    const SinkTiming& videoTiming() const { return m_videoTiming; }
    const SinkTiming& audioTiming() const { return m_audioTiming; }

private:
    static void onPadAdded(GstElement* demultiplexer, GstPad* pad, gpointer tuner);
    static gboolean onMessage(GstBus* bus, GstMessage* message, gpointer tuner);
    bool addElements(Picture& picture, Picture::Token token);
    void configureElements();
    void linkElements();
    void addStream(GstPad* pad);
    bool addVideo(GstPad* pad, const std::string& decoder);
    bool addAudio(GstPad* pad, const std::string& decoder, uint16_t pid);
    bool addSubtitle(GstPad* pad, uint16_t pid);
    void ignore(GstPad* pad);
    GstElement* addBin(const std::string& description);
    GstPad* addToSelector(GstElement* selector, GstElement* bin);
    void applySelection();

    uint16_t m_serviceId;
    Listener m_listener;
    SinkTiming m_videoTiming{SinkTiming::LateStart::Present};
    SinkTiming m_audioTiming{SinkTiming::LateStart::Drop};
    GstElement* m_pipeline = nullptr;
    // Owned by the pipeline, which is not changed after start() but for the streams' bins.
    GstElement* m_source = nullptr;
    GstElement* m_demultiplexer = nullptr;
    GstElement* m_overlay = nullptr; // draws the subtitles
    GstElement* m_videoValve = nullptr;
    GstElement* m_videoSink = nullptr;
    GstElement* m_audioSelector = nullptr;
    GstElement* m_volume = nullptr;
    GstElement* m_convert = nullptr;
    GstElement* m_resample = nullptr;
    GstElement* m_audioSink = nullptr;
    GstElement* m_subtitleSelector = nullptr;
    guint m_watch = 0;

    bool m_hasVideo = false; // used by the demultiplexer's thread alone

    mutable std::mutex m_mutex; // guards what follows: streams appear on GStreamer's threads
    bool m_videoOn = true;
    std::optional<uint16_t> m_audio;
    std::optional<uint16_t> m_subtitle;
    std::map<uint16_t, GstPad*> m_audioPads; // sink pads of the selectors by PID, one reference each
    std::map<uint16_t, GstPad*> m_subtitlePads;
};

} // namespace desktop

#endif
