// What the test multiplex holds, how its file is made, and its tables.
#include "desktop/platform/Multiplex.h"

#include <cstdio>
#include <cstdlib>
#include <glib.h>
#include <glib/gstdio.h>
#include <gst/gst.h>
#include <unistd.h>

namespace desktop {

namespace {

// Both frames of 40 ms and of 24 ms fill it: nothing is cut at its end.
const char* const length = "10.08";

// Changes when the recipe does, so that an older file is not taken for it.
const char* const fileName = "test-multiplex-1.ts";

constexpr uint8_t typeMpeg2Video = 0x02;
constexpr uint8_t typeMpegAudio = 0x03;
constexpr uint8_t ordinarySubtitles = 0x10;
constexpr uint8_t subtitlesForHardOfHearing = 0x20;

struct SubtitleLanguage {
    const char* code;
    const char* first;
    const char* second;
};
const SubtitleLanguage subtitleLanguages[] = {
    {"deu", "Guten Abend aus dem Studio", "Untertitel in deutscher Sprache"},
    {"eng", "Good evening from the studio", "Subtitles in English"},
};

Bytes operator+(Bytes left, const Bytes& right) {
    left.insert(left.end(), right.begin(), right.end());
    return left;
}

// Two kinds of audio and of subtitles for each service, on PIDs that follow `base`.
std::vector<ElementaryStream> makeStreams(uint16_t base, const Bytes& secondAudio,
                                          const Bytes& secondSubtitles) {
    const auto pid = [base](int index) { return static_cast<uint16_t>(base + index); };
    return {
        {typeMpeg2Video, pid(0), describeComponentTag(1)},
        {typeMpegAudio, pid(1), describeComponentTag(2) + describeLanguage("deu", 0)},
        {typeMpegAudio, pid(2), describeComponentTag(3) + secondAudio},
        {streamTypePrivate, pid(3), describeComponentTag(4) + describeSubtitles("deu", ordinarySubtitles)},
        {streamTypePrivate, pid(4), describeComponentTag(5) + secondSubtitles},
        {streamTypeStreamEvents, pid(5), describeComponentTag(testEventTag)},
    };
}

std::string cacheFolder() {
    char* folder = g_build_filename(g_get_user_cache_dir(), "telix", nullptr);
    std::string result = folder;
    g_free(folder);
    return result;
}

// Widens the regions of encoded subtitles. The encoder makes them as wide as what is in them, and the decoder
// takes the end of a line that reaches the end of its region for a fault.
GstPadProbeReturn widenRegions(GstPad* pad, GstPadProbeInfo* info, gpointer data) {
    (void)pad;
    (void)data;
    constexpr uint8_t segmentStart = 0x0F;
    constexpr uint8_t regionSegment = 0x11;
    constexpr gsize segmentHeader = 6;
    constexpr gsize widthOffset = 2; // in the segment
    GstBuffer* buffer = gst_buffer_make_writable(GST_PAD_PROBE_INFO_BUFFER(info));
    GST_PAD_PROBE_INFO_DATA(info) = buffer; // in place of the one that came
    GstMapInfo map;
    if (!gst_buffer_map(buffer, &map, GST_MAP_READWRITE)) {
        return GST_PAD_PROBE_OK;
    }
    gsize at = 2; // behind the identifier of data and stream
    while (at + segmentHeader <= map.size && map.data[at] == segmentStart) {
        uint8_t* width = map.data + at + segmentHeader + widthOffset;
        if (map.data[at + 1] == regionSegment && at + segmentHeader + widthOffset + 2 <= map.size) {
            const unsigned int wider = (static_cast<unsigned int>(width[0]) << 8 | width[1]) + 2;
            width[0] = static_cast<uint8_t>(wider >> 8);
            width[1] = static_cast<uint8_t>(wider);
        }
        at += segmentHeader + (static_cast<gsize>(map.data[at + 4]) << 8 | map.data[at + 5]);
    }
    gst_buffer_unmap(buffer, &map);
    return GST_PAD_PROBE_OK;
}

// Writes the subtitles of one language as a transport stream; false with the reason.
bool makeSubtitles(const SubtitleLanguage& language, const std::string& folder, std::string& error) {
    const std::string stem = folder + "/subtitles-" + language.code;
    const std::string text = std::string("1\n00:00:00,500 --> 00:00:04,500\n") + language.first +
                             "\n\n2\n00:00:05,000 --> 00:00:09,500\n" + language.second +
                             "\n\n3\n00:00:09,600 --> 00:00:09,700\n.\n\n";
    GError* reason = nullptr;
    if (!g_file_set_contents((stem + ".srt").c_str(), text.data(), static_cast<gssize>(text.size()),
                             &reason)) {
        error = reason->message;
        g_error_free(reason);
        return false;
    }
    GstElement* pipeline =
        gst_parse_launch("filesrc name=source ! subparse ! textrender font-desc=\"Sans 24\" ! "
                         "video/x-raw,format=AYUV,width=720,height=576 ! dvbsubenc name=encoder ! mpegtsmux "
                         "! filesink name=sink",
                         &reason);
    if (reason) {
        error = reason->message;
        g_error_free(reason);
        if (pipeline) {
            gst_object_unref(pipeline);
        }
        return false;
    }
    for (const auto& [name, ending] : {std::pair("source", ".srt"), std::pair("sink", ".ts")}) {
        GstElement* element = gst_bin_get_by_name(GST_BIN(pipeline), name);
        g_object_set(element, "location", (stem + ending).c_str(), nullptr);
        gst_object_unref(element);
    }
    GstElement* encoder = gst_bin_get_by_name(GST_BIN(pipeline), "encoder");
    GstPad* encoded = gst_element_get_static_pad(encoder, "src");
    gst_pad_add_probe(encoded, GST_PAD_PROBE_TYPE_BUFFER, widenRegions, nullptr, nullptr);
    gst_object_unref(encoded);
    gst_object_unref(encoder);
    gst_element_set_state(pipeline, GST_STATE_PLAYING);
    GstBus* bus = gst_element_get_bus(pipeline);
    GstMessage* message = gst_bus_timed_pop_filtered(
        bus, 20 * GST_SECOND, static_cast<GstMessageType>(GST_MESSAGE_EOS | GST_MESSAGE_ERROR));
    const bool isDone = message && GST_MESSAGE_TYPE(message) == GST_MESSAGE_EOS;
    if (!isDone) {
        error = "the subtitles could not be made";
    }
    if (message) {
        gst_message_unref(message);
    }
    gst_object_unref(bus);
    gst_element_set_state(pipeline, GST_STATE_NULL);
    gst_object_unref(pipeline);
    return isDone;
}

// The command that makes `file`.
std::vector<std::string> ffmpegCommand(const std::string& folder, const std::string& file) {
    std::vector<std::string> command{"ffmpeg", "-hide_banner", "-loglevel", "error", "-nostdin", "-y"};
    const auto add = [&](std::initializer_list<std::string> more) { command.insert(command.end(), more); };
    const std::vector<TestService>& services = testServices();
    for (const TestService& service : services) {
        add({"-f", "lavfi", "-t", length, "-i", service.picture});
    }
    for (const char* tone : {"sine=f=440:r=48000", "sine=f=880:r=48000"}) {
        add({"-f", "lavfi", "-t", length, "-i", tone});
    }
    for (const SubtitleLanguage& language : subtitleLanguages) {
        add({"-itsoffset", "0.5", "-i", folder + "/subtitles-" + language.code + ".ts"});
    }

    std::string filters;
    std::string low =
        "[" + std::to_string(services.size()) + ":a]volume=0.2,asplit=" + std::to_string(services.size());
    std::string high =
        "[" + std::to_string(services.size() + 1) + ":a]volume=0.2,asplit=" + std::to_string(services.size());
    const std::string subtitles = std::to_string(services.size() + 2);
    const std::string moreSubtitles = std::to_string(services.size() + 3);
    std::vector<std::string> maps;
    int output = 0;
    for (size_t index = 0; index < services.size(); ++index) {
        const std::string number = std::to_string(index);
        filters += "[" + number + ":v]drawtext=text='" + services[index].name +
                   "':x=48:y=48:fontsize=48:fontcolor=white:box=1:boxcolor=black@0.6:boxborderw=12," +
                   "drawtext=text='%{pts\\:hms}':x=w-tw-48:y=48:fontsize=36:fontcolor=white:box=1:" +
                   "boxcolor=black@0.6:boxborderw=12,setsar=64/45[v" + number + "];";
        low += "[l" + number + "]";
        high += "[h" + number + "]";
        for (const std::string& map : {"[v" + number + "]", "[l" + number + "]", "[h" + number + "]",
                                       subtitles + ":s", moreSubtitles + ":s"}) {
            maps.insert(maps.end(),
                        {"-map", map, "-streamid",
                         std::to_string(output) + ":" +
                             std::to_string(services[index].streams[static_cast<size_t>(output) % 5].pid)});
            ++output;
        }
    }
    add({"-filter_complex", filters + low + ";" + high});
    command.insert(command.end(), maps.begin(), maps.end());
    add({"-c:v", "mpeg2video", "-b:v", "1500k", "-maxrate", "2500k", "-bufsize", "1000k", "-g", "12", "-bf",
         "0", "-c:a", "mp2", "-b:a", "128k", "-c:s", "copy"});
    for (size_t index = 0; index < services.size(); ++index) {
        std::string program = "program_num=" + std::to_string(services[index].serviceId);
        for (size_t stream = 0; stream < 5; ++stream) {
            program += ":st=" + std::to_string(index * 5 + stream);
        }
        add({"-program", program});
    }
    // Without the short delays the first picture comes a second late.
    add({"-muxdelay", "0.2", "-muxpreload", "0.2", "-f", "mpegts", file});
    return command;
}

bool runCommand(const std::vector<std::string>& command, std::string& error) {
    std::vector<char*> arguments;
    arguments.reserve(command.size() + 1);
    for (const std::string& argument : command) {
        arguments.push_back(const_cast<char*>(argument.c_str())); // not written to
    }
    arguments.push_back(nullptr);
    GError* reason = nullptr;
    gint status = 0;
    char* said = nullptr;
    bool isGood = g_spawn_sync(nullptr, arguments.data(), nullptr,
                               static_cast<GSpawnFlags>(G_SPAWN_SEARCH_PATH | G_SPAWN_STDOUT_TO_DEV_NULL),
                               nullptr, nullptr, nullptr, &said, &status, &reason) != FALSE;
    isGood = isGood && g_spawn_check_wait_status(status, &reason);
    if (!isGood) {
        error = reason->message;
        if (said && *said) {
            error += std::string(": ") + said;
        }
        g_error_free(reason);
    }
    g_free(said);
    return isGood;
}

} // namespace

const std::vector<TestService>& testServices() {
    // Kept until the process ends: the head-end's thread reads it to the last.
    static const auto& services = *new std::vector<TestService>{
        {101,
         0x0101,
         "Telix One",
         makeStreams(0x0110, describeLanguage("eng", 0), describeSubtitles("eng", ordinarySubtitles)),
         "testsrc2=s=720x576:r=25",
         {"Morning Patterns", "The Colour Hour", "News at the Minute"},
         {0, 3, 9}},
        {102,
         0x0102,
         "Telix Two",
         makeStreams(0x0120, describeLanguage("deu", audioTypeDescription),
                     describeSubtitles("eng", ordinarySubtitles)),
         "smptehdbars=s=720x576:r=25,scroll=h=0.004",
         {"Bars of the World", "Night of the Test Card"},
         {1, 13}},
        {103,
         0x0103,
         "Telix Three",
         makeStreams(0x0130, describeLanguage("eng", 0), describeSubtitles("deu", subtitlesForHardOfHearing)),
         "gradients=s=720x576:r=25:c0=navy:c1=teal:c2=purple:n=3:speed=0.02:seed=1",
         {"Gradients", "Slow Colours", "Fast Colours", "Colours Live"},
         {0, 0, 3, 5}},
    };
    return services;
}

const Bytes& testDeliveryDescriptor() {
    // Satellite: 11.72755 GHz, 19.2 degrees east, horizontal, QPSK, 27.511 megasymbols, inner code 3/4.
    static const auto& descriptor =
        *new Bytes{0x43, 0x0B, 0x11, 0x72, 0x75, 0x51, 0x01, 0x92, 0x81, 0x27, 0x51, 0x11, 0x13};
    return descriptor;
}

EitEvent testProgramme(const TestService& service, int64_t time, uint32_t programmeSeconds, int distance) {
    const int64_t slot = time / programmeSeconds + distance;
    const size_t index = static_cast<size_t>(slot) % service.programmes.size();
    EitEvent event;
    event.id = static_cast<uint16_t>(slot);
    event.start = slot * programmeSeconds;
    event.duration = programmeSeconds;
    event.name = service.programmes[index];
    event.text = std::string("A programme of ") + service.name + ".";
    if (service.ratings[index] != 0) {
        event.ratings.push_back({"DEU", service.ratings[index]});
    }
    return event;
}

std::string makeTestMultiplex(std::string& error) {
    const std::string folder = cacheFolder();
    std::string file = folder + "/" + fileName;
    if (g_file_test(file.c_str(), G_FILE_TEST_IS_REGULAR)) {
        return file;
    }
    if (g_mkdir_with_parents(folder.c_str(), 0700) != 0) {
        error = folder + ": " + g_strerror(errno);
        return "";
    }
    std::fprintf(stderr, "libtelix: making the test multiplex, once, in %s ...\n", folder.c_str());
    // In a folder of its own, so that two sets that start at once do not meet.
    std::string work = folder + "/making-XXXXXX";
    if (!g_mkdtemp(work.data())) {
        error = work + ": " + g_strerror(errno);
        return "";
    }
    bool isMade = true;
    for (const SubtitleLanguage& language : subtitleLanguages) {
        isMade = isMade && makeSubtitles(language, work, error);
    }
    const std::string made = work + "/" + fileName;
    isMade = isMade && runCommand(ffmpegCommand(work, made), error);
    if (isMade && g_rename(made.c_str(), file.c_str()) != 0) {
        error = file + ": " + g_strerror(errno);
        isMade = false;
    }
    for (const SubtitleLanguage& language : subtitleLanguages) {
        for (const char* ending : {".srt", ".ts"}) {
            g_unlink((work + "/subtitles-" + language.code + ending).c_str());
        }
    }
    g_unlink(made.c_str());
    g_rmdir(work.c_str());
    if (!isMade) {
        return "";
    }
    std::fprintf(stderr, "libtelix: the test multiplex is ready\n");
    return file;
}

namespace {

class TestCarousel : public Carousel {
public:
    TestCarousel(uint32_t programmeSeconds, uint32_t streamEventSeconds)
        : m_programmeSeconds(programmeSeconds), m_streamEventSeconds(streamEventSeconds) {
        for (const TestService& service : testServices()) {
            for (const ElementaryStream& stream : service.streams) {
                if (stream.type != streamTypeStreamEvents) {
                    m_sentPids.insert(stream.pid);
                }
            }
        }
    }

