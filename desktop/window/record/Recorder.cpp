// Records what the viewer sees and hears: frames and sound go into a pipeline that encodes them on threads of
// its own.
#include "desktop/window/record/Recorder.h"

#include <fcntl.h>
#include <gst/app/gstappsrc.h>
#include <gst/audio/audio.h>
#include <gst/gst.h>
#include <unistd.h>

#include <cerrno>
#include <utility>
#include <vector>

#include "desktop/window/shared/PageGeometry.h"

namespace desktop {

namespace {

constexpr int kFrameRate = 25;
constexpr int64_t kFrameDuration = GST_SECOND / kFrameRate;
constexpr size_t kStride = size_t{kPageWidth} * 4;
// Sound may arrive so much later than it is heard, which is more than a buffer of any sink.
constexpr int64_t kSoundDelay = 2 * GST_SECOND;
constexpr GstClockTime kFinishTimeout = 20 * GST_SECOND;

// The encoders that are used if they are there, the first of them. The picture's does little, so that the
// recording leaves the machine to the television.
const char* const kPictureEncoders[] = {
    "x264enc speed-preset=superfast threads=1 bframes=0 key-int-max=50 pass=quant quantizer=22"};
const char* const kSoundEncoders[] = {"avenc_aac bitrate=128000", "fdkaacenc bitrate=128000",
                                      "voaacenc bitrate=128000"};

std::string elementOf(const std::string& description) {
    return description.substr(0, description.find(' '));
}

// The description of the first encoder that is installed; empty, and in `error` the reason, if none is.
template <size_t Count>
std::string installed(const char* const (&encoders)[Count], std::string& error) {
    for (const char* each : encoders) {
        GstElementFactory* factory = gst_element_factory_find(elementOf(each).c_str());
        if (factory) {
            gst_object_unref(factory);
            return each;
        }
    }
    error = "the GStreamer element " + elementOf(encoders[0]) + " is not installed";
    return {};
}

// Frames are dropped before the encoder if it is too slow, and then repeated by videorate. The file is one of
// fragments until it is complete. A fragment has one frame: in longer ones, where sound and picture
// alternate, mp4mux (1.22) may leave a size out, and the file cannot be read.
GstElement* newPipeline(std::string& error) {
    const std::string picture = installed(kPictureEncoders, error);
    const std::string sound = picture.empty() ? "" : installed(kSoundEncoders, error);
    if (sound.empty()) {
        return nullptr;
    }
    // Each encoder has a queue of its own behind it, because the sound comes later than the picture.
    const std::string toFile = " ! queue max-size-time=0 max-size-bytes=0 max-size-buffers=0 ! mux. ";
    const std::string description =
        "appsrc name=picture format=time is-live=true max-buffers=10 max-bytes=0 leaky-type=downstream "
        "caps=video/x-raw,format=BGRx,width=" +
        std::to_string(kPageWidth) + ",height=" + std::to_string(kPageHeight) +
        ",framerate=25/1 ! videorate ! videoconvert ! video/x-raw,format=I420,framerate=25/1 ! " + picture +
        " ! h264parse" + toFile +
        "appsrc name=sound format=time is-live=true max-bytes=0 "
        "caps=audio/x-raw,format=" GST_AUDIO_NE(S16) ",layout=interleaved,rate=" +
        std::to_string(TELIX_DESKTOP_SOUND_RATE) +
        ",channels=" + std::to_string(TELIX_DESKTOP_SOUND_CHANNELS) + " ! audioconvert ! " + sound +
        " ! aacparse" + toFile +
        "mp4mux name=mux fragment-duration=40 fragment-mode=first-moov-then-finalise ! "
        "filesink name=file sync=false";
    GError* failure = nullptr;
    GstElement* pipeline =
        gst_parse_launch_full(description.c_str(), nullptr, GST_PARSE_FLAG_FATAL_ERRORS, &failure);
    if (failure) {
        error = failure->message;
        g_error_free(failure);
    }
    return pipeline;
}

GstElement* elementNamed(GstElement* pipeline, const char* name) {
    return gst_bin_get_by_name(GST_BIN(pipeline), name);
}

// What a message of the kind ERROR says.
std::string errorOf(GstMessage* message) {
    GError* failure = nullptr;
    gst_message_parse_error(message, &failure, nullptr);
    std::string error = failure->message;
    g_error_free(failure);
    return error;
}

// Creates the file, or empties it. Returns the reason if that is not possible.
std::string createFile(const std::string& file) {
    const int descriptor = open(file.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666);
    if (descriptor < 0) {
        return g_strerror(errno);
    }
    close(descriptor);
    return {};
}

int64_t now() {
    return g_get_monotonic_time() * 1000;
}

} // namespace

std::unique_ptr<Recorder> Recorder::start(const std::string& file, Paint paint, std::string& error) {
    GError* failure = nullptr;
    if (!gst_init_check(nullptr, nullptr, &failure)) {
        error = failure->message;
        g_error_free(failure);
        return nullptr;
    }
    GstElement* pipeline = newPipeline(error);
    if (!pipeline) {
        return nullptr;
    }
    std::unique_ptr<Recorder> recorder(new Recorder(pipeline, std::move(paint)));
    error = createFile(file);
    if (!error.empty()) {
        return nullptr;
    }
    GstElement* sink = elementNamed(pipeline, "file");
    g_object_set(sink, "location", file.c_str(), nullptr);
    gst_object_unref(sink);
    if (gst_element_set_state(pipeline, GST_STATE_PLAYING) == GST_STATE_CHANGE_FAILURE) {
        error = "the pipeline does not start";
        return nullptr;
    }
    return recorder;
}

Recorder::Recorder(GstElement* pipeline, Paint paint)
    : m_paint(std::move(paint)), m_pipeline(pipeline), m_picture(elementNamed(pipeline, "picture")),
      m_sound(elementNamed(pipeline, "sound")), m_start(now()), m_track(m_start) {
    m_timer = g_timeout_add(
        kFrameDuration / GST_MSECOND,
        [](gpointer recorder) -> gboolean {
            static_cast<Recorder*>(recorder)->record(now(), kSoundDelay);
            return G_SOURCE_CONTINUE;
        },
        this);
}

Recorder::~Recorder() {
    stop();
    for (GstElement* element : {m_picture, m_sound, m_pipeline}) {
        gst_object_unref(element);
    }
}

void Recorder::stop() {
    if (m_timer != 0) {
        g_source_remove(std::exchange(m_timer, 0));
    }
    gst_element_set_state(m_pipeline, GST_STATE_NULL);
}

void Recorder::addSound(const telix_desktop_sound& sound) {
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_track.add(sound);
}

// What is seen at a time, and the sound of `soundDelay` before.
void Recorder::record(int64_t time, int64_t soundDelay) {
    const int64_t frame = (time - m_start) / kFrameDuration;
    if (frame != m_lastFrame) {
        m_lastFrame = frame;
        recordFrame(frame);
    }
    recordSound(time - soundDelay);
}

void Recorder::recordFrame(int64_t frame) {
    GstBuffer* buffer = gst_buffer_new_allocate(nullptr, kStride * kPageHeight, nullptr);
    GstMapInfo map;
    gst_buffer_map(buffer, &map, GST_MAP_WRITE);
    m_paint(map.data, static_cast<int>(kStride));
    gst_buffer_unmap(buffer, &map);
    GST_BUFFER_PTS(buffer) = static_cast<GstClockTime>(frame * kFrameDuration);
    GST_BUFFER_DURATION(buffer) = kFrameDuration;
    gst_app_src_push_buffer(GST_APP_SRC(m_picture), buffer); // takes it
}

void Recorder::recordSound(int64_t until) {
    int64_t first = 0;
    std::vector<int16_t> samples;
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        first = m_track.taken();
        samples = m_track.take(until);
    }
    if (samples.empty()) {
        return;
    }
    const size_t frames = samples.size() / TELIX_DESKTOP_SOUND_CHANNELS;
    GstBuffer* buffer = gst_buffer_new_memdup(samples.data(), samples.size() * sizeof(int16_t));
    GST_BUFFER_PTS(buffer) =
        gst_util_uint64_scale(static_cast<guint64>(first), GST_SECOND, TELIX_DESKTOP_SOUND_RATE);
    GST_BUFFER_DURATION(buffer) = gst_util_uint64_scale(frames, GST_SECOND, TELIX_DESKTOP_SOUND_RATE);
    gst_app_src_push_buffer(GST_APP_SRC(m_sound), buffer); // takes it
}

std::string Recorder::finish() {
    record(now(), 0);
    gst_app_src_end_of_stream(GST_APP_SRC(m_picture));
    gst_app_src_end_of_stream(GST_APP_SRC(m_sound));
    GstBus* bus = gst_element_get_bus(m_pipeline);
    GstMessage* message = gst_bus_timed_pop_filtered(
        bus, kFinishTimeout, static_cast<GstMessageType>(GST_MESSAGE_EOS | GST_MESSAGE_ERROR));
    gst_object_unref(bus);
    std::string error = message ? "" : "the file has not been completed in time";
    if (message && GST_MESSAGE_TYPE(message) == GST_MESSAGE_ERROR) {
        error = errorOf(message);
    }
    g_clear_pointer(&message, gst_message_unref);
    stop();
    return error;
}

} // namespace desktop
