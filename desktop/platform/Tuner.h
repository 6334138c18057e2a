// Presents one service: a pipeline from packets to picture and sound, made anew for each tune.
#ifndef TELIX_DESKTOP_TUNER_H
#define TELIX_DESKTOP_TUNER_H

#include "desktop/platform/Picture.h"
#include "desktop/platform/TsTables.h"

#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <string>

namespace desktop {

// Platform thread, unless said otherwise.
class Tuner {
public:
    struct Listener {
        std::function<void(const std::string& reason)> failed; // platform thread; several times at worst
        std::function<void()> heard; // the first sound is decoded; GStreamer's thread
        std::function<void(uint16_t pid, uint32_t channels)> audioFormat; // GStreamer's thread
    };

    Tuner(uint16_t serviceId, Listener listener);
    ~Tuner();
    Tuner(const Tuner&) = delete;
    Tuner& operator=(const Tuner&) = delete;

    // Starts to present as `token`. False with the reason if that is impossible.
    bool start(Picture& picture, Picture::Token token, std::string& error);

    // Takes packets of the service and its tables. Any thread, also while the tuner ends and later.
    std::function<void(const Bytes& packets)> feed() const;

    // What is presented; it may be chosen before the stream shows up. None is silence, no picture, no
    // subtitles.
    void selectVideo(bool on);
    void selectAudio(std::optional<uint16_t> pid);
    void selectSubtitle(std::optional<uint16_t> pid);

    // The PID of the audio that is heard, as the pipeline has it.
    std::optional<uint16_t> heardAudio() const;

private:
    static void onPadAdded(GstElement* demultiplexer, GstPad* pad, gpointer tuner);
    static gboolean onMessage(GstBus* bus, GstMessage* message, gpointer tuner);
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
    GstElement* m_pipeline = nullptr;
    GstElement* m_source = nullptr; // these belong to the pipeline
    GstElement* m_overlay = nullptr;
    GstElement* m_gate = nullptr;
    GstElement* m_volume = nullptr;
    GstElement* m_audioSelector = nullptr;
    GstElement* m_subtitleSelector = nullptr;
    guint m_watch = 0;

    mutable std::mutex m_mutex; // for what follows: streams show up on GStreamer's threads
    bool m_hasVideo = false;
    bool m_videoOn = true;
    std::optional<uint16_t> m_audio;
    std::optional<uint16_t> m_subtitle;
    std::map<uint16_t, GstPad*> m_audioPads; // of the selectors, with a reference each
    std::map<uint16_t, GstPad*> m_subtitlePads;
};

} // namespace desktop

#endif
