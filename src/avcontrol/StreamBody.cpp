// Gathering the bytes of a stream.
#include "src/avcontrol/StreamBody.h"

#include <cstdlib>
#include <cstring>
#include <utility>

void StreamBody::append(std::string_view bytes) {
    if (m_isGivenUp || bytes.empty()) {
        return;
    }
    void* grown = nullptr;
    if (bytes.size() <= m_longest - m_size) {
        grown = std::realloc(m_block.get(), static_cast<size_t>(m_size) + bytes.size() + 1);
    }
    if (!grown) {
        m_block.reset();
        m_size = 0;
        m_isGivenUp = true;
        return;
    }
    static_cast<void>(m_block.release()); // realloc has taken it
    m_block.reset(static_cast<char*>(grown));
    std::memcpy(m_block.get() + m_size, bytes.data(), bytes.size());
    m_size += static_cast<uint32_t>(bytes.size());
    m_block.get()[m_size] = '\0';
}

AsxText StreamBody::take() {
    m_size = 0;
    m_isGivenUp = false;
    return std::move(m_block);
}
