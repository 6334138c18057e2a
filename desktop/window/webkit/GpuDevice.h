// Whether the machine has a GPU at all.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_GPUDEVICE_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_GPUDEVICE_H

namespace desktop {

// Looks for its device file: without one, OpenGL is a software renderer, which need not be loaded for the
// answer. With one, the display may still be on another machine.
bool hasGpuDevice();

} // namespace desktop

#endif
