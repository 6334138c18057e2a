// The main functions of the programs that use Google Benchmark.
#ifndef TELIX_BENCH_BENCHMAIN_H
#define TELIX_BENCH_BENCHMAIN_H

#include <benchmark/benchmark.h>

#include <string>

#include "bench/BenchBrowser.h"
#include "common/PluginExports.h"

// Initialises the plug-in and runs the benchmarks that `add(plugin)` registers; `plugin` is the plug-in's
// function table. Returns the exit status of the program.
template <typename Add>
int runBenchmarks(int argc, char** argv, Add add) {
    NPPluginFuncs plugin{};
    plugin.size = sizeof(plugin);
    if (NP_Initialize(&benchBrowserTable(), &plugin) != NPERR_NO_ERROR) {
        return 2;
    }
    benchmark::Initialize(&argc, argv);
    add(plugin);
    benchmark::RunSpecifiedBenchmarks();
    NP_Shutdown();
    return 0;
}

// The same with benchmarks that `registerAll(name, level)` registers, without and with a log level.
inline int runWithAndWithoutLog(int argc, char** argv,
                                void (*registerAll)(const std::string& name, const char* level)) {
    return runBenchmarks(argc, argv, [=](NPPluginFuncs&) {
        registerAll("log unset", nullptr);
        // Last, because the plug-in caches a log level other than 0. No module has this number, so nothing is
        // logged.
        registerAll("log set", "99");
    });
}

#endif
