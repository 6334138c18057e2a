// The receiving end of a multiplex: follows its tables, and feeds one service of it to a tuner.
#ifndef TELIX_DESKTOP_PLATFORM_RECEIVER_H
#define TELIX_DESKTOP_PLATFORM_RECEIVER_H

#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <set>
#include <utility>

#include "desktop/platform/ApplicationInformation.h"
#include "desktop/platform/RecentPackets.h"
#include "desktop/platform/Sections.h"

namespace desktop {

class Receiver {
public:
    // The selected service and what is called for it: on the thread that calls push(), or inside of select()
    // for tables that are known already. The receiver is locked meanwhile: the functions may post, and must
    // not call the receiver.
    struct Service {
        uint16_t serviceId = 0;
        // PAT, PMT and streams of this service alone, and how long ago they arrived.
        std::function<void(const Bytes& packets, Clock::Duration age)> feed;
        std::function<void(const Pmt& pmt)> onPmt; // once, before the first packets
        std::function<void()> onMissing;           // once: the PAT does not list the service
        std::function<void(const Eit& eit)> onEit; // a section that differs from the one before
        std::function<void(uint8_t componentTag, const StreamEvent& event)> onStreamEvent; // each repetition
    };

    // Called with the applications of a service when its PMT or its AIT is known, and at each change. On the
    // same threads and under the same lock as the functions of a service.
    using OnApplications = std::function<void(const ApplicationList& list)>;

    // `clock` must outlive the receiver.
    explicit Receiver(Clock& clock) : m_clock(clock) {}

    // Takes packets of the multiplex that arrived `age` ago. Playout thread.
    void push(const uint8_t* packets, size_t size, Clock::Duration age);

    // Whether packets of all services are kept, so that a service that is selected is fed from its last
    // random access point on. Off at first.
    void keepPackets(bool isOn);
    bool keepsPackets() const;
    size_t keptSize() const; // bytes

    // How long ago the first of the kept packets of a service arrived; 0 if there are none.
    Clock::Duration keptAge(uint16_t serviceId) const;

    // Another multiplex follows. Deselects, and forgets followApplications() too.
    void reset();

    void select(const Service& service);

    // When this returns, no function of the service is running, and none is called again.
    void deselect();

    // Follows the AIT of a service instead of the one before, whether it is selected or not.
    void followApplications(uint16_t serviceId, OnApplications onApplications);

private:
    // The AITs of a service.
    struct Signalling {
        uint16_t serviceId;
        OnApplications onApplications;
        std::map<uint16_t, ApplicationTable> tables; // by PID
        bool hasPmt = false;
    };

    void onSection(uint16_t pid, const Bytes& section);
    void onPat(const Bytes& section);
    void onEit(const Bytes& section);
    void onPmt(const Pmt& pmt);
    void onAit(uint16_t pid, const Bytes& section);
    void refreshSignalling();
    void reportApplications() const;
    void startFeed();
    void feedRecent();
    void refreshFeed();

    Clock& m_clock;
    mutable std::mutex m_mutex; // guards everything
    SectionDemultiplexer m_sections{[this](uint16_t pid, const Bytes& section) { onSection(pid, section); }};
    bool m_isFilteringTables = false;

    // Of the multiplex.
    std::optional<Pat> m_pat;
    std::map<uint16_t, Pmt> m_pmts;                              // by service id
    std::map<std::pair<uint16_t, uint8_t>, Bytes> m_eitSections; // by service id and section number

    bool m_isKeeping = false;
    RecentPackets m_recent;
    std::optional<Signalling> m_signalling;

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
