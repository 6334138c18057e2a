// The pipeline of a piece of media: its states, seeks, buffering and errors.
#include "desktop/platform/MediaPipeline.h"

#include "desktop/platform/AudioSink.h"

#include <algorithm>
#include <cstring>
#include <gst/audio/audio.h>
#include <gst/tag/tag.h>
#include <gst/video/video.h>
#include <unistd.h>

namespace desktop {

namespace {

// "download" keeps what has come from a network in a temporary file: it tells how much is held, and only so
// can such media be played backward.
const char* const playFlags = "video+audio+text+soft-volume+download";

const char* const storeElement = "downloadbuffer";
const char* const subtitleElement = "subtitleoverlay";

constexpr guint networkSilence = 10;           // seconds without data after which a connection counts as lost
constexpr gint64 bufferAhead = 2 * GST_SECOND; // media that is there before presentation begins

struct Encoding {
    const char* caps;
    const char* name;
};
const Encoding encodings[] = {
    {"video/x-h264", "AVC"},
    {"video/x-h265", "HEVC"},
    {"video/mpeg,mpegversion=1", "MPEG1"},
    {"video/mpeg,mpegversion=2", "MPEG2"},
    {"video/mpeg,mpegversion=4", "MPEG4"},
    {"audio/mpeg,mpegversion={2,4}", "HEAAC"},
    {"audio/mpeg,mpegversion=1,layer=3", "MPEG1_L3"},
    {"audio/mpeg,mpegversion=1", "MPEG1_L2"},
    {"audio/x-ac3", "AC3"},
    {"audio/x-eac3", "E_AC3"},
    {"audio/x-wav", "WAV"},
    {"subpicture/x-dvb", "DVB_SUB"},
    {"text/x-raw", "TEXT"},
};

std::string encodingOf(const GstCaps* caps) {
    for (const Encoding& encoding : encodings) {
        GstCaps* known = gst_caps_from_string(encoding.caps);
        const bool isMatch = gst_caps_can_intersect(caps, known) != FALSE;
        gst_caps_unref(known);
        if (isMatch) {
            return encoding.name;
        }
    }
    return "";
}

bool isDecoded(const GstCaps* caps) {
    const char* name = gst_structure_get_name(gst_caps_get_structure(caps, 0));
    return std::strcmp(name, "audio/x-raw") == 0 || std::strcmp(name, "video/x-raw") == 0;
}

// The pad from which `pad` gets its data; a reference, null at a source.
GstPad* padBefore(GstPad* pad) {
    if (GST_PAD_IS_SINK(pad)) {
        return gst_pad_get_peer(pad);
    }
    GstPad* before = nullptr;
    if (GstIterator* inputs = gst_pad_iterate_internal_links(pad)) {
        GValue value = G_VALUE_INIT;
        if (gst_iterator_next(inputs, &value) == GST_ITERATOR_OK) {
            before = GST_PAD(g_value_dup_object(&value));
            g_value_unset(&value);
        }
        gst_iterator_free(inputs);
    }
    return before;
}

// The name of what was decoded to come to `pad`.
std::string encodingBefore(GstPad* pad) {
    std::string name;
    auto* at = GST_PAD(gst_object_ref(pad));
    while (at && name.empty()) {
        if (GstCaps* caps = gst_pad_get_current_caps(at)) {
            if (!isDecoded(caps)) {
                name = encodingOf(caps);
            }
            gst_caps_unref(caps);
        }
        GstPad* before = padBefore(at);
        gst_object_unref(at);
        at = before;
    }
    if (at) {
        gst_object_unref(at);
    }
    return name;
}

std::string languageOf(const GstTagList* tags) {
    gchar* code = nullptr;
    if (!tags || !gst_tag_list_get_string(tags, GST_TAG_LANGUAGE_CODE, &code)) {
        return "";
    }
    // Of the two codes of three letters, broadcast and pages use that of the language's own name.
    const char* ofThree = gst_tag_get_language_code_iso_639_2T(code);
    std::string language = ofThree ? ofThree : "";
    g_free(code);
    return language;
}

struct StreamKind {
    TELIX_JS_AVCOMPTYPE type;
    const char* count; // property and signals of the element
    const char* tags;
    const char* pad;
};
const StreamKind streamKinds[] = {
    {TELIX_JS_AVCOMPTYPE_VIDEO, "n-video", "get-video-tags", "get-video-pad"},
    {TELIX_JS_AVCOMPTYPE_AUDIO, "n-audio", "get-audio-tags", "get-audio-pad"},
    {TELIX_JS_AVCOMPTYPE_SUBTITLE, "n-text", "get-text-tags", "get-text-pad"},
};

void readPad(GstPad* pad, MediaPipeline::Stream& stream) {
    stream.encoding = encodingBefore(pad);
    GstCaps* caps = gst_pad_get_current_caps(pad);
    if (!caps) {
        return;
    }
    GstVideoInfo video;
    GstAudioInfo audio;
    if (stream.type == TELIX_JS_AVCOMPTYPE_VIDEO && gst_video_info_from_caps(&video, caps) &&
        video.height > 0 && video.par_d > 0) {
        stream.aspectRatio = static_cast<float>(static_cast<double>(video.width) * video.par_n /
                                                (static_cast<double>(video.height) * video.par_d));
    } else if (stream.type == TELIX_JS_AVCOMPTYPE_AUDIO && gst_audio_info_from_caps(&audio, caps)) {
        stream.audioChannels = static_cast<uint32_t>(audio.channels);
    }
    gst_caps_unref(caps);
}

std::vector<MediaPipeline::Stream> readStreams(GstElement* playbin) {
    std::vector<MediaPipeline::Stream> streams;
    for (const StreamKind& kind : streamKinds) {
        gint count = 0;
        g_object_get(playbin, kind.count, &count, nullptr);
        for (gint number = 0; number < count; ++number) {
            MediaPipeline::Stream stream;
            stream.type = kind.type;
            stream.number = number;
            GstTagList* tags = nullptr;
            g_signal_emit_by_name(playbin, kind.tags, number, &tags);
            if (tags) {
                stream.language = languageOf(tags);
                gst_tag_list_unref(tags);
            }
            GstPad* pad = nullptr;
            g_signal_emit_by_name(playbin, kind.pad, number, &pad);
            if (pad) {
                readPad(pad, stream);
                gst_object_unref(pad);
            }
            streams.push_back(stream);
        }
    }
    return streams;
}

// The status with which a server has refused; 0 if it was something else.
uint32_t httpStatusOf(GstMessage* message) {
    const GstStructure* details = nullptr;
    gst_message_parse_error_details(message, &details);
    guint status = 0;
    if (details) {
        gst_structure_get_uint(details, "http-status-code", &status);
    }
    return status;
}

// Data stops coming from the source itself, which has not said why.
bool isDriedUp(GstMessage* message, const GError& error) {
    return g_error_matches(&error, GST_STREAM_ERROR, GST_STREAM_ERROR_FAILED) &&
           GST_OBJECT_FLAG_IS_SET(GST_MESSAGE_SRC(message), GST_ELEMENT_FLAG_SOURCE);
}

bool isHttpAnswer(GstMessage* message) {
    return GST_MESSAGE_TYPE(message) == GST_MESSAGE_ELEMENT && gst_message_has_name(message, "http-headers");
}

bool hasProperty(GstElement* element, const char* name) {
    return g_object_class_find_property(G_OBJECT_GET_CLASS(element), name) != nullptr;
}

void end(GstElement* pipeline) {
    GstBus* bus = gst_element_get_bus(pipeline);
    gst_bus_remove_watch(bus);
    gst_bus_set_flushing(bus, TRUE);
    gst_object_unref(bus);
    gst_element_set_state(pipeline, GST_STATE_NULL);
    gst_object_unref(pipeline);
}

// A pipeline without its player, until the server has answered: the source crashes now and then if it is told
// to give a request up at the moment of the answer.
class Farewell {
public:
    // Takes the pipeline over.
    static void begin(GstElement* pipeline) {
        new Farewell(pipeline); // deletes itself
    }
    Farewell(const Farewell&) = delete;
    Farewell& operator=(const Farewell&) = delete;

private:
    explicit Farewell(GstElement* pipeline)
        : m_pipeline(pipeline), m_limit(g_timeout_source_new_seconds(2 * networkSilence)) {
        GstBus* bus = gst_element_get_bus(pipeline);
        gst_bus_remove_watch(bus);
        gst_bus_add_watch(bus, onMessage, this);
        gst_object_unref(bus);
        g_source_set_callback(m_limit, onLimit, this, nullptr);
        g_source_attach(m_limit, g_main_context_get_thread_default());
        gst_element_set_state(pipeline, GST_STATE_PAUSED);
    }
    ~Farewell() {
        g_source_destroy(m_limit);
        g_source_unref(m_limit);
        end(m_pipeline);
    }

