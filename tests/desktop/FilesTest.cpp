// Channels from transport stream files. A process reads its channel list once, so each of these tests needs a
// process of its own.
#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <thread>

#include <gtest/gtest.h>

#include "desktop/platform/Broadcast.h"
#include "desktop/platform/Multiplex.h"
#include "telix/telix_platform.h"
#include "tests/desktop/LineUpTest.h"
#include "tests/support/TemporaryFolder.h"

using namespace desktop;

namespace {

class FilesTest : public LineUpTest {
protected:
    void SetUp() override {
        const std::string multiplex = std::string(g_get_user_cache_dir()) + "/telix/test-multiplex-1.ts";
        const std::string missing = "/nonexistent/channel.ts";
        const std::string text = g_getenv("TELIX_CONFIG"); // not a transport stream
        start(multiplex + "#102;" + missing + ";" + text + ";" + multiplex + "#999", 4);
    }
};

// Transport streams of another multiplexer, with other encodings.
class FormatsTest : public LineUpTest {
protected:
    // Has ffmpeg make a transport stream of 3 seconds.
    std::string make(const std::string& name, const std::string& arguments) const {
        const std::string file = m_folder.file(name);
        const std::string command =
            "ffmpeg -hide_banner -loglevel error -nostdin " + arguments + " -t 3 -f mpegts " + file;
        EXPECT_EQ(std::system(command.c_str()), 0) << command;
        return file;
    }

    static std::vector<std::string> encodings(TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPTYPE type) {
        TELIX_JS_AVCOMPHANDLE* handles = nullptr;
        uint32_t count = 0;
        EXPECT_EQ(TELIX_JS_VB_GetComponents(object, type, &handles, &count), 0);
        std::vector<std::string> found;
        for (const TELIX_JS_AVCOMPHANDLE handle : std::vector(handles, handles + count)) {
            char* text = nullptr;
            EXPECT_EQ(TELIX_JS_VB_AVComponent_GetEncoding(handle, type, &text), 0);
            found.push_back(textOf(text));
        }
        return found;
    }

    TemporaryFolder m_folder;
};

uint64_t newestSerial() {
    telix_desktop_frame frame{};
    telix_desktop_acquire_frame(&frame);
    const uint64_t serial = frame.serial;
    telix_desktop_release_frame(&frame);
    return serial;
}

// Waits until the first pixel has this colour.
bool showsColour(uint8_t red, uint8_t green, uint8_t blue) {
    const auto isNear = [](uint8_t left, uint8_t right) { return std::abs(left - right) < 16; };
    return waitUntil([&] {
        telix_desktop_frame frame{};
        telix_desktop_acquire_frame(&frame);
        const bool isShown = frame.visible != 0 && isNear(frame.pixels[0], blue) &&
                             isNear(frame.pixels[1], green) && isNear(frame.pixels[2], red);
        telix_desktop_release_frame(&frame);
        return isShown;
    });
}

TEST_F(FilesTest, ShowsAServiceOfAFileWithoutAGapWhereItBeginsAnew) {
    ASSERT_EQ(tune(m_channels[0]), TELIX_ERR_STATE_NONE);
    uint32_t sid = 0;
    EXPECT_EQ(TELIX_JS_CM_GetSid(m_channels[0], &sid), 0);
    EXPECT_EQ(sid, 102U);
    // Every stretch that is longer than the file (250 frames) has a gap if there is one where the file begins
    // again. A machine under load makes gaps of its own, here and there: one stretch without any is enough.
    using Clock = std::chrono::steady_clock;
    constexpr uint64_t kFrames = 300;
    constexpr auto kGap = std::chrono::milliseconds(600);
    uint64_t first = newestSerial();
    uint64_t last = first;
    auto changed = Clock::now();
    const auto hasStretch = [&] {
        const uint64_t serial = newestSerial();
        const auto now = Clock::now();
        if (now - changed > kGap) {
            first = serial;
        }
        if (serial != last) {
            last = serial;
            changed = now;
        }
        return last - first >= kFrames;
    };
    EXPECT_TRUE(waitUntil(hasStretch, 200));
    EXPECT_EQ(outcomes.all().size(), 1U) << "the file was tuned to again";
}

TEST_F(FilesTest, TellsWhyAFileOrServiceIsNotShownAndGoesOn) {
    EXPECT_EQ(tune(m_channels[1]), kErrorNoSignal);
    EXPECT_EQ(tune(m_channels[2]), kErrorNoSignal);
    EXPECT_EQ(tune(m_channels[3]), kErrorUnknownChannel);
    EXPECT_EQ(tune(m_channels[0]), TELIX_ERR_STATE_NONE);
}

TEST_F(FormatsTest, ShowsAndNamesTheFormatsOfOtherStreams) {
    const std::string picture = " -f lavfi -i color=c=0x2040c0:size=320x180:rate=25";
    const std::string sound = " -f lavfi -i sine=frequency=440:sample_rate=48000";
    const std::string avc = make("avc.ts", picture + sound + " -c:v libx264 -g 12 -pix_fmt yuv420p -c:a aac");
    const std::string hevc =
        make("hevc.ts", picture + sound +
                            " -c:v libx265 -x265-params log-level=none:keyint=12 -pix_fmt yuv420p -c:a ac3");
    start(avc + ";" + hevc, 2);
    ASSERT_EQ(tune(m_channels[0]), TELIX_ERR_STATE_NONE);
    EXPECT_TRUE(showsColour(0x20, 0x40, 0xC0));
    EXPECT_EQ(encodings(m_object, TELIX_JS_AVCOMPTYPE_VIDEO), std::vector<std::string>{"AVC"});
    EXPECT_EQ(encodings(m_object, TELIX_JS_AVCOMPTYPE_AUDIO), std::vector<std::string>{"HEAAC"});
    ASSERT_EQ(tune(m_channels[1]), TELIX_ERR_STATE_NONE);
    EXPECT_TRUE(showsColour(0x20, 0x40, 0xC0));
    EXPECT_EQ(encodings(m_object, TELIX_JS_AVCOMPTYPE_VIDEO), std::vector<std::string>{"HEVC"});
    EXPECT_EQ(encodings(m_object, TELIX_JS_AVCOMPTYPE_AUDIO), std::vector<std::string>{"AC3"});
}

TEST_F(FormatsTest, PresentsRadioWithoutAPicture) {
    start(make("radio.ts", "-f lavfi -i sine=frequency=440:sample_rate=48000 -c:a mp2 "
                           "-mpegts_service_type digital_radio -metadata service_name=Wave"),
          1);
    int32_t type = -1;
    EXPECT_EQ(TELIX_JS_CM_GetChannelType(m_channels[0], &type), 0);
    EXPECT_EQ(type, 1);
    ASSERT_EQ(tune(m_channels[0]), TELIX_ERR_STATE_NONE);
    EXPECT_EQ(newestSerial(), 0U);
    EXPECT_TRUE(encodings(m_object, TELIX_JS_AVCOMPTYPE_VIDEO).empty());
    EXPECT_EQ(encodings(m_object, TELIX_JS_AVCOMPTYPE_AUDIO).size(), 1U);
}

} // namespace
