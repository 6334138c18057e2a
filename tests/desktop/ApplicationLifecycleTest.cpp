// Which application starts, goes on or ends.
#include <gtest/gtest.h>

#include "desktop/platform/ApplicationLifecycle.h"

using namespace desktop;

namespace {

constexpr ApplicationId kFirst{1, 1};
constexpr ApplicationId kSecond{1, 2};
constexpr ApplicationId kThird{1, 3};

SignalledApplication entry(ApplicationId id, uint8_t controlCode, uint8_t priority = 1) {
    SignalledApplication application;
    application.id = id;
    application.controlCode = controlCode;
    application.priority = priority;
    return application;
}

RunningApplication running(ApplicationId id, bool isServiceBound = false) {
    return {id, isServiceBound};
}

// "start 1.2", "end", "end, start 1.2" or "nothing".
std::string outcome(LifecycleEvent event, const std::vector<SignalledApplication>& signalled,
                    std::optional<RunningApplication> runs, std::vector<ApplicationId> failed = {}) {
    const LifecycleDecision decision = decide(event, {signalled, runs, std::move(failed)});
    const std::string started =
        decision.started ? "start " + toString(signalled.at(*decision.started).id) : "";
    const std::string ended = decision.endsRunning ? "end" : "";
    const std::string both = ended + (ended.empty() || started.empty() ? "" : ", ") + started;
    return both.empty() ? "nothing" : both;
}

const std::vector<SignalledApplication> kThree = {entry(kFirst, kControlCodeAutostart, 5),
                                                  entry(kSecond, kControlCodeAutostart, 9),
                                                  entry(kThird, kControlCodePresent, 200)};

TEST(ApplicationLifecycleTest, StartsTheAutostartApplicationWithTheHighestPriority) {
    EXPECT_EQ(outcome(LifecycleEvent::SignallingChanged, kThree, std::nullopt), "start 1.2");
    EXPECT_EQ(outcome(LifecycleEvent::SignallingChanged, {}, std::nullopt), "nothing");
    EXPECT_EQ(outcome(LifecycleEvent::SignallingChanged, {entry(kFirst, kControlCodePresent)}, std::nullopt),
              "nothing");
    EXPECT_EQ(outcome(LifecycleEvent::SignallingChanged,
                      {entry(kThird, kControlCodeAutostart), entry(kFirst, kControlCodeAutostart)},
                      std::nullopt),
              "start 1.3"); // the same priority: the first one
}

TEST(ApplicationLifecycleTest, LetsARunningApplicationGoOnThatMayRun) {
    EXPECT_EQ(outcome(LifecycleEvent::SignallingChanged, kThree, running(kFirst)), "nothing");
    EXPECT_EQ(outcome(LifecycleEvent::SignallingChanged, kThree, running(kThird)), "nothing");
}

TEST(ApplicationLifecycleTest, EndsAnApplicationThatIsKilledDisabledOrSignalledNoMore) {
    for (const uint8_t code : {kControlCodeKill, kControlCodeDisabled}) {
        EXPECT_EQ(outcome(LifecycleEvent::SignallingChanged, {entry(kFirst, code)}, running(kFirst)), "end");
        EXPECT_EQ(outcome(LifecycleEvent::SignallingChanged,
                          {entry(kFirst, code), entry(kSecond, kControlCodeAutostart)}, running(kFirst)),
                  "end, start 1.2");
        EXPECT_EQ(outcome(LifecycleEvent::SignallingChanged, {entry(kFirst, code)}, std::nullopt), "nothing");
    }
    EXPECT_EQ(outcome(LifecycleEvent::SignallingChanged, {}, running(kFirst)), "end");
    EXPECT_EQ(
        outcome(LifecycleEvent::SignallingChanged, {entry(kSecond, kControlCodeAutostart)}, running(kFirst)),
        "end, start 1.2");
}

TEST(ApplicationLifecycleTest, EndsAServiceBoundApplicationWithItsServiceAndKeepsOthersUntilTheAit) {
    EXPECT_EQ(outcome(LifecycleEvent::ServiceSelected, {}, running(kFirst, true)), "end");
    EXPECT_EQ(outcome(LifecycleEvent::ServiceSelected, {}, running(kFirst, false)), "nothing");
    EXPECT_EQ(outcome(LifecycleEvent::ServiceSelected, kThree, std::nullopt), "nothing");
}

TEST(ApplicationLifecycleTest, LeavesABroadcastIndependentApplicationAlone) {
    const RunningApplication independent{std::nullopt, true};
    EXPECT_EQ(outcome(LifecycleEvent::ServiceSelected, {}, independent), "nothing");
    EXPECT_EQ(outcome(LifecycleEvent::SignallingChanged, kThree, independent), "nothing");
    EXPECT_EQ(outcome(LifecycleEvent::SignallingChanged, {}, independent), "nothing");
}

TEST(ApplicationLifecycleTest, TriesTheNextOneAfterAFailedLoad) {
    EXPECT_EQ(outcome(LifecycleEvent::LoadFailed, kThree, running(kSecond)), "end, start 1.1");
    EXPECT_EQ(outcome(LifecycleEvent::LoadFailed, kThree, running(kFirst), {kSecond}), "end");
    EXPECT_EQ(outcome(LifecycleEvent::LoadFailed, kThree, std::nullopt, {kSecond}), "start 1.1");
    EXPECT_EQ(outcome(LifecycleEvent::SignallingChanged, kThree, std::nullopt, {kSecond}), "start 1.1");
}

TEST(ApplicationLifecycleTest, StartsNothingAfterAnExit) {
    for (const LifecycleEvent event : {LifecycleEvent::Exited, LifecycleEvent::StoppedByViewer}) {
        EXPECT_EQ(outcome(event, kThree, running(kSecond)), "end");
        EXPECT_EQ(outcome(event, kThree, std::nullopt), "nothing");
    }
}

TEST(ApplicationLifecycleTest, StartsTheAutostartApplicationAgainWhenTheViewerAsksForIt) {
    EXPECT_EQ(outcome(LifecycleEvent::StartedByViewer, kThree, std::nullopt), "start 1.2");
    EXPECT_EQ(outcome(LifecycleEvent::StartedByViewer, kThree, std::nullopt, {kSecond}), "start 1.2");
    EXPECT_EQ(outcome(LifecycleEvent::StartedByViewer, kThree, running(kFirst)), "nothing");
    const RunningApplication independent{std::nullopt, false};
    EXPECT_EQ(outcome(LifecycleEvent::StartedByViewer, kThree, independent), "end, start 1.2");
    EXPECT_EQ(outcome(LifecycleEvent::StartedByViewer, {}, independent), "nothing");
}

} // namespace
