// Clock references, time stamps and continuity counters of packets.
#include "desktop/platform/Restamper.h"

#include "desktop/platform/TsTables.h"

namespace desktop {

namespace {

constexpr int64_t stampPeriod = int64_t{1} << 33;
constexpr int64_t ticksPerStamp = 300;

bool hasPayload(const uint8_t* packet) {
    return (packet[3] & 0x10) != 0;
}
bool hasClockReference(const uint8_t* packet) {
    return (packet[3] & 0x20) != 0 && packet[4] >= 7 && (packet[5] & 0x10) != 0;
}

// The header of an elementary stream's packet that begins in this one with room for both time stamps; or
// null.
uint8_t* elementaryHeader(uint8_t* packet) {
    const bool isScrambled = (packet[3] & 0xC0) != 0;
    const bool begins = (packet[1] & 0x40) != 0;
    if (isScrambled || !begins || !hasPayload(packet)) {
        return nullptr;
    }
    size_t at = 4;
    if ((packet[3] & 0x20) != 0) {
        at += 1 + static_cast<size_t>(packet[4]);
    }
    constexpr size_t fixedPart = 9;
    if (at + fixedPart > packetSize || packet[at] != 0 || packet[at + 1] != 0 || packet[at + 2] != 1) {
        return nullptr;
    }
    const uint8_t stream = packet[at + 3];
    // Audio, video and private streams have time stamps, others another header.
    const bool isTimed = stream == 0xBD || (stream >= 0xC0 && stream <= 0xEF) || stream == 0xFD;
    const size_t needed = (packet[at + 7] >> 6) * size_t{5};
    const bool isWhole = at + fixedPart + (needed == 15 ? 10 : 5) <= packetSize;
    return isTimed && isWhole && (packet[at + 7] & 0x80) != 0 ? packet + at : nullptr;
}

int64_t readStamp(const uint8_t* bytes) {
    return static_cast<int64_t>(bytes[0] >> 1 & 0x07) << 30 | static_cast<int64_t>(bytes[1]) << 22 |
           static_cast<int64_t>(bytes[2] >> 1) << 15 | static_cast<int64_t>(bytes[3]) << 7 | bytes[4] >> 1;
}

void writeStamp(uint8_t* bytes, int64_t stamp) {
    bytes[0] = static_cast<uint8_t>((bytes[0] & 0xF1) | (stamp >> 30 & 0x07) << 1);
    bytes[1] = static_cast<uint8_t>(stamp >> 22);
    bytes[2] = static_cast<uint8_t>((bytes[2] & 0x01) | (stamp >> 15 & 0x7F) << 1);
    bytes[3] = static_cast<uint8_t>(stamp >> 7);
    bytes[4] = static_cast<uint8_t>((bytes[4] & 0x01) | (stamp & 0x7F) << 1);
}

void moveStamp(uint8_t* bytes, int64_t ticks) {
    writeStamp(bytes, (readStamp(bytes) + ticks / ticksPerStamp) % stampPeriod);
}

} // namespace

std::optional<int64_t> clockReferenceOf(const uint8_t* packet) {
    if (!hasClockReference(packet)) {
        return std::nullopt;
    }
    const uint8_t* bytes = packet + 6;
    const int64_t base = static_cast<int64_t>(bytes[0]) << 25 | static_cast<int64_t>(bytes[1]) << 17 |
                         static_cast<int64_t>(bytes[2]) << 9 | static_cast<int64_t>(bytes[3]) << 1 |
                         bytes[4] >> 7;
    return base * ticksPerStamp + ((bytes[4] & 0x01) << 8 | bytes[5]);
}

std::optional<int64_t> presentationTimeOf(const uint8_t* packet) {
    const uint8_t* header = elementaryHeader(const_cast<uint8_t*>(packet)); // read only
    return header ? std::optional(readStamp(header + 9)) : std::nullopt;
}

void Restamper::repeat(int64_t ticks) {
    m_shift = (m_shift + ticks / ticksPerStamp * ticksPerStamp) % clockPeriod;
    for (auto& [pid, counter] : m_counters) {
        counter.isFresh = true;
    }
}

void Restamper::restamp(uint8_t* packet) {
    Counter& counter = m_counters[pidOf(packet)];
    if (counter.isFresh) {
        counter.isFresh = false;
        const int next = counter.last + (hasPayload(packet) ? 1 : 0);
        counter.offset = static_cast<uint8_t>((next - (packet[3] & 0x0F)) & 0x0F);
    }
    counter.last = static_cast<uint8_t>((packet[3] + counter.offset) & 0x0F);
    packet[3] = static_cast<uint8_t>((packet[3] & 0xF0) | counter.last);

    if (const auto reference = clockReferenceOf(packet)) {
        const int64_t moved = (*reference + m_shift) % clockPeriod;
        const int64_t base = moved / ticksPerStamp;
        const int64_t extension = moved % ticksPerStamp;
        uint8_t* bytes = packet + 6;
        bytes[0] = static_cast<uint8_t>(base >> 25);
        bytes[1] = static_cast<uint8_t>(base >> 17);
        bytes[2] = static_cast<uint8_t>(base >> 9);
        bytes[3] = static_cast<uint8_t>(base >> 1);
        bytes[4] = static_cast<uint8_t>((base & 1) << 7 | 0x7E | (extension >> 8 & 1));
        bytes[5] = static_cast<uint8_t>(extension);
    }
    if (uint8_t* header = elementaryHeader(packet)) {
        moveStamp(header + 9, m_shift);
        if ((header[7] & 0x40) != 0) {
            moveStamp(header + 14, m_shift);
        }
    }
}

} // namespace desktop
