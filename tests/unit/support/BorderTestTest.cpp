// The fixture: that it notices what a test leaves behind, and captures what is printed.
#include <cstdio>

#include <gtest/gtest-spi.h>

#include "common/BrowserGates.h"
#include "tests/support/BorderTest.h"

using ::testing::ElementsAre;

namespace {

// Makes the end of a test callable inside one.
class LeftoverTest : public BorderTest {
public:
    void end() { BorderTest::TearDown(); }
    using BorderTest::outputOf;

protected:
    LeftoverTest() { running = this; }
    void TearDown() override {}

    // EXPECT_NONFATAL_FAILURE reaches static things only.
    static inline LeftoverTest* running = nullptr;
};

TEST_F(LeftoverTest, AReferenceThatIsLeftFailsTheTest) {
    const ScriptFunction listener = browser.function("listener");
    NPN_RetainObject(listener.object());
    EXPECT_NONFATAL_FAILURE(running->end(), "references left to listener");
}

TEST_F(LeftoverTest, AReferenceThatIsLeftOnPurposeIsDeclared) {
    const ScriptFunction listener = browser.function("listener");
    NPN_RetainObject(listener.object());
    leftBehind(listener);
    end();
}

TEST_F(LeftoverTest, ReferencesToAClassAreDeclaredTogether) {
    const ScriptFunction first = browser.function("listener");
    const ScriptFunction second = browser.function("listener");
    NPN_RetainObject(first.object());
    NPN_RetainObject(second.object());
    leftBehind("listener", 2);
    end();
}

TEST_F(LeftoverTest, ADeclaredReferenceThatIsNotLeftFailsTheTest) {
    const ScriptFunction listener = browser.function("listener");
    leftBehind(listener);
    EXPECT_NONFATAL_FAILURE(running->end(), "references left to listener");
}

TEST_F(LeftoverTest, MemoryThatIsLeftFailsTheTest) {
    void* block = NPN_MemAlloc(1);
    EXPECT_NONFATAL_FAILURE(running->end(), "memory left");
    memoryLeftBehind(1);
    end();
    NPN_MemFree(block);
}

TEST_F(LeftoverTest, WhatThePageHoldsIsNoLeftover) {
    const ScriptFunction listener = browser.function("listener");
    const ScriptObject object = browser.scriptObject("object");
    object.set("listener", listener);
    listener.callDefault({object});
    end();
}

TEST_F(LeftoverTest, ThePageDropsTheReferencesInTheTestsVariablesToo) {
    const ScriptFunction listener = browser.function("listener");
    const Values values = {listener};
    end();
    EXPECT_FALSE(listener);
    EXPECT_EQ(browser.liveCount("listener"), 0U);
}

TEST_F(LeftoverTest, ThePlatformWritesIntoTheSameLog) {
    NPN_MemFlush(1);
    TELIX_JS_APP_RegisterLowMemory(nullptr);
    EXPECT_THAT(log.everything(), ElementsAre("NPN_MemFlush", "TELIX_JS_APP_RegisterLowMemory(null)"));
}

TEST_F(LeftoverTest, CapturesLogTextsWithoutLastingEffect) {
    const std::string text = logOf(9, [] { NPN_MemFlush(1); });
    EXPECT_EQ(text, logLine("COMMON", "NPN_MemFlush", " is called\n"));
    EXPECT_FALSE(log.contains("NPN_MemFlush"));
    EXPECT_EQ(logOf(2, [] { NPN_MemFlush(1); }), "");
    EXPECT_EQ(outputOf([] { std::printf("printed"); }), "printed");
}

TEST_F(LeftoverTest, AFailureInACapturedBodyFailsTheTest) {
    EXPECT_NONFATAL_FAILURE(running->outputOf([] { ADD_FAILURE() << "inside"; }), "inside");
}

} // namespace
