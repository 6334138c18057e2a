// The writing side of a frame ring, in the process of the platform library.
#include "desktop/window/frames/FrameWriter.h"

#include <sys/eventfd.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <utility>

namespace desktop {

std::unique_ptr<FrameWriter> FrameWriter::create(size_t frameSize) {
    const int wakeup = eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    if (wakeup == -1) {
        return nullptr;
    }
    int descriptor = -1;
    auto memory = FrameRingMemory::create(frameSize, descriptor);
    if (!memory) {
        const int error = errno;
        close(wakeup);
        errno = error;
        return nullptr;
    }
    auto writer = std::make_unique<FrameWriter>(std::move(memory), wakeup);
    writer->m_memoryDescriptor = descriptor;
    return writer;
}

FrameWriter::FrameWriter(std::shared_ptr<FrameRingMemory> memory, int wakeup)
    : m_memory(std::move(memory)), m_wakeupDescriptor(wakeup) {}

FrameWriter::~FrameWriter() {
    for (const int descriptor : {m_memoryDescriptor, m_wakeupDescriptor}) {
        if (descriptor != -1) {
            close(descriptor);
        }
    }
}

size_t FrameWriter::sizeOf(const telix_desktop_frame& frame) {
    if (!frame.pixels || frame.width > kMaximumFrameSide || frame.height > kMaximumFrameSide) {
        return 0;
    }
    const size_t size = size_t{frame.width} * frame.height * kBytesPerPixel;
    return size <= kMaximumSlotSize ? size : 0;
}

bool FrameWriter::publish(const telix_desktop_frame& frame) {
    const bool isVisible = frame.visible != 0;
    if (isVisible && (sizeOf(frame) == 0 || sizeOf(frame) > m_memory->slotSize())) {
        return false;
    }
    if (isVisible && (!m_hasPixels || frame.serial != m_serial)) {
        copyPixels(frame);
    }
    m_slots[m_own] = m_pixelSlot;
    m_memory->header().descriptions[m_own] = {
        frame.presenter,   frame.serial,       m_pixelSlot,
        frame.width,       frame.height,       frame.width * kBytesPerPixel,
        frame.aspectWidth, frame.aspectHeight, frame.areaX,
        frame.areaY,       frame.areaWidth,    frame.areaHeight,
        frame.fullScreen,  isVisible ? 1U : 0U};
    const uint32_t given = m_memory->header().newest.exchange(m_own | FrameRingHeader::kNew);
    m_own = given % FrameRingHeader::kNew % kSlotCount;
    const uint64_t one = 1;
    // Fails only for a counter that nothing resets, after 2^64 changes.
    [[maybe_unused]] const ssize_t written = write(m_wakeupDescriptor, &one, sizeof one);
    return true;
}

// Into the slot to which neither of the descriptions refers that the reader has or can take.
void FrameWriter::copyPixels(const telix_desktop_frame& frame) {
    uint32_t slot = 0;
    while (slot == m_slots[(m_own + 1) % kSlotCount] || slot == m_slots[(m_own + 2) % kSlotCount]) {
        slot++;
    }
    uint8_t* target = m_memory->slot(slot);
    const size_t lineSize = size_t{frame.width} * kBytesPerPixel;
    if (frame.stride == lineSize) {
        std::memcpy(target, frame.pixels, lineSize * frame.height);
    } else {
        for (size_t line = 0; line < frame.height; ++line) {
            std::memcpy(target + line * lineSize, frame.pixels + line * frame.stride, lineSize);
        }
    }
    m_pixelSlot = slot;
    m_serial = frame.serial;
    m_hasPixels = true;
}

} // namespace desktop
