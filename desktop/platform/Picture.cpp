// Newest frame, display area, and the functions with which the window reads them.
#include "desktop/platform/Picture.h"

#include "desktop/platform/Platform.h"

#include <gst/app/gstappsink.h>
#include <gst/video/video.h>
#include <utility>

namespace desktop {

namespace {

// What an acquired frame holds until it is released.
struct Held {
    GstSample* sample;
    GstVideoFrame frame;
};

void giveBack(GstSample* sample) {
    if (sample) {
        gst_sample_unref(sample);
    }
}

} // namespace

// What a sink needs to know, for as long as its callbacks may run.
struct Picture::Target {
    Picture& picture;
    Token token;
    uint64_t sink;
};

Picture::Token Picture::take(const View& view, std::function<void()> lost, std::function<void()> shown) {
    std::function<void()> formerLost;
    GstSample* formerSample = nullptr;
    Token token = 0;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        token = m_current = ++m_last;
        m_view = view;
        m_isHidden = false;
        formerSample = std::exchange(m_sample, nullptr);
        formerLost = std::exchange(m_lost, std::move(lost));
        m_shown = std::move(shown);
    }
    giveBack(formerSample);
    if (formerLost) {
        formerLost();
    }
    wake();
    return token;
}

void Picture::release(Token token) {
    GstSample* formerSample = nullptr;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (token == 0 || token != m_current) {
            return;
        }
        m_current = 0;
        m_lost = nullptr;
        m_shown = nullptr;
        formerSample = std::exchange(m_sample, nullptr);
    }
    giveBack(formerSample);
    wake();
}

void Picture::place(Token token, const View& view) {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (token == 0 || token != m_current) {
            return;
        }
        m_view = view;
    }
    wake();
}

void Picture::blank(Token token) {
    GstSample* formerSample = nullptr;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (token == 0 || token != m_current) {
            return;
        }
        formerSample = std::exchange(m_sample, nullptr);
    }
    giveBack(formerSample);
    wake();
}

void Picture::hide(Token token, bool isHidden) {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (token == 0 || token != m_current || m_isHidden == isHidden) {
            return;
        }
        m_isHidden = isHidden;
    }
    wake();
}

// Takes the sample over.
GstFlowReturn Picture::showSample(const Target& target, GstSample* sample) {
    if (sample) {
        // One of our own: the sink uses its sample again, and could not change one that somebody holds.
        GstSample* own = gst_sample_new(gst_sample_get_buffer(sample), gst_sample_get_caps(sample),
                                        gst_sample_get_segment(sample), nullptr);
        gst_sample_unref(sample);
        target.picture.show(target, own);
        gst_sample_unref(own);
    }
    return GST_FLOW_OK;
}

void Picture::show(const Target& target, GstSample* sample) {
    std::function<void()> shown;
    GstSample* formerSample = nullptr;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (target.token == 0 || target.token != m_current || target.sink != m_lastSink) {
            return;
        }
        formerSample = std::exchange(m_sample, gst_sample_ref(sample)); // kept until the next one
        ++m_serial;
        shown = std::exchange(m_shown, nullptr);
    }
    giveBack(formerSample);
    wake();
    if (shown) {
        shown();
    }
}

GstElement* Picture::makeSink(Token token) {
    GError* error = nullptr;
    GstElement* bin = gst_parse_bin_from_description(
        "videoconvert ! appsink name=picture caps=video/x-raw,format=BGRx max-buffers=2 drop=true", TRUE,
        &error);
    g_clear_error(&error);
    if (!bin) {
        return nullptr;
    }
    uint64_t number = 0;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        number = ++m_lastSink;
    }
    blank(token); // the sink before shows nothing more
    GstElement* sink = gst_bin_get_by_name(GST_BIN(bin), "picture");
    GstAppSinkCallbacks callbacks{};
    callbacks.new_sample = [](GstAppSink* appSink, gpointer target) {
        return showSample(*static_cast<Target*>(target), gst_app_sink_try_pull_sample(appSink, 0));
    };
    // The first frame is shown while the pipeline still waits to begin.
    callbacks.new_preroll = [](GstAppSink* appSink, gpointer target) {
        return showSample(*static_cast<Target*>(target), gst_app_sink_try_pull_preroll(appSink, 0));
    };
    gst_app_sink_set_callbacks(GST_APP_SINK(sink), &callbacks, new Target{*this, token, number},
                               [](gpointer target) { delete static_cast<Target*>(target); });
    gst_object_unref(sink); // the bin keeps it
    return bin;
}

void Picture::setWakeup(telix_desktop_wakeup wakeup, void* data) {
    {
        std::lock_guard<std::mutex> lock(m_wakeupMutex);
        m_wakeup = wakeup;
        m_wakeupData = data;
    }
    bool visible = false;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        visible = m_current != 0;
    }
    if (visible) {
        wake();
    }
}

void Picture::wake() {
    std::lock_guard<std::mutex> lock(m_wakeupMutex);
    if (m_wakeup) {
        m_wakeup(m_wakeupData);
    }
}

void Picture::acquire(telix_desktop_frame& frame) {
    frame = {};
    GstSample* sample = nullptr;
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        frame.areaX = m_view.x;
        frame.areaY = m_view.y;
        frame.areaWidth = m_view.width;
        frame.areaHeight = m_view.height;
        frame.fullScreen = m_view.fullScreen ? 1 : 0;
        frame.visible = m_current != 0 && m_sample && !m_isHidden ? 1 : 0;
        frame.serial = m_serial;
        if (frame.visible) {
            sample = gst_sample_ref(m_sample); // the record's, until it is released
        }
    }
    if (!sample) {
        return;
    }
    GstVideoInfo info;
    auto* held = new Held{sample, {}};
    if (!gst_video_info_from_caps(&info, gst_sample_get_caps(sample)) ||
        !gst_video_frame_map(&held->frame, &info, gst_sample_get_buffer(sample), GST_MAP_READ)) {
        gst_sample_unref(sample);
        delete held;
        frame.visible = 0;
        return;
    }
    frame.pixels = static_cast<const uint8_t*>(GST_VIDEO_FRAME_PLANE_DATA(&held->frame, 0));
    frame.width = static_cast<uint32_t>(info.width);
    frame.height = static_cast<uint32_t>(info.height);
    frame.stride = static_cast<uint32_t>(GST_VIDEO_FRAME_PLANE_STRIDE(&held->frame, 0));
    guint aspectWidth = 0;
    guint aspectHeight = 0;
    if (gst_video_calculate_display_ratio(&aspectWidth, &aspectHeight, static_cast<guint>(info.width),
                                          static_cast<guint>(info.height), static_cast<guint>(info.par_n),
                                          static_cast<guint>(info.par_d), 1, 1)) {
        frame.aspectWidth = aspectWidth;
        frame.aspectHeight = aspectHeight;
    }
    frame.owner = held;
}

} // namespace desktop

void telix_desktop_set_wakeup(telix_desktop_wakeup wakeup, void* data) {
    desktop::Platform::instance().picture().setWakeup(wakeup, data);
}

void telix_desktop_acquire_frame(telix_desktop_frame* frame) {
    desktop::Platform::instance().picture().acquire(*frame);
}

void telix_desktop_release_frame(telix_desktop_frame* frame) {
    if (auto* held = static_cast<desktop::Held*>(frame->owner)) {
        gst_video_frame_unmap(&held->frame);
        gst_sample_unref(held->sample);
        delete held;
    }
    *frame = {};
}
