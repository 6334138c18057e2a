// What an A/V control gathers of a stream: the bytes one after another in one block of the C heap, which is
// all the memory that they take. Browser thread only.
#ifndef TELIX_SRC_AVCONTROL_STREAMBODY_H
#define TELIX_SRC_AVCONTROL_STREAMBODY_H

#include <cstdint>
#include <string_view>

#include "src/avcontrol/Asx.h"

class StreamBody {
public:
    // A body and its terminating zero, counted in 32 bits.
    static constexpr uint32_t kLongest = UINT32_MAX - 1;

    explicit StreamBody(uint32_t longest = kLongest) : m_longest(longest) {}

    // Without memory for them, or if the body would grow too long, the bytes before are given up as well, and
    // so are all that follow.
    void append(std::string_view bytes);

    uint32_t size() const { return m_size; }

    // Hands the body over, with a zero after it; null if there is none. The next body begins empty.
    AsxText take();

private:
    const uint32_t m_longest;
    AsxText m_block; // zero-terminated
    uint32_t m_size = 0;
    bool m_isGivenUp = false;
};

#endif
