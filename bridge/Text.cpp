// Conversions between the engine's UTF-16 and the plug-in's UTF-8.
#include "bridge/Text.h"

#include <algorithm>
#include <cstdint>

namespace bridge {

namespace {

constexpr char32_t kReplacement = 0xFFFD;
constexpr char32_t kFirstSurrogate = 0xD800;
constexpr char32_t kFirstLowSurrogate = 0xDC00;
constexpr char32_t kAfterSurrogates = 0xE000;
constexpr char32_t kFirstSupplementary = 0x10000;
constexpr char32_t kAfterUnicode = 0x110000;

bool isHighSurrogate(char32_t unit) {
    return unit >= kFirstSurrogate && unit < kFirstLowSurrogate;
}

bool isLowSurrogate(char32_t unit) {
    return unit >= kFirstLowSurrogate && unit < kAfterSurrogates;
}

void appendUtf8(std::string& text, char32_t character) {
    const auto continuation = [&](int shift) {
        text += static_cast<char>(0x80 | ((character >> shift) & 0x3F));
    };
    if (character < 0x80) {
        text += static_cast<char>(character);
    } else if (character < 0x800) {
        text += static_cast<char>(0xC0 | (character >> 6));
        continuation(0);
    } else if (character < kFirstSupplementary) {
        text += static_cast<char>(0xE0 | (character >> 12));
        continuation(6);
        continuation(0);
    } else {
        text += static_cast<char>(0xF0 | (character >> 18));
        continuation(12);
        continuation(6);
        continuation(0);
    }
}

void appendUtf16(std::u16string& text, char32_t character) {
    if (character < kFirstSupplementary) {
        text += static_cast<char16_t>(character);
    } else {
        text += static_cast<char16_t>(kFirstSurrogate + ((character - kFirstSupplementary) >> 10));
        text += static_cast<char16_t>(kFirstLowSurrogate + (character & 0x3FF));
    }
}

// Length of the sequence that a byte begins and the smallest character that needs that length.
struct Lead {
    size_t length;
    char32_t bits;
    char32_t smallest;
};

Lead readLead(uint8_t byte) {
    if ((byte & 0xE0) == 0xC0) {
        return {2, byte & 0x1FU, 0x80};
    }
    if ((byte & 0xF0) == 0xE0) {
        return {3, byte & 0x0FU, 0x800};
    }
    if ((byte & 0xF8) == 0xF0) {
        return {4, byte & 0x07U, kFirstSupplementary};
    }
    return {1, kAfterUnicode, 0};
}

// The character at the start of `text`, and in `length` how many bytes it takes.
char32_t readUtf8(std::string_view text, size_t& length) {
    const Lead lead = readLead(static_cast<uint8_t>(text[0]));
    char32_t character = lead.bits;
    length = 1;
    if (lead.length > text.size()) {
        return kReplacement;
    }
    for (size_t i = 1; i < lead.length; i++) {
        if ((text[i] & 0xC0) != 0x80) {
            return kReplacement;
        }
        character = (character << 6) | (text[i] & 0x3FU);
    }
    if (character < lead.smallest || character >= kAfterUnicode ||
        (character >= kFirstSurrogate && character < kAfterSurrogates)) {
        return kReplacement;
    }
    length = lead.length;
    return character;
}

} // namespace

std::string utf8From(std::u16string_view text) {
    std::string converted;
    converted.reserve(text.size());
    for (size_t i = 0; i < text.size(); i++) {
        char32_t character = text[i];
        if (isHighSurrogate(character) && i + 1 < text.size() && isLowSurrogate(text[i + 1])) {
            i++;
            character =
                kFirstSupplementary + ((character - kFirstSurrogate) << 10) + (text[i] - kFirstLowSurrogate);
        } else if (isHighSurrogate(character) || isLowSurrogate(character)) {
            character = kReplacement;
        }
        appendUtf8(converted, character);
    }
    return converted;
}

std::u16string utf16From(std::string_view text) {
    std::u16string converted;
    converted.reserve(text.size());
    for (size_t i = 0; i < text.size();) {
        const auto isAscii = [](char byte) { return static_cast<uint8_t>(byte) < 0x80; };
        const auto* const start = text.begin() + i;
        const auto* const end = std::find_if_not(start, text.end(), isAscii);
        converted.append(start, end);
        i += static_cast<size_t>(end - start);
        if (i < text.size()) {
            size_t length = 0;
            appendUtf16(converted, readUtf8(text.substr(i), length));
            i += length;
        }
    }
    return converted;
}

} // namespace bridge
