// The sound of the platform library that the plug-in has loaded.
#ifndef TELIX_DESKTOP_WINDOW_RECORD_SOUNDSOURCE_H
#define TELIX_DESKTOP_WINDOW_RECORD_SOUNDSOURCE_H

#include <functional>

#include "desktop/platform/telix_sound.h"
#include "desktop/window/shared/LibrarySearch.h"
#include "desktop/window/shared/PlatformLibrary.h"

namespace desktop {

// Main thread.
class SoundSource {
public:
    // Called on threads of the library, see telix_sound.h.
    using Listener = std::function<void(const telix_desktop_sound& sound)>;

    // Waits for the library. One without the functions of telix_sound.h is silent.
    explicit SoundSource(Listener listener);
    // Afterwards the listener is not running and is never called again.
    ~SoundSource();
    SoundSource(const SoundSource&) = delete;
    SoundSource& operator=(const SoundSource&) = delete;

private:
    bool find();

    Listener m_listener;
    PlatformLibrary m_library;
    telix_desktop_set_sound_listener_function m_setListener = nullptr;
    LibrarySearch m_search; // starts last: it uses the others
};

} // namespace desktop

#endif
