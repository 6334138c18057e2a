// Packets since the last random access point: what is kept, how much, and what a tuner is fed of it.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "desktop/platform/Receiver.h"
#include "desktop/platform/RecentPackets.h"
#include "desktop/platform/Sections.h"
#include "tests/desktop/ManualClock.h"

using namespace desktop;
using std::chrono::milliseconds;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

constexpr uint16_t kVideoPid = 0x110;
constexpr uint16_t kAudioPid = 0x111;
constexpr uint16_t kServiceId = 101;
constexpr uint16_t kPmtPid = 0x101;

// A packet that carries its number.
Bytes makePacket(uint16_t pid, uint8_t number) {
    Bytes packet(kPacketSize, kStuffingByte);
    packet[0] = kSyncByte;
    packet[1] = static_cast<uint8_t>(pid >> 8);
    packet[2] = static_cast<uint8_t>(pid);
    packet[3] = kPayloadFlag;
    packet[4] = number;
    return packet;
}

// A PES packet begins in it; the flags of the adaptation field, and then the payload.
Bytes makeStart(uint8_t adaptationFlags, const Bytes& payload) {
    Bytes packet = makePacket(kVideoPid, 0);
    packet[1] |= kPayloadUnitStartIndicator;
    packet[3] |= kAdaptationFieldFlag;
    packet[4] = 1;
    packet[5] = adaptationFlags;
    const Bytes pes{0, 0, 1, kStreamIdFirstVideo, 0, 0, kPesHeaderMarker, 0, 0};
    std::copy(pes.begin(), pes.end(), packet.begin() + 6);
    std::copy(payload.begin(), payload.end(), packet.begin() + 15);
    return packet;
}

Bytes makeKeyframe(uint8_t number) {
    Bytes packet = makeStart(kRandomAccessIndicator, {});
    packet[20] = number;
    return packet;
}

Pmt makePmt(uint16_t serviceId = kServiceId, uint16_t firstPid = kVideoPid) {
    Pmt pmt;
    pmt.serviceId = serviceId;
    pmt.pcrPid = firstPid;
    pmt.streams = {{kStreamTypeMpeg2Video, firstPid, {}},
                   {kStreamTypeMpeg1Audio, static_cast<uint16_t>(firstPid + 1), {}}};
    return pmt;
}

Clock::Instant at(int milli) {
    return Clock::Instant(milliseconds(milli));
}

Bytes allOf(const std::deque<RecentPackets::Chunk>& chunks) {
    Bytes all;
    for (const RecentPackets::Chunk& each : chunks) {
        all.insert(all.end(), each.packets.begin(), each.packets.end());
    }
    return all;
}

Bytes joined(std::initializer_list<Bytes> parts) {
    Bytes all;
    for (const Bytes& each : parts) {
        all.insert(all.end(), each.begin(), each.end());
    }
    return all;
}

TEST(RandomAccessTest, IsSeenByItsFlagAndByTheBeginningOfAPicture) {
    const uint8_t mpeg2 = kStreamTypeMpeg2Video;
    EXPECT_TRUE(isRandomAccessPoint(makeStart(0x40, {}).data(), mpeg2));
    EXPECT_FALSE(isRandomAccessPoint(makeStart(0x10, {}).data(), mpeg2));
    EXPECT_TRUE(isRandomAccessPoint(makeStart(0, {0, 0, 1, 0xB3}).data(), mpeg2));
    EXPECT_FALSE(isRandomAccessPoint(makeStart(0, {0, 0, 1, 0x00}).data(), mpeg2));
    const Bytes delimiter{0, 0, 1, 0x09, 0xF0, 0, 0, 1};
    EXPECT_TRUE(isRandomAccessPoint(makeStart(0, joined({delimiter, {0x67}})).data(), kStreamTypeAvcVideo));
    EXPECT_TRUE(isRandomAccessPoint(makeStart(0, joined({delimiter, {0x65}})).data(), kStreamTypeAvcVideo));
    EXPECT_FALSE(isRandomAccessPoint(makeStart(0, joined({delimiter, {0x41}})).data(), kStreamTypeAvcVideo));
    EXPECT_TRUE(isRandomAccessPoint(makeStart(0, {0, 0, 1, 0x40}).data(), kStreamTypeHevcVideo)); // VPS
    EXPECT_TRUE(isRandomAccessPoint(makeStart(0, {0, 0, 1, 0x26}).data(), kStreamTypeHevcVideo)); // IDR
    EXPECT_FALSE(isRandomAccessPoint(makeStart(0, {0, 0, 1, 0x02}).data(), kStreamTypeHevcVideo));
    EXPECT_FALSE(isRandomAccessPoint(makePacket(kVideoPid, 0).data(), mpeg2));
    Bytes scrambled = makeStart(0x40, {});
    scrambled[3] |= 0x80;
    EXPECT_FALSE(isRandomAccessPoint(scrambled.data(), mpeg2));
    Bytes erroneous = makeStart(0x40, {});
    erroneous[1] |= kTransportErrorIndicator;
    EXPECT_FALSE(isRandomAccessPoint(erroneous.data(), mpeg2));
    Bytes unaligned = makeStart(0x40, {});
    unaligned[0] = 0;
    EXPECT_FALSE(isRandomAccessPoint(unaligned.data(), mpeg2));
    for (int length = 0; length < 256; ++length) { // also beyond the packet
        Bytes damaged = makeStart(0, {});
        damaged[4] = static_cast<uint8_t>(length);
        isRandomAccessPoint(damaged.data(), mpeg2);
    }
}

