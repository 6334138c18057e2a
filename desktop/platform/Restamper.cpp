// PCR, PTS, DTS and continuity counters in packets: ISO/IEC 13818-1, 2.4.3.
#include "desktop/platform/Restamper.h"

#include "desktop/platform/TsTables.h"

namespace desktop {

namespace {

constexpr size_t kPcrOffset = 6;      // in a packet
constexpr size_t kPesFlagsOffset = 7; // in a PES header
constexpr size_t kPtsOffset = kPesFixedHeaderSize;
constexpr size_t kDtsOffset = kPtsOffset + kPesTimestampSize;

bool hasPayload(const uint8_t* packet) {
    return (packet[3] & kPayloadFlag) != 0;
}

bool hasPcr(const uint8_t* packet) {
    return (packet[3] & kAdaptationFieldFlag) != 0 && packet[4] >= kAdaptationFieldWithPcrLength &&
           (packet[5] & kPcrFlag) != 0;
}

// Other streams, such as padding, have a shorter header without timestamps.
bool hasTimestampHeader(uint8_t streamId) {
    return streamId == kStreamIdPrivateStream1 || streamId == kStreamIdExtended ||
           (streamId >= kStreamIdFirstAudio && streamId <= kStreamIdLastVideo);
}

// The header of a PES packet that begins in this packet and has its timestamps in it; null if there is none.
uint8_t* pesHeader(uint8_t* packet) {
    const bool isScrambled = (packet[3] & kTransportScramblingControlMask) != 0;
    const bool isStart = (packet[1] & kPayloadUnitStartIndicator) != 0;
    if (isScrambled || !isStart || !hasPayload(packet)) {
        return nullptr;
    }
    size_t at = kPacketHeaderSize;
    if ((packet[3] & kAdaptationFieldFlag) != 0) {
        at += 1 + static_cast<size_t>(packet[4]);
    }
    if (at + kPesFixedHeaderSize > kPacketSize || packet[at] != 0 || packet[at + 1] != 0 ||
        packet[at + 2] != 1) { // packet_start_code_prefix
        return nullptr;
    }
    const uint8_t flags = packet[at + kPesFlagsOffset];
    const bool hasBoth = (flags & (kPtsFlag | kDtsFlag)) == (kPtsFlag | kDtsFlag);
    const bool isWhole = at + kPesFixedHeaderSize + (hasBoth ? 2 : 1) * kPesTimestampSize <= kPacketSize;
    return hasTimestampHeader(packet[at + 3]) && isWhole && (flags & kPtsFlag) != 0 ? packet + at : nullptr;
}

// A timestamp has 33 bits in five bytes, with marker bits in between.
int64_t readTimestamp(const uint8_t* bytes) {
    return static_cast<int64_t>(bytes[0] >> 1 & 0x07) << 30 | static_cast<int64_t>(bytes[1]) << 22 |
           static_cast<int64_t>(bytes[2] >> 1) << 15 | static_cast<int64_t>(bytes[3]) << 7 | bytes[4] >> 1;
}

void writeTimestamp(uint8_t* bytes, int64_t timestamp) {
    bytes[0] = static_cast<uint8_t>((bytes[0] & 0xF1) | (timestamp >> 30 & 0x07) << 1);
    bytes[1] = static_cast<uint8_t>(timestamp >> 22);
    bytes[2] = static_cast<uint8_t>((bytes[2] & 0x01) | (timestamp >> 15 & 0x7F) << 1);
    bytes[3] = static_cast<uint8_t>(timestamp >> 7);
    bytes[4] = static_cast<uint8_t>((bytes[4] & 0x01) | (timestamp & 0x7F) << 1);
}

void shiftTimestamp(uint8_t* bytes, int64_t ticks) {
    writeTimestamp(bytes, (readTimestamp(bytes) + ticks / kSystemClockTicksPerBaseTick) % kTimestampPeriod);
}

} // namespace

std::optional<int64_t> pcrOf(const uint8_t* packet) {
    if (!hasPcr(packet)) {
        return std::nullopt;
    }
    const uint8_t* bytes = packet + kPcrOffset;
    const int64_t base = static_cast<int64_t>(bytes[0]) << 25 | static_cast<int64_t>(bytes[1]) << 17 |
                         static_cast<int64_t>(bytes[2]) << 9 | static_cast<int64_t>(bytes[3]) << 1 |
                         bytes[4] >> 7;
    const int64_t extension = (bytes[4] & 0x01) << 8 | bytes[5];
    return base * kSystemClockTicksPerBaseTick + extension;
}

std::optional<int64_t> ptsOf(const uint8_t* packet) {
    const uint8_t* header = pesHeader(const_cast<uint8_t*>(packet)); // read only
    return header ? std::optional(readTimestamp(header + kPtsOffset)) : std::nullopt;
}

void Restamper::repeat(int64_t ticks) {
    m_shift = (m_shift + ticks / kSystemClockTicksPerBaseTick * kSystemClockTicksPerBaseTick) % kPcrPeriod;
    for (auto& [pid, counter] : m_counters) {
        counter.isRestarted = true;
    }
}

void Restamper::restamp(uint8_t* packet) {
    restampContinuity(packet);
    restampPcr(packet);
    restampPes(packet);
}

// A packet without payload repeats the counter of the packet before.
void Restamper::restampContinuity(uint8_t* packet) {
    Counter& counter = m_counters[pidOf(packet)];
    if (counter.isRestarted) {
        counter.isRestarted = false;
        const int next = counter.last + (hasPayload(packet) ? 1 : 0);
        counter.offset =
            static_cast<uint8_t>((next - (packet[3] & kContinuityCounterMask)) & kContinuityCounterMask);
    }
    counter.last = static_cast<uint8_t>((packet[3] + counter.offset) & kContinuityCounterMask);
    packet[3] = static_cast<uint8_t>((packet[3] & ~kContinuityCounterMask) | counter.last);
}

void Restamper::restampPcr(uint8_t* packet) const {
    const auto pcr = pcrOf(packet);
    if (!pcr) {
        return;
    }
    const int64_t shifted = (*pcr + m_shift) % kPcrPeriod;
    const int64_t base = shifted / kSystemClockTicksPerBaseTick;
    const int64_t extension = shifted % kSystemClockTicksPerBaseTick;
    uint8_t* bytes = packet + kPcrOffset;
    bytes[0] = static_cast<uint8_t>(base >> 25);
    bytes[1] = static_cast<uint8_t>(base >> 17);
    bytes[2] = static_cast<uint8_t>(base >> 9);
    bytes[3] = static_cast<uint8_t>(base >> 1);
    bytes[4] = static_cast<uint8_t>((base & 1) << 7 | kPcrReservedBits | (extension >> 8 & 1));
    bytes[5] = static_cast<uint8_t>(extension);
}

void Restamper::restampPes(uint8_t* packet) const {
    uint8_t* header = pesHeader(packet);
    if (!header) {
        return;
    }
    shiftTimestamp(header + kPtsOffset, m_shift);
    if ((header[kPesFlagsOffset] & kDtsFlag) != 0) {
        shiftTimestamp(header + kDtsOffset, m_shift);
    }
}

} // namespace desktop
