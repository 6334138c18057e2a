// Regular expressions for texts of any length, as pages may make them.
#include "desktop/window/shared/Pattern.h"

#include <cassert>

namespace desktop {

Pattern::Pattern(const std::string& expression, Case letterCase) {
    int flags = G_REGEX_RAW | G_REGEX_ANCHORED | G_REGEX_DOLLAR_ENDONLY | G_REGEX_DOTALL;
    flags |= letterCase == Case::Insensitive ? G_REGEX_CASELESS : 0;
    m_regex = g_regex_new(("(?:" + expression + ")$").c_str(), static_cast<GRegexCompileFlags>(flags),
                          static_cast<GRegexMatchFlags>(0), nullptr);
    assert(m_regex);
}

Pattern::~Pattern() {
    g_regex_unref(m_regex);
}

std::optional<std::vector<std::string>> Pattern::match(const std::string& text) const {
    g_autoptr(GMatchInfo) info = nullptr;
    if (!g_regex_match_full(m_regex, text.data(), static_cast<gssize>(text.size()), 0,
                            static_cast<GRegexMatchFlags>(0), &info, nullptr)) {
        return std::nullopt;
    }
    std::vector<std::string> groups;
    for (int group = 0; group <= g_regex_get_capture_count(m_regex); ++group) {
        g_autofree char* part = g_match_info_fetch(info, group);
        groups.emplace_back(part ? part : "");
    }
    return groups;
}

} // namespace desktop
