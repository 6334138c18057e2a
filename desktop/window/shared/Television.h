// What a television does by itself, whatever its window's toolkit: the keys that no page gets, the on-screen
// display that answers them, the applications that the broadcast signals, and warnings.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_TELEVISION_H
#define TELIX_DESKTOP_WINDOW_SHARED_TELEVISION_H

#include <cstdint>
#include <functional>
#include <string>

#include "desktop/window/shared/RemoteControl.h"
#include "desktop/window/shared/SignalledApplications.h"
#include "desktop/window/shared/Warnings.h"

namespace desktop {

// Main thread.
class Television {
public:
    // The timer of the channel number that is being typed.
    struct Timer {
        // Calls `onEnd` after that time, unless it is started again or stopped before.
        std::function<void(unsigned milliseconds, std::function<void()> onEnd)> start;
        std::function<void()> stop;
    };

    // Digits that follow one another within this time are one number.
    static constexpr unsigned kDigitMilliseconds = 1500;

    // Receives the channel that is on then; 0 and an empty name if there is none.
    using OnChannel = std::function<void(uint32_t number, const std::string& name)>;

    // The functions of telix_viewer.h, which may be in another process: they call `done` at once or later,
    // not at all without a library.
    struct Library {
        // Tunes to a channel by its number.
        std::function<void(uint32_t number, OnChannel done)> tune;
        // Tunes to a channel by its position after the one that is on.
        std::function<void(int positions, OnChannel done)> step;
        std::function<void(uint32_t volume)> setVolume;
    };

    // `display` shows a text of the on-screen display for some seconds.
    Television(Library library, SignalledApplications::Window window,
               std::function<void(const std::string& text)> display, Timer timer);
    ~Television();
    Television(const Television&) = delete;
    Television& operator=(const Television&) = delete;

    // A key that no page gets has been pressed. The number that digits form selects a channel when no other
    // follows in time, at the most digits that a number has, or with OK; any other key discards it. `page`:
    // of the topmost application.
    void onKey(const RemoteKey& key, const Warnings::Page& page = {});
    // The signalling has changed, or a channel is selected.
    void onSignalling(Signalling signalling);
    // An application has left the window's stack.
    void onEnded(SignalledApplications::Application application);

    // 0 to 100, for a library that starts again.
    uint32_t volume() const { return m_volume; }

    SignalledApplications& applications() { return m_applications; }
    const SignalledApplications& applications() const { return m_applications; }
    Warnings& warnings() { return m_warnings; }

private:
    enum class Action {
        SelectTyped,
        ChannelUp,
        ChannelDown,
        VolumeUp,
        VolumeDown,
        Mute,
        Exit,
        Start,
        StartUnlessRunning
    };
    struct KeyAction {
        const char* key;
        Action action;
    };
    static const KeyAction kActions[];

    void onDigit(char digit);
    void selectTypedChannel();
    OnChannel showChannel() const;
    void perform(Action action);
    void setVolume(uint32_t volume);

    Library m_library;
    std::function<void(const std::string& text)> m_display;
    Timer m_timer;
    SignalledApplications m_applications;
    std::string m_digits; // of the channel number that is being typed
    Warnings m_warnings;
    uint32_t m_volume = 100;
    uint32_t m_volumeBeforeMute = 0; // 0: not muted
};

} // namespace desktop

#endif
