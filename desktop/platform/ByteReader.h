// Reading of numbers, strings and loops from the bytes of a section or a descriptor.
#ifndef TELIX_DESKTOP_PLATFORM_BYTEREADER_H
#define TELIX_DESKTOP_PLATFORM_BYTEREADER_H

#include <cstddef>
#include <cstdint>
#include <string>

#include "desktop/platform/Sections.h"

namespace desktop {

// Reads numbers one after the other; beyond the end every number is 0 and good() is false.
class ByteReader {
public:
    ByteReader(const uint8_t* bytes, size_t length) : m_at(bytes), m_left(length) {}

    unsigned int read8() {
        if (m_left == 0) {
            m_good = false;
            return 0;
        }
        --m_left;
        return *m_at++;
    }
    unsigned int read16() {
        const unsigned int high = read8();
        return high << 8 | read8();
    }
    uint32_t read32() {
        const uint32_t high = read16();
        return high << 16 | read16();
    }
    // The next `length` bytes as a reader of their own.
    ByteReader take(size_t length) {
        if (length > m_left) {
            m_good = false;
            length = m_left;
        }
        ByteReader part(m_at, length);
        m_at += length;
        m_left -= length;
        return part;
    }
    ByteReader takeLoop() { return take(read16() & kLengthMask); }
    std::string takeString() {
        const ByteReader part = take(read8());
        return decodeString(part.m_at, part.m_left);
    }
    std::string takeCode() {
        const ByteReader part = take(kCodeSize);
        return {reinterpret_cast<const char*>(part.m_at), part.m_left};
    }
    Bytes rest() const { return {m_at, m_at + m_left}; }
    size_t left() const { return m_left; }
    bool good() const { return m_good; }

private:
    const uint8_t* m_at;
    size_t m_left;
    bool m_good = true;
};

} // namespace desktop

#endif
