// The key set: live when reached through an application, inert when reached through the configuration object.
#include <cmath>
#include <limits>

#include "tests/support/BorderTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;

namespace {

class KeySetTest : public BorderTest {
protected:
    void TearDown() override {
        application = {};
        keys = {};
        BorderTest::TearDown();
    }

    static ObjectRef keySetOf(const ObjectRef& application) {
        return application.get("privateData").object().get("keyset").object();
    }

    ObjectRef newApplication() const {
        return manager.call("getOwnerApplication", browser.document()).object();
    }

    void maskInForceIs(uint32_t mask) {
        platform.TELIX_JS_APP_GetKeySetValue = [mask](uint32_t* out) {
            *out = mask;
            return TELIX_RETCODE_SUCCESS;
        };
    }

    // Takes every mask and answers another.
    void newMasksAreAnsweredWith(uint32_t answer) {
        platform.TELIX_JS_APP_SetKeySetValue = [this, answer](uint32_t mask, uint32_t* granted) {
            masks.push_back(mask);
            *granted = answer;
            return TELIX_RETCODE_SUCCESS;
        };
    }

    void newMasksAreRefused() {
        platform.TELIX_JS_APP_SetKeySetValue = [this](uint32_t mask, uint32_t* granted) {
            masks.push_back(mask);
            *granted = 99;
            return 1;
        };
    }

    // Each read that looks for the application leaves a reference to its private data and its key set, and
    // the private data, being alive for good, keeps one of the key set.
    void searchesLeaveReferences(int searches) {
        leftBehind("JSApplicationPrivateData", searches);
        leftBehind("JSKeySet", searches + 1);
    }

