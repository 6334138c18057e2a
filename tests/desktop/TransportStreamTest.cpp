// Tables that are packed and parsed again, damaged sections, and timestamps across the seam of a repetition.
#include <gtest/gtest.h>

#include <random>

#include "desktop/platform/Restamper.h"
#include "desktop/platform/Sections.h"

using namespace desktop;

namespace {

Eit makeEit() {
    Eit eit;
    eit.serviceId = 101;
    eit.transportStreamId = 7;
    eit.originalNetworkId = kFirstPrivateNetworkId;
    eit.version = 9;
    eit.sectionNumber = kEitSectionFollowing;
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

// The sections that a filter reassembles from packets.
std::vector<Bytes> filtered(const Bytes& packets) {
    std::vector<Bytes> sections;
    SectionFilter filter([&](const Bytes& section) { sections.push_back(section); });
    for (size_t at = 0; at < packets.size(); at += kPacketSize) {
        filter.push(packets.data() + at);
    }
    return sections;
}

TEST(TablesTest, NameTheServicesAfterPackingAndReading) {
    Pat pat;
    pat.transportStreamId = 7;
    pat.version = 3;
    pat.programs = {{kProgramNumberNetwork, kPidNit}, {101, 0x101}, {65535, 0x1FFE}};
    const auto readPat = parsePat(pack(pat));
    ASSERT_TRUE(readPat);
    EXPECT_EQ(readPat->transportStreamId, 7);
    EXPECT_EQ(readPat->version, 3);
    EXPECT_EQ(readPat->programs, pat.programs);

    Sdt sdt;
    sdt.transportStreamId = 7;
    sdt.originalNetworkId = kFirstPrivateNetworkId;
    sdt.services = {{101, kServiceTypeDigitalTelevision, "Provider", "Größe"},
                    {102, kServiceTypeDigitalRadio, "", "Radio"}};
    const auto readSdt = parseSdt(pack(sdt));
    ASSERT_TRUE(readSdt);
    EXPECT_EQ(readSdt->originalNetworkId, kFirstPrivateNetworkId);
    ASSERT_EQ(readSdt->services.size(), 2U);
    EXPECT_EQ(readSdt->services[0].name, "Größe");
    EXPECT_EQ(readSdt->services[0].provider, "Provider");
    EXPECT_EQ(readSdt->services[1].type, kServiceTypeDigitalRadio);

    Nit nit;
    nit.networkId = kFirstPrivateNetworkId;
    nit.name = "Network";
    nit.transportStreamId = 7;
    nit.originalNetworkId = kFirstPrivateNetworkId;
    nit.deliveryDescriptor = {kTagSatelliteDeliverySystem, 2, 0x11, 0x22};
    const auto readNit = parseNit(pack(nit));
    ASSERT_TRUE(readNit);
    EXPECT_EQ(readNit->networkId, kFirstPrivateNetworkId);
    EXPECT_EQ(readNit->name, "Network");
    EXPECT_EQ(readNit->deliveryDescriptor, nit.deliveryDescriptor);
}

TEST(TablesTest, DescribeTheStreamsOfAService) {
    Pmt pmt;
    pmt.serviceId = 101;
    pmt.pcrPid = 0x110;
    pmt.streams = {
        {kStreamTypeMpeg2Video, 0x110, streamIdentifierDescriptor(1)},
        {kStreamTypeMpeg1Audio, 0x111, iso639LanguageDescriptor("deu", kAudioTypeVisualImpairedCommentary)}};
    const auto read = parsePmt(pack(pmt));
    ASSERT_TRUE(read);
    EXPECT_EQ(read->serviceId, 101);
    EXPECT_EQ(read->pcrPid, 0x110);
    ASSERT_EQ(read->streams.size(), 2U);
    EXPECT_EQ(read->streams[1].pid, 0x111);
    EXPECT_EQ(read->streams[1].descriptors,
              iso639LanguageDescriptor("deu", kAudioTypeVisualImpairedCommentary));
}

TEST(TablesTest, KeepProgrammesTimesRatingsAndEvents) {
    const Eit eit = makeEit();
    const auto read = parseEit(pack(eit));
    ASSERT_TRUE(read);
    EXPECT_EQ(read->serviceId, 101);
    EXPECT_EQ(read->version, 9);
    EXPECT_EQ(read->sectionNumber, kEitSectionFollowing);
    ASSERT_EQ(read->events.size(), 1U);
    EXPECT_EQ(read->events[0].id, 4711);
    EXPECT_EQ(read->events[0].start, eit.events[0].start);
    EXPECT_EQ(read->events[0].duration, eit.events[0].duration);
    EXPECT_EQ(read->events[0].name, "Größe & Länge");
    EXPECT_EQ(read->events[0].text, "What it is about.");
    ASSERT_EQ(read->events[0].ratings.size(), 2U);
    EXPECT_EQ(read->events[0].ratings[1].country, "FRA");
    EXPECT_EQ(read->events[0].ratings[1].value, 13);

    EXPECT_EQ(parseTime(packTdt(1795253723)), 1795253723);
    EXPECT_FALSE(parseTime({kTableIdTdt, 0x70, 0, 0}));
    EXPECT_FALSE(parseTime(pack(eit)));

    StreamEvent event{77, 5, {1, 0, 255}};
    const auto events = parseStreamEvents(pack(event));
    ASSERT_EQ(events.size(), 1U);
    EXPECT_EQ(events[0].id, 77);
    EXPECT_EQ(events[0].version, 5);
    EXPECT_EQ(events[0].data, event.data);
}

// The other tests would not notice a wrong number, because packing and parsing share it.
TEST(TablesTest, HaveTheBytesOfTheStandards) {
    Bytes section = pack(StreamEvent{0x0123, 5, {0xAB}});
    section.resize(section.size() - kCrcSize);
    EXPECT_EQ(section, (Bytes{0x3D, 0xB0, 0x16, 0x01, 0x23, 0xCB, 0x00, 0x00,             // header
                              0x1A, 0x0B, 0x01, 0x23, 0xFF, 0xFF, 0xFF, 0xFE, 0, 0, 0, 0, // event id, no NPT
                              0xAB}));
    Eit eit = makeEit();
    constexpr size_t kStatus =
        24; // running_status in its upper three bits, the length of the descriptors in the lower 12
    const Bytes following = pack(eit);
    EXPECT_EQ(following[kStatus] & 0xF0, 0x20);
    EXPECT_EQ((following[kStatus] & 0x0F) << 8 | following[kStatus + 1],
              static_cast<int>(following.size() - kStatus - 2 - kCrcSize));
    eit.sectionNumber = kEitSectionPresent;
    EXPECT_EQ(pack(eit)[kStatus] & 0xF0, 0x80);
    EXPECT_EQ(packTdt(0), (Bytes{0x70, 0x70, 0x05, 0x9E, 0x8B, 0, 0, 0}));
    EXPECT_EQ(subtitlingDescriptor("deu", kSubtitlingTypeHardOfHearing),
              (Bytes{0x59, 0x08, 'd', 'e', 'u', 0x20, 0, 1, 0, 1}));
    EXPECT_EQ(iso639LanguageDescriptor("eng", kAudioTypeVisualImpairedCommentary),
              (Bytes{0x0A, 0x04, 'e', 'n', 'g', 0x03}));
}

TEST(TablesTest, CutLongNamesBeforeACharacter) {
    Sdt sdt;
    sdt.services = {{101, kServiceTypeDigitalTelevision, std::string(200, 'x'), "x"}};
    for (int i = 0; i < 100; ++i) {
        sdt.services[0].name += "ö";
    }
    const auto read = parseSdt(pack(sdt));
    ASSERT_TRUE(read);
    EXPECT_EQ(read->services[0].provider, std::string(99, 'x')); // with the byte of the character table 100
    EXPECT_EQ(read->services[0].name, sdt.services[0].name.substr(0, 99));
    sdt.services[0].name.insert(0, "x");
    EXPECT_EQ(parseSdt(pack(sdt))->services[0].name, sdt.services[0].name.substr(0, 98));
}

TEST(TablesTest, DecodeTextsOfOlderCharacterSets) {
    const Bytes latin{'G', 'r', 0xF6, 0xDF, 'e'};
    Bytes marked{kCharacterTableIso8859ByNumber, 0x00, 0x01};
    marked.insert(marked.end(), latin.begin(), latin.end());
    EXPECT_EQ(decodeString(marked.data(), marked.size()), "Größe");
    const Bytes composed{'G', 'r', 0xC8, 'o', 0x86, 'x', 0x87}; // a diaeresis before its letter, and emphasis
    EXPECT_EQ(decodeString(composed.data(), composed.size()), "Gröx");
    EXPECT_EQ(decodeString(nullptr, 0), "");
}

TEST(SectionFilterTest, PutsASectionOfSeveralPacketsTogether) {
    Sdt sdt;
    for (uint16_t service = 1; service <= 30; ++service) {
        sdt.services.push_back(
            {service, kServiceTypeDigitalTelevision, "Provider", "Service " + std::to_string(service)});
    }
    const Bytes section = pack(sdt);
    ASSERT_GT(section.size(), 3 * kPacketSize);
    uint8_t continuity = 14;
    const auto sections = filtered(packetsOf(section, kPidSdt, continuity));
    ASSERT_EQ(sections.size(), 1U);
    EXPECT_EQ(sections[0], section);
}

TEST(SectionFilterTest, DropsASectionWithALostPacketAndTakesTheNext) {
    Sdt sdt;
    for (uint16_t service = 1; service <= 30; ++service) {
        sdt.services.push_back(
            {service, kServiceTypeDigitalTelevision, "Provider", "Service " + std::to_string(service)});
    }
    const Bytes section = pack(sdt);
    uint8_t continuity = 0;
    Bytes packets = packetsOf(section, kPidSdt, continuity);
    packets.erase(packets.begin() + kPacketSize, packets.begin() + 2 * kPacketSize);
    const Bytes again = packetsOf(section, kPidSdt, continuity);
    packets.insert(packets.end(), again.begin(), again.end());
    EXPECT_EQ(filtered(packets), std::vector<Bytes>{section});
}

TEST(SectionFilterTest, TakesEachPacketOnceThatIsSentTwice) {
    const Bytes section = pack(makeEit());
    uint8_t continuity = 3;
    const Bytes packets = packetsOf(section, kPidEit, continuity);
    Bytes doubled;
    for (size_t at = 0; at < packets.size(); at += kPacketSize) {
        for (int i = 0; i < 2; ++i) {
            doubled.insert(doubled.end(), packets.data() + at, packets.data() + at + kPacketSize);
        }
    }
    EXPECT_EQ(filtered(doubled), std::vector<Bytes>{section});
}

TEST(SectionFilterTest, PassesAPacketThatAnAdaptationFieldFills) {
    Sdt sdt;
    for (uint16_t service = 1; service <= 10; ++service) {
        sdt.services.push_back({service, kServiceTypeDigitalTelevision, "Provider", "Service"});
    }
    const Bytes section = pack(sdt);
    uint8_t continuity = 0;
    Bytes packets = packetsOf(section, kPidSdt, continuity);
    ASSERT_GT(packets.size(), kPacketSize);
    for (size_t at = kPacketSize; at < packets.size(); at += kPacketSize) {
        packets[at + 3] = static_cast<uint8_t>((packets[at + 3] & ~kContinuityCounterMask) |
                                               ((packets[at + 3] + 1) & kContinuityCounterMask));
    }
    Bytes full(packets.begin(), packets.begin() + kPacketSize);
    full[3] = static_cast<uint8_t>(kAdaptationFieldFlag | kPayloadFlag |
                                   ((packets[3] + 1) & kContinuityCounterMask));
    full[4] = kPacketSize - kPacketHeaderSize - 1;
    packets.insert(packets.begin() + kPacketSize, full.begin(), full.end());
    EXPECT_EQ(filtered(packets), std::vector<Bytes>{section});
}

TEST(SectionFilterTest, TakesTheLongestSectionAndNoLongerOne) {
    constexpr size_t kLongest = 4096; // of a private section
    const auto makeSection = [](size_t size) {
        Bytes section(size, 0);
        section[0] = kTableIdDsmccStreamDescriptors;
        section[1] = static_cast<uint8_t>((size - kSectionHeaderSize) >> 8); // without a CRC
        section[2] = static_cast<uint8_t>(size - kSectionHeaderSize);
        return section;
    };
    uint8_t continuity = 0;
    Bytes packets;
    for (const size_t size : {kLongest, kLongest + 1, size_t{100}}) {
        const Bytes more = packetsOf(makeSection(size), kPidEit, continuity);
        packets.insert(packets.end(), more.begin(), more.end());
    }
    EXPECT_EQ(filtered(packets), (std::vector<Bytes>{makeSection(kLongest), makeSection(100)}));
}

TEST(SectionFilterTest, TakesAnyDamageWithoutHarmAndLetsNoneThrough) {
    const Bytes section = pack(makeEit());
    std::mt19937 random(20261121);
    size_t whole = 0;
    for (int round = 0; round < 20000; ++round) {
        uint8_t continuity = static_cast<uint8_t>(round & kContinuityCounterMask);
        Bytes packets = packetsOf(section, kPidEit, continuity);
        const Bytes more = packetsOf(section, kPidEit, continuity);
        packets.insert(packets.end(), more.begin(), more.end());
        for (int damage = 0; damage < 1 + round % 8; ++damage) {
            packets[random() % packets.size()] = static_cast<uint8_t>(random());
        }
        for (const Bytes& each : filtered(packets)) {
            if ((each[1] & kSectionSyntaxIndicator) != 0) { // a section with a CRC is what was sent
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
        const uint8_t tables[] = {kTableIdPat,
                                  kTableIdPmt,
                                  kTableIdNitActual,
                                  kTableIdSdtActual,
                                  kTableIdEitActualPresentFollowing,
                                  kTableIdTdt,
                                  kTableIdDsmccStreamDescriptors};
        section[0] = tables[random() % std::size(tables)];
        parsePat(section);
        parsePmt(section);
        parseNit(section);
        parseSdt(section);
        parseEit(section);
        parseTime(section);
        parseStreamEvents(section);
    }
    EXPECT_FALSE(parseEit(Bytes(12, kTableIdEitActualPresentFollowing)));
    EXPECT_FALSE(parsePat({}));
}

// A packet with a PCR in which a PES packet with PTS and DTS begins.
Bytes makeFramePacket(uint8_t continuity, int64_t pcr, int64_t pts, int64_t dts) {
    Bytes packet(kPacketSize, kStuffingByte);
    const auto stamp = [](uint8_t* bytes, uint8_t prefix, int64_t value) {
        bytes[0] = static_cast<uint8_t>(prefix | (value >> 30 & 7) << 1 | 1);
        bytes[1] = static_cast<uint8_t>(value >> 22);
        bytes[2] = static_cast<uint8_t>(value >> 14 | 1);
        bytes[3] = static_cast<uint8_t>(value >> 7);
        bytes[4] = static_cast<uint8_t>(value << 1 | 1);
    };
    const int64_t base = pcr / kSystemClockTicksPerBaseTick;
    const int64_t extension = pcr % kSystemClockTicksPerBaseTick;
    const uint8_t header[] = {kSyncByte,
                              kPayloadUnitStartIndicator | 0x01, // PID 0x0110
                              0x10,
                              static_cast<uint8_t>(kAdaptationFieldFlag | kPayloadFlag | continuity),
                              kAdaptationFieldWithPcrLength,
                              kPcrFlag,
                              static_cast<uint8_t>(base >> 25),
                              static_cast<uint8_t>(base >> 17),
                              static_cast<uint8_t>(base >> 9),
                              static_cast<uint8_t>(base >> 1),
                              static_cast<uint8_t>((base & 1) << 7 | kPcrReservedBits | extension >> 8),
                              static_cast<uint8_t>(extension),
                              0, // packet_start_code_prefix
                              0,
                              1,
                              kStreamIdFirstVideo,
                              0,
                              0,
                              kPesHeaderMarker,
                              kPtsFlag | kDtsFlag,
                              2 * kPesTimestampSize};
    std::copy(std::begin(header), std::end(header), packet.begin());
    stamp(packet.data() + std::size(header), kTimestampPrefixPts, pts);
    stamp(packet.data() + std::size(header) + kPesTimestampSize, kTimestampPrefixDts, dts);
    return packet;
}

TEST(RestamperTest, LetsClockStampsAndCountersRunOnAcrossTheSeam) {
    constexpr int64_t kFrame = 3600; // ticks of 90 kHz
    constexpr int kFrames = 21;      // not a multiple of the counter's 16
    Restamper restamper;
    int64_t expected = 90000;
    uint8_t continuity = 5;
    for (int round = 0; round < 3; ++round) {
        for (int index = 0; index < kFrames; ++index) {
            const int64_t time = 90000 + index * kFrame;
            Bytes packet = makeFramePacket(static_cast<uint8_t>((5 + index) & kContinuityCounterMask),
                                           time * kSystemClockTicksPerBaseTick + 7, time + kFrame, time);
            restamper.restamp(packet.data());
            EXPECT_EQ(packet[3] & kContinuityCounterMask, continuity);
            EXPECT_EQ(pcrOf(packet.data()), expected * kSystemClockTicksPerBaseTick + 7);
            EXPECT_EQ(ptsOf(packet.data()), expected + kFrame);
            const Bytes expectedPacket = makeFramePacket(
                continuity, expected * kSystemClockTicksPerBaseTick + 7, expected + kFrame, expected);
            EXPECT_EQ(packet, expectedPacket); // the DTS, too, and nothing else
            continuity = (continuity + 1) & kContinuityCounterMask;
            expected += kFrame;
        }
        restamper.repeat(kFrames * kFrame * kSystemClockTicksPerBaseTick);
    }
}

TEST(RestamperTest, ShiftsEachBitOfATimestamp) {
    constexpr int64_t kFirst = 0x0F0F0F0F0;
    constexpr int64_t kShift = 0x0A5A5A5A5;
    Restamper restamper;
    restamper.repeat(kShift * kSystemClockTicksPerBaseTick);
    Bytes packet = makeFramePacket(0, kFirst * kSystemClockTicksPerBaseTick, kFirst + 3, kFirst);
    Bytes expected = makeFramePacket(0, (kFirst + kShift) * kSystemClockTicksPerBaseTick, kFirst + kShift + 3,
                                     kFirst + kShift);
    restamper.restamp(packet.data());
    EXPECT_EQ(packet, expected);
}

TEST(RestamperTest, FindsTimestampsInAPacketWithoutAnAdaptationField) {
    const auto withoutField = [](Bytes packet) {
        packet[3] &= static_cast<uint8_t>(~kAdaptationFieldFlag);
        packet.erase(packet.begin() + kPacketHeaderSize,
                     packet.begin() + kPacketHeaderSize + 1 + kAdaptationFieldWithPcrLength);
        packet.resize(kPacketSize, kStuffingByte);
        return packet;
    };
    Restamper restamper;
    restamper.repeat(90000 * kSystemClockTicksPerBaseTick);
    Bytes packet = withoutField(makeFramePacket(0, 0, 5000, 4000));
    restamper.restamp(packet.data());
    EXPECT_EQ(packet, withoutField(makeFramePacket(0, 0, 95000, 94000)));
}

TEST(RestamperTest, LeavesAGapInTheCountersAfterTheSeam) {
    Restamper restamper;
    const auto restamped = [&restamper](uint8_t continuity) {
        Bytes packet = makeFramePacket(continuity, 0, 0, 0);
        restamper.restamp(packet.data());
        return packet[3] & kContinuityCounterMask;
    };
    EXPECT_EQ(restamped(5), 5);
    restamper.repeat(0);
    EXPECT_EQ(restamped(5), 6);
    EXPECT_EQ(restamped(8), 9); // two packets are lost
}

TEST(RestamperTest, WrapsAsTheStreamsClockDoes) {
    Restamper restamper;
    restamper.repeat(10 * 90000 * kSystemClockTicksPerBaseTick);
    const int64_t last = kTimestampPeriod - 90000;
    Bytes packet = makeFramePacket(0, last * kSystemClockTicksPerBaseTick, last, last);
    restamper.restamp(packet.data());
    EXPECT_EQ(pcrOf(packet.data()), 9 * 90000 * kSystemClockTicksPerBaseTick);
    EXPECT_EQ(ptsOf(packet.data()), 9 * 90000);
}

} // namespace