    const std::set<uint16_t>& sentPids() const override { return m_sentPids; }

    void appendDue(int64_t now, Bytes& packets) override {
        if (isDue(m_mapsDue, now, 100)) {
            appendMaps(packets);
        }
        if (isDue(m_tablesDue, now, 1000)) {
            appendDescriptions(packets);
            append(packTime(now / 1000), tdtPid, packets);
        }
        if (isDue(m_programmesDue, now, 500)) {
            appendProgrammes(now / 1000, packets);
        }
        if (m_streamEventSeconds != 0 && isDue(m_eventsDue, now, 250)) {
            appendStreamEvents(now / 1000, packets);
        }
    }

private:
    static bool isDue(int64_t& due, int64_t now, int64_t distance) {
        // A clock that was set back must not silence the table.
        if (now < due && due - now <= distance) {
            return false;
        }
        due = now + distance;
        return true;
    }

    void append(const Bytes& section, uint16_t pid, Bytes& packets) {
        const Bytes more = packetsOf(section, pid, m_continuity[pid]);
        packets.insert(packets.end(), more.begin(), more.end());
    }

    void appendMaps(Bytes& packets) {
        Pat pat;
        pat.transportStreamId = testTransportStreamId;
        pat.programmes.emplace_back(0, nitPid);
        for (const TestService& service : testServices()) {
            pat.programmes.emplace_back(service.serviceId, service.mapPid);
        }
        append(pack(pat), patPid, packets);
        for (const TestService& service : testServices()) {
            Pmt pmt;
            pmt.serviceId = service.serviceId;
            pmt.pcrPid = service.streams[0].pid;
            pmt.streams = service.streams;
            append(pack(pmt), service.mapPid, packets);
        }
    }

