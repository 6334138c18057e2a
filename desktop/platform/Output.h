// How results leave the library: fresh texts, which the plug-in frees, and arrays, which stay the library's.
#ifndef TELIX_DESKTOP_OUTPUT_H
#define TELIX_DESKTOP_OUTPUT_H

#include "desktop/platform/ComponentTraits.h"

#include <cstdlib>
#include <cstring>
#include <optional>
#include <utility>
#include <vector>

namespace desktop {

// Any number but those with a meaning: what a call answers that refuses.
constexpr TELIX_RETCODE_ENUM_T refused = 1;

inline TELIX_RETCODE_ENUM_T resultOf(bool isTaken) {
    return isTaken ? TELIX_RETCODE_SUCCESS : refused;
}

// Gives `text` out in a block of malloc, which passes to the caller.
inline TELIX_RETCODE_ENUM_T giveText(char** out, const std::string& text) {
    auto* copy = static_cast<char*>(std::malloc(text.size() + 1));
    if (!copy) {
        return refused;
    }
    std::memcpy(copy, text.c_str(), text.size() + 1);
    *out = copy;
    return TELIX_RETCODE_SUCCESS;
}

inline TELIX_RETCODE_ENUM_T giveFlag(___UINT8* out, bool flag) {
    *out = flag ? 1 : 0;
    return TELIX_RETCODE_SUCCESS;
}

// Gives an array out, which stays in `kept`. Refuses without one.
inline TELIX_RETCODE_ENUM_T giveComponents(std::vector<TELIX_JS_AVCOMPHANDLE>& kept,
                                           std::optional<std::vector<TELIX_JS_AVCOMPHANDLE>> found,
                                           TELIX_JS_AVCOMPHANDLE** components, uint32_t* count) {
    if (!found) {
        return refused;
    }
    kept = std::move(*found);
    kept.reserve(1); // also an empty array is somewhere
    *components = kept.data();
    *count = static_cast<uint32_t>(kept.size());
    return TELIX_RETCODE_SUCCESS;
}

// Gives out what a component says of itself. Refuses without a component.
inline TELIX_RETCODE_ENUM_T giveTrait(const std::optional<ComponentTraits>& found,
                                      std::string ComponentTraits::*trait, char** out) {
    return found ? giveText(out, (*found).*trait) : refused;
}

inline TELIX_RETCODE_ENUM_T giveTrait(const std::optional<ComponentTraits>& found,
                                      bool ComponentTraits::*trait, ___UINT8* out) {
    return found ? giveFlag(out, (*found).*trait) : refused;
}

// Numbers are asked for until they are given: refuses until something has been decoded.
template <typename Number>
TELIX_RETCODE_ENUM_T giveTrait(const std::optional<ComponentTraits>& found, Number ComponentTraits::*trait,
                               Number* out) {
    if (!found || (*found).*trait <= 0) {
        return refused;
    }
    *out = (*found).*trait;
    return TELIX_RETCODE_SUCCESS;
}

} // namespace desktop

#endif
