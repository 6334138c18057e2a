// The newest frame, the view, and the exported functions with which the window reads them.
#include "desktop/platform/Picture.h"

#include <gst/app/gstappsink.h>
#include <gst/video/video.h>

#include <utility>

#include "desktop/platform/Platform.h"

namespace desktop {

namespace {

// The owner of an acquired frame's pixels, until the frame is released.
struct MappedFrame {
    GstSample* sample; // owns a reference
    GstVideoFrame frame;
};

void unref(GstSample* sample) {
    if (sample) {
        gst_sample_unref(sample);
    }
}

// Maps the pixels and describes them in `frame`. Takes the reference; false if the sample is not a video
// frame.
bool mapFrame(GstSample* sample, telix_desktop_frame& frame) {
    GstVideoInfo info;
    auto* mapped = new MappedFrame{sample, {}};
    if (!gst_video_info_from_caps(&info, gst_sample_get_caps(sample)) ||
        !gst_video_frame_map(&mapped->frame, &info, gst_sample_get_buffer(sample), GST_MAP_READ)) {
        gst_sample_unref(sample);
        delete mapped;
        return false;
    }
    frame.pixels = static_cast<const uint8_t*>(GST_VIDEO_FRAME_PLANE_DATA(&mapped->frame, 0));
    frame.width = static_cast<uint32_t>(info.width);
    frame.height = static_cast<uint32_t>(info.height);
    frame.stride = static_cast<uint32_t>(GST_VIDEO_FRAME_PLANE_STRIDE(&mapped->frame, 0));
    guint aspectWidth = 0;
    guint aspectHeight = 0;
    if (gst_video_calculate_display_ratio(&aspectWidth, &aspectHeight, static_cast<guint>(info.width),
                                          static_cast<guint>(info.height), static_cast<guint>(info.par_n),
                                          static_cast<guint>(info.par_d), 1, 1)) {
        frame.aspectWidth = aspectWidth;
        frame.aspectHeight = aspectHeight;
    }
    frame.owner = mapped;
    return true;
}

} // namespace

// The user data of a sink's callbacks.
struct Picture::SinkData {
    Picture& picture;
    Token token;
    uint64_t id;
};

// ---- Presentations

Picture::Token Picture::acquire(const View& view, std::function<void()> onPreempted,
                                std::function<void()> onFirstFrame) {
    std::function<void()> preempt;
    GstSample* oldSample = nullptr;
    Token token = 0;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        token = m_current = ++m_lastToken;
        m_view = view;
        m_isHidden = false;
        oldSample = std::exchange(m_sample, nullptr);
        preempt = std::exchange(m_onPreempted, std::move(onPreempted));
        m_onFirstFrame = std::move(onFirstFrame);
    }
    unref(oldSample);
    if (preempt) {
        preempt();
    }
    wakeUp();
    return token;
}

bool Picture::release(Token token) {
    GstSample* oldSample = nullptr;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (!isCurrentLocked(token)) {
            return false;
        }
        m_current = 0;
        m_onPreempted = nullptr;
        m_onFirstFrame = nullptr;
        oldSample = std::exchange(m_sample, nullptr);
    }
    unref(oldSample);
    wakeUp();
    return true;
}

void Picture::leave(Token token) {
    std::function<void()> onFree;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        onFree = m_onFree;
    }
    if (release(token) && onFree) {
        onFree();
    }
}

void Picture::setOnFree(std::function<void()> onFree) {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_onFree = std::move(onFree);
}

bool Picture::isFree() const {
    std::lock_guard<std::mutex> lock(m_mutex);
    return m_current == 0;
}

void Picture::setView(Token token, const View& view) {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (!isCurrentLocked(token)) {
            return;
        }
        m_view = view;
    }
    wakeUp();
}

void Picture::blank(Token token) {
    GstSample* oldSample = nullptr;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (!isCurrentLocked(token)) {
            return;
        }
        oldSample = std::exchange(m_sample, nullptr);
    }
    unref(oldSample);
    wakeUp();
}

void Picture::setHidden(Token token, bool isHidden) {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (!isCurrentLocked(token) || m_isHidden == isHidden) {
            return;
        }
        m_isHidden = isHidden;
    }
    wakeUp();
}

// ---- Frames

