// Objects on both sides: values, identity, references, the ends of instances and pages.
#include "bridge/Objects.h"

#include <algorithm>
#include <vector>

#include "bridge/CallDepth.h"
#include "tests/bridge/ScriptHost.h"

using namespace bridge;

namespace {

class BridgeObjects : public ScriptHost {
protected:
    uint32_t instance = addInstance("plugin", {{"id", "first"}, {"data", "two words"}});
    NPP self = npp(instance);

    NPIdentifier id(const char* name) { return browser.getstringidentifier(name); }
    int liveObjects() { return std::stoi(script("plugin.objects")); }
    // The object that the plug-in gets as the result of a script, with a reference.
    NPObject* resultOf(const std::string& text) {
        NPObject* window = nullptr;
        EXPECT_EQ(browser.getvalue(self, NPNVWindowNPObject, &window), NPERR_NO_ERROR);
        NPString program = {text.c_str(), static_cast<uint32_t>(text.size())};
        NPVariant result{};
        EXPECT_TRUE(browser.evaluate(self, window, &program, &result));
        browser.releaseobject(window);
        return objectOf(result);
    }
};

INSTANTIATE_TEST_SUITE_P(Engines, BridgeObjects, testing::Values(EngineKind::CApi, EngineKind::GObject),
                         nameOf);

TEST_P(BridgeObjects, AnInstanceGetsItsParametersInTheirOrder) {
    EXPECT_EQ(script("plugin.attributes"), "id=first data=two words");
}

TEST_P(BridgeObjects, ValuesGoInAndComeOut) {
    for (const char* const value : {"undefined", "null", "true", "false", "-1.5", "1e300", "''", "'text'",
                                    "'a\\0b'", "'\\u20ac\\ud83d\\ude00'", "Infinity"}) {
        EXPECT_EQ(script(std::string("plugin.echo(") + value + ") === " + value), "true") << value;
    }
    EXPECT_EQ(script("plugin.echo('a\\ud83d') === 'a\\ufffd'"), "true");
    EXPECT_EQ(script("plugin.value = 5; plugin.kind"), "double");
    EXPECT_EQ(script("plugin.echo(Symbol())"), "undefined");
}

TEST_P(BridgeObjects, InvalidTextOfThePluginIsReplaced) {
    const OwnedVariant text(stringVariant("a\xFF"));
    const OwnedVariant window(objectVariant(page->window()));
    browser.setproperty(self, objectOf(window.get()), id("given"), &text.get());
    EXPECT_EQ(script("given === 'a\\ufffd'"), "true");
}

TEST_P(BridgeObjects, NamesPropertiesAndMethods) {
    EXPECT_EQ(script("['value' in plugin, 'echo' in plugin, 'none' in plugin]"), "true,true,false");
    EXPECT_EQ(script("[typeof plugin, typeof plugin.echo, typeof plugin.none]"), "object,function,undefined");
    EXPECT_EQ(script("plugin.echo === plugin.sub().echo"), "true");
    EXPECT_EQ(script("plugin.echo.call(plugin.sub(), 4)"), "4");
    EXPECT_EQ(script("[plugin[0], plugin['2'], plugin[3], plugin.length]"), "item 0,item 2,,3");
    EXPECT_EQ(script("plugin.readOnly = 1; plugin.readOnly"), "42");
    EXPECT_EQ(script("plugin.mine = 1; plugin.mine"), "1");
    EXPECT_EQ(script("plugin.echo = 1; typeof plugin.echo"), "function");
    EXPECT_EQ(script("var names = []; for (var name in plugin) { names.push(name); } names.sort()"),
              "length,mine,value");
    EXPECT_EQ(script("Object.create(plugin).echo(8)"), "8");
    EXPECT_EQ(
        script(
            "var last = plugin; for (var i = 0; i < 31; i++) { last = Object.create(last); } last.echo(9)"),
        "9");
}

TEST_P(BridgeObjects, ArgumentsArePaddedWithVoid) {
    EXPECT_EQ(script("plugin.positions('a', 1)"),
              "2 string double void void void void void void void void void void void void void void");
    EXPECT_EQ(
        script("plugin.last.apply(plugin, Array.from({ length: 50 }, function (_, i) { return 'n' + i; }))"),
        "n49");
}

TEST_P(BridgeObjects, FailuresAreExceptions) {
    EXPECT_EQ(script("plugin.fail()"), "threw Error calling method on NPObject.");
    EXPECT_EQ(script("plugin.throwText('its text')"), "threw its text");
    EXPECT_EQ(script("plugin.title = 1"), "threw no title");
    EXPECT_EQ(script("plugin.echo(1)"), "1");
    EXPECT_EQ(script("plugin.function()('called')"), "called");
}

TEST_P(BridgeObjects, ACallThatIsRefusedIsReportedWithTheTypesOfItsArguments) {
    const OwnedVariant functions = evaluated(
        "var warnings = []; ({ warn: function () { warnings.push([].slice.call(arguments).join(' ')); } })");
    page->attachScript(objectOf(functions.get()));
    script("plugin.fail(1, 'a', {}, null, true, undefined)");
    script("plugin.throwText('its text')");
    EXPECT_EQ(script("plugin.echo(1)"), "1");
    EXPECT_EQ(script("warnings"), "refused-call fail(number, string, object, null, boolean, undefined)");
}

TEST_P(BridgeObjects, ObjectsOfAnotherFrameAreTheSame) {
    EXPECT_EQ(scriptOfAnotherFrame("plugin.echo(5)"), "5");
    EXPECT_EQ(
        scriptOfAnotherFrame("var o = { a: 1 }; plugin.keep(o); plugin.kept() === o && plugin.isKept(o)"),
        "true");
    EXPECT_EQ(script("plugin.kept().a"), "1");
}

TEST_P(BridgeObjects, ScriptObjectsAreTheSameWhileThePluginHoldsThem) {
    EXPECT_EQ(script("var o = {}; plugin.keep(o); plugin.kept() === o && plugin.isKept(o)"), "true");
    EXPECT_EQ(script("plugin.keep(o); plugin.isKept({})"), "false");
    const OwnedVariant first = evaluated("o");
    const OwnedVariant second = evaluated("o");
    EXPECT_EQ(objectOf(first.get()), objectOf(second.get()));
}

TEST_P(BridgeObjects, PluginObjectsAreTheSameWhileEitherSideHoldsThem) {
    EXPECT_EQ(script("var sub = plugin.sub(); plugin.echo(sub) === sub"), "true");
    EXPECT_EQ(script("plugin.keep(sub); sub.mine = 'here'; sub = null; plugin.kept().mine"), "here");
    const int before = liveObjects();
    EXPECT_EQ(script("for (var i = 0; i < 2000; i++) { plugin.sub().mine = i; } 0"), "0");
    EXPECT_TRUE(collectUntil([&] { return liveObjects() < before + 1000; }));
    EXPECT_EQ(script("plugin.kept().mine"), "here");
}

TEST_P(BridgeObjects, AnObjectThatOnlyThePluginReleasesIsDeletedOnce) {
    const int before = liveObjects();
    EXPECT_EQ(script("plugin.keep(plugin.sub()); plugin.keep(null); 0"), "0");
    EXPECT_EQ(script("for (var i = 0; i < 500; i++) { plugin.keep(plugin.sub()); } plugin.keep(null); 0"),
              "0");
    EXPECT_TRUE(collectUntil([&] { return liveObjects() < before + 2500; })) << liveObjects();
}

TEST_P(BridgeObjects, ReferencesOfThePluginKeepScriptObjects) {
    EXPECT_EQ(script("plugin.keep({ big: new Array(1000), name: 'kept' }); 0"), "0");
    collectUntil([rounds = 0]() mutable { return ++rounds > 3; });
    EXPECT_EQ(script("plugin.kept().name"), "kept");
}

TEST_P(BridgeObjects, ScriptObjectsThatThePluginReleasesAreCollected) {
    script("var known = []; for (var i = 0; i < 50; i++) { (function (object) {"
           " known.push(new WeakRef(object)); plugin.keep(object); }({})); } plugin.keep(null); 0");
    const char* const alive = "known.filter(function (each) { return each.deref(); }).length";
    EXPECT_TRUE(collectUntil([&] { return std::stoi(script(alive)) < 25; })) << script(alive);
}

TEST_P(BridgeObjects, ThePluginUsesScriptObjects) {
    const OwnedVariant object = evaluated("({ a: 1, f: function (x) { return this.a + x; } })");
    NPObject* const target = objectOf(object.get());
    OwnedVariant result;
    EXPECT_TRUE(browser.getproperty(self, target, id("a"), &result));
    EXPECT_EQ(numberOf(result.get()), 1);
    NPVariant two = doubleVariant(2);
    EXPECT_TRUE(browser.invoke(self, target, id("f"), &two, 1, &result));
    EXPECT_EQ(numberOf(result.get()), 3);
    EXPECT_FALSE(browser.invoke(self, target, id("a"), nullptr, 0, &result));
    EXPECT_FALSE(browser.invoke(self, target, id("none"), nullptr, 0, &result));
    EXPECT_TRUE(browser.hasmethod(self, target, id("f")));
    EXPECT_FALSE(browser.hasmethod(self, target, id("a")));
    EXPECT_TRUE(browser.setproperty(self, target, id("b"), &two));
    EXPECT_TRUE(browser.hasproperty(self, target, id("b")));
    EXPECT_TRUE(browser.removeproperty(self, target, id("b")));
    EXPECT_FALSE(browser.hasproperty(self, target, id("b")));
    EXPECT_FALSE(browser.removeproperty(self, target, id("b")));
    NPIdentifier* names = nullptr;
    uint32_t count = 0;
    ASSERT_TRUE(browser.enumerate(self, target, &names, &count));
    EXPECT_EQ(count, 2U);
    EXPECT_EQ(names[0], id("a"));
    browser.memfree(names);
}

TEST_P(BridgeObjects, AnOperationThatScriptRefusesByAnExceptionFailsAlone) {
    const OwnedVariant throwing =
        evaluated("var refuse = function () { throw 'none'; }; new Proxy(function () {}, { has: refuse,"
                  " get: refuse, set: refuse, deleteProperty: refuse, ownKeys: refuse, apply: refuse,"
                  " construct: refuse, getPrototypeOf: refuse, getOwnPropertyDescriptor: refuse })");
    const OwnedVariant good = evaluated("({ a: 1 })");
    NPObject* const target = objectOf(throwing.get());
    NPVariant result = voidVariant();
    NPIdentifier* names = nullptr;
    uint32_t count = 0;
    const std::function<bool()> operations[] = {
        [&] { return browser.hasproperty(self, target, id("a")); },
        [&] { return browser.hasmethod(self, target, id("a")); },
        [&] { return browser.getproperty(self, target, id("a"), &result); },
        [&] { return browser.setproperty(self, target, id("a"), &good.get()); },
        [&] { return browser.removeproperty(self, target, id("a")); },
        [&] { return browser.invoke(self, target, id("a"), nullptr, 0, &result); },
        [&] { return browser.invokeDefault(self, target, nullptr, 0, &result); },
        [&] { return browser.construct(self, target, nullptr, 0, &result); },
        [&] {
            const bool isDone = browser.enumerate(self, target, &names, &count);
            browser.memfree(names);
            return isDone;
        },
    };
    for (const auto& operation : operations) {
        EXPECT_FALSE(operation()) << &operation - operations;
        ASSERT_TRUE(browser.enumerate(self, objectOf(good.get()), &names, &count));
        EXPECT_EQ(count, 1U) << &operation - operations;
        browser.memfree(names);
        EXPECT_EQ(script("1 + 1"), "2") << &operation - operations;
    }
}

TEST_P(BridgeObjects, ThePluginCallsConstructsAndEvaluates) {
    EXPECT_EQ(script("plugin.call(function (a) { return a + arguments.length; }, 5)"), "6");
    EXPECT_EQ(script("plugin.construct(function (a) { this.a = a; }, 'z').a"), "z");
    EXPECT_EQ(script("plugin.evaluate('var there = 4; there * 2') + there"), "12");
    EXPECT_EQ(script("plugin.evaluate('throw 1')"), "threw Error calling method on NPObject.");
    EXPECT_EQ(script("plugin.tries(function () { throw new Error('x'); })"), "failed void");
    EXPECT_EQ(script("plugin.callMethod(plugin.sub(), 'echo', 'own object')"), "own object");
}

TEST_P(BridgeObjects, AnObjectThatOutlivesItsInstanceThrows) {
    script("var sub = plugin.sub(); var echo = plugin.echo; var dead = plugin; 0");
    addInstance("plugin");
    page->endInstance(instance);
    const std::string ended = std::string("threw ") + PluginObject::kEndedText;
    EXPECT_EQ(script("sub.value"), ended);
    EXPECT_EQ(script("sub.value = 1"), ended);
    EXPECT_EQ(script("dead.journal"), ended);
    EXPECT_EQ(script("echo.call(sub, 1)"), ended);
    EXPECT_EQ(script("echo.call(plugin, 1)"), "1");
}

TEST_P(BridgeObjects, ObjectsOfAnEndedInstanceAreInvalidatedAndReleased) {
    addInstance("other");
    const int before = std::stoi(script("other.objects"));
    script("var all = []; for (var i = 0; i < 100; i++) { all.push(plugin.sub()); } other.clear(); 0");
    page->endInstance(instance);
    EXPECT_EQ(std::stoi(script("other.objects")), before - 1);
    EXPECT_EQ(script("other.journal.match(/invalidate/g).length"), "100");
}

TEST_P(BridgeObjects, ResultsOfScriptsEndWithTheirInstance) {
    addInstance("other");
    NPObject* const forgotten = resultOf("({ a: 1 })");
    NPObject* const retained = browser.retainobject(resultOf("({ a: 1 })"));
    NPObject* const again = resultOf("shared = { a: 1 }");
    ASSERT_EQ(resultOf("shared"), again);
    NPObject* const elsewhere = resultOf("elsewhere = { a: 1 }");
    script("other.keep(elsewhere); 0");
    browser.releaseobject(resultOf("({ a: 1 })"));
    page->endInstance(instance);
    const auto isThere = [&](NPObject* object) {
        OwnedVariant value;
        return browser.getproperty(self, object, id("a"), &value);
    };
    EXPECT_FALSE(isThere(forgotten));
    EXPECT_TRUE(isThere(retained));
    EXPECT_TRUE(isThere(again));
    EXPECT_TRUE(isThere(elsewhere));
    EXPECT_EQ(script("other.kept().a"), "1");
    NPVariant cutOff{};
    cutOff.type = NPVariantType_Object;
    cutOff.value.objectValue = forgotten;
    EXPECT_TRUE(browser.setproperty(self, retained, id("given"), &cutOff));
    OwnedVariant given;
    EXPECT_TRUE(browser.getproperty(self, retained, id("given"), &given));
    EXPECT_EQ(given.get().type, NPVariantType_Null);
    for (NPObject* object : {forgotten, retained, retained, again, again, elsewhere}) {
        browser.releaseobject(object);
    }
}

TEST_P(BridgeObjects, ForgottenResultsOfScriptsAreCollectedAfterTheirInstance) {
    script("var known = []; var last; 0");
    std::vector<NPObject*> results;
    for (int i = 0; i < 50; i++) {
        results.push_back(resultOf("known.push(new WeakRef(last = {})); last"));
    }
    script("last = null; 0");
    page->endInstance(instance);
    const char* const alive = "known.filter(function (each) { return each.deref(); }).length";
    EXPECT_TRUE(collectUntil([&] { return std::stoi(script(alive)) < 25; })) << script(alive);
    std::for_each(results.begin(), results.end(), browser.releaseobject);
}

TEST_P(BridgeObjects, AnInstanceThatIsEndedInItsOwnCallEndsAfterIt) {
    addInstance("other");
    script("other.clear(); 0");
    const auto kept = page->instance(instance);
    {
        const CallDepth inTheCall;
        page->endInstance(instance);
        EXPECT_EQ(script("other.journal.indexOf('destroy')"), "-1");
        EXPECT_EQ(script("plugin.readOnly"), std::string("threw ") + PluginObject::kEndedText);
        runMainLoop();
        EXPECT_EQ(script("other.journal.indexOf('destroy')"), "-1");
    }
    // The main loop tries again as long as the plug-in is on the stack.
    EXPECT_TRUE(runUntil([&] { return script("other.journal.indexOf('destroy') >= 0") == "true"; }));
}

TEST_P(BridgeObjects, AfterThePageThePluginMayKeepAndReleaseItsObjects) {
    NPObject* window = nullptr;
    ASSERT_EQ(browser.getvalue(self, NPNVWindowNPObject, &window), NPERR_NO_ERROR);
    NPObject* own = nullptr;
    {
        const OwnedVariant object = evaluated("({ a: 1 })");
        own = browser.retainobject(objectOf(object.get()));
    }
    const auto kept = page->instance(instance);
    const auto ended = page;
    page->end();
    EXPECT_EQ(page->window(), nullptr);
    endPage();
    EXPECT_EQ(ended->createInstance(nullptr, "application/x-telix-test", {}), 0U);
    EXPECT_EQ(ended->engine().globalObject(), nullptr);
    OwnedVariant result;
    EXPECT_FALSE(browser.getproperty(self, own, id("a"), &result));
    EXPECT_FALSE(browser.invokeDefault(self, own, nullptr, 0, &result));
    EXPECT_FALSE(browser.enumerate(self, own, nullptr, nullptr));
    NPString text = {"1", 1};
    EXPECT_FALSE(browser.evaluate(self, window, &text, &result));
    browser.releaseobject(own);
    browser.releaseobject(window);
}

TEST_P(BridgeObjects, TwoInstancesHaveTheirOwn) {
    addInstance("other");
    EXPECT_EQ(script("plugin === other"), "false");
    EXPECT_EQ(script("plugin.value = 1; other.value = 2; plugin.value + other.value"), "3");
    EXPECT_EQ(script("plugin.call(other.echo.bind(other), 'over')"), "over");
}

TEST_P(BridgeObjects, ARefusedInstanceIsNone) {
    EXPECT_EQ(addInstance("none", {{"refuse", ""}}), 0U);
    EXPECT_EQ(script("typeof none"), "undefined");
}

} // namespace
