// The AIT: what is read from its sections, what is skipped and why, and how the receiver follows it.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <random>

#include "desktop/platform/ApplicationInformation.h"
#include "desktop/platform/Receiver.h"
#include "desktop/platform/Sections.h"
#include "tests/desktop/ManualClock.h"

using namespace desktop;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

constexpr uint16_t kServiceId = 101;
constexpr uint16_t kPmtPid = 0x101;
constexpr uint16_t kAitPid = 0x116;
constexpr uint8_t kLabel = 4;
constexpr ApplicationProfile kHbbTv11{0, 1, 1, 1};

Bytes joined(std::initializer_list<Bytes> parts) {
    Bytes bytes;
    for (const Bytes& part : parts) {
        bytes.insert(bytes.end(), part.begin(), part.end());
    }
    return bytes;
}

// An application with all that it needs to start.
AitApplication makeApplication(uint16_t id, uint8_t priority, uint8_t controlCode = kControlCodeAutostart) {
    AitApplication application;
    application.organisationId = 0x12345678;
    application.applicationId = id;
    application.controlCode = controlCode;
    application.descriptors = joined({applicationDescriptor(kHbbTv11, false, priority, kLabel),
                                      httpTransportDescriptor(kLabel, "http://a.example/", {}),
                                      simpleApplicationLocationDescriptor("start.html")});
    return application;
}

Bytes makeSection(uint8_t version, std::vector<AitApplication> applications, uint8_t number = 0,
                  uint8_t last = 0) {
    Ait ait;
    ait.version = version;
    ait.sectionNumber = number;
    ait.lastSectionNumber = last;
    ait.applications = std::move(applications);
    return pack(ait);
}

// Adds a section after its CRC has been made right for changed bytes.
Bytes changed(Bytes section, size_t at, uint8_t value) {
    section.at(at) = value;
    section.resize(section.size() - kCrcSize);
    const uint32_t sum = crc32(section.data(), section.size());
    for (int shift = 24; shift >= 0; shift -= 8) {
        section.push_back(static_cast<uint8_t>(sum >> shift));
    }
    return section;
}

std::vector<uint16_t> idsOf(const ApplicationList& list) {
    std::vector<uint16_t> ids;
    for (const SignalledApplication& each : list.applications) {
        ids.push_back(each.id.application);
    }
    return ids;
}

ApplicationList listOf(const Bytes& section) {
    ApplicationTable table;
    EXPECT_TRUE(table.add(section));
    return table.list();
}

TEST(ApplicationTableTest, ReadsEverythingThatAnApplicationSignals) {
    AitApplication application;
    application.organisationId = 0xFEDCBA98;
    application.applicationId = 0xABCD;
    application.controlCode = kControlCodePresent;
    application.descriptors =
        joined({applicationNameDescriptor("deu", "Größe"), applicationNameDescriptor("eng", "Size"),
                applicationDescriptor(kHbbTv11, true, 200, kLabel), applicationUsageDescriptor(1),
                httpTransportDescriptor(kLabel, "http://a.example/", {"hbb/", "other/"}),
                simpleApplicationLocationDescriptor("start.html?x=1#top"),
                simpleApplicationBoundaryDescriptor({"http://b.example/", "https://c.example/d"})});
    const ApplicationList list = listOf(makeSection(3, {application}));
    EXPECT_THAT(list.skipped, IsEmpty());
    ASSERT_EQ(list.applications.size(), 1U);
    const SignalledApplication& read = list.applications[0];
    EXPECT_EQ(toString(read.id), "fedcba98.abcd");
    EXPECT_EQ(read.controlCode, kControlCodePresent);
    EXPECT_EQ(read.name, "Größe");
    EXPECT_EQ(read.url, "http://a.example/hbb/start.html?x=1#top");
    EXPECT_TRUE(read.isServiceBound);
    EXPECT_EQ(read.visibility, kVisibilityAll);
    EXPECT_EQ(read.priority, 200);
    EXPECT_EQ(read.usage, kUsageDigitalText);
    EXPECT_THAT(read.boundaries, ElementsAre("http://b.example/", "https://c.example/d"));
}

