// Reassembly and parsing of sections.
#include "desktop/platform/Sections.h"

#include <algorithm>
#include <glib.h>
#include <memory>

namespace desktop {

namespace {

constexpr size_t longestSection = 4096;
constexpr size_t longHeader = 8;
constexpr size_t sumSize = 4;

// Reads numbers one behind the other; past the end everything is 0 and `good` turns false.
class Reader {
public:
    Reader(const uint8_t* bytes, size_t length) : m_at(bytes), m_left(length) {}

    unsigned int read8() {
        if (m_left == 0) {
            m_good = false;
            return 0;
        }
        --m_left;
        return *m_at++;
    }
    unsigned int read16() {
        const unsigned int high = read8();
        return high << 8 | read8();
    }
    uint32_t read32() {
        const uint32_t high = read16();
        return high << 16 | read16();
    }
    // The next `length` bytes as a reader of their own.
    Reader take(size_t length) {
        if (length > m_left) {
            m_good = false;
            length = m_left;
        }
        Reader part(m_at, length);
        m_at += length;
        m_left -= length;
        return part;
    }
    Reader takeLoop() { return take(read16() & 0x0FFF); }
    std::string takeText() {
        const Reader part = take(read8());
        return decodeText(part.m_at, part.m_left);
    }
    std::string takeCode() {
        const Reader part = take(3);
        return {reinterpret_cast<const char*>(part.m_at), part.m_left};
    }
    Bytes rest() const { return {m_at, m_at + m_left}; }
    size_t left() const { return m_left; }
    bool good() const { return m_good; }

private:
    const uint8_t* m_at;
    size_t m_left;
    bool m_good = true;
};

// The body of a section of the long form and what stands before it.
struct Long {
    uint8_t table;
    uint16_t extension;
    uint8_t version;
    uint8_t number;
    Reader body;
};

std::optional<Long> openLong(const Bytes& section, uint8_t table) {
    if (section.size() < longHeader + sumSize || section[0] != table || (section[5] & 0x01) == 0) {
        return std::nullopt;
    }
    return Long{section[0], static_cast<uint16_t>(section[3] << 8 | section[4]),
                static_cast<uint8_t>(section[5] >> 1 & 0x1F), section[6],
                Reader(section.data() + longHeader, section.size() - longHeader - sumSize)};
}

unsigned int fromBcd(unsigned int value) {
    return (value >> 4) * 10 + (value & 0x0F);
}

uint32_t readDuration(Reader& reader) {
    const unsigned int hours = fromBcd(reader.read8());
    const unsigned int minutes = fromBcd(reader.read8());
    return hours * 3600 + minutes * 60 + fromBcd(reader.read8());
}

int64_t readTime(Reader& reader) {
    constexpr int64_t dayOf1970 = 40587;
    const int64_t day = reader.read16();
    return (day - dayOf1970) * 86400 + readDuration(reader);
}

size_t lengthOf(const Bytes& section) {
    return 3 + (static_cast<size_t>(section[1] & 0x0F) << 8 | section[2]);
}

} // namespace

std::optional<size_t> findPackets(const uint8_t* bytes, size_t length) {
    constexpr size_t packetsCompared = 5;
    for (size_t start = 0; start < packetSize; ++start) {
        size_t seen = 0;
        while (start + (seen + 1) * packetSize <= length && bytes[start + seen * packetSize] == packetStart) {
            if (++seen == packetsCompared) {
                return start;
            }
        }
    }
    return std::nullopt;
}

void SectionFilter::push(const uint8_t* packet) {
    const bool damaged = packet[0] != packetStart || (packet[1] & 0x80) != 0 || (packet[3] & 0xC0) != 0;
    if (damaged) {
        m_isCollecting = false;
        m_continuity = -1;
        return;
    }
    if ((packet[3] & 0x10) == 0) {
        return; // no payload
    }
    const int continuity = packet[3] & 0x0F;
    if (continuity == m_continuity) {
        return; // sent twice
    }
    if (m_continuity >= 0 && continuity != ((m_continuity + 1) & 0x0F)) {
        m_isCollecting = false;
    }
    m_continuity = continuity;

    size_t begin = 4;
    if ((packet[3] & 0x20) != 0) {
        begin += 1 + static_cast<size_t>(packet[4]);
    }
    if (begin >= packetSize) {
        return;
    }
    if ((packet[1] & 0x40) == 0) {
        if (m_isCollecting) {
            append(packet + begin, packetSize - begin);
        }
        return;
    }
    const size_t pointer = packet[begin++];
    const size_t start = begin + pointer;
    if (start > packetSize) {
        m_isCollecting = false;
        return;
    }
    if (m_isCollecting) {
        append(packet + begin, pointer); // the end of the one before
    }
    m_section.clear();
    m_isCollecting = true;
    append(packet + start, packetSize - start);
}

void SectionFilter::append(const uint8_t* bytes, size_t length) {
    m_section.insert(m_section.end(), bytes, bytes + length);
    deliverWhole();
}

void SectionFilter::deliverWhole() {
    while (m_isCollecting && !m_section.empty()) {
        if (m_section[0] == 0xFF) { // stuffing up to the end of the packet
            m_isCollecting = false;
            break;
        }
        if (m_section.size() < 3) {
            return;
        }
        const size_t length = lengthOf(m_section);
        if (length > longestSection) {
            m_isCollecting = false;
            break;
        }
        if (m_section.size() < length) {
            return;
        }
        const auto end = m_section.begin() + static_cast<std::ptrdiff_t>(length);
        const Bytes section(m_section.begin(), end);
        m_section.erase(m_section.begin(), end);
        const bool hasSum = (section[1] & 0x80) != 0;
        if (!hasSum || (length >= longHeader + sumSize && crc32(section.data(), length) == 0)) {
            m_handler(section);
        }
    }
    if (!m_isCollecting) {
        m_section.clear();
    }
}

void SectionDemultiplexer::add(uint16_t pid) {
    m_filters.try_emplace(pid, [this, pid](const Bytes& section) { m_handler(pid, section); });
}

void SectionDemultiplexer::push(const uint8_t* packet) {
    const auto filter = m_filters.find(pidOf(packet));
    if (filter != m_filters.end()) {
        filter->second.push(packet);
    }
}

std::optional<Pat> parsePat(const Bytes& section) {
    auto open = openLong(section, 0x00);
    if (!open) {
        return std::nullopt;
    }
    Pat pat;
    pat.transportStreamId = open->extension;
    pat.version = open->version;
    while (open->body.left() >= 4) {
        const unsigned int service = open->body.read16();
        pat.programmes.emplace_back(service, open->body.read16() & 0x1FFF);
    }
    return pat;
}

std::optional<Pmt> parsePmt(const Bytes& section) {
    auto open = openLong(section, 0x02);
    if (!open) {
        return std::nullopt;
    }
    Pmt pmt;
    pmt.serviceId = open->extension;
    pmt.version = open->version;
    pmt.pcrPid = open->body.read16() & 0x1FFF;
    pmt.descriptors = open->body.takeLoop().rest();
    while (open->body.left() >= 5) {
        ElementaryStream stream;
        stream.type = static_cast<uint8_t>(open->body.read8());
        stream.pid = open->body.read16() & 0x1FFF;
        stream.descriptors = open->body.takeLoop().rest();
        pmt.streams.push_back(stream);
    }
    return open->body.good() ? std::optional(pmt) : std::nullopt;
}

std::optional<Nit> parseNit(const Bytes& section) {
    auto open = openLong(section, 0x40);
    if (!open) {
        return std::nullopt;
    }
    Nit nit;
    nit.networkId = open->extension;
    forEachDescriptor(open->body.takeLoop().rest(), [&](uint8_t tag, const uint8_t* body, size_t length) {
        if (tag == 0x40) {
            nit.name = decodeText(body, length);
        }
    });
    Reader streams = open->body.takeLoop();
    nit.transportStreamId = static_cast<uint16_t>(streams.read16());
    nit.originalNetworkId = static_cast<uint16_t>(streams.read16());
    forEachDescriptor(streams.takeLoop().rest(), [&](uint8_t tag, const uint8_t* body, size_t length) {
        const bool isDelivery = tag == 0x43 || tag == 0x44 || tag == 0x5A; // satellite, cable, terrestrial
        if (isDelivery && nit.deliveryDescriptor.empty()) {
            nit.deliveryDescriptor.assign(body - 2, body + length);
        }
    });
    return open->body.good() && streams.good() ? std::optional(nit) : std::nullopt;
}

std::optional<Sdt> parseSdt(const Bytes& section) {
    auto open = openLong(section, 0x42);
    if (!open) {
        return std::nullopt;
    }
    Sdt sdt;
    sdt.transportStreamId = open->extension;
    sdt.version = open->version;
    sdt.originalNetworkId = static_cast<uint16_t>(open->body.read16());
    open->body.read8();
    while (open->body.left() >= 5) {
        SdtService service;
        service.serviceId = static_cast<uint16_t>(open->body.read16());
        open->body.read8();
        forEachDescriptor(open->body.takeLoop().rest(), [&](uint8_t tag, const uint8_t* body, size_t length) {
            if (tag == 0x48) {
                Reader words(body, length);
                service.type = static_cast<uint8_t>(words.read8());
                service.provider = words.takeText();
                service.name = words.takeText();
            }
        });
        sdt.services.push_back(service);
    }
    return open->body.good() ? std::optional(sdt) : std::nullopt;
}

std::optional<Eit> parseEit(const Bytes& section) {
    auto open = openLong(section, 0x4E);
    if (!open) {
        return std::nullopt;
    }
    Eit eit;
    eit.serviceId = open->extension;
    eit.version = open->version;
    eit.number = open->number;
    eit.transportStreamId = static_cast<uint16_t>(open->body.read16());
    eit.originalNetworkId = static_cast<uint16_t>(open->body.read16());
    open->body.read16();
    while (open->body.left() >= 12) {
        EitEvent event;
        event.id = static_cast<uint16_t>(open->body.read16());
        event.start = readTime(open->body);
        event.duration = readDuration(open->body);
        bool hasWords = false;
        forEachDescriptor(open->body.takeLoop().rest(), [&](uint8_t tag, const uint8_t* body, size_t length) {
            Reader words(body, length);
            if (tag == 0x4D && !hasWords) { // the first language
                hasWords = true;
                event.language = words.takeCode();
                event.name = words.takeText();
                event.text = words.takeText();
            } else if (tag == 0x55) {
                while (words.left() >= 4) {
                    const std::string country = words.takeCode();
                    event.ratings.push_back({country, static_cast<uint8_t>(words.read8())});
                }
            }
        });
        eit.events.push_back(event);
    }
    return open->body.good() ? std::optional(eit) : std::nullopt;
}

std::optional<int64_t> parseTime(const Bytes& section) {
    const bool isTime = section.size() >= 8 && (section[0] == 0x70 || section[0] == 0x73);
    if (!isTime) {
        return std::nullopt;
    }
    Reader reader(section.data() + 3, section.size() - 3);
    return readTime(reader);
}

std::vector<StreamEvent> parseStreamEvents(const Bytes& section) {
    std::vector<StreamEvent> events;
    if (const auto open = openLong(section, 0x3D)) {
        forEachDescriptor(open->body.rest(), [&](uint8_t tag, const uint8_t* body, size_t length) {
            if (tag == 0x1A && length >= 10) {
                StreamEvent event;
                event.id = static_cast<uint16_t>(body[0] << 8 | body[1]);
                event.version = open->version;
                event.data.assign(body + 10, body + length);
                events.push_back(event);
            }
        });
    }
    return events;
}

std::string decodeText(const uint8_t* bytes, size_t length) {
    std::string charset = "ISO_6937";
    if (length > 0 && bytes[0] < 0x20) {
        const uint8_t selector = *bytes++;
        --length;
        if (selector == 0x15) {
            charset = "UTF-8";
        } else if (selector == 0x11) {
            charset = "UTF-16BE";
        } else if (selector == 0x10 && length >= 2) {
            charset = "ISO-8859-" + std::to_string(bytes[1]);
            bytes += 2;
            length -= 2;
        } else if (selector <= 0x0B) {
            charset = "ISO-8859-" + std::to_string(selector + 4);
        }
    }
    std::string text(reinterpret_cast<const char*>(bytes), length);
    const bool singleBytes = charset != "UTF-8" && charset != "UTF-16BE";
    if (singleBytes) { // emphasis and line breaks are codes of their own
        text.erase(std::remove_if(text.begin(), text.end(),
                                  [](char each) {
                                      const auto code = static_cast<uint8_t>(each);
                                      return code < 0x20 || (code >= 0x80 && code < 0xA0);
                                  }),
                   text.end());
    }
    struct Free {
        void operator()(char* block) const { g_free(block); }
    };
    using Text = std::unique_ptr<char, Free>;
    Text converted;
    if (charset == "UTF-8") {
        converted.reset(g_utf8_make_valid(text.data(), static_cast<gssize>(text.size())));
        return converted.get();
    }
    for (const char* each : {charset.c_str(), "ISO-8859-1"}) {
        converted.reset(g_convert(text.data(), static_cast<gssize>(text.size()), "UTF-8", each, nullptr,
                                  nullptr, nullptr));
        if (converted) {
            return converted.get(); // up to the first zero
        }
    }
    return "";
}

void forEachDescriptor(const Bytes& descriptors,
                       const std::function<void(uint8_t tag, const uint8_t* body, size_t length)>& visit) {
    size_t at = 0;
    while (at + 2 <= descriptors.size()) {
        const size_t length = descriptors[at + 1];
        if (at + 2 + length > descriptors.size()) {
            return;
        }
        visit(descriptors[at], descriptors.data() + at + 2, length);
        at += 2 + length;
    }
}

} // namespace desktop
