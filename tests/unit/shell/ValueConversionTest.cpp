// Conversion of script values, and the UTF-8 machinery.
#include <cmath>
#include <cstdlib>
#include <limits>
#include <optional>

#include "common/PluginUtils.h"
#include "tests/support/BorderTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace {

class ValueConversionTest : public BorderTest {
protected:
    static std::string text(const std::string& content) {
        const ArgumentArray array({content});
        return stringValue(array.data()[0].value.stringValue);
    }

    static double number(const Value& value) { return numberValue(ArgumentArray({value}).data()[0]); }
    static bool isNumber(const Value& value) { return isNumberValue(ArgumentArray({value}).data()[0]); }

    static int index(const Name& name) { return getIntFromNPIdentifier(name.identifier()); }
};

// What convUTF8ToUTF16 made of a text.
struct Converted {
    int result;
    std::vector<unsigned short> units;
    size_t consumed;
};

bool operator==(const Converted& left, const Converted& right) {
    return left.result == right.result && left.units == right.units && left.consumed == right.consumed;
}

std::ostream& operator<<(std::ostream& stream, const Converted& converted) {
    stream << "result " << converted.result << ", " << converted.consumed << " bytes consumed, units"
           << std::hex;
    for (const unsigned short unit : converted.units) {
        stream << ' ' << unit;
    }
    return stream << std::dec;
}

Converted convert(const std::string& source, size_t room = 16, bool strict = true) {
    std::vector<unsigned short> target(room);
    const char* sourceStart = source.data();
    unsigned short* targetStart = target.data();
    const int result = convUTF8ToUTF16(&sourceStart, source.data() + source.size(), &targetStart,
                                       target.data() + target.size(), strict);
    target.resize(static_cast<size_t>(targetStart - target.data()));
    return {result, target, static_cast<size_t>(sourceStart - source.data())};
}

// The bytes that utf8ToUtf16Converter makes, or an empty value for null. Checks the zero after them.
std::optional<std::string> bytesOf(const std::string& source) {
    const ArgumentArray array({source});
    unsigned int length = 4711;
    unsigned char* bytes = utf8ToUtf16Converter(array.data()[0].value.stringValue, &length);
    if (!bytes) {
        EXPECT_EQ(length, 4711U);
        return std::nullopt;
    }
    EXPECT_EQ(bytes[length], 0);
    std::string result(reinterpret_cast<char*>(bytes), length);
    std::free(bytes);
    return result;
}

TEST_F(ValueConversionTest, ToLowerChangesTheLettersAToZOnly) {
    EXPECT_EQ(toLower("AZaz@[`{09-"), "azaz@[`{09-");
    EXPECT_EQ(toLower("\xC4\xD6\xDC\xFF\x80"), "\xC4\xD6\xDC\xFF\x80");
    EXPECT_EQ(toLower(""), "");
}

TEST_F(ValueConversionTest, StringValueIsTheTextUpToItsFirstZero) {
    EXPECT_EQ(text("some text"), "some text");
    EXPECT_EQ(text(""), "");
    EXPECT_EQ(text(std::string("ab\0cd", 5)), "ab");
}

TEST_F(ValueConversionTest, StringValueReadsNoFurtherThanTheLength) {
    EXPECT_EQ(stringValue(NPString{"abcdef", 3}), "abc");
}

TEST_F(ValueConversionTest, NumbersAreIntegersAndDoubles) {
    EXPECT_TRUE(isNumber(1));
    EXPECT_TRUE(isNumber(1.5));
    for (const Value& value : {Value(), Value(nullptr), Value(true), Value("1"), Value(browser.window())}) {
        EXPECT_FALSE(isNumber(value)) << value;
        EXPECT_EQ(number(value), 0.0) << value;
    }
    EXPECT_EQ(number(-7), -7.0);
    EXPECT_EQ(number(1.5), 1.5);
}

TEST_F(ValueConversionTest, NumbersBecomeIntegersByTruncationSaturating) {
    EXPECT_EQ(toInt32(1.9), 1);
    EXPECT_EQ(toInt32(-1.9), -1);
    EXPECT_EQ(toInt32(3e9), std::numeric_limits<int32_t>::max());
    EXPECT_EQ(toInt32(-3e9), std::numeric_limits<int32_t>::min());
    EXPECT_EQ(toInt32(std::numeric_limits<double>::infinity()), std::numeric_limits<int32_t>::max());
    EXPECT_EQ(toInt32(std::nan("")), 0);
    EXPECT_EQ(toInt32(2147483647.0), 2147483647);
    EXPECT_EQ(toInt32(-2147483648.0), std::numeric_limits<int32_t>::min());
    EXPECT_EQ(toUint32(3e9), 3000000000U);
    EXPECT_EQ(toUint32(4294967295.0), 4294967295U);
    EXPECT_EQ(toUint32(5e9), 4294967295U);
    EXPECT_EQ(toUint32(-1), 0U);
    EXPECT_EQ(toUint32(-std::numeric_limits<double>::infinity()), 0U);
    EXPECT_EQ(toUint32(std::nan("")), 0U);
    EXPECT_EQ(toUint32(0.99), 0U);
}

