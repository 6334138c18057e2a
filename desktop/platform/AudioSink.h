// Where sound goes.
#ifndef TELIX_DESKTOP_AUDIOSINK_H
#define TELIX_DESKTOP_AUDIOSINK_H

#include <gst/gst.h>

namespace desktop {

// A sink for the system's audio if there is one, else one that is silent and keeps time. The reference is
// floating. Platform thread; the first call tries the system's audio out.
GstElement* makeAudioSink();

} // namespace desktop

#endif
