// Fuzz target of the conversions between UTF-8 and UTF-16: those of the bridge, compared with GLib's where
// the input is valid, and that of the plug-in.
#include <glib.h>

#include <algorithm>
#include <cassert>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

#include "bridge/Text.h"
#include "common/PluginUtils.h"
#include "desktop/platform/Utf8.h"

namespace {

bool isUtf8(const std::string& text) {
    // g_utf8_validate refuses zeros, which both conversions keep.
    size_t at = 0;
    while (at < text.size()) {
        const size_t end = std::min(text.find('\0', at), text.size());
        if (!g_utf8_validate(text.data() + at, static_cast<gssize>(end - at), nullptr)) {
            return false;
        }
        at = end + 1;
    }
    return true;
}

void checkFromUtf8(const std::string& text) {
    const std::u16string units = bridge::utf16From(text);
    const std::string back = bridge::utf8From(units);
    assert(isUtf8(back) && (back == text) == isUtf8(text));
    assert(bridge::utf16From(back) == units);
}

void checkFromUtf16(const std::u16string& units) {
    const std::string text = bridge::utf8From(units);
    assert(isUtf8(text));
    // Only lone surrogates change, and each of them becomes one other unit.
    assert(bridge::utf16From(text).size() == units.size());
}

void checkPlugin(const std::string& text) {
    std::vector<unsigned short> units(text.size() + 1);
    for (const int strict : {0, 1}) {
        const char* source = text.data();
        unsigned short* target = units.data();
        const ConversionResult result =
            convUTF8ToUTF16(&source, source + text.size(), &target, target + text.size(), strict);
        assert(source <= text.data() + text.size() && target <= units.data() + text.size());
        assert(result != conversionOK || source == text.data() + text.size());
    }
    unsigned int length = 0;
    const NPString string{text.data(), static_cast<uint32_t>(text.size())};
    if (unsigned char* bytes = utf8ToUtf16Converter(string, &length)) {
        assert(bytes[length] == 0);
        std::free(bytes);
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    checkFromUtf8(text);
    std::u16string units;
    for (size_t at = 0; at + 1 < size; at += 2) {
        units.push_back(static_cast<char16_t>(data[at] << 8 | data[at + 1]));
    }
    checkFromUtf16(units);
    checkPlugin(text);
    const size_t limit = size ? data[0] : 0;
    assert(desktop::truncateUtf8(text, limit).size() <= limit);
    return 0;
}
