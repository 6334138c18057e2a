// Records what the viewer sees and hears as an MP4 file.
#ifndef TELIX_DESKTOP_WINDOW_RECORD_RECORDER_H
#define TELIX_DESKTOP_WINDOW_RECORD_RECORDER_H

#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <string>

#include "desktop/platform/telix_sound.h"
#include "desktop/window/record/SoundTrack.h"

using GstElement = struct _GstElement;

namespace desktop {

// H.264 with 25 frames of 1280x720 pixels a second, and AAC. A machine that is too slow repeats frames. The
// file can be played at any time, also if the process is killed. Main thread, unless a function says
// otherwise.
class Recorder {
public:
    // Paints the page's 1280x720 pixels of 4 bytes: blue, green, red, unused. `stride` is in bytes.
    using Paint = std::function<void(uint8_t* pixels, int stride)>;

    // Creates the file and starts to record on GLib's default main context. Null, and in `error` the reason,
    // if the file or an encoder is missing.
    static std::unique_ptr<Recorder> start(const std::string& file, Paint paint, std::string& error);
    ~Recorder();
    Recorder(const Recorder&) = delete;
    Recorder& operator=(const Recorder&) = delete;

    // Adds sound. Any thread.
    void addSound(const telix_desktop_sound& sound);

    // Ends the recording and completes the file. Returns the reason if that has failed, or what has failed
    // before; empty if all is well.
    std::string finish();

private:
    Recorder(GstElement* pipeline, Paint paint);

    void record(int64_t time, int64_t soundDelay);
    void recordFrame(int64_t frame);
    void recordSound(int64_t until);
    void stop();

    Paint m_paint;
    GstElement* m_pipeline; // owns a reference, as of the next two
    GstElement* m_picture;
    GstElement* m_sound;
    int64_t m_start; // nanoseconds of CLOCK_MONOTONIC
    int64_t m_lastFrame = -1;
    unsigned m_timer = 0;
    std::mutex m_mutex; // guards the track
    SoundTrack m_track;
};

} // namespace desktop

#endif
