// What an audio sink plays, for the listener of telix_sound.h.
#ifndef TELIX_DESKTOP_PLATFORM_SOUNDTAP_H
#define TELIX_DESKTOP_PLATFORM_SOUNDTAP_H

#include <gst/gst.h>

namespace desktop {

// Passes on what the sink, a GstBaseSink, gets from now on; costs nothing without a listener. Before the sink
// gets buffers, and after probes that drop some.
void tapSound(GstElement* sink);

} // namespace desktop

#endif
