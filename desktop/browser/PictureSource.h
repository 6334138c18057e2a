// The picture of the platform library that the plug-in has opened: found when it is there, read frame by
// frame.
#ifndef TELIX_DESKTOP_BROWSER_PICTURESOURCE_H
#define TELIX_DESKTOP_BROWSER_PICTURESOURCE_H

#include "desktop/platform/telix_picture.h"

// All functions on the window's thread.
class PictureSource {
public:
    // `wakeup` is called with `data` when something is new, from any thread, as telix_picture.h tells.
    PictureSource(telix_desktop_wakeup wakeup, void* data);
    // Afterwards the wake-up is not running and is never called again.
    ~PictureSource();
    PictureSource(const PictureSource&) = delete;
    PictureSource& operator=(const PictureSource&) = delete;

    // Looks for the library unless it is found already. Costs next to nothing while no library has been
    // loaded since the last time. True from when it is found; a libtelix.so without a picture is none.
    bool find();

    // Takes the newest frame in place of the one before it.
    void refresh();
    // What refresh() has found last; it is valid until the next. Without a library nothing is visible.
    const telix_desktop_frame& frame() const { return m_frame; }

private:
    bool bind(const char* file);

    telix_desktop_wakeup m_wakeup;
    void* m_wakeupData;
    unsigned long long m_loadsSeen = 0;
    telix_desktop_set_wakeup_function m_setWakeup = nullptr;
    telix_desktop_acquire_frame_function m_acquire = nullptr;
    telix_desktop_release_frame_function m_release = nullptr;
    telix_desktop_frame m_frame{};
};

#endif
