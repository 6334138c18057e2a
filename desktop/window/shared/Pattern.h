// Regular expressions for texts of any length, as pages may make them.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_PATTERN_H
#define TELIX_DESKTOP_WINDOW_SHARED_PATTERN_H

#include <glib.h>

#include <optional>
#include <string>
#include <vector>

namespace desktop {

// A Perl-compatible expression for the bytes of a whole text. std::regex is not used in the window: it
// recurses for each character, and a text of 100,000 exhausts the stack. Any thread.
class Pattern {
public:
    enum class Case { Sensitive, Insensitive };

    explicit Pattern(const std::string& expression, Case letterCase = Case::Sensitive);
    ~Pattern();
    Pattern(const Pattern&) = delete;
    Pattern& operator=(const Pattern&) = delete;

    // The text and its groups, empty for those that take no part; nothing if the text does not match.
    std::optional<std::vector<std::string>> match(const std::string& text) const;

private:
    GRegex* m_regex;
};

} // namespace desktop

#endif
