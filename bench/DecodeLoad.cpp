// Decodes a transport stream in real time without showing it, and prints the processor time that took per
// second: the least that the television can need. Usage: decode_load FILE.ts SECONDS
#include <gst/gst.h>
#include <sys/resource.h>

#include <cstdio>
#include <cstdlib>
#include <string>

namespace {

double usedSeconds() {
    rusage usage{};
    getrusage(RUSAGE_SELF, &usage);
    const auto seconds = [](const timeval& time) {
        return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) / 1e6;
    };
    return seconds(usage.ru_utime) + seconds(usage.ru_stime);
}

} // namespace

int main(int argc, char* argv[]) {
    const int seconds = argc == 3 ? std::atoi(argv[2]) : 0;
    if (seconds <= 0) {
        std::fprintf(stderr, "Usage: %s FILE.ts SECONDS\n", argv[0]);
        return 2;
    }
    gst_init(nullptr, nullptr);
    // The elements and formats of the television: frames in the format of the window, decoded audio.
    const std::string description = "filesrc location=\"" + std::string(argv[1]) +
                                    "\" ! tsdemux name=streams"
                                    " streams. ! queue ! mpegvideoparse ! avdec_mpeg2video ! videoconvert ! "
                                    "video/x-raw,format=BGRx ! fakesink sync=true"
                                    " streams. ! queue ! mpegaudioparse ! mpg123audiodec ! audioconvert ! "
                                    "audioresample ! fakesink sync=true";
    GError* error = nullptr;
    GstElement* pipeline = gst_parse_launch(description.c_str(), &error);
    if (!pipeline || error) {
        std::fprintf(stderr, "%s: %s\n", argv[0], error ? error->message : "no pipeline");
        return 2;
    }
    gst_element_set_state(pipeline, GST_STATE_PLAYING);
    if (gst_element_get_state(pipeline, nullptr, nullptr, 10 * GST_SECOND) != GST_STATE_CHANGE_SUCCESS) {
        std::fprintf(stderr, "%s: %s: the pipeline does not preroll\n", argv[0], argv[1]);
        return 2;
    }
    const double before = usedSeconds();
    GstBus* bus = gst_element_get_bus(pipeline);
    GstMessage* message =
        gst_bus_timed_pop_filtered(bus, static_cast<guint64>(seconds) * GST_SECOND,
                                   static_cast<GstMessageType>(GST_MESSAGE_ERROR | GST_MESSAGE_EOS));
    if (message) {
        std::fprintf(stderr, "%s: %s: the stream ended or failed too early\n", argv[0], argv[1]);
        return 2;
    }
    std::printf("%.4f\n", (usedSeconds() - before) / seconds);
    gst_object_unref(bus);
    gst_element_set_state(pipeline, GST_STATE_NULL);
    gst_object_unref(pipeline);
    return 0;
}
