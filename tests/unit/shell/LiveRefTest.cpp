// Steps that are posted for an object, which may be gone when they run.
#include "common/LiveRef.h"

#include <memory>
#include <vector>

#include <glib.h>

#include "tests/support/BorderTest.h"
#include "tests/unit/support/SameAddress.h"

using ::testing::ElementsAre;
using ::testing::IsEmpty;

namespace {

struct Receiver {
    explicit Receiver(int ownNumber) : number(ownNumber) {}

    const int number;
    const LiveRegistration<Receiver> live{*this};
};

std::vector<int> g_served;

int serveIdle(void* object) {
    g_served.push_back(static_cast<Receiver*>(object)->number);
    return 0;
}

void serveCall(void* object) {
    g_served.push_back(static_cast<Receiver*>(object)->number);
}

class LiveRefTest : public BorderTest {
protected:
    LiveRefTest() { g_served.clear(); }

    // Both ways to the browser thread, from another one.
    void postBoth(const LiveRef<Receiver>& receiver) {
        onPlatformThread([&] {
            postIdleIfAlive(receiver, serveIdle);
            postAsyncCallIfAlive(&m_npp, receiver, serveCall);
        });
    }

private:
    NPP_t m_npp{};
};

TEST_F(LiveRefTest, AStepRunsOnceOnTheBrowserThreadForItsObject) {
    const Receiver receiver(1);
    postBoth(receiver.live.ref());
    EXPECT_THAT(g_served, IsEmpty());
    browser.pump();
    EXPECT_THAT(g_served, ElementsAre(1, 1));
    browser.pump();
    EXPECT_EQ(g_served.size(), 2U);
}

TEST_F(LiveRefTest, OneStepTakesTheIdleSourceAndTheOtherTheBrowsersCall) {
    const Receiver receiver(1);
    postIdleIfAlive(receiver.live.ref(), serveIdle);
    EXPECT_EQ(log.count("NPN_PluginThreadAsyncCall"), 0U);
    EXPECT_NE(g_main_context_pending(nullptr), FALSE);
    browser.pump();
    postAsyncCallIfAlive(nullptr, receiver.live.ref(), serveCall);
    EXPECT_EQ(log.count("NPN_PluginThreadAsyncCall"), 1U);
    EXPECT_EQ(g_main_context_pending(nullptr), FALSE);
    browser.pump();
    EXPECT_EQ(g_served.size(), 2U);
}

TEST_F(LiveRefTest, StepsOfOneWayRunInTheirOrder) {
    const Receiver first(1);
    const Receiver second(2);
    for (const Receiver* receiver : {&second, &first, &second}) {
        postIdleIfAlive(receiver->live.ref(), serveIdle);
    }
    browser.pump();
    EXPECT_THAT(g_served, ElementsAre(2, 1, 2));
}

TEST_F(LiveRefTest, AStepForAnObjectThatHasGoneIsLeftOut) {
    auto gone = std::make_unique<Receiver>(1);
    const Receiver other(2);
    postBoth(gone->live.ref());
    postBoth(other.live.ref());
    gone.reset();
    browser.pump();
    EXPECT_THAT(g_served, ElementsAre(2, 2));
}

TEST_F(LiveRefTest, TheNextObjectAtTheSameAddressGetsNothingOfItsPredecessor) {
    const SameAddress place(sizeof(Receiver));
    auto receiver = std::make_unique<Receiver>(1);
    const LiveRef<Receiver> first = receiver->live.ref();
    postBoth(first);
    receiver.reset();
    receiver = std::make_unique<Receiver>(2);
    ASSERT_EQ(receiver.get(), first.address());
    EXPECT_EQ(first.get(), nullptr);
    EXPECT_EQ(receiver->live.ref().get(), receiver.get());
    browser.pump();
    EXPECT_THAT(g_served, IsEmpty());
}

TEST_F(LiveRefTest, AnObjectThatGoesTakesNoOtherWithIt) {
    std::vector<std::unique_ptr<Receiver>> receivers;
    std::vector<LiveRef<Receiver>> refs;
    for (int i = 0; i < 5; ++i) {
        receivers.push_back(std::make_unique<Receiver>(i));
        refs.push_back(receivers.back()->live.ref());
    }
    for (const size_t index : {2, 0, 4}) {
        receivers[index].reset();
        for (size_t i = 0; i < refs.size(); ++i) {
            EXPECT_EQ(refs[i].get(), receivers[i].get()) << i << " after " << index;
        }
    }
}

TEST_F(LiveRefTest, NoObjectIsNeverAlive) {
    EXPECT_EQ(LiveRef<Receiver>().get(), nullptr);
    EXPECT_EQ(LiveRef<Receiver>().address(), nullptr);
}

} // namespace