TEST(RecentPacketsTest, AreThoseSinceTheLastRandomAccessPoint) {
    RecentPackets recent;
    recent.setService(makePmt(), {kVideoPid, kAudioPid});
    recent.push(makePacket(kAudioPid, 1).data(), at(0));
    EXPECT_THAT(recent.packetsOf(kServiceId), IsEmpty()); // no beginning yet
    recent.push(makeKeyframe(1).data(), at(10));
    recent.push(makePacket(kVideoPid, 2).data(), at(20));
    recent.push(makeKeyframe(2).data(), at(30));
    recent.push(makePacket(kAudioPid, 3).data(), at(30));
    recent.push(makePacket(0x555, 4).data(), at(30));
    recent.push(makePacket(kVideoPid, 5).data(), at(40));
    const auto& chunks = recent.packetsOf(kServiceId);
    ASSERT_EQ(chunks.size(), 2U);
    EXPECT_EQ(chunks[0].arrival, at(30));
    EXPECT_EQ(chunks[1].arrival, at(40));
    EXPECT_EQ(allOf(chunks), joined({makeKeyframe(2), makePacket(kAudioPid, 3), makePacket(kVideoPid, 5)}));
    EXPECT_EQ(recent.size(), 3 * kPacketSize);
    recent.setService(makePmt(), {kVideoPid, kAudioPid}); // the PMT comes again
    EXPECT_EQ(recent.size(), 3 * kPacketSize);
    recent.setService(makePmt(), {kVideoPid});
    EXPECT_EQ(recent.size(), 0U);
    recent.push(makePacket(kAudioPid, 6).data(), at(50));
    recent.push(makeKeyframe(3).data(), at(50));
    recent.push(makePacket(kAudioPid, 7).data(), at(50));
    EXPECT_EQ(allOf(recent.packetsOf(kServiceId)), makeKeyframe(3));
    recent.clear();
    EXPECT_EQ(recent.size(), 0U);
    EXPECT_THAT(recent.packetsOf(kServiceId), IsEmpty());
}

TEST(RecentPacketsTest, DropTheServiceThatBeganFirstWhenThereIsNoMoreRoom) {
    RecentPackets recent(4 * kPacketSize);
    recent.setService(makePmt(1, kVideoPid), {kVideoPid, kAudioPid});
    recent.setService(makePmt(2, 0x120), {0x120, kAudioPid}); // the services share their sound
    Bytes other = makeKeyframe(9);
    other[2] = 0x20;
    recent.push(makeKeyframe(1).data(), at(10));
    recent.push(other.data(), at(20));
    recent.push(makePacket(kAudioPid, 1).data(), at(30));
    EXPECT_EQ(recent.size(), 4 * kPacketSize);
    recent.push(makePacket(kVideoPid, 2).data(), at(40));
    EXPECT_THAT(recent.packetsOf(1), IsEmpty());
    EXPECT_EQ(allOf(recent.packetsOf(2)), joined({other, makePacket(kAudioPid, 1)}));
    EXPECT_EQ(recent.size(), 2 * kPacketSize);
}

// What a selected service is fed: packets, and their age in milliseconds.
struct Fed {
    Bytes packets;
    int64_t age;
};

class ReceiverFeedTest : public testing::Test {
protected:
    void SetUp() override {
        m_receiver.keepPackets(true);
        Pat pat;
        pat.programs = {{kServiceId, kPmtPid}};
        pushSection(pack(pat), kPidPat);
        pushSection(pack(makePmt()), kPmtPid);
    }

