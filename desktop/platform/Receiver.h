// The receiving end of a multiplex: follows its tables, and feeds one service of it to a tuner.
#ifndef TELIX_DESKTOP_RECEIVER_H
#define TELIX_DESKTOP_RECEIVER_H

#include "desktop/platform/Sections.h"

#include <map>
#include <mutex>
#include <set>

namespace desktop {

class Receiver {
public:
    // Called on the thread of push, or of select for what is known already, with the receiver locked: they
    // may post and must not call the receiver.
    struct Service {
        uint16_t serviceId = 0;
        std::function<void(const Bytes& packets)> feed; // tables and streams of this service alone
        std::function<void(const Pmt& map)> mapped;     // once, before the first packets
        std::function<void()> missing;                  // once: the multiplex has no such service
        std::function<void(const Eit& eit)> programmes; // whenever a section differs
        std::function<void(uint8_t tag, const StreamEvent& event)> event; // each section that is received
    };

    // Takes packets of the multiplex. Head-end's thread.
    void push(const uint8_t* packets, size_t size);

    // Another multiplex follows. Deselects too.
    void reset();

    void select(const Service& service);

    // When this returns, nothing of the service is called any more.
    void deselect();

private:
    void takeSection(uint16_t pid, const Bytes& section);
    void begin();
    void refreshFeed();

    std::mutex m_mutex;
    SectionDemultiplexer m_sections{
        [this](uint16_t pid, const Bytes& section) { takeSection(pid, section); }};
    std::optional<Pat> m_pat;
    std::map<uint16_t, Pmt> m_maps;                             // by service
    std::map<std::pair<uint16_t, uint8_t>, Bytes> m_programmes; // by service and number, as received
    bool m_isWatching = false;

    std::optional<Service> m_service;
    bool m_isBegun = false;
    bool m_isMissing = false;
    std::set<uint16_t> m_fedPids;
    std::map<uint16_t, uint8_t> m_eventTags; // component tag by PID
    uint8_t m_patContinuity = 0;
    uint8_t m_mapContinuity = 0;
    Bytes m_batch;
};

} // namespace desktop

#endif
