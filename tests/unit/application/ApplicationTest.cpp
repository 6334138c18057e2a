// An application as a page sees it, and the four page functions that do its work.
#include "src/application/Application.h"

#include "common/ScriptReferences.h"
#include "src/application/ApplicationManager.h"
#include "src/application/JSApplication.h"
#include "tests/support/BorderTest.h"

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;

namespace {

const char* const kHandlerNames[] = {"onKeyPress", "onKeyUp", "onKeyDown", "onApplicationShown",
                                     "onApplicationHidden"};
const char kCreateScript[] = "window.createHbbTVApplication('http://b.example/');";

class ApplicationTest : public BorderTest {
protected:
    ApplicationTest() { log.clear(); }

    size_t applicationCount() {
        return static_cast<ApplicationManager*>(static_cast<PluginBase*>(manager.model()))
            ->applicationList()
            .size();
    }

    EmbeddedObject manager = browser.embed("application/oipfapplicationmanager");
    ObjectRef application = manager.call("getOwnerApplication", browser.document()).object();
};

TEST_F(ApplicationTest, HasItsPropertiesAndMethods) {
    for (const char* name : kHandlerNames) {
        EXPECT_TRUE(application.hasProperty(name)) << name;
        EXPECT_FALSE(application.hasMethod(name)) << name;
    }
    for (const char* name : {"privateData", "private"}) {
        EXPECT_TRUE(application.hasProperty(name)) << name;
        EXPECT_FALSE(application.hasMethod(name)) << name;
        EXPECT_FALSE(application.set(name, browser.scriptObject("data"))) << name;
        EXPECT_FALSE(application.set(name, nullptr)) << name;
    }
    for (const char* name : {"createApplication", "destroyApplication", "show", "hide"}) {
        EXPECT_TRUE(application.hasMethod(name)) << name;
        EXPECT_FALSE(application.hasProperty(name)) << name;
        EXPECT_FALSE(application.get(name)) << name;
        EXPECT_FALSE(application.set(name, 1)) << name;
    }
    for (const char* name : {"onLowMemory", "onkeypress", "Show", "0", ""}) {
        EXPECT_FALSE(application.hasProperty(name)) << name;
        EXPECT_FALSE(application.hasMethod(name)) << name;
        EXPECT_FALSE(application.get(name)) << name;
        EXPECT_FALSE(application.set(name, browser.function("handler"))) << name;
        EXPECT_FALSE(application.call(name)) << name;
    }
    EXPECT_FALSE(application.callDefault());
}

TEST_F(ApplicationTest, InternsItsNamesInOrder) {
    log.clear();
    const ObjectRef another = manager.call("getOwnerApplication", browser.document()).object();
    log.expectInOrder(
        {"NPN_CreateObject JSApplication#2", "NPN_GetStringIdentifier \"onKeyPress\"",
         "NPN_GetStringIdentifier \"onKeyUp\"", "NPN_GetStringIdentifier \"onKeyDown\"",
         "NPN_GetStringIdentifier \"onApplicationShown\"", "NPN_GetStringIdentifier \"onApplicationHidden\"",
         "NPN_GetStringIdentifier \"createApplication\"", "NPN_GetStringIdentifier \"destroyApplication\"",
         "NPN_GetStringIdentifier \"show\"", "NPN_GetStringIdentifier \"hide\""});
}

TEST_F(ApplicationTest, AHandlerIsKeptAndReplaced) {
    for (const char* name : kHandlerNames) {
        const ScriptFunction first = browser.function("first");
        const ScriptFunction second = browser.function("second");
        EXPECT_EQ(application.get(name), nullptr) << name;
        EXPECT_TRUE(application.set(name, first)) << name;
        EXPECT_EQ(application.get(name), first) << name;
        EXPECT_EQ(first.pluginReferences(), 1) << name;
        EXPECT_TRUE(application.set(name, second)) << name;
        EXPECT_EQ(first.pluginReferences(), 0) << name;
        EXPECT_EQ(second.pluginReferences(), 1) << name;
        EXPECT_EQ(application.get(name), second) << name;
    }
}

// What the browser sees of the slot at the moment at which it counts a reference to the new handler.
NPObject* (*retainOfBrowser)(NPObject* object) = nullptr;
Application* observedApplication = nullptr;
NPObject* heldAtRetain = nullptr;

NPObject* retainAndLook(NPObject* object) {
    NPNFuncs->retainobject = retainOfBrowser; // the getter retains too
    heldAtRetain = observedApplication->onKeyPress();
    if (heldAtRetain) {
        NPN_ReleaseObject(heldAtRetain);
    }
    return retainOfBrowser(object);
}

TEST_F(ApplicationTest, AHandlerIsReleasedStoredAndThenRetained) {
    const ScriptFunction first = browser.function("first");
    const ScriptFunction second = browser.function("second");
    application.set("onKeyPress", first);
    log.clear();
    retainOfBrowser = browser.table().retainobject;
    observedApplication = wrapperOf<JSApplication>(application.object())->impl();
    browser.table().retainobject = retainAndLook;
    EXPECT_TRUE(application.set("onKeyPress", second));
    EXPECT_EQ(heldAtRetain, second.object());
    EXPECT_THAT(log.everything(), ElementsAre("NPN_ReleaseObject first", "NPN_RetainObject second",
                                              "NPN_ReleaseObject second", "NPN_RetainObject second"));
}

TEST_F(ApplicationTest, AHandlerCanNotBeClearedOrWrittenAsAnythingElse) {
    for (const char* name : kHandlerNames) {
        const ScriptFunction handler = browser.function("handler");
        application.set(name, handler);
        for (const Value& value :
             {Value(nullptr), Value(), Value(5), Value(0.5), Value(true), Value("text")}) {
            EXPECT_FALSE(application.set(name, value)) << name << ' ' << value;
            EXPECT_EQ(application.get(name), handler) << name << ' ' << value;
        }
    }
}

TEST_F(ApplicationTest, TheHandlersAreApart) {
    application.set("onKeyDown", browser.function("handler"));
    for (const char* name : {"onKeyPress", "onKeyUp", "onApplicationShown", "onApplicationHidden"}) {
        EXPECT_EQ(application.get(name), nullptr) << name;
    }
}

TEST_F(ApplicationTest, TheEndReleasesPrivateDataAndHandlersInItsOwnOrder) {
    for (const char* name : kHandlerNames) {
        application.set(name, browser.function(name));
    }
    application.get("privateData");
    application.call("show"); // an application may know its window by now
    log.clear();
    application.reset();
    EXPECT_THAT(log.everything(),
                ElementsAre("NPN_ReleaseObject JSApplicationPrivateData", "NPN_ReleaseObject onKeyDown",
                            "NPN_ReleaseObject onKeyUp", "NPN_ReleaseObject onKeyPress",
                            "NPN_ReleaseObject onApplicationShown", "NPN_ReleaseObject onApplicationHidden"));
    EXPECT_EQ(applicationCount(), 0U);
}

TEST_F(ApplicationTest, TheEndLogsOnceBeforeAnythingIsGivenBack) {
    application.get("privateData");
    const std::string text = logOf(1, [this] { application.reset(); });
    const size_t logged = text.find("APP_MGR :: ~JSApplication :: Destructor called, This:-- ");
    ASSERT_NE(logged, std::string::npos) << text;
    EXPECT_LT(logged, text.find("NPN_ReleaseObject")) << text;
    EXPECT_EQ(text.find("~JSApplication ::", logged + sizeof "APP_MGR :: ~JSApplication ::"),
              std::string::npos)
        << text;
}

TEST_F(ApplicationTest, CreateApplicationAsksThePageAndGivesANewApplication) {
    browser.whenEvaluating(kCreateScript).gives(true);
    log.clear();
    const Outcome created = application.call("createApplication", "http://b.example/", true);
    ASSERT_TRUE(created.value.isObject());
    EXPECT_NE(created.object(), application);
    EXPECT_EQ(created.object().pluginReferences(), 0);
    EXPECT_THAT(log.calls(),
                ElementsAre("NPN_GetValue 15", "NPN_Evaluate window \"" + std::string(kCreateScript) + "\"",
                            "NPN_CreateObject JSApplication#2"));
    EXPECT_EQ(applicationCount(), 2U);
}

TEST_F(ApplicationTest, TheFlagOfCreateApplicationHasNoEffect) {
    browser.whenEvaluating(kCreateScript).gives(true);
    EXPECT_TRUE(application.call("createApplication", "http://b.example/", true).value.isObject());
    EXPECT_TRUE(application.call("createApplication", "http://b.example/", false).value.isObject());
    EXPECT_THAT(browser.scripts(), ElementsAre("location.href", kCreateScript, kCreateScript));
}

TEST_F(ApplicationTest, CreateApplicationIsNullUnlessThePageSaysTrue) {
    for (const Value& answer : {Value(false), Value(), Value(nullptr), Value(1)}) {
        browser.whenEvaluating(kCreateScript).gives(answer);
        EXPECT_EQ(application.call("createApplication", "http://b.example/", true), nullptr) << answer;
    }
    browser.whenEvaluating(kCreateScript).throws();
    EXPECT_EQ(application.call("createApplication", "http://b.example/", true), nullptr);
    EXPECT_EQ(applicationCount(), 1U);
}

TEST_F(ApplicationTest, AnAddressWithAQuoteBreaksTheScript) {
    browser.whenEvaluatingTextFrom("window.createHbbTVApplication").gives(true);
    EXPECT_EQ(application.call("createApplication", "http://b.example/it's", true), nullptr);
    EXPECT_EQ(browser.lastScript(), "window.createHbbTVApplication('http://b.example/it's');");
    EXPECT_EQ(applicationCount(), 1U);
}

TEST_F(ApplicationTest, AnEmptyAddressGoesToThePageToo) {
    browser.whenEvaluating("window.createHbbTVApplication('');").gives(true);
    EXPECT_TRUE(application.call("createApplication", "", true).value.isObject());
}

TEST_F(ApplicationTest, AnAddressEndsAtAZero) {
    application.call("createApplication", std::string("ab\0cd", 5), true);
    EXPECT_EQ(browser.lastScript(), "window.createHbbTVApplication('ab');");
}

TEST_F(ApplicationTest, CreateApplicationIsNullWhenTheBrowserRefusesTheObject) {
    browser.whenEvaluating(kCreateScript).gives(true);
    browser.refuse("NPN_CreateObject");
    EXPECT_EQ(application.call("createApplication", "http://b.example/", true), nullptr);
    EXPECT_EQ(applicationCount(), 1U);
}

TEST_F(ApplicationTest, CreateApplicationTakesATextAndABooleanOnly) {
    log.clear();
    EXPECT_FALSE(application.call("createApplication", "http://b.example/", 1));
    EXPECT_FALSE(application.call("createApplication", "http://b.example/", nullptr));
    EXPECT_FALSE(application.call("createApplication", "http://b.example/"));
    EXPECT_FALSE(application.call("createApplication", 1, true));
    EXPECT_FALSE(application.call("createApplication", nullptr, true));
    EXPECT_FALSE(application.call("createApplication"));
    EXPECT_THAT(log.calls(), IsEmpty());
}

TEST_F(ApplicationTest, TheOtherMethodsRunTheirPageFunctionAndGiveNothing) {
    struct Row {
        const char* method;
        const char* script;
    };
    for (const Row& row :
         {Row{"destroyApplication", "window.destroyHbbTVApplication();"},
          Row{"show", "window.showHbbTVApplication();"}, Row{"hide", "window.hideHbbTVApplication();"}}) {
        EXPECT_EQ(application.call(row.method), undefined) << row.method;
        EXPECT_EQ(browser.lastScript(), row.script);
        browser.whenEvaluating(row.script).gives(true);
        EXPECT_EQ(application.call(row.method), undefined) << row.method;
        browser.whenEvaluating(row.script).throws();
        EXPECT_EQ(application.call(row.method, "more", 5), undefined) << row.method;
    }
    EXPECT_THAT(browser.scripts(), SizeIs(1 + 3 * 3));
}

TEST_F(ApplicationTest, TheOtherMethodsLeaveTheResultAsTheBrowserGaveIt) {
    const ArgumentArray none({});
    for (const char* method : {"destroyApplication", "show", "hide"}) {
        NPVariant result{};
        result.type = NPVariantType_Int32;
        result.value.intValue = 99;
        EXPECT_TRUE(application.object()->_class->invoke(application.object(), Name(method).identifier(),
                                                         none.data(), 0, &result));
        EXPECT_EQ(Value::copyOf(result), 99) << method;
    }
}

TEST_F(ApplicationTest, ADestroyedApplicationStillAnswers) {
    const ScriptFunction handler = browser.function("handler");
    application.set("onKeyPress", handler);
    application.call("destroyApplication");
    EXPECT_EQ(application.get("onKeyPress"), handler);
    EXPECT_TRUE(application.set("onKeyUp", handler));
    EXPECT_TRUE(application.call("show"));
    EXPECT_EQ(applicationCount(), 1U);
}

TEST_F(ApplicationTest, NoPlatformCallIsMade) {
    log.clear();
    browser.whenEvaluating(kCreateScript).gives(true);
    application.call("createApplication", "http://b.example/", true);
    application.call("show");
    application.call("hide");
    application.call("destroyApplication");
    EXPECT_EQ(log.count("TELIX_"), 0U);
}

TEST_F(ApplicationTest, LogsUnderTheManagersModule) {
    EXPECT_THAT(logOf(2, [this] { application.call("createApplication", "http://b.example/", true); }),
                AllOf(HasSubstr(logLine("APP_MGR", "Invoke", " mId_createApplication\n")),
                      HasSubstr(logLine("APP_MGR", "createApplication",
                                        " Application class:: invokeJScript returned FAIL.\n"))));
    browser.whenEvaluating(kCreateScript).gives(true);
    EXPECT_THAT(logOf(2, [this] { application.call("createApplication", "http://b.example/", true); }),
                HasSubstr(logLine("APP_MGR", "createApplication", " Target :: object: 0x")));
    EXPECT_THAT(logOf(2, [this] { application.get("onKeyPress"); }),
                HasSubstr(logLine("APP_MGR", "GetProperty", " pId_onKeyPress\n")));
}

} // namespace
