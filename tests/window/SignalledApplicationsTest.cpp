// Which applications a window starts and ends, as the signalling and its stack change.
#include <gtest/gtest.h>

#include <algorithm>
#include <list>
#include <string>
#include <vector>

#include "desktop/window/shared/SignalledApplications.h"

using namespace desktop;

namespace {

constexpr ApplicationId kFirst{0x11, 1};
constexpr ApplicationId kSecond{0x11, 2};

SignalledApplication application(const ApplicationId& id, uint8_t controlCode, uint8_t priority = 1,
                                 bool isServiceBound = false) {
    SignalledApplication application;
    application.id = id;
    application.controlCode = controlCode;
    application.url = "http://example/" + toString(id);
    application.priority = priority;
    application.isServiceBound = isServiceBound;
    return application;
}

class SignalledApplicationsTest : public testing::Test {
protected:
    // A stack of pages, the last one on top.
    struct Page {
        std::string url;
    };

    static SignalledApplications::Window windowOf(SignalledApplicationsTest& test) {
        SignalledApplications::Window window;
        window.hasApplication = [&test] { return !test.m_pages.empty(); };
        window.open = [&test](const std::string& url) { return test.open(url); };
        window.end = [&test](SignalledApplications::Application lowest) {
            while (std::any_of(test.m_pages.begin(), test.m_pages.end(),
                               [lowest](const Page& page) { return &page == lowest; })) {
                test.close(&test.m_pages.back());
            }
        };
        window.endAll = [&test] {
            while (!test.m_pages.empty()) {
                test.close(&test.m_pages.back());
            }
        };
        return window;
    }

    const Page* open(const std::string& url) {
        m_pages.push_back({url});
        return &m_pages.back();
    }

    void close(const Page* page) {
        m_applications.onEnded(page);
        m_pages.remove_if([page](const Page& each) { return &each == page; });
    }

    std::vector<std::string> urls() const {
        std::vector<std::string> urls;
        for (const Page& page : m_pages) {
            urls.push_back(page.url);
        }
        return urls;
    }

    // The service begins with nothing known.
    void select(uint64_t service) {
        m_signalling.service = service;
        m_signalling.state = TELIX_DESKTOP_SIGNALLING_AWAITED;
        m_signalling.applications.clear();
        ++m_signalling.serial;
        m_applications.update(m_signalling);
    }

    void signal(const std::vector<SignalledApplication>& applications) {
        m_signalling.state = TELIX_DESKTOP_SIGNALLING_KNOWN;
        m_signalling.applications = applications;
        ++m_signalling.serial;
        m_applications.update(m_signalling);
    }

    static std::string urlOf(const ApplicationId& id) { return application(id, 1).url; }

