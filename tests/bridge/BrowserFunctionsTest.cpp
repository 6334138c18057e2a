// The browser's function table, as a plug-in without script uses it.
#include <thread>

#include <glib.h>

#include "bridge/Identifiers.h"
#include "bridge/Objects.h"
#include "tests/bridge/ScriptHost.h"

using namespace bridge;

namespace {

class BrowserFunctions : public ScriptHost {
protected:
    uint32_t instance = addInstance("plugin");
    NPP self = npp(instance);

    NPIdentifier id(const char* name) { return browser.getstringidentifier(name); }
};

INSTANTIATE_TEST_SUITE_P(Engines, BrowserFunctions, testing::Values(EngineKind::CApi, EngineKind::GObject),
                         nameOf);

TEST_P(BrowserFunctions, EveryEntryIsThere) {
    const auto* const entries = reinterpret_cast<void* const*>(&browser.geturl);
    const size_t count = (sizeof(NPNetscapeFuncs) - offsetof(NPNetscapeFuncs, geturl)) / sizeof(void*);
    for (size_t i = 0; i < count; i++) {
        EXPECT_NE(entries[i], nullptr) << i;
    }
    EXPECT_EQ(browser.size, sizeof(NPNetscapeFuncs));
    EXPECT_EQ(browser.version >> 8, 0);
}

TEST_P(BrowserFunctions, EqualNamesAreEqualIdentifiers) {
    EXPECT_EQ(id("name"), id("name"));
    EXPECT_NE(id("name"), id("other"));
    EXPECT_EQ(browser.getintidentifier(7), browser.getintidentifier(7));
    EXPECT_NE(browser.getintidentifier(7), id("7"));
    const char* names[] = {"name", "other"};
    NPIdentifier found[2] = {};
    browser.getstringidentifiers(names, 2, found);
    EXPECT_EQ(found[0], id("name"));
    EXPECT_EQ(found[1], id("other"));
    EXPECT_EQ(browser.getstringidentifier(nullptr), nullptr);
}

TEST_P(BrowserFunctions, IdentifiersGiveTheirTextAndNumber) {
    EXPECT_TRUE(browser.identifierisstring(id("name")));
    EXPECT_FALSE(browser.identifierisstring(browser.getintidentifier(7)));
    EXPECT_EQ(browser.intfromidentifier(browser.getintidentifier(-7)), -7);
    EXPECT_EQ(browser.intfromidentifier(id("name")), 0);
    char* const text = browser.utf8fromidentifier(id("name"));
    EXPECT_STREQ(text, "name");
    std::free(text); // plug-ins do
    char* const digits = browser.utf8fromidentifier(browser.getintidentifier(12));
    EXPECT_STREQ(digits, "12");
    browser.memfree(digits);
}

TEST_P(BrowserFunctions, NamesOfScriptThatAreIndexesAreNumbers) {
    EXPECT_EQ(identifierOfScriptName("12"), browser.getintidentifier(12));
    EXPECT_EQ(identifierOfScriptName("0"), browser.getintidentifier(0));
    EXPECT_EQ(identifierOfScriptName("2147483647"), browser.getintidentifier(INT32_MAX));
    for (const char* const name : {"", "-1", "01", "1x", "1:", "1/", "2147483648", "99999999999", "1.5"}) {
        EXPECT_EQ(identifierOfScriptName(name), id(name)) << name;
    }
}

TEST_P(BrowserFunctions, MemoryIsThatOfMalloc) {
    void* const memory = browser.memalloc(10);
    ASSERT_NE(memory, nullptr);
    std::free(memory);
    browser.memfree(browser.memalloc(10));
    EXPECT_EQ(browser.memflush(10), 0U);
}

TEST_P(BrowserFunctions, VariantsAreReleasedOnce) {
    NPVariant text = stringVariant("text");
    EXPECT_STREQ(text.value.stringValue.UTF8Characters, "text");
    browser.releasevariantvalue(&text);
    EXPECT_EQ(text.type, NPVariantType_Void);
    browser.releasevariantvalue(&text);
    const OwnedVariant object = evaluated("({})");
    const uint32_t references = objectOf(object.get())->referenceCount;
    NPVariant second = object.get();
    browser.retainobject(objectOf(second));
    browser.releasevariantvalue(&second);
    EXPECT_EQ(second.type, NPVariantType_Void);
    EXPECT_EQ(objectOf(object.get())->referenceCount, references);
}

TEST_P(BrowserFunctions, ValuesOfTheBrowser) {
    NPBool flag = 7;
    for (const auto& [variable, expected] : {std::pair(NPNVjavascriptEnabledBool, 1),
                                             {NPNVSupportsWindowless, 1},
                                             {NPNVasdEnabledBool, 0},
                                             {NPNVSupportsXEmbedBool, 0},
                                             {NPNVprivateModeBool, 0},
                                             {NPNVisOfflineBool, 0}}) {
        flag = 7;
        EXPECT_EQ(browser.getvalue(self, variable, &flag), NPERR_NO_ERROR) << variable;
        EXPECT_EQ(flag, expected) << variable;
    }
    void* other = nullptr;
    for (const NPNVariable variable : {NPNVxDisplay, NPNVxtAppContext, NPNVnetscapeWindow, NPNVToolkit}) {
        EXPECT_NE(browser.getvalue(self, variable, &other), NPERR_NO_ERROR) << variable;
    }
    EXPECT_NE(browser.getvalue(self, NPNVWindowNPObject, nullptr), NPERR_NO_ERROR);
    EXPECT_NE(browser.getvalue(nullptr, NPNVWindowNPObject, &other), NPERR_NO_ERROR);
}

TEST_P(BrowserFunctions, WindowAndElementAreTheSameEachTime) {
    for (const NPNVariable variable : {NPNVWindowNPObject, NPNVPluginElementNPObject}) {
        NPObject* first = nullptr;
        NPObject* second = nullptr;
        ASSERT_EQ(browser.getvalue(self, variable, &first), NPERR_NO_ERROR);
        ASSERT_EQ(browser.getvalue(self, variable, &second), NPERR_NO_ERROR);
        EXPECT_EQ(first, second);
        browser.releaseobject(first);
        browser.releaseobject(second);
    }
}

TEST_P(BrowserFunctions, ItTakesWhatAPluginSaysOfItself) {
    EXPECT_EQ(browser.setvalue(self, NPPVpluginWindowBool, nullptr), NPERR_NO_ERROR);
    EXPECT_EQ(browser.setvalue(self, NPPVpluginTransparentBool, nullptr), NPERR_NO_ERROR);
    EXPECT_NE(browser.setvalue(self, NPPVformValue, nullptr), NPERR_NO_ERROR);
    EXPECT_NE(browser.setvalue(nullptr, NPPVpluginWindowBool, nullptr), NPERR_NO_ERROR);
}

TEST_P(BrowserFunctions, WhatMakesNoSenseReturnsAnErrorAndDoesNothing) {
    NPStream* stream = reinterpret_cast<NPStream*>(1);
    EXPECT_NE(browser.newstream(self, nullptr, nullptr, &stream), NPERR_NO_ERROR);
    EXPECT_EQ(stream, nullptr);
    EXPECT_NE(browser.newstream(self, nullptr, nullptr, nullptr), NPERR_NO_ERROR);
    EXPECT_LT(browser.write(self, nullptr, 0, nullptr), 0);
    EXPECT_NE(browser.requestread(nullptr, nullptr), NPERR_NO_ERROR);
    EXPECT_NE(browser.destroystream(self, nullptr, NPRES_DONE), NPERR_NO_ERROR);
    EXPECT_EQ(browser.getJavaEnv(), nullptr);
    EXPECT_EQ(browser.getJavaPeer(self), nullptr);
    char* value = reinterpret_cast<char*>(1);
    uint32_t length = 1;
    EXPECT_NE(browser.getvalueforurl(self, NPNURLVCookie, "http://x/", &value, &length), NPERR_NO_ERROR);
    EXPECT_EQ(value, nullptr);
    EXPECT_EQ(length, 0U);
    EXPECT_NE(browser.setvalueforurl(self, NPNURLVCookie, "http://x/", "a", 1), NPERR_NO_ERROR);
    EXPECT_NE(
        browser.getauthenticationinfo(self, "http", "x", 80, "basic", "r", &value, &length, &value, &length),
        NPERR_NO_ERROR);
    EXPECT_NE(browser.popupcontextmenu(self, nullptr), NPERR_NO_ERROR);
    EXPECT_FALSE(
        browser.convertpoint(self, 0, 0, NPCoordinateSpacePlugin, nullptr, nullptr, NPCoordinateSpacePlugin));
    EXPECT_FALSE(browser.handleevent(self, nullptr, false));
    EXPECT_FALSE(browser.unfocusinstance(self, NPFocusNext));
    EXPECT_NE(browser.initasyncsurface(self, nullptr, NPImageFormatBGRA32, nullptr, nullptr), NPERR_NO_ERROR);
    EXPECT_NE(browser.finalizeasyncsurface(self, nullptr), NPERR_NO_ERROR);
    browser.setcurrentasyncsurface(self, nullptr, nullptr);
    browser.invalidaterect(self, nullptr);
    browser.invalidateregion(self, nullptr);
    browser.forceredraw(self);
    browser.reloadplugins(false);
    browser.pushpopupsenabledstate(self, true);
    browser.poppopupsenabledstate(self);
    browser.urlredirectresponse(self, nullptr, true);
}

TEST_P(BrowserFunctions, NullsAreErrors) {
    NPVariant result = boolVariant(true);
    NPIdentifier* names = nullptr;
    uint32_t count = 0;
    EXPECT_FALSE(browser.invoke(self, nullptr, id("f"), nullptr, 0, &result));
    EXPECT_EQ(result.type, NPVariantType_Void);
    EXPECT_FALSE(browser.invokeDefault(self, nullptr, nullptr, 0, &result));
    EXPECT_FALSE(browser.construct(self, nullptr, nullptr, 0, &result));
    EXPECT_FALSE(browser.evaluate(self, nullptr, nullptr, &result));
    EXPECT_FALSE(browser.getproperty(self, nullptr, id("a"), &result));
    EXPECT_FALSE(browser.setproperty(self, nullptr, id("a"), &result));
    EXPECT_FALSE(browser.removeproperty(self, nullptr, id("a")));
    EXPECT_FALSE(browser.hasproperty(self, nullptr, id("a")));
    EXPECT_FALSE(browser.hasmethod(self, nullptr, id("a")));
    EXPECT_FALSE(browser.enumerate(self, nullptr, &names, &count));
    const OwnedVariant object = evaluated("({})");
    EXPECT_FALSE(browser.enumerate(self, objectOf(object.get()), nullptr, &count));
    EXPECT_FALSE(browser.enumerate(self, objectOf(object.get()), &names, nullptr));
    EXPECT_EQ(browser.createobject(nullptr, nullptr), nullptr);
    EXPECT_EQ(browser.createobject(self, nullptr), nullptr);
    EXPECT_EQ(browser.retainobject(nullptr), nullptr);
    browser.releaseobject(nullptr);
    EXPECT_NE(browser.geturl(self, nullptr, nullptr), NPERR_NO_ERROR);
    EXPECT_NE(browser.geturl(nullptr, "x", nullptr), NPERR_NO_ERROR);
    EXPECT_EQ(browser.scheduletimer(self, 1, false, nullptr), 0U);
    EXPECT_EQ(browser.scheduletimer(nullptr, 1, false, nullptr), 0U);
    browser.unscheduletimer(self, 12345);
    browser.pluginthreadasynccall(self, nullptr, nullptr);
    browser.status(nullptr, nullptr);
    EXPECT_NE(browser.destroystream(nullptr, nullptr, NPRES_DONE), NPERR_NO_ERROR);
    ASSERT_STRNE(browser.uagent(nullptr), nullptr);
    EXPECT_STRNE(browser.uagent(nullptr), "");
}

TEST_P(BrowserFunctions, TheStatusIsThatOfTheWindow) {
    browser.status(self, "text");
    EXPECT_EQ(script("status"), "text");
    browser.status(self, nullptr);
    EXPECT_EQ(script("status"), "");
}

TEST_P(BrowserFunctions, TheUserAgentIsThatOfTheFirstPageThatHasOne) {
    script("navigator = { userAgent: 'Television/1' }; 0");
    const char* const first = browser.uagent(self);
    EXPECT_STREQ(first, "Television/1");
    script("navigator.userAgent = 'Another/2'; 0");
    EXPECT_EQ(browser.uagent(self), first);
    EXPECT_STREQ(first, "Television/1");
}

TEST_P(BrowserFunctions, AnInstanceThatHasEndedIsNoInstance) {
    const auto kept = page->instance(instance);
    page->endInstance(instance);
    EXPECT_EQ(kept->scriptableObject(), nullptr);
    NPObject* object = nullptr;
    EXPECT_NE(browser.getvalue(self, NPNVWindowNPObject, &object), NPERR_NO_ERROR);
    EXPECT_NE(browser.geturl(self, "x", nullptr), NPERR_NO_ERROR);
    EXPECT_EQ(browser.scheduletimer(self, 1, false, [](NPP, uint32_t) {}), 0U);
}

TEST_P(BrowserFunctions, PostedCallsRunLaterOnTheMainThread) {
    static std::thread::id s_ran;
    s_ran = {};
    std::thread([this] {
        browser.pluginthreadasynccall(
            self, [](void*) { s_ran = std::this_thread::get_id(); }, nullptr);
    }).join();
    EXPECT_EQ(s_ran, std::thread::id());
    runMainLoop();
    EXPECT_EQ(s_ran, std::this_thread::get_id());
}

TEST_P(BrowserFunctions, PostedCallsRunAfterTheirInstanceAndPage) {
    int runs = 0;
    const auto count = [](void* data) { ++*static_cast<int*>(data); };
    browser.pluginthreadasynccall(self, count, &runs);
    page->endInstance(instance);
    browser.pluginthreadasynccall(self, count, &runs); // from a thread that has not heard of the end
    endPage();
    EXPECT_EQ(runs, 2);
}

TEST_P(BrowserFunctions, PostedCallsOfAPluginThatIsShutDownAreDropped) {
    int runs = 0;
    endPage();
    browser.pluginthreadasynccall(
        nullptr, [](void* data) { ++*static_cast<int*>(data); }, &runs);
    plugin = nullptr;
    runMainLoop();
    EXPECT_EQ(runs, 0);
}

int s_timerRuns = 0;

TEST_P(BrowserFunctions, TimersRunOnceOrUntilTheyAreStopped) {
    s_timerRuns = 0;
    EXPECT_NE(browser.scheduletimer(self, 1, false, [](NPP, uint32_t) { s_timerRuns++; }), 0U);
    ASSERT_TRUE(runUntil([] { return s_timerRuns == 1; }));
    browser.scheduletimer(self, 1, true, [](NPP npp, uint32_t timer) {
        if (++s_timerRuns == 4) {
            browserFunctions()->unscheduletimer(npp, timer);
        }
    });
    ASSERT_TRUE(runUntil([] { return s_timerRuns == 4; }));
    g_usleep(5000);
    runMainLoop();
    EXPECT_EQ(s_timerRuns, 4);
}

TEST_P(BrowserFunctions, TimersEndWithTheirInstance) {
    s_timerRuns = 0;
    browser.scheduletimer(self, 1, true, [](NPP, uint32_t) { s_timerRuns++; });
    page->endInstance(instance);
    g_usleep(5000);
    runMainLoop();
    EXPECT_EQ(s_timerRuns, 0);
}

TEST(BridgePlugin, ItsTypesAreReadFromItsDescription) {
    const auto types = readMimeDescription("a/b:x,y:First: one;c/d::;;e/f");
    ASSERT_EQ(types.size(), 3U);
    EXPECT_EQ(types[0].type, "a/b");
    EXPECT_EQ(types[0].suffixes, "x,y");
    EXPECT_EQ(types[0].description, "First: one");
    EXPECT_EQ(types[1].type, "c/d");
    EXPECT_EQ(types[1].description, "");
    EXPECT_EQ(types[2].type, "e/f");
    EXPECT_TRUE(readMimeDescription("").empty());
}

TEST(BridgePlugin, AFileThatIsNoPluginIsAnError) {
    std::string error;
    EXPECT_EQ(Plugin::load("/nonexistent/plugin.so", error), nullptr);
    EXPECT_NE(error, "");
    EXPECT_EQ(Plugin::load("libgmodule-2.0.so.0", error), nullptr);
    EXPECT_NE(error.find("not a browser plug-in"), std::string::npos) << error;
}

TEST(BridgePlugin, APluginThatRefusesIsAnError) {
    std::string error;
    static int s_shutdowns = 0;
    const PluginEntries entries = {
        [](NPNetscapeFuncs*, NPPluginFuncs*) -> NPError { return NPERR_INCOMPATIBLE_VERSION_ERROR; },
        []() -> NPError { return ++s_shutdowns, NPERR_NO_ERROR; }, [] { return ""; }, nullptr};
    EXPECT_EQ(Plugin::initialize(entries, error), nullptr);
    EXPECT_NE(error.find("error 8"), std::string::npos) << error;
    EXPECT_EQ(s_shutdowns, 0);
}

TEST(BridgePlugin, ItIsShutDownOnce) {
    std::string error;
    static int s_shutdowns = 0;
    const PluginEntries entries = {
        [](NPNetscapeFuncs*, NPPluginFuncs* calls) -> NPError {
            calls->newp = [](NPMIMEType, NPP, uint16_t, int16_t, char*[], char*[], NPSavedData*) -> NPError {
                return NPERR_GENERIC_ERROR;
            };
            calls->destroy = [](NPP, NPSavedData**) -> NPError { return NPERR_NO_ERROR; };
            return NPERR_NO_ERROR;
        },
        []() -> NPError { return ++s_shutdowns, NPERR_NO_ERROR; }, [] { return ""; }, nullptr};
    ASSERT_NE(Plugin::initialize(entries, error), nullptr) << error;
    EXPECT_EQ(s_shutdowns, 1);
}

} // namespace
