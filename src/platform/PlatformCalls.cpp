// Slots, binding and forwarders of the platform calls, made from the one list of calls. The slots are written
// while the library is loaded and only read afterwards, so that forwarders may be called from any thread.
#include "src/platform/PlatformCalls.h"

#include "src/platform/PlatformLoader.h"
#include "telix/telix_platform.h"

namespace {

#define TELIX_CALL(name, parameters, arguments) void* slot_##name = nullptr;
#include "telix/telix_platform_calls.h"

} // namespace

int bindPlatformCalls(GModule* module) {
    int bound = 0;
#define TELIX_CALL(name, parameters, arguments) bound |= resolve_symbol(module, #name, &slot_##name);
#define TELIX_CALL_UNBOUND(name, parameters, arguments) // its slot stays empty on purpose
#include "telix/telix_platform_calls.h"
    return bound;
}

#define TELIX_CALL(name, parameters, arguments)                                                              \
    TELIX_RETCODE_ENUM_T name parameters {                                                                   \
        if (should_load_telix_library() == 0 || slot_##name == nullptr) {                                    \
            return TELIX_RETCODE_NOT_AVAILABLE;                                                              \
        }                                                                                                    \
        return reinterpret_cast<decltype(&name)>(slot_##name) arguments;                                     \
    }
#include "telix/telix_platform_calls.h"
