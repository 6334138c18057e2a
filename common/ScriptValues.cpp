// Strings for script.
#include "common/ScriptValues.h"

#include <cstdint>
#include <cstring>

#include "common/BrowserGates.h"

bool setText(NPVariant& result, const char* text, size_t length) {
    if (length > UINT32_MAX) {
        return false; // the browser counts in 32 bits
    }
    auto* copy = static_cast<char*>(NPN_MemAlloc(static_cast<uint32_t>(length)));
    if (!copy) {
        return false;
    }
    std::memcpy(copy, text, length);
    result.type = NPVariantType_String;
    result.value.stringValue = {copy, static_cast<uint32_t>(length)};
    return true;
}

// quirk 3: an empty string reads as null.
void setResult(NPVariant& result, const std::string& text) {
    if (text.empty() || !setText(result, text.data(), text.size())) {
        setNull(result);
    }
}

void setDuplicatedText(NPVariant& result, const std::string& text) {
    char* copy = strdup(text.c_str());
    if (!copy) {
        setNull(result);
        return;
    }
    result.type = NPVariantType_String;
    result.value.stringValue = {copy, static_cast<uint32_t>(std::strlen(copy))};
}