TEST_F(ValueConversionTest, ANameIsAnIndexIfItBeginsWithADigit) {
    EXPECT_EQ(index("length"), -1);
    EXPECT_EQ(index("0"), 0);
    EXPECT_EQ(index("12abc"), 12);
    EXPECT_EQ(index("2x"), 2);
    EXPECT_EQ(index("-3"), -1);
    EXPECT_EQ(index("-1"), -1);
    EXPECT_EQ(index(" 1"), -1);
    EXPECT_EQ(index(""), -1);
}

TEST_F(ValueConversionTest, ANameWithoutTextIsNoIndex) {
    EXPECT_EQ(index(5), -1);
    browser.refuse("NPN_UTF8FromIdentifier");
    EXPECT_EQ(index("5"), -1);
}

TEST_F(ValueConversionTest, TheTextOfANameGoesBackToTheCHeap) {
    index("5");
    EXPECT_THAT(log.everything(), ElementsAre("NPN_UTF8FromIdentifier 5"));
}

TEST_F(ValueConversionTest, EscapeCharactersAreSevenToThirteen) {
    for (unsigned int value = 0; value < 300; ++value) {
        EXPECT_EQ(isEscapeCharacter(value), value >= 7 && value <= 13) << value;
    }
}

TEST_F(ValueConversionTest, HexDigitsAreRecognisedInEitherCase) {
    const std::string digits = "0123456789abcdefABCDEF";
    for (int c = -128; c < 128; ++c) {
        const bool isDigit = c > 0 && digits.find(static_cast<char>(c)) != std::string::npos;
        EXPECT_EQ(isASCIIHexDigit(static_cast<char>(c)), isDigit) << c;
    }
    EXPECT_FALSE(isASCIIHexDigit('g'));
    EXPECT_FALSE(isASCIIHexDigit('G'));
}

TEST_F(ValueConversionTest, HexDigitsHaveTheirValue) {
    for (int value = 0; value < 16; ++value) {
        EXPECT_EQ(toASCIIHexValue("0123456789abcdef"[value]), value);
        EXPECT_EQ(toASCIIHexValue("0123456789ABCDEF"[value]), value);
    }
}

TEST_F(ValueConversionTest, AnythingElseHasNoHexValue) {
    EXPECT_DEATH(toASCIIHexValue('g'), "common/PluginUtils.h.*isASCIIHexDigit\\(c\\)");
    EXPECT_DEATH(toASCIIHexValue(' '), "isASCIIHexDigit\\(c\\)");
}

TEST_F(ValueConversionTest, AFirstByteTellsTheLengthOfItsSequence) {
    for (int byte = 0; byte < 256; ++byte) {
        const int expected = byte < 0x80   ? 1
                             : byte < 0xC0 ? 0
                             : byte < 0xE0 ? 2
                             : byte < 0xF0 ? 3
                             : byte < 0xF8 ? 4
                                           : 0;
        EXPECT_EQ(inlineUTF8SequenceLength(static_cast<char>(byte)), expected) << byte;
        if (byte >= 0x80) {
            EXPECT_EQ(inlineUTF8SequenceLengthNonASCII(static_cast<char>(byte)), expected) << byte;
        }
    }
}

TEST_F(ValueConversionTest, ConvertsSequencesOfEveryLength) {
    EXPECT_EQ(convert(""), (Converted{0, {}, 0}));
    EXPECT_EQ(convert("A"), (Converted{0, {0x41}, 1}));
    EXPECT_EQ(convert(std::string("\0", 1)), (Converted{0, {0}, 1}));
    EXPECT_EQ(convert("\xC2\xAB"), (Converted{0, {0xAB}, 2}));
    EXPECT_EQ(convert("\xE1\x88\xB4"), (Converted{0, {0x1234}, 3}));
    EXPECT_EQ(convert("\xF0\x9F\x98\x80"), (Converted{0, {0xD83D, 0xDE00}, 4}));
    EXPECT_EQ(convert("\xF4\x8F\xBF\xBF"), (Converted{0, {0xDBFF, 0xDFFF}, 4}));
    EXPECT_EQ(convert("\xEF\xBF\xBF\x7F"), (Converted{0, {0xFFFF, 0x7F}, 4}));
}

