// A channel as a page sees it.
#include "src/channel/JSChannel.h"
#include "tests/support/SubObjectTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace {

class ChannelTest : public SubObjectTest {
protected:
    ObjectRef channelOf(uint32_t handle) {
        return make<JSChannel>([handle](Channel& model) { model.setChannelHandle(handle); });
    }

    // Has the platform know each channel: ids are its handle plus 1, 2 and 3, strings end in its handle.
    void describeChannels() {
        platform.TELIX_JS_CM_GetOnid = id(1);
        platform.TELIX_JS_CM_GetTsid = id(2);
        platform.TELIX_JS_CM_GetSid = id(3);
        platform.TELIX_JS_CM_GetChannelType = [](uint32_t, int32_t* type) {
            *type = 1;
            return 0;
        };
        platform.TELIX_JS_CM_GetName = text("name ");
        platform.TELIX_JS_CM_GetDsd = text("dsd ");
    }

    static std::function<int32_t(uint32_t, uint32_t*)> id(uint32_t offset) {
        return [offset](uint32_t handle, uint32_t* out) {
            EXPECT_EQ(*out, 0U) << "the result is preset";
            *out = handle + offset;
            return 0;
        };
    }

    static std::function<int32_t(uint32_t, char**)> text(const std::string& prefix) {
        return [prefix](uint32_t handle, char** out) {
            EXPECT_EQ(*out, nullptr) << "the result is preset";
            *out = platformText(prefix + std::to_string(handle));
            return 0;
        };
    }
};

TEST_F(ChannelTest, AsksForItsNamesInTableOrder) {
    EXPECT_THAT(namesOf<JSChannel>(), ElementsAre("onid", "tsid", "sid", "channelType", "ccid", "name", "dsd",
                                                  "TYPE_TV", "TYPE_RADIO", "TYPE_OTHER"));
}

TEST_F(ChannelTest, ReadsEveryPropertyFromThePlatformThroughItsHandle) {
    describeChannels();
    const ObjectRef channel = channelOf(70);
    log.clear();
    EXPECT_EQ(channel.get("onid"), 71);
    EXPECT_EQ(channel.get("tsid"), 72);
    EXPECT_EQ(channel.get("sid"), 73);
    EXPECT_EQ(channel.get("channelType"), 1);
    EXPECT_EQ(channel.get("ccid"), "70");
    EXPECT_EQ(channel.get("name"), "name 70");
    EXPECT_EQ(channel.get("dsd"), "dsd 70");
    EXPECT_EQ(channel.get("TYPE_TV"), 0);
    EXPECT_EQ(channel.get("TYPE_RADIO"), 1);
    EXPECT_EQ(channel.get("TYPE_OTHER"), 2);
    EXPECT_THAT(log.calls(), ElementsAre("TELIX_JS_CM_GetOnid(70, out)", "TELIX_JS_CM_GetTsid(70, out)",
                                         "TELIX_JS_CM_GetSid(70, out)", "TELIX_JS_CM_GetChannelType(70, out)",
                                         "TELIX_JS_CM_GetName(70, out)", "TELIX_JS_CM_GetDsd(70, out)"));
}

TEST_F(ChannelTest, HandsTextsOutInTheBrowsersMemory) {
    describeChannels();
    const ObjectRef channel = channelOf(70);
    for (const char* name : {"ccid", "name", "dsd"}) {
        EXPECT_TRUE(channel.get(name).inBrowserMemory) << name;
    }
}

TEST_F(ChannelTest, GivesNullForATextWhenTheBrowserHasNoMemory) {
    describeChannels();
    const ObjectRef channel = channelOf(70);
    browser.refuse("NPN_MemAlloc");
    for (const char* name : {"ccid", "name", "dsd"}) {
        EXPECT_EQ(channel.get(name), nullptr) << name;
    }
}

TEST_F(ChannelTest, IsReadOnlyThroughout) {
    describeChannels();
    const ObjectRef channel = channelOf(70);
    expectReadOnly(channel, {"onid", "tsid", "sid", "channelType", "ccid", "name", "dsd", "TYPE_TV",
                             "TYPE_RADIO", "TYPE_OTHER"});
    expectNothingElse(channel);
    EXPECT_EQ(channel.get("name"), "name 70");
}

TEST_F(ChannelTest, WithoutAHandleReadsItsStartValuesAndAsksNothing) {
    describeChannels();
    const ObjectRef channel = channelOf(0);
    log.clear();
    EXPECT_EQ(channel.get("onid"), 0);
    EXPECT_EQ(channel.get("tsid"), 0);
    EXPECT_EQ(channel.get("sid"), 0);
    EXPECT_EQ(channel.get("channelType"), 3);
    EXPECT_EQ(channel.get("ccid"), nullptr);
    EXPECT_EQ(channel.get("name"), nullptr);
    EXPECT_EQ(channel.get("dsd"), nullptr);
    EXPECT_THAT(log.calls(), IsEmpty());
}

