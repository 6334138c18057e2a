// The reading side of a frame ring, in the process of the window.
#include "desktop/window/frames/FrameReader.h"

#include <sys/epoll.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <utility>

namespace desktop {

namespace {

// Of the page; nobody sees what is further away, and twice as much does not overflow in any window.
constexpr int32_t kFarthestPixel = 1 << 20;

// Reads each word once, so that what is checked is what is used.
FrameDescription copyOnce(const FrameDescription& shared) {
    constexpr size_t kWords = sizeof(FrameDescription) / sizeof(uint32_t);
    static_assert(sizeof(FrameDescription) % sizeof(uint32_t) == 0);
    uint32_t words[kWords];
    const auto* source = reinterpret_cast<const volatile uint32_t*>(&shared);
    for (size_t word = 0; word < kWords; ++word) {
        words[word] = source[word];
    }
    FrameDescription copy;
    std::memcpy(&copy, words, sizeof copy);
    return copy;
}

bool isPlausible(const FrameDescription& description, size_t slotSize) {
    return description.slot < kSlotCount && description.width > 0 && description.height > 0 &&
           description.width <= kMaximumFrameSide && description.height <= kMaximumFrameSide &&
           description.stride % kBytesPerPixel == 0 &&
           description.stride >= description.width * kBytesPerPixel &&
           uint64_t{description.stride} * description.height <= slotSize &&
           std::abs(int64_t{description.areaX}) <= kFarthestPixel &&
           std::abs(int64_t{description.areaY}) <= kFarthestPixel &&
           description.areaWidth <= kFarthestPixel && description.areaHeight <= kFarthestPixel;
}

// A descriptor that is readable once for each write to the given one. Unlike that one it need not be read:
// the other process could make a read block. -1 if the given one cannot be polled.
int watch(int wakeup) {
    const int watching = epoll_create1(EPOLL_CLOEXEC);
    epoll_event event{};
    event.events = EPOLLIN | EPOLLET;
    if (watching != -1 && epoll_ctl(watching, EPOLL_CTL_ADD, wakeup, &event) != 0) {
        close(watching);
        return -1;
    }
    return watching;
}

} // namespace

std::unique_ptr<FrameReader> FrameReader::open(int memory, int wakeup, std::string& error) {
    const char* reason = nullptr;
    auto mapping = FrameRingMemory::map(memory, reason);
    close(memory);
    if (!mapping) {
        error = std::string("frames: ") + reason;
        close(wakeup);
        return nullptr;
    }
    auto reader = std::make_unique<FrameReader>(std::move(mapping));
    reader->m_wakeupDescriptor = wakeup;
    reader->m_pollDescriptor = watch(wakeup);
    if (reader->m_pollDescriptor == -1) {
        error = std::string("frames: wake-up: ") + std::strerror(errno);
        return nullptr;
    }
    return reader;
}

FrameReader::FrameReader(std::shared_ptr<FrameRingMemory> memory) : m_memory(std::move(memory)) {}

FrameReader::~FrameReader() {
    // The watching descriptor first: it refers to the other one.
    for (const int descriptor : {m_pollDescriptor, m_wakeupDescriptor}) {
        if (descriptor != -1) {
            close(descriptor);
        }
    }
}

bool FrameReader::refresh() {
    epoll_event event;
    // Before the frame is taken, so that one that comes meanwhile makes the descriptor readable again.
    epoll_wait(m_pollDescriptor, &event, 1, 0);
    std::atomic<uint32_t>& newest = m_memory->header().newest;
    if ((newest.load() & FrameRingHeader::kNew) == 0) {
        return false;
    }
    const uint32_t taken = newest.exchange(m_own) & ~FrameRingHeader::kNew;
    if (taken >= kSlotCount) {
        m_frame = {};
        return true;
    }
    m_own = taken;
    show(copyOnce(m_memory->header().descriptions[m_own]));
    return true;
}

void FrameReader::show(const FrameDescription& description) {
    m_frame = {};
    m_frame.presenter = description.presenter;
    m_frame.serial = description.serial;
    if (description.visible == 0 || !isPlausible(description, m_memory->slotSize())) {
        return;
    }
    m_frame.pixels = m_memory->slot(description.slot);
    m_frame.width = description.width;
    m_frame.height = description.height;
    m_frame.stride = description.stride;
    m_frame.aspectWidth = description.aspectWidth;
    m_frame.aspectHeight = description.aspectHeight;
    m_frame.areaX = description.areaX;
    m_frame.areaY = description.areaY;
    m_frame.areaWidth = description.areaWidth;
    m_frame.areaHeight = description.areaHeight;
    m_frame.fullScreen = description.fullScreen != 0 ? 1 : 0;
    m_frame.visible = 1;
}

} // namespace desktop
