// The channel configuration and the list that it offers, as a page sees them.
#include "src/channel/JSChannel.h"
#include "src/channel/JSChannelConfig.h"
#include "src/channel/JSChannelList.h"
#include "tests/support/SubObjectTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

namespace {

class ChannelListTest : public SubObjectTest {
protected:
    void TearDown() override {
        leftBehind("JSChannel", channelsLeftBehind);
        SubObjectTest::TearDown();
    }

    // The configuration of a platform with these channels, whose objects outlive it on purpose.
    ObjectRef configOf(std::vector<uint32_t> channels) {
        handles = std::move(channels);
        platform.TELIX_JS_CM_GetChannelList = [this](uint32_t* count, uint32_t** out) {
            EXPECT_EQ(*count, 0U) << "the results are preset";
            EXPECT_EQ(*out, nullptr) << "the results are preset";
            *count = static_cast<uint32_t>(handles.size());
            *out = handles.data();
            return 0;
        };
        channelsLeftBehind += static_cast<int>(handles.size());
        return make<JSChannelConfig>();
    }

    ObjectRef listOf(std::vector<uint32_t> channels) {
        return configOf(std::move(channels)).get("channelList").object();
    }

    void answerTriplet(uint32_t handle) {
        platform.TELIX_JS_CM_GetChannelByTriplet = [handle](uint32_t, uint32_t, uint32_t, uint32_t* out) {
            EXPECT_EQ(*out, 0U) << "the result is preset";
            *out = handle;
            return 0;
        };
    }

    uint32_t handleOf(const ObjectRef& channel) { return modelOf<JSChannel>(channel).getChannelHandle(); }