GstElement* Picture::makeSink(Token token) {
    GError* error = nullptr;
    const std::string description = std::string("videoconvert ! appsink name=") + kSinkName +
                                    " caps=video/x-raw,format=BGRx max-buffers=2 drop=true";
    GstElement* bin = gst_parse_bin_from_description(description.c_str(), TRUE, &error);
    g_clear_error(&error);
    if (!bin) {
        return nullptr;
    }
    uint64_t id = 0;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        id = ++m_lastSink;
    }
    blank(token); // the frame of the previous sink
    GstElement* sink = gst_bin_get_by_name(GST_BIN(bin), kSinkName);
    GstAppSinkCallbacks callbacks{};
    callbacks.new_sample = [](GstAppSink* appSink, gpointer data) {
        return onSample(*static_cast<SinkData*>(data), gst_app_sink_try_pull_sample(appSink, 0));
    };
    // The first frame is shown while the pipeline is still paused.
    callbacks.new_preroll = [](GstAppSink* appSink, gpointer data) {
        return onSample(*static_cast<SinkData*>(data), gst_app_sink_try_pull_preroll(appSink, 0));
    };
    gst_app_sink_set_callbacks(GST_APP_SINK(sink), &callbacks, new SinkData{*this, token, id},
                               [](gpointer data) { delete static_cast<SinkData*>(data); });
    gst_object_unref(sink); // the bin owns it
    return bin;
}

// GStreamer's thread. Takes the reference.
GstFlowReturn Picture::onSample(const SinkData& sink, GstSample* sample) {
    if (sample) {
        // A copy without the pixels: the sink reuses its sample, which it cannot while somebody else refers
        // to it.
        GstSample* copy = gst_sample_new(gst_sample_get_buffer(sample), gst_sample_get_caps(sample),
                                         gst_sample_get_segment(sample), nullptr);
        gst_sample_unref(sample);
        sink.picture.showSample(sink, copy);
        gst_sample_unref(copy);
    }
    return GST_FLOW_OK;
}

void Picture::showSample(const SinkData& sink, GstSample* sample) {
    std::function<void()> onFirstFrame;
    GstSample* oldSample = nullptr;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (!isCurrentLocked(sink.token) || sink.id != m_lastSink) {
            return;
        }
        oldSample = std::exchange(m_sample, gst_sample_ref(sample)); // kept until the next frame
        ++m_serial;
        onFirstFrame = std::exchange(m_onFirstFrame, nullptr);
    }
    unref(oldSample);
    wakeUp();
    if (onFirstFrame) {
        onFirstFrame();
    }
}

// ---- The window

void Picture::setWakeup(telix_desktop_wakeup wakeup, void* data) {
    {
        std::lock_guard<std::mutex> lock(m_wakeupMutex);
        m_wakeup = wakeup;
        m_wakeupData = data;
    }
    bool isPresenting = false;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        isPresenting = m_current != 0;
    }
    if (isPresenting) {
        wakeUp();
    }
}

void Picture::wakeUp() {
    std::lock_guard<std::mutex> lock(m_wakeupMutex);
    if (m_wakeup) {
        m_wakeup(m_wakeupData);
    }
}

void Picture::acquireFrame(telix_desktop_frame& frame) {
    frame = {};
    GstSample* sample = describeFrame(frame);
    if (sample && !mapFrame(sample, frame)) {
        frame.visible = 0;
    }
}

// All but the pixels. A new reference to the sample that is to be seen; null if there is none.
GstSample* Picture::describeFrame(telix_desktop_frame& frame) {
    std::lock_guard<std::mutex> lock(m_mutex);
    frame.presenter = m_current != 0 ? m_view.presenter : 0;
    frame.areaX = m_view.x;
    frame.areaY = m_view.y;
    frame.areaWidth = m_view.width;
    frame.areaHeight = m_view.height;
    frame.fullScreen = m_view.fullScreen ? 1 : 0;
    frame.visible = m_current != 0 && m_sample && !m_isHidden ? 1 : 0;
    frame.serial = m_serial;
    return frame.visible != 0 ? gst_sample_ref(m_sample) : nullptr;
}

} // namespace desktop

void telix_desktop_set_wakeup(telix_desktop_wakeup wakeup, void* data) {
    desktop::Platform::instance().picture().setWakeup(wakeup, data);
}

void telix_desktop_acquire_frame(telix_desktop_frame* frame) {
    desktop::Platform::instance().picture().acquireFrame(*frame);
}

uint64_t telix_desktop_newest_presenter(void) {
    return desktop::Platform::instance().picture().newestPresenter();
}

void telix_desktop_release_frame(telix_desktop_frame* frame) {
    if (auto* mapped = static_cast<desktop::MappedFrame*>(frame->owner)) {
        gst_video_frame_unmap(&mapped->frame);
        gst_sample_unref(mapped->sample);
        delete mapped;
    }
    *frame = {};
}
