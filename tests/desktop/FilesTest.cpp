// Channels from transport stream files. The line-up is read once in a process, so each of these tests needs
// its own.
#include "desktop/platform/Broadcast.h"
#include "desktop/platform/Multiplex.h"
#include "telix/telix_platform.h"

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <gtest/gtest.h>
#include <thread>

using namespace desktop;

namespace {

std::mutex outcomeMutex;
std::condition_variable outcomeCame;
std::vector<std::pair<TELIX_JS_CM_HANDLE, TELIX_ERR_STATE_ENUM_T>> outcomes;

TELIX_RETCODE_ENUM_T add(TELIX_JS_CM_HANDLE channel, TELIX_ERR_STATE_ENUM_T error) {
    {
        std::lock_guard<std::mutex> lock(outcomeMutex);
        outcomes.emplace_back(channel, error);
    }
    outcomeCame.notify_all();
    return 0;
}
TELIX_RETCODE_ENUM_T onChange(TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE channel) {
    return add(channel, TELIX_ERR_STATE_NONE);
}
TELIX_RETCODE_ENUM_T onError(TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE channel, TELIX_ERR_STATE_ENUM_T error) {
    return add(channel, error);
}

class FilesTest : public testing::Test {
protected:
    void SetUp() override {
        const std::string multiplex = std::string(g_get_user_cache_dir()) + "/telix/test-multiplex-1.ts";
        const std::string missing = "/nonexistent/channel.ts";
        const std::string text = g_getenv("TELIX_CONFIG"); // no transport stream
        setenv("TELIX_CHANNELS",
               (multiplex + "#102;" + missing + ";" + text + ";" + multiplex + "#999").c_str(), 1);
        ASSERT_EQ(TELIX_JS_VB_GetHandle(&m_object), 0);
        TELIX_JS_VB_RegisterOnChannelChangeSucceeded(onChange);
        TELIX_JS_VB_RegisterOnChannelChangeError(onError);
        uint32_t count = 0;
        TELIX_JS_CM_HANDLE* handles = nullptr;
        ASSERT_EQ(TELIX_JS_CM_GetChannelList(&count, &handles), 0);
        ASSERT_EQ(count, 4U);
        m_channels.assign(handles, handles + count);
    }

    void TearDown() override {
        TELIX_JS_VB_Release(m_object);
        TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded(onChange);
        TELIX_JS_VB_UnRegisterOnChannelChangeError(onError);
    }

    // Tunes and gives what came of it.
    TELIX_ERR_STATE_ENUM_T tune(TELIX_JS_CM_HANDLE channel) {
        std::unique_lock<std::mutex> lock(outcomeMutex);
        const size_t before = outcomes.size();
        EXPECT_EQ(TELIX_JS_VB_SetChannel(m_object, channel, 0), 0);
        if (!outcomeCame.wait_for(lock, std::chrono::seconds(12), [&] { return outcomes.size() > before; })) {
            ADD_FAILURE() << "no outcome";
            return -1;
        }
        EXPECT_EQ(outcomes[before].first, channel);
        return outcomes[before].second;
    }

    TELIX_JS_VB_HANDLE m_object = 0;
    std::vector<TELIX_JS_CM_HANDLE> m_channels;
};

uint64_t newestSerial() {
    telix_desktop_frame frame{};
    telix_desktop_acquire_frame(&frame);
    const uint64_t serial = frame.serial;
    telix_desktop_release_frame(&frame);
    return serial;
}

TEST_F(FilesTest, ShowsAServiceOfAFileWithoutAGapWhereItBeginsAnew) {
    ASSERT_EQ(tune(m_channels[0]), TELIX_ERR_STATE_NONE);
    uint32_t sid = 0;
    EXPECT_EQ(TELIX_JS_CM_GetSid(m_channels[0], &sid), 0);
    EXPECT_EQ(sid, 102U);
    using Clock = std::chrono::steady_clock;
    const auto begin = Clock::now();
    const uint64_t first = newestSerial();
    uint64_t last = first;
    auto changed = begin;
    auto longest = Clock::duration::zero();
    while (Clock::now() - begin < std::chrono::seconds(12)) { // longer than the file
        if (const uint64_t serial = newestSerial(); serial != last) {
            longest = std::max(longest, Clock::now() - changed);
            changed = Clock::now();
            last = serial;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
    longest = std::max(longest, Clock::now() - changed);
    EXPECT_LT(longest, std::chrono::milliseconds(600));
    EXPECT_GT(last - first, 250U); // of 300
}

TEST_F(FilesTest, TellsWhyAFileOrServiceIsNotShownAndGoesOn) {
    EXPECT_EQ(tune(m_channels[1]), errorNoSignal);
    EXPECT_EQ(tune(m_channels[2]), errorNoSignal);
    EXPECT_EQ(tune(m_channels[3]), errorUnknownChannel);
    EXPECT_EQ(tune(m_channels[0]), TELIX_ERR_STATE_NONE);
}

} // namespace
