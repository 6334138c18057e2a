// Tables of a multiplex as they arrive, and the packets of the selected service.
#include "desktop/platform/Receiver.h"

#include <algorithm>

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

} // namespace

void Receiver::push(const uint8_t* packets, size_t size) {
    std::lock_guard<std::mutex> lock(m_mutex);
    if (!m_isFilteringTables) {
        m_isFilteringTables = true;
        m_sections.add(kPidPat);
        m_sections.add(kPidEit);
    }
    for (size_t at = 0; at + kPacketSize <= size; at += kPacketSize) {
        const uint8_t* packet = packets + at;
        m_sections.push(packet);
        if (m_isFeeding && m_fedPids.count(pidOf(packet)) != 0) {
            m_batch.insert(m_batch.end(), packet, packet + kPacketSize);
        }
    }
    if (m_isFeeding && !m_batch.empty()) {
        m_service->feed(m_batch);
        m_batch.clear();
    }
}

void Receiver::reset() {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_sections =
        SectionDemultiplexer([this](uint16_t pid, const Bytes& section) { onSection(pid, section); });
    m_isFilteringTables = false;
    m_pat.reset();
    m_pmts.clear();
    m_eitSections.clear();
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
}

void Receiver::deselect() {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_service.reset();
    m_isFeeding = false;
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
    m_fedPids = {pmt.pcrPid};
    m_streamEventTags.clear();
    for (const ElementaryStream& stream : pmt.streams) {
        if (stream.type == kStreamTypeDsmccStreamDescriptors) {
            m_streamEventTags[stream.pid] = componentTagOf(stream);
            m_sections.add(stream.pid);
        } else {
            m_fedPids.insert(stream.pid);
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

void Receiver::onSection(uint16_t pid, const Bytes& section) {
    if (pid == kPidPat) {
        onPat(section);
    } else if (pid == kPidEit) {
        onEit(section);
    } else if (const auto pmt = parsePmt(section)) {
        m_pmts[pmt->serviceId] = *pmt;
        if (m_isFeeding && pmt->serviceId == m_service->serviceId) {
            refreshFeed();
        }
        startFeed();
    } else if (m_isFeeding && m_streamEventTags.count(pid) != 0) {
        for (const StreamEvent& event : parseStreamEvents(section)) {
            m_service->onStreamEvent(m_streamEventTags[pid], event);
        }
    }
}

} // namespace desktop
