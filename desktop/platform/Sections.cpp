// Reassembly and parsing of sections.
#include "desktop/platform/Sections.h"

#include <glib.h>

#include <algorithm>
#include <memory>

#include "desktop/platform/ByteReader.h"

namespace desktop {

namespace {

// Least sizes of what the loops of the tables repeat.
constexpr size_t kPatEntrySize = 4;
constexpr size_t kPmtStreamSize = 5;
constexpr size_t kSdtServiceSize = 5;
constexpr size_t kEitEventSize = 12;
constexpr size_t kRatingSize = 4;
constexpr size_t kTimeSize = 5;
constexpr size_t kAitApplicationSize = 9;

// The header fields and the body of a section of the long form.
struct LongSection {
    uint16_t tableIdExtension;
    uint8_t version;
    uint8_t number;
    uint8_t lastNumber;
    ByteReader body;
};

std::optional<LongSection> openSection(const Bytes& section, uint8_t tableId) {
    if (section.size() < kLongSectionHeaderSize + kCrcSize || section[0] != tableId ||
        (section[5] & kCurrentNextIndicator) == 0) {
        return std::nullopt;
    }
    return LongSection{static_cast<uint16_t>(section[3] << 8 | section[4]),
                       static_cast<uint8_t>(section[5] >> 1 & (kVersionCount - 1)), section[6], section[7],
                       ByteReader(section.data() + kLongSectionHeaderSize,
                                  section.size() - kLongSectionHeaderSize - kCrcSize)};
}

unsigned int fromBcd(unsigned int value) {
    return (value >> 4) * 10 + (value & 0x0F);
}

uint32_t readDuration(ByteReader& reader) {
    const unsigned int hours = fromBcd(reader.read8());
    const unsigned int minutes = fromBcd(reader.read8());
    return hours * 3600 + minutes * 60 + fromBcd(reader.read8());
}

int64_t readTime(ByteReader& reader) {
    constexpr int64_t kSecondsPerDay = 86400;
    const int64_t day = reader.read16();
    return (day - kModifiedJulianDateOf1970) * kSecondsPerDay + readDuration(reader);
}

// Header included.
size_t sizeOf(const Bytes& section) {
    return kSectionHeaderSize + ((static_cast<size_t>(section[1]) << 8 | section[2]) & kLengthMask);
}

// Where the payload of a packet begins; the packet's end if it has none.
size_t payloadOffset(const uint8_t* packet) {
    if ((packet[3] & kPayloadFlag) == 0) {
        return kPacketSize;
    }
    const bool hasAdaptationField = (packet[3] & kAdaptationFieldFlag) != 0;
    return kPacketHeaderSize + (hasAdaptationField ? 1 + size_t{packet[4]} : 0);
}

} // namespace

std::optional<size_t> findPackets(const uint8_t* bytes, size_t length) {
    constexpr size_t kPacketsCompared = 5;
    for (size_t start = 0; start < kPacketSize; ++start) {
        size_t seen = 0;
        while (start + (seen + 1) * kPacketSize <= length && bytes[start + seen * kPacketSize] == kSyncByte) {
            if (++seen == kPacketsCompared) {
                return start;
            }
        }
    }
    return std::nullopt;
}

void SectionFilter::push(const uint8_t* packet) {
    const bool isDamaged = packet[0] != kSyncByte || (packet[1] & kTransportErrorIndicator) != 0 ||
                           (packet[3] & kTransportScramblingControlMask) != 0;
    if (isDamaged) {
        m_isCollecting = false;
        m_continuity = -1;
        return;
    }
    if ((packet[3] & kPayloadFlag) == 0) {
        return;
    }
    const int continuity = packet[3] & kContinuityCounterMask;
    if (continuity == m_continuity) {
        return; // a duplicate packet
    }
    if (m_continuity >= 0 && continuity != ((m_continuity + 1) & kContinuityCounterMask)) {
        m_isCollecting = false;
    }
    m_continuity = continuity;

    const size_t begin = payloadOffset(packet);
    if (begin >= kPacketSize) {
        return;
    }
    if ((packet[1] & kPayloadUnitStartIndicator) != 0) {
        pushStart(packet, begin);
    } else if (m_isCollecting) {
        append(packet + begin, kPacketSize - begin);
    }
}

// A packet in which a section begins: its payload begins with pointer_field.
void SectionFilter::pushStart(const uint8_t* packet, size_t begin) {
    const size_t pointer = packet[begin++];
    const size_t start = begin + pointer;
    if (start > kPacketSize) {
        m_isCollecting = false;
        return;
    }
    if (m_isCollecting) {
        append(packet + begin, pointer); // the end of the preceding section
    }
    m_section.clear();
    m_isCollecting = true;
    append(packet + start, kPacketSize - start);
}

void SectionFilter::append(const uint8_t* bytes, size_t length) {
    m_section.insert(m_section.end(), bytes, bytes + length);
    dispatchWhole();
}

void SectionFilter::dispatchWhole() {
    while (m_isCollecting && !m_section.empty()) {
        if (m_section[0] == kStuffingByte) { // up to the end of the packet
            m_isCollecting = false;
            break;
        }
        if (m_section.size() < kSectionHeaderSize) {
            return;
        }
        const size_t size = sizeOf(m_section);
        if (size > kMaxPrivateSectionSize) {
            m_isCollecting = false;
            break;
        }
        if (m_section.size() < size) {
            return;
        }
        const auto end = m_section.begin() + static_cast<std::ptrdiff_t>(size);
        const Bytes section(m_section.begin(), end);
        m_section.erase(m_section.begin(), end);
        const bool hasCrc = (section[1] & kSectionSyntaxIndicator) != 0;
        const bool isIntact = size >= kLongSectionHeaderSize + kCrcSize && crc32(section.data(), size) == 0;
        if (!hasCrc || isIntact) {
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
    auto open = openSection(section, kTableIdPat);
    if (!open) {
        return std::nullopt;
    }
    Pat pat;
    pat.transportStreamId = open->tableIdExtension;
    pat.version = open->version;
    while (open->body.left() >= kPatEntrySize) {
        const unsigned int program = open->body.read16();
        pat.programs.emplace_back(program, open->body.read16() & kPidMask);
    }
    return pat;
}

std::optional<Pmt> parsePmt(const Bytes& section) {
    auto open = openSection(section, kTableIdPmt);
    if (!open) {
        return std::nullopt;
    }
    Pmt pmt;
    pmt.serviceId = open->tableIdExtension;
    pmt.version = open->version;
    pmt.pcrPid = open->body.read16() & kPidMask;
    pmt.descriptors = open->body.takeLoop().rest();
    while (open->body.left() >= kPmtStreamSize) {
        ElementaryStream stream;
        stream.type = static_cast<uint8_t>(open->body.read8());
        stream.pid = open->body.read16() & kPidMask;
        stream.descriptors = open->body.takeLoop().rest();
        pmt.streams.push_back(stream);
    }
    return open->body.good() ? std::optional(pmt) : std::nullopt;
}

std::optional<Nit> parseNit(const Bytes& section) {
    auto open = openSection(section, kTableIdNitActual);
    if (!open) {
        return std::nullopt;
    }
    Nit nit;
    nit.networkId = open->tableIdExtension;
    forEachDescriptor(open->body.takeLoop().rest(), [&](uint8_t tag, const uint8_t* body, size_t length) {
        if (tag == kTagNetworkName) {
            nit.name = decodeString(body, length);
        }
    });
    ByteReader streams = open->body.takeLoop();
    nit.transportStreamId = static_cast<uint16_t>(streams.read16());
    nit.originalNetworkId = static_cast<uint16_t>(streams.read16());
    forEachDescriptor(streams.takeLoop().rest(), [&](uint8_t tag, const uint8_t* body, size_t length) {
        const bool isDelivery = tag == kTagSatelliteDeliverySystem || tag == kTagCableDeliverySystem ||
                                tag == kTagTerrestrialDeliverySystem;
        if (isDelivery && nit.deliveryDescriptor.empty()) {
            nit.deliveryDescriptor.assign(body - kDescriptorHeaderSize, body + length);
        }
    });
    return open->body.good() && streams.good() ? std::optional(nit) : std::nullopt;
}

std::optional<Sdt> parseSdt(const Bytes& section) {
    auto open = openSection(section, kTableIdSdtActual);
    if (!open) {
        return std::nullopt;
    }
    Sdt sdt;
    sdt.transportStreamId = open->tableIdExtension;
    sdt.version = open->version;
    sdt.originalNetworkId = static_cast<uint16_t>(open->body.read16());
    open->body.read8();
    while (open->body.left() >= kSdtServiceSize) {
        SdtService service;
        service.serviceId = static_cast<uint16_t>(open->body.read16());
        open->body.read8();
        forEachDescriptor(open->body.takeLoop().rest(), [&](uint8_t tag, const uint8_t* body, size_t length) {
            if (tag == kTagService) {
                ByteReader words(body, length);
                service.type = static_cast<uint8_t>(words.read8());
                service.provider = words.takeString();
                service.name = words.takeString();
            }
        });
        sdt.services.push_back(service);
    }
    return open->body.good() ? std::optional(sdt) : std::nullopt;
}

namespace {

// Of several short event descriptors the first one, that of the first language, counts.
void readEventDescriptors(const Bytes& descriptors, EitEvent& event) {
    bool hasShortEvent = false;
    forEachDescriptor(descriptors, [&](uint8_t tag, const uint8_t* body, size_t length) {
        ByteReader words(body, length);
        if (tag == kTagShortEvent && !hasShortEvent) {
            hasShortEvent = true;
            event.language = words.takeCode();
            event.name = words.takeString();
            event.text = words.takeString();
        } else if (tag == kTagParentalRating) {
            while (words.left() >= kRatingSize) {
                const std::string country = words.takeCode();
                event.ratings.push_back({country, static_cast<uint8_t>(words.read8())});
            }
        }
    });
}

} // namespace

std::optional<Eit> parseEit(const Bytes& section) {
    auto open = openSection(section, kTableIdEitActualPresentFollowing);
    if (!open) {
        return std::nullopt;
    }
    Eit eit;
    eit.serviceId = open->tableIdExtension;
    eit.version = open->version;
    eit.sectionNumber = open->number;
    eit.transportStreamId = static_cast<uint16_t>(open->body.read16());
    eit.originalNetworkId = static_cast<uint16_t>(open->body.read16());
    open->body.read16(); // segment_last_section_number, last_table_id
    while (open->body.left() >= kEitEventSize) {
        EitEvent event;
        event.id = static_cast<uint16_t>(open->body.read16());
        event.start = readTime(open->body);
        event.duration = readDuration(open->body);
        readEventDescriptors(open->body.takeLoop().rest(), event);
        eit.events.push_back(event);
    }
    return open->body.good() ? std::optional(eit) : std::nullopt;
}

std::optional<int64_t> parseTime(const Bytes& section) {
    const bool isTime = section.size() >= kSectionHeaderSize + kTimeSize &&
                        (section[0] == kTableIdTdt || section[0] == kTableIdTot);
    if (!isTime) {
        return std::nullopt;
    }
    ByteReader reader(section.data() + kSectionHeaderSize, section.size() - kSectionHeaderSize);
    return readTime(reader);
}

std::vector<StreamEvent> parseStreamEvents(const Bytes& section) {
    std::vector<StreamEvent> events;
    if (const auto open = openSection(section, kTableIdDsmccStreamDescriptors)) {
        forEachDescriptor(open->body.rest(), [&](uint8_t tag, const uint8_t* body, size_t length) {
            if (tag == kTagStreamEvent && length >= kStreamEventFixedBodySize) {
                StreamEvent event;
                event.id = static_cast<uint16_t>(body[0] << 8 | body[1]);
                event.version = open->version;
                event.data.assign(body + kStreamEventFixedBodySize, body + length);
                events.push_back(event);
            }
        });
    }
    return events;
}

std::optional<Ait> parseAit(const Bytes& section) {
    auto open = openSection(section, kTableIdAit);
    if (!open) {
        return std::nullopt;
    }
    Ait ait;
    ait.applicationType = open->tableIdExtension & kApplicationTypeMask;
    ait.isTest = (open->tableIdExtension & kTestApplicationFlag) != 0;
    ait.version = open->version;
    ait.sectionNumber = open->number;
    ait.lastSectionNumber = open->lastNumber;
    ait.commonDescriptors = open->body.takeLoop().rest();
    ByteReader applications = open->body.takeLoop();
    while (applications.left() >= kAitApplicationSize) {
        AitApplication application;
        application.organisationId = applications.read32();
        application.applicationId = static_cast<uint16_t>(applications.read16());
        application.controlCode = static_cast<uint8_t>(applications.read8());
        application.descriptors = applications.takeLoop().rest();
        ait.applications.push_back(application);
    }
    const bool isWhole = open->body.good() && applications.good() && applications.left() == 0 &&
                         ait.sectionNumber <= ait.lastSectionNumber;
    return isWhole ? std::optional(ait) : std::nullopt;
}

namespace {

// The name that iconv knows for the character table of a string, whose selecting bytes are skipped.
std::string takeCharacterTable(const uint8_t*& bytes, size_t& length) {
    std::string charset = "ISO_6937";
    if (length == 0 || bytes[0] >= kFirstCharacterCode) {
        return charset;
    }
    const uint8_t selector = *bytes++;
    --length;
    if (selector == kCharacterTableUtf8) {
        charset = "UTF-8";
    } else if (selector == kCharacterTableUcs2) {
        charset = "UTF-16BE";
    } else if (selector == kCharacterTableIso8859ByNumber && length >= 2) {
        charset = "ISO-8859-" + std::to_string(bytes[1]);
        bytes += 2;
        length -= 2;
    } else if (selector <= kCharacterTableLastIso8859) {
        charset = "ISO-8859-" + std::to_string(selector + kCharacterTableIso8859Offset);
    }
    return charset;
}

// Emphasis and line breaks have control codes of one byte.
void removeControlCodes(std::string& string) {
    const auto isControl = [](char each) {
        const auto code = static_cast<uint8_t>(each);
        return code < kFirstCharacterCode || (code >= kFirstControlCode && code < kControlCodesEnd);
    };
    string.erase(std::remove_if(string.begin(), string.end(), isControl), string.end());
}

struct Free {
    void operator()(char* block) const { g_free(block); }
};

} // namespace

std::string decodeString(const uint8_t* bytes, size_t length) {
    const std::string charset = takeCharacterTable(bytes, length);
    std::string string(reinterpret_cast<const char*>(bytes), length);
    std::unique_ptr<char, Free> converted;
    if (charset == "UTF-8") {
        converted.reset(g_utf8_make_valid(string.data(), static_cast<gssize>(string.size())));
        return converted.get();
    }
    if (charset != "UTF-16BE") {
        removeControlCodes(string);
    }
    // An unknown or wrong character table must not lose the string: ISO/IEC 8859-1 has a character for each
    // byte.
    for (const char* each : {charset.c_str(), "ISO-8859-1"}) {
        converted.reset(g_convert(string.data(), static_cast<gssize>(string.size()), "UTF-8", each, nullptr,
                                  nullptr, nullptr));
        if (converted) {
            return converted.get(); // up to the first zero
        }
    }
    return "";
}

bool forEachDescriptor(const Bytes& descriptors,
                       const std::function<void(uint8_t tag, const uint8_t* body, size_t length)>& visit) {
    size_t at = 0;
    while (at + kDescriptorHeaderSize <= descriptors.size()) {
        const size_t length = descriptors[at + 1];
        if (at + kDescriptorHeaderSize + length > descriptors.size()) {
            return false;
        }
        visit(descriptors[at], descriptors.data() + at + kDescriptorHeaderSize, length);
        at += kDescriptorHeaderSize + length;
    }
    return at == descriptors.size();
}

} // namespace desktop
