// The fixture of tests about objects that other objects hand out: makes a wrapper as its owner does, gives it
// to the page, and checks what all script tables have in common.
#ifndef TELIX_TESTS_SUPPORT_SUBOBJECTTEST_H
#define TELIX_TESTS_SUPPORT_SUBOBJECTTEST_H

#include <cstdlib>
#include <cstring>
#include <initializer_list>
#include <string>
#include <vector>

#include "common/ScriptReferences.h"
#include "tests/support/BorderTest.h"

class SubObjectTest : public BorderTest {
protected:
    // A new wrapper whose only reference is the page's; `fill(model)` completes it first.
    template <class Wrapper, class Fill>
    ObjectRef make(Fill fill) {
        NPObject* object = createScriptObject<Wrapper>(host.npp());
        fill(*wrapperOf<Wrapper>(object)->impl());
        return ObjectRef::adopt(object);
    }
    template <class Wrapper>
    ObjectRef make() {
        return make<Wrapper>([](auto&) {});
    }

    template <class Wrapper>
    auto& modelOf(const ObjectRef& object) {
        return *wrapperOf<Wrapper>(object.object())->impl();
    }

    // The names that wrappers of the class ask the browser for, in order.
    template <class Wrapper>
    std::vector<std::string> namesOf() {
        static const std::string entry = "NPN_GetStringIdentifier ";
        log.clear();
        make<Wrapper>();
        std::vector<std::string> names;
        for (const std::string& call : log.startingWith(entry)) {
            names.push_back(call.substr(entry.size() + 1, call.size() - entry.size() - 2)); // without quotes
        }
        return names;
    }

    // What script may write somewhere: one value of each type.
    std::vector<Value> valuesOfEveryType() {
        return {undefined, nullptr, true, 1, 1.5, "text", browser.scriptObject("value")};
    }

    // Properties that refuse every write, and every call.
    void expectReadOnly(const ObjectRef& object, std::initializer_list<const char*> names) {
        for (const char* name : names) {
            SCOPED_TRACE(name);
            EXPECT_TRUE(object.hasProperty(name));
            EXPECT_FALSE(object.hasMethod(name));
            for (const Value& value : valuesOfEveryType()) {
                EXPECT_FALSE(object.set(name, value).succeeded) << value;
            }
            EXPECT_FALSE(object.call(name).succeeded);
        }
    }

    // Methods that can't be read or written as properties.
    void expectMethods(const ObjectRef& object, std::initializer_list<const char*> names) {
        for (const char* name : names) {
            SCOPED_TRACE(name);
            EXPECT_TRUE(object.hasMethod(name));
            EXPECT_FALSE(object.hasProperty(name));
            EXPECT_FALSE(object.get(name).succeeded);
            for (const Value& value : valuesOfEveryType()) {
                EXPECT_FALSE(object.set(name, value).succeeded) << value;
            }
        }
    }

    // What no object of ours offers.
    void expectNothingElse(const ObjectRef& object) {
        EXPECT_FALSE(object.hasProperty("unknown"));
        EXPECT_FALSE(object.hasMethod("unknown"));
        EXPECT_FALSE(object.get("unknown").succeeded);
        EXPECT_FALSE(object.set("unknown", 1).succeeded);
        EXPECT_FALSE(object.call("unknown").succeeded);
        EXPECT_FALSE(object.callDefault().succeeded);
        EXPECT_FALSE(object.construct().succeeded);
        EXPECT_FALSE(object.remove("unknown"));
        EXPECT_FALSE(object.enumerate());
    }

    // A text as the platform hands it out.
    static char* platformText(const std::string& text) {
        auto* block = static_cast<char*>(std::malloc(text.size() + 1));
        std::memcpy(block, text.c_str(), text.size() + 1);
        return block;
    }

    // An instance that asks the platform nothing by itself.
    EmbeddedObject host = browser.embed("application/oipfparentalcontrolmanager");
};

#endif
