// What the tuners of the set receive besides the channel that is on: the multiplexes of its neighbours.
#include <gmock/gmock.h>
#include <unistd.h>

#include <chrono>
#include <fstream>
#include <future>

#include "desktop/platform/Broadcast.h"
#include "tests/desktop/LineUpTest.h"
#include "tests/desktop/ManualClock.h"
#include "tests/support/TemporaryFolder.h"

using namespace desktop;
using testing::ElementsAre;
using testing::UnorderedElementsAre;

namespace {

constexpr auto kMoment = std::chrono::seconds(1); // after which a channel has been on for a moment
const char* const kOff = "";

BroadcastClock& testClock() {
    static auto* const clock = new BroadcastClock(0); // broadcast uses it until the process ends
    return *clock;
}

void flushPlatformThread() {
    std::promise<void> isDone;
    Platform::instance().post([&] { isDone.set_value(); });
    isDone.get_future().wait();
}

// Channels of three files, each a multiplex of its own.
class TunersTest : public LineUpTest {
protected:
    void SetUp() override {
        Broadcast::useClock(testClock());
        const std::string multiplex = std::string(g_get_user_cache_dir()) + "/telix/test-multiplex-1.ts";
        for (const char* name : {"a", "b", "c"}) {
            ASSERT_EQ(symlink(multiplex.c_str(), file(name).c_str()), 0);
        }
    }

    std::string file(const std::string& name) const { return m_folder.file(name); }

    void startWithTuners(uint32_t tuners, const std::string& lineUp, uint32_t channels) {
        std::ofstream(file("tv.conf")) << "[set]\nsignal-timeout=3600\ntuners=" << tuners << "\n";
        setenv("TELIX_CONFIG", file("tv.conf").c_str(), 1);
        start(lineUp, channels);
    }

    // A service of each file.
    void startWithThreeFiles(uint32_t tuners) {
        startWithTuners(tuners, file("a") + "#101;" + file("b") + "#102;" + file("c") + "#103", 3);
    }

    static std::vector<std::string> multiplexes() {
        std::vector<std::string> files;
        for (const BroadcastSource::Reception& each : Broadcast::instance().state().tuners) {
            files.push_back(each.file);
        }
        return files;
    }

    static std::string selectedMultiplex() {
        for (const BroadcastSource::Reception& each : Broadcast::instance().state().tuners) {
            if (each.isSelected) {
                return each.file;
            }
        }
        return "";
    }

    static void advance() {
        flushPlatformThread();
        testClock().advance(kMoment);
        flushPlatformThread();
    }

    // Tunes, and lets the channel be on for a moment.
    void watch(TELIX_JS_CM_HANDLE channel) {
        ASSERT_EQ(tune(channel), TELIX_ERR_STATE_NONE);
        advance();
    }

