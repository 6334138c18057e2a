// How the file of the test multiplex is made: ffmpeg draws pictures and sound, GStreamer encodes the
// subtitles.
#include <glib.h>
#include <glib/gstdio.h>
#include <gst/gst.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>

#include "desktop/platform/Multiplex.h"

namespace desktop {

namespace {

// Seconds. Frames of 40 ms and of 24 ms both fill it, so that none is cut at its end.
const char* const kDuration = "10.08";

// The number changes with the recipe, so that an older file is not mistaken for it.
const char* const kFileName = "test-multiplex-1.ts";

// Video, two audio and two subtitle streams of a service are in the file; its stream events are injected.
constexpr size_t kStreamsInFile = 5;

struct SubtitleLanguage {
    const char* code;
    const char* first;
    const char* second;
};
const SubtitleLanguage kSubtitleLanguages[] = {
    {"deu", "Guten Abend aus dem Studio", "Untertitel in deutscher Sprache"},
    {"eng", "Good evening from the studio", "Subtitles in English"},
};

struct Unref {
    void operator()(GstElement* element) const { gst_object_unref(element); }
    void operator()(GstPad* pad) const { gst_object_unref(pad); }
    void operator()(GstBus* bus) const { gst_object_unref(bus); }
    void operator()(GstMessage* message) const { gst_message_unref(message); }
};
template <typename Type>
using Reference = std::unique_ptr<Type, Unref>;

std::string takeMessage(GError* error) {
    std::string message = error->message;
    g_error_free(error);
    return message;
}

std::string cacheFolder() {
    char* folder = g_build_filename(g_get_user_cache_dir(), "telix", nullptr);
    std::string result = folder;
    g_free(folder);
    return result;
}

// Widens the regions of encoded subtitles by two pixels. dvbsubenc makes them as wide as their content, and
// dvbsuboverlay rejects a line that reaches the end of its region.
GstPadProbeReturn widenRegions(GstPad* pad, GstPadProbeInfo* info, gpointer data) {
    (void)pad;
    (void)data;
    GstBuffer* buffer = gst_buffer_make_writable(GST_PAD_PROBE_INFO_BUFFER(info));
    GST_PAD_PROBE_INFO_DATA(info) = buffer; // replaces the one that arrived
    GstMapInfo map;
    if (!gst_buffer_map(buffer, &map, GST_MAP_READWRITE)) {
        return GST_PAD_PROBE_OK;
    }
    gsize at = kSubtitlingDataHeaderSize;
    while (at + kSubtitlingSegmentHeaderSize <= map.size && map.data[at] == kSubtitlingSegmentSync) {
        const gsize widthAt = at + kSubtitlingSegmentHeaderSize + kRegionWidthOffset;
        if (map.data[at + 1] == kRegionCompositionSegment && widthAt + 2 <= map.size) {
            uint8_t* width = map.data + widthAt;
            const unsigned int wider = (static_cast<unsigned int>(width[0]) << 8 | width[1]) + 2;
            width[0] = static_cast<uint8_t>(wider >> 8);
            width[1] = static_cast<uint8_t>(wider);
        }
        at += kSubtitlingSegmentHeaderSize + (static_cast<gsize>(map.data[at + 4]) << 8 | map.data[at + 5]);
    }
    gst_buffer_unmap(buffer, &map);
    return GST_PAD_PROBE_OK;
}

bool writeSubtitleScript(const SubtitleLanguage& language, const std::string& file, std::string& error) {
    const std::string script = std::string("1\n00:00:00,500 --> 00:00:04,500\n") + language.first +
                               "\n\n2\n00:00:05,000 --> 00:00:09,500\n" + language.second +
                               "\n\n3\n00:00:09,600 --> 00:00:09,700\n.\n\n";
    GError* reason = nullptr;
    if (!g_file_set_contents(file.c_str(), script.data(), static_cast<gssize>(script.size()), &reason)) {
        error = takeMessage(reason);
        return false;
    }
    return true;
}

// From `stem`.srt to `stem`.ts; null with the reason in `error`.
Reference<GstElement> makeSubtitlePipeline(const std::string& stem, std::string& error) {
    GError* reason = nullptr;
    Reference<GstElement> pipeline(
        gst_parse_launch("filesrc name=source ! subparse ! textrender font-desc=\"Sans 24\" ! "
                         "video/x-raw,format=AYUV,width=720,height=576 ! dvbsubenc name=encoder ! mpegtsmux "
                         "! filesink name=sink",
                         &reason));
    if (reason) {
        error = takeMessage(reason);
        return nullptr;
    }
    for (const auto& [name, ending] : {std::pair("source", ".srt"), std::pair("sink", ".ts")}) {
        const Reference<GstElement> element(gst_bin_get_by_name(GST_BIN(pipeline.get()), name));
        g_object_set(element.get(), "location", (stem + ending).c_str(), nullptr);
    }
    const Reference<GstElement> encoder(gst_bin_get_by_name(GST_BIN(pipeline.get()), "encoder"));
    const Reference<GstPad> encoded(gst_element_get_static_pad(encoder.get(), "src"));
    gst_pad_add_probe(encoded.get(), GST_PAD_PROBE_TYPE_BUFFER, widenRegions, nullptr, nullptr);
    return pipeline;
}

// Writes the subtitles of one language as a transport stream; false with the reason in `error`.
bool makeSubtitles(const SubtitleLanguage& language, const std::string& folder, std::string& error) {
    const std::string stem = folder + "/subtitles-" + language.code;
    if (!writeSubtitleScript(language, stem + ".srt", error)) {
        return false;
    }
    const Reference<GstElement> pipeline = makeSubtitlePipeline(stem, error);
    if (!pipeline) {
        return false;
    }
    gst_element_set_state(pipeline.get(), GST_STATE_PLAYING);
    const Reference<GstBus> bus(gst_element_get_bus(pipeline.get()));
    const Reference<GstMessage> message(gst_bus_timed_pop_filtered(
        bus.get(), 20 * GST_SECOND, static_cast<GstMessageType>(GST_MESSAGE_EOS | GST_MESSAGE_ERROR)));
    const bool isDone = message && GST_MESSAGE_TYPE(message.get()) == GST_MESSAGE_EOS;
    if (!isDone) {
        error = stem + ".ts: the subtitles could not be encoded";
    }
    gst_element_set_state(pipeline.get(), GST_STATE_NULL);
    return isDone;
}

using Arguments = std::vector<std::string>;

void append(Arguments& arguments, std::initializer_list<std::string> more) {
    arguments.insert(arguments.end(), more);
}

// A picture for each service, then two tones and two subtitle files for all of them.
void appendInputs(Arguments& command, const std::string& folder) {
    for (const TestService& service : testServices()) {
        append(command, {"-f", "lavfi", "-t", kDuration, "-i", service.picture});
    }
    for (const char* tone : {"sine=f=440:r=48000", "sine=f=880:r=48000"}) {
        append(command, {"-f", "lavfi", "-t", kDuration, "-i", tone});
    }
    for (const SubtitleLanguage& language : kSubtitleLanguages) {
        append(command, {"-itsoffset", "0.5", "-i", folder + "/subtitles-" + language.code + ".ts"});
    }
}

// Name of the service and running time over the picture, with an aspect ratio of 16:9.
std::string overlayFilter(const TestService& service) {
    return std::string("drawtext=text='") + service.name +
           "':x=48:y=48:fontsize=48:fontcolor=white:box=1:boxcolor=black@0.6:boxborderw=12,"
           "drawtext=text='%{pts\\:hms}':x=w-tw-48:y=48:fontsize=36:fontcolor=white:box=1:"
           "boxcolor=black@0.6:boxborderw=12,setsar=64/45";
}

// The graph with the outputs v, l and h (video, low and high tone) with the index of each service, and the
// maps of its streams to the PIDs.
void appendStreams(Arguments& command) {
    const std::vector<TestService>& services = testServices();
    const std::string count = std::to_string(services.size());
    const auto inputAfterPictures = [&](size_t index) { return std::to_string(services.size() + index); };
    std::string pictures;
    std::string low = "[" + inputAfterPictures(0) + ":a]volume=0.2,asplit=" + count;
    std::string high = "[" + inputAfterPictures(1) + ":a]volume=0.2,asplit=" + count;
    Arguments maps;
    size_t output = 0;
    for (size_t index = 0; index < services.size(); ++index) {
        const std::string suffix = std::to_string(index) + "]";
        pictures +=
            "[" + std::to_string(index) + ":v]" + overlayFilter(services[index]) + "[v" + suffix + ";";
        low += "[l" + suffix;
        high += "[h" + suffix;
        for (const std::string& source : {"[v" + suffix, "[l" + suffix, "[h" + suffix,
                                          inputAfterPictures(2) + ":s", inputAfterPictures(3) + ":s"}) {
            const uint16_t pid = services[index].streams[output % kStreamsInFile].pid;
            append(maps, {"-map", source, "-streamid", std::to_string(output) + ":" + std::to_string(pid)});
            ++output;
        }
    }
    append(command, {"-filter_complex", pictures + low + ";" + high});
    command.insert(command.end(), maps.begin(), maps.end());
}

void appendPrograms(Arguments& command) {
    size_t output = 0;
    for (const TestService& service : testServices()) {
        std::string program = "program_num=" + std::to_string(service.serviceId);
        for (size_t stream = 0; stream < kStreamsInFile; ++stream) {
            program += ":st=" + std::to_string(output++);
        }
        append(command, {"-program", program});
    }
}

// The command that makes `file`.
Arguments ffmpegCommand(const std::string& folder, const std::string& file) {
    Arguments command{"ffmpeg", "-hide_banner", "-loglevel", "error", "-nostdin", "-y"};
    appendInputs(command, folder);
    appendStreams(command);
    append(command, {"-c:v", "mpeg2video", "-b:v", "1500k", "-maxrate", "2500k", "-bufsize", "1000k", "-g",
                     "12", "-bf", "0", "-c:a", "mp2", "-b:a", "128k", "-c:s", "copy"});
    appendPrograms(command);
    // With the default delays the first frame comes a second late.
    append(command, {"-muxdelay", "0.2", "-muxpreload", "0.2", "-f", "mpegts", file});
    return command;
}

bool runCommand(const Arguments& command, std::string& error) {
    std::vector<char*> arguments;
    arguments.reserve(command.size() + 1);
    for (const std::string& argument : command) {
        arguments.push_back(const_cast<char*>(argument.c_str())); // not written to
    }
    arguments.push_back(nullptr);
    GError* reason = nullptr;
    gint status = 0;
    char* output = nullptr;
    bool isDone = g_spawn_sync(nullptr, arguments.data(), nullptr,
                               static_cast<GSpawnFlags>(G_SPAWN_SEARCH_PATH | G_SPAWN_STDOUT_TO_DEV_NULL),
                               nullptr, nullptr, nullptr, &output, &status, &reason) != FALSE;
    isDone = isDone && g_spawn_check_wait_status(status, &reason);
    if (!isDone) {
        error = takeMessage(reason);
        if (output && *output) {
            error += std::string(": ") + output;
        }
    }
    g_free(output);
    return isDone;
}

// Makes `file` with all intermediate files in `work`; false with the reason in `error`.
bool makeIn(const std::string& work, const std::string& file, std::string& error) {
    bool isMade = true;
    for (const SubtitleLanguage& language : kSubtitleLanguages) {
        isMade = isMade && makeSubtitles(language, work, error);
    }
    const std::string made = work + "/" + kFileName;
    isMade = isMade && runCommand(ffmpegCommand(work, made), error);
    if (isMade && g_rename(made.c_str(), file.c_str()) != 0) {
        error = file + ": " + g_strerror(errno);
        isMade = false;
    }
    for (const SubtitleLanguage& language : kSubtitleLanguages) {
        for (const char* ending : {".srt", ".ts"}) {
            g_unlink((work + "/subtitles-" + language.code + ending).c_str());
        }
    }
    g_unlink(made.c_str());
    return isMade;
}

} // namespace

std::string makeTestMultiplex(std::string& error) {
    const std::string folder = cacheFolder();
    std::string file = folder + "/" + kFileName;
    if (g_file_test(file.c_str(), G_FILE_TEST_IS_REGULAR)) {
        return file;
    }
    if (g_mkdir_with_parents(folder.c_str(), 0700) != 0) {
        error = folder + ": " + g_strerror(errno);
        return "";
    }
    std::fprintf(stderr, "libtelix: making the test multiplex in %s (only once)\n", folder.c_str());
    // In a folder of its own, because two processes may do this at the same time.
    std::string work = folder + "/making-XXXXXX";
    if (!g_mkdtemp(work.data())) {
        error = work + ": " + g_strerror(errno);
        return "";
    }
    const bool isMade = makeIn(work, file, error);
    g_rmdir(work.c_str());
    if (!isMade) {
        return "";
    }
    std::fprintf(stderr, "libtelix: the test multiplex is ready\n");
    return file;
}

} // namespace desktop
