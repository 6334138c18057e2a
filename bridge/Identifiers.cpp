// The names of properties and methods, interned.
#include "bridge/Identifiers.h"

#include <deque>
#include <unordered_map>

namespace bridge {

namespace {

// Identifiers stay where they are and are never freed: plug-ins keep their addresses.
struct Names {
    std::deque<Identifier> all;
    std::unordered_map<std::string_view, Identifier*> byText;
    std::unordered_map<int32_t, Identifier*> byNumber;
};

Names& names() {
    static auto* instance = new Names;
    return *instance;
}

constexpr size_t kMostDigits = 10;

// Whether the text is a number as script writes an array index: digits without a leading zero, in 31 bits.
bool readIndex(std::string_view text, int32_t& index) {
    if (text.empty() || text.size() > kMostDigits || (text[0] == '0' && text.size() > 1)) {
        return false;
    }
    int64_t number = 0;
    for (const char digit : text) {
        if (digit < '0' || digit > '9') {
            return false;
        }
        number = number * 10 + (digit - '0');
    }
    index = static_cast<int32_t>(number);
    return number <= INT32_MAX;
}

} // namespace

NPIdentifier identifierFor(std::string_view text) {
    const auto found = names().byText.find(text);
    if (found != names().byText.end()) {
        return found->second;
    }
    Identifier& added = names().all.emplace_back(Identifier{true, 0, std::string(text), nullptr});
    names().byText.emplace(added.text, &added);
    return &added;
}

NPIdentifier identifierFor(int32_t number) {
    const auto found = names().byNumber.find(number);
    if (found != names().byNumber.end()) {
        return found->second;
    }
    Identifier& added = names().all.emplace_back(Identifier{false, number, std::to_string(number), nullptr});
    names().byNumber.emplace(number, &added);
    return &added;
}

NPIdentifier identifierOfScriptName(std::string_view text) {
    int32_t index = 0;
    return readIndex(text, index) ? identifierFor(index) : identifierFor(text);
}

} // namespace bridge