// The other tests would not notice a wrong number, because packing and parsing share it.
TEST(ApplicationTableTest, ReadsTheBytesOfTheStandard) {
    const std::string base = "http://e.x/";
    const std::string path = "i.html";
    Bytes common{0x02, static_cast<uint8_t>(5 + base.size()), 0x00, 0x03,
                 0x01, static_cast<uint8_t>(base.size())};
    common.insert(common.end(), base.begin(), base.end());
    common.push_back(0); // no extension
    Bytes own{0x00, 0x09,
              0x05, 0x00,
              0x00, 0x01,
              0x01, 0x01,
              0xFF, 0x07,
              0x01, // application
              0x15, static_cast<uint8_t>(path.size())};
    own.insert(own.end(), path.begin(), path.end());
    Bytes section{0x74, 0xF0, 0x00, 0x00, 0x10, 0xC3, 0x00, 0x00, 0xF0, static_cast<uint8_t>(common.size())};
    section.insert(section.end(), common.begin(), common.end());
    const Bytes loop{0xF0, static_cast<uint8_t>(9 + own.size()), 0, 0, 0, 0x11, 0, 0x22, 0x01,
                     0xF0, static_cast<uint8_t>(own.size())};
    section.insert(section.end(), loop.begin(), loop.end());
    section.insert(section.end(), own.begin(), own.end());
    section.resize(section.size() + kCrcSize);
    section[2] = static_cast<uint8_t>(section.size() - kSectionHeaderSize);
    const ApplicationList list = listOf(changed(section, 0, 0x74));
    ASSERT_EQ(list.applications.size(), 1U);
    EXPECT_EQ(toString(list.applications[0].id), "11.22");
    EXPECT_EQ(list.applications[0].url, "http://e.x/i.html");
    EXPECT_TRUE(list.applications[0].isServiceBound);
    EXPECT_EQ(list.applications[0].priority, 7);
    EXPECT_EQ(applicationSignallingDescriptor(kApplicationTypeHbbTv, 3), (Bytes{0x6F, 3, 0x80, 0x10, 0xE3}));
}

TEST(ApplicationTableTest, SkipsAnApplicationThatCannotRunAndSaysWhy) {
    struct Case {
        Bytes descriptors;
        uint8_t controlCode;
        const char* reason;
    };
    const Bytes application = applicationDescriptor(kHbbTv11, false, 1, kLabel);
    const Bytes transport = httpTransportDescriptor(kLabel, "http://a.example/", {});
    const Bytes location = simpleApplicationLocationDescriptor("start.html");
    const Bytes carousel{kTagTransportProtocol, 4, 0x00, 0x01, kLabel, 0};
    const Case cases[] = {
        {joined({transport, location}), kControlCodeAutostart, "no application descriptor"},
        {joined({application, transport}), kControlCodeAutostart, "no simple application location"},
        {joined({application, location, carousel}), kControlCodeAutostart, "no HTTP transport"},
        {joined({application, location, httpTransportDescriptor(kLabel + 1, "http://a.example/", {})}),
         kControlCodePresent, "no HTTP transport"},
        {joined({applicationDescriptor({0, 1, 9, 1}, false, 1, kLabel), transport, location}),
         kControlCodeAutostart, "profile or version"},
        {joined({applicationDescriptor({2, 1, 1, 1}, false, 1, kLabel), transport, location}),
         kControlCodeAutostart, "profile or version"},
        {joined({application, httpTransportDescriptor(kLabel, "start/", {}), location}),
         kControlCodeAutostart, "\"start/start.html\" is not an absolute URL"},
        {joined({application, httpTransportDescriptor(kLabel, "http://a.example/ \x01", {}), location}),
         kControlCodeAutostart, "invalid characters"},
        {joined({application, transport, location}), 0x05, "control code 5"},
        {joined({Bytes{kTagApplication, 2, 200, 1}, transport, location}), kControlCodeAutostart,
         "descriptor 0x00 is malformed"},
        {joined({application, transport, location, Bytes{kTagSimpleApplicationBoundary, 2, 1, 9}}),
         kControlCodeAutostart, "descriptor 0x17 is malformed"},
        {joined({application, transport, location, Bytes{0x16, 9, 1}}), kControlCodeAutostart,
         "longer than the descriptors"},
    };
    for (const Case& each : cases) {
        AitApplication bad;
        bad.applicationId = 0xBAD;
        bad.controlCode = each.controlCode;
        bad.descriptors = each.descriptors;
        const ApplicationList list = listOf(makeSection(0, {bad, makeApplication(2, 1)}));
        EXPECT_THAT(idsOf(list), ElementsAre(2)) << each.reason;
        EXPECT_THAT(list.skipped, ElementsAre(HasSubstr(each.reason)));
        EXPECT_THAT(list.skipped, ElementsAre(HasSubstr("application 0.bad: ")));
    }
}

