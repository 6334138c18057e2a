// The processes that the engine has started.
#include "desktop/window/webkit/ChildProcesses.h"

#include <glib.h>
#include <sys/wait.h>

#include <algorithm>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <system_error>
#include <vector>

namespace desktop {

namespace {

constexpr unsigned kPollMs = 10;

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

// Waits up to the time in milliseconds until all have ended, while the main loop runs, on which the engine
// closes its connections to them. Returns those that have not.
std::vector<pid_t> waitFor(std::vector<pid_t> children, unsigned timeoutMs) {
    const auto hasEnded = [](pid_t child) { return waitpid(child, nullptr, WNOHANG) != 0; };
    for (unsigned time = 0; time < timeoutMs && !children.empty(); time += kPollMs) {
        children.erase(std::remove_if(children.begin(), children.end(), hasEnded), children.end());
        while (g_main_context_iteration(nullptr, FALSE)) {
        }
        g_usleep(kPollMs * G_TIME_SPAN_MILLISECOND);
    }
    return children;
}

} // namespace

void endChildProcesses(unsigned timeoutMs) {
    const auto children = waitFor(childProcesses(), timeoutMs);
    for (const pid_t child : children) {
        kill(child, SIGKILL);
    }
    for (const pid_t child : children) {
        waitpid(child, nullptr, 0);
    }
}

} // namespace desktop
