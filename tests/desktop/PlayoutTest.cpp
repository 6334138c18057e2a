// Playout by a clock that the test advances: pacing, repetition, injected tables; and what a tune does with a
// stream that never shows anything.
#include <fcntl.h>
#include <glib.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>
#include <map>
#include <mutex>
#include <optional>

#include "desktop/platform/Broadcast.h"
#include "desktop/platform/Multiplex.h"
#include "desktop/platform/Picture.h"
#include "desktop/platform/Playout.h"
#include "desktop/platform/Restamper.h"
#include "desktop/platform/Sections.h"
#include "desktop/platform/telix_viewer.h"
#include "tests/desktop/ManualClock.h"
#include "tests/desktop/PlatformThread.h"
#include "tests/desktop/Received.h"
#include "tests/support/TemporaryFolder.h"

using namespace desktop;
using std::chrono::milliseconds;

namespace {

constexpr int64_t kUtcStart = 1795253700;
constexpr uint16_t kPcrPid = 0x110;
constexpr int64_t kTicksPerMillisecond = kSystemClockFrequency / 1000;

// A packet without payload.
Bytes makePcrPacket(int64_t pcr) {
    const int64_t base = pcr / kSystemClockTicksPerBaseTick;
    Bytes packet(kPacketSize, kStuffingByte);
    const uint8_t header[] = {kSyncByte,
                              static_cast<uint8_t>(kPcrPid >> 8),
                              static_cast<uint8_t>(kPcrPid),
                              kAdaptationFieldFlag,
                              static_cast<uint8_t>(kPacketSize - kPacketHeaderSize - 1),
                              kPcrFlag,
                              static_cast<uint8_t>(base >> 25),
                              static_cast<uint8_t>(base >> 17),
                              static_cast<uint8_t>(base >> 9),
                              static_cast<uint8_t>(base >> 1),
                              static_cast<uint8_t>((base & 1) << 7),
                              0};
    std::copy(std::begin(header), std::end(header), packet.begin());
    return packet;
}

// A stream of `count` packets with a PCR in each, `interval` after each other.
Bytes makeStream(int count, milliseconds interval) {
    Bytes stream;
    for (int index = 0; index < count; ++index) {
        const Bytes packet = makePcrPacket(index * interval.count() * kTicksPerMillisecond);
        stream.insert(stream.end(), packet.begin(), packet.end());
    }
    return stream;
}

// A file that is removed at the end of the test.
class StreamFile {
public:
    explicit StreamFile(const Bytes& stream) {
        GError* error = nullptr;
        const int file = g_file_open_tmp("telix-stream-XXXXXX.ts", &m_name, &error);
        EXPECT_GE(file, 0) << (error ? error->message : "");
        EXPECT_EQ(write(file, stream.data(), stream.size()), static_cast<ssize_t>(stream.size()));
        close(file);
    }
    ~StreamFile() {
        unlink(m_name);
        g_free(m_name);
    }
    StreamFile(const StreamFile&) = delete;
    StreamFile& operator=(const StreamFile&) = delete;

    std::string name() const { return m_name; }

    // Replaces the contents of the same file, which may be open.
    void overwrite(const Bytes& stream) const {
        const int file = open(m_name, O_WRONLY | O_TRUNC);
        EXPECT_GE(file, 0);
        EXPECT_EQ(write(file, stream.data(), stream.size()), static_cast<ssize_t>(stream.size()));
        close(file);
    }

private:
    char* m_name = nullptr;
};

class PlayoutTest : public testing::Test {
protected:
    // Advances step by step, as time does.
    void advance(milliseconds duration) {
        for (milliseconds passed{0}; passed < duration; passed += milliseconds(10)) {
            m_clock.advance(milliseconds(10));
            ASSERT_TRUE(m_clock.settle());
        }
    }

