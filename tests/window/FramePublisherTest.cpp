// The publisher: what the loaded platform library shows arrives in the ring, and nothing is left when it
// ends.
#include <dlfcn.h>
#include <poll.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <future>
#include <memory>
#include <mutex>
#include <string>

#include <gtest/gtest.h>

#include "desktop/window/frames/FramePublisher.h"
#include "desktop/window/frames/FrameReader.h"
#include "tests/window/FrameLibrary.h"

namespace desktop {
namespace {

constexpr int kTimeoutInMilliseconds = 60000;

class FramePublisherTest : public testing::Test {
protected:
    FramePublisherTest()
        : m_publisher(std::make_unique<FramePublisher>([this](int memory, int wakeup) {
              std::string error;
              auto reader = FrameReader::open(dup(memory), dup(wakeup), error);
              const std::lock_guard<std::mutex> lock(m_mutex);
              m_error = error;
              m_next = std::move(reader);
              m_rings++;
              m_changed.notify_one();
          })) {}

    // As the plug-in does.
    void loadLibrary() {
        void* const library = dlopen(TELIX_FRAME_LIBRARY, RTLD_NOW | RTLD_LOCAL);
        ASSERT_TRUE(library) << dlerror();
        m_show = reinterpret_cast<ShowFrameFunction>(dlsym(library, "showFrame"));
        m_setPresenter = reinterpret_cast<SetPresenterFunction>(dlsym(library, "setPresenter"));
        m_count = reinterpret_cast<CountFramesFunction>(dlsym(library, "countFrames"));
        m_hasWakeup = reinterpret_cast<HasWakeupFunction>(dlsym(library, "hasWakeup"));
        ASSERT_TRUE(m_show && m_setPresenter && m_count && m_hasWakeup);
        m_setPresenter(0, false);
    }

    void takeRing() {
        std::unique_lock<std::mutex> lock(m_mutex);
        ASSERT_TRUE(m_changed.wait_for(lock, std::chrono::milliseconds(kTimeoutInMilliseconds), [this] {
            return m_next != nullptr;
        })) << m_error;
        m_reader = std::move(m_next);
    }

    // Waits until the ring shows a frame of that value.
    void waitFor(uint8_t value) {
        for (;;) {
            m_reader->refresh();
            if (m_reader->frame().visible && m_reader->frame().pixels[0] == value) {
                return;
            }
            pollfd watched{m_reader->pollDescriptor(), POLLIN, 0};
            ASSERT_EQ(poll(&watched, 1, kTimeoutInMilliseconds), 1) << "no frame of value " << int(value);
        }
    }

    // The first frame, of value 1, presented by that object.
    void startWithAFrameOf(uint64_t presenter) {
        loadLibrary();
        ASSERT_TRUE(m_publisher->start());
        m_setPresenter(presenter, false);
        m_show(64, 36, 1);
        takeRing();
        waitFor(1);
    }

    std::mutex m_mutex; // guards the next three
    std::condition_variable m_changed;
    std::unique_ptr<FrameReader> m_next;
    std::string m_error;
    int m_rings = 0;

