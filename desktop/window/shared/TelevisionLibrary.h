// The desktop's platform library as the window uses it: channels, keys, volume and signalled applications.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_TELEVISIONLIBRARY_H
#define TELIX_DESKTOP_WINDOW_SHARED_TELEVISIONLIBRARY_H

#include <cstdint>
#include <string>

#include "desktop/platform/telix_viewer.h"
#include "desktop/window/shared/PlatformLibrary.h"
#include "desktop/window/shared/SignalledApplications.h"

namespace desktop {

// What a television starts with.
struct TelevisionStart {
    uint32_t channel = 0;       // to be on; 0: the library's choice
    std::string signalUrl;      // page to signal; empty: none
    uint32_t signalChannel = 0; // that signals it; 0: the one that is on
    uint32_t volume = 100;
};

// In the process of the library. All functions are for one thread.
class TelevisionLibrary {
public:
    struct Channel {
        uint32_t number = 0; // 0: none
        std::string name;
    };

    // Loads the library of a plug-in before the plug-in does, if it lies beside it and has the functions: the
    // channel is there before any object.
    void loadBeside(const std::string& plugin);
    // Whether the library is loaded and has the functions. The other ones need it to be.
    bool find();

    // Presents the channel that is on from now on, and calls `wakeup` on any thread when signalling()
    // changes. Returns what is wrong with `start`; empty if nothing is.
    std::string start(const TelevisionStart& start, telix_desktop_applications_wakeup wakeup, void* data);
    // Afterwards the wake-up is not running and is never called again.
    void stop();

    uint32_t keySet() const { return m_keySet(); }
    Channel channel() const;
    void tune(uint32_t number) const { m_tune(number); }
    // After the last channel follows the first.
    void step(int positions) const;
    void setVolume(uint32_t volume) const { m_setVolume(volume); }
    Signalling signalling() const;

private:
    PlatformLibrary m_library;
    bool m_hasFunctions = false;
    telix_desktop_key_set_function m_keySet = nullptr;
    telix_desktop_channel_function m_channel = nullptr;
    telix_desktop_channel_count_function m_channelCount = nullptr;
    telix_desktop_channel_name_function m_channelName = nullptr;
    telix_desktop_tune_function m_tune = nullptr;
    telix_desktop_present_channel_function m_present = nullptr;
    telix_desktop_set_volume_function m_setVolume = nullptr;
    telix_desktop_set_applications_wakeup_function m_setWakeup = nullptr;
    telix_desktop_acquire_applications_function m_acquire = nullptr;
    telix_desktop_release_applications_function m_release = nullptr;
    telix_desktop_signal_application_function m_signal = nullptr;
};

} // namespace desktop

#endif
