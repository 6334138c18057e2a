// The plug-in as it is shipped: what the shared object shows, what it needs, and that it finds the platform
// library at the place that is fixed for a set.
#include "tests/loader/LoaderOutput.h"

#include "tests/support/RecordingPlatform.h"
#include "tests/support/platform/CallSamples.h"

#include <cerrno>
#include <cstring>
#include <dlfcn.h>
#include <filesystem>
#include <sched.h>
#include <set>
#include <sstream>
#include <sys/mount.h>
#include <unistd.h>

namespace {

std::string outputOfCommand(const std::string& command) {
    FILE* pipe = popen(command.c_str(), "r");
    std::string output;
    for (int character = fgetc(pipe); character != EOF; character = fgetc(pipe)) {
        output += static_cast<char>(character);
    }
    EXPECT_EQ(pclose(pipe), 0) << command;
    return output;
}

// The last word of each line that holds `mark`.
std::multiset<std::string> lastWords(const std::string& text, const std::string& mark = "") {
    std::multiset<std::string> words;
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);) {
        if (line.find(mark) != std::string::npos) {
            words.insert(line.substr(line.find_last_of(' ') + 1));
        }
    }
    return words;
}

// Gives this process file systems of its own, with an empty place for the platform library. False without the
// right to do so.
bool makeEmptySet(const std::filesystem::path& directory) {
    if (unshare(CLONE_NEWNS) != 0 || mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
        mount("tmpfs", "/mnt", "tmpfs", 0, nullptr) != 0) {
        return false;
    }
    return std::filesystem::create_directories(directory);
}

template <class Function>
Function* forwarderOf(void* plugin, const char* name) {
    return reinterpret_cast<Function*>(dlsym(plugin, name));
}

} // namespace

TEST(SharedObject, ExportsTheEntryPointsTheGatesAndTheForwardersAndNothingElse) {
    std::multiset<std::string> expected{
        "NP_Initialize",    "NP_GetValue",     "NP_Shutdown",   "NP_GetMIMEDescription",
        "NPP_Initialize",   "NPP_Shutdown",    "NPP_GetValue",  "NPP_GetMIMEDescription",
        "NPP_SetValue",     "NPP_New",         "NPP_Destroy",   "NPP_SetWindow",
        "NPP_NewStream",    "NPP_WriteReady",  "NPP_Write",     "NPP_DestroyStream",
        "NPP_StreamAsFile", "NPP_HandleEvent", "NPP_URLNotify", "NPP_Print"};
    const std::vector<std::string> forwarders = callNames();
    EXPECT_EQ(forwarders.size(), 121U);
    expected.insert(forwarders.begin(), forwarders.end());
    // On MIPS, the dynamic symbols include local ones, because of the global offset table.
    EXPECT_EQ(lastWords(outputOfCommand(TELIX_TEST_NM " -D --defined-only --extern-only " TELIX_TEST_PLUGIN)),
              expected);
}

TEST(SharedObject, NeedsGLibGModuleAndTheRunTimeLibrariesOnly) {
#ifdef TELIX_TEST_SANITIZED
    constexpr bool kIsSanitized = true;
#else
    constexpr bool kIsSanitized = false;
#endif
    const std::set<std::string> allowed{"[libglib-2.0.so.0]", "[libgmodule-2.0.so.0]", "[libc.so.6]",
                                        "[libm.so.6]",        "[libstdc++.so.6]",      "[libgcc_s.so.1]",
                                        "[libpthread.so.0]"};
    const auto needed = lastWords(outputOfCommand(TELIX_TEST_READELF " -d " TELIX_TEST_PLUGIN), "(NEEDED)");
    EXPECT_EQ(needed.count("[libgmodule-2.0.so.0]"), 1U);
    for (const std::string& library : needed) {
        const bool isSanitizer = kIsSanitized && library.find("san.so") != std::string::npos;
        const bool isDynamicLinker = library.rfind("[ld-linux", 0) == 0 || library == "[ld.so.1]";
        EXPECT_TRUE(isSanitizer || isDynamicLinker || allowed.count(library) != 0) << library;
    }
}

TEST(SharedObject, FindsTheLibraryAtTheFixedPlaceOfASet) {
    const std::filesystem::path directory = "/mnt/browser/lib/TV";
    if (!makeEmptySet(directory)) {
        GTEST_SKIP() << "needs root and the right to mount: " << strerror(errno);
    }
    void* plugin = dlopen(TELIX_TEST_PLUGIN, RTLD_NOW | RTLD_LOCAL);
    ASSERT_NE(plugin, nullptr) << dlerror();
    LoaderOutput output;
    auto* stop = forwarderOf<decltype(TELIX_JS_AV_Stop)>(plugin, "TELIX_JS_AV_Stop");
    EXPECT_EQ(stop(1), 5);
    EXPECT_EQ(output.printed(), kLoadLine);
    EXPECT_EQ(output.warnings(), std::vector<std::string>{
                                     "Library:: libtelix.so, not found in the path /mnt/browser/lib/TV .\n"});

    std::filesystem::copy_file(TELIX_TEST_COMPLETE_LIBRARY, directory / "libtelix.so");
    RecordingPlatform& platform = recordingPlatformAt(directory / "libtelix.so");
    platform.defaultResult = 77;
    std::vector<std::string> reached;
    platform.onCall = [&](const std::string& call) { reached.push_back(call.substr(0, call.find('('))); };
#define TELIX_CALL(name, parameters, arguments)                                                              \
    {                                                                                                        \
        ArgumentSource source;                                                                               \
        auto* forwarder = forwarderOf<decltype(name)>(plugin, #name);                                        \
        EXPECT_EQ(std::apply(forwarder, CallSignature<decltype(&name)>::sample(source)), 77) << #name;       \
    }
#define TELIX_CALL_UNBOUND(name, parameters, arguments)                                                      \
    EXPECT_EQ(forwarderOf<decltype(name)>(plugin, #name)(1), 5) << #name;
#include "telix/telix_platform_calls.h"
    EXPECT_EQ(reached, boundCallNames());
    EXPECT_EQ(output.printed(), kLoadLine);
    EXPECT_EQ(output.warnings(), std::vector<std::string>{});
    platform.reset();
}
