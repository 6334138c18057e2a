// The checks of a platform library, and the means to write one down.
#ifndef TELIX_DESKTOP_CHECKS_H
#define TELIX_DESKTOP_CHECKS_H

#include "desktop/conformance/Library.h"

#include <chrono>
#include <functional>
#include <initializer_list>
#include <string>
#include <utility>
#include <vector>

// Why a check fails, or why it says nothing about this library. Thrown by checks.
struct Failure {
    std::string reason;
};
struct Skip {
    std::string reason;
};

inline void expect(bool isSo, const std::string& otherwise) {
    if (!isSo) {
        throw Failure{otherwise};
    }
}

// A function that a check calls; see NEED.
struct Need {
    const char* name;
    bool isThere;
};
#define NEED(name)                                                                                           \
    Need {                                                                                                   \
#name, m.library.name != nullptr                                                                     \
    }
#define ALL_CALLS(name) #name, m.library.name

enum class Outcome : char { begun = 'B', ok = 'O', failed = 'F', skipped = 'S', unusable = 'X' };

// What checks share. One process makes the checks of one group.
struct Means {
    Library library;
    std::chrono::milliseconds wait; // for a callback that must come
    std::string media;              // a URL that the library can play; empty if none is named
    std::function<void(Outcome outcome, const std::string& text)> report;

    // Makes one check, unless functions are missing. `text` says what holds if it passes.
    void check(const std::string& text, std::initializer_list<Need> needs,
               const std::function<void()>& body) const;

    // Waits until `isSo`, at most as long as for a callback, with the main context running as in a browser.
    bool waitUntil(const std::function<bool()>& isSo) const;

    // Waits for what must not come, and gives whether it did.
    bool comesWithin(std::chrono::milliseconds time, const std::function<bool()>& isSo) const;
};

// Handles that no library has given out.
constexpr uint32_t nonsenseHandles[] = {0, 0xFFFFFFFF, 0x7FFFFFF1};

bool isUtf8(const char* text);

// A text function gives a fresh text of malloc at each call, or refuses and leaves its output null. Gives the
// text.
std::string takeText(const std::string& name, const std::function<TELIX_RETCODE_ENUM_T(char** text)>& call);

// A group of checks with a name; each runs in a process of its own.
struct Group {
    const char* name;
    void (*run)(const Means& m);
};
const std::vector<Group>& groups();

void checkExports(const Means& m);
void checkDevice(const Means& m);
void checkCapabilities(const Means& m);
void checkChannels(const Means& m);
void checkRatings(const Means& m);
void checkObjects(const Means& m);
void checkTuning(const Means& m);
void checkPlayers(const Means& m);
void checkDrm(const Means& m);

// ---- Forms that several functions have

// A function that takes a handle and writes a result refuses nonsense handles and leaves the result alone.
template <typename Value>
void checkRefusal(const Means& m, const char* name, TELIX_RETCODE_ENUM_T (*function)(uint32_t, Value*)) {
    m.check(std::string(name) + " refuses unknown handles and leaves its output alone",
            {{name, function != nullptr}}, [&] {
                for (const uint32_t handle : nonsenseHandles) {
                    Value value{};
                    expect(function(handle, &value) != 0, "handle " + std::to_string(handle) + " is taken");
                    expect(value == Value{}, "handle " + std::to_string(handle) + ": the output has changed");
                }
            });
}

// The same of the properties of a component.
template <typename Value>
void checkRefusal(const Means& m, const char* name,
                  TELIX_RETCODE_ENUM_T (*function)(TELIX_JS_AVCOMPHANDLE, TELIX_JS_AVCOMPTYPE, Value*)) {
    m.check(std::string(name) + " refuses unknown components and leaves its output alone",
            {{name, function != nullptr}}, [&] {
                for (const uint32_t handle : nonsenseHandles) {
                    for (const TELIX_JS_AVCOMPTYPE type : {0U, 1U, 2U, 77U}) {
                        Value value{};
                        expect(function(handle, type, &value) != 0,
                               "component " + std::to_string(handle) + " is taken");
                        expect(value == Value{},
                               "component " + std::to_string(handle) + ": the output has changed");
                    }
                }
            });
}

// A function that takes a handle and further arguments refuses nonsense handles.
template <typename... Parameters, typename... Arguments>
void checkRefusalOf(const Means& m, const char* name,
                    TELIX_RETCODE_ENUM_T (*function)(uint32_t, Parameters...), Arguments... arguments) {
    m.check(std::string(name) + " refuses unknown handles", {{name, function != nullptr}}, [&] {
        for (const uint32_t handle : nonsenseHandles) {
            expect(function(handle, static_cast<Parameters>(arguments)...) != 0,
                   "handle " + std::to_string(handle) + " is taken");
        }
    });
}

// A text that a handle has: a fresh one of malloc.
inline std::string takeText(const char* name, TELIX_RETCODE_ENUM_T (*function)(uint32_t, char**),
                            uint32_t handle) {
    return takeText(std::string(name), [&](char** text) { return function(handle, text); });
}

#endif
