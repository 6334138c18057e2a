// Objects of classes that a test makes: entries that are missing, and calls that end what they run in.
#include "bridge/HostObject.h"
#include "bridge/Objects.h"
#include "tests/bridge/ScriptHost.h"

using namespace bridge;

namespace {

class BridgeClasses : public ScriptHost {
protected:
    BridgeClasses() {
        s_class = {};
        s_class.structVersion = NP_CLASS_STRUCT_VERSION;
        s_page = page.get();
        s_calls = 0;
    }

    NPIdentifier id(const char* name) { return browser.getstringidentifier(name); }
    // Gives the object to script, as that global variable.
    NPObject* give(const char* variable, NPObject* object) {
        const OwnedVariant given(objectVariant(object));
        const OwnedVariant window(objectVariant(page->window()));
        browser.setproperty(self, objectOf(window.get()), id(variable), &given.get());
        return object;
    }
    // One of the class of the test.
    NPObject* give(const char* variable) { return give(variable, browser.createobject(self, &s_class)); }

    // Reading the property `there` closes the engine of the page.
    static bool closeEngine(NPObject*, NPIdentifier, NPVariant* result) {
        s_calls++;
        s_page->engine().close();
        *result = stringVariant("text");
        return true;
    }
    static bool isThere(NPObject*, NPIdentifier name) {
        return name == browserFunctions()->getstringidentifier("there");
    }

    uint32_t instance = addInstance("plugin");
    NPP self = npp(instance);

