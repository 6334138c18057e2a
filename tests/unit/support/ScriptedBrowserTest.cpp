// The scripted browser: that it behaves as browsers do, and that it notices what a plug-in may not do.
#include <cstdlib>
#include <cstring>
#include <thread>

#include <glib.h>
#include <gtest/gtest-spi.h>

#include "common/BrowserGates.h"
#include "tests/support/BorderTest.h"

using ::testing::ElementsAre;
using ::testing::IsEmpty;

namespace {

// A class of objects that counts its deaths and hands out what the test puts in `result`.
struct Thing : NPObject {
    static inline int deaths = 0;
    static inline NPObject* result = nullptr;

    static NPClass* thingClass() {
        static NPClass record = {};
        record.structVersion = NP_CLASS_STRUCT_VERSION;
        record.allocate = [](NPP, NPClass*) -> NPObject* { return new Thing; };
        record.deallocate = [](NPObject* object) {
            ++deaths;
            delete static_cast<Thing*>(object);
        };
        record.getProperty = [](NPObject*, NPIdentifier, NPVariant* value) {
            value->type = NPVariantType_Object;
            value->value.objectValue = result;
            return true;
        };
        return &record;
    }
};

class ScriptedBrowserTest : public BorderTest {
protected:
    ScriptedBrowserTest() { Thing::deaths = 0; }

