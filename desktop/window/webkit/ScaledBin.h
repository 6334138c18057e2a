// A container that lays out its child at the size of a page, whatever its own size, and shows it scaled.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_SCALEDBIN_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_SCALEDBIN_H

#include <gtk/gtk.h>

namespace desktop {

// Returns a new container, a GtkBin, with a floating reference. The child draws to an offscreen window, so
// scripts see the same geometry in every window. The child's transparent parts show what lies under the
// container. Pointer positions are scaled back.
GtkWidget* newScaledBin();

} // namespace desktop

#endif