    std::vector<uint32_t> handles;
    int channelsLeftBehind = 0; // one reference each
};

TEST_F(ChannelListTest, ConfigAsksForItsNameAndListForItsNamesInTableOrder) {
    EXPECT_THAT(namesOf<JSChannelConfig>(), ElementsAre("channelList"));
    EXPECT_THAT(namesOf<JSChannelList>(), ElementsAre("getChannelByTriplet", "item", "getChannel", "length"));
}

TEST_F(ChannelListTest, ConfigHasOneReadOnlyPropertyAndNothingElse) {
    const ObjectRef config = configOf({1});
    expectReadOnly(config, {"channelList"});
    expectNothingElse(config);
    EXPECT_TRUE(config.get("channelList").value.isObject());
}

TEST_F(ChannelListTest, ARefusedListReadsAsNullAndTheNextReadAsksAgain) {
    const ObjectRef config = configOf({1, 2});
    const auto answer = *platform.TELIX_JS_CM_GetChannelList.current();
    platform.TELIX_JS_CM_GetChannelList = [](uint32_t*, uint32_t**) { return 1; };
    EXPECT_EQ(config.get("channelList"), nullptr);
    platform.TELIX_JS_CM_GetChannelList = answer;
    EXPECT_EQ(config.get("channelList").object().get("length"), 2);
    EXPECT_EQ(platform.TELIX_JS_CM_GetChannelList.count(), 2U);
}

TEST_F(ChannelListTest, AnAnswerWithoutAnArrayIsARefusal) {
    const ObjectRef config = configOf({});
    platform.TELIX_JS_CM_GetChannelList = [](uint32_t* count, uint32_t**) {
        *count = 3;
        return 0;
    };
    EXPECT_EQ(config.get("channelList"), nullptr);
    EXPECT_EQ(config.get("channelList"), nullptr);
    EXPECT_EQ(platform.TELIX_JS_CM_GetChannelList.count(), 2U);
}

TEST_F(ChannelListTest, ChannelListIsOneObjectReadOnce) {
    const ObjectRef config = configOf({1});
    const ObjectRef list = config.get("channelList").object();
    EXPECT_EQ(config.get("channelList").object(), list);
    EXPECT_EQ(platform.TELIX_JS_CM_GetChannelList.count(), 1U);
    EXPECT_EQ(list.pluginReferences(), 1) << "the configuration's own";
}

TEST_F(ChannelListTest, TheListOutlivesItsConfigurationInThePagesHands) {
    ObjectRef config = configOf({1});
    const ObjectRef list = config.get("channelList").object();
    config = {};
    EXPECT_EQ(list.pluginReferences(), 0);
    EXPECT_EQ(list.get("length"), 1);
}

TEST_F(ChannelListTest, AListThatTheBrowserDoesNotMakeReadsAsNullAndIsTriedAgain) {
    const ObjectRef config = configOf({1});
    browser.refuse("NPN_CreateObject", 1);
    EXPECT_EQ(config.get("channelList"), nullptr);
    EXPECT_EQ(config.get("channelList").object().get("length"), 1);
}

TEST_F(ChannelListTest, HoldsAChannelForEachHandleInOrder) {
    const ObjectRef list = listOf({30, 10, 20});
    EXPECT_EQ(list.get("length"), 3);
    EXPECT_EQ(list.call("item", 0).object().get("ccid"), "30");
    EXPECT_EQ(list.call("item", 1).object().get("ccid"), "10");
    EXPECT_EQ(list.call("item", 2).object().get("ccid"), "20");
}

TEST_F(ChannelListTest, CreatesUntilTheBrowserMakesEveryChannel) {
    const ObjectRef config = configOf({1, 2});
    browser.refuse("NPN_CreateObject", 3, 1); // the list, then three refusals
    const ObjectRef list = config.get("channelList").object();
    EXPECT_EQ(list.get("length"), 2);
    EXPECT_EQ(handleOf(list.call("item", 0).object()), 1U);
    EXPECT_EQ(handleOf(list.call("item", 1).object()), 2U);
}

TEST_F(ChannelListTest, EachChannelHasTwoReferencesAtTheOutsetAndOneIsLeftBehind) {
    ObjectRef config = configOf({1, 2});
    ObjectRef list = config.get("channelList").object();
    const ObjectRef channel = list.call("item", 1).object();
    EXPECT_EQ(channel.pluginReferences(), 2);
    config = {};
    log.clear();
    list = {};
    EXPECT_EQ(channel.pluginReferences(), 1);
    EXPECT_THAT(log.startingWith("NPN_ReleaseObject"),
                ElementsAre("NPN_ReleaseObject JSChannel#2", "NPN_ReleaseObject JSChannel"))
        << "from the last to the first";
}

TEST_F(ChannelListTest, ZeroChannelsWithAnArrayGiveAListOfLengthZero) {
    const ObjectRef config = configOf({});
    platform.TELIX_JS_CM_GetChannelList = [](uint32_t* count, uint32_t** out) {
        static uint32_t none = 0;
        *count = 0;
        *out = &none;
        return 0;
    };
    const ObjectRef list = config.get("channelList").object();
    EXPECT_EQ(list.get("length"), 0);
    EXPECT_EQ(list.call("item", 0), nullptr);
    EXPECT_FALSE(list.hasProperty("0"));
    EXPECT_FALSE(list.get("0").succeeded);
    EXPECT_EQ(list.call("getChannel", "1"), nullptr);
}

TEST_F(ChannelListTest, AListWithoutHandlesIsEmpty) {
    const ObjectRef list = make<JSChannelList>([](ChannelList& model) { model.initialize(nullptr, 3); });
    EXPECT_EQ(list.get("length"), 0);
}

TEST_F(ChannelListTest, LengthIsReadOnlyAndTheRestAreMethods) {
    const ObjectRef list = listOf({1});
    expectReadOnly(list, {"length", "0"});
    expectMethods(list, {"getChannelByTriplet", "item", "getChannel"});
    expectNothingElse(list);
    EXPECT_EQ(list.get("length"), 1);
}

TEST_F(ChannelListTest, ItemAtTheLengthIsNull) {
    const ObjectRef list = listOf({1, 2});
    EXPECT_EQ(list.call("item", 2), nullptr);
    EXPECT_EQ(list.call("item", 4294967295.0), nullptr);
}

TEST_F(ChannelListTest, ItemTakesAnyNumberTruncatedAndNothingElse) {
    const ObjectRef list = listOf({1, 2});
    EXPECT_EQ(handleOf(list.call("item", 1.9).object()), 2U);
    EXPECT_EQ(handleOf(list.call("item", -5).object()), 1U);
    for (const Value& value : {Value(undefined), Value(nullptr), Value(true), Value("0"), Value(list)}) {
        EXPECT_FALSE(list.call("item", value).succeeded) << value;
    }
    EXPECT_FALSE(list.call("item").succeeded);
}

TEST_F(ChannelListTest, ArrayNotationAndItemGiveTheSameObjectWithOneMoreReferenceEach) {
    const ObjectRef list = listOf({1, 2});
    const ObjectRef channel = list.get("0").object();
    EXPECT_EQ(channel, list.call("item", 0).object());
    EXPECT_EQ(channel.pluginReferences(), 2) << "what was handed out is the page's";
}

TEST_F(ChannelListTest, ANameThatBeginsWithADigitIsAnIndex) {
    const ObjectRef list = listOf({1, 2});
    EXPECT_TRUE(list.hasProperty("1x"));
    EXPECT_EQ(handleOf(list.get("1x").object()), 2U);
    for (const char* name : {"2", "2x", "-1", "x1", ""}) {
        EXPECT_FALSE(list.hasProperty(name)) << name;
        EXPECT_FALSE(list.get(name).succeeded) << name;
    }
}

TEST_F(ChannelListTest, GetChannelFindsTheFirstChannelOfACcid) {
    const ObjectRef list = listOf({5, 7, 7});
    EXPECT_EQ(list.call("getChannel", "7").object(), list.call("item", 1).object());
    EXPECT_EQ(list.call("getChannel", "6"), nullptr);
    EXPECT_EQ(list.call("getChannel", "7 "), nullptr);
    EXPECT_EQ(list.call("item", 1).object().pluginReferences(), 2);
}

TEST_F(ChannelListTest, GetChannelOfAnEmptyTextFindsAChannelWithoutACcid) {
    const ObjectRef list = listOf({5, 0});
    EXPECT_EQ(list.call("getChannel", "").object(), list.call("item", 1).object());
    EXPECT_EQ(listOf({5}).call("getChannel", ""), nullptr);
}

TEST_F(ChannelListTest, GetChannelFindsCcidsOfLargeHandlesInNoOtherNotation) {
    const ObjectRef list = listOf({0x80000000, 9, 0xFFFFFFFF, 0, 2147483647});
    EXPECT_EQ(list.call("getChannel", "-2147483648").object(), list.call("item", 0).object());
    EXPECT_EQ(list.call("getChannel", "-1").object(), list.call("item", 2).object());
    EXPECT_EQ(list.call("getChannel", "2147483647").object(), list.call("item", 4).object());
    for (const char* other :
         {"4294967295", "99999999999999999999", "0", "-0", "+9", "09", " 9", "9x", "0x9"}) {
        EXPECT_EQ(list.call("getChannel", other), nullptr) << other;
    }
}

TEST_F(ChannelListTest, GetChannelFindsWhatAnEntryHasBecome) {
    const ObjectRef list = listOf({5, 7, 9});
    EXPECT_EQ(list.call("getChannel", "7").object(), list.call("item", 1).object());
    modelOf<JSChannel>(list.call("item", 0).object()).reset(9);
    EXPECT_EQ(list.call("getChannel", "9").object(), list.call("item", 0).object());
    EXPECT_EQ(list.call("getChannel", "5"), nullptr);
    modelOf<JSChannel>(list.call("item", 0).object()).reset(0);
    EXPECT_EQ(list.call("getChannel", "9").object(), list.call("item", 2).object());
    EXPECT_EQ(list.call("getChannel", "").object(), list.call("item", 0).object());
}

TEST_F(ChannelListTest, TheLogShowsASearchFromTheFrontEachTime) {
    const std::string text = logOf(4, [this] {
        const ObjectRef list = listOf({5, 6, 7});
        EXPECT_TRUE(list.call("getChannel", "6"));
        EXPECT_TRUE(list.call("getChannel", "6"));
    });
    const auto countOf = [&text](const std::string& part) {
        size_t count = 0;
        for (size_t at = text.find(part); at != std::string::npos; at = text.find(part, at + 1)) {
            ++count;
        }
        return count;
    };
    EXPECT_EQ(countOf("::m_Ccid= ( 5 )"), 2U);
    EXPECT_EQ(countOf("::m_Ccid= ( 6 )"), 2U);
    EXPECT_EQ(countOf("::m_Ccid= ( 7 )"), 0U);
}

TEST_F(ChannelListTest, GetChannelTakesATextOnly) {
    const ObjectRef list = listOf({5});
    for (const Value& value :
         {Value(undefined), Value(nullptr), Value(true), Value(5), Value(5.0), Value(list)}) {
        EXPECT_FALSE(list.call("getChannel", value).succeeded) << value;
    }
    EXPECT_FALSE(list.call("getChannel").succeeded);
}

TEST_F(ChannelListTest, GetChannelByTripletAsksThePlatformAndLooksTheHandleUp) {
    const ObjectRef list = listOf({5, 7});
    answerTriplet(7);
    log.clear();
    EXPECT_EQ(list.call("getChannelByTriplet", 1, 2, 3).object(), list.call("item", 1).object());
    EXPECT_THAT(log.calls(), ElementsAre("TELIX_JS_CM_GetChannelByTriplet(1, 2, 3, out)"));
    EXPECT_EQ(list.call("item", 1).object().pluginReferences(), 2);
}

TEST_F(ChannelListTest, ANullTransportStreamAsksForAnyOne) {
    const ObjectRef list = listOf({5, 7});
    answerTriplet(5);
    log.clear();
    EXPECT_EQ(list.call("getChannelByTriplet", 1, nullptr, 3).object(), list.call("item", 0).object());
    EXPECT_THAT(log.calls(), ElementsAre("TELIX_JS_CM_GetChannelByTriplet(1, 8191, 3, out)"));
}

TEST_F(ChannelListTest, TripletNumbersAreTruncatedToUnsigned) {
    const ObjectRef list = listOf({5});
    answerTriplet(5);
    log.clear();
    EXPECT_TRUE(list.call("getChannelByTriplet", 1.9, -2.5, 5000000000.0));
    EXPECT_THAT(log.calls(), ElementsAre("TELIX_JS_CM_GetChannelByTriplet(1, 0, 4294967295, out)"));
}

TEST_F(ChannelListTest, AChannelThatTheListDoesNotHoldIsNull) {
    const ObjectRef list = listOf({5});
    answerTriplet(6);
    EXPECT_EQ(list.call("getChannelByTriplet", 1, 2, 3), nullptr);
}

TEST_F(ChannelListTest, ATripletThatThePlatformRefusesIsNull) {
    const ObjectRef list = listOf({5});
    platform.TELIX_JS_CM_GetChannelByTriplet = [](uint32_t, uint32_t, uint32_t, uint32_t* out) {
        *out = 5;
        return 1;
    };
    EXPECT_EQ(list.call("getChannelByTriplet", 1, 2, 3), nullptr);
}

TEST_F(ChannelListTest, GetChannelByTripletTakesNumbersAndNullOnlyInTheMiddle) {
    const ObjectRef list = listOf({5});
    log.clear();
    for (const Value& wrong : {Value(undefined), Value(nullptr), Value(true), Value("1"), Value(list)}) {
        EXPECT_FALSE(list.call("getChannelByTriplet", wrong, 2, 3).succeeded) << wrong;
        EXPECT_FALSE(list.call("getChannelByTriplet", 1, 2, wrong).succeeded) << wrong;
    }
    for (const Value& wrong : {Value(undefined), Value(true), Value("1"), Value(list)}) {
        EXPECT_FALSE(list.call("getChannelByTriplet", 1, wrong, 3).succeeded) << wrong;
    }
    EXPECT_FALSE(list.call("getChannelByTriplet", 1).succeeded);
    EXPECT_THAT(log.calls(), IsEmpty());
}

TEST_F(ChannelListTest, TheModelFindsAChannelByItsHandle) {
    const ObjectRef list = listOf({5, 7});
    ChannelList& model = modelOf<JSChannelList>(list);
    EXPECT_EQ(ObjectRef::adopt(model.getChannel(7U)), list.call("item", 1).object());
    EXPECT_EQ(model.getChannel(8U), nullptr);
}

TEST_F(ChannelListTest, AFoundChannelIsLoggedBeforeItIsRetained) {
    const std::string text = logOf(1, [this] {
        const ObjectRef list = listOf({5});
        EXPECT_TRUE(list.call("getChannel", "5"));
    });
    const size_t found = text.find("getChannel() succeeded. ccid string: 5 ");
    ASSERT_NE(found, std::string::npos);
    EXPECT_NE(text.find("NPN_RetainObject", found), std::string::npos);
    const size_t asked = text.find("Channel Id =( 5 )");
    EXPECT_GT(text.find("NPN_RetainObject", asked), found);
}

TEST_F(ChannelListTest, LogsUnderTheChannelsModule) {
    const std::string text = logOf(4, [this] {
        const ObjectRef config = configOf({5});
        const ObjectRef list = config.get("channelList").object();
        answerTriplet(5);
        EXPECT_TRUE(list.get("0"));
        EXPECT_TRUE(list.call("getChannel", "5"));
        EXPECT_TRUE(list.call("getChannelByTriplet", 1, 2, 3));
        config.set("channelList", 1);
        config.call("channelList");
        platform.TELIX_JS_CM_GetChannelList = [](uint32_t*, uint32_t**) { return 1; };
        EXPECT_EQ(make<JSChannelConfig>().get("channelList"), nullptr);
    });
    for (const std::string& line : {
             logLine("CHANNEL", "getChannelList", " ChannelConfig getChannelListObject\n"),
             logLine("CHANNEL", "getChannelList", "TELIX_JS_CM_GetChannelList::channelCount:-- 1 --\n"),
             logLine("CHANNEL", "getChannelList", " TELIX_JS_CM_GetChannelList failed.\n"),
             logLine("CHANNEL", "initialize", "Channel Object =( 0x"),
             std::string(" ), ChannelHandle = (5) \n"),
             logLine("CHANNEL", "GetProperty", "Array Notation Index:-- 0 --\n"),
             logLine("CHANNEL", "getitem", " getitem\n"),
             logLine("CHANNEL", "getitem", " Channel Obj = 0x"),
             logLine("CHANNEL", "getChannel", "Channel Id =( 5 )\n"),
             logLine("CHANNEL", "getChannel", "getChannel() succeeded. ccid string: 5 \n"),
             logLine("CHANNEL", "getChannelByTriplet", "called. onid: 1, tsid: 2, sid: 3 \n"),
             logLine("CHANNEL", "getChannelByTriplet", "ChannelHandle = 5 \n"),
             logLine("CHANNEL", "SetProperty", "JSChannelConfig class\n"),
             logLine("CHANNEL", "HasMethod", "JSChannelConfig class\n"),
             logLine("CHANNEL", "Invoke", "JSChannelConfig class\n"),
         }) {
        EXPECT_THAT(text, HasSubstr(line));
    }
    EXPECT_THAT(text, Not(HasSubstr("PROGRAMME")));
}

} // namespace
