// The ordered log of the border.
#include "tests/support/BorderLog.h"

#include <algorithm>
#include <iterator>

#include <gtest/gtest.h>

namespace {

bool startsWith(const std::string& text, const std::string& prefix) {
    return text.compare(0, prefix.size(), prefix) == 0;
}

bool isBookkeeping(const std::string& entry) {
    static const char* const kPrefixes[] = {
        "NPN_GetStringIdentifier",
        "NPN_GetIntIdentifier",
        "NPN_IdentifierIsString",
        "NPN_UTF8FromIdentifier",
        "NPN_IntFromIdentifier",
        "NPN_RetainObject",
        "NPN_ReleaseObject",
        "NPN_ReleaseVariantValue",
        "NPN_MemAlloc",
        "NPN_MemFree",
    };
    return std::any_of(std::begin(kPrefixes), std::end(kPrefixes),
                       [&](const char* prefix) { return startsWith(entry, prefix); });
}

} // namespace

size_t BorderLog::add(const std::string& text) {
    const std::lock_guard<std::mutex> guard(m_mutex);
    m_entries.push_back(text);
    return m_entries.size() - 1;
}

void BorderLog::amend(size_t place, const std::string& text) {
    const std::lock_guard<std::mutex> guard(m_mutex);
    if (place < m_entries.size()) {
        m_entries[place] += text;
    }
}

void BorderLog::clear() {
    const std::lock_guard<std::mutex> guard(m_mutex);
    m_entries.clear();
}

BorderLog::Entries BorderLog::everything() const {
    const std::lock_guard<std::mutex> guard(m_mutex);
    return m_entries;
}

size_t BorderLog::size() const {
    const std::lock_guard<std::mutex> guard(m_mutex);
    return m_entries.size();
}

BorderLog::Entries BorderLog::calls() const {
    Entries entries = everything();
    entries.erase(std::remove_if(entries.begin(), entries.end(), isBookkeeping), entries.end());
    return entries;
}

BorderLog::Entries BorderLog::startingWith(const std::string& prefix) const {
    const Entries entries = everything();
    Entries result;
    std::copy_if(entries.begin(), entries.end(), std::back_inserter(result),
                 [&](const std::string& entry) { return startsWith(entry, prefix); });
    return result;
}

bool BorderLog::contains(const std::string& entry) const {
    const Entries entries = everything();
    return std::find(entries.begin(), entries.end(), entry) != entries.end();
}

void BorderLog::expectInOrder(const Entries& expected) const {
    const Entries entries = everything();
    auto position = entries.begin();
    for (const std::string& entry : expected) {
        position = std::find(position, entries.end(), entry);
        if (position == entries.end()) {
            ADD_FAILURE() << "Not in the log, or not in this place: " << entry << "\nThe log:\n" << text();
            return;
        }
        ++position;
    }
}

std::string BorderLog::text() const {
    std::string result;
    for (const std::string& entry : everything()) {
        result += "  " + entry + "\n";
    }
    return result;
}
