// An allocator may make a new object where the one before it was destroyed. This makes certain of it.
#ifndef TELIX_TESTS_UNIT_SUPPORT_SAMEADDRESS_H
#define TELIX_TESTS_UNIT_SUPPORT_SAMEADDRESS_H

#include <cstddef>

// While it lives, objects of `size` bytes that this thread makes with `new` stand at one and the same
// address, one after the other. One at a time.
class SameAddress {
public:
    explicit SameAddress(size_t size);
    SameAddress(const SameAddress&) = delete;
    SameAddress& operator=(const SameAddress&) = delete;
    ~SameAddress();

    void* address() const { return m_block; }

    // What `new` and `delete` do first: null and false if the block is not concerned.
    static void* take(size_t size);
    static bool giveBack(void* block);

private:
    const size_t m_size;
    void* const m_block;
    bool m_isTaken = false;
};

#endif
