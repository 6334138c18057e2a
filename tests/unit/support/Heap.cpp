// The linker leads the heap's functions here (tests/unit/CMakeLists.txt), and the names "__real_..." to the
// ones that a sanitizer may have put in place.
#include "tests/unit/support/Heap.h"

#include <atomic>
#include <mutex>
#include <new>
#include <utility>

#include <gtest/gtest.h>

#include "tests/unit/support/SameAddress.h"

void* reallyMalloc(size_t size) __asm__("__real_malloc");
void* reallyRealloc(void* block, size_t size) __asm__("__real_realloc");
char* reallyStrdup(const char* text) __asm__("__real_strdup");
void reallyFree(void* block) __asm__("__real_free");
void* reallyNew(size_t size) __asm__("__real__Znw" TELIX_SIZE_LETTER);
void* reallyNewOrNull(size_t size,
                      const std::nothrow_t& tag) __asm__("__real__Znw" TELIX_SIZE_LETTER "RKSt9nothrow_t");
void reallyDelete(void* block) noexcept __asm__("__real__ZdlPv");
void reallyDeleteSized(void* block, size_t size) noexcept __asm__("__real__ZdlPv" TELIX_SIZE_LETTER);

namespace {

// A thread that has ended for the test may still release what is its own while the watch ends, so the lock
// outlives it.
std::mutex s_mutex;
std::atomic<HeapWatch*> s_watch{nullptr};
thread_local HeapWatch* t_watch = nullptr; // of the call that this thread is in
thread_local bool t_isCounting = false;    // what the watch itself takes doesn't count
// The calls of this thread that pass, and those after them that fail.
thread_local unsigned t_passing = 0;
thread_local unsigned t_failing = 0;

// While the watch is at work on its own blocks.
class Counting {
public:
    Counting() : m_before(std::exchange(t_isCounting, true)) {}
    Counting(const Counting&) = delete;
    Counting& operator=(const Counting&) = delete;
    ~Counting() { t_isCounting = m_before; }

private:
    const bool m_before;
};

bool isShort() {
    if (t_failing == 0) {
        return false;
    }
    if (t_passing > 0) {
        --t_passing;
        return false;
    }
    --t_failing;
    return true;
}

void* counted(void* block, HeapWatch::Release release) {
    HeapWatch::taken(block, release);
    return block;
}

} // namespace

HeapWatch::HeapWatch() {
    EXPECT_EQ(s_watch.exchange(this), nullptr) << "one at a time";
}

HeapWatch::~HeapWatch() {
    const std::lock_guard<std::mutex> lock(s_mutex);
    s_watch = nullptr;
    for (const auto& [block, release] : m_blocks) {
        release(block);
    }
}

void HeapWatch::during(const std::function<void()>& function) {
    HeapWatch* const before = std::exchange(t_watch, this);
    function();
    t_watch = before;
}

size_t HeapWatch::left() const {
    const std::lock_guard<std::mutex> lock(s_mutex);
    return m_blocks.size();
}

void HeapWatch::taken(void* block, Release release) {
    if (block && t_watch && !t_isCounting) {
        const Counting own;
        const std::lock_guard<std::mutex> lock(s_mutex);
        t_watch->m_blocks[block] = release;
    }
}

void HeapWatch::released(void* block) {
    if (block && s_watch && !t_isCounting) {
        const Counting own;
        const std::lock_guard<std::mutex> lock(s_mutex);
        if (HeapWatch* const watch = s_watch) {
            watch->m_blocks.erase(block);
        }
    }
}

MemoryShortage::MemoryShortage(unsigned times, unsigned after) {
    t_passing = after;
    t_failing = times;
}

MemoryShortage::~MemoryShortage() {
    t_failing = 0;
}

void* mallocHere(size_t size) __asm__("__wrap_malloc");
void* mallocHere(size_t size) {
    return isShort() ? nullptr : counted(reallyMalloc(size), reallyFree);
}

void* reallocHere(void* block, size_t size) __asm__("__wrap_realloc");
void* reallocHere(void* block, size_t size) {
    if (isShort()) {
        return nullptr;
    }
    HeapWatch::released(block);
    return counted(reallyRealloc(block, size), reallyFree);
}

char* strdupHere(const char* text) __asm__("__wrap_strdup");
char* strdupHere(const char* text) {
    return isShort() ? nullptr : static_cast<char*>(counted(reallyStrdup(text), reallyFree));
}

void freeHere(void* block) __asm__("__wrap_free");
void freeHere(void* block) {
    HeapWatch::released(block);
    reallyFree(block);
}

void* newHere(size_t size) __asm__("__wrap__Znw" TELIX_SIZE_LETTER);
void* newHere(size_t size) {
    void* const block = SameAddress::take(size);
    return block ? block : counted(reallyNew(size), reallyDelete);
}

void* newOrNullHere(size_t size,
                    const std::nothrow_t& tag) __asm__("__wrap__Znw" TELIX_SIZE_LETTER "RKSt9nothrow_t");
void* newOrNullHere(size_t size, const std::nothrow_t& tag) {
    return isShort() ? nullptr : counted(reallyNewOrNull(size, tag), reallyDelete);
}

void deleteHere(void* block) noexcept __asm__("__wrap__ZdlPv");
void deleteHere(void* block) noexcept {
    HeapWatch::released(block);
    reallyDelete(block);
}

void deleteSizedHere(void* block, size_t size) noexcept __asm__("__wrap__ZdlPv" TELIX_SIZE_LETTER);
void deleteSizedHere(void* block, size_t size) noexcept {
    if (!SameAddress::giveBack(block)) {
        HeapWatch::released(block);
        reallyDeleteSized(block, size);
    }
}