    // Outlives the objects of the page; without entries at first.
    static inline NPClass s_class = {};
    // For its functions.
    static inline bridge::Page* s_page = nullptr;
    static inline int s_calls = 0;
};

INSTANTIATE_TEST_SUITE_P(Engines, BridgeClasses, testing::Values(EngineKind::CApi, EngineKind::GObject),
                         nameOf);

TEST_P(BridgeClasses, WithoutEntriesAnObjectIsThePages) {
    give("bare");
    EXPECT_EQ(script("typeof bare"), "object");
    EXPECT_EQ(script("[bare.there, 'there' in bare]"), ",false");
    EXPECT_EQ(script("bare.there = 1; [bare.there, Object.keys(bare)]"), "1,there");
    EXPECT_EQ(script("delete bare.there; typeof bare.there"), "undefined");
}

TEST_P(BridgeClasses, APropertyMayBeNeitherReadNorWrittenNorRemoved) {
    s_class.hasProperty = isThere;
    give("locked");
    EXPECT_EQ(script("[typeof locked.there, 'there' in locked]"), "undefined,true");
    EXPECT_EQ(script("locked.there = 1; typeof locked.there"), "undefined");
    EXPECT_EQ(script("delete locked.there; 'there' in locked"), "true");
}

TEST_P(BridgeClasses, WhatAPropertyThatCannotBeReadHasLeftIsNoValue) {
    s_class.hasProperty = isThere;
    s_class.getProperty = [](NPObject*, NPIdentifier, NPVariant* result) {
        *result = doubleVariant(7);
        return false;
    };
    give("object");
    EXPECT_EQ(script("typeof object.there"), "undefined");
}

TEST_P(BridgeClasses, OlderClassesHaveFewerEntries) {
    s_class.enumerate = [](NPObject*, NPIdentifier** names, uint32_t* count) {
        *names = static_cast<NPIdentifier*>(browserFunctions()->memalloc(sizeof(NPIdentifier)));
        (*names)[0] = browserFunctions()->getstringidentifier("there");
        *count = 1;
        return true;
    };
    s_class.hasProperty = isThere;
    s_class.invokeDefault = [](NPObject*, const NPVariant*, uint32_t, NPVariant*) { return true; };
    s_class.construct = [](NPObject*, const NPVariant*, uint32_t, NPVariant* result) {
        *result = doubleVariant(7);
        return true;
    };
    for (const uint32_t version : {1U, 2U, 3U}) {
        s_class.structVersion = version;
        NPObject* const object = give("object");
        EXPECT_EQ(script("var names = ''; for (var name in object) { names += name; } names"),
                  version < 2 ? "" : "there");
        OwnedVariant result;
        EXPECT_EQ(PluginObject::of(object).construct(Arguments(0), &result), version >= 3);
    }
}

TEST_P(BridgeClasses, AMethodMayNotBeCalledAndMayThrow) {
    const OwnedVariant functions = evaluated("var warnings = 0; ({ warn: function () { warnings++; } })");
    page->attachScript(objectOf(functions.get()));
    s_class.hasMethod = isThere;
    give("object");
    EXPECT_EQ(script("object.there()"), "threw Error calling method on NPObject.");
    EXPECT_EQ(script("warnings"), "1");
    s_class.invoke = [](NPObject* object, NPIdentifier, const NPVariant*, uint32_t, NPVariant*) {
        browserFunctions()->setexception(object, "its text");
        return false;
    };
    EXPECT_EQ(script("object.there()"), "threw its text");
    EXPECT_EQ(script("warnings"), "1"); // the exception says which call it was
}

TEST_P(BridgeClasses, OnlyNamesOfTheObjectAreRemovedFromIt) {
    s_class.hasProperty = isThere;
    s_class.removeProperty = [](NPObject*, NPIdentifier) { return ++s_calls > 0; };
    give("object");
    script("delete object.missing");
    EXPECT_EQ(s_calls, 0);
    script("delete object.there");
    EXPECT_EQ(s_calls, 1);
}

TEST_P(BridgeClasses, ACallMayEndItsInstanceAndFail) {
    s_class.hasMethod = isThere;
    s_class.invoke = [](NPObject*, NPIdentifier, const NPVariant*, uint32_t, NPVariant*) {
        s_page->endInstance(1); // the first one
        return false;
    };
    give("last");
    EXPECT_EQ(script("last.there()"), "threw Error calling method on NPObject.");
    EXPECT_EQ(script("last.there()"), std::string("threw ") + PluginObject::kEndedText);
}

TEST_P(BridgeClasses, ReadingAPropertyMayCloseThePagesEngine) {
    s_class.hasProperty = isThere;
    s_class.getProperty = closeEngine;
    NPObject* const object = give("plugin");
    EXPECT_EQ(scriptOfAnotherFrame("typeof plugin.there"), "undefined");
    EXPECT_EQ(s_calls, 1);
    EXPECT_EQ(PluginObject::of(object).engine(), &page->engine());
    EXPECT_EQ(page->engine().globalObject(), nullptr);
}

TEST_P(BridgeClasses, ScriptThatThePluginCallsMayCloseThePagesEngine) {
    s_class.hasProperty = isThere;
    s_class.getProperty = closeEngine;
    give("closing");
    const OwnedVariant object =
        evaluated("({ get method() { closing.there; return function () { closing.there; }; } })");
    OwnedVariant result(boolVariant(true));
    EXPECT_FALSE(browser.invoke(self, objectOf(object.get()), id("method"), nullptr, 0, &result));
    EXPECT_EQ(result.get().type, NPVariantType_Void);
    EXPECT_EQ(s_calls, 1);
}

TEST_P(BridgeClasses, AMethodOfAClosedEngineDoesNothing) {
    EXPECT_EQ(scriptOfAnotherFrame("var echo = plugin.echo; echo.call(plugin, 4)"), "4");
    page->engine().close();
    const std::string ended = std::string("threw ") + PluginObject::kEndedText;
    EXPECT_EQ(scriptOfAnotherFrame("echo.call(plugin, 4)"), ended);
    EXPECT_EQ(scriptOfAnotherFrame("echo.call(plugin, {})"), ended);
}

TEST_P(BridgeClasses, AClosedEngineDoesNothing) {
    const OwnedVariant function = evaluated("(function () { return 1; })");
    const OwnedVariant object = evaluated("({ a: 1, f: function () { return 1; } })");
    NPObject* const target = objectOf(object.get());
    NPObject* const called = objectOf(function.get());
    page->engine().close();
    NPString program = {"1", 1};
    NPIdentifier* names = nullptr;
    uint32_t count = 1;
    const std::function<bool(NPVariant*)> operations[] = {
        [&](NPVariant* result) { return target->_class->invoke(target, id("f"), nullptr, 0, result); },
        [&](NPVariant* result) { return called->_class->invokeDefault(called, nullptr, 0, result); },
        [&](NPVariant* result) { return called->_class->construct(called, nullptr, 0, result); },
        [&](NPVariant* result) { return browser.evaluate(self, target, &program, result); },
        [&](NPVariant* result) { return target->_class->getProperty(target, id("a"), result); },
    };
    for (const auto& operation : operations) {
        NPVariant result = boolVariant(true);
        EXPECT_FALSE(operation(&result)) << &operation - operations;
        EXPECT_EQ(result.type, NPVariantType_Void) << &operation - operations;
    }
    EXPECT_FALSE(browser.setproperty(self, target, id("a"), &object.get()));
    EXPECT_FALSE(browser.hasproperty(self, target, id("a")));
    EXPECT_FALSE(browser.hasmethod(self, target, id("f")));
    EXPECT_FALSE(browser.removeproperty(self, target, id("a")));
    names = reinterpret_cast<NPIdentifier*>(1);
    EXPECT_FALSE(target->_class->enumerate(target, &names, &count));
    EXPECT_EQ(names, nullptr);
    EXPECT_EQ(count, 0U);
}

TEST_P(BridgeClasses, OnlyTheCurrentScriptObjectIsReportedAsCollected) {
    NPObject* const object = browser.retainobject(give("object"));
    const uint32_t references = object->referenceCount;
    const uint64_t serial = PluginObject::of(object).wrapper()->serial();
    PluginObject::scriptObjectCollected(object, serial);
    EXPECT_EQ(object->referenceCount, references);
    runMainLoop();
    EXPECT_EQ(object->referenceCount, references - 1);
    give("object", browser.retainobject(object)); // has another script object now
    EXPECT_EQ(object->referenceCount, references);
    PluginObject::scriptObjectCollected(object, serial);
    runMainLoop();
    EXPECT_EQ(object->referenceCount, references);
    browser.releaseobject(object);
}

TEST_P(BridgeClasses, PlacesThatDoNotFitAreLimited) {
    give("host", createHostObject(*page, self));
    const std::string place = "host.place(" + std::to_string(instance) + ", ";
    script(place + "-1e12, 1e12, NaN, -5, -1, 1e12, 7, 8)");
    EXPECT_EQ(script("plugin.place"), "-1073741824 1073741823 0 0");
    EXPECT_EQ(script("plugin.clip"), "0 65535 7 8");
    script(place + "1, 'two', true)");
    EXPECT_EQ(script("plugin.place"), "1 0 0 0");
}

} // namespace
