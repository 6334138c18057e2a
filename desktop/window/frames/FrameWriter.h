// The writing side of a frame ring, in the process of the platform library.
#ifndef TELIX_DESKTOP_WINDOW_FRAMES_FRAMEWRITER_H
#define TELIX_DESKTOP_WINDOW_FRAMES_FRAMEWRITER_H

#include <memory>

#include "desktop/platform/telix_picture.h"
#include "desktop/window/frames/FrameRing.h"

namespace desktop {

// One thread at a time. Never waits for the reader.
class FrameWriter {
public:
    // A ring for frames of up to that number of bytes. Null, with errno set, if it cannot be made.
    static std::unique_ptr<FrameWriter> create(size_t frameSize);
    // On a mapping that the caller has already, for example the one of a reader in the same process. `wakeup`
    // is an eventfd of the writer's own from now on, or -1.
    FrameWriter(std::shared_ptr<FrameRingMemory> memory, int wakeup);
    ~FrameWriter();
    FrameWriter(const FrameWriter&) = delete;
    FrameWriter& operator=(const FrameWriter&) = delete;

    // The bytes that the pixels of a frame take in a ring; 0 for one that no ring takes, because it has no
    // pixels or a side that is too long.
    static size_t sizeOf(const telix_desktop_frame& frame);

    // Copies the pixels, if the serial is not that of the last ones, makes the frame the newest one and wakes
    // the reader up. False, with no effect, if the frame is larger than a slot.
    bool publish(const telix_desktop_frame& frame);

    // For the reader; valid as long as the writer.
    int memoryDescriptor() const { return m_memoryDescriptor; }
    int wakeupDescriptor() const { return m_wakeupDescriptor; }

private:
    void copyPixels(const telix_desktop_frame& frame);

    std::shared_ptr<FrameRingMemory> m_memory;
    int m_memoryDescriptor = -1;
    int m_wakeupDescriptor;
    uint32_t m_own = FrameRingHeader::kFirstOfWriter; // the description that is the writer's
    uint32_t m_slots[kSlotCount] = {0, 1, 2}; // of each description; the shared ones are not read back
    bool m_hasPixels = false;
    uint32_t m_pixelSlot = 0; // of the last pixels
    uint64_t m_serial = 0;
};

} // namespace desktop

#endif