    // The PCRs that were sent so far, in milliseconds.
    std::vector<int64_t> sentPcrs() {
        std::lock_guard<std::mutex> lock(m_mutex);
        std::vector<int64_t> pcrs;
        for (size_t at = 0; at < m_packets.size(); at += kPacketSize) {
            const auto pcr = pcrOf(m_packets.data() + at);
            if (pcr && pidOf(m_packets.data() + at) == kPcrPid) {
                pcrs.push_back(*pcr / kTicksPerMillisecond);
            }
        }
        return pcrs;
    }

    // How often each table was sent so far.
    std::map<uint8_t, size_t> sentTables(const std::set<uint16_t>& pids) {
        std::lock_guard<std::mutex> lock(m_mutex);
        std::map<uint8_t, size_t> counts;
        SectionDemultiplexer demultiplexer([&](uint16_t, const Bytes& section) { ++counts[section[0]]; });
        for (const uint16_t pid : pids) {
            demultiplexer.add(pid);
        }
        for (size_t at = 0; at < m_packets.size(); at += kPacketSize) {
            demultiplexer.push(m_packets.data() + at);
        }
        return counts;
    }

    ManualClock m_clock{kUtcStart};
    std::mutex m_mutex;
    Bytes m_packets;             // guarded by the mutex
    std::vector<int64_t> m_ages; // in milliseconds, of the parts of the packets; guarded by the mutex
    Playout m_playout{m_clock, [this](const uint8_t* packets, size_t size, Clock::Duration age) {
                          std::lock_guard<std::mutex> lock(m_mutex);
                          m_packets.insert(m_packets.end(), packets, packets + size);
                          m_ages.push_back(std::chrono::duration_cast<milliseconds>(age).count());
                      }};
};

TEST_F(PlayoutTest, SendsEachPacketWhenItIsDue) {
    const StreamFile file(makeStream(50, milliseconds(40)));
    std::string error;
    ASSERT_TRUE(m_playout.play(file.name(), nullptr, error)) << error;
    ASSERT_TRUE(m_clock.settle());
    EXPECT_EQ(sentPcrs().back(), 400);
    advance(milliseconds(30));
    EXPECT_EQ(sentPcrs().back(), 400);
    advance(milliseconds(10));
    EXPECT_EQ(sentPcrs().back(), 440);
    advance(milliseconds(400));
    EXPECT_EQ(sentPcrs().size(), 22U);
    EXPECT_EQ(sentPcrs().back(), 840);
}

TEST_F(PlayoutTest, HasBegunBeforeItIsReceived) {
    const StreamFile file(makeStream(50, milliseconds(40)));
    std::string error;
    ASSERT_TRUE(m_playout.play(file.name(), nullptr, error)) << error;
    ASSERT_TRUE(m_clock.settle());
    EXPECT_EQ(sentPcrs(), (std::vector<int64_t>{0, 40, 80, 120, 160, 200, 240, 280, 320, 360, 400}));
    advance(milliseconds(80));
    std::lock_guard<std::mutex> lock(m_mutex);
    EXPECT_EQ(m_ages, (std::vector<int64_t>{400, 360, 320, 280, 240, 200, 160, 120, 80, 40, 0, 0, 0}));
}

TEST_F(PlayoutTest, SendsThePacketsOfTenMillisecondsTogether) {
    const StreamFile file(makeStream(500, milliseconds(1)));
    std::string error;
    ASSERT_TRUE(m_playout.play(file.name(), nullptr, error)) << error;
    ASSERT_TRUE(m_clock.settle());
    EXPECT_EQ(sentPcrs().size(), 401U);
    std::lock_guard<std::mutex> lock(m_mutex);
    EXPECT_EQ(m_ages.size(), 41U);
}

TEST_F(PlayoutTest, StartsAgainAtTheEndWithPcrsThatRunOn) {
    const StreamFile file(makeStream(10, milliseconds(40)));
    std::string error;
    ASSERT_TRUE(m_playout.play(file.name(), nullptr, error)) << error;
    ASSERT_TRUE(m_clock.settle());
    advance(milliseconds(1200));
    const std::vector<int64_t> pcrs = sentPcrs();
    ASSERT_GE(pcrs.size(), 30U); // three times the file
    for (size_t index = 1; index < 30; ++index) {
        EXPECT_EQ(pcrs[index], static_cast<int64_t>(index) * 40);
    }
}

TEST_F(PlayoutTest, InjectsTablesAtTheirIntervals) {
    const StreamFile file(makeStream(50, milliseconds(40)));
    std::string error;
    ASSERT_TRUE(m_playout.play(file.name(), makeTestTableInjector(300, 0, ""), error)) << error;
    ASSERT_TRUE(m_clock.settle());
    const std::set<uint16_t> pids{kPidPat, kPidNit, kPidSdt, kPidEit, kPidTdt};
    const size_t services = testServices().size();
    auto tables = sentTables(pids);
    EXPECT_EQ(tables[kTableIdPat], 1U);
    EXPECT_EQ(tables[kTableIdSdtActual], 1U);
    EXPECT_EQ(tables[kTableIdEitActualPresentFollowing], 2 * services);
    advance(milliseconds(990));
    tables = sentTables(pids);
    EXPECT_GE(tables[kTableIdPat], 8U); // ten less what the packets' own times cost
    EXPECT_LE(tables[kTableIdPat], 10U);
    EXPECT_EQ(tables[kTableIdSdtActual], 1U);
    EXPECT_EQ(tables[kTableIdNitActual], 1U);
    EXPECT_EQ(tables[kTableIdTdt], 1U);
    EXPECT_EQ(tables[kTableIdEitActualPresentFollowing], 4 * services);
    advance(milliseconds(50));
    EXPECT_EQ(sentTables(pids)[kTableIdSdtActual], 2U);
}

TEST_F(PlayoutTest, SendsNothingAfterItHasStopped) {
    const StreamFile file(makeStream(50, milliseconds(40)));
    std::string error;
    ASSERT_TRUE(m_playout.play(file.name(), nullptr, error)) << error;
    ASSERT_TRUE(m_clock.settle());
    m_playout.stop();
    const size_t before = sentPcrs().size();
    m_clock.advance(milliseconds(500));
    EXPECT_EQ(sentPcrs().size(), before);
}

TEST_F(PlayoutTest, TakesAFileWhoseClockStandsStillWithoutHarm) {
    const StreamFile file(makeStream(10, milliseconds(0)));
    std::string error;
    ASSERT_TRUE(m_playout.play(file.name(), nullptr, error)) << error;
    ASSERT_TRUE(m_clock.settle());
    advance(milliseconds(100));
    EXPECT_LE(sentPcrs().size(), 600U); // of 10 in each step of the 500 ms, and not without end
    m_playout.stop();
}

TEST_F(PlayoutTest, SurvivesAFileThatShrinksAndPlaysWhatComesIntoItNext) {
    constexpr int kPackets = 5000; // more than are read at once
    const StreamFile file(makeStream(kPackets, milliseconds(40)));
    std::string error;
    ASSERT_TRUE(m_playout.play(file.name(), nullptr, error)) << error;
    ASSERT_TRUE(m_clock.settle());
    EXPECT_EQ(sentPcrs().size(), 11U);
    file.overwrite({});
    ASSERT_NO_FATAL_FAILURE(advance(milliseconds(kPackets * 40)));
    const size_t before = sentPcrs().size();
    EXPECT_LE(before, 2000U);
    file.overwrite(makeStream(kPackets, milliseconds(40)));
    ASSERT_NO_FATAL_FAILURE(advance(milliseconds(2000)));
    EXPECT_GT(sentPcrs().size(), before + 20);
    m_playout.stop();
}

TEST_F(PlayoutTest, SurvivesAFileThatIsOverwrittenWithSomethingElse) {
    const StreamFile file(makeStream(5000, milliseconds(40)));
    std::string error;
    ASSERT_TRUE(m_playout.play(file.name(), nullptr, error)) << error;
    ASSERT_TRUE(m_clock.settle());
    file.overwrite(Bytes(5000 * kPacketSize, 0x55));
    ASSERT_NO_FATAL_FAILURE(advance(milliseconds(1000)));
    m_playout.stop();
}

TEST_F(PlayoutTest, RefusesWhatIsNoTransportStream) {
    std::string error;
    EXPECT_FALSE(m_playout.play("/nonexistent/file.ts", nullptr, error));
    EXPECT_EQ(error, "/nonexistent/file.ts: No such file or directory");
    EXPECT_FALSE(m_playout.play("/dev/zero", nullptr, error));
    EXPECT_EQ(error, "/dev/zero: Not a regular file");
    const StreamFile garbage(Bytes(5000, 0x55));
    EXPECT_FALSE(m_playout.play(garbage.name(), nullptr, error));
    EXPECT_EQ(error, garbage.name() + ": not a transport stream");
    uint8_t continuity = 0;
    Bytes tables;
    for (int index = 0; index < 10; ++index) {
        const Bytes packets = packetsOf(pack(Pat()), kPidPat, continuity);
        tables.insert(tables.end(), packets.begin(), packets.end());
    }
    const StreamFile withoutPcr(tables);
    EXPECT_FALSE(m_playout.play(withoutPcr.name(), nullptr, error));
    EXPECT_EQ(error, withoutPcr.name() + ": no PCR");
}

// The channel list is read once in a process, so this test needs a process of its own.
Received<TELIX_ERR_STATE_ENUM_T> errors;

TELIX_RETCODE_ENUM_T onError(TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE, TELIX_ERR_STATE_ENUM_T error) {
    return errors.add(error);
}

// A stream of one service, of which nothing can be decoded.
Bytes makeStreamWithoutPictures() {
    constexpr uint16_t kPmtPid = 0x100;
    constexpr uint16_t kServiceId = 7;
    Pat pat;
    pat.programs = {{kServiceId, kPmtPid}};
    Pmt pmt;
    pmt.serviceId = kServiceId;
    pmt.pcrPid = kPcrPid;
    pmt.streams = {{kStreamTypeMpeg2Video, kPcrPid, {}}};
    uint8_t patContinuity = 0;
    uint8_t pmtContinuity = 0;
    Bytes stream;
    for (const Bytes& part :
         {packetsOf(pack(pat), kPidPat, patContinuity), packetsOf(pack(pmt), kPmtPid, pmtContinuity),
          makeStream(50, milliseconds(40))}) {
        stream.insert(stream.end(), part.begin(), part.end());
    }
    return stream;
}

// Lets the channel list be that of the file, with the default of signal-timeout, 6 seconds. Returns the clock
// of broadcast.
ManualClock& useBroadcastOf(const StreamFile& file) {
    setenv("TELIX_CHANNELS", file.name().c_str(), 1);
    unsetenv("TELIX_CONFIG");
    setenv("XDG_CONFIG_HOME", "/nonexistent", 1);
    static auto* const clock = new BroadcastClock(kUtcStart); // broadcast uses it until the process ends
    Broadcast::useClock(*clock);
    return *clock;
}

TEST(TuneTimeoutTest, EndsATuneThatShowsNothingAfterSixSeconds) {
    const StreamFile file(makeStreamWithoutPictures());
    ManualClock& clock = useBroadcastOf(file);

    TELIX_JS_VB_HANDLE object = 0;
    ASSERT_EQ(TELIX_JS_VB_GetHandle(&object), 0);
    TELIX_JS_VB_RegisterOnChannelChangeError(onError);
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(object), 0);
    // From the PMT on, the pipeline waits for video.
    TELIX_JS_AVCOMPHANDLE* components = nullptr;
    uint32_t count = 0;
    ASSERT_TRUE(waitUntil([&] {
        return TELIX_JS_VB_GetComponents(object, TELIX_JS_AVCOMPTYPE_VIDEO, &components, &count) == 0 &&
               count == 1;
    }));
    clock.advance(milliseconds(5999));
    flushPlatformThread();
    EXPECT_TRUE(errors.all().empty());
    TELIX_PLAYSTATE_ENUM_T state = 0;
    EXPECT_EQ(TELIX_JS_VB_GetPlayBackState(object, &state), 0);
    EXPECT_EQ(state, TELIX_PLAYSTATE_CONNECTING);
    clock.advance(milliseconds(1));
    ASSERT_TRUE(waitUntil([] { return !errors.all().empty(); }));
    EXPECT_EQ(errors.all(), std::vector<TELIX_ERR_STATE_ENUM_T>{kErrorNoSignal});
    EXPECT_TRUE(waitUntil([&] {
        return TELIX_JS_VB_GetPlayBackState(object, &state) == 0 && state == TELIX_PLAYSTATE_UNREALIZED;
    }));
    TELIX_JS_VB_Release(object);
    TELIX_JS_VB_UnRegisterOnChannelChangeError(onError);
}