    bool evaluate(const std::string& text, Value* value = nullptr) {
        NPString script = {text.data(), static_cast<uint32_t>(text.size())};
        NPVariant result;
        const bool succeeded = NPN_Evaluate(nullptr, browser.window().object(), &script, &result);
        const Value taken = Value::take(result);
        if (value) {
            *value = taken;
        }
        return succeeded;
    }
};

TEST_F(ScriptedBrowserTest, InternsIdentifiers) {
    EXPECT_EQ(NPN_GetStringIdentifier("name"), NPN_GetStringIdentifier("name"));
    EXPECT_NE(NPN_GetStringIdentifier("name"), NPN_GetStringIdentifier("Name"));
    EXPECT_EQ(NPN_GetStringIdentifier(5), NPN_GetStringIdentifier(5));
    EXPECT_NE(NPN_GetStringIdentifier(5), NPN_GetStringIdentifier("5"));
    EXPECT_EQ(NPN_IntFromIdentifier(NPN_GetStringIdentifier(5)), 5);
    EXPECT_TRUE(NPN_IdentifierIsString(NPN_GetStringIdentifier("name")));
    EXPECT_FALSE(NPN_IdentifierIsString(NPN_GetStringIdentifier(5)));
}

TEST_F(ScriptedBrowserTest, TheTextOfAnIdentifierIsTheCallersToFree) {
    char* text = NPN_UTF8FromIdentifier(NPN_GetStringIdentifier("name"));
    EXPECT_STREQ(text, "name");
    std::free(text);
    EXPECT_EQ(NPN_UTF8FromIdentifier(NPN_GetStringIdentifier(5)), nullptr);
}

TEST_F(ScriptedBrowserTest, AnObjectDiesWithItsLastReference) {
    NPObject* object = NPN_CreateObject(nullptr, Thing::thingClass());
    NPN_RetainObject(object);
    NPN_ReleaseObject(object);
    EXPECT_EQ(Thing::deaths, 0);
    NPN_ReleaseObject(object);
    EXPECT_EQ(Thing::deaths, 1);
    EXPECT_THAT(log.everything(), ElementsAre("NPN_CreateObject object", "NPN_RetainObject object",
                                              "NPN_ReleaseObject object", "NPN_ReleaseObject object"));
}

TEST_F(ScriptedBrowserTest, AClassWithoutAllocateAndDeallocateLivesOnTheHeap) {
    NPClass plain = {};
    NPN_ReleaseObject(NPN_CreateObject(nullptr, &plain));
    EXPECT_EQ(browser.liveCount("object"), 0U);
}

TEST_F(ScriptedBrowserTest, NoticesTheReleaseOfADeadObject) {
    NPObject* object = NPN_CreateObject(nullptr, Thing::thingClass());
    NPN_ReleaseObject(object);
    EXPECT_NONFATAL_FAILURE(NPN_ReleaseObject(object), "NPN_ReleaseObject: a dead or unknown object");
    EXPECT_EQ(Thing::deaths, 1);
}

TEST_F(ScriptedBrowserTest, NoticesTheUseOfADeadObject) {
    NPObject* object = NPN_CreateObject(nullptr, Thing::thingClass());
    NPN_ReleaseObject(object);
    NPVariant result;
    EXPECT_NONFATAL_FAILURE(NPN_RetainObject(object), "dead");
    EXPECT_NONFATAL_FAILURE(NPN_InvokeDefault(nullptr, object, nullptr, 0, &result), "dead");
    EXPECT_NONFATAL_FAILURE(NPN_GetProperty(nullptr, object, NPN_GetStringIdentifier("x"), &result), "dead");
}

TEST_F(ScriptedBrowserTest, NoticesTheReleaseOfAReferenceThatIsThePages) {
    const ScriptFunction listener = browser.function("listener");
    EXPECT_NONFATAL_FAILURE(NPN_ReleaseObject(listener.object()), "holds no reference to listener");
    EXPECT_TRUE(listener.callDefault());
}

TEST_F(ScriptedBrowserTest, NoticesAnObjectThatIsHandedOutWithoutAReference) {
    const ScriptObject held = browser.scriptObject("held");
    const ObjectRef thing = ObjectRef::adopt(NPN_CreateObject(nullptr, Thing::thingClass()));
    Thing::result = held.object();
    EXPECT_NONFATAL_FAILURE(thing.get("anything"), "handed out held without a reference");
    NPN_RetainObject(held.object());
    EXPECT_EQ(thing.get("anything").value, held);
}

TEST_F(ScriptedBrowserTest, NullCanBeRetainedAndReleased) {
    EXPECT_EQ(NPN_RetainObject(nullptr), nullptr);
    NPN_ReleaseObject(nullptr);
    EXPECT_THAT(log.everything(), ElementsAre("NPN_RetainObject null", "NPN_ReleaseObject null"));
}

TEST_F(ScriptedBrowserTest, CountsThePagesReferencesApart) {
    const ObjectRef thing = ObjectRef::adopt(NPN_CreateObject(nullptr, Thing::thingClass()));
    EXPECT_EQ(thing.pluginReferences(), 0);
    const ObjectRef another = thing;
    NPN_RetainObject(thing.object());
    EXPECT_EQ(thing.pluginReferences(), 1);
    EXPECT_EQ(thing.object()->referenceCount, 3U);
    NPN_ReleaseObject(thing.object());
}

TEST_F(ScriptedBrowserTest, ReportsWhatIsAlive) {
    NPObject* first = NPN_CreateObject(nullptr, Thing::thingClass());
    NPObject* second = NPN_CreateObject(nullptr, Thing::thingClass());
    EXPECT_EQ(browser.liveCount("object"), 2U);
    EXPECT_THAT(browser.report(), ::testing::HasSubstr("object#2: 1 references, 1 of the plug-in"));
    NPN_ReleaseObject(first);
    NPN_ReleaseObject(second);
    EXPECT_EQ(browser.liveCount("object"), 0U);
}

TEST_F(ScriptedBrowserTest, CountsMemory) {
    void* block = NPN_MemAlloc(10);
    EXPECT_EQ(browser.memoryBlocks(), 1U);
    NPN_MemFree(block);
    EXPECT_EQ(browser.memoryBlocks(), 0U);
    NPN_MemFree(nullptr);
    EXPECT_THAT(log.everything(), ElementsAre("NPN_MemAlloc 10", "NPN_MemFree", "NPN_MemFree"));
}

TEST_F(ScriptedBrowserTest, RefusesWhatTheTestSays) {
    browser.refuse("NPN_MemAlloc", 1, 1);
    void* first = NPN_MemAlloc(1);
    EXPECT_NE(first, nullptr);
    EXPECT_EQ(NPN_MemAlloc(1), nullptr);
    void* third = NPN_MemAlloc(1);
    EXPECT_NE(third, nullptr);
    NPN_MemFree(first);
    NPN_MemFree(third);

    browser.refuse("NPN_CreateObject");
    EXPECT_EQ(NPN_CreateObject(nullptr, Thing::thingClass()), nullptr);
    EXPECT_EQ(NPN_CreateObject(nullptr, Thing::thingClass()), nullptr);
    browser.permit("NPN_CreateObject");
    NPObject* object = NPN_CreateObject(nullptr, Thing::thingClass());
    ASSERT_NE(object, nullptr);
    NPN_ReleaseObject(object);

    browser.refuse("NPN_Evaluate", 1);
    EXPECT_FALSE(evaluate("1"));
    EXPECT_TRUE(evaluate("1"));
    browser.refuse("NPN_GetValue");
    NPObject* window = nullptr;
    EXPECT_NE(NPN_GetValue(nullptr, NPNVWindowNPObject, &window), NPERR_NO_ERROR);
    EXPECT_EQ(window, nullptr);
}

TEST_F(ScriptedBrowserTest, NoticesACallFromAnotherThread) {
    EXPECT_NONFATAL_FAILURE_ON_ALL_THREADS(std::thread([] { NPN_MemFlush(1); }).join(),
                                           "NPN_MemFlush was called on another thread");
    EXPECT_THAT(log.everything(), IsEmpty());
}

TEST_F(ScriptedBrowserTest, RunsAsynchronousCallsInOrderWhenPumped) {
    static std::vector<int> ran;
    ran.clear();
    const auto remember = [](void* data) {
        ran.push_back(static_cast<int>(reinterpret_cast<intptr_t>(data)));
    };
    std::thread([&] {
        NPN_PluginThreadAsyncCall(nullptr, remember, reinterpret_cast<void*>(1));
        NPN_PluginThreadAsyncCall(nullptr, remember, reinterpret_cast<void*>(2));
    }).join();
    EXPECT_THAT(ran, IsEmpty());
    EXPECT_EQ(browser.pendingAsyncCalls(), 2U);
    browser.pump();
    EXPECT_THAT(ran, ElementsAre(1, 2));
}

TEST_F(ScriptedBrowserTest, PumpsIdleFunctionsAndWhatTheyQueue) {
    static int runs;
    runs = 0;
    g_idle_add(
        [](void*) -> gboolean {
            ++runs;
            NPN_PluginThreadAsyncCall(
                nullptr, [](void*) { ++runs; }, nullptr);
            return G_SOURCE_REMOVE;
        },
        nullptr);
    browser.pump();
    EXPECT_EQ(runs, 2);
}

TEST_F(ScriptedBrowserTest, WaitsForATimerAndNoLongerThanTheBound) {
    static bool done;
    done = false;
    g_timeout_add(
        5,
        [](void*) -> gboolean {
            done = true;
            return G_SOURCE_REMOVE;
        },
        nullptr);
    EXPECT_TRUE(browser.pumpUntil([] { return done; }));
    EXPECT_NONFATAL_FAILURE(browser.pumpUntil([] { return false; }, std::chrono::milliseconds(1)),
                            "within 1 ms");
}

TEST_F(ScriptedBrowserTest, EvaluatesAsTheTestSaysYoungestRuleFirst) {
    Value value;
    EXPECT_TRUE(evaluate("anything", &value));
    EXPECT_EQ(value, undefined);
    browser.whenEvaluatingTextFrom("window.").gives(1);
    browser.whenEvaluating("window.special()").gives("special");
    EXPECT_TRUE(evaluate("window.other()", &value));
    EXPECT_EQ(value, 1);
    EXPECT_TRUE(evaluate("window.special()", &value));
    EXPECT_EQ(value, "special");
    browser
        .whenEvaluatingIf([&](const Evaluation& evaluation) { return evaluation.scope == browser.window(); })
        .throws();
    EXPECT_FALSE(evaluate("window.special()", &value));
    EXPECT_EQ(browser.lastScript(), "window.special()");
    EXPECT_EQ(browser.scripts().size(), 4U);
}

TEST_F(ScriptedBrowserTest, ATextWithAnOpenLiteralDoesNotRun) {
    browser.whenEvaluatingTextFrom("f(").gives(true);
    EXPECT_TRUE(evaluate("f('a', \"b's\", 'it\\'s')"));
    EXPECT_FALSE(evaluate("f('it's')"));
    EXPECT_FALSE(evaluate("f(\"a)"));
}

TEST_F(ScriptedBrowserTest, TellsThePagesAddress) {
    browser.setAddress("http://elsewhere.example/");
    Value value;
    EXPECT_TRUE(evaluate("document.location.href", &value));
    EXPECT_EQ(value, "http://elsewhere.example/");
}

TEST_F(ScriptedBrowserTest, DispatchesDomEventsAtElementsOfThePage) {
    browser.embed("application/none", {{"id", "tv"}});
    size_t heard = 0;
    browser.onEvent("Buffering", [&](const DomEvent&) { ++heard; });
    const std::string script =
        "var objElement=document.getElementById(\"tv\"); newEvent=document.createEvent(\"Event\");"
        "newEvent.initEvent(\"Buffering\", true,false); objElement.dispatchEvent(newEvent);";
    Value value;
    EXPECT_TRUE(evaluate(script, &value));
    EXPECT_EQ(value, true);
    EXPECT_THAT(browser.events(), ElementsAre(DomEvent{"Buffering", "tv", true, false, {}}));
    EXPECT_EQ(heard, 1U);
    EXPECT_TRUE(log.contains("event Buffering at tv bubbles"));
}

TEST_F(ScriptedBrowserTest, AnEventAtAnUnknownElementThrows) {
    browser.embed("application/none", {{"id", "tv"}});
    EXPECT_FALSE(evaluate("document.getElementById(\"radio\"); newEvent.initEvent(\"X\", false,false); "
                          "objElement.dispatchEvent(newEvent);"));
    EXPECT_THAT(browser.events(), IsEmpty());
}

TEST_F(ScriptedBrowserTest, ReadsTheFieldsOfAStreamEvent) {
    browser.embed("application/none", {{"id", "tv"}});
    EXPECT_TRUE(evaluate(
        "var objElement = document.getElementById(\"tv\"); strEvent.initEvent('StreamEvent', false, false); "
        "strEvent.name = \"n\"; strEvent.data = \"41\";  strEvent.text = \"A\";  strEvent.status = "
        "\"trigger\"; objElement.dispatchEvent(strEvent);"));
    const DomEvent expected{"StreamEvent",
                            "tv",
                            false,
                            false,
                            {{"name", "n"}, {"data", "41"}, {"text", "A"}, {"status", "trigger"}}};
    EXPECT_THAT(browser.events(), ElementsAre(expected));
}

TEST_F(ScriptedBrowserTest, AFunctionRemembersItsCallsAndDoesWhatTheTestSays) {
    const ScriptFunction listener = browser.function("listener");
    EXPECT_NONFATAL_FAILURE(listener.last(), "listener was never called");
    const ArgumentArray arguments({1, "two"});
    NPVariant result;
    EXPECT_TRUE(NPN_InvokeDefault(nullptr, listener.object(), arguments.data(), arguments.count(), &result));
    EXPECT_EQ(Value::take(result), undefined);
    EXPECT_EQ(listener.count(), 1U);
    EXPECT_EQ(listener.last(), (Values{1, "two"}));
    EXPECT_TRUE(log.contains("NPN_InvokeDefault listener(1, \"two\")"));

    listener.does([](const Values& values) { return Value(values.size()); });
    EXPECT_EQ(listener.callDefault({true, true, true}), 3);
    listener.throws();
    EXPECT_FALSE(listener.callDefault());
}

TEST_F(ScriptedBrowserTest, PageObjectsHavePropertiesAndMethods) {
    const ScriptObject object = browser.scriptObject("thing");
    object.method("sum",
                  [](const Values& values) { return Value(values[0].integer() + values[1].integer()); });
    EXPECT_EQ(object.call("sum", 2, 3), 5);
    EXPECT_THAT(object.calls("sum"), ElementsAre(Values{2, 3}));
    EXPECT_FALSE(object.call("missing"));
    EXPECT_FALSE(object.get("colour").exists);
    EXPECT_EQ(object.get("colour").value, undefined);
    object.set("colour", "red");
    EXPECT_EQ(object.get("colour"), "red");
    EXPECT_TRUE(object.enumerate());
    EXPECT_TRUE(object.remove("colour"));
    EXPECT_FALSE(object.hasProperty("colour"));
    object.set("size", 1);
    object.refuse("size");
    EXPECT_FALSE(object.get("size"));
    EXPECT_FALSE(object.set("size", 2));
}

TEST_F(ScriptedBrowserTest, AnElementTellsItsRectangleAndItsStyle) {
    const EmbeddedObject tv = browser.embed("application/none", {{"id", "tv"}});
    EXPECT_EQ(tv.error(), NPERR_NO_ERROR);
    tv.setRectangle(1, 2, 30, 40);
    const ObjectRef rectangle = tv.element().call("getBoundingClientRect").object();
    EXPECT_EQ(rectangle.get("left"), 1.0);
    EXPECT_EQ(rectangle.get("bottom"), 40.0);
    tv.element().get("style").object().set("colour", "red");
    EXPECT_EQ(tv.element().get("style").object().get("colour"), "red");
    tv.element().call("addEventListener", "click", nullptr, false);
    EXPECT_THAT(tv.element().calls("addEventListener"), ElementsAre(Values{"click", nullptr, false}));
}

TEST_F(ScriptedBrowserTest, HandsOutWindowAndElementWithAReference) {
    const EmbeddedObject tv = browser.embed("application/none", {{"id", "tv"}});
    NPObject* element = nullptr;
    EXPECT_EQ(NPN_GetValue(tv.npp(), NPNVPluginElementNPObject, &element), NPERR_NO_ERROR);
    EXPECT_EQ(element, tv.element().object());
    EXPECT_EQ(tv.element().pluginReferences(), 1);
    NPN_ReleaseObject(element);
    EXPECT_NE(NPN_GetValue(nullptr, NPNVPluginElementNPObject, &element), NPERR_NO_ERROR);
}

} // namespace
