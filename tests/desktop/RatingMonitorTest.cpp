// When a parental rating is reported, and as what.
#include "desktop/platform/RatingMonitor.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using namespace desktop;

namespace {

constexpr TELIX_JS_VB_HANDLE kOwner = 7;

std::vector<std::string> g_reports; // "kind rating"

TELIX_RETCODE_ENUM_T onChange(TELIX_JS_VB_HANDLE object, ___UINT8*, TELIX_JS_SI_PARENTALRATING_HANDLE rating,
                              ___UINT8*) {
    EXPECT_EQ(object, kOwner);
    g_reports.push_back("change " + std::to_string(rating));
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T onError(TELIX_JS_VB_HANDLE object, ___UINT8*, TELIX_JS_SI_PARENTALRATING_HANDLE rating,
                             ___UINT8*) {
    EXPECT_EQ(object, kOwner);
    g_reports.push_back("error " + std::to_string(rating));
    return TELIX_RETCODE_SUCCESS;
}

class RatingMonitorTest : public testing::Test {
protected:
    void SetUp() override {
        g_reports.clear();
        m_callbacks.onRatingChange.set(onChange);
        m_callbacks.onRatingError.set(onError);
    }

    static std::string change(TELIX_JS_SI_PARENTALRATING_HANDLE rating) {
        return "change " + std::to_string(rating);
    }

    Programmes m_programmes;
    BroadcastCallbacks m_callbacks;
    RatingMonitor m_monitor{m_programmes, m_callbacks};
    const TELIX_JS_SI_PARENTALRATING_HANDLE m_age = m_programmes.addRating("DEU", 9);
    const TELIX_JS_SI_PARENTALRATING_HANDLE m_otherAge = m_programmes.addRating("DEU", 13);
    const TELIX_JS_SI_PARENTALRATING_HANDLE m_own = m_programmes.addRating("DEU", kParentalRatingLastAge + 1);
};

TEST_F(RatingMonitorTest, ReportsARatingWhenItChanges) {
    m_monitor.update(kOwner, 0); // a service without ratings
    EXPECT_TRUE(g_reports.empty());
    m_monitor.update(kOwner, m_age);
    m_monitor.update(kOwner, m_age);
    m_monitor.update(kOwner, m_otherAge);
    m_monitor.update(kOwner, 0);
    EXPECT_EQ(g_reports, (std::vector<std::string>{change(m_age), change(m_otherAge), change(0)}));
}

TEST_F(RatingMonitorTest, ReportsTheFirstRatingOfEachService) {
    m_monitor.update(kOwner, m_age);
    m_monitor.reset();
    m_monitor.update(kOwner, m_age);
    m_monitor.reset();
    m_monitor.update(kOwner, 0);
    EXPECT_EQ(g_reports, (std::vector<std::string>{change(m_age), change(m_age)}));
}

TEST_F(RatingMonitorTest, ReportsABroadcastersOwnRatingAsAnError) {
    m_monitor.update(kOwner, m_own);
    EXPECT_EQ(g_reports, std::vector<std::string>{"error " + std::to_string(m_own)});
}

TEST_F(RatingMonitorTest, ReportsAForcedRatingAlsoIfItIsTheSame) {
    m_monitor.update(kOwner, m_age);
    m_monitor.force(kOwner, m_age);
    m_monitor.update(kOwner, m_age);
    m_monitor.force(kOwner, 0);
    m_monitor.force(kOwner, 0);
    EXPECT_EQ(g_reports, (std::vector<std::string>{change(m_age), change(m_age), change(0), change(0)}));
}

} // namespace
