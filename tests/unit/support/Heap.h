// The heap of this executable: how much of what the plug-in has taken is still there, and a heap that gives
// no more. The functions of the C and C++ heap that the plug-in's and the tests' objects call come here
// first.
#ifndef TELIX_TESTS_UNIT_SUPPORT_HEAP_H
#define TELIX_TESTS_UNIT_SUPPORT_HEAP_H

#include <cstddef>
#include <functional>
#include <map>

// Counts blocks from their allocation to their release, and releases at its end those that are left. One at a
// time. Any thread.
class HeapWatch {
public:
    HeapWatch();
    HeapWatch(const HeapWatch&) = delete;
    HeapWatch& operator=(const HeapWatch&) = delete;
    ~HeapWatch();

    // Runs the function. What it takes of the heap on this thread counts until somebody releases it, on
    // whatever thread.
    void during(const std::function<void()>& function);
    // How many blocks count at present.
    size_t left() const;

    // What the functions of the heap do with a block.
    using Release = void (*)(void* block);
    static void taken(void* block, Release release);
    static void released(void* block);

private:
    std::map<void*, Release> m_blocks;
};

// While it lives, malloc(), realloc(), strdup() and the `new` that may fail give this thread null: the first
// `after` calls pass, the next `times` fail. The other `new` goes on.
class MemoryShortage {
public:
    explicit MemoryShortage(unsigned times = ~0U, unsigned after = 0);
    MemoryShortage(const MemoryShortage&) = delete;
    MemoryShortage& operator=(const MemoryShortage&) = delete;
    ~MemoryShortage();
};

#endif
