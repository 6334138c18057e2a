// Script values: equality, printing, and the road into and out of variants.
#include <cstring>
#include <sstream>

#include <gtest/gtest-spi.h>

#include "common/BrowserGates.h"
#include "tests/support/BorderTest.h"

namespace {

using ValueTest = BorderTest;

std::string printed(const Value& value) {
    std::ostringstream text;
    text << value;
    return text.str();
}

TEST_F(ValueTest, EqualsOnlyAValueOfTheSameType) {
    EXPECT_EQ(Value(1), Value(1));
    EXPECT_NE(Value(1), Value(1.0));
    EXPECT_NE(Value(1), Value(true));
    EXPECT_NE(Value(), Value(nullptr));
    EXPECT_NE(Value(""), Value(nullptr));
    EXPECT_EQ(Value("text"), Value(std::string("text")));
    EXPECT_NE(Value(browser.scriptObject("a")), Value(browser.scriptObject("b")));
    EXPECT_EQ(Value(browser.window()), Value(browser.window()));
}

TEST_F(ValueTest, AnEmptyReferenceIsNull) {
    EXPECT_EQ(Value(ObjectRef()), Value(nullptr));
}

TEST_F(ValueTest, PrintsAsInScript) {
    EXPECT_EQ(printed(undefined), "undefined");
    EXPECT_EQ(printed(nullptr), "null");
    EXPECT_EQ(printed(true), "true");
    EXPECT_EQ(printed(-3), "-3");
    EXPECT_EQ(printed(2.5), "double 2.5");
    EXPECT_EQ(printed("text"), "\"text\"");
    EXPECT_EQ(printed(browser.window()), "window");
}

TEST_F(ValueTest, GivesAwayEveryTypeAndTakesItBack) {
    const ScriptObject object = browser.scriptObject("thing");
    for (const Value& value : {Value(), Value(nullptr), Value(true), Value(7), Value(0.5), Value("a text"),
                               Value(""), Value(object)}) {
        NPVariant variant;
        value.giveTo(variant);
        EXPECT_EQ(variant.type, value.type());
        EXPECT_EQ(Value::copyOf(variant), value);
        EXPECT_EQ(Value::take(variant), value);
        EXPECT_EQ(variant.type, NPVariantType_Void);
    }
    EXPECT_EQ(object.pluginReferences(), 0);
    EXPECT_EQ(browser.memoryBlocks(), 0U);
}

TEST_F(ValueTest, WhatIsGivenAwayIsTheReceiversUntilItIsReleased) {
    const ScriptObject object = browser.scriptObject("thing");
    NPVariant variant;
    Value(object).giveTo(variant);
    EXPECT_EQ(object.pluginReferences(), 1);
    NPN_ReleaseVariantValue(&variant);
    EXPECT_EQ(object.pluginReferences(), 0);

    Value("text").giveTo(variant);
    EXPECT_EQ(browser.memoryBlocks(), 1U);
    NPN_ReleaseVariantValue(&variant);
    EXPECT_EQ(browser.memoryBlocks(), 0U);
    EXPECT_EQ(variant.type, NPVariantType_Void);
}

TEST_F(ValueTest, AStringOfTheCHeapCanBeReleasedAsAVariant) {
    NPVariant variant{};
    variant.type = NPVariantType_String;
    variant.value.stringValue = {strdup("text"), 4};
    NPN_ReleaseVariantValue(&variant);
    EXPECT_EQ(variant.type, NPVariantType_Void);
}

TEST_F(ValueTest, FailsWhenReadAsAnotherType) {
    EXPECT_NONFATAL_FAILURE(Value("text").integer(), "Not an integer: \"text\"");
    EXPECT_NONFATAL_FAILURE(Value(1).object(), "Not an object: 1");
    EXPECT_EQ(Value(3).number(), 3.0);
}

TEST_F(ValueTest, ArgumentsAreFollowedByReadableVoids) {
    const ArgumentArray array({1, "text"});
    EXPECT_EQ(array.count(), 2U);
    EXPECT_EQ(array.data()[0].type, NPVariantType_Int32);
    EXPECT_EQ(array.data()[1].type, NPVariantType_String);
    EXPECT_EQ(array.data()[2].type, NPVariantType_Void);
    EXPECT_EQ(array.data()[9].type, NPVariantType_Void);
}

TEST_F(ValueTest, AnOutcomeEqualsAValueOnlyIfTheNameExistsAndTheCallSucceeded) {
    Outcome outcome;
    outcome.value = 1;
    EXPECT_FALSE(outcome == Value(1));
    outcome.exists = true;
    EXPECT_FALSE(outcome == Value(1));
    outcome.succeeded = true;
    EXPECT_TRUE(outcome == Value(1));
    EXPECT_TRUE(outcome);
}

} // namespace
