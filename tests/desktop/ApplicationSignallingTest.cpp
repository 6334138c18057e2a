// The applications of the test multiplex, as the window sees them.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>

#include "desktop/platform/ApplicationSignalling.h"
#include "desktop/platform/Broadcast.h"
#include "desktop/platform/telix_applications.h"
#include "tests/desktop/Received.h"

using namespace desktop;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

std::atomic<unsigned int> wakeups{0};

// A snapshot for the time of a scope.
class Applications {
public:
    Applications() { telix_desktop_acquire_applications(&m_record); }
    ~Applications() { telix_desktop_release_applications(&m_record); }
    Applications(const Applications&) = delete;
    Applications& operator=(const Applications&) = delete;

    const telix_desktop_applications& record() const { return m_record; }
    bool isKnown() const { return m_record.state == TELIX_DESKTOP_SIGNALLING_KNOWN; }
    std::vector<std::string> urls() const {
        std::vector<std::string> urls;
        for (size_t index = 0; index < m_record.applicationCount; ++index) {
            urls.emplace_back(m_record.applications[index].url);
        }
        return urls;
    }

    // What the rules make of an event while nothing, or the application of a URL, runs.
    std::string decide(telix_desktop_application_event event, const std::string& runningUrl) const {
        telix_desktop_running_application running{};
        for (size_t index = 0; index < m_record.applicationCount; ++index) {
            const telix_desktop_application& each = m_record.applications[index];
            if (each.url == runningUrl) {
                running = {1, 1, each.serviceBound, {each.organisationId, each.applicationId}};
            }
        }
        telix_desktop_application_decision decision{};
        telix_desktop_decide_application(event, &m_record, &running, nullptr, 0, &decision);
        return std::string(decision.endsRunning != 0 ? "end " : "") +
               (decision.started ? decision.started->url : "");
    }

private:
    telix_desktop_applications m_record{};
};

const char kDemonstration[] = "http://127.0.0.1/apps/demo/index.html";
const char kMedia[] = "http://127.0.0.1/apps/media/index.html";

class ApplicationSignallingTest : public testing::Test {
protected:
    void SetUp() override {
        telix_desktop_set_applications_wakeup([](void*) { ++wakeups; }, nullptr);
    }
    void TearDown() override { telix_desktop_set_applications_wakeup(nullptr, nullptr); }

    static bool waitForUrls(const std::vector<std::string>& urls) {
        return waitUntil([&] {
            const Applications applications;
            return applications.isKnown() && applications.urls() == urls;
        });
    }

    static void zap(size_t number) {
        ASSERT_TRUE(Broadcast::instance().arbiter().zap(Broadcast::instance().channels().list()[number - 1]));
    }
};

TEST_F(ApplicationSignallingTest, ListsWhatTheCurrentChannelSignalsWithoutAnObject) {
    ASSERT_TRUE(waitForUrls({kDemonstration, kMedia}));
    EXPECT_GT(wakeups, 0U);
    const Applications applications;
    const telix_desktop_application& first = applications.record().applications[0];
    EXPECT_STREQ(first.name, "Demonstration");
    EXPECT_EQ(first.controlCode, 1);
    EXPECT_EQ(first.serviceBound, 0);
    ASSERT_EQ(first.boundaryCount, 1U);
    EXPECT_STREQ(first.boundaries[0], "http://127.0.0.1/apps/");
    EXPECT_EQ(applications.record().applications[1].controlCode, 2);
    EXPECT_EQ(applications.record().skippedCount, 0U);
    EXPECT_EQ(applications.decide(TELIX_DESKTOP_SIGNALLING_CHANGED, ""), kDemonstration);
    EXPECT_EQ(applications.decide(TELIX_DESKTOP_SIGNALLING_CHANGED, kMedia), "");
}

TEST_F(ApplicationSignallingTest, FollowsTheViewerToOtherChannels) {
    ASSERT_TRUE(waitForUrls({kDemonstration, kMedia}));
    const uint64_t service = Applications().record().service;
    zap(2);
    ASSERT_TRUE(waitForUrls({kDemonstration}));
    EXPECT_EQ(Applications().record().service, service + 1);
    zap(3);
    ASSERT_TRUE(waitForUrls({}));
    EXPECT_EQ(Applications().record().service, service + 2);
}

