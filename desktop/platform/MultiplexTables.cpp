// The tables of the test multiplex, and how often each is repeated.
#include <algorithm>
#include <chrono>
#include <map>
#include <string>
#include <utility>

#include "desktop/platform/Multiplex.h"

namespace desktop {

namespace {

using std::chrono::milliseconds;

// Repetition intervals, none longer than TS 101 211 allows.
constexpr auto kPsiInterval = milliseconds(100);
constexpr auto kSiInterval = milliseconds(1000); // NIT, SDT, TDT
constexpr auto kEitInterval = milliseconds(500);
constexpr auto kAitInterval = milliseconds(500);
constexpr auto kStreamEventInterval = milliseconds(250);

constexpr uint8_t kTransportLabel = 1;
constexpr ApplicationProfile kHbbTvProfile{0, 1, 1, 1};

// The PID after those of the streams.
uint16_t aitPidOf(const TestService& service) {
    return static_cast<uint16_t>(service.streams.back().pid + 1);
}

std::vector<const TestApplication*> applicationsOf(const TestService& service) {
    std::vector<const TestApplication*> applications;
    for (const TestApplication& each : testApplications()) {
        if (std::find(each.serviceIds.begin(), each.serviceIds.end(), service.serviceId) !=
            each.serviceIds.end()) {
            applications.push_back(&each);
        }
    }
    return applications;
}

class TestTableInjector final : public TableInjector {
public:
    TestTableInjector(uint32_t programmeSeconds, uint32_t streamEventSeconds, std::string applicationsUrl)
        : m_programmeSeconds(programmeSeconds), m_streamEventSeconds(streamEventSeconds),
          m_applicationsUrl(std::move(applicationsUrl)) {
        for (const TestService& service : testServices()) {
            for (const ElementaryStream& stream : service.streams) {
                if (stream.type != kStreamTypeDsmccStreamDescriptors) {
                    m_passedPids.insert(stream.pid);
                }
            }
        }
    }

    const std::set<uint16_t>& passedPids() const override { return m_passedPids; }

    void appendDue(Clock::Instant now, int64_t utcSeconds, Bytes& packets) override {
        if (isDue(m_psiDue, now, kPsiInterval)) {
            appendPatAndPmts(packets);
        }
        if (isDue(m_siDue, now, kSiInterval)) {
            appendNit(packets);
            appendSdt(packets);
            append(packTdt(utcSeconds), kPidTdt, packets);
        }
        if (isDue(m_eitDue, now, kEitInterval)) {
            appendEits(utcSeconds, packets);
        }
        if (!m_applicationsUrl.empty() && isDue(m_aitDue, now, kAitInterval)) {
            appendAits(packets);
        }
        if (m_streamEventSeconds != 0 && isDue(m_streamEventsDue, now, kStreamEventInterval)) {
            appendStreamEvents(utcSeconds, packets);
        }
    }

private:
    static bool isDue(Clock::Instant& due, Clock::Instant now, Clock::Duration interval) {
        if (now < due) {
            return false;
        }
        due = now + interval;
        return true;
    }

    void append(const Bytes& section, uint16_t pid, Bytes& packets) {
        const Bytes more = packetsOf(section, pid, m_continuity[pid]);
        packets.insert(packets.end(), more.begin(), more.end());
    }

    void appendPatAndPmts(Bytes& packets) {
        Pat pat;
        pat.transportStreamId = kTestTransportStreamId;
        pat.programs.emplace_back(kProgramNumberNetwork, kPidNit);
        for (const TestService& service : testServices()) {
            pat.programs.emplace_back(service.serviceId, service.pmtPid);
        }
        append(pack(pat), kPidPat, packets);
        for (const TestService& service : testServices()) {
            Pmt pmt;
            pmt.serviceId = service.serviceId;
            pmt.pcrPid = service.streams[0].pid;
            pmt.streams = service.streams;
            if (!m_applicationsUrl.empty() && !applicationsOf(service).empty()) {
                pmt.streams.push_back({kStreamTypePrivateSections, aitPidOf(service),
                                       applicationSignallingDescriptor(kApplicationTypeHbbTv, 0)});
            }
            append(pack(pmt), service.pmtPid, packets);
        }
    }

