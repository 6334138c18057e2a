// Who receives a stream event, and how often.
#include "desktop/platform/StreamEvents.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using namespace desktop;

namespace {

constexpr TELIX_JS_VB_HANDLE kObject = 1;
constexpr TELIX_JS_VB_HANDLE kOtherObject = 2;
constexpr uint8_t kComponentTag = 0x1F;

std::vector<std::string> g_calls; // "object name data status"

TELIX_RETCODE_ENUM_T onEvent(TELIX_JS_VB_HANDLE object, ___UINT8*, ___UINT8*, ___UINT8* name, ___UINT8* data,
                             ___UINT32 length, ___UINT8* status) {
    g_calls.push_back(std::to_string(object) + " " + reinterpret_cast<char*>(name) + " " +
                      std::string(reinterpret_cast<char*>(data), length) + " " +
                      reinterpret_cast<char*>(status));
    return TELIX_RETCODE_SUCCESS;
}

class StreamEventsTest : public testing::Test {
protected:
    void SetUp() override { g_calls.clear(); }

    StreamEvents m_events;
};

TEST_F(StreamEventsTest, DispatchesEachVersionOnceHoweverOftenItIsRepeated) {
    m_events.subscribe(kObject, onEvent, "10", "1f", "red");
    m_events.dispatch(kObject, kComponentTag, {10, 3, {0x00, 0xAB}});
    m_events.dispatch(kObject, kComponentTag, {10, 3, {0x00, 0xAB}});
    EXPECT_EQ(g_calls, std::vector<std::string>{"1 red 00ab trigger"});
    m_events.dispatch(kObject, kComponentTag, {10, 4, {}});
    EXPECT_EQ(g_calls.size(), 2U);
}

TEST_F(StreamEventsTest, DispatchesToTheObjectComponentAndIdThatWereSubscribed) {
    m_events.subscribe(kObject, onEvent, "0x0A", "1f", "hexadecimal");
    m_events.subscribe(kObject, onEvent, "0X0a", "1F", "capital");
    m_events.subscribe(kObject, onEvent, "11", "1f", "another id");
    m_events.subscribe(kObject, onEvent, "10", "20", "another component");
    m_events.subscribe(kOtherObject, onEvent, "10", "1f", "another object");
    m_events.dispatch(kObject, kComponentTag, {10, 0, {}});
    EXPECT_EQ(g_calls, (std::vector<std::string>{"1 hexadecimal  trigger", "1 capital  trigger"}));
}

TEST_F(StreamEventsTest, EndsOneOfTwoEqualSubscriptionsAtATime) {
    m_events.subscribe(kObject, onEvent, "10", "1f", "first");
    m_events.subscribe(kObject, onEvent, "10", "1f", "second");
    EXPECT_FALSE(m_events.unsubscribe(kOtherObject, onEvent, "10", "1f"));
    EXPECT_TRUE(m_events.unsubscribe(kObject, onEvent, "10", "1f"));
    m_events.dispatch(kObject, kComponentTag, {10, 0, {}});
    EXPECT_EQ(g_calls, std::vector<std::string>{"1 second  trigger"});
    EXPECT_TRUE(m_events.unsubscribe(kObject, onEvent, "10", "1f"));
    EXPECT_FALSE(m_events.unsubscribe(kObject, onEvent, "10", "1f"));
    EXPECT_TRUE(m_events.subscriptions().empty());
}

TEST_F(StreamEventsTest, DispatchesInjectedEventsToEveryObjectThatIsMeant) {
    m_events.subscribe(kObject, onEvent, "10", "1f", "red");
    m_events.subscribe(kOtherObject, onEvent, "10", "1f", "red");
    m_events.subscribe(kOtherObject, onEvent, "10", "1f", "green");
    const auto isRed = [](const StreamEvents::Subscription& each) { return each.name == "red"; };
    EXPECT_EQ(m_events.dispatchTo(isRed, {0x01}, "error"), 2U);
    EXPECT_EQ(g_calls, (std::vector<std::string>{"1 red 01 error", "2 red 01 error"}));
}

} // namespace
