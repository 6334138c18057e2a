// The log: lines on standard output, switched by the environment variable LOG_MODULE (1 for all, or one
// module's number). Every source file that includes this keeps a cached level and a table of module names of
// its own.
#ifndef TELIX_COMMON_LOG_H
#define TELIX_COMMON_LOG_H

#include <atomic>
#include <cstdlib>

enum class LogModule {
    NONE,
    ALL,
    APP_MGR,
    CONFIG,
    CHANNEL,
    AVCONTROL,
    VIDEOBCAST,
    PROGRAMME,
    PARENTAL,
    COMMON,
    AV_COMP,
    CAPABILITIES,
    DRMAGENT
};

// Refreshes `level` from the environment while it is 0 and returns whether a statement of `module` prints. A
// level of 0 is read again at every statement; any other stays for good. Any thread.
inline bool logWanted(std::atomic<int>& level, LogModule module) {
    int value = level.load(std::memory_order_relaxed);
    if (value == 0) {
        if (const char* text = std::getenv("LOG_MODULE")) {
            value = std::atoi(text);
            level.store(value, std::memory_order_relaxed);
        }
    }
    return value == static_cast<int>(LogModule::ALL) || value == static_cast<int>(module);
}

// Prints one statement, whole even when several threads print. Any thread.
void logPrint(const char* moduleName, const char* functionName, const char* text, ...)
    __attribute__((format(printf, 3, 4)));

[[maybe_unused]] static std::atomic<int> logLevelOfFile{0};
[[maybe_unused]] static const char* const kLogModuleNames[] = {
    "NONE",      "ALL",      "APP_MGR", "CONFIG",  "CHANNEL",      "AVCONTROL", "VIDEOBCAST",
    "PROGRAMME", "PARENTAL", "COMMON",  "AV_COMP", "CAPABILITIES", "DRMAGENT"};

// A statement on behalf of another function, for code that many classes share.
#define PLUGIN_LOG_FOR(module, functionName, ...)                                                            \
    do {                                                                                                     \
        if (logWanted(logLevelOfFile, module)) {                                                             \
            logPrint(kLogModuleNames[static_cast<int>(module)], functionName, __VA_ARGS__);                  \
        }                                                                                                    \
    } while (false)

#define PLUGIN_LOG(module, ...) PLUGIN_LOG_FOR(LogModule::module, __func__, __VA_ARGS__)

#endif