    void appendNit(Bytes& packets) {
        Nit nit;
        nit.networkId = kTestOriginalNetworkId;
        nit.name = "Telix Test Network";
        nit.transportStreamId = kTestTransportStreamId;
        nit.originalNetworkId = kTestOriginalNetworkId;
        nit.deliveryDescriptor = testDeliveryDescriptor();
        append(pack(nit), kPidNit, packets);
    }

    void appendSdt(Bytes& packets) {
        Sdt sdt;
        sdt.transportStreamId = kTestTransportStreamId;
        sdt.originalNetworkId = kTestOriginalNetworkId;
        for (const TestService& service : testServices()) {
            sdt.services.push_back({service.serviceId, kServiceTypeDigitalTelevision, "Telix", service.name});
        }
        append(pack(sdt), kPidSdt, packets);
    }

    void appendEits(int64_t utcSeconds, Bytes& packets) {
        for (const TestService& service : testServices()) {
            for (const uint8_t sectionNumber : {kEitSectionPresent, kEitSectionFollowing}) {
                Eit eit;
                eit.serviceId = service.serviceId;
                eit.transportStreamId = kTestTransportStreamId;
                eit.originalNetworkId = kTestOriginalNetworkId;
                eit.version = static_cast<uint8_t>(utcSeconds / m_programmeSeconds % kVersionCount);
                eit.sectionNumber = sectionNumber;
                eit.events = {testProgramme(service, utcSeconds, m_programmeSeconds, sectionNumber)};
                append(pack(eit), kPidEit, packets);
            }
        }
    }

    // One section for each application.
    void appendAits(Bytes& packets) {
        for (const TestService& service : testServices()) {
            const auto applications = applicationsOf(service);
            for (size_t index = 0; index < applications.size(); ++index) {
                Ait ait;
                ait.sectionNumber = static_cast<uint8_t>(index);
                ait.lastSectionNumber = static_cast<uint8_t>(applications.size() - 1);
                ait.commonDescriptors = httpTransportDescriptor(kTransportLabel, m_applicationsUrl, {});
                ait.applications = {makeApplication(*applications[index])};
                append(pack(ait), aitPidOf(service), packets);
            }
        }
    }

    AitApplication makeApplication(const TestApplication& application) const {
        AitApplication made;
        made.organisationId = kTestOrganisationId;
        made.applicationId = application.applicationId;
        made.controlCode = application.controlCode;
        for (const Bytes& descriptor : {applicationDescriptor(kHbbTvProfile, application.isServiceBound,
                                                              application.priority, kTransportLabel),
                                        applicationNameDescriptor("eng", application.name),
                                        simpleApplicationLocationDescriptor(application.path),
                                        simpleApplicationBoundaryDescriptor({m_applicationsUrl})}) {
            made.descriptors.insert(made.descriptors.end(), descriptor.begin(), descriptor.end());
        }
        return made;
    }

    // One event in each period, repeated during the period's first second.
    void appendStreamEvents(int64_t utcSeconds, Bytes& packets) {
        if (utcSeconds % m_streamEventSeconds != 0) {
            return;
        }
        for (const TestService& service : testServices()) {
            StreamEvent event;
            event.id = kTestEventId;
            event.version = static_cast<uint8_t>(utcSeconds / m_streamEventSeconds % kVersionCount);
            const std::string data = std::string("Red button on ") + service.name;
            event.data.assign(data.begin(), data.end());
            append(pack(event), service.streams.back().pid, packets);
        }
    }

    uint32_t m_programmeSeconds;
    uint32_t m_streamEventSeconds;
    std::string m_applicationsUrl;
    std::set<uint16_t> m_passedPids;
    std::map<uint16_t, uint8_t> m_continuity; // by PID
    Clock::Instant m_psiDue;
    Clock::Instant m_siDue;
    Clock::Instant m_eitDue;
    Clock::Instant m_aitDue;
    Clock::Instant m_streamEventsDue;
};

} // namespace

std::unique_ptr<TableInjector> makeTestTableInjector(uint32_t programmeSeconds, uint32_t streamEventSeconds,
                                                     const std::string& applicationsUrl) {
    return std::make_unique<TestTableInjector>(programmeSeconds, streamEventSeconds, applicationsUrl);
}

} // namespace desktop
