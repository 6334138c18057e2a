// The list of live video/broadcast objects as platform threads see it.
#include <optional>
#include <thread>

#include <glib.h>
#include <gtest/gtest.h>

#include "src/videobroadcast/InstanceList.h"
#include "tests/support/ScriptedBrowser.h"

namespace {

// Objects are never looked into: addresses are enough.
VideoBroadcast* object(uintptr_t number) {
    return reinterpret_cast<VideoBroadcast*>(number * 16);
}

TEST(InstanceListTest, AnEmptyListFindsNothing) {
    const InstanceList list;
    EXPECT_EQ(list.find(0), nullptr);
    EXPECT_EQ(list.handleOf(object(1)), 0U);
    EXPECT_FALSE(list.contains(object(1)));
}

TEST(InstanceListTest, EveryChangeIsSeenAtOnceOnEveryThread) {
    InstanceList list;
    const auto foundElsewhere = [&list](unsigned int handle) {
        VideoBroadcast* found = nullptr;
        std::thread([&] { found = list.find(handle); }).join();
        return found;
    };
    list.set(object(1), 0);
    EXPECT_EQ(foundElsewhere(0), object(1));
    list.set(object(1), 7);
    EXPECT_EQ(foundElsewhere(7), object(1));
    EXPECT_EQ(foundElsewhere(0), nullptr);
    EXPECT_TRUE(list.erase(object(1)));
    EXPECT_EQ(foundElsewhere(7), nullptr);
    EXPECT_FALSE(list.erase(object(1)));
}

TEST(InstanceListTest, OfEqualHandlesTheLowestAddressIsFound) {
    InstanceList list;
    list.set(object(2), 7);
    list.set(object(1), 7);
    list.set(object(3), 7);
    EXPECT_EQ(list.find(7), object(1));
}

TEST(InstanceListTest, ReplacedCopiesAreFreedOnTheMainLoopAfterAGrace) {
    ScriptedBrowser browser;
    InstanceList list(20);
    list.set(object(1), 7);
    EXPECT_EQ(list.copiesHeldBack(), 0U);
    for (unsigned int handle = 8; handle < 20; ++handle) {
        list.set(object(1), handle);
    }
    EXPECT_EQ(list.copiesHeldBack(), 12U);
    EXPECT_TRUE(browser.pumpUntil([&] { return list.copiesHeldBack() == 0; }));
    EXPECT_EQ(list.find(19), object(1));
    // And again, once the clearing up has come to rest.
    list.erase(object(1));
    EXPECT_EQ(list.copiesHeldBack(), 1U);
    EXPECT_TRUE(browser.pumpUntil([&] { return list.copiesHeldBack() == 0; }));
}

TEST(InstanceListTest, AListThatEndsLeavesNothingOnTheMainLoop) {
    std::optional<InstanceList> list(1);
    void* const address = &*list;
    list->set(object(1), 7);
    list->set(object(1), 8);
    EXPECT_NE(g_main_context_find_source_by_user_data(nullptr, address), nullptr);
    list.reset();
    EXPECT_EQ(g_main_context_find_source_by_user_data(nullptr, address), nullptr);
}

} // namespace
