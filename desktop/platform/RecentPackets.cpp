// Keeping, and the recognition of random access points.
#include "desktop/platform/RecentPackets.h"

#include <algorithm>

namespace desktop {

namespace {

// A NAL unit with the random access of AVC (an IDR slice, or the parameter set before it) or HEVC.
bool isRandomAccessUnit(uint8_t byte, uint8_t streamType) {
    if (streamType == kStreamTypeAvcVideo) {
        const uint8_t type = byte & 0x1F;
        return type == kAvcNalIdrSlice || type == kAvcNalSequenceParameterSet;
    }
    if (streamType == kStreamTypeHevcVideo) {
        const uint8_t type = byte >> 1 & 0x3F;
        return (type >= kHevcNalFirstIrap && type <= kHevcNalLastIrap) || type == kHevcNalVideoParameterSet;
    }
    return byte == kMpegSequenceHeaderCode;
}

} // namespace

bool isVideo(uint8_t streamType) {
    return streamType == kStreamTypeMpeg1Video || streamType == kStreamTypeMpeg2Video ||
           streamType == kStreamTypeAvcVideo || streamType == kStreamTypeHevcVideo;
}

bool isRandomAccessPoint(const uint8_t* packet, uint8_t streamType) {
    const bool isIntact = packet[0] == kSyncByte && (packet[1] & kTransportErrorIndicator) == 0 &&
                          (packet[3] & kTransportScramblingControlMask) == 0;
    const bool hasAdaptationField = (packet[3] & kAdaptationFieldFlag) != 0;
    if (!isIntact || (packet[1] & kPayloadUnitStartIndicator) == 0 || (packet[3] & kPayloadFlag) == 0) {
        return false;
    }
    if (hasAdaptationField && packet[4] > 0 && (packet[5] & kRandomAccessIndicator) != 0) {
        return true;
    }
    const size_t payload = kPacketHeaderSize + (hasAdaptationField ? 1 + size_t{packet[4]} : 0);
    for (size_t at = payload + kPesFixedHeaderSize; at + 3 < kPacketSize; ++at) {
        const bool isStartCode = packet[at] == 0 && packet[at + 1] == 0 && packet[at + 2] == 1;
        if (isStartCode && isRandomAccessUnit(packet[at + 3], streamType)) {
            return true;
        }
    }
    return false;
}

void RecentPackets::setService(const Pmt& pmt, const std::set<uint16_t>& pids) {
    const auto video = std::find_if(pmt.streams.begin(), pmt.streams.end(),
                                    [](const ElementaryStream& each) { return isVideo(each.type); });
    Service& service = m_services[pmt.serviceId];
    const uint16_t videoPid = video == pmt.streams.end() ? kPidNullPacket : video->pid;
    if (service.videoPid == videoPid && service.pids == pids) {
        return;
    }
    drop(service);
    for (const uint16_t pid : service.pids) {
        std::vector<Service*>& receivers = m_receivers[pid];
        receivers.erase(std::remove(receivers.begin(), receivers.end(), &service), receivers.end());
    }
    service.videoPid = videoPid;
    service.videoType = video == pmt.streams.end() ? 0 : video->type;
    service.pids = pids;
    for (const uint16_t pid : pids) {
        m_receivers[pid].push_back(&service);
    }
}

void RecentPackets::push(const uint8_t* packet, Clock::Instant arrival) {
    const auto receivers = m_receivers.find(pidOf(packet));
    if (receivers == m_receivers.end()) {
        return;
    }
    for (Service* service : receivers->second) {
        const bool isStart =
            receivers->first == service->videoPid && isRandomAccessPoint(packet, service->videoType);
        if (isStart) {
            drop(*service);
        }
        if (isStart || !service->chunks.empty()) {
            append(*service, packet, arrival);
        }
    }
    while (m_size > m_maxSize) {
        dropOldest();
    }
}

void RecentPackets::append(Service& service, const uint8_t* packet, Clock::Instant arrival) {
    if (service.chunks.empty() || service.chunks.back().arrival != arrival) {
        service.chunks.push_back({arrival, {}});
    }
    Bytes& packets = service.chunks.back().packets;
    packets.insert(packets.end(), packet, packet + kPacketSize);
    service.size += kPacketSize;
    m_size += kPacketSize;
}

void RecentPackets::drop(Service& service) {
    m_size -= service.size;
    service.size = 0;
    service.chunks.clear();
}

// Without its beginning the rest of a service could not be decoded.
void RecentPackets::dropOldest() {
    Service* oldest = nullptr;
    for (auto& [id, service] : m_services) {
        if (!service.chunks.empty() &&
            (!oldest || service.chunks.front().arrival < oldest->chunks.front().arrival)) {
            oldest = &service;
        }
    }
    if (oldest) {
        drop(*oldest);
    }
}

void RecentPackets::clearPackets() {
    for (auto& [id, service] : m_services) {
        drop(service);
    }
}

void RecentPackets::clear() {
    m_services.clear();
    m_receivers.clear();
    m_size = 0;
}

const std::deque<RecentPackets::Chunk>& RecentPackets::packetsOf(uint16_t serviceId) const {
    static const auto& none = *new std::deque<Chunk>;
    const auto service = m_services.find(serviceId);
    return service == m_services.end() ? none : service->second.chunks;
}

} // namespace desktop
