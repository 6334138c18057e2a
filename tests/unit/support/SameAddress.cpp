// `new` and the sized `delete` of this program's objects ask here first (Heap.cpp).
#include "tests/unit/support/SameAddress.h"

#include <gtest/gtest.h>

void* reallyAllocate(size_t size) __asm__("__real__Znw" TELIX_SIZE_LETTER);
void reallyRelease(void* block, size_t size) noexcept __asm__("__real__ZdlPv" TELIX_SIZE_LETTER);

namespace {

thread_local SameAddress* t_current = nullptr;

} // namespace

SameAddress::SameAddress(size_t size) : m_size(size), m_block(reallyAllocate(size)) {
    EXPECT_EQ(t_current, nullptr) << "one at a time";
    t_current = this;
}

// An object that still stands there is released as any other.
SameAddress::~SameAddress() {
    t_current = nullptr;
    if (!m_isTaken) {
        reallyRelease(m_block, m_size);
    }
}

void* SameAddress::take(size_t size) {
    if (!t_current || t_current->m_size != size || t_current->m_isTaken) {
        return nullptr;
    }
    t_current->m_isTaken = true;
    return t_current->m_block;
}

bool SameAddress::giveBack(void* block) {
    if (!t_current || t_current->m_block != block || !block) {
        return false;
    }
    t_current->m_isTaken = false;
    return true;
}
