// How late the buffers of a sink are, and the beginning of the sound only once it is in time.
#ifndef TELIX_DESKTOP_PLATFORM_SINKTIMING_H
#define TELIX_DESKTOP_PLATFORM_SINKTIMING_H

#include <gst/gst.h>

#include <atomic>
#include <chrono>
#include <optional>

namespace desktop {

// Any thread. It must outlive the pipeline of the sink.
class SinkTiming {
public:
    enum class LateStart {
        Present, // late buffers are presented at once
        Drop,    // they are dropped up to the first one in time
    };

    // A sound that is no later than this counts as in time.
    static constexpr auto kTolerance = std::chrono::milliseconds(40);

    // After so much dropped media the sink starts all the same: the machine is too slow for being in time.
    static constexpr auto kMaxDropped = std::chrono::seconds(2);

    explicit SinkTiming(LateStart lateStart) : m_isStarted(lateStart == LateStart::Present) {}
    SinkTiming(const SinkTiming&) = delete;
    SinkTiming& operator=(const SinkTiming&) = delete;

    // `sink` is a GstBaseSink in a pipeline. Once, before it gets buffers.
    void observe(GstElement* sink);

    // Of the last buffer that was presented; negative if it had to wait for its time. Nothing before the
    // first one.
    std::optional<std::chrono::milliseconds> lateness() const;

private:
    static GstPadProbeReturn onBuffer(GstPad* pad, GstPadProbeInfo* info, gpointer timing);
    GstPadProbeReturn onLateness(GstClockTimeDiff lateness, GstClockTime runningTime);

    GstElement* m_sink = nullptr; // owned by the pipeline
    bool m_isStarted;             // used by the streaming thread alone, like the next one
    GstClockTime m_firstDropped = GST_CLOCK_TIME_NONE;
    std::atomic<bool> m_hasPresented{false};
    std::atomic<GstClockTimeDiff> m_lateness{0};
};

} // namespace desktop

#endif
