// The choice of the audio sink, made once.
#include "desktop/platform/AudioSink.h"

#include <string>

#include "desktop/platform/ElementRank.h"

namespace desktop {

namespace {

constexpr const char* kSilentSink = "fakesink";

// The name of the element with the highest rank that can be opened.
std::string chooseSink() {
    std::string chosen = kSilentSink;
    GstElement* automatic = gst_element_factory_make("autoaudiosink", nullptr);
    if (!automatic) {
        return chosen;
    }
    gst_object_ref_sink(automatic);
    // openalsink reports a missing device on standard error, and uses only devices that other sinks use as
    // well.
    setRank("openalsink", GST_RANK_NONE);
    if (gst_element_set_state(automatic, GST_STATE_READY) != GST_STATE_CHANGE_FAILURE) {
        GstIterator* children = gst_bin_iterate_elements(GST_BIN(automatic));
        GValue value = G_VALUE_INIT;
        if (gst_iterator_next(children, &value) == GST_ITERATOR_OK) {
            auto* child = GST_ELEMENT(g_value_get_object(&value));
            chosen = GST_OBJECT_NAME(gst_element_get_factory(child));
            g_value_unset(&value);
        }
        gst_iterator_free(children);
    }
    gst_element_set_state(automatic, GST_STATE_NULL);
    gst_object_unref(automatic);
    return chosen;
}

} // namespace

GstElement* makeAudioSink() {
    static const auto& name =
        *new std::string(chooseSink()); // never deleted: the platform thread runs until the process ends
    GstElement* sink = gst_element_factory_make(name.c_str(), nullptr);
    if (sink && name == kSilentSink) {
        g_object_set(sink, "sync", TRUE, nullptr);
    }
    return sink;
}

} // namespace desktop
