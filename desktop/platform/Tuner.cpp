// The pipeline of a tune.
#include "desktop/platform/Tuner.h"

#include <gst/app/gstappsrc.h>

#include <algorithm>
#include <chrono>
#include <cstring>
#include <memory>

#include "desktop/platform/AudioSink.h"
#include "desktop/platform/OutputVolume.h"
#include "desktop/platform/Platform.h"
#include "desktop/platform/RecentPackets.h"
#include "desktop/platform/SoundTap.h"

namespace desktop {

namespace {

struct Decoder {
    const char* caps; // of the stream
    const char* elements;
};

const Decoder kVideoDecoders[] = {
    {"video/mpeg,mpegversion={1,2}", "mpegvideoparse ! avdec_mpeg2video"},
    {"video/x-h264", "h264parse ! avdec_h264"},
    {"video/x-h265", "h265parse ! avdec_h265"},
};
const Decoder kAudioDecoders[] = {
    {"audio/mpeg,mpegversion=1", "mpegaudioparse ! mpg123audiodec"},
    {"audio/mpeg,mpegversion={2,4}", "aacparse ! avdec_aac"},
    {"audio/x-ac3", "ac3parse ! avdec_ac3"},
    {"audio/x-eac3", "ac3parse ! avdec_eac3"},
};

// Up to three seconds wait for the decoder, however many bytes and buffers that is.
const char* const kDecoderQueue = "queue max-size-time=3000000000 max-size-bytes=0 max-size-buffers=0 ! ";

constexpr guint64 kMaxWaiting = guint64{8} << 20; // bytes from the receiver that wait for the demultiplexer

GstClockTime toGstreamer(Clock::Duration duration) {
    return static_cast<GstClockTime>(std::chrono::nanoseconds(duration).count());
}

template <size_t Count>
const char* decoderFor(const GstCaps* caps, const Decoder (&decoders)[Count]) {
    for (const Decoder& decoder : decoders) {
        GstCaps* accepted = gst_caps_from_string(decoder.caps);
        const bool isMatch = gst_caps_can_intersect(caps, accepted) != FALSE;
        gst_caps_unref(accepted);
        if (isMatch) {
            return decoder.elements;
        }
    }
    return nullptr;
}

// Those of GStreamer that have the elements.
template <size_t Count>
void loadPlugins(const Decoder (&decoders)[Count]) {
    for (const Decoder& decoder : decoders) {
        gchar** names = g_strsplit(decoder.elements, " ! ", -1);
        for (gchar** name = names; *name; ++name) {
            GstElementFactory* factory = gst_element_factory_find(*name);
            GstPluginFeature* loaded =
                factory ? gst_plugin_feature_load(GST_PLUGIN_FEATURE(factory)) : nullptr;
            g_clear_object(&loaded);
            g_clear_object(&factory);
        }
        g_strfreev(names);
    }
}

// tsdemux names pads after type, generation and PID, as in audio_0_0111.
uint16_t pidOfPad(GstPad* pad) {
    const char* separator = std::strrchr(GST_PAD_NAME(pad), '_');
    return static_cast<uint16_t>(separator ? std::strtoul(separator + 1, nullptr, 16) : 0);
}

// What the probe after an audio decoder reports to.
struct AudioProbe {
    std::function<void()> onFirstAudio;
    std::function<void(uint16_t pid, uint32_t channels)> onAudioFormat;
    uint16_t pid;
};

GstPadProbeReturn probeAudio(GstPad* pad, GstPadProbeInfo* info, gpointer data) {
    (void)pad;
    const auto* probe = static_cast<AudioProbe*>(data);
    if ((GST_PAD_PROBE_INFO_TYPE(info) & GST_PAD_PROBE_TYPE_BUFFER) != 0) {
        probe->onFirstAudio();
        return GST_PAD_PROBE_REMOVE;
    }
    GstEvent* event = GST_PAD_PROBE_INFO_EVENT(info);
    if (GST_EVENT_TYPE(event) == GST_EVENT_CAPS) {
        GstCaps* caps = nullptr;
        gst_event_parse_caps(event, &caps);
        gint channels = 0;
        if (gst_structure_get_int(gst_caps_get_structure(caps, 0), "channels", &channels)) {
            probe->onAudioFormat(probe->pid, static_cast<uint32_t>(channels));
        }
    }
    return GST_PAD_PROBE_OK;
}

} // namespace

Tuner::Tuner(uint16_t serviceId, Listener listener)
    : m_serviceId(serviceId), m_listener(std::move(listener)) {}

void Tuner::loadDecoders() {
    loadPlugins(kVideoDecoders);
    loadPlugins(kAudioDecoders);
}

bool Tuner::start(Picture& picture, Picture::Token token, Clock::Duration age, std::string& error) {
    m_pipeline = gst_pipeline_new("tuner");
    if (!addElements(picture, token)) {
        error = "a GStreamer element is missing";
        return false;
    }
    configureElements();
    linkElements();
    g_signal_connect(m_demultiplexer, "pad-added", G_CALLBACK(onPadAdded), this);
    GstBus* bus = gst_element_get_bus(m_pipeline);
    m_watch = gst_bus_add_watch(bus, onMessage, this);
    gst_object_unref(bus);
    // Running time begins `age` ago: what arrived since then is late, and presented at once.
    const bool isPaused = gst_element_set_state(m_pipeline, GST_STATE_PAUSED) != GST_STATE_CHANGE_FAILURE;
    gst_element_set_start_time(m_pipeline, toGstreamer(age));
    if (!isPaused || gst_element_set_state(m_pipeline, GST_STATE_PLAYING) == GST_STATE_CHANGE_FAILURE) {
        error = "the pipeline does not start";
        return false;
    }
    return true;
}

bool Tuner::addElements(Picture& picture, Picture::Token token) {
    m_source = gst_element_factory_make("appsrc", nullptr);
    m_demultiplexer = gst_element_factory_make("tsdemux", nullptr);
    m_overlay = gst_element_factory_make("dvbsuboverlay", nullptr);
    m_videoValve = gst_element_factory_make("valve", nullptr);
    m_videoSink = picture.makeSink(token);
    m_audioSelector = gst_element_factory_make("input-selector", nullptr);
    m_subtitleSelector = gst_element_factory_make("input-selector", nullptr);
    m_volume = gst_element_factory_make("volume", nullptr);
    m_convert = gst_element_factory_make("audioconvert", nullptr);
    m_resample = gst_element_factory_make("audioresample", nullptr);
    m_audioSink = makeAudioSink();
    bool isComplete = true;
    for (GstElement* element :
         {m_source, m_demultiplexer, m_overlay, m_videoValve, m_videoSink, m_audioSelector,
          m_subtitleSelector, m_volume, m_convert, m_resample, m_audioSink}) {
        if (element) {
            gst_bin_add(GST_BIN(m_pipeline), element); // the pipeline owns it
        }
        isComplete = isComplete && element;
    }
    return isComplete;
}

void Tuner::configureElements() {
    GstElement* videoSink = gst_bin_get_by_name(GST_BIN(m_videoSink), Picture::kSinkName);
    m_videoTiming.observe(videoSink);
    gst_object_unref(videoSink); // the bin owns it
    m_audioTiming.observe(m_audioSink);
    tapSound(m_audioSink);
    OutputVolume::instance().apply(m_volume, 1);
    GstCaps* caps = gst_caps_from_string("video/mpegts,systemstream=(boolean)true,packetsize=(int)188");
    g_object_set(m_source, "caps", caps, "format", GST_FORMAT_TIME, "is-live", TRUE, "max-bytes",
                 guint64{kMaxRecentPackets + kMaxWaiting}, nullptr);
    gst_caps_unref(caps);
    gst_util_set_object_arg(G_OBJECT(m_source), "leaky-type", "downstream");
    g_object_set(m_demultiplexer, "program-number", static_cast<gint>(m_serviceId), "latency", 50, nullptr);
    g_object_set(m_overlay, "enable", FALSE, nullptr);
    for (GstElement* selector : {m_audioSelector, m_subtitleSelector}) {
        g_object_set(selector, "sync-streams", FALSE, nullptr); // streams must not wait for each other
    }
}

void Tuner::linkElements() {
    gst_element_link(m_source, m_demultiplexer);
    gst_element_link_many(m_videoValve, m_videoSink, nullptr);
    gst_element_link_pads(m_overlay, "src", m_videoValve, "sink");
    gst_element_link_pads(m_subtitleSelector, "src", m_overlay, "text_sink");
    gst_element_link_many(m_audioSelector, m_volume, m_convert, m_resample, m_audioSink, nullptr);
}

Tuner::~Tuner() {
    OutputVolume::instance().remove(m_volume);
    if (m_watch != 0) {
        if (GSource* source = g_main_context_find_source_by_id(Platform::instance().context(), m_watch)) {
            g_source_destroy(source);
        }
    }
    if (m_pipeline) {
        GstBus* bus = gst_element_get_bus(m_pipeline);
        gst_bus_set_flushing(bus, TRUE);
        gst_object_unref(bus);
        gst_element_set_state(m_pipeline, GST_STATE_NULL);
    }
    for (const auto* pads : {&m_audioPads, &m_subtitlePads}) {
        for (const auto& [pid, pad] : *pads) {
            gst_object_unref(pad);
        }
    }
    if (m_pipeline) {
        gst_object_unref(m_pipeline);
    }
}

std::function<void(const Bytes& packets, Clock::Duration age)> Tuner::feed() const {
    const std::shared_ptr<GstElement> source(GST_ELEMENT(gst_object_ref(m_source)), gst_object_unref);
    return [source](const Bytes& packets, Clock::Duration age) {
        GstBuffer* buffer = gst_buffer_new_memdup(packets.data(), packets.size());
        const GstClockTime now = gst_element_get_current_running_time(source.get());
        if (GST_CLOCK_TIME_IS_VALID(now)) {
            GST_BUFFER_DTS(buffer) = now - std::min(now, toGstreamer(age));
        }
        gst_app_src_push_buffer(GST_APP_SRC(source.get()), buffer);
    };
}

gboolean Tuner::onMessage(GstBus* bus, GstMessage* message, gpointer tuner) {
    (void)bus;
    if (GST_MESSAGE_TYPE(message) == GST_MESSAGE_ERROR) {
        GError* error = nullptr;
        gst_message_parse_error(message, &error, nullptr);
        const std::string reason = error->message;
        g_error_free(error);
        static_cast<Tuner*>(tuner)->m_listener.onError(reason);
    }
    return TRUE;
}

void Tuner::onPadAdded(GstElement* demultiplexer, GstPad* pad, gpointer tuner) {
    (void)demultiplexer;
    static_cast<Tuner*>(tuner)->addStream(pad);
}

void Tuner::addStream(GstPad* pad) {
    GstCaps* caps = gst_pad_get_current_caps(pad);
    if (!caps) {
        caps = gst_pad_query_caps(pad, nullptr);
    }
    const char* video = decoderFor(caps, kVideoDecoders);
    const char* audio = decoderFor(caps, kAudioDecoders);
    const bool isSubtitle =
        gst_structure_has_name(gst_caps_get_structure(caps, 0), "subpicture/x-dvb") != FALSE;
    gst_caps_unref(caps);
    const uint16_t pid = pidOfPad(pad);
    bool isLinked = false;
    if (video && !m_hasVideo) {
        isLinked = m_hasVideo = addVideo(pad, video);
    } else if (audio) {
        isLinked = addAudio(pad, audio, pid);
    } else if (isSubtitle) {
        isLinked = addSubtitle(pad, pid);
    }
    if (!isLinked) {
        ignore(pad);
    }
    applySelection();
}

// The part of the pipeline after a pad; null if an element is missing.
GstElement* Tuner::addBin(const std::string& description) {
    GError* error = nullptr;
    GstElement* bin = gst_parse_bin_from_description(description.c_str(), TRUE, &error);
    g_clear_error(&error);
    if (bin) {
        gst_bin_add(GST_BIN(m_pipeline), bin);
    }
    return bin;
}

void Tuner::ignore(GstPad* pad) {
    GstElement* sink = gst_element_factory_make("fakesink", nullptr);
    g_object_set(sink, "sync", FALSE, "async", FALSE, nullptr);
    gst_bin_add(GST_BIN(m_pipeline), sink);
    gst_element_sync_state_with_parent(sink);
    GstPad* sinkPad = gst_element_get_static_pad(sink, "sink");
    gst_pad_link(pad, sinkPad);
    gst_object_unref(sinkPad);
}

namespace {

bool linkPad(GstPad* pad, GstElement* bin) {
    gst_element_sync_state_with_parent(bin);
    GstPad* sinkPad = gst_element_get_static_pad(bin, "sink");
    const bool isLinked = gst_pad_link(pad, sinkPad) == GST_PAD_LINK_OK;
    gst_object_unref(sinkPad);
    return isLinked;
}

} // namespace

bool Tuner::addVideo(GstPad* pad, const std::string& decoder) {
    GstElement* bin = addBin(std::string(kDecoderQueue) + decoder + " ! videoconvert");
    return bin && gst_element_link_pads(bin, "src", m_overlay, "video_sink") && linkPad(pad, bin);
}

// A new sink pad of a selector, linked to the bin. The caller owns the reference.
GstPad* Tuner::addToSelector(GstElement* selector, GstElement* bin) {
    GstPad* input = gst_element_request_pad_simple(selector, "sink_%u");
    GstPad* output = gst_element_get_static_pad(bin, "src");
    gst_pad_link(output, input);
    gst_object_unref(output);
    return input;
}

bool Tuner::addAudio(GstPad* pad, const std::string& decoder, uint16_t pid) {
    GstElement* bin = addBin(std::string(kDecoderQueue) + decoder + " ! audioconvert");
    if (!bin) {
        return false;
    }
    GstPad* output = gst_element_get_static_pad(bin, "src");
    gst_pad_add_probe(
        output, static_cast<GstPadProbeType>(GST_PAD_PROBE_TYPE_BUFFER | GST_PAD_PROBE_TYPE_EVENT_DOWNSTREAM),
        probeAudio, new AudioProbe{m_listener.onFirstAudio, m_listener.onAudioFormat, pid},
        [](gpointer data) { delete static_cast<AudioProbe*>(data); });
    gst_object_unref(output);
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_audioPads[pid] = addToSelector(m_audioSelector, bin);
    }
    applySelection();
    return linkPad(pad, bin);
}