    static gboolean onMessage(GstBus* bus, GstMessage* message, gpointer farewell) {
        (void)bus;
        const GstMessageType type = GST_MESSAGE_TYPE(message);
        if (isHttpAnswer(message) || type == GST_MESSAGE_ERROR || type == GST_MESSAGE_ASYNC_DONE ||
            type == GST_MESSAGE_EOS) {
            delete static_cast<Farewell*>(farewell);
            return G_SOURCE_REMOVE;
        }
        return G_SOURCE_CONTINUE;
    }

    static gboolean onLimit(gpointer farewell) {
        delete static_cast<Farewell*>(farewell);
        return G_SOURCE_REMOVE;
    }

    GstElement* m_pipeline;
    GSource* m_limit;
};

} // namespace

MediaPipeline::MediaPipeline(Listener listener) : m_listener(std::move(listener)) {}

bool MediaPipeline::start(Picture& picture, Picture::Token token, const Setup& setup, std::string& error) {
    m_pipeline = gst_element_factory_make("playbin", nullptr);
    GstElement* pictureSink = picture.makeSink(token);
    GstElement* audioSink = makeAudioSink();
    if (m_pipeline) {
        gst_object_ref_sink(m_pipeline); // ours, until the end
    }
    if (!m_pipeline || !pictureSink || !audioSink) {
        for (GstElement* element : {pictureSink, audioSink}) {
            if (element) {
                gst_object_unref(gst_object_ref_sink(element));
            }
        }
        error = "elements of GStreamer are missing";
        return false;
    }
    const gchar* scheme = g_uri_peek_scheme(setup.url.c_str());
    m_isNetwork = scheme && std::strcmp(scheme, "file") != 0;
    m_isHttp = scheme && g_str_has_prefix(scheme, "http");
    m_isPaused = setup.isPaused;
    m_goal = setup.position;
    if (setup.speed != 1) {
        m_newSpeed = setup.speed;
    }
    m_volume = setup.volume / 100.0;
    gst_util_set_object_arg(G_OBJECT(m_pipeline), "flags", playFlags);
    g_object_set(m_pipeline, "uri", setup.url.c_str(), "video-sink", pictureSink, "audio-sink", audioSink,
                 "buffer-duration", bufferAhead, nullptr);
    const auto release = [](gpointer shared, GClosure*) { delete static_cast<SharedPointer*>(shared); };
    g_signal_connect_data(m_pipeline, "source-setup", G_CALLBACK(onSource), new SharedPointer(m_shared),
                          release, {});
    g_signal_connect_data(m_pipeline, "element-setup", G_CALLBACK(onElement), new SharedPointer(m_shared),
                          release, {});
    applySound();

    GstBus* bus = gst_element_get_bus(m_pipeline);
    gst_bus_add_watch(bus, onMessage, this);
    gst_object_unref(bus);
    m_state = GST_STATE_PAUSED;
    const GstStateChangeReturn result = gst_element_set_state(m_pipeline, m_state);
    m_isLive = result == GST_STATE_CHANGE_NO_PREROLL;
    if (m_isLive) {
        settle();
    }
    return true; // a failure is on the bus, with its reason
}

MediaPipeline::~MediaPipeline() {
    if (m_pipeline && isAsking()) {
        Farewell::begin(m_pipeline);
    } else if (m_pipeline) {
        end(m_pipeline);
    }
}

// The answer to a request may come at any moment.
bool MediaPipeline::isAsking() const {
    return m_isHttp && !m_hasFailed && (!m_hasAnswer || m_isSeeking);
}

// On GStreamer's thread.
void MediaPipeline::onSource(GstElement* playbin, GstElement* source, gpointer shared) {
    (void)playbin;
    if (hasProperty(source, "timeout") && hasProperty(source, "user-agent")) {
        g_object_set(source, "timeout", networkSilence, nullptr);
    }
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

// On GStreamer's threads.
void MediaPipeline::onElement(GstElement* playbin, GstElement* element, gpointer shared) {
    (void)playbin;
    const GstElementFactory* factory = gst_element_get_factory(element);
    const gchar* name = factory ? GST_OBJECT_NAME(factory) : "";
    if (std::strcmp(name, subtitleElement) == 0) {
        g_object_set(element, "silent", (*static_cast<SharedPointer*>(shared))->showsSubtitle ? FALSE : TRUE,
                     nullptr);
    } else if (std::strcmp(name, storeElement) == 0) {
        g_signal_connect(element, "notify::temp-location", G_CALLBACK(onStore), nullptr);
    }
}

// The file of what has been fetched has been opened. Without a name it goes with the process, however that
// ends.
void MediaPipeline::onStore(GObject* store, GParamSpec* property, gpointer data) {
    (void)property;
    (void)data;
    gchar* file = nullptr;
    g_object_get(store, "temp-location", &file, nullptr);
    if (file) {
        unlink(file);
    }
    g_free(file);
}

gboolean MediaPipeline::onMessage(GstBus* bus, GstMessage* message, gpointer player) {
    (void)bus;
    static_cast<MediaPipeline*>(player)->handle(message);
    return TRUE;
}

void MediaPipeline::handle(GstMessage* message) {
    if (m_hasFailed) {
        return; // what follows an error are consequences
    }
    switch (GST_MESSAGE_TYPE(message)) {
    case GST_MESSAGE_ERROR:
        handleError(message);
        break;
    case GST_MESSAGE_EOS:
        m_listener.ended();
        break;
    case GST_MESSAGE_BUFFERING: {
        gint percent = 100;
        gst_message_parse_buffering(message, &percent);
        takeBuffering(percent);
        break;
    }
    case GST_MESSAGE_ASYNC_DONE:
        m_isSeeking = false;
        settle();
        break;
    case GST_MESSAGE_STATE_CHANGED: {
        GstState state = GST_STATE_NULL;
        gst_message_parse_state_changed(message, nullptr, &state, nullptr);
        if (GST_MESSAGE_SRC(message) == GST_OBJECT(m_pipeline) && state == GST_STATE_PLAYING && !m_hasBegun) {
            m_hasBegun = true;
            m_listener.began();
        }
        break;
    }
    case GST_MESSAGE_ELEMENT:
        if (isHttpAnswer(message)) {
            m_hasAnswer = true;
            readHeaders(gst_message_get_structure(message));
        }
        break;
    case GST_MESSAGE_CLOCK_LOST:
        if (m_state == GST_STATE_PLAYING) {
            gst_element_set_state(m_pipeline, GST_STATE_PAUSED);
            gst_element_set_state(m_pipeline, GST_STATE_PLAYING);
        }
        break;
    default:
        break;
    }
}

// ---- Errors

TELIX_AV_CB_MSG MediaPipeline::kindOf(GstMessage* message, const GError& error) const {
    const uint32_t status = httpStatusOf(message);
    const bool isMissing =
        (status >= 400 && status < 500) ||
        (!m_isNetwork && g_error_matches(&error, GST_RESOURCE_ERROR, GST_RESOURCE_ERROR_NOT_FOUND));
    if (isMissing) {
        return TELIX_AV_CB_MSG_ERR_NOT_FOUND;
    }
    const bool isOfConnection =
        m_isNetwork && status == 0 && (error.domain == GST_RESOURCE_ERROR || isDriedUp(message, error));
    if (isOfConnection) {
        return m_shared->hasData ? TELIX_AV_CB_MSG_ERR_NET_DISCONNECTED
                                 : TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT;
    }
    // Data that does not flow before anything is presented has not been understood.
    const bool isNotUnderstood =
        (error.domain == GST_STREAM_ERROR && (!m_hasBegun || error.code != GST_STREAM_ERROR_FAILED)) ||
        g_error_matches(&error, GST_CORE_ERROR, GST_CORE_ERROR_MISSING_PLUGIN);
    return isNotUnderstood ? TELIX_AV_CB_MSG_ERR_CODEC_NOT_SUPPORTED : TELIX_AV_CB_MSG_ERR_PLAYING;
}

void MediaPipeline::handleError(GstMessage* message) {
    GError* error = nullptr;
    gst_message_parse_error(message, &error, nullptr);
    m_hasFailed = true;
    m_listener.failed(kindOf(message, *error), error->message);
    g_error_free(error);
}

void MediaPipeline::readHeaders(const GstStructure* headers) {
    const GValue* response = gst_structure_get_value(headers, "response-headers");
    if (!response || !GST_VALUE_HOLDS_STRUCTURE(response)) {
        return;
    }
    gst_structure_foreach(
        gst_value_get_structure(response),
        [](GQuark name, const GValue* value, gpointer hasRanges) -> gboolean {
            const bool isGiven = g_ascii_strcasecmp(g_quark_to_string(name), "accept-ranges") == 0 &&
                                 G_VALUE_HOLDS_STRING(value) &&
                                 g_ascii_strcasecmp(g_value_get_string(value), "bytes") == 0;
            *static_cast<bool*>(hasRanges) = *static_cast<bool*>(hasRanges) || isGiven;
            return TRUE;
        },
        &m_hasRanges);
}

// ---- States

void MediaPipeline::takeBuffering(int percent) {
    const bool isHeld = percent < 100 && !m_isLive; // what is live does not wait
    if (isHeld != m_isHeld) {
        m_isHeld = isHeld;
        m_listener.buffering(isHeld);
        applyState();
    }
}

// After each change of state or place that takes its time.
void MediaPipeline::settle() {
    if (!m_isKnown) {
        becomeKnown();
    }
    const std::optional<uint32_t> goal = m_goal && canReach(*m_goal) ? m_goal : std::nullopt;
    if (goal || m_newSpeed) {
        const double speed = m_newSpeed.value_or(m_speed);
        const uint32_t position = goal ? *goal : progress().position;
        m_goal.reset();
        m_newSpeed.reset();
        if (applySeek(speed, position)) {
            return; // comes again when it is done
        }
    }
    m_goal.reset();
    m_isReady = true;
    applyState();
}

void MediaPipeline::becomeKnown() {
    m_isKnown = true;
    Media media;
    media.streams = readStreams(m_pipeline);
    GstQuery* query = gst_query_new_seeking(GST_FORMAT_TIME);
    if (gst_element_query(m_pipeline, query)) {
        gboolean canSeek = FALSE;
        gst_query_parse_seeking(query, nullptr, &canSeek, nullptr, nullptr);
        media.canSeek = canSeek != FALSE;
    }
    gst_query_unref(query);
    m_hasStore = usesStore();
    media.canSeekAhead = media.canSeek && (!m_hasStore || m_hasRanges);
    media.canReverse = media.canSeek && (!m_isNetwork || m_hasStore);
    m_listener.known(media);
}

// What has been fetched is kept in a file.
bool MediaPipeline::usesStore() const {
    GstIterator* stores = gst_bin_iterate_all_by_element_factory_name(GST_BIN(m_pipeline), storeElement);
    GValue value = G_VALUE_INIT;
    const bool isUsed = gst_iterator_next(stores, &value) == GST_ITERATOR_OK;
    if (isUsed) {
        g_value_unset(&value);
    }
    gst_iterator_free(stores);
    return isUsed;
}

void MediaPipeline::applyState() {
    if (!m_isReady && !m_isLive) {
        return; // the beginning is not to be seen before it is the right place
    }
    const GstState state = m_isPaused || m_isHeld ? GST_STATE_PAUSED : GST_STATE_PLAYING;
    if (state != m_state) {
        m_state = state;
        gst_element_set_state(m_pipeline, state);
    }
}

void MediaPipeline::setPaused(bool isPaused) {
    m_isPaused = isPaused;
    applyState();
}

// ---- Seeks

// A server that does not give parts is not asked for one: it would cut the media off, or leave it hanging.
bool MediaPipeline::canReach(uint32_t milliseconds) {
    return !m_hasStore || m_hasRanges || milliseconds / 1000 <= progress().bufferedEnd;
}

bool MediaPipeline::applySeek(double speed, uint32_t milliseconds) {
    if (!canReach(milliseconds)) {
        return false;
    }
    const auto at = static_cast<gint64>(milliseconds) * GST_MSECOND;
    const auto flags = static_cast<GstSeekFlags>(GST_SEEK_FLAG_FLUSH | GST_SEEK_FLAG_ACCURATE);
    const bool isForward = speed > 0;
    // Backward, the segment is what is to be played from its end.
    const bool isTaken =
        gst_element_seek(m_pipeline, speed, GST_FORMAT_TIME, flags, GST_SEEK_TYPE_SET, isForward ? at : 0,
                         GST_SEEK_TYPE_SET, isForward ? -1 : at) != FALSE;
    if (isTaken) {
        m_isSeeking = true;
        m_speed = speed;
        m_position = milliseconds;
        applySound();
    }
    return isTaken;
}

bool MediaPipeline::seek(uint32_t milliseconds) {
    if (isSeeking()) {
        m_goal = milliseconds;
        return true;
    }
    return applySeek(m_speed, milliseconds);
}

bool MediaPipeline::setSpeed(double speed) {
    if (isSeeking()) {
        m_newSpeed = speed;
        return true;
    }
    return speed == m_speed || applySeek(speed, progress().position);
}

bool MediaPipeline::repeat() {
    return applySeek(m_speed, 0);
}

// ---- Sound and streams

void MediaPipeline::setVolume(uint32_t volume) {
    m_volume = volume / 100.0;
    applySound();
}

void MediaPipeline::selectAudio(std::optional<int> number) {
    m_hasSound = number.has_value();
    if (number && *number != sound().audio) {
        g_object_set(m_pipeline, "current-audio", *number, nullptr);
    }
    applySound();
}

void MediaPipeline::applySound() {
    g_object_set(m_pipeline, "volume", m_volume, "mute", m_hasSound && m_speed == 1 ? FALSE : TRUE, nullptr);
}

void MediaPipeline::selectSubtitle(std::optional<int> number) {
    gint current = -1;
    g_object_get(m_pipeline, "current-text", &current, nullptr);
    if (number && *number != current) { // a choice that changes nothing would still drop the text that is due
        g_object_set(m_pipeline, "current-text", *number, nullptr);
    }
    m_shared->showsSubtitle = number.has_value();
    applySubtitle();
}

// The element that draws subtitles is there if the media has any; it is told whether to. What it was given
// before it was told stays unseen: the next text is the first.
void MediaPipeline::applySubtitle() {
    GstIterator* overlays = gst_bin_iterate_all_by_element_factory_name(GST_BIN(m_pipeline), subtitleElement);
    gst_iterator_foreach(
        overlays,
        [](const GValue* overlay, gpointer isSilent) {
            g_object_set(g_value_get_object(overlay), "silent", GPOINTER_TO_INT(isSilent), nullptr);
        },
        GINT_TO_POINTER(m_shared->showsSubtitle ? FALSE : TRUE));
    gst_iterator_free(overlays);
}

MediaPipeline::Sound MediaPipeline::sound() const {
    Sound sound;
    gboolean isMuted = FALSE;
    g_object_get(m_pipeline, "current-audio", &sound.audio, "volume", &sound.volume, "mute", &isMuted,
                 nullptr);
    sound.isMuted = isMuted != FALSE;
    return sound;
}

// ---- Progress

MediaPipeline::Progress MediaPipeline::progress() {
    gint64 value = 0;
    if (!isSeeking() && gst_element_query_position(m_pipeline, GST_FORMAT_TIME, &value) && value >= 0) {
        m_position = static_cast<uint32_t>(value / GST_MSECOND);
    }
    if (gst_element_query_duration(m_pipeline, GST_FORMAT_TIME, &value) && value > 0) {
        m_duration = static_cast<uint32_t>(value / GST_MSECOND);
        m_position = std::min(m_position, m_duration);
    }
    Progress progress;
    progress.position = m_position;
    progress.duration = m_duration;
    if (m_isNetwork && m_duration > 0) {
        readBuffering(progress);
    }
    return progress;
}

void MediaPipeline::readBuffering(Progress& progress) {
    GstQuery* query = gst_query_new_buffering(GST_FORMAT_PERCENT);
    if (gst_element_query(m_pipeline, query)) {
        const guint count = gst_query_get_n_buffering_ranges(query);
        for (guint index = 0; index < count; ++index) {
            gint64 begin = 0;
            gint64 end = 0;
            gst_query_parse_nth_buffering_range(query, index, &begin, &end);
            const double millisecondsAPart = static_cast<double>(m_duration) / GST_FORMAT_PERCENT_MAX;
            const double beginAt = static_cast<double>(begin) * millisecondsAPart;
            const double endAt = static_cast<double>(end) * millisecondsAPart;
            if (beginAt <= m_position && m_position <= endAt) {
                // Rounded down, so that it is never beyond the duration.
                progress.bufferedEnd = static_cast<uint32_t>(endAt / 1000);
                progress.buffered = static_cast<uint32_t>((endAt - m_position) / 1000);
            }
        }
        if (count > 0 && progress.buffered == noBufferReport) {
            progress.bufferedEnd = m_position / 1000; // nothing is there yet at this place
            progress.buffered = 0;
        }
    }
    gst_query_unref(query);
}

} // namespace desktop