    std::list<Page> m_pages;
    Signalling m_signalling;
    SignalledApplications m_applications{windowOf(*this)};
};

using Urls = std::vector<std::string>;

TEST_F(SignalledApplicationsTest, AnAutostartApplicationStartsWhenItsSignallingIsKnown) {
    select(1);
    EXPECT_EQ(urls(), Urls{});
    signal({application(kFirst, kControlCodeAutostart)});
    EXPECT_EQ(urls(), Urls{urlOf(kFirst)});
    EXPECT_EQ(m_applications.idOf(&m_pages.back()), toString(kFirst));
}

TEST_F(SignalledApplicationsTest, ThePriorityDecides) {
    select(1);
    signal({application(kFirst, kControlCodeAutostart, 1), application(kSecond, kControlCodeAutostart, 2)});
    EXPECT_EQ(urls(), Urls{urlOf(kSecond)});
}

TEST_F(SignalledApplicationsTest, APresentApplicationWaitsAndGoesOn) {
    select(1);
    signal({application(kFirst, kControlCodePresent)});
    EXPECT_EQ(urls(), Urls{});
    signal({application(kFirst, kControlCodeAutostart)});
    signal({application(kFirst, kControlCodePresent)});
    EXPECT_EQ(urls(), Urls{urlOf(kFirst)});
}

TEST_F(SignalledApplicationsTest, KillAndDisabledEndTheApplicationAndTheNextStarts) {
    for (const uint8_t code : {kControlCodeKill, kControlCodeDisabled}) {
        select(1);
        signal({application(kFirst, kControlCodeAutostart)});
        ASSERT_EQ(urls(), Urls{urlOf(kFirst)});
        signal({application(kFirst, code)});
        EXPECT_EQ(urls(), Urls{});
        signal({application(kFirst, code), application(kSecond, kControlCodeAutostart)});
        EXPECT_EQ(urls(), Urls{urlOf(kSecond)});
        m_applications.stop();
    }
}

TEST_F(SignalledApplicationsTest, AnotherServiceEndsAServiceBoundApplicationAtOnce) {
    select(1);
    signal({application(kFirst, kControlCodeAutostart, 1, true)});
    select(2);
    EXPECT_EQ(urls(), Urls{});
}

TEST_F(SignalledApplicationsTest, AnotherServiceThatSignalsTheApplicationKeepsIt) {
    select(1);
    signal({application(kFirst, kControlCodeAutostart)});
    const Page* page = &m_pages.back();
    select(2);
    EXPECT_EQ(urls(), Urls{urlOf(kFirst)});
    signal({application(kSecond, kControlCodeAutostart, 9), application(kFirst, kControlCodePresent)});
    ASSERT_EQ(urls(), Urls{urlOf(kFirst)});
    EXPECT_EQ(&m_pages.back(), page);
}

TEST_F(SignalledApplicationsTest, AnotherServiceThatDoesNotSignalTheApplicationEndsIt) {
    select(1);
    signal({application(kFirst, kControlCodeAutostart)});
    select(2);
    signal({application(kSecond, kControlCodeAutostart)});
    EXPECT_EQ(urls(), Urls{urlOf(kSecond)});
}

TEST_F(SignalledApplicationsTest, WhetherAnApplicationIsServiceBoundFollowsTheSignalling) {
    select(1);
    signal({application(kFirst, kControlCodeAutostart, 1, false)});
    signal({application(kFirst, kControlCodeAutostart, 1, true)});
    select(2);
    EXPECT_EQ(urls(), Urls{});
}

TEST_F(SignalledApplicationsTest, APageOfItsOwnIsNotSubjectToTheSignalling) {
    open("http://example/own");
    select(1);
    signal({application(kFirst, kControlCodeAutostart)});
    EXPECT_EQ(urls(), Urls{"http://example/own"});
    EXPECT_EQ(m_applications.idOf(&m_pages.back()), "");
}

TEST_F(SignalledApplicationsTest, AHandOverToAPageMakesTheSetIndependentOfTheSignalling) {
    select(1);
    signal({application(kFirst, kControlCodeAutostart)});
    const Page* first = &m_pages.back();
    open("http://example/own");
    close(first);
    signal({application(kFirst, kControlCodeKill)});
    EXPECT_EQ(urls(), Urls{"http://example/own"});
}

TEST_F(SignalledApplicationsTest, AHandOverByIdKeepsTheSetWithTheSignalling) {
    const auto both = [](uint8_t second) {
        return std::vector<SignalledApplication>{application(kFirst, kControlCodeAutostart),
                                                 application(kSecond, second)};
    };
    select(1);
    signal(both(kControlCodePresent));
    const Page* first = &m_pages.back();
    m_applications.onOpened(open(urlOf(kSecond)), application(kSecond, kControlCodePresent));
    close(first);
    EXPECT_EQ(m_applications.idOf(&m_pages.back()), toString(kSecond));
    signal(both(kControlCodeKill));
    EXPECT_EQ(urls(), Urls{urlOf(kFirst)});
}

TEST_F(SignalledApplicationsTest, AnApplicationThatCannotBeLoadedGivesWayToTheNext) {
    select(1);
    signal({application(kFirst, kControlCodeAutostart, 2), application(kSecond, kControlCodeAutostart, 1)});
    ASSERT_EQ(urls(), Urls{urlOf(kFirst)});
    EXPECT_TRUE(m_applications.onLoadFailed(&m_pages.back()));
    ASSERT_EQ(urls(), Urls{urlOf(kSecond)});
    EXPECT_TRUE(m_applications.onLoadFailed(&m_pages.back()));
    EXPECT_EQ(urls(), Urls{});
    signal({application(kFirst, kControlCodeAutostart, 2)}); // another try
    EXPECT_EQ(urls(), Urls{urlOf(kFirst)});
}

TEST_F(SignalledApplicationsTest, APageThatCannotBeLoadedIsTheWindowsAffair) {
    open("http://example/own");
    EXPECT_FALSE(m_applications.onLoadFailed(&m_pages.back()));
    EXPECT_EQ(urls(), Urls{"http://example/own"});
}

TEST_F(SignalledApplicationsTest, TheViewerEndsAndStartsTheApplication) {
    select(1);
    signal({application(kFirst, kControlCodeAutostart)});
    open("http://example/opened");
    m_applications.stop();
    EXPECT_EQ(urls(), Urls{});
    m_applications.start();
    EXPECT_EQ(urls(), Urls{urlOf(kFirst)});
    m_applications.start();
    EXPECT_EQ(urls(), Urls{urlOf(kFirst)});
}

TEST_F(SignalledApplicationsTest, AnApplicationThatEndsItselfIsNotStartedAgain) {
    select(1);
    signal({application(kFirst, kControlCodeAutostart)});
    close(&m_pages.back());
    m_applications.update(m_signalling);
    EXPECT_EQ(urls(), Urls{});
}

TEST_F(SignalledApplicationsTest, TheFirstSignallingOfAnotherLibraryIsNoChangeOfTheService) {
    select(7);
    signal({application(kFirst, kControlCodeAutostart, 1, true)});
    m_applications.onLibraryEnded();
    m_signalling = {};
    select(1);
    signal({application(kFirst, kControlCodeAutostart, 1, true)});
    EXPECT_EQ(urls(), Urls{urlOf(kFirst)});
}

} // namespace
