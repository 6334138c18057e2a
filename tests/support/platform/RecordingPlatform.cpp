// The recording libtelix.so itself: its exported functions, made from the list of calls.
#include "tests/support/RecordingPlatform.h"

#include <type_traits>

namespace {

std::string describe(const char* text) {
    return text == nullptr ? "null" : '"' + std::string(text) + '"';
}

std::string describe(const TELIX_JS_DISPLAY_AREA* area) {
    return area == nullptr ? "null"
                           : '{' + std::to_string(area->x) + ',' + std::to_string(area->y) + ',' +
                                 std::to_string(area->width) + ',' + std::to_string(area->height) + '}';
}

std::string describe(const ___UINT8* bytes, uint32_t length) {
    if (bytes == nullptr) {
        return "null";
    }
    constexpr const char* digits = "0123456789abcdef";
    std::string text = "<";
    for (uint32_t index = 0; index < length; ++index) {
        text += {digits[bytes[index] >> 4], digits[bytes[index] & 15]};
    }
    return text + '>';
}

template <class Value>
std::string describe(Value value) {
    if constexpr (std::is_pointer_v<Value>) {
        constexpr bool isFunction = std::is_function_v<std::remove_pointer_t<Value>>;
        return value == nullptr ? "null" : isFunction ? "callback" : "out";
    } else {
        return std::to_string(value);
    }
}

std::string list() {
    return "";
}

template <class First, class... Rest>
std::string list(First first, Rest... rest) {
    return describe(first) + (sizeof...(rest) > 0 ? ", " : "") + list(rest...);
}

// Bytes are read by the length that follows them.
template <class First, class Second, class... Rest>
std::string list(First first, Second second, const ___UINT8* bytes, uint32_t length, Rest... rest) {
    return describe(first) + ", " + describe(second) + ", " + describe(bytes, length) + ", " +
           list(length, rest...);
}

template <class Signature>
struct Recorder;
template <class... Arguments>
struct Recorder<TELIX_RETCODE_ENUM_T(Arguments...)> {
    const char* name;
    ScriptedCall<TELIX_RETCODE_ENUM_T(Arguments...)>& call;

    TELIX_RETCODE_ENUM_T operator()(Arguments... arguments) const {
        RecordingPlatform* platform = telix_recording_platform();
        platform->record(call, std::string(name) + '(' + list(arguments...) + ')');
        auto function = call.current();
        return *function ? (*function)(arguments...) : platform->defaultResult.load();
    }
};

} // namespace

RecordingPlatform* telix_recording_platform() {
    static auto* platform = new RecordingPlatform; // kept: detached threads may call to the very end
    return platform;
}

#define TELIX_CALL(name, parameters, arguments)                                                              \
    TELIX_RETCODE_ENUM_T name parameters {                                                                   \
        return Recorder<TELIX_RETCODE_ENUM_T parameters>{#name, telix_recording_platform()->name} arguments; \
    }
#include "telix/telix_platform_calls.h"
