#include "desktop/conformance/CheckContext.h"

#include <cstdlib>
#include <glib.h>

namespace desktop {

namespace {

constexpr gulong kPollInterval = 5000; // microseconds

} // namespace

void CheckContext::run(const Check& check) const {
    for (const RequiredCall& required : check.requiredCalls) {
        if (!required.isPresent(library)) {
            report(CheckEvent::Skipped, check.claim + ": the library has no " + required.name);
            return;
        }
    }
    report(CheckEvent::Started, check.claim);
    try {
        check.run(*this);
        report(CheckEvent::Passed, check.claim);
    } catch (const CheckFailure& failure) {
        report(CheckEvent::Failed, check.claim + ": " + failure.reason);
    } catch (const CheckSkipped& skipped) {
        report(CheckEvent::Skipped, check.claim + ": " + skipped.reason);
    }
}

bool CheckContext::waitUntil(const std::function<bool()>& condition) const {
    return happensWithin(callbackTimeout, condition);
}

bool CheckContext::happensWithin(std::chrono::milliseconds time,
                                 const std::function<bool()>& condition) const {
    const auto end = std::chrono::steady_clock::now() + time;
    while (!condition()) {
        if (std::chrono::steady_clock::now() > end) {
            return false;
        }
        while (g_main_context_iteration(nullptr, FALSE)) {
        }
        g_usleep(kPollInterval);
    }
    return true;
}

bool isUtf8(const char* string) {
    return g_utf8_validate(string, -1, nullptr) != FALSE;
}

std::string checkedString(const std::string& name,
                          const std::function<TELIX_RETCODE_ENUM_T(char** string)>& call) {
    char* first = nullptr;
    char* second = nullptr;
    if (call(&first) != 0) {
        expect(first == nullptr, name + " refuses, but changes its output");
        return "";
    }
    const bool isRepeated = call(&second) == 0;
    std::string string = first ? first : "";
    const bool isDistinct = !isRepeated || !first || first != second;
    if (isDistinct) { // or the second free would crash before the failure is reported
        std::free(first);
        std::free(second);
    }
    expect(isDistinct, name + " returns the same block twice");
    expect(isUtf8(string.c_str()), name + " returns invalid UTF-8");
    return string;
}

void checkStringOf(const char* name, TELIX_RETCODE_ENUM_T (*function)(uint32_t, char**), uint32_t handle) {
    if (function) {
        checkedString(name, [&](char** string) { return function(handle, string); });
    }
}

Check optionalNumber(const char* name, TELIX_RETCODE_ENUM_T (*Library::*call)(uint32_t*)) {
    const RequiredCall required{name, [call](const Library& library) { return library.*call != nullptr; }};
    return {std::string(name) + " returns a number, or refuses and leaves its output unchanged",
            {required},
            [call](const CheckContext& context) {
                uint32_t value = 0;
                const bool isAccepted = (context.library.*call)(&value) == 0;
                expect(isAccepted || value == 0, "it refuses, but changes its output");
            }};
}

} // namespace desktop
