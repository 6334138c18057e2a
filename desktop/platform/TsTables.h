// The tables of a transport stream as plain records, and packing them into sections and packets. Tables and
// descriptors are those of ISO/IEC 13818-1 and EN 300 468, stream events and the AIT those of TS
// 102 809.
#ifndef TELIX_DESKTOP_PLATFORM_TSTABLES_H
#define TELIX_DESKTOP_PLATFORM_TSTABLES_H

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "desktop/platform/DvbConstants.h"

namespace desktop {

using Bytes = std::vector<uint8_t>;

inline uint16_t pidOf(const uint8_t* packet) {
    return static_cast<uint16_t>((packet[1] << 8 | packet[2]) & kPidMask);
}

// The CRC at the end of a section; 0 over a whole section that is undamaged.
uint32_t crc32(const uint8_t* bytes, size_t length);

struct Pat {
    uint16_t transportStreamId = 0;
    uint8_t version = 0;
    std::vector<std::pair<uint16_t, uint16_t>> programs; // program number (the service id), PID of its PMT
};

struct ElementaryStream {
    uint8_t type = 0; // stream_type
    uint16_t pid = 0;
    Bytes descriptors;
};

struct Pmt {
    uint16_t serviceId = 0;
    uint8_t version = 0;
    uint16_t pcrPid = kPidNullPacket;
    Bytes descriptors;
    std::vector<ElementaryStream> streams;
};

struct Nit {
    uint16_t networkId = 0;
    std::string name;
    uint16_t transportStreamId = 0;
    uint16_t originalNetworkId = 0;
    Bytes deliveryDescriptor; // whole, with tag and length; empty if there is none
};

struct SdtService {
    uint16_t serviceId = 0;
    uint8_t type = kServiceTypeDigitalTelevision; // service_type
    std::string provider;
    std::string name;
};

struct Sdt {
    uint16_t transportStreamId = 0;
    uint16_t originalNetworkId = 0;
    uint8_t version = 0;
    std::vector<SdtService> services;
};

struct EitRating {
    std::string country; // three letters
    uint8_t value = 0;   // as broadcast: see kParentalRatingFirstAge
};

struct EitEvent {
    uint16_t id = 0;
    int64_t start = 0;     // seconds since 1970, UTC
    uint32_t duration = 0; // seconds, below 100 hours
    std::string language = "deu";
    std::string name;
    std::string text;
    std::vector<EitRating> ratings;
};

// One section of the EIT present/following of a service.
struct Eit {
    uint16_t serviceId = 0;
    uint16_t transportStreamId = 0;
    uint16_t originalNetworkId = 0;
    uint8_t version = 0;
    uint8_t sectionNumber = kEitSectionPresent;
    std::vector<EitEvent> events;
};

// One "do it now" event of a stream event component.
struct StreamEvent {
    uint16_t id = 0;     // 14 bits
    uint8_t version = 0; // changes with each occurrence
    Bytes data;          // at most 245 bytes
};

struct AitApplication {
    uint32_t organisationId = 0;
    uint16_t applicationId = 0;
    uint8_t controlCode = kControlCodeAutostart;
    Bytes descriptors;
};

// One section of the AIT of one application type.
struct Ait {
    uint16_t applicationType = kApplicationTypeHbbTv;
    bool isTest = false; // applications that only sets under test start
    uint8_t version = 0;
    uint8_t sectionNumber = 0;
    uint8_t lastSectionNumber = 0;
    Bytes commonDescriptors; // of all applications of the section
    std::vector<AitApplication> applications;
};

// Whole sections, with their CRC.
Bytes pack(const Pat& pat);
Bytes pack(const Pmt& pmt);
Bytes pack(const Nit& nit);
Bytes pack(const Sdt& sdt);
Bytes pack(const Eit& eit);
Bytes pack(const StreamEvent& event);
Bytes pack(const Ait& ait);
Bytes packTdt(int64_t utcSeconds); // since 1970; a TDT has no CRC

// Whole descriptors, with tag and length. `language` is an ISO 639-2 code.
Bytes iso639LanguageDescriptor(const std::string& language, uint8_t audioType);
Bytes subtitlingDescriptor(const std::string& language, uint8_t subtitlingType);
Bytes streamIdentifierDescriptor(uint8_t componentTag);

// Of the stream with an AIT, in the PMT.
Bytes applicationSignallingDescriptor(uint16_t applicationType, uint8_t version);

// Descriptors of an AIT. A label connects an application with its transport protocols.
struct ApplicationProfile {
    uint16_t profile = 0;
    uint8_t versionMajor = 0;
    uint8_t versionMinor = 0;
    uint8_t versionMicro = 0;
};
Bytes applicationDescriptor(const ApplicationProfile& profile, bool isServiceBound, uint8_t priority,
                            uint8_t label);
Bytes applicationNameDescriptor(const std::string& language, const std::string& name);
Bytes httpTransportDescriptor(uint8_t label, const std::string& baseUrl,
                              const std::vector<std::string>& extensions);
Bytes simpleApplicationLocationDescriptor(const std::string& initialPath);
Bytes applicationUsageDescriptor(uint8_t usage);
Bytes simpleApplicationBoundaryDescriptor(const std::vector<std::string>& urls);

// The packets that carry a section; `continuity` is the continuity counter of the PID, which is advanced.
Bytes packetsOf(const Bytes& section, uint16_t pid, uint8_t& continuity);

} // namespace desktop

#endif
