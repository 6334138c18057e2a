// A platform library that turns up while the plug-in is running, and one that is there from the start.
#include "tests/loader/LoaderOutput.h"

#include "src/platform/PlatformLoader.h"
#include "tests/support/RecordingPlatform.h"

#include <filesystem>

TEST(LateLibrary, IsPickedUpByTheNextCallAndLoadedOnce) {
    const std::filesystem::path directory = TELIX_TEST_LIBRARY_DIRECTORY;
    std::filesystem::remove_all(directory);
    LoaderOutput output;

    EXPECT_EQ(TELIX_JS_AV_Stop(7), 5);
    EXPECT_EQ(output.printed(), kLoadLine);
    EXPECT_EQ(output.warnings().size(), 1U);
    EXPECT_EQ(TELIX_JS_AV_Stop(7), 5);
    EXPECT_EQ(output.printed(), kLoadLine);
    EXPECT_EQ(output.warnings().size(), 1U);

    std::filesystem::create_directories(directory);
    std::filesystem::copy_file(TELIX_TEST_COMPLETE_LIBRARY, directory / "libtelix.so");
    RecordingPlatform& platform = recordingPlatformAt(directory / "libtelix.so");
    platform.TELIX_JS_AV_Stop = [](TELIX_JS_AV_HANDLE player) { return player == 7 ? 42 : 0; };

    EXPECT_EQ(TELIX_JS_AV_Stop(7), 42);
    EXPECT_EQ(output.printed(), kLoadLine);
    EXPECT_EQ(TELIX_JS_AV_Stop(7), 42);
    EXPECT_EQ(should_load_telix_library(), 1);
    EXPECT_EQ(output.printed(), "");
    EXPECT_EQ(output.warnings(), std::vector<std::string>{});
    EXPECT_EQ(platform.TELIX_JS_AV_Stop.count(), 2U);
}
