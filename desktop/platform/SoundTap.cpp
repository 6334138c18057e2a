// What an audio sink plays. A buffer waits at the sink until its time has come, and when that is can change
// until then: a pipeline that is paused begins to play later. So each buffer is passed on when the next one
// arrives.
#include "desktop/platform/SoundTap.h"

#include <gst/audio/audio.h>
#include <gst/base/gstbasesink.h>

#include <memory>
#include <mutex>
#include <vector>

#include "desktop/platform/telix_sound.h"

namespace desktop {

namespace {

// ---- The listener

class SoundListener {
public:
    static SoundListener& instance() {
        static auto* listener = new SoundListener; // lives until the process ends
        return *listener;
    }

    void set(telix_desktop_sound_listener listener, void* data) {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_listener = listener;
        m_data = data;
    }

    bool isSet() {
        std::lock_guard<std::mutex> lock(m_mutex);
        return m_listener != nullptr;
    }

    void call(const telix_desktop_sound& sound) {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (m_listener) {
            m_listener(&sound, m_data);
        }
    }

private:
    std::mutex m_mutex; // held while the listener runs
    telix_desktop_sound_listener m_listener = nullptr;
    void* m_data = nullptr;
};

// ---- One sink

constexpr int64_t kClockJitter = GST_MSECOND;
constexpr int kClockReadings = 5;

// What a time of the clock lacks to be one of CLOCK_MONOTONIC, in nanoseconds. The thread may lose the
// processor between reading the one clock and the other; then they are read again.
int64_t monotonicOffsetOf(GstClock* clock) {
    int64_t offset = 0;
    for (int reading = 0; reading < kClockReadings; ++reading) {
        const int64_t before = g_get_monotonic_time() * 1000;
        const auto time = static_cast<int64_t>(gst_clock_get_time(clock));
        const int64_t after = g_get_monotonic_time() * 1000;
        offset = before - time;
        if (after - before < kClockJitter) {
            break;
        }
    }
    return offset;
}

struct ConverterFree {
    void operator()(GstAudioConverter* converter) const { gst_audio_converter_free(converter); }
};

struct BufferUnref {
    void operator()(GstBuffer* buffer) const { gst_buffer_unref(buffer); }
};

// Used by the streaming thread alone. Ends with the pad of the sink.
class SoundTap {
public:
    explicit SoundTap(GstElement* sink) : m_sink(sink) { gst_segment_init(&m_segment, GST_FORMAT_TIME); }

    void onEvent(GstEvent* event) {
        switch (GST_EVENT_TYPE(event)) {
        case GST_EVENT_CAPS: {
            GstCaps* caps = nullptr;
            gst_event_parse_caps(event, &caps);
            emit();
            setFormat(caps);
            break;
        }
        case GST_EVENT_SEGMENT:
            gst_event_copy_segment(event, &m_segment);
            break;
        case GST_EVENT_FLUSH_STOP: // what was waiting is not heard
            m_waiting.reset();
            break;
        case GST_EVENT_EOS:
            emit();
            break;
        default:
            break;
        }
    }

    void onBuffer(GstBuffer* buffer) {
        emit();
        // Sound is heard at normal speed only.
        if (SoundListener::instance().isSet() && m_converter && m_segment.rate == 1) {
            m_waiting.reset(gst_buffer_ref(buffer));
            m_runningTime = gst_segment_to_running_time(&m_segment, GST_FORMAT_TIME, GST_BUFFER_PTS(buffer));
        }
    }

private:
    void setFormat(const GstCaps* caps) {
        m_converter.reset();
        if (!gst_audio_info_from_caps(&m_format, caps)) {
            return;
        }
        GstAudioInfo output;
        gst_audio_info_set_format(&output, GST_AUDIO_FORMAT_S16, TELIX_DESKTOP_SOUND_RATE,
                                  TELIX_DESKTOP_SOUND_CHANNELS, nullptr);
        m_converter.reset(
            gst_audio_converter_new(GST_AUDIO_CONVERTER_FLAG_NONE, &m_format, &output, nullptr));
    }

    // Passes the waiting buffer on.
    void emit() {
        const std::unique_ptr<GstBuffer, BufferUnref> buffer = std::move(m_waiting);
        GstClock* clock = buffer ? gst_element_get_clock(m_sink) : nullptr;
        if (!clock) {
            return;
        }
        const int64_t time = static_cast<int64_t>(dueTime()) + monotonicOffsetOf(clock);
        gst_object_unref(clock);
        GstAudioBuffer mapped;
        if (!GST_CLOCK_TIME_IS_VALID(m_runningTime) ||
            !gst_audio_buffer_map(&mapped, &m_format, buffer.get(), GST_MAP_READ)) {
            return;
        }
        const gsize frames = gst_audio_converter_get_out_frames(m_converter.get(), mapped.n_samples);
        m_samples.resize(frames * TELIX_DESKTOP_SOUND_CHANNELS);
        gpointer output[] = {m_samples.data()};
        if (gst_audio_converter_samples(m_converter.get(), GST_AUDIO_CONVERTER_FLAG_NONE, mapped.planes,
                                        mapped.n_samples, output, frames)) {
            SoundListener::instance().call({m_samples.data(), static_cast<uint32_t>(frames), time});
        }
        gst_audio_buffer_unmap(&mapped);
    }

    // Of the waiting buffer, by the clock of the pipeline.
    GstClockTime dueTime() const {
        return gst_element_get_base_time(m_sink) + m_runningTime +
               gst_base_sink_get_latency(GST_BASE_SINK(m_sink));
    }

    GstElement* m_sink; // the owner of the pad
    GstSegment m_segment;
    GstAudioInfo m_format;
    std::unique_ptr<GstAudioConverter, ConverterFree> m_converter; // null: no known format
    std::unique_ptr<GstBuffer, BufferUnref> m_waiting;
    GstClockTime m_runningTime = GST_CLOCK_TIME_NONE; // of the waiting buffer
    std::vector<int16_t> m_samples;
};

GstPadProbeReturn onData(GstPad*, GstPadProbeInfo* info, gpointer data) {
    auto* tap = static_cast<SoundTap*>(data);
    if ((GST_PAD_PROBE_INFO_TYPE(info) & GST_PAD_PROBE_TYPE_BUFFER) != 0) {
        tap->onBuffer(GST_PAD_PROBE_INFO_BUFFER(info));
    } else {
        tap->onEvent(GST_PAD_PROBE_INFO_EVENT(info));
    }
    return GST_PAD_PROBE_OK;
}

} // namespace

void tapSound(GstElement* sink) {
    GstPad* pad = gst_element_get_static_pad(sink, "sink");
    gst_pad_add_probe(pad,
                      static_cast<GstPadProbeType>(GST_PAD_PROBE_TYPE_BUFFER |
                                                   GST_PAD_PROBE_TYPE_EVENT_DOWNSTREAM |
                                                   GST_PAD_PROBE_TYPE_EVENT_FLUSH),
                      onData, new SoundTap(sink), [](gpointer tap) { delete static_cast<SoundTap*>(tap); });
    gst_object_unref(pad);
}

} // namespace desktop

void telix_desktop_set_sound_listener(telix_desktop_sound_listener listener, void* data) {
    desktop::SoundListener::instance().set(listener, data);
}
