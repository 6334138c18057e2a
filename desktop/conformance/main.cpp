// telix-conformance: checks a set's platform library against what the plug-in expects of it. The checks run
// in processes of their own, so that a library that crashes or hangs fails them and ends nothing else.
#include "desktop/conformance/Checks.h"

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <glib.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

enum ExitStatus { exitPassed = 0, exitFailed = 1, exitUnusable = 2 };

const char summary[] =
    "Checks LIBRARY, or libtelix.so in the folder LIBRARY, call by call: what exists, results, outputs, "
    "texts,\n"
    "arrays, handles, callbacks and threads, as include/telix/telix_platform.h states them. Each check is "
    "one line:\n"
    "ok, FAIL with the reason, or skip with what it would need. The library's own output goes to standard "
    "error.\n\n"
    "Exit status: 0 all passed, 1 some failed, 2 for a bad command line or a file that is no library.";

struct Arguments {
    std::string file;
    std::string media;
    int waitSeconds = 15;
};

struct Counts {
    unsigned int passed = 0;
    unsigned int failed = 0;
    unsigned int skipped = 0;
};

int reject(const std::string& reason) {
    std::fprintf(stderr, "telix-conformance: %s\n", reason.c_str());
    return exitUnusable;
}

// ---- The process of one group

// Reports through a pipe: the outcome, the text, a zero.
[[noreturn]] void runGroup(const Group& group, const Arguments& arguments, int pipe) {
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    dup2(STDERR_FILENO, STDOUT_FILENO);
    Means means;
    means.wait = std::chrono::seconds(arguments.waitSeconds);
    means.media = arguments.media;
    means.report = [pipe](Outcome outcome, const std::string& text) {
        std::string line(1, static_cast<char>(outcome));
        line += text;
        for (size_t done = 0; done <= line.size();) { // the zero at its end, too
            const ssize_t size = write(pipe, line.c_str() + done, line.size() + 1 - done);
            if (size < 0 && errno != EINTR) {
                _exit(exitFailed);
            }
            done += size > 0 ? static_cast<size_t>(size) : 0;
        }
    };
    means.report(Outcome::begun, "the library can be opened");
    std::string error;
    if (!means.library.open(arguments.file, error)) {
        means.report(Outcome::unusable, error);
        std::exit(exitUnusable);
    }
    group.run(means);
    means.report(Outcome::begun,
                 std::string("a process that has used it ends in order (") + group.name + ")");
    std::exit(exitPassed); // what the library does at the end is part of it
}

// ---- The process that tells

class Teller {
public:
    explicit Teller(Counts& counts) : m_counts(counts) {}

    void take(const std::string& line) {
        const std::string text = line.substr(1);
        switch (static_cast<Outcome>(line[0])) {
        case Outcome::begun:
            m_begun = text;
            return;
        case Outcome::unusable:
            unusable = text;
            break;
        case Outcome::ok:
            tell("ok", text, m_counts.passed);
            break;
        case Outcome::failed:
            tell("FAIL", text, m_counts.failed);
            break;
        case Outcome::skipped:
            tell("skip", text, m_counts.skipped);
            break;
        }
        m_begun.clear();
    }

    // The process is gone, with that status of waitpid.
    void end(const Group& group, int status, bool isHung) {
        std::string reason;
        if (isHung) {
            reason = "it hangs";
        } else if (WIFSIGNALED(status)) {
            reason = std::string("the process ended by a signal: ") + strsignal(WTERMSIG(status));
        } else if (WEXITSTATUS(status) != exitPassed && unusable.empty()) {
            reason = "the process ended with the status " + std::to_string(WEXITSTATUS(status));
        }
        if (!reason.empty()) {
            const bool isInCheck = !m_begun.empty();
            tell("FAIL",
                 (isInCheck ? m_begun : group.name) + ": " + reason + "; the checks of " + group.name +
                     " end here",
                 m_counts.failed);
        }
    }

    std::string unusable; // why nothing can be checked

private:
    static void tell(const char* word, const std::string& text, unsigned int& count) {
        std::printf("%-4s  %s\n", word, text.c_str());
        std::fflush(stdout);
        ++count;
    }

    Counts& m_counts;
    std::string m_begun;
};