TEST_F(ChannelTest, TakesItsHandleInDecimalForItsCcid) {
    EXPECT_EQ(channelOf(1234).get("ccid"), "1234");
}

TEST_F(ChannelTest, WritesAHandleAboveTheSignedRangeAsANegativeCcid) {
    EXPECT_EQ(channelOf(0xFFFFFFFF).get("ccid"), "-1");
    EXPECT_EQ(channelOf(0x80000000).get("ccid"), "-2147483648");
}

TEST_F(ChannelTest, AsksOnceForIdsAndTextsButForTheTypeAtEveryRead) {
    describeChannels();
    const ObjectRef channel = channelOf(70);
    for (int i = 0; i < 3; ++i) {
        for (const char* name : {"onid", "tsid", "sid", "channelType", "name", "dsd"}) {
            EXPECT_TRUE(channel.get(name));
        }
    }
    EXPECT_EQ(platform.TELIX_JS_CM_GetOnid.count(), 1U);
    EXPECT_EQ(platform.TELIX_JS_CM_GetTsid.count(), 1U);
    EXPECT_EQ(platform.TELIX_JS_CM_GetSid.count(), 1U);
    EXPECT_EQ(platform.TELIX_JS_CM_GetName.count(), 1U);
    EXPECT_EQ(platform.TELIX_JS_CM_GetDsd.count(), 1U);
    EXPECT_EQ(platform.TELIX_JS_CM_GetChannelType.count(), 3U);
}

TEST_F(ChannelTest, AsksAgainForAnIdThatIsZero) {
    platform.TELIX_JS_CM_GetOnid = [](uint32_t, uint32_t* out) {
        *out = 0;
        return 0;
    };
    const ObjectRef channel = channelOf(70);
    EXPECT_EQ(channel.get("onid"), 0);
    EXPECT_EQ(channel.get("onid"), 0);
    EXPECT_EQ(platform.TELIX_JS_CM_GetOnid.count(), 2U);
}

TEST_F(ChannelTest, ReadsAnEmptyNameAsNullAndAsksAgain) {
    platform.TELIX_JS_CM_GetName = [](uint32_t, char** out) {
        *out = platformText("");
        return 0;
    };
    const ObjectRef channel = channelOf(70);
    EXPECT_EQ(channel.get("name"), nullptr);
    EXPECT_EQ(channel.get("name"), nullptr);
    EXPECT_EQ(platform.TELIX_JS_CM_GetName.count(), 2U);
}

TEST_F(ChannelTest, ReadsASuccessfulAnswerWithoutATextAsNull) {
    const ObjectRef channel = channelOf(70);
    EXPECT_EQ(channel.get("name"), nullptr);
    EXPECT_EQ(channel.get("dsd"), nullptr);
}

TEST_F(ChannelTest, KeepsItsStartValuesWhileThePlatformRefuses) {
    const auto refuseId = [](uint32_t, uint32_t* out) {
        *out = 9;
        return 1;
    };
    const auto refuseText = [](uint32_t, char** out) {
        *out = platformText("given and refused"); // freed all the same
        return 1;
    };
    platform.TELIX_JS_CM_GetOnid = refuseId;
    platform.TELIX_JS_CM_GetTsid = refuseId;
    platform.TELIX_JS_CM_GetSid = refuseId;
    platform.TELIX_JS_CM_GetName = refuseText;
    platform.TELIX_JS_CM_GetDsd = refuseText;
    platform.TELIX_JS_CM_GetChannelType = [](uint32_t, int32_t* out) {
        *out = 2;
        return 1;
    };
    const ObjectRef channel = channelOf(70);
    for (const char* name : {"onid", "tsid", "sid"}) {
        EXPECT_EQ(channel.get(name), 0) << name;
    }
    EXPECT_EQ(channel.get("channelType"), 3);
    EXPECT_EQ(channel.get("name"), nullptr);
    EXPECT_EQ(channel.get("dsd"), nullptr);

    describeChannels();
    EXPECT_EQ(channel.get("onid"), 71);
    EXPECT_EQ(channel.get("name"), "name 70");
}

TEST_F(ChannelTest, KeepsTheLastTypeWhenThePlatformRefusesLater) {
    describeChannels();
    const ObjectRef channel = channelOf(70);
    EXPECT_EQ(channel.get("channelType"), 1);
    platform.TELIX_JS_CM_GetChannelType = [](uint32_t, int32_t*) { return 1; };
    EXPECT_EQ(channel.get("channelType"), 1);
}

