// The heap of this executable itself.
#include "tests/unit/support/Heap.h"

#include <cstdlib>
#include <cstring>
#include <iterator>
#include <memory>
#include <new>
#include <thread>

#include <gtest/gtest.h>

namespace {

TEST(HeapWatchTest, CountsWhatAFunctionTakesUntilAnyThreadReleasesIt) {
    HeapWatch watch;
    void* blocks[3] = {};
    int* number = nullptr;
    int* perhaps = nullptr;
    watch.during([&] {
        blocks[0] = std::malloc(8);
        blocks[1] = std::realloc(nullptr, 8);
        blocks[2] = strdup("text");
        number = new int;
        perhaps = new (std::nothrow) int;
        std::free(std::malloc(8));
    });
    EXPECT_EQ(watch.left(), 5U);
    blocks[1] = std::realloc(blocks[1], 8000);
    EXPECT_EQ(watch.left(), 4U) << "it is what this call has taken";
    std::free(blocks[1]);
    std::thread([&] {
        std::free(blocks[0]);
        std::free(blocks[2]);
    }).join();
    delete number;
    delete perhaps;
    EXPECT_EQ(watch.left(), 0U);
}

TEST(HeapWatchTest, CountsNothingOfOtherCallsAndThreads) {
    HeapWatch watch;
    const std::unique_ptr<int> before = std::make_unique<int>();
    std::unique_ptr<int> another;
    watch.during([&] { std::thread([&] { another = std::make_unique<int>(); }).join(); });
    EXPECT_EQ(watch.left(), 0U);
}

TEST(MemoryShortageTest, FailsTheCallsAfterThoseThatPass) {
    void* blocks[5] = {};
    {
        const MemoryShortage shortage(2, 1);
        for (void*& block : blocks) {
            block = std::malloc(8);
        }
    }
    for (size_t i = 0; i < std::size(blocks); ++i) {
        EXPECT_EQ(blocks[i] == nullptr, i == 1 || i == 2) << i;
        std::free(blocks[i]);
    }
}

TEST(MemoryShortageTest, IsOfItsThreadAndOfEachFunctionThatMayFail) {
    void* elsewhere = nullptr;
    void* blocks[4] = {};
    {
        const MemoryShortage shortage;
        std::thread([&] { elsewhere = std::malloc(8); }).join();
        blocks[0] = std::malloc(8);
        blocks[1] = std::realloc(nullptr, 8);
        blocks[2] = strdup("text");
        blocks[3] = new (std::nothrow) int;
        const std::unique_ptr<int> number = std::make_unique<int>();
        EXPECT_NE(number, nullptr);
    }
    for (const void* block : blocks) {
        EXPECT_EQ(block, nullptr);
    }
    EXPECT_NE(elsewhere, nullptr);
    std::free(elsewhere);
}

} // namespace