// False, with what is wrong in `unusable`, if the file is no library.
bool checkGroup(const Group& group, const Arguments& arguments, Counts& counts, std::string& unusable) {
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0) {
        unusable = std::strerror(errno);
        return false;
    }
    std::fflush(nullptr);
    const pid_t child = fork();
    if (child < 0) {
        unusable = std::strerror(errno);
        return false;
    }
    if (child == 0) {
        close(ends[0]);
        runGroup(group, arguments, ends[1]);
    }
    close(ends[1]);
    Teller teller(counts);
    std::string input;
    bool isHung = false;
    // A check waits for several callbacks at most.
    const int longest = (arguments.waitSeconds * 4 + 10) * 1000;
    for (;;) {
        pollfd ready{ends[0], POLLIN, 0};
        const int count = poll(&ready, 1, longest);
        if (count < 0 && errno == EINTR) {
            continue;
        }
        char piece[4096];
        const ssize_t size = count > 0 ? read(ends[0], piece, sizeof(piece)) : 0;
        if (count <= 0) {
            isHung = true;
            kill(child, SIGKILL);
        }
        if (size <= 0) {
            break;
        }
        input.append(piece, static_cast<size_t>(size));
        for (size_t end = input.find('\0'); end != std::string::npos; end = input.find('\0')) {
            teller.take(input.substr(0, end));
            input.erase(0, end + 1);
        }
    }
    close(ends[0]);
    // The pipe may be closed before the process has ended: it is not waited for without end.
    int status = 0;
    const gint64 limit = g_get_monotonic_time() + gint64{longest} * 1000;
    while (waitpid(child, &status, WNOHANG) == 0) {
        if (g_get_monotonic_time() > limit) {
            isHung = true;
            kill(child, SIGKILL);
        }
        g_usleep(2000);
    }
    teller.end(group, status, isHung);
    unusable = teller.unusable;
    return unusable.empty();
}

// The status to end with if the arguments are not good or ask for nothing.
int readArguments(int argc, char** argv, Arguments& arguments) {
    char* media = nullptr;
    gint wait = arguments.waitSeconds;
    char** files = nullptr;
    const GOptionEntry entries[] = {
        {"media", 'm', 0, G_OPTION_ARG_STRING, &media,
         "Media that the library can play, for the checks of players", "URL"},
        {"wait", 'w', 0, G_OPTION_ARG_INT, &wait, "How long to wait for a callback (15)", "SECONDS"},
        {G_OPTION_REMAINING, 0, 0, G_OPTION_ARG_FILENAME_ARRAY, &files, nullptr, "LIBRARY"},
        {},
    };
    GOptionContext* context = g_option_context_new("- check a platform library");
    g_option_context_set_description(context, summary);
    g_option_context_add_main_entries(context, entries, nullptr);
    GError* error = nullptr;
    const bool isGood = g_option_context_parse(context, &argc, &argv, &error);
    g_option_context_free(context);
    const std::string reason = error ? error->message : "";
    g_clear_error(&error);
    arguments.media = media ? media : "";
    arguments.waitSeconds = wait;
    const guint count = files ? g_strv_length(files) : 0;
    arguments.file = count == 1 ? files[0] : "";
    g_free(media);
    g_strfreev(files);
    if (!isGood) {
        return reject(reason);
    }
    if (count != 1) {
        return reject(count == 0 ? "name a library or its folder (--help tells more)"
                                 : "name one library alone");
    }
    if (wait < 1 || wait > 600) {
        return reject("--wait must be from 1 to 600 seconds");
    }
    if (g_file_test(arguments.file.c_str(), G_FILE_TEST_IS_DIR)) {
        arguments.file += "/libtelix.so";
    }
    if (!g_file_test(arguments.file.c_str(), G_FILE_TEST_EXISTS)) {
        return reject(arguments.file + " does not exist");
    }
    char* absolute =
        g_canonicalize_filename(arguments.file.c_str(), nullptr); // or it is looked for elsewhere
    arguments.file = absolute;
    g_free(absolute);
    return exitPassed;
}

} // namespace

int main(int argc, char** argv) {
    Arguments arguments;
    if (const int status = readArguments(argc, argv, arguments); status != exitPassed) {
        return status;
    }
    Counts counts;
    for (const Group& group : groups()) {
        std::string unusable;
        if (!checkGroup(group, arguments, counts, unusable)) {
            return reject(unusable);
        }
    }
    std::printf("%u ok, %u failed, %u skipped\n", counts.passed, counts.failed, counts.skipped);
    return counts.failed == 0 ? exitPassed : exitFailed;
}
