// The sound of the platform library on its way to the window.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_SOUNDSENDER_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_SOUNDSENDER_H

namespace desktop {

// Sends it from now on to the descriptor of the window's SoundChannel; nothing if that is negative. Main
// thread of the web process, once.
void sendSound(int channel);

} // namespace desktop

#endif