    void pushSection(const Bytes& section, uint16_t pid) { push(packetsOf(section, pid, m_continuity[pid])); }

    void push(const Bytes& packets, Clock::Duration age = Clock::Duration::zero()) {
        m_receiver.push(packets.data(), packets.size(), age);
    }

    void select() {
        Receiver::Service service;
        service.serviceId = kServiceId;
        service.feed = [this](const Bytes& packets, Clock::Duration age) {
            m_fed.push_back({packets, std::chrono::duration_cast<milliseconds>(age).count()});
        };
        service.onPmt = [](const Pmt&) {};
        service.onMissing = [] {};
        service.onEit = [](const Eit&) {};
        service.onStreamEvent = [](uint8_t, const StreamEvent&) {};
        m_receiver.select(service);
    }

    // The packets of the service without PAT and PMT.
    Bytes fedStreams() const {
        Bytes streams;
        for (const Fed& each : m_fed) {
            for (size_t begin = 0; begin < each.packets.size(); begin += kPacketSize) {
                const auto packet = each.packets.begin() + static_cast<std::ptrdiff_t>(begin);
                const uint16_t pid = pidOf(&*packet);
                if (pid == kVideoPid || pid == kAudioPid) {
                    streams.insert(streams.end(), packet, packet + kPacketSize);
                }
            }
        }
        return streams;
    }

    ManualClock m_clock{0};
    Receiver m_receiver{m_clock};
    std::map<uint16_t, uint8_t> m_continuity;
    std::vector<Fed> m_fed;
};

TEST_F(ReceiverFeedTest, BeginsWithTheKeptPacketsAndGoesOnWithoutGap) {
    push(makeKeyframe(1));
    m_clock.advance(milliseconds(300));
    push(makePacket(kVideoPid, 2));
    m_clock.advance(milliseconds(40));
    EXPECT_EQ(m_receiver.keptAge(kServiceId), milliseconds(340));
    select();
    ASSERT_EQ(m_fed.size(), 2U);
    EXPECT_EQ(pidOf(m_fed[0].packets.data()), kPidPat); // the tuner must know the streams first
    EXPECT_EQ(m_fed[0].age, 340);
    EXPECT_EQ(m_fed[1].age, 40);
    push(makePacket(kAudioPid, 3));
    ASSERT_EQ(m_fed.size(), 3U);
    EXPECT_EQ(m_fed[2].age, 0);
    EXPECT_EQ(fedStreams(), joined({makeKeyframe(1), makePacket(kVideoPid, 2), makePacket(kAudioPid, 3)}));
    m_fed.clear();
    select(); // again: from the same random access point
    EXPECT_EQ(fedStreams(), joined({makeKeyframe(1), makePacket(kVideoPid, 2), makePacket(kAudioPid, 3)}));
}

TEST_F(ReceiverFeedTest, TellsHowLongAgoPacketsArrivedBeforeTheyWerePushed) {
    push(makeKeyframe(1), milliseconds(400));
    EXPECT_EQ(m_receiver.keptAge(kServiceId), milliseconds(400));
    push(makePacket(kVideoPid, 2), milliseconds(360));
    m_clock.advance(milliseconds(5));
    select();
    push(makePacket(kAudioPid, 3), milliseconds(320));
    ASSERT_EQ(m_fed.size(), 3U);
    EXPECT_EQ(m_fed[0].age, 405);
    EXPECT_EQ(m_fed[1].age, 365);
    EXPECT_EQ(m_fed[2].age, 320);
}

TEST_F(ReceiverFeedTest, BeginsWithTheNextPacketsIfNothingIsKept) {
    push(makeKeyframe(1));
    m_receiver.keepPackets(false);
    EXPECT_EQ(m_receiver.keptSize(), 0U);
    push(makeKeyframe(2));
    select();
    EXPECT_THAT(fedStreams(), IsEmpty());
    EXPECT_EQ(m_receiver.keptAge(kServiceId), Clock::Duration::zero());
    push(makePacket(kVideoPid, 3));
    EXPECT_EQ(fedStreams(), makePacket(kVideoPid, 3));
}

TEST_F(ReceiverFeedTest, ForgetsThePacketsOfAnotherMultiplex) {
    push(makeKeyframe(1));
    EXPECT_EQ(m_receiver.keptSize(), kPacketSize);
    m_receiver.reset();
    EXPECT_EQ(m_receiver.keptSize(), 0U);
    EXPECT_TRUE(m_receiver.keepsPackets());
}

} // namespace
