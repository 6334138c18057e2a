// Reading tables from packets: reassembly of sections, check of their CRC, and parsing. Streams may be
// damaged or hostile: every length is checked, and what does not fit is skipped.
#ifndef TELIX_DESKTOP_PLATFORM_SECTIONS_H
#define TELIX_DESKTOP_PLATFORM_SECTIONS_H

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "desktop/platform/TsTables.h"

namespace desktop {

// The offset of the first of several packets in a row; nothing if there are none.
std::optional<size_t> findPackets(const uint8_t* bytes, size_t length);

// Reassembles the sections of one PID.
class SectionFilter {
public:
    using Handler = std::function<void(const Bytes& section)>;

    // `handler` gets each whole section with a correct CRC, and those of tables without a CRC, on the thread
    // that calls push().
    explicit SectionFilter(Handler handler) : m_handler(std::move(handler)) {}

    // Takes one packet of the PID.
    void push(const uint8_t* packet);

private:
    void pushStart(const uint8_t* packet, size_t begin);
    void append(const uint8_t* bytes, size_t length);
    void dispatchWhole();

    Handler m_handler;
    Bytes m_section;
    bool m_isCollecting = false;
    int m_continuity = -1;
};

// Sections of several PIDs.
class SectionDemultiplexer {
public:
    using Handler = std::function<void(uint16_t pid, const Bytes& section)>;

    explicit SectionDemultiplexer(Handler handler) : m_handler(std::move(handler)) {}

    void add(uint16_t pid);
    void remove(uint16_t pid) { m_filters.erase(pid); }
    bool has(uint16_t pid) const { return m_filters.count(pid) != 0; }

    // Takes one packet of any PID. The handler may add PIDs, and must not remove any.
    void push(const uint8_t* packet);

private:
    Handler m_handler;
    std::map<uint16_t, SectionFilter> m_filters;
};

// The table in a section. Nothing if the section belongs to another table, is not applicable yet
// (current_next_indicator) or is malformed.
std::optional<Pat> parsePat(const Bytes& section);
std::optional<Pmt> parsePmt(const Bytes& section);
std::optional<Nit> parseNit(const Bytes& section);      // actual network; its first transport stream
std::optional<Sdt> parseSdt(const Bytes& section);      // actual transport stream
std::optional<Eit> parseEit(const Bytes& section);      // actual transport stream, present/following
std::optional<int64_t> parseTime(const Bytes& section); // TDT or TOT: seconds since 1970, UTC
std::vector<StreamEvent> parseStreamEvents(const Bytes& section);
std::optional<Ait> parseAit(const Bytes& section); // of any application type

// A string of a table as UTF-8, without its control codes.
std::string decodeString(const uint8_t* bytes, size_t length);

// Calls `visit` for each descriptor up to the first one that is not whole. False if there is such a one.
bool forEachDescriptor(const Bytes& descriptors,
                       const std::function<void(uint8_t tag, const uint8_t* body, size_t length)>& visit);

} // namespace desktop

#endif