    void appendDescriptions(Bytes& packets) {
        Nit nit;
        nit.networkId = testOriginalNetworkId;
        nit.name = "Telix Test Network";
        nit.transportStreamId = testTransportStreamId;
        nit.originalNetworkId = testOriginalNetworkId;
        nit.deliveryDescriptor = testDeliveryDescriptor();
        append(pack(nit), nitPid, packets);
        Sdt sdt;
        sdt.transportStreamId = testTransportStreamId;
        sdt.originalNetworkId = testOriginalNetworkId;
        for (const TestService& service : testServices()) {
            sdt.services.push_back({service.serviceId, 1, "Telix", service.name});
        }
        append(pack(sdt), sdtPid, packets);
    }

    void appendProgrammes(int64_t seconds, Bytes& packets) {
        for (const TestService& service : testServices()) {
            for (uint8_t number = 0; number < 2; ++number) {
                Eit eit;
                eit.serviceId = service.serviceId;
                eit.transportStreamId = testTransportStreamId;
                eit.originalNetworkId = testOriginalNetworkId;
                eit.version = static_cast<uint8_t>(seconds / m_programmeSeconds % 32);
                eit.number = number;
                eit.events = {testProgramme(service, seconds, m_programmeSeconds, number)};
                append(pack(eit), eitPid, packets);
            }
        }
    }

    // One event in each period, sent again while its first second lasts.
    void appendStreamEvents(int64_t seconds, Bytes& packets) {
        if (seconds % m_streamEventSeconds != 0) {
            return;
        }
        for (const TestService& service : testServices()) {
            StreamEvent event;
            event.id = testEventId;
            event.version = static_cast<uint8_t>(seconds / m_streamEventSeconds % 32);
            const std::string words = std::string("Red button on ") + service.name;
            event.data.assign(words.begin(), words.end());
            append(pack(event), service.streams.back().pid, packets);
        }
    }

    uint32_t m_programmeSeconds;
    uint32_t m_streamEventSeconds;
    std::set<uint16_t> m_sentPids;
    std::map<uint16_t, uint8_t> m_continuity;
    int64_t m_mapsDue = 0;
    int64_t m_tablesDue = 0;
    int64_t m_programmesDue = 0;
    int64_t m_eventsDue = 0;
};

} // namespace

std::unique_ptr<Carousel> makeTestCarousel(uint32_t programmeSeconds, uint32_t streamEventSeconds) {
    return std::make_unique<TestCarousel>(programmeSeconds, streamEventSeconds);
}

} // namespace desktop
