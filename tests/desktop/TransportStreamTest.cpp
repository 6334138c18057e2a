// Tables packed and read back, damaged sections, and stamps across the seam of a repetition.
#include "desktop/platform/Restamper.h"
#include "desktop/platform/Sections.h"

#include <gtest/gtest.h>
#include <random>

using namespace desktop;

namespace {

Eit makeEit() {
    Eit eit;
    eit.serviceId = 101;
    eit.transportStreamId = 7;
    eit.originalNetworkId = 0xFF01;
    eit.version = 9;
    eit.number = 1;
    EitEvent event;
    event.id = 4711;
    event.start = 1795253700;
    event.duration = 2 * 3600 + 34 * 60 + 56;
    event.language = "eng";
    event.name = "Größe & Länge";
    event.text = "What it is about.";
    event.ratings = {{"DEU", 9}, {"FRA", 13}};
    eit.events = {event};
    return eit;
}

// The sections that a filter gets out of packets.
std::vector<Bytes> filtered(const Bytes& packets) {
    std::vector<Bytes> sections;
    SectionFilter filter([&](const Bytes& section) { sections.push_back(section); });
    for (size_t at = 0; at < packets.size(); at += packetSize) {
        filter.push(packets.data() + at);
    }
    return sections;
}

TEST(TablesTest, NameTheServicesAfterPackingAndReading) {
    Pat pat;
    pat.transportStreamId = 7;
    pat.version = 3;
    pat.programmes = {{0, nitPid}, {101, 0x101}, {65535, 0x1FFE}};
    const auto readPat = parsePat(pack(pat));
    ASSERT_TRUE(readPat);
    EXPECT_EQ(readPat->transportStreamId, 7);
    EXPECT_EQ(readPat->version, 3);
    EXPECT_EQ(readPat->programmes, pat.programmes);

    Sdt sdt;
    sdt.transportStreamId = 7;
    sdt.originalNetworkId = 0xFF01;
    sdt.services = {{101, 1, "Provider", "Größe"}, {102, 2, "", "Radio"}};
    const auto readSdt = parseSdt(pack(sdt));
    ASSERT_TRUE(readSdt);
    EXPECT_EQ(readSdt->originalNetworkId, 0xFF01);
    ASSERT_EQ(readSdt->services.size(), 2U);
    EXPECT_EQ(readSdt->services[0].name, "Größe");
    EXPECT_EQ(readSdt->services[0].provider, "Provider");
    EXPECT_EQ(readSdt->services[1].type, 2);

    Nit nit;
    nit.networkId = 0xFF01;
    nit.name = "Network";
    nit.transportStreamId = 7;
    nit.originalNetworkId = 0xFF01;
    nit.deliveryDescriptor = {0x43, 2, 0x11, 0x22};
    const auto readNit = parseNit(pack(nit));
    ASSERT_TRUE(readNit);
    EXPECT_EQ(readNit->name, "Network");
    EXPECT_EQ(readNit->deliveryDescriptor, nit.deliveryDescriptor);
}

TEST(TablesTest, DescribeTheStreamsOfAService) {
    Pmt pmt;
    pmt.serviceId = 101;
    pmt.pcrPid = 0x110;
    pmt.streams = {{0x02, 0x110, describeComponentTag(1)}, {0x03, 0x111, describeLanguage("deu", 3)}};
    const auto read = parsePmt(pack(pmt));
    ASSERT_TRUE(read);
    EXPECT_EQ(read->serviceId, 101);
    EXPECT_EQ(read->pcrPid, 0x110);
    ASSERT_EQ(read->streams.size(), 2U);
    EXPECT_EQ(read->streams[1].pid, 0x111);
    EXPECT_EQ(read->streams[1].descriptors, describeLanguage("deu", 3));
}

TEST(TablesTest, KeepProgrammesTimesRatingsAndEvents) {
    const Eit eit = makeEit();
    const auto read = parseEit(pack(eit));
    ASSERT_TRUE(read);
    EXPECT_EQ(read->serviceId, 101);
    EXPECT_EQ(read->version, 9);
    EXPECT_EQ(read->number, 1);
    ASSERT_EQ(read->events.size(), 1U);
    EXPECT_EQ(read->events[0].id, 4711);
    EXPECT_EQ(read->events[0].start, eit.events[0].start);
    EXPECT_EQ(read->events[0].duration, eit.events[0].duration);
    EXPECT_EQ(read->events[0].name, "Größe & Länge");
    EXPECT_EQ(read->events[0].text, "What it is about.");
    ASSERT_EQ(read->events[0].ratings.size(), 2U);
    EXPECT_EQ(read->events[0].ratings[1].country, "FRA");
    EXPECT_EQ(read->events[0].ratings[1].value, 13);

    EXPECT_EQ(parseTime(packTime(1795253723)), 1795253723);

    StreamEvent event{77, 5, {1, 0, 255}};
    const auto events = parseStreamEvents(pack(event));
    ASSERT_EQ(events.size(), 1U);
    EXPECT_EQ(events[0].id, 77);
    EXPECT_EQ(events[0].version, 5);
    EXPECT_EQ(events[0].data, event.data);
}

TEST(TablesTest, DecodeTextsOfOlderCharacterSets) {
    const Bytes latin{'G', 'r', 0xF6, 0xDF, 'e'};
    Bytes marked{0x10, 0x00, 0x01};
    marked.insert(marked.end(), latin.begin(), latin.end());
    EXPECT_EQ(decodeText(marked.data(), marked.size()), "Größe");
    const Bytes composed{'G', 'r', 0xC8, 'o', 0x86, 'x', 0x87}; // a diaeresis before its letter, and emphasis
    EXPECT_EQ(decodeText(composed.data(), composed.size()), "Gröx");
    EXPECT_EQ(decodeText(nullptr, 0), "");
}

TEST(SectionFilterTest, PutsASectionOfSeveralPacketsTogether) {
    Sdt sdt;
    for (uint16_t service = 1; service <= 30; ++service) {
        sdt.services.push_back({service, 1, "Provider", "Service " + std::to_string(service)});
    }
    const Bytes section = pack(sdt);
    ASSERT_GT(section.size(), 3 * packetSize);
    uint8_t continuity = 14;
    const auto sections = filtered(packetsOf(section, sdtPid, continuity));
    ASSERT_EQ(sections.size(), 1U);
    EXPECT_EQ(sections[0], section);
}

TEST(SectionFilterTest, DropsASectionWithALostPacketAndTakesTheNext) {
    Sdt sdt;
    for (uint16_t service = 1; service <= 30; ++service) {
        sdt.services.push_back({service, 1, "Provider", "Service " + std::to_string(service)});
    }
    const Bytes section = pack(sdt);
    uint8_t continuity = 0;
    Bytes packets = packetsOf(section, sdtPid, continuity);
    packets.erase(packets.begin() + packetSize, packets.begin() + 2 * packetSize);
    const Bytes again = packetsOf(section, sdtPid, continuity);
    packets.insert(packets.end(), again.begin(), again.end());
    EXPECT_EQ(filtered(packets), std::vector<Bytes>{section});
}

TEST(SectionFilterTest, TakesAnyDamageWithoutHarmAndLetsNoneThrough) {
    const Bytes section = pack(makeEit());
    std::mt19937 random(20261121);
    size_t whole = 0;
    for (int round = 0; round < 20000; ++round) {
        uint8_t continuity = static_cast<uint8_t>(round & 0x0F);
        Bytes packets = packetsOf(section, eitPid, continuity);
        const Bytes more = packetsOf(section, eitPid, continuity);
        packets.insert(packets.end(), more.begin(), more.end());
        for (int damage = 0; damage < 1 + round % 8; ++damage) {
            packets[random() % packets.size()] = static_cast<uint8_t>(random());
        }
        for (const Bytes& each : filtered(packets)) {
            if ((each[1] & 0x80) != 0) { // a section with a sum is what was sent
                EXPECT_EQ(crc32(each.data(), each.size()), 0U);
                whole += each == section ? 1 : 0;
            }
        }
    }
    EXPECT_GT(whole, 1000U);
}

TEST(SectionFilterTest, LeavesNonsenseBehindAGoodSumOut) {
    std::mt19937 random(4711);
    for (int round = 0; round < 20000; ++round) {
        Bytes section(3 + random() % 300);
        for (uint8_t& byte : section) {
            byte = static_cast<uint8_t>(random());
        }
        const uint8_t tables[] = {0x00, 0x02, 0x40, 0x42, 0x4E, 0x70, 0x3D};
        section[0] = tables[random() % 7];
        parsePat(section);
        parsePmt(section);
        parseNit(section);
        parseSdt(section);
        parseEit(section);
        parseTime(section);
        parseStreamEvents(section);
    }
    EXPECT_FALSE(parseEit(Bytes(12, 0x4E)));
    EXPECT_FALSE(parsePat({}));
}

// A packet in which a frame with both time stamps and a clock reference begins.
Bytes makeFramePacket(uint8_t continuity, int64_t clock, int64_t presentation, int64_t decoding) {
    Bytes packet(packetSize, 0xFF);
    const auto stamp = [](uint8_t* bytes, uint8_t mark, int64_t value) {
        bytes[0] = static_cast<uint8_t>(mark | (value >> 30 & 7) << 1 | 1);
        bytes[1] = static_cast<uint8_t>(value >> 22);
        bytes[2] = static_cast<uint8_t>(value >> 14 | 1);
        bytes[3] = static_cast<uint8_t>(value >> 7);
        bytes[4] = static_cast<uint8_t>(value << 1 | 1);
    };
    const int64_t base = clock / 300;
    const int64_t extension = clock % 300;
    const uint8_t header[] = {packetStart,
                              0x41,
                              0x10,
                              static_cast<uint8_t>(0x30 | continuity),
                              7,
                              0x10,
                              static_cast<uint8_t>(base >> 25),
                              static_cast<uint8_t>(base >> 17),
                              static_cast<uint8_t>(base >> 9),
                              static_cast<uint8_t>(base >> 1),
                              static_cast<uint8_t>((base & 1) << 7 | 0x7E | extension >> 8),
                              static_cast<uint8_t>(extension),
                              0,
                              0,
                              1,
                              0xE0,
                              0,
                              0,
                              0x80,
                              0xC0,
                              10};
    std::copy(std::begin(header), std::end(header), packet.begin());
    stamp(packet.data() + 21, 0x30, presentation);
    stamp(packet.data() + 26, 0x10, decoding);
    return packet;
}

TEST(RestamperTest, LetsClockStampsAndCountersRunOnAcrossTheSeam) {
    constexpr int64_t frame = 3600; // ticks of 90 kHz
    constexpr int frames = 21;      // no multiple of the counter's 16
    Restamper restamper;
    int64_t expected = 90000;
    uint8_t continuity = 5;
    for (int round = 0; round < 3; ++round) {
        for (int index = 0; index < frames; ++index) {
            const int64_t time = 90000 + index * frame;
            Bytes packet =
                makeFramePacket(static_cast<uint8_t>((5 + index) & 0x0F), time * 300 + 7, time + frame, time);
            restamper.restamp(packet.data());
            EXPECT_EQ(packet[3] & 0x0F, continuity);
            EXPECT_EQ(clockReferenceOf(packet.data()), expected * 300 + 7);
            EXPECT_EQ(presentationTimeOf(packet.data()), expected + frame);
            const Bytes wanted = makeFramePacket(continuity, expected * 300 + 7, expected + frame, expected);
            EXPECT_EQ(packet, wanted); // the decoding time stamp, too, and nothing else
            continuity = (continuity + 1) & 0x0F;
            expected += frame;
        }
        restamper.repeat(frames * frame * 300);
    }
}

TEST(RestamperTest, WrapsAsTheStreamsClockDoes) {
    Restamper restamper;
    restamper.repeat(10 * 90000 * 300);
    const int64_t last = (int64_t{1} << 33) - 90000;
    Bytes packet = makeFramePacket(0, last * 300, last, last);
    restamper.restamp(packet.data());
    EXPECT_EQ(clockReferenceOf(packet.data()), 9 * 90000 * 300);
    EXPECT_EQ(presentationTimeOf(packet.data()), 9 * 90000);
}

} // namespace
