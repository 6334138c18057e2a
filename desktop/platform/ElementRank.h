// Which element GStreamer chooses where several can do the work.
#ifndef TELIX_DESKTOP_PLATFORM_ELEMENTRANK_H
#define TELIX_DESKTOP_PLATFORM_ELEMENTRANK_H

#include <gst/gst.h>

namespace desktop {

// Sets the rank of an element in this process; does nothing if the element is not installed. After
// gst_init(); any thread.
inline void setRank(const char* element, guint rank) {
    if (GstPluginFeature* feature = gst_registry_lookup_feature(gst_registry_get(), element)) {
        gst_plugin_feature_set_rank(feature, rank);
        gst_object_unref(feature);
    }
}

} // namespace desktop

#endif
