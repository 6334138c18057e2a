// The list of live video/broadcast objects as platform threads see it.
#include <chrono>
#include <optional>
#include <thread>

#include <glib.h>
#include <gtest/gtest.h>

#include "src/videobroadcast/InstanceList.h"
#include "tests/support/ScriptedBrowser.h"

namespace {

constexpr std::chrono::seconds kBound(50); // for what comes at once unless it never comes

// Objects are never looked into: addresses are enough.
VideoBroadcast* object(uintptr_t number) {
    return reinterpret_cast<VideoBroadcast*>(number * 16);
}

// The object there; its generation is its number unless another one is given.
LiveRef<VideoBroadcast> ref(uintptr_t number, uint64_t generation = 0) {
    return {object(number), generation ? generation : number};
}

TEST(InstanceListTest, AnEmptyListFindsNothing) {
    const InstanceList list;
    EXPECT_EQ(list.find(0).address(), nullptr);
    EXPECT_EQ(list.handleOf(object(1)), 0U);
    EXPECT_FALSE(list.contains(object(1)));
}

TEST(InstanceListTest, EveryChangeIsSeenAtOnceOnEveryThread) {
    InstanceList list;
    const auto foundElsewhere = [&list](unsigned int handle) {
        VideoBroadcast* found = nullptr;
        std::thread([&] { found = list.find(handle).address(); }).join();
        return found;
    };
    list.set(ref(1), 0);
    EXPECT_EQ(foundElsewhere(0), object(1));
    list.set(ref(1), 7);
    EXPECT_EQ(foundElsewhere(7), object(1));
    EXPECT_EQ(foundElsewhere(0), nullptr);
    EXPECT_TRUE(list.erase(object(1)));
    EXPECT_EQ(foundElsewhere(7), nullptr);
    EXPECT_FALSE(list.erase(object(1)));
}

TEST(InstanceListTest, OfEqualHandlesTheLowestAddressIsFound) {
    InstanceList list;
    list.set(ref(2), 7);
    list.set(ref(1), 7);
    list.set(ref(3), 7);
    EXPECT_EQ(list.find(7).address(), object(1));
}

TEST(InstanceListTest, AnObjectThatIsMadeAtTheAddressOfAnotherIsFoundAsTheNewOne) {
    InstanceList list;
    list.set(ref(1, 5), 7);
    list.erase(object(1));
    list.set(ref(1, 6), 7);
    EXPECT_EQ(list.find(7).generation(), 6U);
}

TEST(InstanceListTest, ReplacedCopiesAreFreedOnTheMainLoopAfterAGrace) {
    ScriptedBrowser browser;
    InstanceList list(20);
    list.set(ref(1), 7);
    EXPECT_EQ(list.copiesHeldBack(), 0U);
    for (unsigned int handle = 8; handle < 20; ++handle) {
        list.set(ref(1), handle);
    }
    EXPECT_EQ(list.copiesHeldBack(), 12U);
    EXPECT_TRUE(browser.pumpUntil([&] { return list.copiesHeldBack() == 0; }, kBound));
    EXPECT_EQ(list.find(19).address(), object(1));
    // And again, once the clearing up has come to rest.
    list.erase(object(1));
    EXPECT_EQ(list.copiesHeldBack(), 1U);
    EXPECT_TRUE(browser.pumpUntil([&] { return list.copiesHeldBack() == 0; }, kBound));
}

TEST(InstanceListTest, AListThatEndsLeavesNothingOnTheMainLoop) {
    std::optional<InstanceList> list(1);
    void* const address = &*list;
    list->set(ref(1), 7);
    list->set(ref(1), 8);
    EXPECT_NE(g_main_context_find_source_by_user_data(nullptr, address), nullptr);
    list.reset();
    EXPECT_EQ(g_main_context_find_source_by_user_data(nullptr, address), nullptr);
}

} // namespace
