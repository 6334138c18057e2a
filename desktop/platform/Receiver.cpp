// Tables of a multiplex as they come, and the packets of the selected service.
#include "desktop/platform/Receiver.h"

namespace desktop {

namespace {

// Where the only map of what a tuner is fed stands.
constexpr uint16_t fedMapPid = 0x1FF0;

uint8_t tagOf(const ElementaryStream& stream) {
    uint8_t tag = 0;
    forEachDescriptor(stream.descriptors, [&](uint8_t descriptor, const uint8_t* body, size_t length) {
        if (descriptor == 0x52 && length >= 1) {
            tag = body[0];
        }
    });
    return tag;
}

} // namespace

void Receiver::push(const uint8_t* packets, size_t size) {
    std::lock_guard<std::mutex> lock(m_mutex);
    if (!m_isWatching) {
        m_isWatching = true;
        m_sections.add(patPid);
        m_sections.add(eitPid);
    }
    for (size_t at = 0; at + packetSize <= size; at += packetSize) {
        const uint8_t* packet = packets + at;
        m_sections.push(packet);
        if (m_isBegun && m_fedPids.count(pidOf(packet)) != 0) {
            m_batch.insert(m_batch.end(), packet, packet + packetSize);
        }
    }
    if (m_isBegun && !m_batch.empty()) {
        m_service->feed(m_batch);
        m_batch.clear();
    }
}

void Receiver::reset() {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_sections =
        SectionDemultiplexer([this](uint16_t pid, const Bytes& section) { takeSection(pid, section); });
    m_pat.reset();
    m_maps.clear();
    m_programmes.clear();
    m_isWatching = false;
    m_service.reset();
    m_isBegun = false;
}

void Receiver::select(const Service& service) {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_service = service;
    m_isBegun = false;
    m_isMissing = false;
    m_batch.clear();
    m_fedPids.clear();
    m_eventTags.clear();
    m_patContinuity = 0;
    m_mapContinuity = 0;
    for (const auto& [key, section] : m_programmes) {
        const auto eit = key.first == service.serviceId ? parseEit(section) : std::nullopt;
        if (eit) {
            m_service->programmes(*eit);
        }
    }
    begin();
}

void Receiver::deselect() {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_service.reset();
    m_isBegun = false;
}

// Starts to feed as soon as the map of the service is known.
void Receiver::begin() {
    if (!m_service || m_isBegun || !m_pat) {
        return;
    }
    const auto map = m_maps.find(m_service->serviceId);
    if (map != m_maps.end()) {
        m_isBegun = true;
        m_service->mapped(map->second);
        refreshFeed();
        return;
    }
    bool isListed = false;
    for (const auto& [service, pid] : m_pat->programmes) {
        isListed = isListed || service == m_service->serviceId;
    }
    if (!isListed && !m_isMissing) {
        m_isMissing = true;
        m_service->missing();
    }
}

// What a tuner is fed is a multiplex with one service, with tables of its own.
void Receiver::refreshFeed() {
    const Pmt& map = m_maps[m_service->serviceId];
    Pat pat;
    pat.transportStreamId = m_pat->transportStreamId;
    pat.programmes.emplace_back(map.serviceId, fedMapPid);
    Pmt fed = map;
    fed.streams.clear();
    m_fedPids = {map.pcrPid};
    m_eventTags.clear();
    for (const ElementaryStream& stream : map.streams) {
        if (stream.type == streamTypeStreamEvents) {
            m_eventTags[stream.pid] = tagOf(stream);
            m_sections.add(stream.pid);
        } else {
            m_fedPids.insert(stream.pid);
            fed.streams.push_back(stream);
        }
    }
    for (const Bytes& packets :
         {packetsOf(pack(pat), patPid, m_patContinuity), packetsOf(pack(fed), fedMapPid, m_mapContinuity)}) {
        m_batch.insert(m_batch.end(), packets.begin(), packets.end());
    }
}

void Receiver::takeSection(uint16_t pid, const Bytes& section) {
    if (pid == patPid) {
        if (auto pat = parsePat(section)) {
            m_pat = std::move(pat);
            for (const auto& [service, mapPid] : m_pat->programmes) {
                if (service != 0) {
                    m_sections.add(mapPid);
                }
            }
            begin();
        }
    } else if (pid == eitPid) {
        const auto eit = parseEit(section);
        if (!eit) {
            return;
        }
        Bytes& known = m_programmes[{eit->serviceId, eit->number}];
        if (known != section) {
            known = section;
            if (m_service && m_service->serviceId == eit->serviceId) {
                m_service->programmes(*eit);
            }
        }
    } else if (const auto map = parsePmt(section)) {
        m_maps[map->serviceId] = *map;
        if (m_isBegun && map->serviceId == m_service->serviceId) {
            refreshFeed();
        }
        begin();
    } else if (m_isBegun && m_eventTags.count(pid) != 0) {
        for (const StreamEvent& event : parseStreamEvents(section)) {
            m_service->event(m_eventTags[pid], event);
        }
    }
}

} // namespace desktop
