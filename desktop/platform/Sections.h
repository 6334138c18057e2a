// Reading tables back from packets: reassembly of sections, their sums, and parsing. Whatever a stream holds,
// damage included, is taken without harm: what does not fit is left out.
#ifndef TELIX_DESKTOP_SECTIONS_H
#define TELIX_DESKTOP_SECTIONS_H

#include "desktop/platform/TsTables.h"

#include <functional>
#include <map>

namespace desktop {

// Where the first of some packets stands that follow each other; nothing if there are none.
std::optional<size_t> findPackets(const uint8_t* bytes, size_t length);

// Reassembles the sections of one PID.
class SectionFilter {
public:
    using Handler = std::function<void(const Bytes& section)>;

    // `handler` gets each whole section whose sum is good (tables without one as they are), on the thread of
    // push.
    explicit SectionFilter(Handler handler) : m_handler(std::move(handler)) {}

    // Takes one packet of the PID.
    void push(const uint8_t* packet);

private:
    void append(const uint8_t* bytes, size_t length);
    void deliverWhole();

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

    // Takes one packet of any PID.  The handler may add PIDs, and must not remove any.
    void push(const uint8_t* packet);

private:
    Handler m_handler;
    std::map<uint16_t, SectionFilter> m_filters;
};

// The tables of sections; nothing for a section of another table, of one that is not in force yet, or for
// nonsense.
std::optional<Pat> parsePat(const Bytes& section);
std::optional<Pmt> parsePmt(const Bytes& section);
std::optional<Nit> parseNit(const Bytes& section); // of the first transport stream in it
std::optional<Sdt> parseSdt(const Bytes& section); // of the actual transport stream
std::optional<Eit> parseEit(const Bytes& section); // present and following of the actual transport stream
std::optional<int64_t> parseTime(const Bytes& section);
std::vector<StreamEvent> parseStreamEvents(const Bytes& section);

// A text of a table as UTF-8, without its control codes.
std::string decodeText(const uint8_t* bytes, size_t length);

// Walks over descriptors.
void forEachDescriptor(const Bytes& descriptors,
                       const std::function<void(uint8_t tag, const uint8_t* body, size_t length)>& visit);

} // namespace desktop

#endif
