// Packing of tables.
#include "desktop/platform/TsTables.h"

#include <algorithm>
#include <array>

namespace desktop {

namespace {

constexpr uint8_t utf8Mark = 0x15;
constexpr size_t longestDescriptor = 255;

std::array<uint32_t, 256> makeCrcTable() {
    std::array<uint32_t, 256> table{};
    for (uint32_t index = 0; index < table.size(); ++index) {
        uint32_t sum = index << 24;
        for (int bit = 0; bit < 8; ++bit) {
            sum = (sum & 0x80000000U) != 0 ? sum << 1 ^ 0x04C11DB7U : sum << 1;
        }
        table[index] = sum;
    }
    return table;
}

void put8(Bytes& bytes, unsigned int value) {
    bytes.push_back(static_cast<uint8_t>(value));
}

void put16(Bytes& bytes, unsigned int value) {
    put8(bytes, value >> 8);
    put8(bytes, value);
}

void put32(Bytes& bytes, uint32_t value) {
    put16(bytes, value >> 16);
    put16(bytes, value);
}

void putBytes(Bytes& bytes, const Bytes& more) {
    bytes.insert(bytes.end(), more.begin(), more.end());
}

// A length of 12 bits below four set bits, then the bytes themselves.
void putLoop(Bytes& bytes, const Bytes& loop) {
    put16(bytes, 0xF000 | static_cast<unsigned int>(loop.size()));
    putBytes(bytes, loop);
}

// At most `most` bytes, cut between characters.
std::string cut(const std::string& text, size_t most) {
    if (text.size() <= most) {
        return text;
    }
    while (most > 0 && (static_cast<uint8_t>(text[most]) & 0xC0) == 0x80) {
        --most;
    }
    return text.substr(0, most);
}

// A text with its length before it, marked as UTF-8.
void putText(Bytes& bytes, const std::string& text, size_t most) {
    const std::string fitting = cut(text, most - 1);
    put8(bytes, static_cast<unsigned int>(fitting.empty() ? 0 : fitting.size() + 1));
    if (!fitting.empty()) {
        put8(bytes, utf8Mark);
        bytes.insert(bytes.end(), fitting.begin(), fitting.end());
    }
}

void putCode(Bytes& bytes, const std::string& code) {
    for (size_t index = 0; index < 3; ++index) {
        put8(bytes, index < code.size() ? static_cast<uint8_t>(code[index]) : ' ');
    }
}

Bytes descriptor(uint8_t tag, const Bytes& body) {
    Bytes bytes;
    put8(bytes, tag);
    put8(bytes, static_cast<unsigned int>(std::min(body.size(), longestDescriptor)));
    bytes.insert(bytes.end(), body.begin(), body.begin() + static_cast<std::ptrdiff_t>(bytes.back()));
    return bytes;
}

unsigned int bcd(unsigned int value) {
    return value / 10 % 10 << 4 | value % 10;
}

void putDuration(Bytes& bytes, uint32_t seconds) {
    put8(bytes, bcd(seconds / 3600));
    put8(bytes, bcd(seconds / 60 % 60));
    put8(bytes, bcd(seconds % 60));
}

void putTime(Bytes& bytes, int64_t seconds) {
    constexpr int64_t dayOf1970 = 40587; // in days of the modified Julian date
    put16(bytes, static_cast<unsigned int>(seconds / 86400 + dayOf1970));
    putDuration(bytes, static_cast<uint32_t>(seconds % 86400));
}

// A section of the long form around `body`, with length and sum.
Bytes section(uint8_t table, uint16_t extension, uint8_t version, uint8_t number, uint8_t last,
              bool isPrivate, const Bytes& body) {
    Bytes bytes;
    put8(bytes, table);
    put16(bytes, (isPrivate ? 0xF000U : 0xB000U) | static_cast<unsigned int>(body.size() + 9));
    put16(bytes, extension);
    put8(bytes, 0xC1U | (version & 0x1FU) << 1);
    put8(bytes, number);
    put8(bytes, last);
    putBytes(bytes, body);
    put32(bytes, crc32(bytes.data(), bytes.size()));
    return bytes;
}

} // namespace

uint32_t crc32(const uint8_t* bytes, size_t length) {
    static const std::array<uint32_t, 256> table = makeCrcTable();
    uint32_t sum = 0xFFFFFFFFU;
    for (size_t index = 0; index < length; ++index) {
        sum = sum << 8 ^ table[(sum >> 24 ^ bytes[index]) & 0xFF];
    }
    return sum;
}

Bytes pack(const Pat& pat) {
    Bytes body;
    for (const auto& [service, pid] : pat.programmes) {
        put16(body, service);
        put16(body, 0xE000U | pid);
    }
    return section(0x00, pat.transportStreamId, pat.version, 0, 0, false, body);
}

Bytes pack(const Pmt& pmt) {
    Bytes body;
    put16(body, 0xE000U | pmt.pcrPid);
    putLoop(body, pmt.descriptors);
    for (const ElementaryStream& stream : pmt.streams) {
        put8(body, stream.type);
        put16(body, 0xE000U | stream.pid);
        putLoop(body, stream.descriptors);
    }
    return section(0x02, pmt.serviceId, pmt.version, 0, 0, false, body);
}

Bytes pack(const Nit& nit) {
    Bytes name;
    name.insert(name.end(), nit.name.begin(), nit.name.end());
    Bytes stream;
    put16(stream, nit.transportStreamId);
    put16(stream, nit.originalNetworkId);
    putLoop(stream, nit.deliveryDescriptor);
    Bytes body;
    putLoop(body, descriptor(0x40, name));
    putLoop(body, stream);
    return section(0x40, nit.networkId, 0, 0, 0, true, body);
}

Bytes pack(const Sdt& sdt) {
    Bytes body;
    put16(body, sdt.originalNetworkId);
    put8(body, 0xFF);
    for (const SdtService& service : sdt.services) {
        Bytes words;
        put8(words, service.type);
        putText(words, service.provider, 100);
        putText(words, service.name, 100);
        put16(body, service.serviceId);
        put8(body, 0xFD); // has present and following programmes
        Bytes loop = descriptor(0x48, words);
        put16(body, 0x8000U | static_cast<unsigned int>(loop.size())); // running, free of charge
        putBytes(body, loop);
    }
    return section(0x42, sdt.transportStreamId, sdt.version, 0, 0, true, body);
}

Bytes pack(const Eit& eit) {
    Bytes body;
    put16(body, eit.transportStreamId);
    put16(body, eit.originalNetworkId);
    put8(body, 1);    // last section of the segment
    put8(body, 0x4E); // last table
    for (const EitEvent& event : eit.events) {
        Bytes words;
        putCode(words, event.language);
        putText(words, event.name, 100);
        putText(words, event.text, 150);
        Bytes loop = descriptor(0x4D, words);
        if (!event.ratings.empty()) {
            Bytes ratings;
            for (const EitRating& rating : event.ratings) {
                putCode(ratings, rating.country);
                put8(ratings, rating.value);
            }
            putBytes(loop, descriptor(0x55, ratings));
        }
        put16(body, event.id);
        putTime(body, event.start);
        putDuration(body, event.duration);
        const unsigned int running = eit.number == 0 ? 4 : 1;
        put16(body, running << 13 | static_cast<unsigned int>(loop.size()));
        putBytes(body, loop);
    }
    return section(0x4E, eit.serviceId, eit.version, eit.number, 1, true, body);
}

Bytes pack(const StreamEvent& event) {
    Bytes words;
    put16(words, event.id);
    put32(words, 0xFFFFFFFE); // no time: now
    put32(words, 0);
    words.insert(words.end(), event.data.begin(), event.data.end());
    return section(0x3D, event.id & 0x3FFF, event.version, 0, 0, false, descriptor(0x1A, words));
}

Bytes packTime(int64_t seconds) {
    Bytes bytes{0x70, 0x70, 0x05};
    putTime(bytes, seconds);
    return bytes;
}

Bytes describeLanguage(const std::string& language, uint8_t audioType) {
    Bytes words;
    putCode(words, language);
    put8(words, audioType);
    return descriptor(0x0A, words);
}

Bytes describeSubtitles(const std::string& language, uint8_t subtitleType) {
    Bytes words;
    putCode(words, language);
    put8(words, subtitleType);
    put16(words, 1); // composition page
    put16(words, 1); // ancillary page
    return descriptor(0x59, words);
}

Bytes describeComponentTag(uint8_t tag) {
    return descriptor(0x52, {tag});
}

Bytes packetsOf(const Bytes& section, uint16_t pid, uint8_t& continuity) {
    Bytes packets;
    size_t sent = 0;
    do {
        const bool begins = sent == 0;
        const size_t end = packets.size() + packetSize;
        put8(packets, packetStart);
        put16(packets, (begins ? 0x4000U : 0U) | pid);
        put8(packets, 0x10U | (continuity & 0x0FU));
        continuity = static_cast<uint8_t>((continuity + 1) & 0x0F);
        if (begins) {
            put8(packets, 0); // the section begins at once
        }
        const size_t amount = std::min(end - packets.size(), section.size() - sent);
        packets.insert(packets.end(), section.begin() + static_cast<std::ptrdiff_t>(sent),
                       section.begin() + static_cast<std::ptrdiff_t>(sent + amount));
        sent += amount;
        packets.resize(end, 0xFF);
    } while (sent < section.size());
    return packets;
}

} // namespace desktop
