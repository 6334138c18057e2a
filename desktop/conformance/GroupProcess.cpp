// The child process sends its events through a pipe: a byte of CheckEvent, the message, a null character.
#include "desktop/conformance/GroupProcess.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <glib.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

namespace desktop {

namespace {

constexpr gulong kExitPollInterval = 2000; // microseconds

// ---- The child process

void sendEvent(int pipe, CheckEvent event, const std::string& message) {
    const std::string record = std::string(1, static_cast<char>(event)) + message + '\0';
    for (size_t sent = 0; sent < record.size();) {
        const ssize_t size = write(pipe, record.data() + sent, record.size() - sent);
        if (size < 0 && errno != EINTR) {
            _exit(EXIT_FAILURE);
        }
        sent += static_cast<size_t>(std::max<ssize_t>(size, 0));
    }
}

[[noreturn]] void runChild(const CheckGroup& group, const CheckOptions& options, int pipe) {
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    dup2(STDERR_FILENO, STDOUT_FILENO); // output of the library must not mix with the results
    CheckContext context;
    context.callbackTimeout = std::chrono::seconds(options.callbackTimeout);
    context.media = options.media;
    context.report = [pipe](CheckEvent event, const std::string& message) {
        sendEvent(pipe, event, message);
    };
    context.report(CheckEvent::Started, "the library can be opened");
    std::string error;
    if (!context.library.open(options.file, error)) {
        context.report(CheckEvent::NoLibrary, error);
        std::exit(EXIT_SUCCESS);
    }
    group.run(context);
    context.report(CheckEvent::Started,
                   std::string("a process that has used the library exits normally (") + group.name + ")");
    std::exit(EXIT_SUCCESS); // runs the destructors of the library
}

// ---- The parent process

// Time without any event after which the child counts as hung: a check waits for a few callbacks at most.
int hangTimeout(const CheckOptions& options) {
    return options.callbackTimeout * 4 + 10; // seconds
}

// Hands the complete records to the summary and removes them.
void handleRecords(std::string& input, Summary& summary) {
    for (size_t end = input.find('\0'); end != std::string::npos; end = input.find('\0')) {
        summary.handle(static_cast<CheckEvent>(input[0]), input.substr(1, end - 1));
        input.erase(0, end + 1);
    }
}

// Reads events until the child closes its end of the pipe. False if it hangs.
bool readEvents(int pipe, int timeout, Summary& summary) {
    std::string input;
    for (;;) {
        pollfd ready{pipe, POLLIN, 0};
        const int count = poll(&ready, 1, timeout * 1000);
        if (count < 0 && errno == EINTR) {
            continue;
        }
        if (count <= 0) {
            return false;
        }
        char buffer[4096];
        const ssize_t size = read(pipe, buffer, sizeof(buffer));
        if (size <= 0) {
            return true;
        }
        input.append(buffer, static_cast<size_t>(size));
        handleRecords(input, summary);
    }
}

// Waits for the end of the process, which may close the pipe long before. False if it hangs and is killed.
bool waitForExit(pid_t child, int timeout, int& status) {
    const gint64 end = g_get_monotonic_time() + gint64{timeout} * G_USEC_PER_SEC;
    bool isHung = false;
    while (waitpid(child, &status, WNOHANG) == 0) {
        if (g_get_monotonic_time() > end) {
            isHung = true;
            kill(child, SIGKILL);
        }
        g_usleep(kExitPollInterval);
    }
    return !isHung;
}

// Why the end of the child is unexpected; empty if it is not.
std::string reasonOf(bool isHung, int timeout, int status) {
    if (isHung) {
        return "no progress within " + std::to_string(timeout) + " seconds";
    }
    if (WIFSIGNALED(status)) {
        return std::string("the process ended by a signal: ") + strsignal(WTERMSIG(status));
    }
    return WEXITSTATUS(status) == EXIT_SUCCESS
               ? ""
               : "the process ended with the status " + std::to_string(WEXITSTATUS(status));
}

} // namespace

std::string runGroup(const CheckGroup& group, const CheckOptions& options, Summary& summary) {
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0) {
        return std::string("pipe: ") + std::strerror(errno);
    }
    std::fflush(nullptr); // or the child would write buffered output again
    const pid_t child = fork();
    if (child < 0) {
        std::string reason = std::string("fork: ") + std::strerror(errno);
        close(ends[0]);
        close(ends[1]);
        return reason;
    }
    if (child == 0) {
        close(ends[0]);
        runChild(group, options, ends[1]);
    }
    close(ends[1]);
    const int timeout = hangTimeout(options);
    bool isHung = !readEvents(ends[0], timeout, summary);
    close(ends[0]);
    if (isHung) {
        kill(child, SIGKILL);
    }
    int status = 0;
    isHung = !waitForExit(child, timeout, status) || isHung;
    summary.endGroup(group, reasonOf(isHung, timeout, status));
    return "";
}

} // namespace desktop
