// The recording of a run: --record.
#include "desktop/window/record/Recording.h"

#include "desktop/window/record/Recorder.h"
#include "desktop/window/shared/CommandLine.h"
#include "desktop/window/shared/Diagnostics.h"
#include "desktop/window/shared/ScriptedWindow.h"

namespace desktop {

Recording::Recording(ScriptedWindow& window, const CommandLine& commandLine)
    : m_file(commandLine.record.value_or("")) {
    if (!commandLine.record) {
        return;
    }
    std::string error;
    m_recorder = Recorder::start(
        m_file, [&window](uint8_t* pixels, int stride) { window.paint(pixels, stride); }, error);
    m_hasFailed = !m_recorder;
    if (m_hasFailed) {
        printError("--record " + m_file + ": " + error);
    }
}

Recording::~Recording() = default;

void Recording::addSound(const telix_desktop_sound& sound) {
    m_recorder->addSound(sound);
}

int Recording::finish(int status) {
    const std::string error = m_recorder ? m_recorder->finish() : "";
    if (error.empty()) {
        return status;
    }
    printError("--record " + m_file + ": " + error);
    return status == kExitSuccess ? kExitBadInput : status;
}

} // namespace desktop