TEST_F(ApplicationSignallingTest, KeepsWhatItKnowsWhileAnObjectTunesToTheSameChannel) {
    ASSERT_TRUE(waitForUrls({kDemonstration, kMedia}));
    const uint64_t serial = Applications().record().serial;
    TELIX_JS_VB_HANDLE object = 0;
    ASSERT_EQ(TELIX_JS_VB_GetHandle(&object), 0);
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(object), 0);
    ASSERT_TRUE(waitUntil([&] {
        TELIX_PLAYSTATE_ENUM_T state = TELIX_PLAYSTATE_UNREALIZED;
        TELIX_JS_VB_GetPlayBackState(object, &state);
        return state == TELIX_PLAYSTATE_PRESENTING;
    }));
    EXPECT_EQ(Applications().record().serial, serial);
    ASSERT_EQ(TELIX_JS_VB_SetChannel(object, Broadcast::instance().channels().list()[2], 0), 0);
    EXPECT_TRUE(waitForUrls({}));
    TELIX_JS_VB_Release(object);
}

TEST_F(ApplicationSignallingTest, KeepsWhatRunsWhenAChannelCannotBeReceived) {
    ASSERT_TRUE(waitForUrls({kDemonstration, kMedia}));
    const uint64_t service = Applications().record().service;
    TELIX_JS_VB_HANDLE object = 0;
    ASSERT_EQ(TELIX_JS_VB_GetHandle(&object), 0);
    const TELIX_JS_CM_HANDLE unknown = Broadcast::instance().channels().makeByTriplet(1, 2, 3);
    ASSERT_EQ(TELIX_JS_VB_SetChannel(object, unknown, 0), 0);
    ASSERT_TRUE(waitUntil([] { return Applications().record().state == TELIX_DESKTOP_SIGNALLING_NONE; }));
    EXPECT_EQ(Applications().record().service, service);
    ASSERT_EQ(TELIX_JS_VB_SetChannel(object, Broadcast::instance().channels().list()[0], 0), 0);
    EXPECT_TRUE(waitForUrls({kDemonstration, kMedia}));
    EXPECT_EQ(Applications().record().service, service); // the same one again
    TELIX_JS_VB_Release(object);
}

TEST_F(ApplicationSignallingTest, AddsAPageThatIsSignalledToItsChannelAlone) {
    const char page[] = "http://127.0.0.1/page.html";
    ASSERT_TRUE(waitForUrls({kDemonstration, kMedia}));
    ASSERT_EQ(telix_desktop_signal_application(page, 3), 1);
    zap(3);
    ASSERT_TRUE(waitForUrls({page}));
    EXPECT_EQ(Applications().decide(TELIX_DESKTOP_SIGNALLING_CHANGED, ""), page);
    const uint32_t id = Applications().record().applications[0].applicationId;
    ASSERT_EQ(telix_desktop_signal_application(page, 0), 1); // the current one: the same
    ASSERT_EQ(telix_desktop_signal_application(page, 1), 1);
    zap(1);
    ASSERT_TRUE(waitForUrls({kDemonstration, kMedia, page}));
    const Applications first;
    EXPECT_EQ(first.record().applications[2].applicationId, id);         // so that it goes on
    EXPECT_EQ(first.decide(TELIX_DESKTOP_SIGNALLING_CHANGED, ""), page); // before those of the broadcast
    EXPECT_EQ(first.decide(TELIX_DESKTOP_SIGNALLING_CHANGED, page), "");
    const uint64_t serial = first.record().serial;
    ASSERT_EQ(telix_desktop_signal_application(nullptr, 1), 1);
    ASSERT_TRUE(waitForUrls({kDemonstration, kMedia}));
    EXPECT_GT(Applications().record().serial, serial);
    EXPECT_EQ(telix_desktop_signal_application(page, 99), 0);
    EXPECT_EQ(telix_desktop_signal_application("page.html", 1), 0);
}

TEST(ApplicationExportsTest, ParseXmlAitsForTheWindow) {
    const std::string document =
        "<ServiceDiscovery><ApplicationDiscovery><ApplicationList><Application>"
        "<applicationIdentifier><orgId>1</orgId><appId>2</appId></applicationIdentifier>"
        "<applicationDescriptor><controlCode>AUTOSTART</controlCode></applicationDescriptor>"
        "<applicationLocation>http://a.example/</applicationLocation></Application>"
        "</ApplicationList></ApplicationDiscovery></ServiceDiscovery>";
    telix_desktop_applications applications{};
    ASSERT_EQ(telix_desktop_parse_xml_ait(document.data(), document.size(), &applications), 1);
    ASSERT_EQ(applications.applicationCount, 1U);
    EXPECT_STREQ(applications.applications[0].url, "http://a.example/");
    telix_desktop_running_application none{};
    telix_desktop_application_decision decision{};
    telix_desktop_decide_application(TELIX_DESKTOP_SIGNALLING_CHANGED, &applications, &none, nullptr, 0,
                                     &decision);
    EXPECT_EQ(decision.started, applications.applications);
    const telix_desktop_application_id failed{1, 2};
    telix_desktop_decide_application(TELIX_DESKTOP_LOAD_FAILED, &applications, &none, &failed, 1, &decision);
    EXPECT_EQ(decision.started, nullptr);
    telix_desktop_release_applications(&applications);
    EXPECT_EQ(applications.owner, nullptr);
    EXPECT_EQ(telix_desktop_parse_xml_ait("<a/>", 4, &applications), 0);
    ASSERT_EQ(applications.skippedCount, 1U);
    EXPECT_THAT(applications.skipped[0], HasSubstr("<a>"));
    telix_desktop_release_applications(&applications);
}

