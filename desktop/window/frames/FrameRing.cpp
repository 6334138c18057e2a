// The memory of a frame ring.
#include "desktop/window/frames/FrameRing.h"

#include <fcntl.h>
#include <linux/magic.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <sys/statfs.h>
#include <unistd.h>

#include <cerrno>
#include <new>

namespace desktop {

namespace {

constexpr size_t kHeaderSize = 4096;
constexpr size_t kSlotAlignment = 4096;
constexpr int kSeals = F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_SEAL;
static_assert(sizeof(FrameRingHeader) <= kHeaderSize);

void* mapMemory(int descriptor, size_t slotSize) {
    return mmap(nullptr, kHeaderSize + kSlotCount * slotSize, PROT_READ | PROT_WRITE, MAP_SHARED, descriptor,
                0);
}

// Of the memory behind a descriptor from another process; 0, with a reason, if it is not that of a ring.
size_t slotSizeOf(int descriptor, const char*& reason) {
    struct stat status {};
    struct statfs system {};
    if (fstat(descriptor, &status) != 0 || fstatfs(descriptor, &system) != 0) {
        reason = "no descriptor";
        return 0;
    }
    // Other memory ends this process when it is read: a file that shrinks, huge pages that have run out.
    const int seals = fcntl(descriptor, F_GET_SEALS);
    if (seals == -1 || (seals & kSeals) != kSeals || system.f_type != TMPFS_MAGIC) {
        reason = "not sealed memory";
        return 0;
    }
    const auto size = static_cast<uint64_t>(status.st_size);
    const uint64_t slotSize = size > kHeaderSize ? (size - kHeaderSize) / kSlotCount : 0;
    if (slotSize == 0 || slotSize > kMaximumSlotSize || slotSize % kSlotAlignment != 0 ||
        size != kHeaderSize + kSlotCount * slotSize) {
        reason = "not of the size of a frame ring";
        return 0;
    }
    return slotSize;
}

} // namespace

std::shared_ptr<FrameRingMemory> FrameRingMemory::create(size_t slotSize, int& descriptor) {
    if (slotSize == 0 || slotSize > kMaximumSlotSize) {
        errno = EINVAL;
        return nullptr;
    }
    slotSize = (slotSize + kSlotAlignment - 1) / kSlotAlignment * kSlotAlignment;
    const int memory = memfd_create("telix-frames", MFD_CLOEXEC | MFD_ALLOW_SEALING);
    if (memory == -1) {
        return nullptr;
    }
    void* address = MAP_FAILED;
    if (ftruncate(memory, static_cast<off_t>(kHeaderSize + kSlotCount * slotSize)) == 0 &&
        fcntl(memory, F_ADD_SEALS, kSeals) == 0) {
        address = mapMemory(memory, slotSize);
    }
    if (address == MAP_FAILED) {
        const int error = errno;
        close(memory);
        errno = error;
        return nullptr;
    }
    auto* header = new (address) FrameRingHeader{};
    header->magic = FrameRingHeader::kMagic;
    header->newest.store(FrameRingHeader::kFirstNewest, std::memory_order_relaxed);
    descriptor = memory;
    return std::shared_ptr<FrameRingMemory>(new FrameRingMemory(address, slotSize));
}

std::shared_ptr<FrameRingMemory> FrameRingMemory::map(int descriptor, const char*& reason) {
    const size_t slotSize = slotSizeOf(descriptor, reason);
    if (slotSize == 0) {
        return nullptr;
    }
    void* const address = mapMemory(descriptor, slotSize);
    if (address == MAP_FAILED) {
        reason = "cannot be mapped";
        return nullptr;
    }
    std::shared_ptr<FrameRingMemory> memory(new FrameRingMemory(address, slotSize));
    if (memory->header().magic != FrameRingHeader::kMagic) {
        reason = "not a frame ring";
        return nullptr;
    }
    return memory;
}

FrameRingMemory::~FrameRingMemory() {
    munmap(m_address, kHeaderSize + kSlotCount * m_slotSize);
}

uint8_t* FrameRingMemory::slot(uint32_t number) const {
    return static_cast<uint8_t*>(m_address) + kHeaderSize + number * m_slotSize;
}

} // namespace desktop
