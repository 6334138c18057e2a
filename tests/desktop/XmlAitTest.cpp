// The XML encoding of the AIT.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "desktop/platform/XmlAit.h"

using namespace desktop;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

const char kApplication[] = R"(<mhp:Application>
  <mhp:appName Language="eng"> News &amp; more </mhp:appName>
  <mhp:applicationIdentifier><mhp:orgId>4660</mhp:orgId><mhp:appId>17</mhp:appId></mhp:applicationIdentifier>
  <mhp:applicationDescriptor xsi:type="mhp:HbbTVApplicationDescriptor">
    <mhp:type><mhp:OtherApp>application/vnd.hbbtv.xhtml+xml</mhp:OtherApp></mhp:type>
    <mhp:controlCode>AUTOSTART</mhp:controlCode>
    <mhp:visibility>VISIBLE_ALL</mhp:visibility>
    <mhp:serviceBound>false</mhp:serviceBound>
    <mhp:priority>1F</mhp:priority>
    <mhp:version>01</mhp:version>
    <mhp:mhpVersion><mhp:profile>0</mhp:profile><mhp:versionMajor>1</mhp:versionMajor>
      <mhp:versionMinor>1</mhp:versionMinor><mhp:versionMicro>1</mhp:versionMicro></mhp:mhpVersion>
  </mhp:applicationDescriptor>
  <mhp:applicationUsageDescriptor><mhp:ApplicationUsage>urn:dvb:mhp:2009:digitalText</mhp:ApplicationUsage>
  </mhp:applicationUsageDescriptor>
  <mhp:applicationBoundary><mhp:BoundaryExtension>http://b.example/</mhp:BoundaryExtension>
    <mhp:BoundaryExtension>http://c.example/</mhp:BoundaryExtension></mhp:applicationBoundary>
  <mhp:applicationTransport xsi:type="mhp:HTTPTransportType"><mhp:URLBase>http://a.example/</mhp:URLBase>
    <mhp:URLExtension>hbb/</mhp:URLExtension></mhp:applicationTransport>
  <mhp:applicationLocation>index.html?a=1</mhp:applicationLocation>
</mhp:Application>)";

std::string documentOf(const std::string& applications) {
    return R"(<?xml version="1.0" encoding="UTF-8"?>
<mhp:ServiceDiscovery xmlns:mhp="urn:dvb:mhp:2009" xmlns:xsi="http://www.w3.org/2001/XMLSchema-instance">
<mhp:ApplicationDiscovery DomainName="a.example"><mhp:ApplicationList>)" +
           applications + "</mhp:ApplicationList></mhp:ApplicationDiscovery></mhp:ServiceDiscovery>";
}

// The application with one string in place of another.
std::string with(const std::string& before, const std::string& after) {
    std::string application = kApplication;
    const size_t at = application.find(before);
    EXPECT_NE(at, std::string::npos) << before;
    return application.replace(at, before.size(), after);
}

std::optional<ApplicationList> parse(const std::string& document) {
    std::string error;
    return parseXmlAit(document, error);
}

std::string errorOf(const std::string& document) {
    std::string error;
    EXPECT_FALSE(parseXmlAit(document, error)) << document;
    return error;
}

TEST(XmlAitTest, GivesTheSameRecordsAsTheBroadcast) {
    const auto list = parse(documentOf(kApplication));
    ASSERT_TRUE(list);
    EXPECT_THAT(list->skipped, IsEmpty());
    ASSERT_EQ(list->applications.size(), 1U);
    const SignalledApplication& read = list->applications[0];
    EXPECT_EQ(toString(read.id), "1234.11");
    EXPECT_EQ(read.controlCode, kControlCodeAutostart);
    EXPECT_EQ(read.name, "News & more");
    EXPECT_EQ(read.url, "http://a.example/hbb/index.html?a=1");
    EXPECT_FALSE(read.isServiceBound);
    EXPECT_EQ(read.priority, 0x1F);
    EXPECT_EQ(read.usage, kUsageDigitalText);
    EXPECT_THAT(read.boundaries, ElementsAre("http://b.example/", "http://c.example/"));
}

TEST(XmlAitTest, DoesNotDependOnThePrefixOfTheNamespace) {
    std::string document = documentOf(kApplication);
    for (size_t at = document.find("mhp:"); at != std::string::npos; at = document.find("mhp:", at)) {
        document.erase(at, 4);
    }
    document.replace(document.find("xmlns:mhp"), 9, "xmlns");
    const auto list = parse(document);
    ASSERT_TRUE(list);
    EXPECT_EQ(list->applications.size(), 1U);
}

TEST(XmlAitTest, TakesAnAbsoluteLocationWithoutATransport) {
    std::string application = with("index.html?a=1", "https://d.example/x.html");
    application.erase(application.find("<mhp:applicationTransport"),
                      application.find("<mhp:applicationLocation") -
                          application.find("<mhp:applicationTransport"));
    const auto list = parse(documentOf(application));
    ASSERT_TRUE(list);
    ASSERT_EQ(list->applications.size(), 1U);
    EXPECT_EQ(list->applications[0].url, "https://d.example/x.html");
}

TEST(XmlAitTest, SkipsAnApplicationThatCannotRunAndSaysWhy) {
    const std::pair<std::string, std::string> cases[] = {
        {with("<mhp:orgId>4660", "<mhp:orgId>-1"), "no valid applicationIdentifier"},
        {with("<mhp:appId>17", "<mhp:appId>65536"), "no valid applicationIdentifier"},
        {with("AUTOSTART", "SOON"), "control code \"SOON\""},
        {with("<mhp:priority>1F", "<mhp:priority>high"), "\"high\" is not a priority"},
        {with("application/vnd.hbbtv.xhtml+xml", "application/x-other"), "application/x-other"},
        {with("<mhp:versionMinor>1", "<mhp:versionMinor>7"), "profile or version"},
        {with("index.html?a=1", ""), "no applicationLocation"},
        {with("http://a.example/", "a.example/"), "is not an absolute URL"},
        {with("index.html?a=1", "in dex.html"), "invalid characters"},
    };
    for (const auto& [application, reason] : cases) {
        const auto list = parse(documentOf(application + kApplication));
        ASSERT_TRUE(list) << reason;
        EXPECT_EQ(list->applications.size(), 1U) << reason;
        EXPECT_THAT(list->skipped, ElementsAre(HasSubstr(reason)));
    }
}

TEST(XmlAitTest, RefusesWhatIsNoSuchDocumentWithTheReason) {
    EXPECT_THAT(errorOf(""), HasSubstr("line"));
    EXPECT_THAT(errorOf("<a>\n<b></a>"), HasSubstr("line 2: "));
    EXPECT_THAT(errorOf("<html/>"), HasSubstr("the root element is <html>"));
    EXPECT_THAT(errorOf(std::string(kMaxXmlAitSize + 1, ' ')), HasSubstr("larger than"));
    EXPECT_THAT(errorOf("<!DOCTYPE x [<!ENTITY a \"b\">]><ServiceDiscovery>&a;</ServiceDiscovery>"),
                HasSubstr("document type"));
    EXPECT_THAT(
        errorOf("<?xml version=\"1.0\" encoding=\"UTF-8\"?><ServiceDiscovery>\xFF</ServiceDiscovery>"),
        HasSubstr("line 1: "));
}

TEST(XmlAitTest, TakesEveryBeginningOfADocumentWithoutHarm) {
    const std::string document = documentOf(kApplication);
    for (size_t length = 0; length < document.size(); ++length) {
        EXPECT_FALSE(parse(document.substr(0, length)));
    }
}

} // namespace
