// The processes that the engine has started.
#include "desktop/window/webkit/ChildProcesses.h"

#include <sys/wait.h>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <system_error>
#include <vector>

namespace desktop {

namespace {

// Those of all threads: the kernel lists children by the thread that has started them.
std::vector<pid_t> childProcesses() {
    std::vector<pid_t> children;
    std::error_code ignored;
    for (const auto& thread : std::filesystem::directory_iterator("/proc/self/task", ignored)) {
        std::ifstream list(thread.path() / "children");
        for (pid_t child = 0; list >> child;) {
            children.push_back(child);
        }
    }
    return children;
}

} // namespace

void endChildProcesses() {
    const auto children = childProcesses();
    for (const pid_t child : children) {
        kill(child, SIGKILL);
    }
    for (const pid_t child : children) {
        waitpid(child, nullptr, 0);
    }
}

} // namespace desktop
