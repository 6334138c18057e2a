// The reading side of a frame ring, in the process of the window.
#ifndef TELIX_DESKTOP_WINDOW_FRAMES_FRAMEREADER_H
#define TELIX_DESKTOP_WINDOW_FRAMES_FRAMEREADER_H

#include <memory>
#include <string>

#include "desktop/platform/telix_picture.h"
#include "desktop/window/frames/FrameRing.h"

namespace desktop {

// One thread only. The writer may be hostile: whatever it does with the memory and the descriptors, the
// reader neither reads outside of the mapping nor waits; it may show wrong pixels.
class FrameReader {
public:
    // Takes both descriptors, also on failure: null, and in `error` the reason.
    static std::unique_ptr<FrameReader> open(int memory, int wakeup, std::string& error);
    // On a mapping that the caller has already, without a wake-up.
    explicit FrameReader(std::shared_ptr<FrameRingMemory> memory);
    ~FrameReader();
    FrameReader(const FrameReader&) = delete;
    FrameReader& operator=(const FrameReader&) = delete;

    // Readable when something has been published since the last refresh(); to be watched, not to be read.
    int pollDescriptor() const { return m_pollDescriptor; }

    // Takes the newest frame. Returns whether anything is new. A frame whose description is wrong is taken as
    // one that is not visible.
    bool refresh();

    // The frame of the last refresh(), in the ring itself; its pixels stay until the next refresh(). `owner`
    // is null. Not visible before the first frame.
    const telix_desktop_frame& frame() const { return m_frame; }

private:
    void show(const FrameDescription& description);

    std::shared_ptr<FrameRingMemory> m_memory;
    int m_wakeupDescriptor = -1;
    int m_pollDescriptor = -1;
    uint32_t m_own = FrameRingHeader::kFirstOfReader; // the description that is the reader's
    telix_desktop_frame m_frame{};
};

} // namespace desktop

#endif
