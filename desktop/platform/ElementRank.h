// Which elements GStreamer takes where several would do.
#ifndef TELIX_DESKTOP_ELEMENTRANK_H
#define TELIX_DESKTOP_ELEMENTRANK_H

#include <gst/gst.h>

namespace desktop {

// Ranks the element of that name, if there is one, in this process. After gst_init; any thread.
inline void setRank(const char* element, guint rank) {
    if (GstPluginFeature* feature = gst_registry_lookup_feature(gst_registry_get(), element)) {
        gst_plugin_feature_set_rank(feature, rank);
        gst_object_unref(feature);
    }
}

} // namespace desktop

#endif
