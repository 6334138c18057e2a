// Objects and functions of the page.
#include "tests/support/PageObjects.h"

#include <gtest/gtest.h>

#include "tests/support/ScriptedBrowser.h"

namespace {

Values argumentsOf(const NPVariant* args, uint32_t count) {
    Values values;
    for (uint32_t i = 0; i < count; ++i) {
        values.push_back(Value::copyOf(args[i]));
    }
    return values;
}

bool deliver(const std::optional<Value>& value, NPVariant* result) {
    Value().giveTo(*result);
    if (!value) {
        return false;
    }
    value->giveTo(*result);
    return true;
}

PageObject& pageObject(NPObject* object) {
    return static_cast<PageObject&>(*object);
}

bool hasMethod(NPObject* object, NPIdentifier name) {
    return pageObject(object).methods.count(ScriptedBrowser::textOf(name)) > 0;
}

bool hasProperty(NPObject* object, NPIdentifier name) {
    return pageObject(object).properties.count(ScriptedBrowser::textOf(name)) > 0;
}

bool getProperty(NPObject* object, NPIdentifier name, NPVariant* result) {
    PageObject& page = pageObject(object);
    const std::string key = ScriptedBrowser::textOf(name);
    if (page.refused.count(key) > 0) {
        return deliver(std::nullopt, result);
    }
    const auto property = page.properties.find(key);
    return deliver(property == page.properties.end() ? Value() : property->second, result);
}

bool setProperty(NPObject* object, NPIdentifier name, const NPVariant* value) {
    PageObject& page = pageObject(object);
    const std::string key = ScriptedBrowser::textOf(name);
    if (page.refused.count(key) > 0) {
        return false;
    }
    page.properties[key] = Value::copyOf(*value);
    return true;
}

bool removeProperty(NPObject* object, NPIdentifier name) {
    return pageObject(object).properties.erase(ScriptedBrowser::textOf(name)) > 0;
}

bool invokeDefault(NPObject* object, const NPVariant* args, uint32_t argCount, NPVariant* result) {
    PageObject& page = pageObject(object);
    const Values arguments = argumentsOf(args, argCount);
    page.calls.push_back(arguments);
    const ScriptBody body = page.body; // the body may give the function another one
    return deliver(body ? body(arguments) : Value(), result);
}

bool invoke(NPObject* object, NPIdentifier name, const NPVariant* args, uint32_t argCount,
            NPVariant* result) {
    PageObject& page = pageObject(object);
    const std::string key = ScriptedBrowser::textOf(name);
    const auto method = page.methods.find(key);
    if (method == page.methods.end() || page.refused.count(key) > 0) {
        return deliver(std::nullopt, result);
    }
    const Values arguments = argumentsOf(args, argCount);
    page.methodCalls[key].push_back(arguments);
    const ScriptBody body = method->second;
    return deliver(body(arguments), result);
}

bool enumerate(NPObject* object, NPIdentifier** names, uint32_t* count) {
    const PageObject& page = pageObject(object);
    *count = static_cast<uint32_t>(page.properties.size());
    *names = static_cast<NPIdentifier*>(ScriptedBrowser::current().newBlock(*count * sizeof(NPIdentifier)));
    NPIdentifier* next = *names;
    for (const auto& property : page.properties) {
        *next++ = ScriptedBrowser::identifier(property.first);
    }
    return true;
}

} // namespace

PageObject::PageObject(std::string objectName) : NPObject{pageClass(), 1}, name(std::move(objectName)) {}

void PageObject::forget() {
    // What is dropped may lead back here.
    const auto oldProperties = std::move(properties);
    const auto oldMethods = std::move(methods);
    const auto oldMethodCalls = std::move(methodCalls);
    const auto oldBody = std::move(body);
    const auto oldCalls = std::move(calls);
    properties.clear();
    methods.clear();
    methodCalls.clear();
    body = nullptr;
    calls.clear();
}

NPClass* PageObject::pageClass() {
    static NPClass record = {
        NP_CLASS_STRUCT_VERSION, nullptr,       nullptr,       nullptr,       ::hasMethod,      ::invoke,
        ::invokeDefault,         ::hasProperty, ::getProperty, ::setProperty, ::removeProperty, ::enumerate,
        ::invokeDefault};
    return &record;
}

PageObject* PageObject::from(NPObject* object) {
    return object && object->_class == pageClass() ? static_cast<PageObject*>(object) : nullptr;
}

ScriptObject ScriptObject::make(const std::string& name) {
    return ScriptObject(ScriptedBrowser::current().newPageObject(name));
}

void ScriptObject::method(const std::string& name, ScriptBody body) const {
    pageObject(object()).methods[name] = std::move(body);
}

std::vector<Values> ScriptObject::calls(const std::string& method) const {
    const auto& calls = pageObject(object()).methodCalls;
    const auto found = calls.find(method);
    return found == calls.end() ? std::vector<Values>() : found->second;
}

void ScriptObject::refuse(const std::string& name) const {
    pageObject(object()).refused.insert(name);
}

ScriptFunction ScriptFunction::make(const std::string& name) {
    return ScriptFunction(ScriptedBrowser::current().newPageObject(name));
}

std::vector<Values> ScriptFunction::calls() const {
    return pageObject(object()).calls;
}

Values ScriptFunction::last() const {
    const std::vector<Values>& calls = pageObject(object()).calls;
    if (calls.empty()) {
        ADD_FAILURE() << name() << " was never called.";
        return {};
    }
    return calls.back();
}

void ScriptFunction::does(ScriptBody body) const {
    pageObject(object()).body = std::move(body);
}
