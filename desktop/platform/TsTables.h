// The tables of a transport stream as plain records, packed into sections and packets.
#ifndef TELIX_DESKTOP_TSTABLES_H
#define TELIX_DESKTOP_TSTABLES_H

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace desktop {

using Bytes = std::vector<uint8_t>;

constexpr size_t packetSize = 188;
constexpr uint8_t packetStart = 0x47;

// Packet identifiers of tables that stand at a fixed place.
constexpr uint16_t patPid = 0x00;
constexpr uint16_t nitPid = 0x10;
constexpr uint16_t sdtPid = 0x11;
constexpr uint16_t eitPid = 0x12;
constexpr uint16_t tdtPid = 0x14;
constexpr uint16_t nullPid = 0x1FFF;

// Kinds of elementary stream in a programme map.
constexpr uint8_t streamTypePrivate = 0x06;
constexpr uint8_t streamTypeStreamEvents = 0x0C;

inline uint16_t pidOf(const uint8_t* packet) {
    return static_cast<uint16_t>((packet[1] & 0x1F) << 8 | packet[2]);
}

// The sum at the end of a section; 0 over a whole section that is undamaged.
uint32_t crc32(const uint8_t* bytes, size_t length);

struct Pat {
    uint16_t transportStreamId = 0;
    uint8_t version = 0;
    std::vector<std::pair<uint16_t, uint16_t>>
        programmes; // service id, PID of its map; service 0 is the network
};

struct ElementaryStream {
    uint8_t type = 0;
    uint16_t pid = 0;
    Bytes descriptors;
};

struct Pmt {
    uint16_t serviceId = 0;
    uint8_t version = 0;
    uint16_t pcrPid = nullPid;
    Bytes descriptors;
    std::vector<ElementaryStream> streams;
};

struct Nit {
    uint16_t networkId = 0;
    std::string name;
    uint16_t transportStreamId = 0;
    uint16_t originalNetworkId = 0;
    Bytes deliveryDescriptor; // whole, with tag and length; empty where there is none
};

struct SdtService {
    uint16_t serviceId = 0;
    uint8_t type = 1; // 1 television, 2 radio, others
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
    uint8_t value = 0;   // 1 to 15: from the age of three years more on; 0 and 16 up: the broadcaster's own
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

// One section of the present and following programmes of a service: number 0 the present one, 1 the
// following.
struct Eit {
    uint16_t serviceId = 0;
    uint16_t transportStreamId = 0;
    uint16_t originalNetworkId = 0;
    uint8_t version = 0;
    uint8_t number = 0;
    std::vector<EitEvent> events;
};

// One "do it now" event of a stream event component.
struct StreamEvent {
    uint16_t id = 0;     // 14 bits
    uint8_t version = 0; // changes with each occurrence
    Bytes data;          // at most 245 bytes
};

// Sections, complete with their sum.
Bytes pack(const Pat& pat);
Bytes pack(const Pmt& pmt);
Bytes pack(const Nit& nit);
Bytes pack(const Sdt& sdt);
Bytes pack(const Eit& eit);
Bytes pack(const StreamEvent& event);
Bytes packTime(int64_t seconds); // the time table, without a sum as ever

// Descriptors, complete with tag and length.
// `audioType` is 0 for ordinary audio, audioTypeDescription for a description of the picture.
constexpr uint8_t audioTypeHearingImpaired = 2;
constexpr uint8_t audioTypeDescription = 3;
Bytes describeLanguage(const std::string& language, uint8_t audioType);
// `subtitleType` is 0x10 for ordinary subtitles, 0x20 for those for the hard of hearing.
Bytes describeSubtitles(const std::string& language, uint8_t subtitleType);
Bytes describeComponentTag(uint8_t tag);

// The packets that carry a section; `continuity` is the counter of the PID and runs on.
Bytes packetsOf(const Bytes& section, uint16_t pid, uint8_t& continuity);

} // namespace desktop

#endif
