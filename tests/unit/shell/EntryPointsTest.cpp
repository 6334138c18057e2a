// The entry points: initialisation, description, values, and the life of an instance.
#include <algorithm>
#include <cctype>
#include <cstring>

#include "common/BrowserGates.h"
#include "common/PluginBase.h"
#include "common/PluginEntryPoints.h"
#include "common/PluginExports.h"
#include "tests/support/BorderTest.h"

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::StartsWith;

namespace {

const char kManagerType[] = "application/oipfapplicationmanager";

const std::string kBannerRule = std::string(91, '*') + "\n";

class EntryPointsTest : public BorderTest {
protected:
    // A second pair of tables, beside those of the running browser.
    NPNetscapeFuncs browserFuncs = browser.table();
    NPPluginFuncs pluginFuncs{};

    NPError initialize(NPNetscapeFuncs* ofBrowser, NPPluginFuncs* ofPlugin) {
        NPNetscapeFuncs* const running = NPNFuncs;
        const NPError error = NP_Initialize(ofBrowser, ofPlugin);
        NPNFuncs = running;
        return error;
    }

    static bool isUnwritten(const NPPluginFuncs& table, uint16_t size) {
        NPPluginFuncs expected{};
        expected.size = size;
        return std::memcmp(&table, &expected, sizeof expected) == 0;
    }
};

TEST_F(EntryPointsTest, InitialiseRefusesANullTable) {
    pluginFuncs.size = sizeof pluginFuncs;
    EXPECT_EQ(initialize(nullptr, &pluginFuncs), NPERR_INVALID_FUNCTABLE_ERROR);
    EXPECT_EQ(initialize(&browserFuncs, nullptr), NPERR_INVALID_FUNCTABLE_ERROR);
    EXPECT_EQ(initialize(nullptr, nullptr), NPERR_INVALID_FUNCTABLE_ERROR);
    EXPECT_TRUE(isUnwritten(pluginFuncs, sizeof pluginFuncs));
}

TEST_F(EntryPointsTest, InitialiseRefusesAnotherMajorVersionAndWritesNothing) {
    pluginFuncs.size = sizeof pluginFuncs;
    for (const int version : {0x0100, 0x011B, 0xFF00}) {
        browserFuncs.version = static_cast<uint16_t>(version);
        EXPECT_EQ(initialize(&browserFuncs, &pluginFuncs), NPERR_INCOMPATIBLE_VERSION_ERROR);
    }
    EXPECT_TRUE(isUnwritten(pluginFuncs, sizeof pluginFuncs));
}

TEST_F(EntryPointsTest, InitialiseTakesAnyMinorVersion) {
    for (const int version : {0x0000, 0x0013, 0x00FF}) {
        pluginFuncs.size = sizeof pluginFuncs;
        browserFuncs.version = static_cast<uint16_t>(version);
        EXPECT_EQ(initialize(&browserFuncs, &pluginFuncs), NPERR_NO_ERROR);
    }
}

TEST_F(EntryPointsTest, InitialiseRefusesAPluginTableBelowSixtyBytes) {
    pluginFuncs.size = 59;
    EXPECT_EQ(initialize(&browserFuncs, &pluginFuncs), NPERR_INVALID_FUNCTABLE_ERROR);
    EXPECT_TRUE(isUnwritten(pluginFuncs, 59));
}

TEST_F(EntryPointsTest, TheVersionIsLookedAtBeforeTheSize) {
    pluginFuncs.size = 59;
    browserFuncs.version = 0x0100;
    EXPECT_EQ(initialize(&browserFuncs, &pluginFuncs), NPERR_INCOMPATIBLE_VERSION_ERROR);
}

TEST_F(EntryPointsTest, InitialiseReportsSizeSixtyAndVersionTwentyFour) {
    for (const size_t size : {size_t{60}, sizeof pluginFuncs}) {
        pluginFuncs.size = static_cast<uint16_t>(size);
        EXPECT_EQ(initialize(&browserFuncs, &pluginFuncs), NPERR_NO_ERROR);
        EXPECT_EQ(pluginFuncs.size, 60);
        EXPECT_EQ(pluginFuncs.version, 24);
    }
}

TEST_F(EntryPointsTest, InitialiseFillsThePluginTableThroughSetValue) {
    pluginFuncs.size = sizeof pluginFuncs;
    pluginFuncs.javaClass = &pluginFuncs;
    EXPECT_EQ(initialize(&browserFuncs, &pluginFuncs), NPERR_NO_ERROR);
    EXPECT_EQ(pluginFuncs.newp, NPP_New);
    EXPECT_EQ(pluginFuncs.destroy, NPP_Destroy);
    EXPECT_EQ(pluginFuncs.setwindow, NPP_SetWindow);
    EXPECT_EQ(pluginFuncs.newstream, NPP_NewStream);
    EXPECT_EQ(pluginFuncs.destroystream, NPP_DestroyStream);
    EXPECT_EQ(pluginFuncs.asfile, NPP_StreamAsFile);
    EXPECT_EQ(pluginFuncs.writeready, NPP_WriteReady);
    EXPECT_EQ(pluginFuncs.write, NPP_Write);
    EXPECT_EQ(pluginFuncs.print, NPP_Print);
    EXPECT_EQ(pluginFuncs.event, NPP_HandleEvent);
    EXPECT_EQ(pluginFuncs.urlnotify, NPP_URLNotify);
    EXPECT_EQ(pluginFuncs.javaClass, nullptr);
    EXPECT_EQ(pluginFuncs.getvalue, NPP_GetValue);
    EXPECT_EQ(pluginFuncs.setvalue, NPP_SetValue);
    EXPECT_EQ(pluginFuncs.gotfocus, nullptr);
    EXPECT_EQ(pluginFuncs.didComposite, nullptr);
}

TEST_F(EntryPointsTest, TheBrowsersTableIsKeptByAddressWhateverItsSize) {
    browserFuncs.size = 0;
    pluginFuncs.size = sizeof pluginFuncs;
    NPNetscapeFuncs* const running = NPNFuncs;
    EXPECT_EQ(NP_Initialize(&browserFuncs, &pluginFuncs), NPERR_NO_ERROR);
    EXPECT_EQ(NPNFuncs, &browserFuncs);
    NPNFuncs = running;
}

TEST_F(EntryPointsTest, InitialiseAsksNothingOfTheBrowserOrThePlatform) {
    pluginFuncs.size = sizeof pluginFuncs;
    EXPECT_EQ(initialize(&browserFuncs, &pluginFuncs), NPERR_NO_ERROR);
    EXPECT_THAT(log.everything(), IsEmpty());
}

TEST_F(EntryPointsTest, InitialisePrintsTheStartBanner) {
    EXPECT_EQ(
        outputOf([] { NPP_Initialize(); }),
        kBannerRule +
            "                               :: ORDA :: PLUGIN :: START ::                               \n"
            "                            :: VERSION:1.25 :: DATE:21.03.2012 ::                           \n" +
            kBannerRule);
}

TEST_F(EntryPointsTest, InitialiseOfThePluginPrintsTheBannerOnceItHasTheTables) {
    pluginFuncs.size = sizeof pluginFuncs;
    EXPECT_THAT(outputOf([this] { initialize(&browserFuncs, &pluginFuncs); }),
                AllOf(StartsWith(kBannerRule), HasSubstr(":: ORDA :: PLUGIN :: START ::")));
    EXPECT_EQ(outputOf([this] { initialize(nullptr, &pluginFuncs); }), "");
}

TEST_F(EntryPointsTest, ShutdownPrintsTheEndBannerAndReturnsNoError) {
    EXPECT_EQ(
        outputOf([] { EXPECT_EQ(NP_Shutdown(), NPERR_NO_ERROR); }),
        kBannerRule +
            "                                 :: ORDA :: PLUGIN :: END ::                               \n" +
            kBannerRule);
}

TEST_F(EntryPointsTest, ShutdownForgetsTheBrowsersTable) {
    EXPECT_EQ(NPNFuncs, &browser.table());
    browser.shutdown();
    EXPECT_EQ(NPNFuncs, nullptr);
}

TEST_F(EntryPointsTest, ShutdownEndsTheSingletonUntilItsNextUse) {
    PluginEntryPoints* first = PluginEntryPoints::getInst();
    EXPECT_EQ(PluginEntryPoints::getInst(), first);
    browser.shutdown();
    EXPECT_NE(PluginEntryPoints::getInst(), nullptr);
    PluginEntryPoints::deleteInst();
    PluginEntryPoints::deleteInst();
}

TEST_F(EntryPointsTest, LogsItsCallsUnderCommon) {
    EXPECT_THAT(logOf(9, [this] { initialize(nullptr, nullptr); }),
                logLine("COMMON", "NP_Initialize", " is called\n"));
    EXPECT_THAT(logOf(9, [] { NP_Shutdown(); }),
                StartsWith(logLine("COMMON", "NP_Shutdown", " is called\n")));
    EXPECT_THAT(logOf(9, [] { NP_GetMIMEDescription(); }),
                logLine("COMMON", "NP_GetMIMEDescription", " is called\n"));
    EXPECT_THAT(logOf(9,
                      [] {
                          const char* name = nullptr;
                          NP_GetValue(nullptr, NPPVpluginNameString, &name);
                      }),
                AllOf(StartsWith(logLine("COMMON", "NP_GetValue", " is called\n")),
                      HasSubstr(logLine("COMMON", "getValue", "NPP inst=( (nil) ), NPPVariable: 1 \n"))));
    EXPECT_EQ(logOf(2, [] { NP_GetMIMEDescription(); }), "");
}

TEST_F(EntryPointsTest, TheMimeDescriptionHasFifteenEntriesInOrder) {
    EXPECT_STREQ(NP_GetMIMEDescription(),
                 "application/oipfapplicationmanager::TELIX JS Plug-in for Application Manager;"
                 "application/oipfconfiguration::TELIX JS Plug-in for Configuration;"
                 "application/oipfparentalcontrolmanager::TELIX JS Plug-in for Parental Control Manager;"
                 "application/oipfcapabilities::TELIX JS Plug-in for Capabilities;"
                 "video/broadcast::TELIX JS Plug-in for Video Broadcast;"
                 "audio/mpeg:mp3:TELIX JS Plug-in for AVControl;"
                 "audio/mp4:mp4:TELIX JS Plug-in for AVControl;"
                 "video/mp4:mp4:TELIX JS Plug-in for AVControl;"
                 "video/mpeg:mpg:TELIX JS Plug-in for AVControl;"
                 "video/mpeg4:mp4:TELIX JS Plug-in for AVControl;"
                 "video/x-ms-ism:ism:TELIX JS Plug-in for AVControl;"
                 "application/vnd.ms-sstr+xml:ism:TELIX JS Plug-in for AVControl;"
                 "application/vnd.apple.mpegurl:m3u8:TELIX JS Plug-in for AVControl;"
                 "audio/mpegurl:m3u8:TELIX JS Plug-in for AVControl;"
                 "application/oipfdrmagent::TELIX JS Plug-in for DRMAgent;");
}

TEST_F(EntryPointsTest, TheMimeDescriptionStaysAtOneAddressBeyondShutdown) {
    const char* description = NP_GetMIMEDescription();
    EXPECT_EQ(NP_GetMIMEDescription(), description);
    browser.shutdown();
    EXPECT_EQ(NP_GetMIMEDescription(), description);
    EXPECT_THAT(description, StartsWith("application/oipfapplicationmanager:"));
    PluginEntryPoints::deleteInst();
}

TEST_F(EntryPointsTest, TellsNameDescriptionAndFlagsWithoutAnInstance) {
    const char* text = nullptr;
    EXPECT_EQ(NP_GetValue(nullptr, NPPVpluginNameString, &text), NPERR_NO_ERROR);
    EXPECT_STREQ(text, "TELIX Scriptable Plugin");
    EXPECT_EQ(NP_GetValue(nullptr, NPPVpluginDescriptionString, &text), NPERR_NO_ERROR);
    EXPECT_STREQ(text, "TELIX Scriptable Plugin (Browser Plug-in for TELIX JS API's)");

    uint32_t flag = 0xFFFFFFFF;
    EXPECT_EQ(NP_GetValue(nullptr, NPPVpluginWindowBool, &flag), NPERR_NO_ERROR);
    EXPECT_EQ(flag, 0U);
    flag = 0xFFFFFFFF;
    EXPECT_EQ(NP_GetValue(nullptr, NPPVpluginTransparentBool, &flag), NPERR_NO_ERROR);
    EXPECT_EQ(flag, 1U);
    flag = 0xFFFFFFFF;
    EXPECT_EQ(NP_GetValue(nullptr, NPPVpluginNeedsXEmbed, &flag), NPERR_NO_ERROR);
    EXPECT_EQ(flag, 0U);
}

TEST_F(EntryPointsTest, TheExportTakesItsFirstArgumentAsTheInstance) {
    const EmbeddedObject manager = browser.embed(kManagerType);
    NPObject* object = nullptr;
    EXPECT_EQ(NP_GetValue(manager.npp(), NPPVpluginScriptableNPObject, &object), NPERR_NO_ERROR);
    EXPECT_EQ(ObjectRef::adopt(object), manager.scriptObject());
    const char* text = nullptr;
    EXPECT_EQ(NP_GetValue(manager.npp(), NPPVpluginNameString, &text), NPERR_NO_ERROR);
    EXPECT_STREQ(text, "TELIX Scriptable Plugin");
    manager.destroy();
    text = nullptr;
    EXPECT_EQ(NP_GetValue(manager.npp(), NPPVpluginNameString, &text), NPERR_GENERIC_ERROR);
    EXPECT_EQ(text, nullptr);
}

TEST_F(EntryPointsTest, RefusesEveryOtherVariableAndWritesNothing) {
    for (const int variable : {0, 5, 6, 7, 8, 9, 10, 11, 12, 13, 16, 17, 18, 100}) {
        uint64_t value = 0x1122334455667788;
        EXPECT_EQ(NP_GetValue(nullptr, static_cast<NPPVariable>(variable), &value), NPERR_GENERIC_ERROR)
            << variable;
        EXPECT_EQ(value, 0x1122334455667788U) << variable;
    }
}

TEST_F(EntryPointsTest, AnInstanceWithoutModelTellsNothing) {
    NPP_t empty{};
    const char* text = nullptr;
    EXPECT_EQ(browser.plugin().getvalue(&empty, NPPVpluginNameString, &text), NPERR_GENERIC_ERROR);
    NPObject* object = nullptr;
    EXPECT_EQ(browser.plugin().getvalue(&empty, NPPVpluginScriptableNPObject, &object), NPERR_GENERIC_ERROR);
    EXPECT_EQ(text, nullptr);
    EXPECT_EQ(object, nullptr);
}

TEST_F(EntryPointsTest, TheScriptableObjectComesWithAReferenceEachTime) {
    const EmbeddedObject manager = browser.embed(kManagerType);
    NPObject* first = nullptr;
    NPObject* second = nullptr;
    EXPECT_EQ(browser.plugin().getvalue(manager.npp(), NPPVpluginScriptableNPObject, &first), NPERR_NO_ERROR);
    EXPECT_EQ(first->referenceCount, 2U); // the model's and the browser's
    EXPECT_EQ(browser.plugin().getvalue(manager.npp(), NPPVpluginScriptableNPObject, &second),
              NPERR_NO_ERROR);
    EXPECT_EQ(second, first);
    EXPECT_EQ(first->referenceCount, 3U);
    EXPECT_EQ(log.count("NPN_CreateObject"), 1U);
    ObjectRef::adopt(first);
    ObjectRef::adopt(second);
}

TEST_F(EntryPointsTest, SetValueIsLoggedAndWithoutEffect) {
    const EmbeddedObject manager = browser.embed(kManagerType);
    log.clear();
    for (const int variable : {0, 4, 15, 99}) {
        EXPECT_EQ(browser.plugin().setvalue(manager.npp(), static_cast<NPNVariable>(variable), nullptr),
                  NPERR_NO_ERROR);
    }
    EXPECT_EQ(browser.plugin().setvalue(nullptr, NPNVxDisplay, nullptr), NPERR_NO_ERROR);
    EXPECT_THAT(log.everything(), IsEmpty());
    EXPECT_EQ(logOf(9, [&] { NPP_SetValue(manager.npp(), NPNVxDisplay, nullptr); }),
              logLine("COMMON", "setValue", " is called \n"));
}

TEST_F(EntryPointsTest, StreamAsFileAndPrintOnlyLog) {
    const EmbeddedObject manager = browser.embed(kManagerType);
    log.clear();
    NPStream stream{};
    EXPECT_EQ(logOf(9,
                    [&] {
                        NPP_StreamAsFile(manager.npp(), &stream, "file");
                        NPP_Print(manager.npp(), nullptr);
                    }),
              logLine("COMMON", "streamAsFile", " is called \n") +
                  logLine("COMMON", "print", " is called \n"));
    browser.plugin().asfile(manager.npp(), &stream, "file");
    browser.plugin().print(manager.npp(), nullptr);
    EXPECT_THAT(log.everything(), IsEmpty());
}

TEST_F(EntryPointsTest, AKnownTypeGivesTheInstanceAModelOfItsKind) {
    const EmbeddedObject manager = browser.embed(kManagerType);
    EXPECT_EQ(manager.error(), NPERR_NO_ERROR);
    ASSERT_NE(manager.model(), nullptr);
    EXPECT_EQ(static_cast<PluginBase*>(manager.model())->getObjectId(), 200);
}

TEST_F(EntryPointsTest, TheCaseOfATypeDoesNotMatter) {
    const EmbeddedObject manager = browser.embed("APPLICATION/OipfApplicationManager");
    ASSERT_NE(manager.model(), nullptr);
    EXPECT_EQ(static_cast<PluginBase*>(manager.model())->getObjectId(), 200);
}

TEST_F(EntryPointsTest, EveryTypeOfTheDescriptionMakesItsKindInAnyCase) {
    struct Row {
        const char* type;
        unsigned short kind;
    };
    for (const Row& row :
         {Row{"application/oipfapplicationmanager", 200}, Row{"audio/mpeg", 300}, Row{"video/mp4", 300},
          Row{"video/mpeg", 300}, Row{"audio/mp4", 300}, Row{"video/mpeg4", 300}, Row{"video/x-ms-ism", 300},
          Row{"application/vnd.ms-sstr+xml", 300}, Row{"application/vnd.apple.mpegurl", 300},
          Row{"audio/mpegurl", 300}, Row{"video/broadcast", 400}, Row{"application/oipfconfiguration", 500},
          Row{"application/oipfparentalcontrolmanager", 600}, Row{"application/oipfcapabilities", 700},
          Row{"application/oipfdrmagent", 800}}) {
        std::string capitals = row.type;
        std::transform(capitals.begin(), capitals.end(), capitals.begin(),
                       [](unsigned char c) { return std::toupper(c); });
        for (const std::string& type : {std::string(row.type), capitals}) {
            const EmbeddedObject object = browser.embed(type, {{"id", "element"}});
            EXPECT_EQ(object.error(), NPERR_NO_ERROR) << type;
            ASSERT_NE(object.model(), nullptr) << type;
            EXPECT_EQ(static_cast<PluginBase*>(object.model())->getObjectId(), row.kind) << type;
            EXPECT_TRUE(object.scriptObject()) << type;
            EXPECT_EQ(object.handleEvent(), 0) << type;
            EXPECT_EQ(object.setNullWindow(), NPERR_NO_ERROR) << type;
            EXPECT_EQ(object.destroy(), NPERR_NO_ERROR) << type;
            EXPECT_EQ(object.model(), nullptr) << type;
        }
        EXPECT_THAT(std::string(NP_GetMIMEDescription()), HasSubstr(std::string(row.type) + ":"));
    }
}

TEST_F(EntryPointsTest, EachKindLogsItsEnd) {
    const auto endOf = [this](const char* type) { return logOf(9, [&] { browser.embed(type).destroy(); }); };
    const std::string line = " PLUGIN >>> COMMON :: destroyInst :: ";
    EXPECT_THAT(endOf("application/oipfapplicationmanager"), HasSubstr(line + "APPMANAGER_OBJ_ID delete\n"));
    EXPECT_THAT(endOf("video/mp4"), HasSubstr(line + "AVCONTROL_OBJ_ID delete :: 0x"));
    EXPECT_THAT(endOf("video/broadcast"), HasSubstr(line + "VIDEOBROADCAST_OBJ_ID delete :: 0x"));
    EXPECT_THAT(endOf("application/oipfconfiguration"),
                HasSubstr(line + "OIPFCONFIGURATION_OBJ_ID delete :: 0x"));
    EXPECT_THAT(endOf("application/oipfparentalcontrolmanager"), Not(HasSubstr("_OBJ_ID delete")));
    EXPECT_THAT(endOf("application/oipfcapabilities"),
                HasSubstr(line + "OIPFCAPABILITIES_OBJ_ID delete :: 0x"));
    EXPECT_THAT(endOf("application/oipfdrmagent"), HasSubstr(line + "DRMAGENT_OBJ_ID delete :: 0x"));
}

TEST_F(EntryPointsTest, AnUnknownTypeIsNoErrorAndGivesNoModel) {
    for (const char* type : {"application/other", "", "application/oipfapplicationmanagers"}) {
        const EmbeddedObject object = browser.embed(type);
        EXPECT_EQ(object.error(), NPERR_NO_ERROR) << type;
        EXPECT_EQ(object.model(), nullptr) << type;
    }
}

TEST_F(EntryPointsTest, ANullNameOrValueOfAnAttributeIsPassedOver) {
    browser.refuse("NPN_GetProperty"); // the style of an element that this browser does not know
    for (const char* type :
         {"application/oipfcapabilities", "application/oipfdrmagent", "video/mp4", "video/broadcast"}) {
        NPP_t npp{};
        std::string mime = type;
        std::string id = "id";
        std::string last = "last";
        char* names[] = {nullptr, id.data(), id.data()};
        char* values[] = {id.data(), nullptr, last.data()};
        EXPECT_EQ(browser.plugin().newp(mime.data(), &npp, NP_EMBED, 3, names, values, nullptr),
                  NPERR_NO_ERROR);
        ASSERT_NE(npp.pdata, nullptr) << type;
        EXPECT_EQ(static_cast<PluginBase*>(npp.pdata)->getId(), "last") << type;
        EXPECT_EQ(browser.plugin().destroy(&npp, nullptr), NPERR_NO_ERROR);
        browser.pump();
    }
}

TEST_F(EntryPointsTest, ARelativeAddressIsResolvedWhileTheInstanceIsMade) {
    for (const char* name : {"src", "src1", "data", "SRC"}) {
        const EmbeddedObject object = browser.embed("application/oipfcapabilities", {{name, "clip.mp4"}});
        EXPECT_EQ(static_cast<PluginBase*>(object.model())->getURL(), "http://page.example/app/clip.mp4")
            << name;
    }
}

TEST_F(EntryPointsTest, NewInstanceRefusesANullInstance) {
    char type[] = "application/oipfapplicationmanager";
    EXPECT_EQ(NPP_New(type, nullptr, NP_EMBED, 0, nullptr, nullptr, nullptr), NPERR_INVALID_INSTANCE_ERROR);
    EXPECT_THAT(log.everything(), IsEmpty());
}

TEST_F(EntryPointsTest, NewInstanceLogsTheType) {
    EXPECT_THAT(logOf(9, [this] { browser.embed("application/other"); }),
                AllOf(StartsWith(" PLUGIN >>> COMMON :: newInstance :: NPP inst=("),
                      HasSubstr("), Mime Type:( application/other )  \n")));
}

TEST_F(EntryPointsTest, DestroyClearsTheInstance) {
    const EmbeddedObject manager = browser.embed(kManagerType);
    EXPECT_EQ(manager.destroy(), NPERR_NO_ERROR);
    EXPECT_EQ(manager.model(), nullptr);
}

TEST_F(EntryPointsTest, DestroyLogsTheKindsLine) {
    EXPECT_THAT(logOf(9, [this] { browser.embed(kManagerType).destroy(); }),
                AllOf(HasSubstr(logLine("COMMON", "destroyInst", " is called \n")),
                      HasSubstr(logLine("COMMON", "destroyInst", "APPMANAGER_OBJ_ID delete\n"))));
}

TEST_F(EntryPointsTest, ANullInstanceIsRefusedEverywhere) {
    NPStream stream{};
    NPWindow window{};
    uint16_t mode = 0;
    char type[] = "text/plain";
    char buffer[] = "x";
    EXPECT_EQ(NPP_Destroy(nullptr, nullptr), NPERR_INVALID_INSTANCE_ERROR);
    EXPECT_EQ(NPP_SetWindow(nullptr, &window), NPERR_INVALID_INSTANCE_ERROR);
    EXPECT_EQ(NPP_NewStream(nullptr, type, &stream, 0, &mode), NPERR_INVALID_INSTANCE_ERROR);
    EXPECT_EQ(NPP_DestroyStream(nullptr, &stream, NPRES_DONE), NPERR_INVALID_INSTANCE_ERROR);
    EXPECT_EQ(NPP_WriteReady(nullptr, &stream), 2);
    EXPECT_EQ(NPP_Write(nullptr, &stream, 0, 1, buffer), 2);
    EXPECT_EQ(NPP_HandleEvent(nullptr, nullptr), 0);
    NPP_URLNotify(nullptr, "http://page.example/", NPRES_DONE, nullptr);
    EXPECT_THAT(log.everything(), IsEmpty());
}

TEST_F(EntryPointsTest, OnlySetWindowLogsTheInvalidInstance) {
    NPWindow window{};
    const std::string line = " Invalid Instance Error \n";
    EXPECT_THAT(logOf(9, [&] { NPP_SetWindow(nullptr, &window); }),
                HasSubstr(logLine("COMMON", "setWindow", line)));
    EXPECT_THAT(logOf(9,
                      [] {
                          NPP_Destroy(nullptr, nullptr);
                          NPP_WriteReady(nullptr, nullptr);
                      }),
                Not(HasSubstr(line)));
}

TEST_F(EntryPointsTest, AnObjectThatTakesNoStreamsRefusesThemAndReportsSuccess) {
    const EmbeddedObject manager = browser.embed(kManagerType);
    log.clear();
    BrowserStream& stream = manager.newStream("http://page.example/a.mp4");
    EXPECT_EQ(stream.error(), NPERR_NO_ERROR);
    EXPECT_TRUE(stream.wasDestroyedByPlugin());
    EXPECT_EQ(stream.writeReady(), 8192);
    EXPECT_EQ(stream.write("data"), 8192);
    EXPECT_EQ(stream.destroy(NPRES_NETWORK_ERR), NPERR_NO_ERROR);
    manager.urlNotify("http://page.example/a.mp4", NPRES_NETWORK_ERR);
    const std::string refusal = "NPN_DestroyStream \"http://page.example/a.mp4\" 0";
    EXPECT_THAT(log.everything(), ElementsAre(refusal, refusal));
}

TEST_F(EntryPointsTest, AnObjectWithoutWindowIgnoresWindows) {
    const EmbeddedObject manager = browser.embed(kManagerType);
    log.clear();
    EXPECT_EQ(manager.setWindow(1, 2, 3, 4), NPERR_NO_ERROR);
    EXPECT_EQ(manager.setNullWindow(), NPERR_NO_ERROR);
    EXPECT_THAT(log.everything(), IsEmpty());
}

} // namespace
