// An application's private data: the door to it, free memory, the presented channel, and the manager's search
// for the application that owns such an object.
#include "src/application/ApplicationManager.h"
#include "src/application/JSApplicationPrivateData.h"
#include "src/config/JSKeySet.h"
#include "tests/support/BorderTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;

namespace {

class PrivateDataTest : public BorderTest {
protected:
    ObjectRef newApplication() const {
        return manager.call("getOwnerApplication", browser.document()).object();
    }

    void freeMemoryIs(uint32_t amount) {
        platform.TELIX_JS_APP_GetFreeMem = [amount](uint32_t* out) {
            *out = amount;
            return TELIX_RETCODE_SUCCESS;
        };
    }

    void currentChannelIs(TELIX_JS_CM_HANDLE handle) {
        platform.TELIX_JS_APP_GetCurrentChannel = [handle](TELIX_JS_CM_HANDLE* out) {
            *out = handle;
            return TELIX_RETCODE_SUCCESS;
        };
    }

    void currentChannelIsRefused() {
        platform.TELIX_JS_APP_GetCurrentChannel = [](TELIX_JS_CM_HANDLE*) { return 1; };
    }

    // "currentChannel" as the browser finds it, with the reference not taken over.
    static NPVariant currentChannelVariant(const ObjectRef& data) {
        NPVariant result{};
        EXPECT_TRUE(
            data.object()->_class->getProperty(data.object(), Name("currentChannel").identifier(), &result));
        return result;
    }

