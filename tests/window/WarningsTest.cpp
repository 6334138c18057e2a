// What the window warns of, and how often.
#include <gtest/gtest.h>

#include <string>

#include "desktop/window/shared/Warnings.h"

using namespace desktop;

namespace {

class WarningsTest : public testing::Test {
protected:
    std::string linesOf(Warning warning, const std::string& subject, const Warnings::Page& page = {}) {
        testing::internal::CaptureStderr();
        m_warnings.print(page, warning, subject);
        return testing::internal::GetCapturedStderr();
    }

    Warnings m_warnings;
    const int m_first = 0;
    const int m_second = 0;
    const Warnings::Page m_page{&m_first, "http://a.example/"};
};

TEST_F(WarningsTest, EachHasALineAtTheFirstTime) {
    EXPECT_EQ(linesOf(Warning::KeyNotInSet, "5", m_page),
              "http://a.example/: telix: the page does not get the key 5, which is not in its key set\n");
    EXPECT_EQ(linesOf(Warning::KeyNotInSet, "5", m_page), "");
    EXPECT_NE(linesOf(Warning::KeyNotInSet, "6", m_page), "");
}

TEST_F(WarningsTest, AnotherApplicationAndAnotherDocumentGetItAgain) {
    const Warnings::Page other{&m_second, "http://b.example/"};
    EXPECT_NE(linesOf(Warning::KeyNotInSet, "5", m_page), "");
    EXPECT_NE(linesOf(Warning::KeyNotInSet, "5", other), "");
    m_warnings.forget(&m_first);
    EXPECT_NE(linesOf(Warning::KeyNotInSet, "5", m_page), "");
    EXPECT_EQ(linesOf(Warning::KeyNotInSet, "5", other), "");
}

TEST_F(WarningsTest, WhatBelongsToNoPageNamesNone) {
    EXPECT_EQ(linesOf(Warning::SkippedEntry, "channel 1: section: malformed"),
              "telix: skipped in the AIT of channel 1: section: malformed\n");
    EXPECT_EQ(linesOf(Warning::SkippedEntry, "channel 1: section: malformed"), "");
}

TEST_F(WarningsTest, AFailedScriptIsNamedByItsEvent) {
    EXPECT_EQ(linesOf(Warning::FailedScript,
                      "strEvent.initEvent('StreamEvent', false); strEvent.name = \"offer\"; x"),
              "telix: the script that dispatches StreamEvent offer has failed, so the event is lost\n");
    EXPECT_EQ(linesOf(Warning::FailedScript, "newEvent.initEvent(\"PlayStateChange\", true,false);"),
              "telix: the script that dispatches PlayStateChange has failed, so the event is lost\n");
    for (const char* source : {"", "1 +", "initEvent(", "initEvent('"}) {
        EXPECT_EQ(linesOf(Warning::FailedScript, source), "") << source;
    }
}

TEST_F(WarningsTest, WhatNobodyMissesHasNoLine) {
    EXPECT_EQ(linesOf(Warning::NoId, "application/oipfconfiguration"), "");
    EXPECT_EQ(linesOf(Warning::UnknownType, "image/png"), "");
    EXPECT_NE(linesOf(Warning::NoId, "application/oipfdrmagent"), "");
    EXPECT_NE(linesOf(Warning::UnknownType, "application/x-images"), "");
}

TEST_F(WarningsTest, ASubjectIsAShortPartOfOneLine) {
    EXPECT_EQ(linesOf(Warning::UnknownType, "a\nb\x1B[2J\xFF"),
              "telix: unknown object type ab[2J\xEF\xBF\xBD\n");
    EXPECT_LT(linesOf(Warning::UnknownType, std::string(100000, 'x')).size(), 300U);
}

TEST_F(WarningsTest, ADocumentGetsAHundredLines) {
    std::string lines;
    for (int number = 0; number < 300; ++number) {
        lines += linesOf(Warning::UnknownType, "x" + std::to_string(number), m_page);
    }
    EXPECT_EQ(std::count(lines.begin(), lines.end(), '\n'), 100);
}

TEST_F(WarningsTest, ScriptsNameSome) {
    EXPECT_EQ(warningNamed("no-id"), Warning::NoId);
    EXPECT_EQ(warningNamed("refused-call"), Warning::RefusedCall);
    EXPECT_EQ(warningNamed(""), std::nullopt);
    EXPECT_EQ(warningNamed("key"), std::nullopt);
}

} // namespace
