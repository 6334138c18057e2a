// A platform library that lacks one function and, where the machine allows it, has another one without a
// value: both fail, their neighbours work.
#include "tests/loader/LoaderOutput.h"

#include "src/platform/PlatformLoader.h"
#include "tests/support/RecordingPlatform.h"
#include "tests/support/platform/CallSamples.h"

namespace {

constexpr const char* kLibraryFile = TELIX_TEST_LIBRARY_DIRECTORY "/libtelix.so";

// The state is the process's; the first call, whichever test makes it, decides it.
class PartialLibrary : public testing::Test {
protected:
    static void SetUpTestSuite() {
        LoaderOutput output;
        firstResult = TELIX_JS_AV_Pause(1);
        printed = output.printed();
        warnings = output.warnings();
    }

    static TELIX_RETCODE_ENUM_T firstResult;
    static std::string printed;
    static std::vector<std::string> warnings;
};

TELIX_RETCODE_ENUM_T PartialLibrary::firstResult;
std::string PartialLibrary::printed;
std::vector<std::string> PartialLibrary::warnings;

} // namespace

TEST_F(PartialLibrary, TheMissingFunctionIsLoggedOnce) {
    EXPECT_EQ(printed, kLoadLine);
    ASSERT_EQ(warnings.size(), 1U);
    const std::string text = "Failed to get symbol TELIX_JS_AV_Pause: ";
    EXPECT_EQ(warnings[0].substr(0, text.size()), text);
    EXPECT_NE(warnings[0].find("undefined symbol: TELIX_JS_AV_Pause", text.size()), std::string::npos)
        << warnings[0];

    LoaderOutput output;
    EXPECT_EQ(TELIX_JS_AV_Pause(1), 5);
    EXPECT_EQ(output.printed(), "");
    EXPECT_EQ(output.warnings(), std::vector<std::string>{});
}

TEST_F(PartialLibrary, TheMissingFunctionReturnsFive) {
    EXPECT_EQ(firstResult, 5);
    EXPECT_EQ(TELIX_JS_AV_Pause(1), 5);
}

#ifdef TELIX_NULL_FUNCTION
TEST_F(PartialLibrary, AFunctionThatResolvesToNullCountsAsFoundAndReturnsFive) {
    EXPECT_EQ(TELIX_JS_AV_PlaySound(1, 2, 3, 4, 5, 6, 7), 5); // and no word of it among the warnings
    LoaderOutput output;
    void* slot = &slot;
    EXPECT_EQ(resolve_symbol(g_platformModule, TELIX_NULL_FUNCTION, &slot), 1);
    EXPECT_EQ(slot, nullptr);
    EXPECT_EQ(output.warnings(), std::vector<std::string>{});
}
#endif

TEST_F(PartialLibrary, AllOthersReachTheLibrary) {
    RecordingPlatform& platform = recordingPlatformAt(kLibraryFile);
    std::vector<std::string> reached;
    platform.onCall = [&](const std::string& call) { reached.push_back(call.substr(0, call.find('('))); };
#define TELIX_CALL(name, parameters, arguments)                                                              \
    {                                                                                                        \
        ArgumentSource source;                                                                               \
        std::apply(name, CallSignature<decltype(&name)>::sample(source));                                    \
    }
#include "telix/telix_platform_calls.h"

    std::vector<std::string> expected = boundCallNames();
    expected.erase(std::remove(expected.begin(), expected.end(), "TELIX_JS_AV_Pause"), expected.end());
#ifdef TELIX_NULL_FUNCTION
    expected.erase(std::remove(expected.begin(), expected.end(), TELIX_NULL_FUNCTION), expected.end());
#endif
    EXPECT_EQ(reached, expected);
    platform.reset();
}

TEST_F(PartialLibrary, ItsNeighboursWork) {
    RecordingPlatform& platform = recordingPlatformAt(kLibraryFile);
    platform.TELIX_JS_AV_Stop = [](TELIX_JS_AV_HANDLE player) { return player == 7 ? 0 : 1; };
    platform.TELIX_JS_AV_Resume = [](TELIX_JS_AV_HANDLE player) { return player == 7 ? 3 : 0; };
    EXPECT_EQ(TELIX_JS_AV_Stop(7), 0);
    EXPECT_EQ(TELIX_JS_AV_Resume(7), 3);
    platform.reset();
}
