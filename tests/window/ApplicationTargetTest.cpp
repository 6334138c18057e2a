// What URLs lead to that start applications. Servers are in the tests of the window.
#include <gtest/gtest.h>

#include <glib.h>

#include <string>

#include "desktop/window/shared/ApplicationTarget.h"
#include "tests/support/TemporaryFolder.h"

using namespace desktop;

namespace {

class ApplicationTargetTest : public testing::Test {
protected:
    std::string write(const std::string& name, const std::string& content) const {
        g_file_set_contents(m_folder.file(name).c_str(), content.c_str(), -1, nullptr);
        return "file://" + m_folder.file(name);
    }

    static SignalledApplication signalled(uint32_t organisation, uint16_t application, const std::string& url,
                                          uint8_t controlCode = kControlCodePresent) {
        SignalledApplication result;
        result.id = {organisation, application};
        result.url = url;
        result.controlCode = controlCode;
        return result;
    }

    // An XML AIT; each application is its control code, its priority and its page in this folder.
    struct Entry {
        std::string controlCode;
        int priority;
        std::string page;
    };
    std::string xmlAit(const std::vector<Entry>& entries) {
        std::string text = "<ServiceDiscovery xmlns=\"urn:dvb:mhp:2009\" "
                           "xmlns:xsi=\"http://www.w3.org/2001/XMLSchema-instance\">"
                           "<ApplicationDiscovery DomainName=\"example\"><ApplicationList>";
        int number = 0;
        for (const Entry& entry : entries) {
            text += "<Application><appName "
                    "Language=\"eng\">Name</appName><applicationIdentifier><orgId>17</orgId>"
                    "<appId>" +
                    std::to_string(++number) +
                    "</appId></applicationIdentifier><applicationDescriptor "
                    "xsi:type=\"HbbTVApplicationDescriptor\">"
                    "<type><OtherApp>application/vnd.hbbtv.xhtml+xml</OtherApp></type><controlCode>" +
                    entry.controlCode +
                    "</controlCode><visibility>VISIBLE_ALL</visibility><serviceBound>false</"
                    "serviceBound><priority>" +
                    std::to_string(entry.priority) +
                    "</priority><version>01</version><mhpVersion><profile>0</profile><versionMajor>1</"
                    "versionMajor>"
                    "<versionMinor>1</versionMinor><versionMicro>1</versionMicro></mhpVersion>"
                    "</applicationDescriptor><applicationTransport "
                    "xsi:type=\"HTTPTransportType\"><URLBase>file://" +
                    m_folder.path() + "/</URLBase></applicationTransport><applicationLocation>" + entry.page +
                    "</applicationLocation></Application>";
        }
        return text + "</ApplicationList></ApplicationDiscovery></ServiceDiscovery>";
    }

