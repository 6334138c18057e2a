// How results leave the library: fresh texts, which the plug-in frees, and arrays, which stay the library's.
#ifndef TELIX_DESKTOP_OUTPUT_H
#define TELIX_DESKTOP_OUTPUT_H

#include "telix/telix_platform.h"

#include <cstdlib>
#include <cstring>
#include <string>

namespace desktop {

// Any number but those with a meaning: what a call answers that refuses.
constexpr TELIX_RETCODE_ENUM_T refused = 1;

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

} // namespace desktop

#endif
