// The signalling of the current channel as the parameters of a message.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_SIGNALLINGMESSAGE_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_SIGNALLINGMESSAGE_H

#include <glib.h>

#include "desktop/window/shared/SignalledApplications.h"

namespace desktop {

// A floating reference.
GVariant* variantOf(const Signalling& signalling);

// The reverse, of what variantOf() has made.
Signalling signallingOf(GVariant* variant);

} // namespace desktop

#endif