bool Tuner::addSubtitle(GstPad* pad, uint16_t pid) {
    GstElement* bin = addBin("queue max-size-time=0 max-size-buffers=0");
    if (!bin) {
        return false;
    }
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_subtitlePads[pid] = addToSelector(m_subtitleSelector, bin);
    }
    applySelection();
    return linkPad(pad, bin);
}

void Tuner::selectVideo(bool on) {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_videoOn = on;
    }
    applySelection();
}

void Tuner::selectAudio(std::optional<uint16_t> pid) {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_audio = pid;
    }
    applySelection();
}

void Tuner::selectSubtitle(std::optional<uint16_t> pid) {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_subtitle = pid;
    }
    applySelection();
}

std::optional<uint16_t> Tuner::activeAudioPid() const {
    std::lock_guard<std::mutex> lock(m_mutex);
    gboolean isMute = FALSE;
    GstPad* active = nullptr;
    g_object_get(m_volume, "mute", &isMute, nullptr);
    g_object_get(m_audioSelector, "active-pad", &active, nullptr);
    std::optional<uint16_t> pid;
    for (const auto& [padPid, pad] : m_audioPads) {
        if (pad == active && !isMute) {
            pid = padPid;
        }
    }
    if (active) {
        gst_object_unref(active);
    }
    return pid;
}

void Tuner::applySelection() {
    std::lock_guard<std::mutex> lock(m_mutex);
    if (!m_pipeline) {
        return;
    }
    const auto audio = m_audio ? m_audioPads.find(*m_audio) : m_audioPads.end();
    if (audio != m_audioPads.end()) {
        g_object_set(m_audioSelector, "active-pad", audio->second, nullptr);
    }
    g_object_set(m_volume, "mute", m_audio ? FALSE : TRUE, nullptr);
    const auto subtitle = m_subtitle ? m_subtitlePads.find(*m_subtitle) : m_subtitlePads.end();
    if (subtitle != m_subtitlePads.end()) {
        g_object_set(m_subtitleSelector, "active-pad", subtitle->second, nullptr);
    }
    g_object_set(m_overlay, "enable", subtitle != m_subtitlePads.end() ? TRUE : FALSE, nullptr);
    g_object_set(m_videoValve, "drop", m_videoOn ? FALSE : TRUE, nullptr);
}

} // namespace desktop
