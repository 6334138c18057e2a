// The streams of the media, which of them are played, and how loud.
#include "desktop/platform/MediaPipeline.h"

#include <gst/audio/audio.h>
#include <gst/tag/tag.h>
#include <gst/video/video.h>

#include <cstring>

#include "desktop/platform/OutputVolume.h"

namespace desktop {

namespace {

struct Encoding {
    const char* caps;
    const char* name;
};
const Encoding kEncodings[] = {
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

struct StreamType {
    TELIX_JS_AVCOMPTYPE type;
    const char* count; // property of playbin
    const char* tags;  // action signals of playbin
    const char* pad;
};
const StreamType kStreamTypes[] = {
    {TELIX_JS_AVCOMPTYPE_VIDEO, "n-video", "get-video-tags", "get-video-pad"},
    {TELIX_JS_AVCOMPTYPE_AUDIO, "n-audio", "get-audio-tags", "get-audio-pad"},
    {TELIX_JS_AVCOMPTYPE_SUBTITLE, "n-text", "get-text-tags", "get-text-pad"},
};

std::string encodingOf(const GstCaps* caps) {
    for (const Encoding& encoding : kEncodings) {
        GstCaps* encoded = gst_caps_from_string(encoding.caps);
        const bool isMatch = gst_caps_can_intersect(caps, encoded) != FALSE;
        gst_caps_unref(encoded);
        if (isMatch) {
            return encoding.name;
        }
    }
    return "";
}

bool isRaw(const GstCaps* caps) {
    const char* name = gst_structure_get_name(gst_caps_get_structure(caps, 0));
    return std::strcmp(name, "audio/x-raw") == 0 || std::strcmp(name, "video/x-raw") == 0;
}

// The next pad upstream; a reference, null at a source.
GstPad* upstreamPadOf(GstPad* pad) {
    if (GST_PAD_IS_SINK(pad)) {
        return gst_pad_get_peer(pad);
    }
    GstPad* upstream = nullptr;
    if (GstIterator* sinkPads = gst_pad_iterate_internal_links(pad)) {
        GValue value = G_VALUE_INIT;
        if (gst_iterator_next(sinkPads, &value) == GST_ITERATOR_OK) {
            upstream = GST_PAD(g_value_dup_object(&value));
            g_value_unset(&value);
        }
        gst_iterator_free(sinkPads);
    }
    return upstream;
}

// The encoding before the decoder, which is somewhere upstream of `pad`.
std::string encodingUpstreamOf(GstPad* pad) {
    std::string name;
    auto* current = GST_PAD(gst_object_ref(pad));
    while (current && name.empty()) {
        if (GstCaps* caps = gst_pad_get_current_caps(current)) {
            if (!isRaw(caps)) {
                name = encodingOf(caps);
            }
            gst_caps_unref(caps);
        }
        GstPad* upstream = upstreamPadOf(current);
        gst_object_unref(current);
        current = upstream;
    }
    if (current) {
        gst_object_unref(current);
    }
    return name;
}

// ISO 639-2; of the two codes that some languages have, the terminological one, as in broadcast.
std::string languageOf(const GstTagList* tags) {
    gchar* code = nullptr;
    if (!tags || !gst_tag_list_get_string(tags, GST_TAG_LANGUAGE_CODE, &code)) {
        return "";
    }
    const char* terminological = gst_tag_get_language_code_iso_639_2T(code);
    std::string language = terminological ? terminological : "";
    g_free(code);
    return language;
}

void readPad(GstPad* pad, MediaPipeline::Stream& stream) {
    stream.encoding = encodingUpstreamOf(pad);
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

MediaPipeline::Stream readStream(GstElement* playbin, const StreamType& type, int number) {
    MediaPipeline::Stream stream;
    stream.type = type.type;
    stream.number = number;
    GstTagList* tags = nullptr;
    g_signal_emit_by_name(playbin, type.tags, number, &tags);
    if (tags) {
        stream.language = languageOf(tags);
        gst_tag_list_unref(tags);
    }
    GstPad* pad = nullptr;
    g_signal_emit_by_name(playbin, type.pad, number, &pad);
    if (pad) {
        readPad(pad, stream);
        gst_object_unref(pad);
    }
    return stream;
}

} // namespace

std::vector<MediaPipeline::Stream> MediaPipeline::readStreams() const {
    std::vector<Stream> streams;
    for (const StreamType& type : kStreamTypes) {
        gint count = 0;
        g_object_get(m_playbin, type.count, &count, nullptr);
        for (gint number = 0; number < count; ++number) {
            streams.push_back(readStream(m_playbin, type, number));
        }
    }
    return streams;
}

void MediaPipeline::setVolume(uint32_t volume) {
    m_volume = volume / 100.0;
    applyAudio();
}

void MediaPipeline::selectAudio(std::optional<int> stream) {
    m_isAudioSelected = stream.has_value();
    gint current = -1;
    g_object_get(m_playbin, "current-audio", &current, nullptr);
    if (stream && *stream != current) {
        g_object_set(m_playbin, "current-audio", *stream, nullptr);
    }
    applyAudio();
}

// Audio is muted at any speed but 1.
void MediaPipeline::applyAudio() {
    OutputVolume::instance().apply(m_volumeFilter, m_volume);
    g_object_set(m_volumeFilter, "mute", m_isAudioSelected && m_speed == 1 ? FALSE : TRUE, nullptr);
}

void MediaPipeline::selectSubtitle(std::optional<int> stream) {
    gint current = -1;
    g_object_get(m_playbin, "current-text", &current, nullptr);
    if (stream && *stream != current) { // to set it to the same value would drop the subtitle that is due
        g_object_set(m_playbin, "current-text", *stream, nullptr);
    }
    m_shared->showsSubtitle = stream.has_value();
    applySubtitle();
}

// Media with subtitles has an overlay element, which draws them unless it is silent. It does not draw a
// subtitle that it received while it was silent: the first one to be seen is the next.
void MediaPipeline::applySubtitle() {
    GstIterator* overlays = gst_bin_iterate_all_by_element_factory_name(GST_BIN(m_playbin), kSubtitleElement);
    gst_iterator_foreach(
        overlays,
        [](const GValue* overlay, gpointer isSilent) {
            g_object_set(g_value_get_object(overlay), "silent", GPOINTER_TO_INT(isSilent), nullptr);
        },
        GINT_TO_POINTER(m_shared->showsSubtitle ? FALSE : TRUE));
    gst_iterator_free(overlays);
}

} // namespace desktop
