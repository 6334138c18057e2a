// What all checks are made with.
#include "desktop/conformance/Checks.h"

#include <cstdlib>
#include <glib.h>

void Means::check(const std::string& text, std::initializer_list<Need> needs,
                  const std::function<void()>& body) const {
    for (const Need& need : needs) {
        if (!need.isThere) {
            report(Outcome::skipped, text + ": there is no " + need.name);
            return;
        }
    }
    report(Outcome::begun, text);
    try {
        body();
        report(Outcome::ok, text);
    } catch (const Failure& failure) {
        report(Outcome::failed, text + ": " + failure.reason);
    } catch (const Skip& skip) {
        report(Outcome::skipped, text + ": " + skip.reason);
    }
}

bool Means::waitUntil(const std::function<bool()>& isSo) const {
    return comesWithin(wait, isSo);
}

bool Means::comesWithin(std::chrono::milliseconds time, const std::function<bool()>& isSo) const {
    const auto end = std::chrono::steady_clock::now() + time;
    while (!isSo()) {
        if (std::chrono::steady_clock::now() > end) {
            return false;
        }
        while (g_main_context_iteration(nullptr, FALSE)) {
        }
        g_usleep(5000);
    }
    return true;
}

bool isUtf8(const char* text) {
    return g_utf8_validate(text, -1, nullptr) != FALSE;
}

std::string takeText(const std::string& name, const std::function<TELIX_RETCODE_ENUM_T(char** text)>& call) {
    char* first = nullptr;
    char* second = nullptr;
    if (call(&first) != 0) {
        expect(first == nullptr, name + " refuses and has changed its output");
        return "";
    }
    const bool isAgain = call(&second) == 0;
    std::string text = first ? first : "";
    const bool isGood = isUtf8(text.c_str());
    const bool isFresh = !isAgain || !first || first != second;
    if (isFresh) {
        std::free(first);
        std::free(second);
    }
    expect(isFresh, name + " gives the same block twice");
    expect(isGood, name + " gives no UTF-8 text");
    return text;
}

const std::vector<Group>& groups() {
    static const auto& all = *new std::vector<Group>{
        {"functions", checkExports}, {"device", checkDevice},   {"capabilities", checkCapabilities},
        {"channels", checkChannels}, {"ratings", checkRatings}, {"broadcast objects", checkObjects},
        {"broadcast", checkTuning},  {"players", checkPlayers}, {"DRM", checkDrm},
    };
    return all;
}

void checkExports(const Means& m) {
    for (const Library::Export& each : m.library.exports) {
        m.check(std::string("has ") + each.name, {}, [&] { expect(each.isThere, "it is missing"); });
    }
}
