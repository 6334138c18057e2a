// The channel list that is made of the tables of files, and channels that pages make.
#include <gtest/gtest.h>

#include <glib.h>

#include "desktop/platform/Channels.h"
#include "desktop/platform/Sections.h"
#include "tests/support/TemporaryFolder.h"

using namespace desktop;

namespace {

constexpr uint16_t kNetworkId = 0xFF02;
constexpr uint16_t kStreamId = 7;
constexpr uint8_t kServiceTypeDataBroadcast = 0x0C;

// A file of tables alone, and null packets around them.
class ChannelsTest : public testing::Test {
protected:
    std::string file() const { return m_folder.file("some.name.ts"); }
    Channels channels(std::optional<uint16_t> service = std::nullopt) const {
        return Channels({{file(), service}});
    }
    static std::vector<std::string> namesOf(const Channels& channels) {
        std::vector<std::string> names;
        for (const TELIX_JS_CM_HANDLE handle : channels.list()) {
            names.push_back(channels.find(handle)->name);
        }
        return names;
    }

    void write(const std::vector<std::pair<uint16_t, Bytes>>& tables) const {
        Bytes packets;
        const auto addNullPackets = [&packets] {
            for (int i = 0; i < 5; ++i) {
                Bytes packet(kPacketSize, kStuffingByte);
                packet[0] = kSyncByte;
                packet[1] = kPidNullPacket >> 8;
                packet[3] = kPayloadFlag;
                packets.insert(packets.end(), packet.begin(), packet.end());
            }
        };
        addNullPackets();
        for (const auto& [pid, section] : tables) {
            uint8_t continuity = 0;
            const Bytes more = packetsOf(section, pid, continuity);
            packets.insert(packets.end(), more.begin(), more.end());
            addNullPackets();
        }
        ASSERT_TRUE(g_file_set_contents(file().c_str(), reinterpret_cast<const char*>(packets.data()),
                                        static_cast<gssize>(packets.size()), nullptr));
    }

    static Bytes pat(std::vector<std::pair<uint16_t, uint16_t>> programs) {
        Pat pat;
        pat.transportStreamId = kStreamId;
        pat.programs = std::move(programs);
        return pack(pat);
    }
    static Bytes sdt() {
        Sdt sdt;
        sdt.transportStreamId = kStreamId;
        sdt.originalNetworkId = kNetworkId;
        sdt.services = {{101, kServiceTypeHevcTelevision, "", "First"},
                        {102, kServiceTypeDigitalRadio, "", ""},
                        {103, kServiceTypeDataBroadcast, "", "Third"}};
        return pack(sdt);
    }
    static Bytes nit() {
        Nit nit;
        nit.deliveryDescriptor = {kTagCableDeliverySystem, 1, 0x55};
        return pack(nit);
    }

    TemporaryFolder m_folder;
};

TEST_F(ChannelsTest, AreReadFromTablesInAnyOrder) {
    write({{kPidNit, nit()},
           {kPidSdt, sdt()},
           {kPidPat, pat({{kProgramNumberNetwork, kPidNit}, {101, 0x100}, {102, 0x200}, {103, 0x300}})}});
    const Channels all = channels();
    EXPECT_EQ(namesOf(all), (std::vector<std::string>{"First", "some.name 102", "Third"}));
    const Channel first = *all.find(all.list()[0]);
    EXPECT_EQ(first.onid, kNetworkId);
    EXPECT_EQ(first.tsid, kStreamId);
    EXPECT_EQ(first.sid, 101U);
    EXPECT_EQ(first.type, Channel::Television);
    EXPECT_EQ(first.deliveryDescriptor, (Bytes{kTagCableDeliverySystem, 1, 0x55}));
    EXPECT_EQ(all.find(all.list()[1])->type, Channel::Radio);
    EXPECT_EQ(all.find(all.list()[2])->type, Channel::Other);
    EXPECT_EQ(namesOf(channels(103)), std::vector<std::string>{"Third"});
}

TEST_F(ChannelsTest, HaveTheNameOfTheFileIfThereIsNoOther) {
    write({{kPidPat, pat({{101, 0x100}})}});
    EXPECT_EQ(namesOf(channels()), std::vector<std::string>{"some.name"});
    write({{kPidPat, pat({{101, 0x100}, {102, 0x200}})}});
    EXPECT_EQ(namesOf(channels()), (std::vector<std::string>{"some.name 101", "some.name 102"}));
    EXPECT_EQ(namesOf(channels(999)), std::vector<std::string>{"some.name"});
    write({});
    EXPECT_EQ(namesOf(channels()), std::vector<std::string>{"some.name"});
}

TEST_F(ChannelsTest, AreFoundByTheirIdsAndMadeOtherwise) {
    write({{kPidSdt, sdt()}, {kPidPat, pat({{101, 0x100}, {102, 0x200}})}});
    Channels all = channels();
    const TELIX_JS_CM_HANDLE second = all.list()[1];
    EXPECT_EQ(all.findByTriplet(kNetworkId, kStreamId, 102), second);
    EXPECT_EQ(all.findByTriplet(kNetworkId, kAnyTransportStream, 102), second);
    EXPECT_EQ(all.findByTriplet(kNetworkId, kStreamId + 1, 102), 0U);
    EXPECT_EQ(all.findByTriplet(kNetworkId + 1, kStreamId, 102), 0U);
    EXPECT_EQ(all.makeByTriplet(kNetworkId, kStreamId, 102), second);
    const TELIX_JS_CM_HANDLE made = all.makeByTriplet(kNetworkId, kStreamId, 500);
    EXPECT_GT(made, second);
    EXPECT_EQ(all.find(made)->origin, Channel::Origin::None);
    EXPECT_EQ(all.makeByTriplet(kNetworkId, kStreamId, 500), made);
    EXPECT_EQ(all.list().size(), 2U);
    EXPECT_FALSE(all.find(0));
    EXPECT_FALSE(all.find(made + 1));
}

TEST_F(ChannelsTest, FollowOneAnotherWithoutAnEnd) {
    write({{kPidPat, pat({{101, 0x100}, {102, 0x200}, {103, 0x300}})}});
    Channels all = channels();
    EXPECT_EQ(all.neighbour(1, 1), 2U);
    EXPECT_EQ(all.neighbour(3, 1), 1U);
    EXPECT_EQ(all.neighbour(1, -1), 3U);
    EXPECT_EQ(all.neighbour(1, -4), 3U);
    EXPECT_EQ(all.neighbour(0, 2), 1U);
    EXPECT_EQ(all.neighbour(all.makeByTriplet(1, 2, 3), 1), 1U);
}

TEST_F(ChannelsTest, AreBoundedInNumberIfPagesMakeThem) {
    write({});
    Channels all = channels();
    uint32_t made = 0;
    while (made < 1000 && all.makeByTriplet(1, 2, made + 1) != 0) {
        ++made;
    }
    EXPECT_EQ(made, 256U);
    EXPECT_NE(all.makeByTriplet(1, 2, 1), 0U); // is there already
}

} // namespace
