// Cutting of UTF-8 strings to a size.
#ifndef TELIX_DESKTOP_PLATFORM_UTF8_H
#define TELIX_DESKTOP_PLATFORM_UTF8_H

#include <cstddef>
#include <cstdint>
#include <string>

namespace desktop {

// The longest start of a UTF-8 string of at most `maxSize` bytes that ends between characters.
inline std::string truncateUtf8(const std::string& string, size_t maxSize) {
    if (string.size() <= maxSize) {
        return string;
    }
    const auto isInsideCharacter = [&](size_t at) {
        return (static_cast<uint8_t>(string[at]) & 0xC0) == 0x80;
    };
    while (maxSize > 0 && isInsideCharacter(maxSize)) {
        --maxSize;
    }
    return string.substr(0, maxSize);
}

} // namespace desktop

#endif