    EmbeddedObject manager = browser.embed("application/oipfapplicationmanager");
};

// The application's property.

TEST_F(PrivateDataTest, BothNamesGiveTheSameObjectAtEveryRead) {
    const ObjectRef application = newApplication();
    const ObjectRef data = application.get("privateData").object();
    EXPECT_EQ(application.get("private"), Value(data));
    EXPECT_EQ(application.get("privateData"), Value(data));
    EXPECT_EQ(browser.classNameOf(data.object()), "JSApplicationPrivateData");
    EXPECT_EQ(data.pluginReferences(), 1);
}

TEST_F(PrivateDataTest, ThePropertyComesFirstAmongTheNamesOfAnApplication) {
    manager.scriptObject();
    log.clear();
    newApplication();
    const BorderLog::Entries names = log.startingWith("NPN_GetStringIdentifier");
    ASSERT_EQ(names.size(), 11U);
    EXPECT_EQ(names[0], "NPN_GetStringIdentifier \"privateData\"");
    EXPECT_EQ(names[1], "NPN_GetStringIdentifier \"private\"");
    EXPECT_EQ(names[2], "NPN_GetStringIdentifier \"onKeyPress\"");
}

TEST_F(PrivateDataTest, EachApplicationHasItsOwn) {
    EXPECT_NE(newApplication().get("privateData").object(), newApplication().get("privateData").object());
}

TEST_F(PrivateDataTest, CannotBeReplaced) {
    const ObjectRef application = newApplication();
    const ObjectRef data = application.get("privateData").object();
    for (const char* name : {"privateData", "private"}) {
        EXPECT_FALSE(application.hasMethod(name)) << name;
        EXPECT_FALSE(application.call(name)) << name;
        for (const Value& value :
             Values{Value(browser.scriptObject("other")), nullptr, 1, "text", true, undefined}) {
            EXPECT_FALSE(application.set(name, value)) << name << " = " << value;
        }
    }
    EXPECT_EQ(application.get("private"), Value(data));
}

TEST_F(PrivateDataTest, ReadsNullIfTheBrowserMakesNoObjectAndIsMadeLater) {
    const ObjectRef application = newApplication();
    browser.refuse("NPN_CreateObject", 1);
    EXPECT_EQ(application.get("privateData"), Value(nullptr));
    EXPECT_TRUE(application.get("privateData").value.isObject());
}

TEST_F(PrivateDataTest, AnApplicationGivesItBackBeforeItsHandlers) {
    ObjectRef application = newApplication();
    application.get("privateData");
    for (const char* name :
         {"onKeyPress", "onKeyUp", "onKeyDown", "onApplicationShown", "onApplicationHidden"}) {
        application.set(name, browser.function(name));
    }
    log.clear();
    application = {};
    EXPECT_THAT(log.startingWith("NPN_ReleaseObject"),
                ElementsAre("NPN_ReleaseObject JSApplicationPrivateData", "NPN_ReleaseObject onKeyDown",
                            "NPN_ReleaseObject onKeyUp", "NPN_ReleaseObject onKeyPress",
                            "NPN_ReleaseObject onApplicationShown", "NPN_ReleaseObject onApplicationHidden"));
}

TEST_F(PrivateDataTest, OutlivesItsApplicationInTheHandsOfThePage) {
    const ObjectRef data = newApplication().get("privateData").object();
    EXPECT_EQ(data.pluginReferences(), 0);
    EXPECT_TRUE(data.get("keyset").value.isObject());
}

// The object itself.

TEST_F(PrivateDataTest, FetchesItsNamesInTheirOrder) {
    const ObjectRef application = newApplication();
    log.clear();
    application.get("privateData");
    EXPECT_THAT(log.startingWith("NPN_GetStringIdentifier"),
                ElementsAre("NPN_GetStringIdentifier \"keyset\"", "NPN_GetStringIdentifier \"getFreeMem\"",
                            "NPN_GetStringIdentifier \"currentChannel\""));
}

TEST_F(PrivateDataTest, HasTwoPropertiesAndOneMethod) {
    const ObjectRef data = newApplication().get("privateData").object();
    EXPECT_TRUE(data.hasProperty("keyset"));
    EXPECT_TRUE(data.hasProperty("currentChannel"));
    EXPECT_TRUE(data.hasMethod("getFreeMem"));
    EXPECT_FALSE(data.hasProperty("getFreeMem"));
    EXPECT_FALSE(data.hasMethod("keyset"));
    EXPECT_FALSE(data.hasMethod("currentChannel"));
    EXPECT_FALSE(data.hasProperty("keySet"));
    EXPECT_FALSE(data.call("keyset").succeeded);
    EXPECT_FALSE(data.get("getFreeMem").succeeded);
    EXPECT_FALSE(data.callDefault());
    EXPECT_EQ(log.count("TELIX_JS_APP_Get"), 0U);
}

TEST_F(PrivateDataTest, AReadOfAnUnknownNameMakesTheResultVoidAndFails) {
    const ObjectRef data = newApplication().get("privateData").object();
    NPVariant result{};
    result.type = NPVariantType_Int32;
    EXPECT_FALSE(data.object()->_class->getProperty(data.object(), Name("other").identifier(), &result));
    EXPECT_EQ(result.type, NPVariantType_Void);
}

TEST_F(PrivateDataTest, RefusesEveryWriteWithALineInTheLog) {
    const ObjectRef data = newApplication().get("privateData").object();
    for (const char* name : {"keyset", "currentChannel", "getFreeMem", "other"}) {
        for (const Value& value :
             Values{Value(browser.scriptObject("other")), nullptr, 1, "text", true, undefined}) {
            EXPECT_FALSE(data.set(name, value).succeeded) << name << " = " << value;
        }
    }
    const std::string text = logOf(2, [&] { EXPECT_FALSE(data.set("keyset", nullptr)); });
    EXPECT_THAT(text, HasSubstr(" PLUGIN >>> APP_MGR :: SetProperty :: "));
}

TEST_F(PrivateDataTest, LogsWhatIsReadAndCalled) {
    const ObjectRef data = newApplication().get("privateData").object();
    EXPECT_THAT(logOf(2, [&] { data.get("keyset"); }),
                HasSubstr(logLine("APP_MGR", "GetProperty", " pId_keyset\n")));
    EXPECT_THAT(logOf(2, [&] { data.get("currentChannel"); }),
                HasSubstr(logLine("APP_MGR", "GetProperty", " pId_currentChannel\n")));
    EXPECT_THAT(logOf(2, [&] { data.call("getFreeMem"); }),
                HasSubstr(logLine("APP_MGR", "Invoke", " mId_getFreeMem\n")));
}

// Key set.

TEST_F(PrivateDataTest, RepeatedReadsOfTheKeySetGiveTheSameObject) {
    const ObjectRef data = newApplication().get("privateData").object();
    const ObjectRef keys = data.get("keyset").object();
    EXPECT_EQ(data.get("keyset"), Value(keys));
    EXPECT_EQ(browser.classNameOf(keys.object()), "JSKeySet");
    EXPECT_EQ(keys.pluginReferences(), 1);
}

TEST_F(PrivateDataTest, TheKeySetIsGivenBackAtTheEnd) {
    ObjectRef data = newApplication().get("privateData").object();
    const ObjectRef keys = data.get("keyset").object();
    data = {};
    EXPECT_EQ(keys.pluginReferences(), 0);
}

TEST_F(PrivateDataTest, TheKeySetReadsNullIfTheBrowserMakesNoObject) {
    const ObjectRef data = newApplication().get("privateData").object();
    browser.refuse("NPN_CreateObject", 1);
    EXPECT_EQ(data.get("keyset"), Value(nullptr));
    EXPECT_TRUE(data.get("keyset").value.isObject());
}

// Current channel.

TEST_F(PrivateDataTest, TheSameHandleGivesTheSameChannel) {
    const ObjectRef data = newApplication().get("privateData").object();
    currentChannelIs(1234);
    const ObjectRef channel = data.get("currentChannel").object();
    EXPECT_EQ(data.get("currentChannel"), Value(channel));
    EXPECT_EQ(platform.TELIX_JS_APP_GetCurrentChannel.count(), 2U);
    EXPECT_EQ(browser.classNameOf(channel.object()), "JSChannel");
    EXPECT_EQ(channel.get("ccid"), Value("1234"));
    EXPECT_EQ(channel.pluginReferences(), 1);
    leftBehind(channel);
}

TEST_F(PrivateDataTest, AnotherHandleGivesANewChannelAndTheOldOneKeepsIts) {
    const ObjectRef data = newApplication().get("privateData").object();
    currentChannelIs(1234);
    const ObjectRef before = data.get("currentChannel").object();
    currentChannelIs(77);
    const ObjectRef after = data.get("currentChannel").object();
    EXPECT_NE(before, after);
    EXPECT_EQ(before.get("ccid"), Value("1234"));
    EXPECT_EQ(after.get("ccid"), Value("77"));
    EXPECT_EQ(before.pluginReferences(), 0);
    EXPECT_EQ(after.pluginReferences(), 1);
    leftBehind(after);
}

TEST_F(PrivateDataTest, TheHandleZeroGivesAChannelToo) {
    const ObjectRef data = newApplication().get("privateData").object();
    currentChannelIs(0);
    const ObjectRef channel = data.get("currentChannel").object();
    EXPECT_EQ(channel.get("ccid"), Value(nullptr));
    EXPECT_EQ(data.get("currentChannel"), Value(channel));
    leftBehind(channel);
}

TEST_F(PrivateDataTest, TheLastChannelIsLeftBehindAtTheEnd) {
    currentChannelIs(1234);
    newApplication().get("privateData").object().get("currentChannel");
    EXPECT_EQ(browser.liveCount("JSApplicationPrivateData"), 0U);
    leftBehind("JSChannel", 1);
}

TEST_F(PrivateDataTest, ARefusalBeforeTheFirstChannelGivesAnObjectVariantWithoutObject) {
    const ObjectRef data = newApplication().get("privateData").object();
    currentChannelIsRefused();
    const NPVariant result = currentChannelVariant(data);
    EXPECT_EQ(result.type, NPVariantType_Object);
    EXPECT_EQ(result.value.objectValue, nullptr);
    EXPECT_EQ(browser.liveCount("JSChannel"), 0U);
}

TEST_F(PrivateDataTest, ChannelThatTheBrowserDoesNotMakeIsAnObjectVariantWithoutObject) {
    const ObjectRef data = newApplication().get("privateData").object();
    currentChannelIs(5);
    browser.refuse("NPN_CreateObject", 1);
    const NPVariant result = currentChannelVariant(data);
    EXPECT_EQ(result.type, NPVariantType_Object);
    EXPECT_EQ(result.value.objectValue, nullptr);
}

TEST_F(PrivateDataTest, ALaterRefusalGivesTheLastChannelWithoutAReference) {
    const ObjectRef data = newApplication().get("privateData").object();
    currentChannelIs(1234);
    const ObjectRef channel = data.get("currentChannel").object();
    currentChannelIsRefused();
    const NPVariant result = currentChannelVariant(data);
    EXPECT_EQ(result.type, NPVariantType_Object);
    EXPECT_EQ(result.value.objectValue, channel.object());
    EXPECT_EQ(channel.pluginReferences(), 1);
    leftBehind(channel);
}

// Free memory. Each search for the application leaves one reference to each private data object that it met.

TEST_F(PrivateDataTest, FreeMemoryIsAskedForAtEveryCall) {
    const ObjectRef application = newApplication();
    const ObjectRef data = application.get("privateData").object();
    freeMemoryIs(4711);
    EXPECT_EQ(data.call("getFreeMem"), Value(4711));
    freeMemoryIs(4000);
    EXPECT_EQ(data.call("getFreeMem"), Value(4000));
    EXPECT_EQ(platform.TELIX_JS_APP_GetFreeMem.count(), 2U);
    leftBehind(data, 2);
}

TEST_F(PrivateDataTest, FreeMemoryDoesNotLookAtArguments) {
    const ObjectRef application = newApplication();
    const ObjectRef data = application.get("privateData").object();
    freeMemoryIs(4711);
    EXPECT_EQ(data.call("getFreeMem", "text", nullptr), Value(4711));
    leftBehind(data);
}

TEST_F(PrivateDataTest, FreeMemoryAboveTheSignedRangeReadsNegative) {
    const ObjectRef application = newApplication();
    const ObjectRef data = application.get("privateData").object();
    freeMemoryIs(0xFFFFFFFE);
    EXPECT_EQ(data.call("getFreeMem"), Value(-2));
    leftBehind(data);
}

TEST_F(PrivateDataTest, FreeMemoryIsZeroIfThePlatformWritesNothing) {
    const ObjectRef application = newApplication();
    const ObjectRef data = application.get("privateData").object();
    platform.TELIX_JS_APP_GetFreeMem = [](uint32_t*) { return TELIX_RETCODE_SUCCESS; };
    EXPECT_EQ(data.call("getFreeMem"), Value(0));
    leftBehind(data);
}

TEST_F(PrivateDataTest, ARefusalGivesTheLastFigureAtFirstZero) {
    const ObjectRef application = newApplication();
    const ObjectRef data = application.get("privateData").object();
    platform.TELIX_JS_APP_GetFreeMem = [](uint32_t* out) {
        *out = 1;
        return 1;
    };
    EXPECT_EQ(data.call("getFreeMem"), Value(0));
    freeMemoryIs(4711);
    EXPECT_EQ(data.call("getFreeMem"), Value(4711));
    platform.TELIX_JS_APP_GetFreeMem = [](uint32_t*) { return 1; };
    EXPECT_EQ(data.call("getFreeMem"), Value(4711));
    leftBehind(data, 3);
}

TEST_F(PrivateDataTest, WithoutItsApplicationFreeMemoryIsTheLastFigure) {
    ObjectRef application = newApplication();
    const ObjectRef data = application.get("privateData").object();
    freeMemoryIs(4711);
    data.call("getFreeMem");
    application = {};
    freeMemoryIs(1);
    EXPECT_EQ(data.call("getFreeMem"), Value(4711));
    EXPECT_EQ(platform.TELIX_JS_APP_GetFreeMem.count(), 1U);
    leftBehind(data);
}

TEST_F(PrivateDataTest, WithoutAManagerFreeMemoryIsTheLastFigure) {
    const ObjectRef application = newApplication();
    const ObjectRef data = application.get("privateData").object();
    manager.destroy();
    freeMemoryIs(4711);
    EXPECT_EQ(data.call("getFreeMem"), Value(0));
    EXPECT_EQ(platform.TELIX_JS_APP_GetFreeMem.count(), 0U);
}

// The manager's search.

TEST_F(PrivateDataTest, TheSearchInAnEmptyListFindsNothing) {
    auto* model = static_cast<ApplicationManager*>(manager.model());
    EXPECT_EQ(model->getApplication(static_cast<ApplicationPrivateData*>(nullptr)), nullptr);
    EXPECT_EQ(model->getApplication(static_cast<KeySet*>(nullptr)), nullptr);
}

TEST_F(PrivateDataTest, TheSearchForPrivateDataVisitsApplicationsUpToTheOneThatOwnsIt) {
    const ObjectRef first = newApplication();
    const ObjectRef second = newApplication();
    const ObjectRef third = newApplication();
    const ObjectRef data = second.get("privateData").object();
    auto* model = static_cast<ApplicationManager*>(manager.model());
    log.clear();
    EXPECT_EQ(model->getApplication(static_cast<JSApplicationPrivateData*>(data.object())->impl()),
              model->applicationList()[1]);
    // The first one got its private data by the search; each that was visited has one reference more.
    EXPECT_THAT(log.startingWith("NPN_CreateObject"),
                ElementsAre("NPN_CreateObject JSApplicationPrivateData#2"));
    EXPECT_EQ(data.pluginReferences(), 2);
    leftBehind("JSApplicationPrivateData", 2);
}

TEST_F(PrivateDataTest, TheSearchForAKeySetMakesTheKeySetsOfThoseVisited) {
    const ObjectRef first = newApplication();
    const ObjectRef second = newApplication();
    const ObjectRef third = newApplication();
    const ObjectRef keys = second.get("privateData").object().get("keyset").object();
    auto* model = static_cast<ApplicationManager*>(manager.model());
    log.clear();
    EXPECT_EQ(model->getApplication(static_cast<JSKeySet*>(keys.object())->impl()),
              model->applicationList()[1]);
    EXPECT_THAT(log.startingWith("NPN_CreateObject"),
                ElementsAre("NPN_CreateObject JSApplicationPrivateData#2", "NPN_CreateObject JSKeySet#2"));
    leftBehind("JSApplicationPrivateData", 2);
    leftBehind("JSKeySet", 4); // of each one left by the search, and one held by the private data left alive
}

TEST_F(PrivateDataTest, TheSearchFindsApplicationsOfOtherPages) {
    const EmbeddedObject other = browser.embed("application/oipfapplicationmanager");
    const ObjectRef application = newApplication();
    const ObjectRef data = application.get("privateData").object();
    auto* model = static_cast<ApplicationManager*>(other.model());
    EXPECT_EQ(model->getApplication(static_cast<JSApplicationPrivateData*>(data.object())->impl()),
              model->applicationList()[0]);
    leftBehind(data);
}

TEST_F(PrivateDataTest, TheSearchPassesApplicationsWhoseObjectsCannotBeMade) {
    const ObjectRef first = newApplication();
    const ObjectRef second = newApplication();
    const ObjectRef data = second.get("privateData").object();
    const ObjectRef keys = data.get("keyset").object();
    auto* model = static_cast<ApplicationManager*>(manager.model());
    browser.refuse("NPN_CreateObject");
    EXPECT_EQ(model->getApplication(static_cast<JSApplicationPrivateData*>(data.object())->impl()),
              model->applicationList()[1]);
    EXPECT_EQ(model->getApplication(static_cast<JSKeySet*>(keys.object())->impl()),
              model->applicationList()[1]);
    leftBehind(data, 2);
    leftBehind(keys, 2);
}

TEST_F(PrivateDataTest, TheSearchForAnObjectOfNoApplicationFindsNothing) {
    ObjectRef gone = newApplication();
    const ObjectRef data = gone.get("privateData").object();
    const ObjectRef keys = data.get("keyset").object();
    gone = {};
    const ObjectRef application = newApplication();
    auto* model = static_cast<ApplicationManager*>(manager.model());
    EXPECT_EQ(model->getApplication(static_cast<JSApplicationPrivateData*>(data.object())->impl()), nullptr);
    EXPECT_EQ(model->getApplication(static_cast<JSKeySet*>(keys.object())->impl()), nullptr);
    leftBehind("JSApplicationPrivateData", 2);
    leftBehind("JSKeySet", 2);
}

} // namespace
