// telix-tv: starts the window of the desktop television on the engine that --engine selects.
#include <glib.h>
#include <unistd.h>

#include <cerrno>
#include <clocale>
#include <cstring>

#include "desktop/window/shared/CommandLine.h"
#include "desktop/window/shared/Diagnostics.h"
#include "desktop/window/shared/ProgramFolder.h"

namespace desktop {

namespace {

// The default first. Each has a program of its own beside this one.
const char* const kEngines[] = {"webkit", "npapi"};

std::string programOf(const std::string& engine) {
    return besideProgram("telix-tv-" + engine);
}

bool isBuilt(const std::string& engine) {
    return access(programOf(engine).c_str(), X_OK) == 0;
}

// The engine to start; empty, after a message, if there is none.
std::string selectEngine(const std::string& wanted) {
    for (const char* engine : kEngines) {
        if ((wanted.empty() || wanted == engine) && isBuilt(engine)) {
            return engine;
        }
    }
    for (const char* engine : kEngines) {
        if (wanted == engine) {
            printError("--engine: the engine \"" + wanted + "\" is not built");
            return {};
        }
    }
    printError(wanted.empty() ? "no engine is built"
                              : "--engine: unknown engine \"" + wanted + "\", expected webkit or npapi");
    return {};
}

// The C library takes large blocks from the machine one by one, until the first one is freed; from then on it
// takes them from its heaps, which keep what is freed. With the frames of one clip after the other the heaps
// of the process of the pages would grow and grow. So the limit stays what it is at the start, 128 KiB,
// unless the user has set another one.
void returnLargeBlocks() {
    g_setenv("MALLOC_MMAP_THRESHOLD_", "131072", FALSE);
}

} // namespace

} // namespace desktop

int main(int argc, char* argv[]) {
    std::setlocale(LC_ALL, "");
    const auto wanted = desktop::earlyOptions({argv, argv + argc}).engine;
    const std::string engine = desktop::selectEngine(wanted);
    if (engine.empty()) {
        return desktop::kExitBadInput;
    }
    desktop::returnLargeBlocks();
    const std::string program = desktop::programOf(engine);
    execv(program.c_str(), argv);
    desktop::printError("cannot start " + program + ": " + std::strerror(errno));
    return desktop::kExitBadInput;
}
