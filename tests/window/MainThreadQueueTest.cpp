// Values from any thread on their way to the main thread.
#include <gtest/gtest.h>

#include <thread>
#include <vector>

#include "desktop/window/shared/MainThreadQueue.h"

using namespace desktop;

namespace {

TEST(MainThreadQueueTest, TheMainThreadTakesWhatOthersPostInItsOrder) {
    constexpr int kPosts = 1000;
    std::vector<int> taken;
    std::thread::id taker;
    MainThreadQueue<int> queue([&](const int& value) {
        taken.push_back(value);
        taker = std::this_thread::get_id();
    });
    std::thread poster([&] {
        for (int value = 0; value < kPosts; ++value) {
            queue.post(value);
        }
    });
    while (taken.size() < kPosts) {
        g_main_context_iteration(nullptr, TRUE);
    }
    poster.join();
    for (int value = 0; value < kPosts; ++value) {
        ASSERT_EQ(taken[static_cast<size_t>(value)], value);
    }
    EXPECT_EQ(taker, std::this_thread::get_id());
}

TEST(MainThreadQueueTest, ATakerMayPost) {
    std::vector<int> taken;
    MainThreadQueue<int>* self = nullptr;
    MainThreadQueue<int> queue([&](const int& value) {
        taken.push_back(value);
        if (value < 3) {
            self->post(value + 1);
        }
    });
    self = &queue;
    queue.post(1);
    while (g_main_context_iteration(nullptr, FALSE)) {
    }
    EXPECT_EQ(taken, (std::vector<int>{1, 2, 3}));
}

TEST(MainThreadQueueTest, TheEndDropsWhatWaits) {
    int taken = 0;
    {
        MainThreadQueue<int> queue([&](const int&) { ++taken; });
        queue.post(1);
    }
    while (g_main_context_iteration(nullptr, FALSE)) {
    }
    EXPECT_EQ(taken, 0);
}

} // namespace
