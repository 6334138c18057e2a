// Creation of the playbin, its bus messages, and the state that follows from them.
#include "desktop/platform/MediaPipeline.h"

#include <unistd.h>

#include <algorithm>
#include <cassert>
#include <cstring>
#include <utility>

#include "desktop/platform/AudioSink.h"
#include "desktop/platform/HttpSource.h"
#include "desktop/platform/OutputVolume.h"
#include "desktop/platform/SoundTap.h"

namespace desktop {

namespace {

// "download" keeps what comes from a network in a temporary file: only then does playbin report what is
// buffered, and only then can such media be played backward.
// Without "soft-volume": the element that playbin makes for it is never freed (GStreamer 1.22).
constexpr const char* kPlaybinFlags = "video+audio+text+download";

constexpr const char* kDownloadBufferElement = "downloadbuffer";

void dropElement(GstElement* element) {
    if (element) {
        gst_object_unref(gst_object_ref_sink(element));
    }
}

} // namespace

MediaPipeline::MediaPipeline(Listener listener) : m_listener(std::move(listener)) {}

MediaPipeline::~MediaPipeline() {
    if (m_volumeFilter) {
        OutputVolume::instance().remove(m_volumeFilter);
        gst_object_unref(m_volumeFilter);
    }
    if (!m_playbin) {
        return;
    }
    GstBus* bus = gst_element_get_bus(m_playbin);
    gst_bus_remove_watch(bus);
    gst_bus_set_flushing(bus, TRUE);
    gst_object_unref(bus);
    gst_element_set_state(m_playbin, GST_STATE_NULL);
    gst_object_unref(m_playbin);
}

// ---- Creation

bool MediaPipeline::start(Picture& picture, Picture::Token token, const Setup& setup, std::string& error) {
    if (!createPlaybin(picture, token, error)) {
        return false;
    }
    const gchar* scheme = g_uri_peek_scheme(setup.url.c_str());
    m_source.isNetwork = scheme && std::strcmp(scheme, "file") != 0;
    m_isPaused = setup.isPaused;
    m_pendingSeek.position = setup.position;
    if (setup.speed != 1) {
        m_pendingSeek.speed = setup.speed;
    }
    m_volume = setup.volume / 100.0;
    g_object_set(m_playbin, "uri", setup.url.c_str(), nullptr);
    connectSignals();
    applyAudio();

    changeState(State::Prerolling);
    m_targetState = GST_STATE_PAUSED;
    const GstStateChangeReturn result = gst_element_set_state(m_playbin, m_targetState);
    m_source.isLive = result == GST_STATE_CHANGE_NO_PREROLL;
    if (m_source.isLive) {
        settle();
    }
    return true; // a failure is on the bus, with its reason
}

bool MediaPipeline::createPlaybin(Picture& picture, Picture::Token token, std::string& error) {
    m_playbin = gst_element_factory_make("playbin", nullptr);
    GstElement* videoSink = picture.makeSink(token);
    GstElement* audioSink = makeAudioSink();
    m_volumeFilter = gst_element_factory_make("volume", nullptr);
    for (GstElement* kept : {m_playbin, m_volumeFilter}) {
        if (kept) {
            gst_object_ref_sink(kept); // until the teardown
        }
    }
    if (!m_playbin || !videoSink || !audioSink || !m_volumeFilter) {
        dropElement(videoSink);
        dropElement(audioSink);
        error = "a GStreamer element is missing";
        return false;
    }
    tapSound(audioSink);
    gst_util_set_object_arg(G_OBJECT(m_playbin), "flags", kPlaybinFlags);
    g_object_set(m_playbin, "video-sink", videoSink, "audio-sink", audioSink, "audio-filter", m_volumeFilter,
                 "buffer-duration", static_cast<gint64>(kBufferDuration), nullptr);
    return true;
}

void MediaPipeline::connectSignals() {
    const auto release = [](gpointer shared, GClosure*) { delete static_cast<SharedPointer*>(shared); };
    g_signal_connect_data(m_playbin, "source-setup", G_CALLBACK(onSourceSetup), new SharedPointer(m_shared),
                          release, {});
    g_signal_connect_data(m_playbin, "element-setup", G_CALLBACK(onElementSetup), new SharedPointer(m_shared),
                          release, {});
    GstBus* bus = gst_element_get_bus(m_playbin);
    gst_bus_add_watch(bus, onMessage, this);
    gst_object_unref(bus);
}

// GStreamer's thread.
void MediaPipeline::onSourceSetup(GstElement* playbin, GstElement* source, gpointer shared) {
    (void)playbin;
    if (GstPad* pad = gst_element_get_static_pad(source, "src")) {
        gst_pad_add_probe(
            pad, GST_PAD_PROBE_TYPE_BUFFER,
            [](GstPad*, GstPadProbeInfo*, gpointer data) {
                (*static_cast<SharedPointer*>(data))->hasData = true;
                return GST_PAD_PROBE_REMOVE;
            },
            new SharedPointer(*static_cast<SharedPointer*>(shared)),
            [](gpointer data) { delete static_cast<SharedPointer*>(data); });
        gst_object_unref(pad);
    }
}

// GStreamer's threads.
void MediaPipeline::onElementSetup(GstElement* playbin, GstElement* element, gpointer shared) {
    (void)playbin;
    const GstElementFactory* factory = gst_element_get_factory(element);
    const gchar* name = factory ? GST_OBJECT_NAME(factory) : "";
    if (std::strcmp(name, kSubtitleElement) == 0) {
        g_object_set(element, "silent", (*static_cast<SharedPointer*>(shared))->showsSubtitle ? FALSE : TRUE,
                     nullptr);
    } else if (std::strcmp(name, kDownloadBufferElement) == 0) {
        g_signal_connect(element, "notify::temp-location", G_CALLBACK(onDownloadFile), nullptr);
    }
}

// The download buffer has opened its file. The name is removed at once, so that nothing is left on disk
// however the process ends.
void MediaPipeline::onDownloadFile(GObject* downloadBuffer, GParamSpec* property, gpointer data) {
    (void)property;
    (void)data;
    gchar* file = nullptr;
    g_object_get(downloadBuffer, "temp-location", &file, nullptr);
    if (file) {
        unlink(file);
    }
    g_free(file);
}

// ---- Bus messages

gboolean MediaPipeline::onMessage(GstBus* bus, GstMessage* message, gpointer pipeline) {
    (void)bus;
    static_cast<MediaPipeline*>(pipeline)->handleMessage(message);
    return TRUE;
}

void MediaPipeline::handleMessage(GstMessage* message) {
    if (m_state == State::Failed) {
        return;
    }
    switch (GST_MESSAGE_TYPE(message)) {
    case GST_MESSAGE_ERROR:
        onError(message);
        break;
    case GST_MESSAGE_EOS:
        m_listener.onEos();
        break;
    case GST_MESSAGE_BUFFERING: {
        gint percent = 100;
        gst_message_parse_buffering(message, &percent);
        onBuffering(percent);
        break;
    }
    case GST_MESSAGE_ASYNC_DONE:
        m_isSeeking = false;
        settle();
        break;
    case GST_MESSAGE_STATE_CHANGED:
        onStateChanged(message);
        break;
    case GST_MESSAGE_ELEMENT:
        if (const auto report = httpResponseReport(message)) {
            m_source.acceptsByteRanges = report->acceptsByteRanges;
        }
        break;
    case GST_MESSAGE_CLOCK_LOST:
        if (m_targetState == GST_STATE_PLAYING) { // PLAYING selects another clock
            gst_element_set_state(m_playbin, GST_STATE_PAUSED);
            gst_element_set_state(m_playbin, GST_STATE_PLAYING);
        }
        break;
    default:
        break;
    }
}

void MediaPipeline::onStateChanged(GstMessage* message) {
    GstState state = GST_STATE_NULL;
    gst_message_parse_state_changed(message, nullptr, &state, nullptr);
    if (GST_MESSAGE_SRC(message) == GST_OBJECT(m_playbin) && state == GST_STATE_PLAYING &&
        m_state != State::Started) {
        changeState(State::Started);
        m_listener.onStarted();
    }
}

void MediaPipeline::onBuffering(int percent) {
    const bool isBuffering = percent < 100 && !m_source.isLive;
    m_bufferingReported = std::chrono::steady_clock::now();
    if (isBuffering != m_isBuffering) {
        m_isBuffering = isBuffering;
        m_listener.onBuffering(isBuffering);
        applyTargetState();
    }
}

// ---- State

void MediaPipeline::changeState(State state) {
    switch (state) {
    case State::Null:
        assert(false);
        break;
    case State::Prerolling:
        assert(m_state == State::Null);
        break;
    case State::InitialSeek:
        assert(m_state == State::Prerolling);
        break;
    case State::Prerolled:
        assert(m_state == State::InitialSeek);
        break;
    case State::Started: // live media can start during the initial seek
        assert(m_state == State::Prerolled || (m_state == State::InitialSeek && m_source.isLive));
        break;
    case State::Failed:
        assert(m_state != State::Null && m_state != State::Failed);
        break;
    }
    m_state = state;
}

// Whether playback is at the position and speed where it starts, or has started there.
bool MediaPipeline::isAtStart() const {
    return m_state == State::Prerolled || m_state == State::Started;
}

// Goes on after preroll and after each seek.
void MediaPipeline::settle() {
    if (m_state == State::Prerolling) {
        changeState(State::InitialSeek);
        onPrerolled();
    }
    if (sendPendingSeek()) {
        return; // settles again when the seek has ended
    }
    if (m_state == State::InitialSeek) {
        changeState(State::Prerolled);
    }
    applyTargetState();
}

void MediaPipeline::onPrerolled() {
    Media media;
    media.streams = readStreams();
    m_hasVideo = std::any_of(media.streams.begin(), media.streams.end(),
                             [](const Stream& stream) { return stream.type == TELIX_JS_AVCOMPTYPE_VIDEO; });
    GstQuery* query = gst_query_new_seeking(GST_FORMAT_TIME);
    if (gst_element_query(m_playbin, query)) {
        gboolean canSeek = FALSE;
        gst_query_parse_seeking(query, nullptr, &canSeek, nullptr, nullptr);
        media.canSeek = canSeek != FALSE;
    }
    gst_query_unref(query);
    m_source.hasDownloadBuffer = usesDownloadBuffer();
    media.canSeekBeyondBuffer = media.canSeek && (!m_source.hasDownloadBuffer || m_source.acceptsByteRanges);
    media.canPlayBackward = media.canSeek && (!m_source.isNetwork || m_source.hasDownloadBuffer);
    m_listener.onPrerolled(media);
}

bool MediaPipeline::usesDownloadBuffer() const {
    GstIterator* elements =
        gst_bin_iterate_all_by_element_factory_name(GST_BIN(m_playbin), kDownloadBufferElement);
    GValue value = G_VALUE_INIT;
    const bool isUsed = gst_iterator_next(elements, &value) == GST_ITERATOR_OK;
    if (isUsed) {
        g_value_unset(&value);
    }
    gst_iterator_free(elements);
    return isUsed;
}

void MediaPipeline::applyTargetState() {
    if (isSeeking() && !m_source.isLive) {
        return; // nobody sees the media before it is at its position and speed
    }
    const GstState state = m_isPaused || m_isBuffering ? GST_STATE_PAUSED : GST_STATE_PLAYING;
    if (state != m_targetState) {
        m_targetState = state;
        gst_element_set_state(m_playbin, state);
    }
}

void MediaPipeline::setPaused(bool isPaused) {
    m_isPaused = isPaused;
    applyTargetState();
}

} // namespace desktop
