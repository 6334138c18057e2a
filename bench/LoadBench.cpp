// What loading the plug-in and a page with all seven objects take: CPU time and heap. Each round is a process
// of its own that, like a browser, has GLib before; of the times the fastest round counts, heap is the same
// in all. The page does not run script: it makes and deletes the objects. Usage: load_bench PLUGIN [ROUNDS]
#include <dlfcn.h>
#include <glib.h>
#include <gmodule.h>
#include <malloc.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <iterator>

#include "bench/BenchBrowser.h"

namespace {

constexpr int kFailed = 2;
constexpr int kDefaultRounds = 50;

const char* const kTypes[] = {"application/oipfapplicationmanager",
                              "application/oipfconfiguration",
                              "application/oipfcapabilities",
                              "application/oipfparentalcontrolmanager",
                              "application/oipfdrmagent",
                              "video/broadcast",
                              "video/mp4"};

// CPU microseconds of the process, and bytes of its heap in use.
struct Cost {
    double time = 0;
    long heap = 0;
};

Cost costSoFar() {
    timespec time;
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &time);
    const struct mallinfo2 heap = mallinfo2();
    return {static_cast<double>(time.tv_sec) * 1e6 + static_cast<double>(time.tv_nsec) / 1e3,
            static_cast<long>(heap.uordblks + heap.hblkhd)};
}

struct Round {
    Cost load; // the file, and its initialisation
    Cost page; // the objects of the page, with the platform library, which the first of them loads
};

[[noreturn]] void fail(const char* what, const char* why) {
    std::fprintf(stderr, "load_bench: %s: %s\n", what, why);
    std::_Exit(kFailed);
}

template <class Function>
Function* entryPoint(void* plugin, const char* name) {
    void* address = dlsym(plugin, name);
    if (!address) {
        fail(name, "not exported by the plug-in");
    }
    return reinterpret_cast<Function*>(address);
}

NPPluginFuncs initialise(const char* file) {
    void* plugin = dlopen(file, RTLD_NOW | RTLD_LOCAL);
    if (!plugin) {
        fail(file, dlerror());
    }
    NPPluginFuncs functions{};
    functions.size = sizeof(functions);
    auto* initialisation = entryPoint<NPError(NPNetscapeFuncs*, NPPluginFuncs*)>(plugin, "NP_Initialize");
    if (initialisation(&benchBrowserTable(), &functions) != NPERR_NO_ERROR) {
        fail(file, "NP_Initialize returned an error");
    }
    return functions;
}

void create(const NPPluginFuncs& functions, const char* type, NPP_t& instance) {
    NPObject* object = nullptr;
    char* const mimeType = const_cast<char*>(type);
    if (functions.newp(mimeType, &instance, NP_EMBED, 0, nullptr, nullptr, nullptr) != NPERR_NO_ERROR ||
        functions.getvalue(&instance, NPPVpluginScriptableNPObject, &object) != NPERR_NO_ERROR) {
        fail(type, "the plug-in makes no object");
    }
    benchBrowserTable().releaseobject(object);
}

Cost difference(const Cost& before, const Cost& after) {
    return {after.time - before.time, after.heap - before.heap};
}

Round measure(const char* file) {
    const Cost start = costSoFar();
    const NPPluginFuncs functions = initialise(file);
    const Cost loaded = costSoFar();
    NPP_t instances[std::size(kTypes)] = {};
    for (size_t n = 0; n < std::size(kTypes); ++n) {
        create(functions, kTypes[n], instances[n]);
    }
    const Cost made = costSoFar();
    for (NPP_t& instance : instances) {
        functions.destroy(&instance, nullptr);
    }
    const Cost deleted = costSoFar();
    Round round{difference(start, loaded), difference(loaded, made)};
    round.page.time = deleted.time - loaded.time;
    return round;
}

// Runs a round in a process of its own, whose output is not this program's.
Round measureApart(const char* file) {
    int ends[2];
    if (pipe(ends) != 0) {
        fail("pipe", "cannot be made");
    }
    const pid_t child = fork();
    if (child == 0) {
        const Round round = std::freopen("/dev/null", "w", stdout) ? measure(file) : Round{};
        const bool written = write(ends[1], &round, sizeof(round)) == sizeof(round);
        std::_Exit(written ? EXIT_SUCCESS : kFailed);
    }
    close(ends[1]);
    Round round{};
    const bool complete = read(ends[0], &round, sizeof(round)) == sizeof(round);
    close(ends[0]);
    int status = 0;
    waitpid(child, &status, 0);
    if (!complete || status != 0) {
        std::exit(kFailed); // the child has said why
    }
    return round;
}

} // namespace

int main(int argc, char** argv) {
    const int rounds = argc == 3 ? std::atoi(argv[2]) : kDefaultRounds;
    if (argc < 2 || argc > 3 || rounds < 1) {
        fail("usage", "load_bench PLUGIN [ROUNDS]");
    }
    g_module_open(nullptr, G_MODULE_BIND_LAZY);
    g_main_context_default();
    Round best = measureApart(argv[1]);
    for (int n = 1; n < rounds; ++n) {
        const Round round = measureApart(argv[1]);
        best.load.time = std::min(best.load.time, round.load.time);
        best.page.time = std::min(best.page.time, round.page.time);
    }
    std::printf("load_us %.0f\nload_heap %ld\npage_us %.0f\npage_heap %ld\n", best.load.time, best.load.heap,
                best.page.time, best.page.heap);
}
