// The ids that the windows give to elements of the plug-in without one, because the plug-in sends events only
// to elements with an id.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_ELEMENTID_H
#define TELIX_DESKTOP_WINDOW_SHARED_ELEMENTID_H

namespace desktop {

constexpr char kElementIdPrefix[] = "telix-object-";

} // namespace desktop

#endif
