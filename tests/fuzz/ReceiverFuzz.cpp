// Fuzz target of the receiver: the input is a list of steps. A step pushes a section with a correct CRC, or a
// packet as it is, or selects another service. Whatever arrives, only what belongs to the selected service is
// passed on.
#include <algorithm>
#include <cassert>
#include <cstddef>
#include <cstdint>
#include <string>

#include "desktop/platform/Receiver.h"

namespace {

using desktop::Bytes;

// Few numbers, so that services, their PMTs and their streams meet.
constexpr uint16_t kServices = 4;
constexpr uint16_t kPids = 32;

// Without its CRC.
constexpr size_t kMaxSection = 1020;

// Each step takes 10 ms.
class StepClock : public desktop::Clock {
public:
    void step() { m_now += std::chrono::milliseconds(10); }

    Instant now() const override { return m_now; }
    int64_t utcSeconds() const override { return 0; }
    bool waitUntil(std::unique_lock<std::mutex>&, std::condition_variable&, Instant,
                   const std::function<bool()>& isDone) override {
        return isDone();
    }
    void callAfter(std::chrono::milliseconds, std::function<void()>) override {}

private:
    Instant m_now;
};

// A step is a byte that tells which, followed by its parameters:
//   0 service             select
//   1                     deselect
//   2                     reset
//   3 packet              push a packet, filled up at the end of the input
//   4 service             follow the applications of a service
//   5 on                  keep packets, or do not
//   6 PID length section  push a section, which gets its length and CRC here; its length has two bytes
class Steps {
public:
    Steps(const uint8_t* data, size_t size) : m_at(data), m_left(size) {}

    void run() {
        while (m_left > 0) {
            m_clock.step();
            switch (take8() % 7) {
            case 0:
                select();
                break;
            case 1:
                m_receiver.deselect();
                break;
            case 2:
                m_receiver.reset();
                break;
            case 3:
                pushPacket();
                break;
            case 4:
                followApplications();
                break;
            case 5:
                m_receiver.keepPackets(take8() % 2 != 0);
                break;
            default:
                pushSection();
            }
        }
    }

private:
    // Zeros follow the end of the input.
    unsigned int take8() {
        const Bytes byte = take(1);
        return byte.empty() ? 0 : byte[0];
    }
    Bytes take(size_t size) {
        const size_t taken = std::min(size, m_left);
        const Bytes bytes(m_at, m_at + taken);
        m_at += taken;
        m_left -= taken;
        return bytes;
    }

    void select() {
        m_service = static_cast<uint16_t>(1 + take8() % kServices);
        m_isMissing = false;
        m_hasPmt = false;
        desktop::Receiver::Service service;
        service.serviceId = m_service;
        service.onPmt = [this](const desktop::Pmt& pmt) {
            assert(pmt.serviceId == m_service && !m_hasPmt);
            m_hasPmt = true;
        };
        service.onMissing = [this] {
            assert(!m_isMissing);
            m_isMissing = true;
        };
        service.feed = [this](const Bytes& packets, desktop::Clock::Duration age) {
            assert(age >= desktop::Clock::Duration::zero());
            assert(m_hasPmt && !packets.empty() && packets.size() % desktop::kPacketSize == 0);
        };
        service.onEit = [this](const desktop::Eit& eit) { assert(eit.serviceId == m_service); };
        service.onStreamEvent = [this](uint8_t, const desktop::StreamEvent&) { assert(m_hasPmt); };
        m_receiver.select(service);
    }

    void followApplications() {
        const auto service = static_cast<uint16_t>(1 + take8() % kServices);
        m_receiver.followApplications(service, [](const desktop::ApplicationList& list) {
            assert(list.applications.size() <= desktop::kMaxSignalledApplications);
            for (const desktop::SignalledApplication& application : list.applications) {
                assert(desktop::findFault(application).empty());
            }
        });
    }

    void pushPacket() {
        Bytes packet = take(desktop::kPacketSize);
        packet.resize(desktop::kPacketSize, desktop::kStuffingByte);
        m_receiver.push(packet.data(), packet.size(), desktop::Clock::Duration::zero());
    }

    // The CRC is appended, because no input would get past its check otherwise.
    void pushSection() {
        const auto pid = static_cast<uint16_t>(take8() % (kPids + 1));
        const unsigned int high = take8();
        Bytes section = take((high << 8 | take8()) % kMaxSection);
        section.resize(std::max(section.size(), desktop::kSectionHeaderSize));
        const size_t length = section.size() - desktop::kSectionHeaderSize + desktop::kCrcSize;
        section[1] = static_cast<uint8_t>(desktop::kSectionSyntaxIndicator | (length >> 8 & 0x0F));
        section[2] = static_cast<uint8_t>(length);
        const uint32_t crc = desktop::crc32(section.data(), section.size());
        for (int shift = 24; shift >= 0; shift -= 8) {
            section.push_back(static_cast<uint8_t>(crc >> shift));
        }
        const Bytes packets = desktop::packetsOf(section, pid, m_continuity[pid]);
        m_receiver.push(packets.data(), packets.size(), desktop::Clock::Duration::zero());
    }

    const uint8_t* m_at;
    size_t m_left;
    uint16_t m_service = 0;
    bool m_hasPmt = false;
    bool m_isMissing = false;
    uint8_t m_continuity[kPids + 1] = {};
    StepClock m_clock;
    desktop::Receiver m_receiver{m_clock};
};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const auto start = desktop::findPackets(data, size);
    assert(!start || *start < desktop::kPacketSize);
    Steps(data, size).run();
    return 0;
}