TEST(TuneOfTheSetTest, IsNotRepeatedWhenItFails) {
    const StreamFile file(makeStreamWithoutPictures());
    ManualClock& clock = useBroadcastOf(file);
    const Picture& picture = Platform::instance().picture();
    telix_desktop_present_channel();
    EXPECT_TRUE(waitUntil([&] { return !picture.isFree(); }));
    EXPECT_TRUE(waitUntil([&] {
        clock.advance(milliseconds(100));
        return picture.isFree();
    }));
    for (int turn = 0; turn < 5; ++turn) {
        flushPlatformThread();
        EXPECT_TRUE(picture.isFree());
        clock.advance(milliseconds(10));
    }
}

// The entries of a folder; nothing if there is no folder.
std::optional<size_t> countEntries(const std::string& folder) {
    GDir* dir = g_dir_open(folder.c_str(), 0, nullptr);
    if (!dir) {
        return std::nullopt;
    }
    size_t count = 0;
    while (g_dir_read_name(dir)) {
        ++count;
    }
    g_dir_close(dir);
    return count;
}

TEST(TuneWhileTheTestMultiplexIsMadeTest, GoesOnWhenItIsThere) {
    const StreamFile file(makeStreamWithoutPictures());
    const TemporaryFolder cache;
    setenv("XDG_CACHE_HOME", cache.path().c_str(), 1); // has no test multiplex
    setenv("PATH", "", 1);                             // nor is there ffmpeg: it ends soon
    setenv("TELIX_CHANNELS", (file.name() + ";test").c_str(), 1);
    TELIX_JS_VB_HANDLE object = 0;
    ASSERT_EQ(TELIX_JS_VB_GetHandle(&object), 0);
    TELIX_JS_VB_RegisterOnChannelChangeError(onError);
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(object), 0);
    const std::string folder = cache.file("telix");
    EXPECT_TRUE(waitUntil([&] { return countEntries(folder) > size_t{0}; }));
    EXPECT_TRUE(waitUntil([&] { return countEntries(folder) == size_t{0}; }));
    // The tune waits for a picture still, and the channels of the test multiplex have no signal.
    TELIX_PLAYSTATE_ENUM_T state = 0;
    EXPECT_EQ(TELIX_JS_VB_GetPlayBackState(object, &state), 0);
    EXPECT_EQ(state, TELIX_PLAYSTATE_CONNECTING);
    EXPECT_TRUE(errors.all().empty());
    TELIX_JS_CM_HANDLE before = 0;
    ASSERT_EQ(TELIX_JS_VB_NextChannel(object, &before), 0);
    EXPECT_TRUE(waitUntil([] { return errors.all().size() == 2; }));
    EXPECT_EQ(errors.all(), (std::vector<TELIX_ERR_STATE_ENUM_T>{kErrorInterrupted, kErrorNoSignal}));
    TELIX_JS_VB_Release(object);
    TELIX_JS_VB_UnRegisterOnChannelChangeError(onError);
}

} // namespace
