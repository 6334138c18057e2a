// The audio output.
#ifndef TELIX_DESKTOP_PLATFORM_AUDIOSINK_H
#define TELIX_DESKTOP_PLATFORM_AUDIOSINK_H

#include <gst/gst.h>

namespace desktop {

// A sink for the system's audio, or a silent one with a clock if there is no audio device. A floating
// reference; null if the element is missing. Platform thread; the first call opens the audio device for a
// moment.
GstElement* makeAudioSink();

} // namespace desktop

#endif
