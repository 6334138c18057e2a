// Packing of tables.
#include "desktop/platform/TsTables.h"

#include <algorithm>
#include <array>

#include "desktop/platform/Utf8.h"

namespace desktop {

namespace {

// Our own limits, in bytes: a descriptor with all its strings must fit into its length.
constexpr size_t kMaxNameSize = 100;
constexpr size_t kMaxTextSize = 150;

constexpr unsigned int kSubtitlePage = 1; // composition and ancillary page of all subtitles

std::array<uint32_t, 256> makeCrcTable() {
    std::array<uint32_t, 256> table{};
    for (uint32_t index = 0; index < table.size(); ++index) {
        uint32_t sum = index << 24;
        for (int bit = 0; bit < 8; ++bit) {
            sum = (sum & 0x80000000U) != 0 ? sum << 1 ^ kCrcPolynomial : sum << 1;
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

// A loop with its length before it.
void putLoop(Bytes& bytes, const Bytes& loop) {
    put16(bytes, kReservedBeforeLength | static_cast<unsigned int>(loop.size()));
    putBytes(bytes, loop);
}

// A string with its length before it, marked as UTF-8.
void putString(Bytes& bytes, const std::string& string, size_t maxSize) {
    const std::string fitting = truncateUtf8(string, maxSize - 1);
    put8(bytes, static_cast<unsigned int>(fitting.empty() ? 0 : fitting.size() + 1));
    if (!fitting.empty()) {
        put8(bytes, kCharacterTableUtf8);
        bytes.insert(bytes.end(), fitting.begin(), fitting.end());
    }
}

// Raw bytes with their length before them, as in the descriptors of an AIT.
void putRaw(Bytes& bytes, const std::string& string) {
    const size_t length = std::min(string.size(), kMaxDescriptorBodySize);
    put8(bytes, static_cast<unsigned int>(length));
    bytes.insert(bytes.end(), string.begin(), string.begin() + static_cast<std::ptrdiff_t>(length));
}

void putCode(Bytes& bytes, const std::string& code) {
    for (size_t index = 0; index < kCodeSize; ++index) {
        put8(bytes, index < code.size() ? static_cast<uint8_t>(code[index]) : ' ');
    }
}

Bytes descriptor(uint8_t tag, const Bytes& body) {
    Bytes bytes;
    put8(bytes, tag);
    put8(bytes, static_cast<unsigned int>(std::min(body.size(), kMaxDescriptorBodySize)));
    bytes.insert(bytes.end(), body.begin(), body.begin() + static_cast<std::ptrdiff_t>(bytes.back()));
    return bytes;
}

unsigned int toBcd(unsigned int value) {
    return value / 10 % 10 << 4 | value % 10;
}

void putDuration(Bytes& bytes, uint32_t seconds) {
    put8(bytes, toBcd(seconds / 3600));
    put8(bytes, toBcd(seconds / 60 % 60));
    put8(bytes, toBcd(seconds % 60));
}

void putTime(Bytes& bytes, int64_t seconds) {
    constexpr int64_t kSecondsPerDay = 86400;
    put16(bytes, static_cast<unsigned int>(seconds / kSecondsPerDay + kModifiedJulianDateOf1970));
    putDuration(bytes, static_cast<uint32_t>(seconds % kSecondsPerDay));
}

// What stands in the header of a section of the long form.
struct SectionHeader {
    uint8_t tableId;
    uint16_t tableIdExtension;
    uint8_t version;
    uint8_t number = 0;
    uint8_t lastNumber = 0;
};

// Whose table it is, which shows in a bit of the header.
enum class Family { Mpeg, Dvb };

// A section of the long form around `body`, with length and CRC.
Bytes packSection(const SectionHeader& header, Family family, const Bytes& body) {
    const size_t length = kLongSectionHeaderSize - kSectionHeaderSize + body.size() + kCrcSize;
    Bytes bytes;
    put8(bytes, header.tableId);
    put16(bytes,
          (family == Family::Dvb ? kDvbSectionFlags : kMpegSectionFlags) | static_cast<unsigned int>(length));
    put16(bytes, header.tableIdExtension);
    put8(bytes, kReservedBeforeVersion | kCurrentNextIndicator | (header.version % kVersionCount) << 1U);
    put8(bytes, header.number);
    put8(bytes, header.lastNumber);
    putBytes(bytes, body);
    put32(bytes, crc32(bytes.data(), bytes.size()));
    return bytes;
}

Bytes eventDescriptors(const EitEvent& event) {
    Bytes shortEvent;
    putCode(shortEvent, event.language);
    putString(shortEvent, event.name, kMaxNameSize);
    putString(shortEvent, event.text, kMaxTextSize);
    Bytes descriptors = descriptor(kTagShortEvent, shortEvent);
    if (!event.ratings.empty()) {
        Bytes ratings;
        for (const EitRating& rating : event.ratings) {
            putCode(ratings, rating.country);
            put8(ratings, rating.value);
        }
        putBytes(descriptors, descriptor(kTagParentalRating, ratings));
    }
    return descriptors;
}

} // namespace

uint32_t crc32(const uint8_t* bytes, size_t length) {
    static const std::array<uint32_t, 256> kTable = makeCrcTable();
    uint32_t sum = kCrcStart;
    for (size_t index = 0; index < length; ++index) {
        sum = sum << 8 ^ kTable[(sum >> 24 ^ bytes[index]) & 0xFF];
    }
    return sum;
}

Bytes pack(const Pat& pat) {
    Bytes body;
    for (const auto& [program, pid] : pat.programs) {
        put16(body, program);
        put16(body, kReservedBeforePid | pid);
    }
    return packSection({kTableIdPat, pat.transportStreamId, pat.version}, Family::Mpeg, body);
}

Bytes pack(const Pmt& pmt) {
    Bytes body;
    put16(body, kReservedBeforePid | pmt.pcrPid);
    putLoop(body, pmt.descriptors);
    for (const ElementaryStream& stream : pmt.streams) {
        put8(body, stream.type);
        put16(body, kReservedBeforePid | stream.pid);
        putLoop(body, stream.descriptors);
    }
    return packSection({kTableIdPmt, pmt.serviceId, pmt.version}, Family::Mpeg, body);
}

Bytes pack(const Nit& nit) {
    const Bytes name(nit.name.begin(), nit.name.end());
    Bytes transportStream;
    put16(transportStream, nit.transportStreamId);
    put16(transportStream, nit.originalNetworkId);
    putLoop(transportStream, nit.deliveryDescriptor);
    Bytes body;
    putLoop(body, descriptor(kTagNetworkName, name));
    putLoop(body, transportStream);
    return packSection({kTableIdNitActual, nit.networkId, 0}, Family::Dvb, body);
}

Bytes pack(const Sdt& sdt) {
    constexpr unsigned int kRunningAndFreeOfCharge = kRunningStatusRunning << 13U;
    Bytes body;
    put16(body, sdt.originalNetworkId);
    put8(body, kReservedByte);
    for (const SdtService& service : sdt.services) {
        Bytes words;
        put8(words, service.type);
        putString(words, service.provider, kMaxNameSize);
        putString(words, service.name, kMaxNameSize);
        const Bytes descriptors = descriptor(kTagService, words);
        put16(body, service.serviceId);
        put8(body, kReservedBeforeEitFlags | kSdtEitPresentFollowingFlag);
        put16(body, kRunningAndFreeOfCharge | static_cast<unsigned int>(descriptors.size()));
        putBytes(body, descriptors);
    }
    return packSection({kTableIdSdtActual, sdt.transportStreamId, sdt.version}, Family::Dvb, body);
}

Bytes pack(const Eit& eit) {
    Bytes body;
    put16(body, eit.transportStreamId);
    put16(body, eit.originalNetworkId);
    put8(body, kEitSectionFollowing); // segment_last_section_number
    put8(body, kTableIdEitActualPresentFollowing);
    const unsigned int status =
        eit.sectionNumber == kEitSectionPresent ? kRunningStatusRunning : kRunningStatusNotRunning;
    for (const EitEvent& event : eit.events) {
        const Bytes descriptors = eventDescriptors(event);
        put16(body, event.id);
        putTime(body, event.start);
        putDuration(body, event.duration);
        put16(body, status << 13U | static_cast<unsigned int>(descriptors.size()));
        putBytes(body, descriptors);
    }
    return packSection({kTableIdEitActualPresentFollowing, eit.serviceId, eit.version, eit.sectionNumber,
                        kEitSectionFollowing},
                       Family::Dvb, body);
}

Bytes pack(const StreamEvent& event) {
    Bytes body;
    put16(body, event.id);
    put32(body, kEventNptHighWithReservedBits);
    put32(body, 0);
    putBytes(body, event.data);
    return packSection(
        {kTableIdDsmccStreamDescriptors, static_cast<uint16_t>(event.id & kStreamEventIdMask), event.version},
        Family::Mpeg, descriptor(kTagStreamEvent, body));
}

Bytes pack(const Ait& ait) {
    Bytes applications;
    for (const AitApplication& application : ait.applications) {
        put32(applications, application.organisationId);
        put16(applications, application.applicationId);
        put8(applications, application.controlCode);
        putLoop(applications, application.descriptors);
    }
    Bytes body;
    putLoop(body, ait.commonDescriptors);
    putLoop(body, applications);
    const uint16_t extension =
        static_cast<uint16_t>(ait.applicationType | (ait.isTest ? kTestApplicationFlag : 0));
    return packSection({kTableIdAit, extension, ait.version, ait.sectionNumber, ait.lastSectionNumber},
                       Family::Dvb, body);
}

Bytes packTdt(int64_t utcSeconds) {
    constexpr unsigned int kTimeSize = 5;
    Bytes bytes;
    put8(bytes, kTableIdTdt);
    put16(bytes, kDvbShortSectionFlags | kTimeSize);
    putTime(bytes, utcSeconds);
    return bytes;
}

Bytes iso639LanguageDescriptor(const std::string& language, uint8_t audioType) {
    Bytes body;
    putCode(body, language);
    put8(body, audioType);
    return descriptor(kTagIso639Language, body);
}

Bytes subtitlingDescriptor(const std::string& language, uint8_t subtitlingType) {
    Bytes body;
    putCode(body, language);
    put8(body, subtitlingType);
    put16(body, kSubtitlePage);
    put16(body, kSubtitlePage);
    return descriptor(kTagSubtitling, body);
}

Bytes streamIdentifierDescriptor(uint8_t componentTag) {
    return descriptor(kTagStreamIdentifier, {componentTag});
}

Bytes applicationSignallingDescriptor(uint16_t applicationType, uint8_t version) {
    Bytes body;
    put16(body,
          static_cast<unsigned int>(kTestApplicationFlag | applicationType)); // the first bit is reserved
    put8(body, kReservedBeforeAitVersion | version % kVersionCount);
    return descriptor(kTagApplicationSignalling, body);
}

Bytes applicationDescriptor(const ApplicationProfile& profile, bool isServiceBound, uint8_t priority,
                            uint8_t label) {
    Bytes profiles;
    put16(profiles, profile.profile);
    put8(profiles, profile.versionMajor);
    put8(profiles, profile.versionMinor);
    put8(profiles, profile.versionMicro);
    Bytes body;
    put8(body, static_cast<unsigned int>(profiles.size()));
    putBytes(body, profiles);
    put8(body, (isServiceBound ? kServiceBoundFlag : 0U) | kVisibilityAll << kVisibilityShift |
                   kReservedAfterVisibility);
    put8(body, priority);
    put8(body, label);
    return descriptor(kTagApplication, body);
}

Bytes applicationNameDescriptor(const std::string& language, const std::string& name) {
    Bytes body;
    putCode(body, language);
    putString(body, name, kMaxNameSize);
    return descriptor(kTagApplicationName, body);
}

Bytes httpTransportDescriptor(uint8_t label, const std::string& baseUrl,
                              const std::vector<std::string>& extensions) {
    Bytes body;
    put16(body, kTransportProtocolHttp);
    put8(body, label);
    putRaw(body, baseUrl);
    put8(body, static_cast<unsigned int>(extensions.size()));
    for (const std::string& extension : extensions) {
        putRaw(body, extension);
    }
    return descriptor(kTagTransportProtocol, body);
}

Bytes simpleApplicationLocationDescriptor(const std::string& initialPath) {
    return descriptor(kTagSimpleApplicationLocation, Bytes(initialPath.begin(), initialPath.end()));
}

Bytes applicationUsageDescriptor(uint8_t usage) {
    return descriptor(kTagApplicationUsage, {usage});
}

Bytes simpleApplicationBoundaryDescriptor(const std::vector<std::string>& urls) {
    Bytes body;
    put8(body, static_cast<unsigned int>(urls.size()));
    for (const std::string& url : urls) {
        putRaw(body, url);
    }
    return descriptor(kTagSimpleApplicationBoundary, body);
}

Bytes packetsOf(const Bytes& section, uint16_t pid, uint8_t& continuity) {
    Bytes packets;
    size_t sent = 0;
    do {
        const bool isFirst = sent == 0;
        const size_t end = packets.size() + kPacketSize;
        put8(packets, kSyncByte);
        put16(packets, (isFirst ? kPayloadUnitStartIndicator << 8U : 0U) | pid);
        put8(packets, kPayloadFlag | (continuity & kContinuityCounterMask));
        continuity = static_cast<uint8_t>((continuity + 1) & kContinuityCounterMask);
        if (isFirst) {
            put8(packets, 0); // pointer_field: the section begins at once
        }
        const size_t amount = std::min(end - packets.size(), section.size() - sent);
        packets.insert(packets.end(), section.begin() + static_cast<std::ptrdiff_t>(sent),
                       section.begin() + static_cast<std::ptrdiff_t>(sent + amount));
        sent += amount;
        packets.resize(end, kStuffingByte);
    } while (sent < section.size());
    return packets;
}

} // namespace desktop