    TemporaryFolder m_folder;
};

TEST_F(TunersTest, ReceiveTheFollowingChannelWhenOneHasBeenOnForAMoment) {
    startWithThreeFiles(2);
    ASSERT_EQ(tune(m_channels[0]), TELIX_ERR_STATE_NONE);
    flushPlatformThread();
    EXPECT_THAT(multiplexes(), ElementsAre(file("a"), kOff));
    advance();
    EXPECT_THAT(multiplexes(), ElementsAre(file("a"), file("b")));
    EXPECT_EQ(selectedMultiplex(), file("a"));
    EXPECT_TRUE(waitUntil([] { return Broadcast::instance().state().tuners[1].keptSize > 0; }));
}

TEST_F(TunersTest, ReceiveBothNeighboursIfThereAreThree) {
    startWithThreeFiles(3);
    watch(m_channels[0]);
    EXPECT_THAT(multiplexes(), ElementsAre(file("a"), file("b"), file("c")));
    EXPECT_EQ(selectedMultiplex(), file("a"));
}

TEST_F(TunersTest, TakeOverAReceivedNeighbourAndGoOnInTheSameDirection) {
    startWithThreeFiles(2);
    watch(m_channels[0]);
    ASSERT_TRUE(waitUntil([] { return Broadcast::instance().state().tuners[1].keptSize > 0; }));
    ASSERT_EQ(tune(m_channels[1]), TELIX_ERR_STATE_NONE);
    EXPECT_EQ(selectedMultiplex(), file("b"));
    EXPECT_THAT(multiplexes(), ElementsAre(file("a"), file("b"))); // the way back is instant, too
    advance();
    EXPECT_THAT(multiplexes(), ElementsAre(file("c"), file("b")));
    EXPECT_EQ(selectedMultiplex(), file("b"));
}

TEST_F(TunersTest, ReceiveTheChannelBeforeAViewerWhoGoesBack) {
    startWithThreeFiles(2);
    watch(m_channels[0]);
    watch(m_channels[2]); // before the first one, as the list has no ends
    EXPECT_EQ(selectedMultiplex(), file("c"));
    EXPECT_THAT(multiplexes(), UnorderedElementsAre(file("c"), file("b")));
}

TEST_F(TunersTest, AreNotUsedForAMultiplexThatIsReceivedAlready) {
    startWithTuners(3, file("a"), 3);
    watch(m_channels[0]);
    EXPECT_THAT(multiplexes(), ElementsAre(file("a"), kOff, kOff));
}

TEST_F(TunersTest, LeaveOutAChannelThatCannotBeReceived) {
    startWithTuners(3, file("a") + "#101;/nonexistent.ts;" + file("c") + "#103", 3);
    watch(m_channels[0]);
    EXPECT_THAT(multiplexes(), UnorderedElementsAre(file("a"), file("c"), kOff));
    EXPECT_EQ(tune(m_channels[1]), kErrorNoSignal); // reported when somebody tunes to it
}

TEST_F(TunersTest, ReportAServiceThatTheReceivedNeighbourLacks) {
    startWithTuners(2, file("a") + "#101;" + file("b") + "#999;" + file("c") + "#103", 3);
    watch(m_channels[0]);
    ASSERT_TRUE(waitUntil([] { return Broadcast::instance().state().tuners[1].keptSize > 0; }));
    EXPECT_EQ(tune(m_channels[1]), kErrorUnknownChannel);
    EXPECT_EQ(tune(m_channels[0]), TELIX_ERR_STATE_NONE);
}

TEST_F(TunersTest, SwitchOffWhenTheChannelIsGivenUp) {
    startWithThreeFiles(3);
    watch(m_channels[0]);
    EXPECT_THAT(multiplexes(), ElementsAre(file("a"), file("b"), file("c")));
    ASSERT_EQ(TELIX_JS_VB_Stop(m_object), 0);
    flushPlatformThread();
    EXPECT_THAT(multiplexes(), ElementsAre(file("a"), kOff, kOff));
    EXPECT_EQ(Broadcast::instance().state().tuners[1].keptSize, 0U);
}

TEST_F(TunersTest, SwitchOffWhileInstantChangesAreOff) {
    startWithThreeFiles(2);
    watch(m_channels[0]);
    Broadcast::instance().setInstantZap(false);
    flushPlatformThread();
    EXPECT_THAT(multiplexes(), ElementsAre(file("a"), kOff));
    Broadcast::instance().setInstantZap(true);
    flushPlatformThread();
    EXPECT_THAT(multiplexes(), ElementsAre(file("a"), file("b")));
}

TEST_F(TunersTest, LeaveTheOneTunerToASecondObject) {
    startWithThreeFiles(2);
    watch(m_channels[0]);
    TELIX_JS_VB_HANDLE second = 0;
    ASSERT_EQ(TELIX_JS_VB_GetHandle(&second), 0);
    const size_t before = outcomes.all().size();
    ASSERT_EQ(TELIX_JS_VB_SetChannel(second, m_channels[2], 0), 0);
    ASSERT_TRUE(waitUntil([&] { return outcomes.all().size() > before; }));
    EXPECT_EQ(outcomes.all()[before], std::pair(m_channels[2], TELIX_ERR_STATE_ENUM_T{TELIX_ERR_STATE_NONE}));
    EXPECT_EQ(selectedMultiplex(), file("c"));
    TELIX_JS_VB_Release(second);
}

} // namespace
