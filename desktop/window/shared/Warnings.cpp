// What fails without a sign that the author of a page would see.
#include "desktop/window/shared/Warnings.h"

#include <glib.h>

#include <algorithm>

#include "desktop/window/shared/Diagnostics.h"

namespace desktop {

namespace {

constexpr std::size_t kMaxLines = 100; // of a document
constexpr std::size_t kMaxSubject = 200;

// The name in scripts, empty if none reports it, and the line around the subject.
struct Row {
    Warning warning;
    const char* name;
    const char* before;
    const char* after;
};
constexpr Row kRows[] = {
    {Warning::NoId, "no-id", "the object of type ", " has no id, so it gets no events"},
    {Warning::UnknownType, "unknown-type", "unknown object type ", ""},
    {Warning::RefusedCall, "refused-call", "", ": the method refuses these arguments"},
    {Warning::FailedScript, "failed-script", "the script that dispatches ",
     " has failed, so the event is lost"},
    {Warning::KeyNotInSet, "", "the page does not get the key ", ", which is not in its key set"},
    {Warning::NotCreated, "", "no application is created: ", ""},
    {Warning::SkippedEntry, "", "skipped in the AIT of ", ""},
};

// Types of the plug-in whose objects dispatch no events.
constexpr const char* kTypesWithoutEvents[] = {
    "application/oipfapplicationmanager", "application/oipfcapabilities", "application/oipfconfiguration",
    "application/oipfparentalcontrolmanager"};
// The beginnings of types that the engine shows itself.
constexpr const char* kTypesOfEngine[] = {
    "image/", "text/", "application/json", "application/pdf", "application/xhtml+xml", "application/xml"};

bool hasEvents(const std::string& type) {
    return std::none_of(std::begin(kTypesWithoutEvents), std::end(kTypesWithoutEvents),
                        [&type](const char* each) { return type == each; });
}

bool isOfEngine(const std::string& type) {
    return std::any_of(std::begin(kTypesOfEngine), std::end(kTypesOfEngine),
                       [&type](const char* each) { return g_str_has_prefix(type.c_str(), each) != FALSE; });
}

// What is in quotes after `mark`; empty if that is not there.
std::string quotedAfter(const std::string& source, const std::string& mark) {
    const std::size_t found = source.find(mark);
    if (found == std::string::npos || found + mark.size() >= source.size()) {
        return {};
    }
    const std::size_t begin = found + mark.size() + 1;
    const std::size_t end = source.find(source[begin - 1], begin);
    return source.substr(begin, end == std::string::npos ? end : end - begin);
}

// The event that a script of the plug-in dispatches; empty if it dispatches none.
std::string eventOf(const std::string& source) {
    const std::string event = quotedAfter(source, "initEvent(");
    const std::string name = quotedAfter(source, "strEvent.name = ");
    return name.empty() ? event : event + " " + name;
}

// Empty: nobody misses anything.
std::string shownSubject(Warning warning, const std::string& subject) {
    switch (warning) {
    case Warning::NoId:
        return hasEvents(subject) ? subject : "";
    case Warning::UnknownType:
        return isOfEngine(subject) ? "" : subject;
    case Warning::FailedScript:
        return eventOf(subject);
    default:
        return subject;
    }
}

// What pages and broadcasts send, as a part of a line.
std::string printable(const std::string& text) {
    g_autofree char* valid = g_utf8_make_valid(text.c_str(), static_cast<gssize>(text.size()));
    std::string result;
    for (const char* position = valid; *position && result.size() < kMaxSubject;
         position = g_utf8_next_char(position)) {
        if (!g_unichar_iscntrl(g_utf8_get_char(position))) {
            result.append(position, static_cast<std::size_t>(g_utf8_next_char(position) - position));
        }
    }
    return result;
}

} // namespace

std::optional<Warning> warningNamed(const std::string& name) {
    const auto* const found = std::find_if(std::begin(kRows), std::end(kRows), [&name](const Row& row) {
        return *row.name != '\0' && name == row.name;
    });
    return found == std::end(kRows) ? std::nullopt : std::optional<Warning>(found->warning);
}

void Warnings::print(const Page& page, Warning warning, const std::string& subject) {
    const std::string shown = printable(shownSubject(warning, subject));
    if (shown.empty()) {
        return;
    }
    const auto* const row = std::find_if(std::begin(kRows), std::end(kRows),
                                         [warning](const Row& each) { return each.warning == warning; });
    const std::string line = row->before + shown + row->after;
    std::set<std::string>& printed = m_printed[page.application];
    if (printed.size() < kMaxLines && printed.insert(line).second) {
        printWarning(page.url, line);
    }
}

} // namespace desktop
