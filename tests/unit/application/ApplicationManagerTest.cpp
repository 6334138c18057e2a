// The application manager as a page sees it, and what it asks of the browser and the platform.
#include "src/application/ApplicationManager.h"

#include "src/application/Application.h"
#include "tests/support/BorderTest.h"

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;

namespace {

const char kManagerType[] = "application/oipfapplicationmanager";
const char* const kHandlerNames[] = {"onLowMemory", "onApplicationLoaded", "onApplicationUnloaded",
                                     "onApplicationLoadError"};

ApplicationManager& modelOf(const EmbeddedObject& manager) {
    return *static_cast<ApplicationManager*>(static_cast<PluginBase*>(manager.model()));
}

class ApplicationManagerTest : public BorderTest {
protected:
    ApplicationManagerTest() { log.clear(); }

    ObjectRef ownerApplication() { return manager.call("getOwnerApplication", browser.document()).object(); }

    EmbeddedObject manager = browser.embed(kManagerType, {{"id", "manager"}});
};

TEST_F(ApplicationManagerTest, HasFourPropertiesAndOneMethod) {
    for (const char* name : kHandlerNames) {
        EXPECT_TRUE(manager.hasProperty(name)) << name;
        EXPECT_FALSE(manager.hasMethod(name)) << name;
    }
    EXPECT_TRUE(manager.hasMethod("getOwnerApplication"));
    EXPECT_FALSE(manager.hasProperty("getOwnerApplication"));
    for (const char* name : {"onLowmemory", "onlowmemory", "getApplication", "onKeyPress", "0", ""}) {
        EXPECT_FALSE(manager.hasProperty(name)) << name;
        EXPECT_FALSE(manager.hasMethod(name)) << name;
        EXPECT_FALSE(manager.get(name)) << name;
        EXPECT_FALSE(manager.set(name, nullptr)) << name;
        EXPECT_FALSE(manager.call(name, browser.document())) << name;
    }
    EXPECT_FALSE(manager.scriptObject().callDefault());
}

TEST_F(ApplicationManagerTest, TheWrapperIsMadeAtTheFirstRequestAndInternsItsNamesInOrder) {
    EXPECT_EQ(log.count("NPN_CreateObject"), 0U);
    manager.scriptObject();
    EXPECT_THAT(log.everything(), ElementsAre("NPN_CreateObject JSApplicationManager",
                                              "NPN_GetStringIdentifier \"onLowMemory\"",
                                              "NPN_GetStringIdentifier \"onApplicationLoaded\"",
                                              "NPN_GetStringIdentifier \"onApplicationUnloaded\"",
                                              "NPN_GetStringIdentifier \"onApplicationLoadError\"",
                                              "NPN_GetStringIdentifier \"getOwnerApplication\"",
                                              "NPN_RetainObject JSApplicationManager"));
}

TEST_F(ApplicationManagerTest, AskingForTheOwnerEvaluatesTheLocationOfThePassedDocument) {
    manager.scriptObject();
    log.clear();
    const Outcome owner = manager.call("getOwnerApplication", browser.document());
    ASSERT_TRUE(owner.value.isObject());
    EXPECT_EQ(owner.object().name(), "JSApplication");
    EXPECT_EQ(owner.object().pluginReferences(), 0); // the one reference is the page's
    EXPECT_THAT(log.calls(),
                ElementsAre("NPN_Evaluate document \"location.href\"", "NPN_CreateObject JSApplication"));
    EXPECT_EQ(log.everything().back(), "NPN_ReleaseVariantValue");
    EXPECT_EQ(browser.memoryBlocks(), 0U);
}

TEST_F(ApplicationManagerTest, EveryCallMakesAnotherApplication) {
    const ObjectRef first = ownerApplication();
    const ObjectRef second = ownerApplication();
    EXPECT_NE(first, second);
    EXPECT_THAT(modelOf(manager).applicationList(), SizeIs(2));
    const ScriptFunction handler = browser.function("handler");
    first.set("onKeyPress", handler);
    EXPECT_EQ(second.get("onKeyPress"), nullptr);
}

TEST_F(ApplicationManagerTest, TheApplicationsStandInOrderOfCreationUntilThePageDropsThem) {
    ObjectRef first = ownerApplication();
    ObjectRef second = ownerApplication();
    ObjectRef third = ownerApplication();
    const std::vector<Application*> all = modelOf(manager).applicationList();
    ASSERT_THAT(all, SizeIs(3));
    second.reset();
    EXPECT_THAT(modelOf(manager).applicationList(), ElementsAre(all[0], all[2]));
    first.reset();
    third.reset();
    EXPECT_THAT(modelOf(manager).applicationList(), IsEmpty());
}

TEST_F(ApplicationManagerTest, ADocumentWhoseLocationCannotBeHadHasNoOwner) {
    browser.whenEvaluating("location.href").throws();
    EXPECT_EQ(manager.call("getOwnerApplication", browser.document()), nullptr);
    EXPECT_THAT(modelOf(manager).applicationList(), IsEmpty());
    EXPECT_EQ(log.count("NPN_ReleaseVariantValue"), 0U);
}

TEST_F(ApplicationManagerTest, ADocumentWhoseLocationIsNoTextHasNoOwner) {
    EXPECT_EQ(manager.call("getOwnerApplication", browser.scriptObject("noDocument")), nullptr);
    browser.whenEvaluating("location.href").gives(browser.window());
    EXPECT_EQ(manager.call("getOwnerApplication", browser.document()), nullptr);
    EXPECT_THAT(modelOf(manager).applicationList(), IsEmpty());
    EXPECT_EQ(log.count("NPN_CreateObject JSApplication"), 1U); // the manager's own wrapper
    EXPECT_EQ(log.count("NPN_ReleaseVariantValue"), 2U);
}

TEST_F(ApplicationManagerTest, AnEmptyLocationIsATextToo) {
    browser.whenEvaluating("location.href").gives("");
    EXPECT_TRUE(manager.call("getOwnerApplication", browser.document()).value.isObject());
}

TEST_F(ApplicationManagerTest, TheOwnerIsNullWhenTheBrowserRefusesTheObject) {
    manager.scriptObject();
    browser.refuse("NPN_CreateObject");
    EXPECT_EQ(manager.call("getOwnerApplication", browser.document()), nullptr);
    EXPECT_EQ(browser.memoryBlocks(), 0U);
}

TEST_F(ApplicationManagerTest, OnlyAnObjectHasAnOwner) {
    for (const Value& value :
         {Value(), Value(nullptr), Value(1), Value(1.5), Value(true), Value("document")}) {
        EXPECT_FALSE(manager.call("getOwnerApplication", value)) << value;
    }
    EXPECT_FALSE(manager.call("getOwnerApplication"));
    EXPECT_EQ(log.count("NPN_Evaluate"), 0U);
}

TEST_F(ApplicationManagerTest, TheArgumentCountIsNotLookedAt) {
    const ArgumentArray array({browser.document()});
    const ObjectRef wrapper = manager.scriptObject();
    NPVariant result{};
    EXPECT_TRUE(wrapper.object()->_class->invoke(wrapper.object(), Name("getOwnerApplication").identifier(),
                                                 array.data(), 0, &result));
    EXPECT_TRUE(Value::take(result).isObject());
}

TEST_F(ApplicationManagerTest, AHandlerIsKeptReplacedAndClearedByNull) {
    for (const char* name : kHandlerNames) {
        const ScriptFunction first = browser.function("first");
        const ScriptFunction second = browser.function("second");
        EXPECT_EQ(manager.get(name), nullptr) << name;
        EXPECT_TRUE(manager.set(name, first)) << name;
        EXPECT_EQ(manager.get(name), first) << name;
        EXPECT_EQ(first.pluginReferences(), 1) << name;
        EXPECT_TRUE(manager.set(name, second)) << name;
        EXPECT_EQ(first.pluginReferences(), 0) << name;
        EXPECT_EQ(manager.get(name), second) << name;
        EXPECT_TRUE(manager.set(name, nullptr)) << name;
        EXPECT_EQ(second.pluginReferences(), 0) << name;
        EXPECT_EQ(manager.get(name), nullptr) << name;
    }
}

TEST_F(ApplicationManagerTest, AHandlerWrittenAsAnythingElseStaysAndTheWriteSucceeds) {
    for (const char* name : kHandlerNames) {
        const ScriptFunction handler = browser.function("handler");
        manager.set(name, handler);
        for (const Value& value : {Value(), Value(5), Value(0.5), Value(true), Value("text")}) {
            EXPECT_TRUE(manager.set(name, value)) << name << ' ' << value;
            EXPECT_EQ(manager.get(name), handler) << name << ' ' << value;
        }
    }
}

TEST_F(ApplicationManagerTest, TheFourHandlersAreApart) {
    const ScriptFunction handler = browser.function("handler");
    manager.set("onApplicationLoaded", handler);
    EXPECT_EQ(manager.get("onLowMemory"), nullptr);
    EXPECT_EQ(manager.get("onApplicationUnloaded"), nullptr);
    EXPECT_EQ(manager.get("onApplicationLoadError"), nullptr);
}

TEST_F(ApplicationManagerTest, AWriteReleasesTheOldHandlerAndRetainsWhateverIsStoredNullToo) {
    const ScriptFunction handler = browser.function("handler");
    manager.scriptObject();
    log.clear();
    manager.set("onLowMemory", handler);
    manager.set("onLowMemory", nullptr);
    manager.set("onLowMemory", nullptr);
    EXPECT_THAT(log.everything(), ElementsAre("NPN_RetainObject handler", "NPN_ReleaseObject handler",
                                              "NPN_RetainObject null", "NPN_RetainObject null"));
}

TEST_F(ApplicationManagerTest, TheFirstManagerRegistersForLowMemoryAndTheLastUnregisters) {
    EXPECT_EQ(platform.TELIX_JS_APP_RegisterLowMemory.count(), 1U); // at the embedding
    const EmbeddedObject other = browser.embed(kManagerType);
    EXPECT_EQ(platform.TELIX_JS_APP_RegisterLowMemory.count(), 1U);
    manager.destroy();
    EXPECT_EQ(platform.TELIX_JS_APP_UnRegisterLowMemory.count(), 0U);
    other.destroy();
    EXPECT_EQ(platform.TELIX_JS_APP_UnRegisterLowMemory.count(), 1U);
    browser.embed(kManagerType);
    EXPECT_THAT(log.startingWith("TELIX_"), ElementsAre("TELIX_JS_APP_UnRegisterLowMemory(callback)",
                                                        "TELIX_JS_APP_RegisterLowMemory(callback)"));
}

TEST_F(ApplicationManagerTest, TheResultOfTheRegistrationIsNotLookedAt) {
    manager.destroy();
    platform.defaultResult = 1;
    const EmbeddedObject first = browser.embed(kManagerType);
    const EmbeddedObject second = browser.embed(kManagerType);
    EXPECT_EQ(first.error(), NPERR_NO_ERROR);
    EXPECT_EQ(platform.TELIX_JS_APP_RegisterLowMemory.count(), 2U);
    first.destroy();
    second.destroy();
    EXPECT_EQ(platform.TELIX_JS_APP_UnRegisterLowMemory.count(), 2U);
}

TEST_F(ApplicationManagerTest, TheSameCallbackIsRegisteredAndUnregistered) {
    manager.destroy();
    TELIX_JS_APP_LOW_MEMORY_CB registered = nullptr;
    TELIX_JS_APP_LOW_MEMORY_CB unregistered = nullptr;
    platform.TELIX_JS_APP_RegisterLowMemory = [&](TELIX_JS_APP_LOW_MEMORY_CB callback) {
        registered = callback;
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_APP_UnRegisterLowMemory = [&](TELIX_JS_APP_LOW_MEMORY_CB callback) {
        unregistered = callback;
        return TELIX_RETCODE_SUCCESS;
    };
    browser.embed(kManagerType).destroy();
    EXPECT_NE(registered, nullptr);
    EXPECT_EQ(unregistered, registered);
}

TEST_F(ApplicationManagerTest, ALowMemoryNoticeEndsAtTheLogAndCallsNoHandler) {
    manager.destroy();
    TELIX_JS_APP_LOW_MEMORY_CB notice = nullptr;
    platform.TELIX_JS_APP_RegisterLowMemory = [&](TELIX_JS_APP_LOW_MEMORY_CB callback) {
        notice = callback;
        return TELIX_RETCODE_SUCCESS;
    };
    const EmbeddedObject fresh = browser.embed(kManagerType);
    const ScriptFunction handler = browser.function("handler");
    fresh.set("onLowMemory", handler);
    log.clear();
    onPlatformThread([&] { EXPECT_EQ(notice(), 0); });
    EXPECT_THAT(log.everything(), IsEmpty());
    browser.pump();
    EXPECT_THAT(log.everything(), IsEmpty());
    EXPECT_EQ(handler.count(), 0U);
    EXPECT_EQ(fresh.get("onLowMemory"), handler);
}

TEST_F(ApplicationManagerTest, ALowMemoryNoticeMayArriveAfterTheLastManager) {
    manager.destroy();
    ApplicationManager::onLowMemoryCb();
    browser.pump();
    EXPECT_EQ(ApplicationManager::handleOnLowMemory(nullptr), 0);
}

TEST_F(ApplicationManagerTest, EachInstanceHasItsOwnManagerAndHandlers) {
    const EmbeddedObject other = browser.embed(kManagerType);
    EXPECT_NE(manager.model(), other.model());
    EXPECT_EQ(ApplicationManager::sharedInstance(manager.npp()), manager.model());
    EXPECT_EQ(ApplicationManager::sharedInstance(other.npp()), other.model());
    const ScriptFunction handler = browser.function("handler");
    manager.set("onApplicationLoaded", handler);
    EXPECT_EQ(other.get("onApplicationLoaded"), nullptr);
}

TEST_F(ApplicationManagerTest, TheApplicationsOfAllManagersAreOneList) {
    const EmbeddedObject other = browser.embed(kManagerType);
    const ObjectRef mine = ownerApplication();
    const ObjectRef theirs = other.call("getOwnerApplication", browser.document()).object();
    EXPECT_THAT(modelOf(manager).applicationList(), SizeIs(2));
    EXPECT_EQ(modelOf(manager).applicationList(), modelOf(other).applicationList());
}

TEST_F(ApplicationManagerTest, ApplicationsOutliveEveryManager) {
    const EmbeddedObject other = browser.embed(kManagerType);
    const ObjectRef application = ownerApplication();
    manager.destroy();
    EXPECT_THAT(modelOf(other).applicationList(), SizeIs(1));
    other.destroy();
    EXPECT_EQ(application.get("onKeyUp"), nullptr);
    EXPECT_TRUE(application.call("show"));
}

TEST_F(ApplicationManagerTest, AnUnknownInstanceHasNoManager) {
    NPP_t unknown{};
    EXPECT_EQ(ApplicationManager::sharedInstance(&unknown), nullptr);
    manager.destroy();
    EXPECT_EQ(ApplicationManager::sharedInstance(manager.npp()), nullptr);
}

TEST_F(ApplicationManagerTest, AskingTwiceForTheManagerOfAnInstanceGivesTheSame) {
    EXPECT_EQ(ApplicationManager::sharedInstance(manager.npp(), 200), manager.model());
    EXPECT_EQ(platform.TELIX_JS_APP_RegisterLowMemory.count(), 1U);
}

TEST_F(ApplicationManagerTest, DestroyReleasesWrapperHandlersRegistrationAndElementInThisOrder) {
    for (const char* name : kHandlerNames) {
        manager.set(name, browser.function(name));
    }
    log.clear();
    manager.destroy();
    EXPECT_THAT(log.everything(),
                ElementsAre("NPN_ReleaseObject JSApplicationManager", "NPN_ReleaseObject onLowMemory",
                            "NPN_ReleaseObject onApplicationLoaded",
                            "NPN_ReleaseObject onApplicationUnloaded",
                            "NPN_ReleaseObject onApplicationLoadError",
                            "TELIX_JS_APP_UnRegisterLowMemory(callback)", "NPN_ReleaseObject manager"));
}

TEST_F(ApplicationManagerTest, AWrapperThatOutlivesItsModelRefusesCalls) {
    manager.scriptObject();
    manager.destroy();
    EXPECT_FALSE(manager.call("getOwnerApplication", browser.document()));
    EXPECT_TRUE(manager.hasMethod("getOwnerApplication"));
}

TEST_F(ApplicationManagerTest, BrowserEventsAreNotHandled) {
    log.clear();
    int event = 0;
    EXPECT_EQ(manager.handleEvent(), 0);
    EXPECT_EQ(manager.handleEvent(&event), 0);
    EXPECT_THAT(log.everything(), IsEmpty());
}

TEST_F(ApplicationManagerTest, ALoadErrorCallsItsHandlerWithoutArguments) {
    EXPECT_FALSE(modelOf(manager).handleApplicationLoadError());
    const ScriptFunction handler = browser.function("handler");
    manager.set("onApplicationLoadError", handler);
    EXPECT_TRUE(modelOf(manager).handleApplicationLoadError());
    EXPECT_EQ(handler.last(), Values{});
    handler.throws();
    EXPECT_TRUE(modelOf(manager).handleApplicationLoadError());
    EXPECT_EQ(handler.count(), 2U);
}

TEST_F(ApplicationManagerTest, KeyEventsCallTheHandlersOfAllApplicationsAndLeaveTwoReferencesEach) {
    struct Row {
        const char* name;
        int (ApplicationManager::*handle)();
    };
    for (const Row& row : {Row{"onKeyPress", &ApplicationManager::handleKeyPressEvent},
                           Row{"onKeyUp", &ApplicationManager::handleKeyUpEvent},
                           Row{"onKeyDown", &ApplicationManager::handleKeyDownEvent}}) {
        const EmbeddedObject other = browser.embed(kManagerType);
        const ObjectRef mine = ownerApplication();
        const ObjectRef without = ownerApplication();
        const ObjectRef theirs = other.call("getOwnerApplication", browser.document()).object();
        const ScriptFunction first = browser.function(std::string("first ") + row.name);
        const ScriptFunction second = browser.function(std::string("second ") + row.name);
        mine.set(row.name, first);
        theirs.set(row.name, second);
        log.clear();
        EXPECT_EQ((modelOf(manager).*row.handle)(), 1);
        EXPECT_THAT(log.calls(), ElementsAre("NPN_InvokeDefault first " + std::string(row.name) + "()",
                                             "NPN_InvokeDefault second " + std::string(row.name) + "()"));
        EXPECT_EQ(first.pluginReferences(), 3); // the application's, and two that are never released
        leftBehind(first, 2);
        leftBehind(second, 2);
    }
}

TEST_F(ApplicationManagerTest, KeyEventsWithoutApplicationOrManagerDoNothing) {
    EXPECT_EQ(modelOf(manager).handleKeyPressEvent(), 1);
    const ScriptFunction handler = browser.function("handler");
    const ObjectRef application = ownerApplication();
    application.set("onKeyUp", handler);
    ApplicationManager::deleteInstance(manager.npp());
    EXPECT_EQ(modelOf(manager).handleKeyUpEvent(), 1);
    EXPECT_EQ(handler.count(), 0U);
}

TEST_F(ApplicationManagerTest, AKeyHandlerMayDropTheNextApplication) {
    const ObjectRef first = ownerApplication();
    ObjectRef second = ownerApplication();
    const ScriptFunction dropping = browser.function("dropping");
    const ScriptFunction dropped = browser.function("dropped");
    dropping.does([&](const Values&) {
        second.reset();
        return Value();
    });
    first.set("onKeyDown", dropping);
    second.set("onKeyDown", dropped);
    EXPECT_EQ(modelOf(manager).handleKeyDownEvent(), 1);
    EXPECT_EQ(dropped.count(), 0U);
    leftBehind(dropping, 2);
}

TEST_F(ApplicationManagerTest, LogsUnderItsModule) {
    EXPECT_THAT(logOf(2, [this] { ownerApplication(); }),
                AllOf(HasSubstr(logLine("APP_MGR", "Invoke", " mId_getOwnerApplication\n")),
                      HasSubstr(logLine(
                          "APP_MGR", "getOwnerApplication",
                          " ApplicationManager class:: Location: http://page.example/app/index.html \n"))));
    EXPECT_THAT(logOf(2, [this] { manager.get("onLowMemory"); }), HasSubstr(" pId_onLowmemory"));
    EXPECT_THAT(logOf(2, [this] { ApplicationManager::sharedInstance(manager.npp(), 200); }),
                HasSubstr(logLine("APP_MGR", "sharedInstance",
                                  " AppManager instance already exists with specified NPP instance \n")));
    EXPECT_THAT(
        logOf(2, [] { ApplicationManager::sharedInstance(nullptr); }),
        HasSubstr(logLine("APP_MGR", "sharedInstance", " ApplicationManager instance does not exist \n")));
    EXPECT_THAT(logOf(2, [this] { ApplicationManager::sharedInstance(manager.npp()); }),
                Not(HasSubstr("does not exist")));
    EXPECT_THAT(logOf(2, [this] { manager.handleEvent(); }), HasSubstr("APP_MGR :: handleEvent :: "));
    EXPECT_THAT(logOf(2, [] { ApplicationManager::onLowMemoryCb(); }),
                HasSubstr("APP_MGR :: onLowMemoryCb :: "));
    EXPECT_THAT(logOf(2, [] { ApplicationManager::handleOnLowMemory(nullptr); }),
                HasSubstr("APP_MGR :: handleOnLowMemory :: "));
}

TEST_F(ApplicationManagerTest, ALoadErrorAloneIsLoggedUnderAnotherModule) {
    EXPECT_EQ(logOf(5, [this] { modelOf(manager).handleApplicationLoadError(); }),
              logLine("AVCONTROL", "handleApplicationLoadError", "AVControl class"));
    EXPECT_EQ(logOf(2, [this] { modelOf(manager).handleApplicationLoadError(); }), "");
}

} // namespace