    EmbeddedObject manager = browser.embed("application/oipfapplicationmanager");
    ObjectRef application = newApplication();
    ObjectRef keys = keySetOf(application);
    std::vector<uint32_t> masks; // that the platform was given
};

TEST_F(KeySetTest, FetchesItsNamesInTheirOrder) {
    log.clear();
    keySetOf(newApplication());
    BorderLog::Entries names = log.startingWith("NPN_GetStringIdentifier");
    ASSERT_GE(names.size(), 12U);
    names.erase(names.begin(), names.end() - 12);
    EXPECT_THAT(names,
                ElementsAre("NPN_GetStringIdentifier \"value\"", "NPN_GetStringIdentifier \"setValue\"",
                            "NPN_GetStringIdentifier \"RED\"", "NPN_GetStringIdentifier \"GREEN\"",
                            "NPN_GetStringIdentifier \"YELLOW\"", "NPN_GetStringIdentifier \"BLUE\"",
                            "NPN_GetStringIdentifier \"NAVIGATION\"", "NPN_GetStringIdentifier \"VCR\"",
                            "NPN_GetStringIdentifier \"SCROLL\"", "NPN_GetStringIdentifier \"INFO\"",
                            "NPN_GetStringIdentifier \"NUMERIC\"", "NPN_GetStringIdentifier \"ALPHA\""));
}

// Reading.

TEST_F(KeySetTest, TheMaskInForceIsAskedForUntilItIsKnown) {
    maskInForceIs(0);
    EXPECT_EQ(keys.get("value"), Value(0));
    maskInForceIs(0x1F);
    EXPECT_EQ(keys.get("value"), Value(0x1F));
    maskInForceIs(0x2F);
    EXPECT_EQ(keys.get("value"), Value(0x1F));
    EXPECT_EQ(platform.TELIX_JS_APP_GetKeySetValue.count(), 2U);
    searchesLeaveReferences(2);
}

TEST_F(KeySetTest, ARefusedReadGivesZeroAndIsTriedAgain) {
    platform.TELIX_JS_APP_GetKeySetValue = [](uint32_t* out) {
        *out = 7;
        return 1;
    };
    EXPECT_EQ(keys.get("value"), Value(0));
    maskInForceIs(7);
    EXPECT_EQ(keys.get("value"), Value(7));
    searchesLeaveReferences(2);
}

TEST_F(KeySetTest, AMaskAboveTheSignedRangeReadsNegative) {
    maskInForceIs(0x80000001);
    EXPECT_EQ(keys.get("value"), Value(std::numeric_limits<int32_t>::min() + 1));
    searchesLeaveReferences(1);
}

TEST_F(KeySetTest, WithoutItsApplicationAReadDoesNotAskButAWriteDoes) {
    application = {};
    maskInForceIs(7);
    newMasksAreAnsweredWith(3);
    EXPECT_EQ(keys.get("value"), Value(0));
    EXPECT_EQ(platform.TELIX_JS_APP_GetKeySetValue.count(), 0U);
    EXPECT_EQ(keys.call("setValue", 5), Value(3));
    EXPECT_EQ(keys.get("value"), Value(5));
    EXPECT_THAT(masks, ElementsAre(5U));
}

TEST_F(KeySetTest, WithoutAManagerNothingIsAskedAndTheLastMaskStays) {
    newMasksAreAnsweredWith(3);
    keys.call("setValue", 5);
    manager.destroy();
    EXPECT_EQ(keys.call("setValue", 9), Value(5));
    EXPECT_EQ(keys.get("value"), Value(5));
    EXPECT_THAT(masks, ElementsAre(5U));
}

// Setting.

TEST_F(KeySetTest, ScriptGetsThePlatformsAnswerAndReadsWhatItAskedFor) {
    newMasksAreAnsweredWith(0x13);
    EXPECT_EQ(keys.call("setValue", 0x1F), Value(0x13));
    EXPECT_EQ(keys.get("value"), Value(0x1F));
    EXPECT_THAT(masks, ElementsAre(0x1FU));
    EXPECT_EQ(platform.TELIX_JS_APP_GetKeySetValue.count(), 0U);
}

TEST_F(KeySetTest, ARefusedMaskLeavesTheOldOne) {
    newMasksAreAnsweredWith(0x1F);
    keys.call("setValue", 0x1F);
    newMasksAreRefused();
    EXPECT_EQ(keys.call("setValue", 0x3F), Value(0x1F));
    EXPECT_EQ(keys.get("value"), Value(0x1F));
    EXPECT_THAT(masks, ElementsAre(0x1FU, 0x3FU));
}

TEST_F(KeySetTest, NumbersAreTruncatedAndSaturate) {
    newMasksAreAnsweredWith(0);
    for (const Value& mask : Values{3.9, -1, -0.5, -1e300, 4294967295.0, 1e12, std::nan(""), 0x7FFFFFFF, 0}) {
        EXPECT_TRUE(keys.call("setValue", mask)) << mask;
    }
    EXPECT_THAT(masks, ElementsAre(3U, 0U, 0U, 0U, 0xFFFFFFFFU, 0xFFFFFFFFU, 0U, 0x7FFFFFFFU, 0U));
}

TEST_F(KeySetTest, AnyBitsGoToThePlatform) {
    newMasksAreAnsweredWith(0xFFFFFFFF);
    EXPECT_EQ(keys.call("setValue", 0x7FFFFC00), Value(-1));
    EXPECT_THAT(masks, ElementsAre(0x7FFFFC00U));
}

TEST_F(KeySetTest, AMaskThatIsNoNumberIsRefusedAndNothingIsCalled) {
    for (const Value& mask : Values{"3", nullptr, undefined, true, Value(browser.scriptObject("object"))}) {
        EXPECT_FALSE(keys.call("setValue", mask)) << mask;
    }
    EXPECT_FALSE(keys.call("setValue"));
    EXPECT_EQ(platform.TELIX_JS_APP_SetKeySetValue.count(), 0U);
}

TEST_F(KeySetTest, TheSecondArgumentGoesNoFurtherThanTheLog) {
    newMasksAreAnsweredWith(1);
    const std::string withBoth = logOf(2, [&] { EXPECT_EQ(keys.call("setValue", 5, 6.7), Value(1)); });
    EXPECT_THAT(withBoth, HasSubstr(logLine("APP_MGR", "setValue", " Value: 5, Other: 6 \n")));
    EXPECT_THAT(withBoth, HasSubstr(logLine("APP_MGR", "setValue", " Value_typecast: 5, Other: 6 \n")));
    for (const Value& other : Values{"6", nullptr, undefined, true, Value(browser.scriptObject("object"))}) {
        EXPECT_THAT(logOf(2, [&] { EXPECT_TRUE(keys.call("setValue", 5, other)); }),
                    HasSubstr(" Value: 5, Other: 0 \n"));
    }
    EXPECT_THAT(logOf(2, [&] { EXPECT_TRUE(keys.call("setValue", 5)); }),
                HasSubstr(" Value: 5, Other: 0 \n"));
    log.clear();
    keys.call("setValue", 5, 6);
    EXPECT_THAT(log.startingWith("TELIX"), ElementsAre("TELIX_JS_APP_SetKeySetValue(5, out)"));
}

TEST_F(KeySetTest, AMaskOfZeroLeavesTheNextReadToThePlatform) {
    newMasksAreAnsweredWith(0);
    keys.call("setValue", 0x1F);
    keys.call("setValue", 0);
    maskInForceIs(0x2);
    EXPECT_EQ(keys.get("value"), Value(0x2));
    EXPECT_EQ(platform.TELIX_JS_APP_GetKeySetValue.count(), 1U);
    searchesLeaveReferences(1);
}

TEST_F(KeySetTest, TwoApplicationsWriteTheSameMaskAndEachKeepsItsOwnValue) {
    const ObjectRef other = newApplication();
    const ObjectRef otherKeys = keySetOf(other);
    newMasksAreAnsweredWith(0);
    keys.call("setValue", 1);
    otherKeys.call("setValue", 2);
    EXPECT_EQ(keys.get("value"), Value(1));
    EXPECT_EQ(otherKeys.get("value"), Value(2));
    EXPECT_THAT(masks, ElementsAre(1U, 2U));
}

// The table.

struct KeyGroup {
    const char* name;
    int value;
};

const KeyGroup kKeyGroups[] = {{"RED", 0x1},         {"GREEN", 0x2},  {"YELLOW", 0x4},  {"BLUE", 0x8},
                               {"NAVIGATION", 0x10}, {"VCR", 0x20},   {"SCROLL", 0x40}, {"INFO", 0x80},
                               {"NUMERIC", 0x100},   {"ALPHA", 0x200}};

TEST_F(KeySetTest, TheConstantsReadTheSameBeforeAndAfterSetting) {
    newMasksAreAnsweredWith(0);
    for (const KeyGroup& group : kKeyGroups) {
        EXPECT_EQ(keys.get(group.name), Value(group.value)) << group.name;
    }
    keys.call("setValue", 0x3FF);
    for (const KeyGroup& group : kKeyGroups) {
        EXPECT_EQ(keys.get(group.name), Value(group.value)) << group.name;
        EXPECT_FALSE(keys.hasMethod(group.name)) << group.name;
        EXPECT_FALSE(keys.call(group.name).succeeded) << group.name;
    }
}

TEST_F(KeySetTest, NothingCanBeAssigned) {
    newMasksAreAnsweredWith(0);
    keys.call("setValue", 0x1F);
    std::vector<const char*> names{"value", "setValue", "other"};
    for (const KeyGroup& group : kKeyGroups) {
        names.push_back(group.name);
    }
    for (const char* name : names) {
        for (const Value& value :
             Values{1, 1.5, "1", true, nullptr, undefined, Value(browser.scriptObject("o"))}) {
            EXPECT_FALSE(keys.set(name, value).succeeded) << name << " = " << value;
        }
    }
    EXPECT_EQ(keys.get("value"), Value(0x1F));
    EXPECT_THAT(masks, ElementsAre(0x1FU));
}

TEST_F(KeySetTest, HasNothingElse) {
    EXPECT_TRUE(keys.hasProperty("value"));
    EXPECT_TRUE(keys.hasMethod("setValue"));
    EXPECT_FALSE(keys.hasMethod("value"));
    EXPECT_FALSE(keys.hasProperty("setValue"));
    EXPECT_FALSE(keys.hasProperty("red"));
    EXPECT_FALSE(keys.get("setValue").succeeded);
    EXPECT_FALSE(keys.call("value").succeeded);
    EXPECT_FALSE(keys.callDefault());
    NPVariant result{};
    result.type = NPVariantType_Int32;
    EXPECT_FALSE(keys.object()->_class->getProperty(keys.object(), Name("other").identifier(), &result));
    EXPECT_EQ(result.type, NPVariantType_Void);
}

TEST_F(KeySetTest, LogsUnderTheApplicationManagersModule) {
    EXPECT_THAT(logOf(2, [&] { keys.get("RED"); }),
                HasSubstr(logLine("APP_MGR", "GetProperty", " cId_RED\n")));
    EXPECT_THAT(logOf(2, [&] { keys.call("setValue", 1); }),
                HasSubstr(logLine("APP_MGR", "Invoke", " mId_setValue\n")));
}

// Through the configuration object.

TEST_F(KeySetTest, TheKeySetOfTheConfigurationObjectIsInert) {
    const EmbeddedObject configuration = browser.embed("application/oipfconfiguration");
    const ObjectRef inert = configuration.get("keyset").object();
    maskInForceIs(0x1F);
    newMasksAreAnsweredWith(0x1F);
    EXPECT_EQ(inert.get("value"), Value(0));
    EXPECT_EQ(inert.call("setValue", 0x1F), Value(0));
    EXPECT_EQ(inert.get("value"), Value(0));
    EXPECT_FALSE(inert.call("setValue", "3"));
    EXPECT_EQ(inert.get("ALPHA"), Value(0x200));
    EXPECT_EQ(log.count("TELIX_JS_APP_GetKeySetValue"), 0U);
    EXPECT_EQ(log.count("TELIX_JS_APP_SetKeySetValue"), 0U);
    // The one of the application is as live as before.
    EXPECT_EQ(keys.call("setValue", 3), Value(0x1F));
    EXPECT_EQ(keys.get("value"), Value(3));
}

} // namespace
