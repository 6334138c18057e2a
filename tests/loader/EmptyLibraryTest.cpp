// A platform library without a single function of the interface: it is closed and never tried again.
#include "tests/loader/LoaderOutput.h"

#include "src/platform/PlatformLoader.h"
#include "tests/support/platform/CallSamples.h"

#include <dlfcn.h>

namespace {

// The state is the process's; the first call, whichever test makes it, decides it.
class EmptyLibrary : public testing::Test {
protected:
    static void SetUpTestSuite() {
        LoaderOutput output;
        firstResult = TELIX_JS_APP_GetFreeMem(&freeMemory);
        printed = output.printed();
        warnings = output.warnings();
    }

    static uint32_t freeMemory;
    static TELIX_RETCODE_ENUM_T firstResult;
    static std::string printed;
    static std::vector<std::string> warnings;
};

uint32_t EmptyLibrary::freeMemory = 4711;
TELIX_RETCODE_ENUM_T EmptyLibrary::firstResult;
std::string EmptyLibrary::printed;
std::vector<std::string> EmptyLibrary::warnings;

std::string family(const std::string& name) {
    const std::string prefix = "TELIX_JS_";
    return name.substr(prefix.size(), name.find('_', prefix.size()) - prefix.size());
}

} // namespace

TEST_F(EmptyLibrary, EachOfTheFunctionsIsLookedUpOnceInFamilyOrder) {
    EXPECT_EQ(printed, kLoadLine);
    std::vector<std::string> names;
    std::vector<std::string> families;
    for (const std::string& warning : warnings) {
        const std::string text = "Failed to get symbol ";
        ASSERT_EQ(warning.substr(0, text.size()), text);
        names.push_back(warning.substr(text.size(), warning.find(':') - text.size()));
        if (families.empty() || families.back() != family(names.back())) {
            families.push_back(family(names.back()));
        }
    }
    EXPECT_EQ(names.size(), 120U);
    EXPECT_EQ(names, boundCallNames());
    EXPECT_EQ(families, (std::vector<std::string>{"APP", "AV", "CAP", "CM", "SI", "VB", "DRM"}));
}

TEST_F(EmptyLibrary, TheFirstCallReturnsFiveAndLeavesItsOutputAlone) {
    EXPECT_EQ(firstResult, 5);
    EXPECT_EQ(freeMemory, 4711U);
}

TEST_F(EmptyLibrary, TheLibraryIsClosedButTheHandleStays) {
    EXPECT_NE(g_platformModule, nullptr);
    EXPECT_EQ(dlopen(TELIX_TEST_LIBRARY_DIRECTORY "/libtelix.so", RTLD_LAZY | RTLD_NOLOAD), nullptr);
}

TEST_F(EmptyLibrary, NoFurtherLoadIsTriedAndEveryCallReturnsFive) {
    LoaderOutput output;
    EXPECT_EQ(should_load_telix_library(), 1);
#define TELIX_CALL(name, parameters, arguments)                                                              \
    {                                                                                                        \
        ArgumentSource source;                                                                               \
        EXPECT_EQ(std::apply(name, CallSignature<decltype(&name)>::sample(source)), 5) << #name;             \
        EXPECT_TRUE(source.isUntouched()) << #name;                                                          \
    }
#include "telix/telix_platform_calls.h"
    EXPECT_EQ(output.printed(), "");
    EXPECT_EQ(output.warnings(), std::vector<std::string>{});
}