TEST(ApplicationTableTest, NeedsNoLocationOfAnApplicationThatMustNotRun) {
    AitApplication application;
    for (const uint8_t code : {kControlCodeKill, kControlCodeDisabled}) {
        application.controlCode = code;
        const ApplicationList list = listOf(makeSection(0, {application}));
        ASSERT_EQ(list.applications.size(), 1U);
        EXPECT_EQ(list.applications[0].controlCode, code);
    }
}

TEST(ApplicationTableTest, WaitsForAllSectionsOfAVersionAndReportsTheNextOneAgain) {
    ApplicationTable table;
    EXPECT_FALSE(table.add(makeSection(1, {makeApplication(3, 1)}, 2, 2)));
    EXPECT_FALSE(table.add(makeSection(1, {makeApplication(1, 1)}, 0, 2)));
    EXPECT_TRUE(table.add(makeSection(1, {makeApplication(2, 1)}, 1, 2)));
    EXPECT_THAT(idsOf(table.list()), ElementsAre(1, 2, 3));
    EXPECT_FALSE(table.add(makeSection(1, {makeApplication(1, 1)}, 0, 2))); // a repetition
    EXPECT_FALSE(table.add(makeSection(2, {makeApplication(7, 1)}, 0, 1)));
    EXPECT_THAT(idsOf(table.list()), ElementsAre(1, 2, 3)); // until the new version is there
    EXPECT_TRUE(table.add(makeSection(2, {makeApplication(8, 1)}, 1, 1)));
    EXPECT_THAT(idsOf(table.list()), ElementsAre(7, 8));
    EXPECT_TRUE(table.add(makeSection(3, {})));
    EXPECT_THAT(idsOf(table.list()), IsEmpty());
}

TEST(ApplicationTableTest, IgnoresADamagedSectionAndTakesTheOthers) {
    ApplicationTable table;
    const Bytes first = makeSection(1, {makeApplication(1, 1)}, 0, 1);
    const Bytes damaged =
        changed(makeSection(1, {makeApplication(2, 1)}, 1, 1), 11, 0xFF); // the loop's length
    EXPECT_FALSE(table.add(first));
    EXPECT_FALSE(table.add(damaged));
    EXPECT_TRUE(table.add(first)); // all there is
    EXPECT_THAT(idsOf(table.list()), ElementsAre(1));
    EXPECT_THAT(table.list().skipped, ElementsAre("section: malformed"));
    EXPECT_FALSE(table.add(damaged));
    EXPECT_TRUE(table.add(makeSection(1, {makeApplication(2, 1)}, 1, 1))); // repaired
    EXPECT_THAT(idsOf(table.list()), ElementsAre(1, 2));

    ApplicationTable hopeless;
    EXPECT_FALSE(hopeless.add(damaged));
    EXPECT_TRUE(hopeless.add(damaged));
    EXPECT_THAT(hopeless.list().skipped, ElementsAre("section: malformed"));
    EXPECT_FALSE(hopeless.add(damaged));
}

TEST(ApplicationTableTest, IgnoresOtherApplicationTypesAndTestApplications) {
    ApplicationTable table;
    Ait ait;
    ait.applications = {makeApplication(1, 1)};
    ait.applicationType = 1;
    EXPECT_FALSE(table.add(pack(ait)));
    ait.applicationType = kApplicationTypeHbbTv;
    ait.isTest = true;
    EXPECT_FALSE(table.add(pack(ait)));
    ait.isTest = false;
    EXPECT_TRUE(table.add(pack(ait)));
}

TEST(ApplicationTableTest, TakesAnyDamageWithoutHarm) {
    const Bytes section = makeSection(1, {makeApplication(1, 1), makeApplication(2, 9)});
    std::mt19937 random(20261122);
    size_t listed = 0;
    for (int round = 0; round < 20000; ++round) {
        ApplicationTable table;
        Bytes damaged = section;
        for (int damage = 0; damage <= round % 6; ++damage) {
            damaged[3 + random() % (damaged.size() - 3)] = static_cast<uint8_t>(random());
        }
        if (round % 3 == 0) {
            damaged.resize(random() % damaged.size());
        }
        table.add(damaged);
        table.add(damaged);
        listed += table.list().applications.size();
        for (const SignalledApplication& each : table.list().applications) {
            EXPECT_EQ(findFault(each), "");
        }
    }
    EXPECT_GT(listed, 1000U);
}

