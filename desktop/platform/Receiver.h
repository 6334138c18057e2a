// The receiving end of a multiplex: follows its tables, and feeds one service of it to a tuner.
#ifndef TELIX_DESKTOP_PLATFORM_RECEIVER_H
#define TELIX_DESKTOP_PLATFORM_RECEIVER_H

#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <set>
#include <utility>

#include "desktop/platform/Sections.h"

namespace desktop {

class Receiver {
public:
    // The selected service and what is called for it: on the thread that calls push(), or inside of select()
    // for tables that are known already. The receiver is locked meanwhile: the functions may post, and must
    // not call the receiver.
    struct Service {
        uint16_t serviceId = 0;
        std::function<void(const Bytes& packets)> feed; // PAT, PMT and streams of this service alone
        std::function<void(const Pmt& pmt)> onPmt;      // once, before the first packets
        std::function<void()> onMissing;                // once: the PAT does not list the service
        std::function<void(const Eit& eit)> onEit;      // a section that differs from the one before
        std::function<void(uint8_t componentTag, const StreamEvent& event)> onStreamEvent; // each repetition
    };

    // Takes packets of the multiplex. Playout thread.
    void push(const uint8_t* packets, size_t size);

    // Another multiplex follows. Deselects too.
    void reset();

    void select(const Service& service);

    // When this returns, no function of the service is running, and none is called again.
    void deselect();

private:
    void onSection(uint16_t pid, const Bytes& section);
    void onPat(const Bytes& section);
    void onEit(const Bytes& section);
    void startFeed();
    void refreshFeed();

    std::mutex m_mutex; // guards everything
    SectionDemultiplexer m_sections{[this](uint16_t pid, const Bytes& section) { onSection(pid, section); }};
    bool m_isFilteringTables = false;

    // Of the multiplex.
    std::optional<Pat> m_pat;
    std::map<uint16_t, Pmt> m_pmts;                              // by service id
    std::map<std::pair<uint16_t, uint8_t>, Bytes> m_eitSections; // by service id and section number

    // Of the selected service.
    std::optional<Service> m_service;
    bool m_isFeeding = false;
    bool m_isMissing = false;
    std::set<uint16_t> m_fedPids;
    std::map<uint16_t, uint8_t> m_streamEventTags; // component tag by PID
    uint8_t m_patContinuity = 0;
    uint8_t m_pmtContinuity = 0;
    Bytes m_batch;
};

} // namespace desktop

#endif
