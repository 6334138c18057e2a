// The device through the platform calls: preferences, keys, memory, capabilities, rating schemes, DRM.
#include <atomic>
#include <cstdlib>
#include <gtest/gtest.h>
#include <set>

#include "desktop/platform/Device.h"
#include "tests/desktop/Received.h"

using namespace desktop;
using testing::Test;

namespace {

struct DrmResult {
    std::string id;
    std::string message;
    int32_t result;
};

Received<DrmResult> results;

TELIX_RETCODE_ENUM_T onDrmResult(___UINT8* id, ___UINT8* message, TELIX_DRM_RESULT_CODE_ENUM_T result) {
    return results.add({reinterpret_cast<char*>(id), reinterpret_cast<char*>(message), result});
}

std::atomic<int> lowMemoryCalls{0};

TELIX_RETCODE_ENUM_T onLowMemory() {
    ++lowMemoryCalls;
    return 0;
}

std::string sendDrmMessage(const std::string& system) {
    char* id = nullptr;
    EXPECT_EQ(TELIX_JS_DRM_SendDRMMessage("application/x-any", "<any/>", system.c_str(), &id), 0);
    return textOf(id);
}

bool hasProfile(const char* profile) {
    ___UINT8 supported = 0;
    EXPECT_EQ(TELIX_JS_CAP_HasCapability(profile, &supported), 0);
    return supported != 0;
}

TEST(DeviceTest, GivesTheViewersChoiceInAFreshTextAtEachCall) {
    char* first = nullptr;
    char* second = nullptr;
    ASSERT_EQ(TELIX_JS_APP_Config_GetPreferredAudioLanguage(&first), 0);
    ASSERT_EQ(TELIX_JS_APP_Config_GetPreferredAudioLanguage(&second), 0);
    EXPECT_NE(first, second);
    EXPECT_EQ(textOf(first), "deu");
    EXPECT_EQ(textOf(second), "deu");
    char* subtitle = nullptr;
    ASSERT_EQ(TELIX_JS_APP_Config_GetPreferredSubtitleLanguage(&subtitle), 0);
    EXPECT_EQ(textOf(subtitle), "deu");
    char* country = nullptr;
    ASSERT_EQ(TELIX_JS_APP_Config_GetCountryId(&country), 0);
    EXPECT_EQ(textOf(country), "DEU");
}

TEST(DeviceTest, GrantsOnlyTheKeysThatTheRemoteControlHas) {
    uint32_t mask = 0;
    ASSERT_EQ(TELIX_JS_APP_GetKeySetValue(&mask), 0);
    EXPECT_EQ(mask, 0x11U);
    uint32_t granted = 0xDEAD;
    ASSERT_EQ(TELIX_JS_APP_SetKeySetValue(0xFFFFFFFF, &granted), 0);
    EXPECT_EQ(granted, 0x1BFU); // the remote control has no scroll keys and no letters
    ASSERT_EQ(TELIX_JS_APP_GetKeySetValue(&mask), 0);
    EXPECT_EQ(mask, 0x1BFU);
    ASSERT_EQ(TELIX_JS_APP_SetKeySetValue(0, &granted), 0);
    EXPECT_EQ(granted, 0U);
}

TEST(DeviceTest, TellsOfFreeMemoryAndOfItsShortage) {
    uint32_t amount = 0;
    ASSERT_EQ(TELIX_JS_APP_GetFreeMem(&amount), 0);
    EXPECT_EQ(amount, 123456U);
    Device& device = Device::instance();
    EXPECT_FALSE(device.injectLowMemory()); // no listener is registered
    TELIX_JS_APP_RegisterLowMemory(onLowMemory);
    EXPECT_TRUE(device.injectLowMemory());
    EXPECT_TRUE(waitUntil([] { return lowMemoryCalls == 1; }));
    TELIX_JS_APP_UnRegisterLowMemory(onLowMemory);
    EXPECT_FALSE(device.injectLowMemory());
    device.setFreeMemory(99);
    ASSERT_EQ(TELIX_JS_APP_GetFreeMem(&amount), 0);
    EXPECT_EQ(amount, 99U);
}

TEST(DeviceTest, DescribesItselfInAProfileList) {
    char* xml = nullptr;
    ASSERT_EQ(TELIX_JS_CAP_GetXmlCapabilities(&xml), 0);
    const std::string document = textOf(xml);
    EXPECT_NE(document.find("<profilelist xmlns=\"urn:hbbtv:config:oitf:oitfCapabilities:2011-1\">"),
              std::string::npos);
    EXPECT_NE(document.find("<parentalcontrol schemes=\"dvb-si films\">true</parentalcontrol>"),
              std::string::npos);
    EXPECT_NE(document.find("<drm DRMSystemID=\"urn:dvb:casystemid:2\">"), std::string::npos);

    EXPECT_TRUE(hasProfile("OITF_HD_UIPROF"));
    EXPECT_TRUE(hasProfile("OITF_HD_UIPROF+DVB_S+META_SI")); // in any order
    EXPECT_TRUE(hasProfile("+TRICKMODE"));
    EXPECT_TRUE(hasProfile("+DRM"));
    EXPECT_TRUE(hasProfile("MP4_AVC_HD_25_HEAAC"));
    EXPECT_FALSE(hasProfile("+PVR"));
    EXPECT_FALSE(hasProfile("OITF_HD_UIPROF+PVR"));
    EXPECT_FALSE(hasProfile("OITF_SDEU_UIPROF"));
    EXPECT_FALSE(hasProfile("OITF_HD"));
    EXPECT_FALSE(hasProfile("+"));
    EXPECT_FALSE(hasProfile("MP4_AVC"));

    uint32_t count = 77;
    ASSERT_EQ(TELIX_JS_CAP_GetExtraSDVideoDecodes(&count), 0);
    EXPECT_EQ(count, 1U);
    ASSERT_EQ(TELIX_JS_CAP_GetExtraHDVideoDecodes(&count), 0);
    EXPECT_EQ(count, 0U);
}

TEST(DeviceTest, ReadsTheProfilesOfADocument) {
    std::string error;
    const auto read = Capabilities::parse("<?xml version=\"1.0\"?><!-- mine -->"
                                          "<o:profilelist xmlns:o=\"urn:x\"><o:ui_profile name=\"A+B+C\"/>"
                                          "<o:ui_profile name=\"D+E\"/><o:video_profile name=\"V\"/>"
                                          "<o:other name=\"W\"/></o:profilelist>",
                                          error);
    ASSERT_TRUE(read) << error;
    EXPECT_TRUE(read->hasProfile("A+C"));
    EXPECT_TRUE(read->hasProfile("+E"));
    EXPECT_TRUE(read->hasProfile("V"));
    EXPECT_FALSE(read->hasProfile("A+E")); // of two profiles
    EXPECT_FALSE(read->hasProfile("W"));
    for (const char* document : {"", "<profilelist>", "<profilelist></other>", "<capabilities/>", "plain"}) {
        error.clear();
        EXPECT_FALSE(Capabilities::parse(document, error)) << document;
        EXPECT_NE(error, "") << document;
    }
    EXPECT_FALSE(Capabilities::parse(std::string("<profilelist/>\0", 15), error));
}

TEST(DeviceTest, ListsItsRatingSchemesWithThresholds) {
    uint32_t count = 0;
    PARENTALRATTINGSCHEME_STRUCT_T_TAG* schemes = nullptr;
    ASSERT_EQ(TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes(&count, &schemes), 0);
    ASSERT_EQ(count, 2U);
    EXPECT_STREQ(schemes[0].szName, "dvb-si");
    EXPECT_EQ(schemes[0].count, 0U);
    EXPECT_NE(schemes[0].ratingNames, nullptr);
    EXPECT_NE(schemes[0].iconUris, nullptr);
    EXPECT_STREQ(schemes[1].szName, "films");
    ASSERT_EQ(schemes[1].count, 3U);
    EXPECT_STREQ(schemes[1].ratingNames[0], "G");
    EXPECT_STREQ(schemes[1].ratingNames[1], "PG");
    EXPECT_STREQ(schemes[1].ratingNames[2], "R");
    EXPECT_STREQ(schemes[1].iconUris[0], "");
    EXPECT_STREQ(schemes[1].iconUris[1], "http://127.0.0.1/pg.png");
    EXPECT_STREQ(schemes[1].iconUris[2], "");

    int32_t threshold = -1;
    ASSERT_EQ(TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold(schemes[0].handle, &threshold), 0);
    EXPECT_EQ(threshold, 12);
    ASSERT_EQ(TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold(schemes[1].handle, &threshold), 0);
    EXPECT_EQ(threshold, 1); // PG
    for (const uint32_t unknown : {0U, schemes[1].handle + 1, 0xFFFFFFFFU}) {
        threshold = 4711;
        EXPECT_NE(TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold(unknown, &threshold), 0);
        EXPECT_EQ(threshold, 4711);
    }
}

TEST(DeviceTest, AnswersDrmMessagesAsConfiguredUnderTheirIdsInTheirOrder) {
    TELIX_JS_DRM_RegisterOnDRMMessageResult(onDrmResult);
    const std::string first = sendDrmMessage("urn:dvb:casystemid:1");
    const std::string second = sendDrmMessage("urn:dvb:casystemid:2");
    const std::string third = sendDrmMessage("urn:dvb:casystemid:3");
    EXPECT_EQ((std::set<std::string>{first, second, third, ""}).size(), 4U);
    ASSERT_TRUE(waitUntil([] { return results.all().size() == 3; }));
    const std::vector<DrmResult> all = results.all();
    EXPECT_EQ(all[0].id, first);
    EXPECT_EQ(all[0].message, "granted");
    EXPECT_EQ(all[0].result, 0);
    EXPECT_EQ(all[1].id, second);
    EXPECT_EQ(all[1].message, "ask the viewer: \"may it?\"");
    EXPECT_EQ(all[1].result, 4);
    EXPECT_EQ(all[2].id, third);
    EXPECT_EQ(all[2].result, kDrmUnknownSystem);
    EXPECT_EQ(results.threads().count(std::this_thread::get_id()), 0U);
    EXPECT_EQ(Device::instance().lastDrmMessage(), third);
    TELIX_JS_DRM_UnregisterOnDRMMessageResult(onDrmResult);
}

TEST(DeviceTest, AnswersOnceAsLongAsOneOfSeveralAgentsIsLeft) {
    TELIX_JS_DRM_RegisterOnDRMMessageResult(onDrmResult);
    TELIX_JS_DRM_RegisterOnDRMMessageResult(onDrmResult);
    TELIX_JS_DRM_UnregisterOnDRMMessageResult(onDrmResult);
    sendDrmMessage("urn:dvb:casystemid:1");
    ASSERT_TRUE(waitUntil([] { return !results.all().empty(); }));
    TELIX_JS_DRM_UnregisterOnDRMMessageResult(onDrmResult);
    sendDrmMessage("urn:dvb:casystemid:1");
    EXPECT_FALSE(Device::instance().injectDrmResult("any", "text", 0));
    // The result would come before anything that is posted after it.
    std::atomic<bool> isReached{false};
    Platform::instance().post([&] { isReached = true; });
    ASSERT_TRUE(waitUntil([&] { return isReached.load(); }));
    EXPECT_EQ(results.all().size(), 1U);
    TELIX_JS_DRM_UnregisterOnDRMMessageResult(onDrmResult); // one too many is harmless
}

TEST(DeviceTest, HasNoChannelHandleByValue) {
    EXPECT_EQ(TELIX_JS_CM_GetChannelHandle(1), TELIX_RETCODE_NOT_AVAILABLE);
}

} // namespace