TEST_F(ChannelTest, PassesAnyChannelTypeThrough) {
    platform.TELIX_JS_CM_GetChannelType = [](uint32_t, int32_t* out) {
        *out = -7;
        return 0;
    };
    EXPECT_EQ(channelOf(70).get("channelType"), -7);
}

TEST_F(ChannelTest, ReadsIdsAboveTheSignedRangeAsNegativeNumbers) {
    platform.TELIX_JS_CM_GetSid = [](uint32_t, uint32_t* out) {
        *out = 0xFFFFFFFE;
        return 0;
    };
    EXPECT_EQ(channelOf(70).get("sid"), -2);
}

TEST_F(ChannelTest, FetchesEverythingAnewAfterAReset) {
    describeChannels();
    const ObjectRef channel = channelOf(70);
    for (const char* name : {"onid", "tsid", "sid", "channelType", "ccid", "name", "dsd"}) {
        EXPECT_TRUE(channel.get(name));
    }
    modelOf<JSChannel>(channel).reset(80);
    EXPECT_EQ(modelOf<JSChannel>(channel).getChannelHandle(), 80U);
    EXPECT_EQ(channel.get("onid"), 81);
    EXPECT_EQ(channel.get("tsid"), 82);
    EXPECT_EQ(channel.get("sid"), 83);
    EXPECT_EQ(channel.get("ccid"), "80");
    EXPECT_EQ(channel.get("name"), "name 80");
    EXPECT_EQ(channel.get("dsd"), "dsd 80");
}

TEST_F(ChannelTest, IsEmptyAfterAResetToNoChannel) {
    describeChannels();
    const ObjectRef channel = channelOf(70);
    for (const char* name : {"onid", "tsid", "sid", "channelType", "ccid", "name", "dsd"}) {
        EXPECT_TRUE(channel.get(name));
    }
    modelOf<JSChannel>(channel).reset(0);
    for (const char* name : {"onid", "tsid", "sid"}) {
        EXPECT_EQ(channel.get(name), 0) << name;
    }
    EXPECT_EQ(channel.get("channelType"), 3);
    for (const char* name : {"ccid", "name", "dsd"}) {
        EXPECT_EQ(channel.get(name), nullptr) << name;
    }
}

TEST_F(ChannelTest, KeepsWhatItHasReadWhenOnlyTheHandleIsSet) {
    describeChannels();
    const ObjectRef channel = channelOf(70);
    EXPECT_EQ(channel.get("name"), "name 70");
    EXPECT_EQ(channel.get("ccid"), "70");
    modelOf<JSChannel>(channel).setChannelHandle(0);
    EXPECT_EQ(channel.get("name"), "name 70");
    EXPECT_EQ(channel.get("ccid"), "70");
}

TEST_F(ChannelTest, DiesWithThePagesLastReference) {
    ObjectRef channel = channelOf(70);
    EXPECT_EQ(channel.pluginReferences(), 0);
    EXPECT_EQ(browser.liveCount("JSChannel"), 1U);
    channel = {};
    EXPECT_EQ(browser.liveCount("JSChannel"), 0U);
}

TEST_F(ChannelTest, LogsUnderItsModuleWithTheMembersOwnNames) {
    const std::string text = logOf(4, [this] {
        const ObjectRef channel = channelOf(70);
        for (const char* name : {"onid", "tsid", "sid", "channelType", "ccid", "name", "dsd", "TYPE_TV",
                                 "TYPE_RADIO", "TYPE_OTHER"}) {
            EXPECT_TRUE(channel.get(name));
        }
        channel.set("name", "x");
        channel.call("name");
    });
    for (const char* member :
         {"pId_Onid", "pId_Tsid", "pId_Sid", "pId_ChannelType", "pId_Ccid", "pId_Name", "pId_Dsd",
          "cId_ChannelType_TV", "cId_ChannelType_RADIO", "cId_ChannelType_OTHER"}) {
        EXPECT_THAT(text, HasSubstr(std::string(member) + "\n"));
    }
    EXPECT_THAT(text, HasSubstr(logLine("CHANNEL", "getCcid", "Channel:( 0x")));
    EXPECT_THAT(text, HasSubstr(" )::m_Ccid= ( 70 )\n"));
    for (const char* function : {"SetProperty", "HasMethod", "Invoke"}) {
        EXPECT_THAT(text, HasSubstr(logLine("CHANNEL", function, "JSChannel class\n")));
    }
}

} // namespace
