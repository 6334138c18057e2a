// Tables of a multiplex as they arrive, and the packets of the selected service.
#include "desktop/platform/Receiver.h"

#include <algorithm>
#include <utility>

namespace desktop {

namespace {

// The PID of the one PMT in what a tuner is fed; above those that broadcasters use.
constexpr uint16_t kFedPmtPid = 0x1FF0;

uint8_t componentTagOf(const ElementaryStream& stream) {
    uint8_t componentTag = 0;
    forEachDescriptor(stream.descriptors, [&](uint8_t tag, const uint8_t* body, size_t length) {
        if (tag == kTagStreamIdentifier && length >= kStreamIdentifierBodySize) {
            componentTag = body[0];
        }
    });
    return componentTag;
}

// The PIDs that a tuner is fed.
std::set<uint16_t> fedPidsOf(const Pmt& pmt) {
    std::set<uint16_t> pids{pmt.pcrPid};
    for (const ElementaryStream& stream : pmt.streams) {
        if (stream.type != kStreamTypeDsmccStreamDescriptors && stream.type != kStreamTypePrivateSections) {
            pids.insert(stream.pid);
        }
    }
    return pids;
}

} // namespace

void Receiver::push(const uint8_t* packets, size_t size, Clock::Duration age) {
    std::lock_guard<std::mutex> lock(m_mutex);
    const Clock::Instant arrival = m_clock.now() - age;
    if (!m_isFilteringTables) {
        m_isFilteringTables = true;
        m_sections.add(kPidPat);
        m_sections.add(kPidEit);
    }
    for (size_t at = 0; at + kPacketSize <= size; at += kPacketSize) {
        const uint8_t* packet = packets + at;
        m_sections.push(packet);
        if (m_isKeeping) {
            m_recent.push(packet, arrival);
        }
        if (m_isFeeding && m_fedPids.count(pidOf(packet)) != 0) {
            m_batch.insert(m_batch.end(), packet, packet + kPacketSize);
        }
    }
    if (m_isFeeding && !m_batch.empty()) {
        m_service->feed(m_batch, age);
        m_batch.clear();
    }
}

void Receiver::keepPackets(bool isOn) {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_isKeeping = isOn;
    if (!isOn) {
        m_recent.clearPackets();
    }
}

bool Receiver::keepsPackets() const {
    std::lock_guard<std::mutex> lock(m_mutex);
    return m_isKeeping;
}

size_t Receiver::keptSize() const {
    std::lock_guard<std::mutex> lock(m_mutex);
    return m_recent.size();
}

Clock::Duration Receiver::keptAge(uint16_t serviceId) const {
    std::lock_guard<std::mutex> lock(m_mutex);
    const auto& chunks = m_recent.packetsOf(serviceId);
    return chunks.empty() ? Clock::Duration::zero() : m_clock.now() - chunks.front().arrival;
}

void Receiver::reset() {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_sections =
        SectionDemultiplexer([this](uint16_t pid, const Bytes& section) { onSection(pid, section); });
    m_isFilteringTables = false;
    m_pat.reset();
    m_pmts.clear();
    m_recent.clear();
    m_eitSections.clear();
    m_signalling.reset();
    m_service.reset();
    m_isFeeding = false;
}

void Receiver::select(const Service& service) {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_service = service;
    m_isFeeding = false;
    m_isMissing = false;
    m_batch.clear();
    m_fedPids.clear();
    m_streamEventTags.clear();
    m_patContinuity = 0;
    m_pmtContinuity = 0;
    for (const auto& [key, section] : m_eitSections) {
        const auto eit = key.first == service.serviceId ? parseEit(section) : std::nullopt;
        if (eit) {
            m_service->onEit(*eit);
        }
    }
    startFeed();
    feedRecent();
}

// What has arrived before the service was selected. A packet is fed either here or by push().
void Receiver::feedRecent() {
    if (!m_isFeeding) {
        return;
    }
    const Clock::Instant now = m_clock.now();
    for (const RecentPackets::Chunk& chunk : m_recent.packetsOf(m_service->serviceId)) {
        m_batch.insert(m_batch.end(), chunk.packets.begin(), chunk.packets.end()); // after PAT and PMT
        m_service->feed(m_batch, now - chunk.arrival);
        m_batch.clear();
    }
}

void Receiver::deselect() {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_service.reset();
    m_isFeeding = false;
}

void Receiver::followApplications(uint16_t serviceId, OnApplications onApplications) {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_signalling = Signalling{serviceId, std::move(onApplications), {}, false};
    refreshSignalling();
}

// The PIDs of the AIT are those of the PMT. What is known of the others stays.
void Receiver::refreshSignalling() {
    const auto pmt = m_signalling ? m_pmts.find(m_signalling->serviceId) : m_pmts.end();
    if (pmt == m_pmts.end()) {
        return;
    }
    std::map<uint16_t, ApplicationTable> before = std::exchange(m_signalling->tables, {});
    for (const ElementaryStream& stream : pmt->second.streams) {
        if (carriesApplications(stream)) {
            m_signalling->tables.insert(before.extract(stream.pid));
            m_signalling->tables.try_emplace(stream.pid);
            m_sections.add(stream.pid);
        }
    }
    const bool isFirst = !std::exchange(m_signalling->hasPmt, true);
    if (!before.empty() || (isFirst && m_signalling->tables.empty())) {
        reportApplications();
    }
}

void Receiver::reportApplications() const {
    ApplicationList all;
    for (const auto& [pid, table] : m_signalling->tables) {
        const ApplicationList& list = table.list();
        all.applications.insert(all.applications.end(), list.applications.begin(), list.applications.end());
        all.skipped.insert(all.skipped.end(), list.skipped.begin(), list.skipped.end());
    }
    m_signalling->onApplications(all);
}

void Receiver::onAit(uint16_t pid, const Bytes& section) {
    if (!m_signalling) {
        return;
    }
    const auto table = m_signalling->tables.find(pid);
    if (table != m_signalling->tables.end() && table->second.add(section)) {
        reportApplications();
    }
}

// As soon as the PMT of the service is known.
void Receiver::startFeed() {
    if (!m_service || m_isFeeding || !m_pat) {
        return;
    }
    const auto pmt = m_pmts.find(m_service->serviceId);
    if (pmt != m_pmts.end()) {
        m_isFeeding = true;
        m_service->onPmt(pmt->second);
        refreshFeed();
        return;
    }
    const bool isListed =
        std::any_of(m_pat->programs.begin(), m_pat->programs.end(),
                    [&](const auto& program) { return program.first == m_service->serviceId; });
    if (!isListed && !m_isMissing) {
        m_isMissing = true;
        m_service->onMissing();
    }
}

// A tuner is fed a multiplex of one service with a PAT and a PMT of its own.
void Receiver::refreshFeed() {
    const Pmt& pmt = m_pmts[m_service->serviceId];
    Pat fedPat;
    fedPat.transportStreamId = m_pat->transportStreamId;
    fedPat.programs.emplace_back(pmt.serviceId, kFedPmtPid);
    Pmt fedPmt = pmt;
    fedPmt.streams.clear();
    m_fedPids = fedPidsOf(pmt);
    m_streamEventTags.clear();
    for (const ElementaryStream& stream : pmt.streams) {
        if (stream.type == kStreamTypeDsmccStreamDescriptors) {
            m_streamEventTags[stream.pid] = componentTagOf(stream);
            m_sections.add(stream.pid);
        } else if (m_fedPids.count(stream.pid) != 0) {
            fedPmt.streams.push_back(stream);
        }
    }
    for (const Bytes& packets : {packetsOf(pack(fedPat), kPidPat, m_patContinuity),
                                 packetsOf(pack(fedPmt), kFedPmtPid, m_pmtContinuity)}) {
        m_batch.insert(m_batch.end(), packets.begin(), packets.end());
    }
}

void Receiver::onPat(const Bytes& section) {
    auto pat = parsePat(section);
    if (!pat) {
        return;
    }
    m_pat = std::move(pat);
    for (const auto& [program, pmtPid] : m_pat->programs) {
        if (program != kProgramNumberNetwork) {
            m_sections.add(pmtPid);
        }
    }
    startFeed();
}

void Receiver::onEit(const Bytes& section) {
    const auto eit = parseEit(section);
    if (!eit) {
        return;
    }
    Bytes& known = m_eitSections[{eit->serviceId, eit->sectionNumber}];
    if (known != section) {
        known = section;
        if (m_service && m_service->serviceId == eit->serviceId) {
            m_service->onEit(*eit);
        }
    }
}

void Receiver::onPmt(const Pmt& pmt) {
    m_pmts[pmt.serviceId] = pmt;
    m_recent.setService(pmt, fedPidsOf(pmt));
    if (m_isFeeding && pmt.serviceId == m_service->serviceId) {
        refreshFeed();
    }
    startFeed();
    if (m_signalling && m_signalling->serviceId == pmt.serviceId) {
        refreshSignalling();
    }
}

void Receiver::onSection(uint16_t pid, const Bytes& section) {
    if (pid == kPidPat) {
        onPat(section);
    } else if (pid == kPidEit) {
        onEit(section);
    } else if (section[0] == kTableIdAit) {
        onAit(pid, section);
    } else if (const auto pmt = parsePmt(section)) {
        onPmt(*pmt);
    } else if (m_isFeeding && m_streamEventTags.count(pid) != 0) {
        for (const StreamEvent& event : parseStreamEvents(section)) {
            m_service->onStreamEvent(m_streamEventTags[pid], event);
        }
    }
}

} // namespace desktop
