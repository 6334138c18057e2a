// A set without the platform library: the plug-in lives, and each platform call fails by itself.
#include "tests/loader/LoaderOutput.h"

#include "src/platform/PlatformLoader.h"
#include "tests/support/platform/CallSamples.h"

namespace {

const std::vector<std::string> kNotFound{
    "Library:: libtelix.so, not found in the path " TELIX_TEST_LIBRARY_DIRECTORY " .\n"};

template <class Function>
void expectRefusal(const char* name, Function* forwarder) {
    SCOPED_TRACE(name);
    LoaderOutput output;
    ArgumentSource source;
    EXPECT_EQ(std::apply(forwarder, CallSignature<Function*>::sample(source)), 5);
    EXPECT_TRUE(source.isUntouched());
    EXPECT_EQ(output.printed(), kLoadLine);
    EXPECT_EQ(output.warnings(), kNotFound);
}

} // namespace

TEST(AbsentLibrary, EveryCallReturnsFiveLeavesItsOutputsAloneAndTriesToLoadAgain) {
#define TELIX_CALL(name, parameters, arguments) expectRefusal(#name, name);
#include "telix/telix_platform_calls.h"
}

TEST(AbsentLibrary, ShouldLoadSaysNoAndKeepsNoHandle) {
    LoaderOutput output;
    EXPECT_EQ(should_load_telix_library(), 0);
    EXPECT_EQ(should_load_telix_library(), 0);
    EXPECT_EQ(g_platformModule, nullptr);
    EXPECT_EQ(output.printed(), std::string(kLoadLine) + kLoadLine);
    EXPECT_EQ(output.warnings().size(), 2U);
}

TEST(AbsentLibrary, LoadLibraryNamesFileAndDirectory) {
    LoaderOutput output;
    EXPECT_EQ(load_library("/nowhere/at/all", "libother.so"), 0);
    EXPECT_EQ(output.warnings(),
              std::vector<std::string>{"Library:: libother.so, not found in the path /nowhere/at/all .\n"});
}