TEST_F(ValueConversionTest, ASequenceThatIsCutOffExhaustsTheSource) {
    EXPECT_EQ(convert("A\xC2"), (Converted{1, {0x41}, 1}));
    EXPECT_EQ(convert("\xE1\x88"), (Converted{1, {}, 0}));
    EXPECT_EQ(convert("\xF0\x9F\x98"), (Converted{1, {}, 0}));
}

TEST_F(ValueConversionTest, IllegalSequencesStopTheConversion) {
    for (const char* bytes : {
             "\xC0\x80",         // overlong
             "\xC1\xBF",         // overlong
             "\x80",             // a lone continuation
             "\xBF",             // a lone continuation
             "\xFF",             // no first byte
             "\xF8\x80\x80\x80", // five bytes
             "\xE0\x9F\x80",     // overlong
             "\xED\xA0\x80",     // a surrogate
             "\xED\xBF\xBF",     // a surrogate
             "\xF0\x8F\x80\x80", // overlong
             "\xF4\x90\x80\x80", // above U+10FFFF
             "\xF5\x80\x80\x80", // above U+10FFFF
             "\xC2\x41",         // no continuation
             "\xE1\x41\x80",     // no continuation
             "\xE1\x80\x41",     // no continuation
             "\xF1\x80\x80\xC0", // no continuation
             "\xC2\xC0",         // no continuation
         }) {
        for (const bool strict : {true, false}) {
            EXPECT_EQ(convert(std::string("A") + bytes, 16, strict), (Converted{3, {0x41}, 1})) << bytes;
        }
    }
}

TEST_F(ValueConversionTest, AFullTargetStopsBeforeTheSequence) {
    EXPECT_EQ(convert("AB", 1), (Converted{2, {0x41}, 1}));
    EXPECT_EQ(convert("\xF0\x9F\x98\x80", 1), (Converted{2, {}, 0}));
    EXPECT_EQ(convert("\xF0\x9F\x98\x80", 0), (Converted{2, {}, 0}));
    EXPECT_EQ(convert("A", 0), (Converted{2, {}, 0}));
    EXPECT_EQ(convert("", 0), (Converted{0, {}, 0}));
}

TEST_F(ValueConversionTest, CharactersStandForBytes) {
    EXPECT_EQ(bytesOf("A\x7F"), "A\x7F");
    EXPECT_EQ(bytesOf("\xC2\xAB"), "\xAB");
    EXPECT_EQ(bytesOf("\xC3\xBF"), "\xFF");
    EXPECT_EQ(bytesOf("\xE1\x88\xB4"), "\x12\x34");
    EXPECT_EQ(bytesOf("\xC4\x80"), std::string("\x01\0", 2));
    EXPECT_EQ(bytesOf("\xF0\x9F\x98\x80"), std::string("\xD8\x3D\xDE\0", 4));
}

TEST_F(ValueConversionTest, AZeroCharacterStaysInTheBytes) {
    EXPECT_EQ(bytesOf(std::string("a\0b", 3)), std::string("a\0b", 3));
}

TEST_F(ValueConversionTest, AnEmptyStringGivesAnEmptyBuffer) {
    EXPECT_EQ(bytesOf(""), "");
}

TEST_F(ValueConversionTest, WhatIsNotUtf8GivesNoBytes) {
    EXPECT_EQ(bytesOf("\xC0\x80"), std::nullopt);
    EXPECT_EQ(bytesOf("\x80"), std::nullopt);
    EXPECT_EQ(bytesOf("\xED\xA0\x80"), std::nullopt);
    EXPECT_EQ(bytesOf("\xF4\x90\x80\x80"), std::nullopt);
    EXPECT_EQ(bytesOf("abc\xC2"), std::nullopt);
}

TEST_F(ValueConversionTest, LogsUnderCommon) {
    EXPECT_EQ(logOf(9, [] { text("some text"); }),
              logLine("COMMON", "stringValue", "In stringValue() function, string is: some text. \n"));
    EXPECT_THAT(logOf(9, [] { index("length"); }),
                HasSubstr(logLine("COMMON", "getIntFromNPIdentifier", "Property name:-- length --\n")));
    const std::string function = "utf8ToUtf16Converter";
    EXPECT_THAT(logOf(9, [] { bytesOf(""); }),
                logLine("COMMON", function, " called \n") +
                    logLine("COMMON", function, "Result after conversion from convertUTF8ToUTF16 \n") +
                    logLine("COMMON", function, "Resultant String passed to IF API\n"));
    EXPECT_THAT(logOf(9, [] { bytesOf("\xC2\xAB"); }), HasSubstr("ab"));
    EXPECT_THAT(logOf(9, [] { bytesOf("\x80"); }),
                logLine("COMMON", function, " called \n") +
                    logLine("COMMON", function, "convUTF8ToUTF16 failed[3]\n"));
    EXPECT_THAT(logOf(3, [] { bytesOf("a"); }), IsEmpty());
}

} // namespace
