// The packets of every service of a multiplex since its last random access point, from which another service
// can be presented at once.
#ifndef TELIX_DESKTOP_PLATFORM_RECENTPACKETS_H
#define TELIX_DESKTOP_PLATFORM_RECENTPACKETS_H

#include <deque>
#include <map>
#include <optional>
#include <set>
#include <vector>

#include "desktop/platform/Clock.h"
#include "desktop/platform/TsTables.h"

namespace desktop {

// Of all services together, in bytes.
constexpr size_t kMaxRecentPackets = size_t{32} << 20;

// Whether a packet is one at which a decoder can begin: it is marked as random access point, or a picture
// that decodes alone begins in it. `streamType` is that of a video stream.
bool isRandomAccessPoint(const uint8_t* packet, uint8_t streamType);

bool isVideo(uint8_t streamType);

// The caller locks.
class RecentPackets {
public:
    // Packets that arrived at one time.
    struct Chunk {
        Clock::Instant arrival;
        Bytes packets;
    };

    explicit RecentPackets(size_t maxSize = kMaxRecentPackets) : m_maxSize(maxSize) {}

    // The packets of `pids` are kept for the service from the following random access point of its first
    // video stream on; none if it has no video. What is kept stays if video and PIDs are the same as before.
    void setService(const Pmt& pmt, const std::set<uint16_t>& pids);

    void push(const uint8_t* packet, Clock::Instant arrival);

    // Drops the packets, or the services as well.
    void clearPackets();
    void clear();

    // In the order of their arrival, from a random access point on. Empty if there is none.
    const std::deque<Chunk>& packetsOf(uint16_t serviceId) const;

    size_t size() const { return m_size; }

private:
    struct Service {
        uint16_t videoPid = kPidNullPacket;
        uint8_t videoType = 0;
        std::set<uint16_t> pids;
        std::deque<Chunk> chunks;
        size_t size = 0;
    };

    void drop(Service& service);
    void dropOldest();
    void append(Service& service, const uint8_t* packet, Clock::Instant arrival);

    size_t m_maxSize;
    size_t m_size = 0;
    std::map<uint16_t, Service> m_services;                // by service id
    std::map<uint16_t, std::vector<Service*>> m_receivers; // by PID; pointers into m_services
};

} // namespace desktop

#endif
