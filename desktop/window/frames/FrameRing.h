// A ring of video frames in memory that two processes share: one writes frames, the other one shows them.
//
// The memory is a memfd that can neither grow nor shrink: a header of one page, then kSlotCount slots of
// equal size for pixels. A second descriptor, an eventfd, is written after each change. Both travel to the
// reader once, in a message kFramesMessage; for larger frames the writer makes new memory and sends it.
//
// The header holds kSlotCount descriptions of what is to be seen, each with the number of a slot. The writer
// owns one description, the reader another one, and each exchanges its own for the third, which holds the
// newest, by one atomic operation. Nobody waits, so a side that ends at any instant harms nobody. The two
// descriptions that are not the writer's refer to at most two slots, so the writer always has a free one.
//
// The reader belongs to the more privileged process. It trusts nothing that it reads: FrameReader.h.
#ifndef TELIX_DESKTOP_WINDOW_FRAMES_FRAMERING_H
#define TELIX_DESKTOP_WINDOW_FRAMES_FRAMERING_H

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <memory>

namespace desktop {

// Name of the user message from the web process to the web context with the descriptors of a ring: the
// memory, then the eventfd. Without parameters.
constexpr char kFramesMessage[] = "telix-frames";

constexpr uint32_t kSlotCount = 3;
constexpr uint32_t kBytesPerPixel = 4;
constexpr uint32_t kMaximumFrameSide = 8192; // pixels
constexpr size_t kMaximumSlotSize = size_t{kBytesPerPixel} * 4096 * 4096;

// What telix_desktop_frame says, without pointers.
struct FrameDescription {
    uint64_t presenter;
    uint64_t serial;
    uint32_t slot;
    uint32_t width;
    uint32_t height;
    uint32_t stride;
    uint32_t aspectWidth;
    uint32_t aspectHeight;
    int32_t areaX;
    int32_t areaY;
    uint32_t areaWidth;
    uint32_t areaHeight;
    uint32_t fullScreen;
    uint32_t visible;
};

struct FrameRingHeader {
    static constexpr uint32_t kMagic = 0x74784652;
    static constexpr uint32_t kNew = 0x80; // in `newest`: not yet taken by the reader
    // Who owns which description of an empty ring.
    static constexpr uint32_t kFirstOfWriter = 0;
    static constexpr uint32_t kFirstNewest = 1;
    static constexpr uint32_t kFirstOfReader = 2;

    uint32_t magic;
    std::atomic<uint32_t> newest; // number of the description that nobody owns
    FrameDescription descriptions[kSlotCount];
};
static_assert(std::atomic<uint32_t>::is_always_lock_free);

// The mapping of a ring's memory. Unmaps it at the end, and keeps no descriptor.
class FrameRingMemory {
public:
    // Makes memory for slots of at least `slotSize` bytes, at most kMaximumSlotSize, with an empty ring, and
    // its descriptor, which the caller closes. Null, with errno set, if there is no memory.
    static std::shared_ptr<FrameRingMemory> create(size_t slotSize, int& descriptor);

    // Maps what another process made. Null, with a reason, if the descriptor is not of sealed memory of the
    // size of a ring. Does not take the descriptor.
    static std::shared_ptr<FrameRingMemory> map(int descriptor, const char*& reason);

    FrameRingMemory(const FrameRingMemory&) = delete;
    FrameRingMemory& operator=(const FrameRingMemory&) = delete;
    ~FrameRingMemory();

    FrameRingHeader& header() const { return *static_cast<FrameRingHeader*>(m_address); }
    uint8_t* slot(uint32_t number) const;
    size_t slotSize() const { return m_slotSize; }

private:
    FrameRingMemory(void* address, size_t slotSize) : m_address(address), m_slotSize(slotSize) {}

    void* m_address;
    size_t m_slotSize; // from the size of the memory, not from its contents
};

} // namespace desktop

#endif