TEST(ApplicationTableTest, LimitsTheNumberOfApplications) {
    ApplicationList list;
    Ait ait;
    ait.applications.assign(kMaxSignalledApplications + 3, makeApplication(1, 1));
    readApplications(ait, list);
    EXPECT_EQ(list.applications.size(), kMaxSignalledApplications);
    EXPECT_EQ(list.skipped.size(), 3U);
}

// A multiplex of one service whose packets are pushed into a receiver.
class ReceiverSignallingTest : public testing::Test {
protected:
    void SetUp() override {
        m_receiver.followApplications(kServiceId,
                                      [this](const ApplicationList& list) { m_lists.push_back(list); });
    }

    void push(const Bytes& section, uint16_t pid) {
        const Bytes packets = packetsOf(section, pid, m_continuity[pid]);
        m_receiver.push(packets.data(), packets.size(), Clock::Duration::zero());
    }

    void pushPat() {
        Pat pat;
        pat.programs = {{kServiceId, kPmtPid}};
        push(pack(pat), kPidPat);
    }

    void pushPmt(uint8_t version, const std::vector<uint16_t>& aitPids) {
        Pmt pmt;
        pmt.serviceId = kServiceId;
        pmt.version = version;
        pmt.streams = {{kStreamTypeMpeg2Video, 0x110, {}}, {kStreamTypePrivateSections, 0x115, {}}};
        for (const uint16_t pid : aitPids) {
            pmt.streams.push_back({kStreamTypePrivateSections, pid,
                                   applicationSignallingDescriptor(kApplicationTypeHbbTv, version)});
        }
        push(pack(pmt), kPmtPid);
    }

    ManualClock m_clock{0};
    Receiver m_receiver{m_clock};
    std::vector<ApplicationList> m_lists;
    std::map<uint16_t, uint8_t> m_continuity;
};

TEST_F(ReceiverSignallingTest, ReportsAnEmptyListAsSoonAsTheServiceSignalsNothing) {
    pushPat();
    EXPECT_THAT(m_lists, IsEmpty());
    pushPmt(0, {});
    ASSERT_EQ(m_lists.size(), 1U);
    EXPECT_THAT(m_lists[0].applications, IsEmpty());
    pushPmt(0, {});
    EXPECT_EQ(m_lists.size(), 1U);
}

TEST_F(ReceiverSignallingTest, FollowsTheAitThroughChangesOfItAndOfThePmt) {
    pushPat();
    pushPmt(0, {kAitPid});
    EXPECT_THAT(m_lists, IsEmpty()); // not known yet
    push(makeSection(0, {makeApplication(1, 1)}), kAitPid);
    push(makeSection(0, {makeApplication(1, 1)}), kAitPid);
    pushPmt(0, {kAitPid});
    ASSERT_EQ(m_lists.size(), 1U);
    EXPECT_THAT(idsOf(m_lists.back()), ElementsAre(1));
    push(makeSection(1, {makeApplication(2, 1)}), kAitPid);
    EXPECT_THAT(idsOf(m_lists.back()), ElementsAre(2));
    pushPmt(1, {kAitPid, kAitPid + 1});
    push(makeSection(5, {makeApplication(3, 1)}), kAitPid + 1);
    EXPECT_THAT(idsOf(m_lists.back()), ElementsAre(2, 3));
    pushPmt(2, {kAitPid + 1});
    EXPECT_THAT(idsOf(m_lists.back()), ElementsAre(3));
    pushPmt(3, {});
    EXPECT_THAT(idsOf(m_lists.back()), IsEmpty());
    const size_t count = m_lists.size();
    push(makeSection(2, {makeApplication(4, 1)}), kAitPid); // nobody signals this PID any more
    EXPECT_EQ(m_lists.size(), count);
}

TEST_F(ReceiverSignallingTest, ForgetsTheServiceWithItsMultiplex) {
    pushPat();
    pushPmt(0, {kAitPid});
    m_receiver.reset();
    m_continuity.clear();
    pushPat();
    pushPmt(0, {});
    EXPECT_THAT(m_lists, IsEmpty());
}

} // namespace
