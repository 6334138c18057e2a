// What a check is, and what it runs with.
#ifndef TELIX_DESKTOP_CONFORMANCE_CHECKCONTEXT_H
#define TELIX_DESKTOP_CONFORMANCE_CHECKCONTEXT_H

#include <chrono>
#include <functional>
#include <string>
#include <utility>
#include <vector>

#include "desktop/conformance/Library.h"

namespace desktop {

// Thrown by checks: why the library fails the check, or why the check cannot be made.
struct CheckFailure {
    std::string reason;
};
struct CheckSkipped {
    std::string reason;
};

inline void expect(bool condition, const std::string& otherwise) {
    if (!condition) {
        throw CheckFailure{otherwise};
    }
}

// A function that a check calls without looking whether it exists.
struct RequiredCall {
    const char* name;
    std::function<bool(const Library& library)> isPresent;
};
#define REQUIRED_CALL(name)                                                                                  \
    desktop::RequiredCall {                                                                                  \
#name, [](const desktop::Library& library) { return library.name != nullptr; }                       \
    }

// The first two arguments of the functions below that make a check of one function.
#define NAMED_CALL(name) #name, &desktop::Library::name

struct CheckContext;

struct Check {
    std::string claim; // what holds if the check passes
    std::vector<RequiredCall> requiredCalls;
    std::function<void(const CheckContext& context)> run;
};

// How a check goes; the values are sent between processes. `Started` precedes one of the outcomes.
enum class CheckEvent : char { Started = 'S', Passed = 'P', Failed = 'F', Skipped = 'K', NoLibrary = 'N' };

struct CheckContext {
    Library library;
    std::chrono::milliseconds callbackTimeout{0};
    std::string media; // a URL that the library can play; empty if none is given
    std::function<void(CheckEvent event, const std::string& message)> report;

    // Makes one check, unless functions are missing, and reports it.
    void run(const Check& check) const;

    // Waits until `condition` holds, at most for the callback timeout. The main context runs meanwhile, as it
    // does in a browser.
    bool waitUntil(const std::function<bool()>& condition) const;

    // Waits for something that must not happen. Returns whether it has happened.
    bool happensWithin(std::chrono::milliseconds time, const std::function<bool()>& condition) const;
};

// Handles that no library has given out.
constexpr uint32_t kUnknownHandles[] = {0, 0xFFFFFFFF, 0x7FFFFFF1};

// Component types of which the last is unknown.
constexpr TELIX_JS_AVCOMPTYPE kComponentTypes[] = {TELIX_JS_AVCOMPTYPE_VIDEO, TELIX_JS_AVCOMPTYPE_AUDIO,
                                                   TELIX_JS_AVCOMPTYPE_SUBTITLE, 77};

// Requests have to return without waiting for their outcome.
constexpr std::chrono::milliseconds kMaxRequestDuration{2000};

// Observation time for callbacks that must not be called.
constexpr std::chrono::milliseconds kQuietPeriod{500};

bool isUtf8(const char* string);

// Checks that a function with a string output allocates a new string with malloc at each call, or refuses and
// leaves the output null. Returns the string.
std::string checkedString(const std::string& name,
                          const std::function<TELIX_RETCODE_ENUM_T(char** string)>& call);

// The same with a property of a handle. A function that the library lacks is not checked.
void checkStringOf(const char* name, TELIX_RETCODE_ENUM_T (*function)(uint32_t, char**), uint32_t handle);

// ---- Checks that many functions have in common

// A function with a handle and an output refuses unknown handles and leaves the output unchanged.
template <typename Value>
Check refusalWithOutput(const char* name, TELIX_RETCODE_ENUM_T (*Library::*call)(uint32_t, Value*)) {
    const RequiredCall required{name, [call](const Library& library) { return library.*call != nullptr; }};
    return {std::string(name) + " refuses unknown handles and leaves its output unchanged",
            {required},
            [call](const CheckContext& context) {
                for (const uint32_t handle : kUnknownHandles) {
                    Value value{};
                    const std::string subject = "handle " + std::to_string(handle);
                    expect((context.library.*call)(handle, &value) != 0, subject + " is accepted");
                    expect(value == Value{}, subject + " changes the output");
                }
            }};
}

// The same with a property of a component.
template <typename Value>
Check refusalWithOutput(const char* name,
                        TELIX_RETCODE_ENUM_T (*Library::*call)(TELIX_JS_AVCOMPHANDLE, TELIX_JS_AVCOMPTYPE,
                                                               Value*)) {
    const RequiredCall required{name, [call](const Library& library) { return library.*call != nullptr; }};
    return {std::string(name) + " refuses unknown components and leaves its output unchanged",
            {required},
            [call](const CheckContext& context) {
                for (const uint32_t handle : kUnknownHandles) {
                    for (const TELIX_JS_AVCOMPTYPE type : kComponentTypes) {
                        Value value{};
                        const std::string subject = "component " + std::to_string(handle);
                        expect((context.library.*call)(handle, type, &value) != 0, subject + " is accepted");
                        expect(value == Value{}, subject + " changes the output");
                    }
                }
            }};
}

// A function with a handle and further arguments refuses unknown handles.
template <typename... Parameters, typename... Arguments>
Check refusal(const char* name, TELIX_RETCODE_ENUM_T (*Library::*call)(uint32_t, Parameters...),
              Arguments... arguments) {
    const RequiredCall required{name, [call](const Library& library) { return library.*call != nullptr; }};
    return {std::string(name) + " refuses unknown handles",
            {required},
            [call, arguments...](const CheckContext& context) {
                for (const uint32_t handle : kUnknownHandles) {
                    expect((context.library.*call)(handle, static_cast<Parameters>(arguments)...) != 0,
                           "handle " + std::to_string(handle) + " is accepted");
                }
            }};
}

// A function with an output alone writes it, or refuses and leaves it unchanged.
Check optionalNumber(const char* name, TELIX_RETCODE_ENUM_T (*Library::*call)(uint32_t*));

} // namespace desktop

#endif