    TemporaryFolder m_folder;
};

TEST_F(ApplicationTargetTest, APageIsItsOwnTarget) {
    const std::string page = write("page.html", "x") + "?a=1#b";
    const ApplicationTarget target = findApplication(page, {"agent"}, {});
    EXPECT_EQ(target.url, page);
    EXPECT_EQ(target.error, "");
    EXPECT_FALSE(target.signalled);
    EXPECT_EQ(findApplication("file://" + m_folder.file("none.html"), {"agent"}, {}).error, "No such file");
}

TEST_F(ApplicationTargetTest, ASignalledApplicationIsFoundByItsHexadecimalIds) {
    const std::string page = write("page.html", "x");
    const auto target = findApplication("dvb://current.ait/1F.A", {"agent"}, {signalled(0x1f, 0xa, page)});
    EXPECT_EQ(target.url, page);
    EXPECT_EQ(target.error, "");
    ASSERT_TRUE(target.signalled);
    EXPECT_EQ(target.signalled->id, (ApplicationId{0x1f, 0xa}));
    EXPECT_EQ(findApplication("DVB://current.ait/0001f.000a", {"agent"}, {signalled(0x1f, 0xa, page)}).url,
              page);
}

TEST_F(ApplicationTargetTest, QueryAndFragmentAreAddedToThoseOfTheSignalling) {
    const std::string page = write("page.html", "x");
    const struct {
        const char* signalled;
        const char* added;
        const char* result;
    } cases[] = {{"", "?a=1", "?a=1"},
                 {"", "#b", "#b"},
                 {"?x=0", "?a=1#b", "?x=0&a=1#b"},
                 {"?x=0#y", "?a=1", "?x=0&a=1#y"},
                 {"#y", "#b", "#b"},
                 {"", "?a=#b?c", "?a=#b?c"}};
    for (const auto& each : cases) {
        EXPECT_EQ(findApplication(std::string("dvb://current.ait/1.1") + each.added, {"agent"},
                                  {signalled(1, 1, page + each.signalled)})
                      .url,
                  page + each.result);
    }
}

TEST_F(ApplicationTargetTest, AnAddressMayHaveAnyLength) {
    const std::string page = write("page.html", "x");
    const std::string query = "?" + std::string(4000000, 'a');
    EXPECT_EQ(findApplication("dvb://current.ait/1.1" + query, {"agent"}, {signalled(1, 1, page)}).url,
              page + query);
    EXPECT_NE(findApplication("dvb://current.ait/" + std::string(4000000, '0'), {"agent"}, {}).error, "");
}

TEST_F(ApplicationTargetTest, AnApplicationThatIsNotSignalledOrMayNotRunIsRefused) {
    const std::string page = write("page.html", "x");
    const std::vector<SignalledApplication> list{signalled(1, 1, page, kControlCodeKill),
                                                 signalled(1, 2, page, kControlCodeDisabled),
                                                 signalled(1, 3, page + "missing")};
    for (const char* url : {"dvb://current.ait/1.1", "dvb://current.ait/1.2", "dvb://current.ait/1.9",
                            "dvb://current.ait/1.3", "dvb://current.ait/1", "dvb://current.ait/x.1",
                            "dvb://current.ait/123456789.1", "dvb://other.ait/1.1", "dvb://1.2.3/"}) {
        EXPECT_NE(findApplication(url, {"agent"}, list).error, "") << url;
    }
}

TEST_F(ApplicationTargetTest, AnXmlAitLeadsToItsApplicationWithTheHighestPriorityThatCanBeLoaded) {
    write("low.html", "x");
    write("high.html", "x");
    const std::string document = write("list.aitx", xmlAit({{"AUTOSTART", 1, "low.html"},
                                                            {"AUTOSTART", 7, "missing.html"},
                                                            {"AUTOSTART", 5, "high.html"},
                                                            {"PRESENT", 9, "low.html"},
                                                            {"KILL", 99, "low.html"}}));
    const ApplicationTarget target = findApplication(document, {"agent"}, {});
    EXPECT_EQ(target.error, "");
    EXPECT_EQ(target.url, "file://" + m_folder.file("high.html"));
    EXPECT_FALSE(target.signalled);
}

TEST_F(ApplicationTargetTest, AnXmlAitWithoutAnApplicationToStartSaysWhy) {
    const std::string document = write("list.aitx", xmlAit({{"KILL", 1, "low.html"}}));
    EXPECT_EQ(findApplication(document, {"agent"}, {}).error, "the XML AIT has no application to start");
    const std::string missing = write("missing.aitx", xmlAit({{"AUTOSTART", 1, "none.html"}}));
    EXPECT_EQ(findApplication(missing, {"agent"}, {}).error,
              "file://" + m_folder.file("none.html") + ": No such file");
    EXPECT_NE(findApplication(write("bad.aitx", "<html></html>"), {"agent"}, {}).error, "");
}

TEST_F(ApplicationTargetTest, OnlyTheOptionTakesADocumentOfAnotherNameAsXmlAit) {
    write("low.html", "x");
    const std::string document = write("list.xml", xmlAit({{"AUTOSTART", 1, "low.html"}}));
    EXPECT_EQ(findApplication(document, {"agent"}, {}).url, document);
    EXPECT_EQ(findApplicationOfXmlAit(document, {"agent"}).url, "file://" + m_folder.file("low.html"));
    EXPECT_NE(findApplicationOfXmlAit(write("page.html", "x"), {"agent"}).error, "");
    EXPECT_EQ(findApplicationOfXmlAit("data:text/html,x", {"agent"}).error, "not an XML AIT");
}

} // namespace
