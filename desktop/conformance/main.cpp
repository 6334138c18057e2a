// telix-conformance: checks the platform library of a television set against what the plug-in expects of it.
#include <clocale>
#include <cstdio>
#include <glib.h>
#include <stdexcept>

#include "desktop/conformance/GroupProcess.h"

namespace desktop {

namespace {

enum class ExitStatus { Passed = 0, Failed = 1, BadInput = 2 };

constexpr gint kMaxCallbackTimeout = 600; // seconds

const char kDescription[] =
    "Checks LIBRARY, or libtelix.so in the folder LIBRARY, call by call: functions, return codes, outputs,\n"
    "strings, arrays, handles, callbacks and threads, as include/telix/telix_platform.h describes them. "
    "Each\n"
    "check prints one line: ok, FAIL with the reason, or skip with the missing precondition. Output of the\n"
    "library goes to standard error.\n\n"
    "Exit status: 0 no check has failed; 1 a check has failed; 2 bad command line, or not a library.";

// Bad input on the command line.
class UsageError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

// What GOption writes to.
struct Arguments {
    char* media = nullptr;
    gint wait = CheckOptions().callbackTimeout;
    char** files = nullptr;

    Arguments() = default;
    Arguments(const Arguments&) = delete;
    Arguments& operator=(const Arguments&) = delete;
    ~Arguments() {
        g_free(media);
        g_strfreev(files);
    }
};

void parse(int argc, char** argv, Arguments& arguments) {
    const GOptionEntry entries[] = {
        {"media", 'm', 0, G_OPTION_ARG_STRING, &arguments.media,
         "Media that the library can play, for the checks of playback (default: none)", "URL"},
        {"wait", 'w', 0, G_OPTION_ARG_INT, &arguments.wait, "Callback timeout (default: 15)", "SECONDS"},
        {G_OPTION_REMAINING, 0, 0, G_OPTION_ARG_FILENAME_ARRAY, &arguments.files, nullptr, "LIBRARY"},
        {},
    };
    GOptionContext* context = g_option_context_new("- check a platform library");
    g_option_context_set_description(context, kDescription);
    g_option_context_add_main_entries(context, entries, nullptr);
    GError* error = nullptr;
    g_option_context_parse(context, &argc, &argv, &error);
    g_option_context_free(context);
    if (error) {
        const std::string reason = error->message;
        g_error_free(error);
        throw UsageError(reason);
    }
}

// The absolute path of the library: dlopen would search for a relative one elsewhere.
std::string pathOf(std::string file) {
    if (g_file_test(file.c_str(), G_FILE_TEST_IS_DIR)) {
        file += "/libtelix.so";
    }
    if (!g_file_test(file.c_str(), G_FILE_TEST_EXISTS)) {
        throw UsageError(file + ": No such file");
    }
    char* absolute = g_canonicalize_filename(file.c_str(), nullptr);
    std::string path = absolute;
    g_free(absolute);
    return path;
}

// Prints the help text and exits the process if it is asked for.
CheckOptions optionsOf(int argc, char** argv) {
    Arguments arguments;
    parse(argc, argv, arguments);
    const guint count = arguments.files ? g_strv_length(arguments.files) : 0;
    if (count == 0) {
        throw UsageError("LIBRARY is missing (see telix-conformance --help)");
    }
    if (count > 1) {
        throw UsageError(std::string("unexpected argument \"") + arguments.files[1] + "\"");
    }
    if (arguments.wait < 1 || arguments.wait > kMaxCallbackTimeout) {
        throw UsageError("--wait: \"" + std::to_string(arguments.wait) +
                         "\" is not a whole number from 1 to " + std::to_string(kMaxCallbackTimeout));
    }
    return {pathOf(arguments.files[0]), arguments.media ? arguments.media : "", arguments.wait};
}

ExitStatus run(const CheckOptions& options) {
    Summary summary;
    for (const CheckGroup& group : checkGroups()) {
        const std::string error = runGroup(group, options, summary);
        if (!error.empty() || !summary.noLibraryReason().empty()) {
            throw UsageError(error.empty() ? summary.noLibraryReason() : error);
        }
    }
    summary.printTotal();
    return summary.hasFailures() ? ExitStatus::Failed : ExitStatus::Passed;
}

} // namespace

} // namespace desktop

int main(int argc, char** argv) {
    std::setlocale(LC_CTYPE, ""); // of the help text
    desktop::ExitStatus status = desktop::ExitStatus::BadInput;
    try {
        status = desktop::run(desktop::optionsOf(argc, argv));
    } catch (const desktop::UsageError& error) {
        std::fprintf(stderr, "telix-conformance: %s\n", error.what());
    }
    return static_cast<int>(status);
}