TEST(ApplicationExportsTest, HandOutWhatIsSignalledOfAnApplication) {
    const std::string document =
        "<ServiceDiscovery><ApplicationDiscovery><ApplicationList><Application><appName>Text</appName>"
        "<applicationIdentifier><orgId>7</orgId><appId>9</appId></applicationIdentifier>"
        "<applicationDescriptor><controlCode>PRESENT</controlCode><visibility>VISIBLE_ALL</visibility>"
        "<serviceBound>false</serviceBound><priority>1f</priority></applicationDescriptor>"
        "<applicationUsageDescriptor><ApplicationUsage>urn:dvb:mhp:2009:digitalText</ApplicationUsage>"
        "</applicationUsageDescriptor><applicationBoundary><BoundaryExtension>http://b.example/"
        "</BoundaryExtension></applicationBoundary><applicationLocation>http://a.example/"
        "</applicationLocation></Application></ApplicationList></ApplicationDiscovery></ServiceDiscovery>";
    telix_desktop_applications applications{};
    ASSERT_EQ(telix_desktop_parse_xml_ait(document.data(), document.size(), &applications), 1);
    ASSERT_EQ(applications.applicationCount, 1U);
    const telix_desktop_application& record = applications.applications[0];
    EXPECT_EQ(record.organisationId, 7U);
    EXPECT_EQ(record.applicationId, 9U);
    EXPECT_EQ(record.controlCode, 2U);
    EXPECT_EQ(record.serviceBound, 0U);
    EXPECT_EQ(record.visibility, 3U);
    EXPECT_EQ(record.priority, 0x1FU);
    EXPECT_EQ(record.usage, 1U);
    EXPECT_STREQ(record.name, "Text");
    EXPECT_STREQ(record.url, "http://a.example/");
    ASSERT_EQ(record.boundaryCount, 1U);
    EXPECT_STREQ(record.boundaries[0], "http://b.example/");
    telix_desktop_release_applications(&applications);
}

TEST(SignallingStateTest, AddsAnInjectedApplicationToWhatTheBroadcastSignals) {
    ApplicationSignalling signalling;
    ApplicationList list;
    list.applications.emplace_back();
    const auto count = [&signalling] { return signalling.snapshot().list.applications.size(); };
    EXPECT_FALSE(signalling.signal(1, "page.html", 1, true));
    ASSERT_TRUE(signalling.signal(1, "http://a.example/", 1, true));
    signalling.onServiceSelected(1);
    EXPECT_EQ(count(), 0U); // nothing is known before the broadcast has signalled
    signalling.onApplications(1, list);
    EXPECT_EQ(count(), 2U);
    signalling.onServiceLost();
    EXPECT_EQ(count(), 0U);
    signalling.onServiceSelected(2);
    signalling.onApplications(2, list);
    EXPECT_EQ(count(), 1U);
}

TEST(SignallingStateTest, IgnoresWhatAnEarlierServiceSignals) {
    ApplicationSignalling signalling;
    const auto state = [&signalling] { return signalling.snapshot().state; };
    signalling.onApplications(1, {});
    EXPECT_EQ(state(), ApplicationSignalling::State::NoService);
    signalling.onServiceSelected(1);
    signalling.onServiceSelected(2);
    signalling.onApplications(1, {});
    EXPECT_EQ(state(), ApplicationSignalling::State::Awaited);
    signalling.onServiceLost();
    signalling.onApplications(2, {});
    EXPECT_EQ(state(), ApplicationSignalling::State::NoService);
    const uint64_t serial = signalling.snapshot().serial;
    signalling.onServiceLost();
    EXPECT_EQ(signalling.snapshot().serial, serial);
}

} // namespace
