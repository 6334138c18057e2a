// The recording of a run: --record.
#ifndef TELIX_DESKTOP_WINDOW_RECORD_RECORDING_H
#define TELIX_DESKTOP_WINDOW_RECORD_RECORDING_H

#include <memory>
#include <string>

#include "desktop/platform/telix_sound.h"

namespace desktop {

class Recorder;
class ScriptedWindow;
struct CommandLine;

// Main thread.
class Recording {
public:
    // Records the window if the command line asks for it. The references must outlive the object.
    Recording(ScriptedWindow& window, const CommandLine& commandLine);
    ~Recording();
    Recording(const Recording&) = delete;
    Recording& operator=(const Recording&) = delete;

    // Whether the command line asks for a recording that cannot begin, which has been printed.
    bool hasFailed() const { return m_hasFailed; }
    bool isActive() const { return m_recorder != nullptr; }

    // Any thread; while the recording is active.
    void addSound(const telix_desktop_sound& sound);

    // Completes the file. Returns the exit status of a run that has ended with `status`.
    int finish(int status);

private:
    const std::string m_file;
    std::unique_ptr<Recorder> m_recorder; // null: no recording
    bool m_hasFailed = false;
};

} // namespace desktop

#endif
