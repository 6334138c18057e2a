// Conversions of text: each length of a sequence at its bounds, and what is invalid.
#include "bridge/Text.h"

#include <gtest/gtest.h>

using namespace bridge;

namespace {

const std::u16string kReplaced = u"\uFFFD";

std::u16string replaced(size_t count) {
    std::u16string text;
    while (text.size() < count) {
        text += kReplaced;
    }
    return text;
}

TEST(BridgeText, EachLengthGoesThereAndBack) {
    // The smallest and the largest character of each length, those beside the surrogates, and such as have
    // different bits in each byte.
    const std::pair<std::u16string, std::string> texts[] = {
        {std::u16string(1, u'\0'), std::string(1, '\0')},
        {u"\u0001", "\x01"},
        {u"a", "a"},
        {u"\u007F", "\x7F"},
        {u"\u0080", "\xC2\x80"},
        {u"\u00E4", "\xC3\xA4"},
        {u"\u07FF", "\xDF\xBF"},
        {u"\u0800", "\xE0\xA0\x80"},
        {u"\u20AC", "\xE2\x82\xAC"},
        {u"\uD7FF", "\xED\x9F\xBF"},
        {u"\uE000", "\xEE\x80\x80"},
        {u"\uFFFF", "\xEF\xBF\xBF"},
        {u"\U00010000", "\xF0\x90\x80\x80"},
        {u"\U0001F600", "\xF0\x9F\x98\x80"},
        {u"\U00050407", "\xF1\x90\x90\x87"},
        {u"\U0010FFFF", "\xF4\x8F\xBF\xBF"},
    };
    std::u16string all16;
    std::string all8;
    for (const auto& [text16, text8] : texts) {
        EXPECT_EQ(utf8From(text16), text8);
        EXPECT_EQ(utf16From(text8), text16) << text8;
        all16 += text16;
        all8 += text8;
    }
    EXPECT_EQ(utf8From(all16), all8);
    EXPECT_EQ(utf16From(all8), all16);
    EXPECT_EQ(utf8From(u""), "");
    EXPECT_EQ(utf16From(""), u"");
}

TEST(BridgeText, LoneSurrogatesAreReplaced) {
    constexpr char16_t kHighs[] = {0xD800, 0xD83D, 0xDBFF};
    constexpr char16_t kLows[] = {0xDC00, 0xDE00, 0xDFFF};
    for (const char16_t high : kHighs) {
        EXPECT_EQ(utf8From(std::u16string{u'a', high}), "a\uFFFD");
        EXPECT_EQ(utf8From(std::u16string{high, u'b'}), "\uFFFDb");
        EXPECT_EQ(utf8From(std::u16string{high, high, 0xDC00}).substr(0, 3), "\uFFFD");
        EXPECT_EQ(utf8From(std::u16string{high, 0xE000}), "\uFFFD\uE000");
    }
    for (const char16_t low : kLows) {
        EXPECT_EQ(utf8From(std::u16string{low}), "\uFFFD");
        EXPECT_EQ(utf8From(std::u16string{low, 0xD800}), "\uFFFD\uFFFD");
        EXPECT_EQ(utf8From(std::u16string{low, low}), "\uFFFD\uFFFD");
    }
    const std::u16string pair = u"\U0001F600";
    EXPECT_EQ(utf8From(std::u16string_view(pair).substr(0, 1)), "\uFFFD"); // what follows is not of the text
}

TEST(BridgeText, BytesOfNoSequenceAreReplacedOneByOne) {
    const std::pair<std::string, size_t> invalid[] = {
        {"\x80", 1}, // a continuation alone
        {"\xBF\xBF", 2},
        {"\xF8\x88\x80\x80\x80", 5}, // what would begin five bytes
        {"\xFE", 1},
        {"\xFF", 1},
        {"\xC0\x80", 2}, // overlong
        {"\xC1\xBF", 2},
        {"\xE0\x80\x80", 3},
        {"\xE0\x9F\xBF", 3},
        {"\xF0\x80\x80\x80", 4},
        {"\xF0\x8F\xBF\xBF", 4},
        {"\xED\xA0\x80", 3}, // surrogates
        {"\xED\xBF\xBF", 3},
        {"\xF4\x90\x80\x80", 4}, // above Unicode
        {"\xF7\xBF\xBF\xBF", 4},
        {"\xC3", 1}, // cut off
        {"\xE2\x82", 2},
        {"\xF0\x9F\x98", 3},
    };
    for (const auto& [bytes, count] : invalid) {
        EXPECT_EQ(utf16From(bytes), replaced(count)) << testing::PrintToString(bytes);
        EXPECT_EQ(utf16From("a" + bytes + "z"), u"a" + replaced(count) + u"z")
            << testing::PrintToString(bytes);
    }
    // A byte that should continue and does not begins the next character.
    EXPECT_EQ(utf16From("\xC3z"), u"\uFFFDz");
    EXPECT_EQ(utf16From("\xE2\xC3\xA4"), u"\uFFFD\u00E4");
    EXPECT_EQ(utf16From("\xF0\x9F\x98z"), replaced(3) + u"z");
    EXPECT_EQ(utf16From("\xE2\x82\xC2\x80"), replaced(2) + u"\u0080");
}

} // namespace