    std::unique_ptr<FramePublisher> m_publisher;
    std::unique_ptr<FrameReader> m_reader;
    ShowFrameFunction m_show = nullptr;
    SetPresenterFunction m_setPresenter = nullptr;
    CountFramesFunction m_count = nullptr;
    HasWakeupFunction m_hasWakeup = nullptr;
};

TEST_F(FramePublisherTest, WithoutALibraryNothingStarts) {
    EXPECT_FALSE(m_publisher->start());
}

TEST_F(FramePublisherTest, FramesArriveWhileTheMainThreadDoesSomethingElse) {
    EXPECT_FALSE(m_publisher->start());
    loadLibrary();
    ASSERT_TRUE(m_publisher->start());
    m_show(64, 36, 1);
    takeRing();
    waitFor(1);
    for (uint8_t value = 2; value < 50; ++value) {
        m_show(64, 36, value);
        waitFor(value);
    }
    EXPECT_EQ(m_rings, 1);
}

TEST_F(FramePublisherTest, ALargerFrameComesInARingOfItsOwn) {
    loadLibrary();
    ASSERT_TRUE(m_publisher->start());
    m_show(64, 36, 1);
    takeRing();
    waitFor(1);
    m_show(1920, 1080, 2);
    takeRing();
    waitFor(2);
    EXPECT_EQ(m_reader->frame().width, 1920U);
    m_show(64, 36, 3);
    waitFor(3);
    EXPECT_EQ(m_rings, 2) << "a ring for large frames takes small ones as well";
}

TEST_F(FramePublisherTest, AFrameForWhichThereIsNoRingHidesTheVideo) {
    loadLibrary();
    ASSERT_TRUE(m_publisher->start());
    m_show(64, 36, 1);
    takeRing();
    waitFor(1);
    m_show(kMaximumFrameSide + 1, 1, 2);
    while (m_reader->frame().visible) {
        pollfd watched{m_reader->pollDescriptor(), POLLIN, 0};
        ASSERT_EQ(poll(&watched, 1, kTimeoutInMilliseconds), 1);
        m_reader->refresh();
    }
    EXPECT_EQ(m_rings, 1);
}

TEST_F(FramePublisherTest, FramesOfAnObjectThatIsLeftOutDoNotArrive) {
    std::atomic<int> changes{0};
    m_publisher->setOnChange([&] { changes++; });
    const auto waitForChange = [&](int count) {
        const auto end = std::chrono::steady_clock::now() + std::chrono::milliseconds(kTimeoutInMilliseconds);
        while (changes < count && std::chrono::steady_clock::now() < end) {
            usleep(1000);
        }
        return changes.load();
    };
    startWithAFrameOf(7);
    EXPECT_EQ(waitForChange(1), 1) << "another object presents";
    m_publisher->watch(7);
    m_publisher->leaveOut(7);
    for (uint8_t value = 2; value < 10; ++value) {
        m_show(64, 36, value);
        EXPECT_EQ(waitForChange(value), value) << "each frame of the watched object is reported";
    }
    m_reader->refresh();
    EXPECT_EQ(m_reader->frame().pixels[0], 1);
    m_setPresenter(7, true);
    m_show(64, 36, 20);
    waitFor(20); // full screen is not left out
    m_setPresenter(8, false);
    m_show(64, 36, 21);
    waitFor(21); // nor is another object
    m_setPresenter(7, false);
    m_show(64, 36, 22);
    waitFor(22); // that there is video again
    m_show(64, 36, 23);
    EXPECT_EQ(waitForChange(13), 13);
    m_reader->refresh();
    EXPECT_EQ(m_reader->frame().pixels[0], 22);
    m_publisher->leaveOut(0);
    m_reader->refresh();
    EXPECT_EQ(m_reader->frame().pixels[0], 23) << "the newest frame is there at once";
    m_publisher.reset(); // before what the callback uses
}

TEST_F(FramePublisherTest, TheNewestFrameIsThereWhenAskedForWhileTheThreadIsBusy) {
    std::promise<void> entered;
    std::promise<void> left;
    m_publisher->setOnChange([&] {
        entered.set_value();
        left.get_future().wait();
    });
    startWithAFrameOf(7);
    entered.get_future().wait();
    m_show(64, 36, 2);
    m_publisher->publishNewest();
    m_reader->refresh();
    EXPECT_EQ(m_reader->frame().pixels[0], 2);
    left.set_value();
    m_publisher.reset(); // before what the callback uses
}

TEST_F(FramePublisherTest, AfterItsEndTheLibraryIsFree) {
    loadLibrary();
    ASSERT_TRUE(m_publisher->start());
    m_show(64, 36, 1);
    takeRing();
    waitFor(1);
    EXPECT_TRUE(m_hasWakeup());
    m_publisher.reset();
    EXPECT_FALSE(m_hasWakeup());
    EXPECT_EQ(m_count(), 0);
    waitFor(1); // what is in the ring stays
}

TEST_F(FramePublisherTest, BetweenFramesNoneIsHeld) {
    loadLibrary();
    ASSERT_TRUE(m_publisher->start());
    m_show(64, 36, 1);
    takeRing();
    waitFor(1);
    const auto end = std::chrono::steady_clock::now() + std::chrono::milliseconds(kTimeoutInMilliseconds);
    while (m_count() != 0 && std::chrono::steady_clock::now() < end) {
        usleep(1000);
    }
    EXPECT_EQ(m_count(), 0);
}

} // namespace
} // namespace desktop
