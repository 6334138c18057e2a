// The ordered log of the border.
#include <gmock/gmock.h>
#include <gtest/gtest-spi.h>
#include <gtest/gtest.h>

#include "tests/support/BorderLog.h"

using ::testing::ElementsAre;

namespace {

TEST(BorderLog, KeepsEntriesInOrderUntilItIsCleared) {
    BorderLog log;
    log.add("NPN_Evaluate window \"1\"");
    log.add("TELIX_JS_APP_Call()");
    EXPECT_THAT(log.everything(), ElementsAre("NPN_Evaluate window \"1\"", "TELIX_JS_APP_Call()"));
    log.clear();
    EXPECT_THAT(log.everything(), ElementsAre());
}

TEST(BorderLog, LeavesTheBookkeepingOutOfTheCalls) {
    BorderLog log;
    log.add("NPN_MemAlloc 4");
    log.add("NPN_RetainObject handler");
    log.add("NPN_InvokeDefault handler()");
    EXPECT_THAT(log.calls(), ElementsAre("NPN_InvokeDefault handler()"));
    EXPECT_EQ(log.count("NPN_MemAlloc"), 1U);
}

TEST(BorderLog, CompletesAnEntry) {
    BorderLog log;
    const size_t place = log.add("NPN_CreateObject");
    log.add("NPN_GetStringIdentifier \"x\"");
    log.amend(place, " JSThing");
    EXPECT_TRUE(log.contains("NPN_CreateObject JSThing"));
    log.clear();
    log.amend(place, " JSThing");
    EXPECT_THAT(log.everything(), ElementsAre());
}

TEST(BorderLog, FindsASequenceWithOthersBetween) {
    BorderLog log;
    for (const char* entry : {"a", "b", "c", "b"}) {
        log.add(entry);
    }
    log.expectInOrder({"a", "c", "b"});
}

TEST(BorderLog, FailsForASequenceInAnotherOrder) {
    BorderLog log;
    log.add("a");
    log.add("b");
    EXPECT_NONFATAL_FAILURE(log.expectInOrder({"b", "a"}), "Not in the log, or not in this place: a");
}

TEST(BorderLog, FailsForAnEntryThatIsExpectedTwiceAndCameOnce) {
    BorderLog log;
    log.add("a");
    EXPECT_NONFATAL_FAILURE(log.expectInOrder({"a", "a"}), "not in this place");
}

} // namespace
