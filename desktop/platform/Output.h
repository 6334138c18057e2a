// How results leave the library: return codes, flags, and new strings, which the plug-in frees.
#ifndef TELIX_DESKTOP_PLATFORM_OUTPUT_H
#define TELIX_DESKTOP_PLATFORM_OUTPUT_H

#include <cstdlib>
#include <cstring>
#include <string>

#include "telix/telix_platform.h"

namespace desktop {

// The return code of a call that refuses: any value without a meaning of its own.
constexpr TELIX_RETCODE_ENUM_T kRefused = 1;

inline TELIX_RETCODE_ENUM_T resultOf(bool isAccepted) {
    return isAccepted ? TELIX_RETCODE_SUCCESS : kRefused;
}

// Returns a copy of `string` in memory of malloc; the caller owns it.
inline TELIX_RETCODE_ENUM_T returnString(char** out, const std::string& string) {
    auto* copy = static_cast<char*>(std::malloc(string.size() + 1));
    if (!copy) {
        return kRefused;
    }
    std::memcpy(copy, string.c_str(), string.size() + 1);
    *out = copy;
    return TELIX_RETCODE_SUCCESS;
}

inline TELIX_RETCODE_ENUM_T returnFlag(___UINT8* out, bool flag) {
    *out = flag ? 1 : 0;
    return TELIX_RETCODE_SUCCESS;
}

} // namespace desktop

#endif
