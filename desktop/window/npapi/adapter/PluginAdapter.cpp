// A plug-in in front of the television's plug-in. Each call goes on to that one, with five additions, of
// which a strict adapter has the last three only.
//
// An element without an id gets one before its instance is made, because the plug-in finds elements by their
// ids.
//
// Where the plug-in hands out a list, script gets the object that scripts/list.js makes of it. For that the
// adapter replaces functions in the plug-in's class records. The records stay where they are, because the
// plug-in knows its objects by them.
//
// A script of the plug-in that fails, and a method that refuses its arguments, are reported.
//
// NPP_SetWindow goes on in a task of its own, because the engine calls it while it lays out the page. The
// plug-in asks script for the place of the element, for which the engine would lay out again, and crash.
//
// NP_Shutdown does not go on while there are instances. The engine counts its views of plug-ins, and counts
// one down that it has never counted up if the view goes before it has an instance.
//
// Main thread. The library is never unloaded, because objects of the plug-in may outlive it in the engine.
#include "desktop/window/npapi/adapter/PluginAdapter.h"

#include <dlfcn.h>
#include <strings.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include "desktop/window/shared/ElementId.h"
#include "desktop/window/shared/PageScript.h"
#include "npapi/npfunctions.h"

#define EXPORT extern "C" __attribute__((visibility("default")))

namespace desktop {

namespace {

// The entry points of the plug-in.
struct EntryPoints {
    NPError (*initialize)(NPNetscapeFuncs*, NPPluginFuncs*);
    NPError (*shutdown)();
    NPError (*getValue)(void*, NPPVariable, void*);
    const char* (*mimeDescription)();
};

EntryPoints plugin;
PluginAdapterSettings settings;
NPPluginFuncs functionsOfPlugin;
bool isInitialized;        // between NP_Initialize and NP_Shutdown of the plug-in
NPNetscapeFuncs browser;   // what the engine has
NPNetscapeFuncs ofAdapter; // what the plug-in gets
bool hasException;         // whether the plug-in has told script why the last method failed

// The functions that the records of the plug-in's classes had.
std::map<NPClass*, NPClass>& originals() {
    static std::map<NPClass*, NPClass> classes;
    return classes;
}

// The instance of each object of the plug-in; null if it has ended.
std::map<NPObject*, NPP>& owners() {
    static std::map<NPObject*, NPP> objects;
    return objects;
}

// The function of scripts/list.js in the window of each instance that has not ended, with a reference; null
// until it is needed.
std::map<NPP, NPObject*>& listFunctions() {
    static std::map<NPP, NPObject*> instances;
    return instances;
}

// The window of each instance that the plug-in has not been told of yet.
std::map<NPP, NPWindow>& heldWindows() {
    static std::map<NPP, NPWindow> windows;
    return windows;
}

NPVariant variantOf(NPObject* object) {
    NPVariant variant{};
    variant.type = NPVariantType_Object;
    variant.value.objectValue = object;
    return variant;
}

NPVariant variantOf(const std::string& text) {
    NPVariant variant{};
    variant.type = NPVariantType_String;
    variant.value.stringValue = {text.c_str(), static_cast<uint32_t>(text.size())};
    return variant;
}

// The object that an expression gives in the window of the instance, with a reference; null without one.
NPObject* evaluate(NPP instance, const std::string& expression) {
    NPObject* window = nullptr;
    if (browser.getvalue(instance, NPNVWindowNPObject, &window) != NPERR_NO_ERROR || !window) {
        return nullptr;
    }
    NPString script = {expression.c_str(), static_cast<uint32_t>(expression.size())};
    NPVariant result{};
    const bool isDone = browser.evaluate(instance, window, &script, &result);
    browser.releaseobject(window);
    if (isDone && result.type == NPVariantType_Object) {
        return result.value.objectValue;
    }
    if (isDone) {
        browser.releasevariantvalue(&result);
    }
    return nullptr;
}

// ---- Warnings

void report(NPP instance, const char* warning, const std::string& subject) {
    NPObject* window = nullptr;
    if (browser.getvalue(instance, NPNVWindowNPObject, &window) != NPERR_NO_ERROR || !window) {
        return;
    }
    constexpr char kPage[] = "top.location.href";
    NPString script = {kPage, sizeof(kPage) - 1};
    NPVariant page{};
    if (browser.evaluate(instance, window, &script, &page)) {
        if (page.type == NPVariantType_String) {
            const NPString& url = page.value.stringValue;
            settings.report(std::string(url.UTF8Characters, url.UTF8Length).c_str(), warning, subject.c_str(),
                            settings.data);
        }
        browser.releasevariantvalue(&page);
    }
    browser.releaseobject(window);
}

// The engine takes a script that throws for one that yields nothing. One that dispatches an event yields
// whether it has not been cancelled.
bool hasFailed(const std::string& source, const NPVariant& result) {
    return source.find("dispatchEvent(") != std::string::npos && result.type != NPVariantType_Bool;
}

bool evaluateOfPlugin(NPP instance, NPObject* object, NPString* script, NPVariant* result) {
    const std::string source(script->UTF8Characters, script->UTF8Length);
    const bool isDone = browser.evaluate(instance, object, script, result);
    if (!isDone || hasFailed(source, *result)) {
        report(instance, "failed-script", source);
    }
    return isDone;
}

void setException(NPObject* object, const char* message) {
    hasException = true;
    browser.setexception(object, message);
}

// As the author of a page would say it.
const char* typeNameOf(const NPVariant& value) {
    switch (value.type) {
    case NPVariantType_Null:
        return "null";
    case NPVariantType_Bool:
        return "boolean";
    case NPVariantType_Int32:
    case NPVariantType_Double:
        return "number";
    case NPVariantType_String:
        return "string";
    case NPVariantType_Object:
        return "object";
    default:
        return "undefined";
    }
}

// The exception that script gets does not say which call it was, and script may catch it.
void reportRefusal(NPP instance, NPIdentifier method, const NPVariant* args, uint32_t argCount) {
    char* name = browser.utf8fromidentifier(method);
    std::string call = std::string(name ? name : "") + '(';
    for (uint32_t i = 0; i < argCount; ++i) {
        call += (i > 0 ? ", " : "") + std::string(typeNameOf(args[i]));
    }
    browser.memfree(name);
    report(instance, "refused-call", call + ')');
}

// ---- Lists

// An object that has a first element by its index. The plug-in takes indexes as names, and an empty list
// needs no help.
bool isList(NPObject* object) {
    NPIdentifier item = browser.getstringidentifier("item");
    NPIdentifier first = browser.getstringidentifier("0");
    return owners().count(object) > 0 && object->_class->hasMethod(object, item) &&
           object->_class->hasProperty(object, first);
}

// The function of scripts/list.js for the instance; null if it has ended.
NPObject* listFunction(NPP instance) {
    const auto found = listFunctions().find(instance);
    if (found == listFunctions().end()) {
        return nullptr;
    }
    if (!found->second) {
        found->second = evaluate(instance, pageScriptCall("list", {}));
    }
    return found->second;
}

// Replaces a result that is a list by the object that script gets.
void adaptResult(NPP instance, NPVariant& result) {
    NPObject* function =
        !settings.isStrict && result.type == NPVariantType_Object && isList(result.value.objectValue)
            ? listFunction(instance)
            : nullptr;
    if (!function) {
        return;
    }
    NPVariant view{};
    browser.retainobject(function); // script that runs meanwhile may end the instance
    if (browser.invokeDefault(instance, function, &result, 1, &view)) {
        browser.releasevariantvalue(&result);
        result = view;
    }
    browser.releaseobject(function);
}

// The object, its class record and its instance may be gone after a call.
bool invoke(NPObject* object, NPIdentifier name, const NPVariant* args, uint32_t argCount,
            NPVariant* result) {
    const auto original = originals()[object->_class].invoke;
    NPP instance = owners()[object];
    hasException = false;
    const bool isDone = original(object, name, args, argCount, result);
    if (isDone) {
        adaptResult(instance, *result);
    } else if (instance && !hasException) {
        reportRefusal(instance, name, args, argCount);
    }
    return isDone;
}

bool getProperty(NPObject* object, NPIdentifier name, NPVariant* result) {
    const auto original = originals()[object->_class].getProperty;
    NPP instance = owners()[object];
    const bool isDone = original(object, name, result);
    if (isDone) {
        adaptResult(instance, *result);
    }
    return isDone;
}

void deallocate(NPObject* object) {
    owners().erase(object);
    const auto original = originals()[object->_class].deallocate;
    if (original) {
        original(object);
    } else {
        std::free(object); // as the browser does
    }
}

NPObject* createObject(NPP instance, NPClass* record) {
    if (originals().emplace(record, *record).second) {
        record->deallocate = deallocate;
        record->invoke = record->invoke ? invoke : nullptr;
        record->getProperty = record->getProperty ? getProperty : nullptr;
    }
    NPObject* object = browser.createobject(instance, record);
    if (object) {
        owners()[object] = instance;
    }
    return object;
}

// ---- Instances

// Gives the element of the instance an id; false if that is not possible. Asks no property of the element,
// because the engine would ask the instance.
bool setId(NPP instance, const std::string& id) {
    NPObject* element = nullptr;
    if (browser.getvalue(instance, NPNVPluginElementNPObject, &element) != NPERR_NO_ERROR || !element) {
        return false;
    }
    NPObject* function = evaluate(instance, "(function (element, id) {"
                                            " Element.prototype.setAttribute.call(element, 'id', id); })");
    const NPVariant arguments[] = {variantOf(element), variantOf(id)};
    NPVariant result{};
    const bool isDone = function && browser.invokeDefault(instance, function, arguments, 2, &result);
    if (isDone) {
        browser.releasevariantvalue(&result);
    }
    if (function) {
        browser.releaseobject(function);
    }
    browser.releaseobject(element);
    return isDone;
}

void forget(NPP instance) {
    // A new instance may have the same address.
    for (auto& owner : owners()) {
        owner.second = owner.second == instance ? nullptr : owner.second;
    }
    const auto found = listFunctions().find(instance);
    if (found != listFunctions().end()) {
        if (found->second) {
            browser.releaseobject(found->second);
        }
        listFunctions().erase(found);
    }
    heldWindows().erase(instance);
}

NPError newInstance(NPMIMEType type, NPP instance, uint16_t mode, int16_t argc, char* argn[], char* argv[],
                    NPSavedData* saved) {
    static unsigned lastId = 0;
    listFunctions()[instance] = nullptr;
    std::vector<char*> names(argn, argn + argc);
    std::vector<char*> values(argv, argv + argc);
    char idName[] = "id";
    std::string id = kElementIdPrefix + std::to_string(lastId + 1);
    const bool hasId = std::any_of(names.begin(), names.end(),
                                   [&idName](const char* name) { return strcasecmp(name, idName) == 0; });
    if (!settings.isStrict && !hasId && setId(instance, id)) {
        ++lastId;
        names.insert(names.begin(), idName);
        values.insert(values.begin(), id.data());
    }
    const NPError error = functionsOfPlugin.newp(type, instance, mode, static_cast<int16_t>(names.size()),
                                                 names.data(), values.data(), saved);
    if (error != NPERR_NO_ERROR) {
        forget(instance);
    }
    return error;
}

NPError destroyInstance(NPP instance, NPSavedData** saved) {
    forget(instance);
    return functionsOfPlugin.destroy(instance, saved);
}

// Does nothing if the plug-in has been told already, or the instance has ended.
void giveHeldWindow(void* data) {
    auto* instance = static_cast<NPP>(data);
    auto held = heldWindows().extract(instance);
    if (!held.empty()) {
        functionsOfPlugin.setwindow(instance, &held.mapped());
    }
}

NPError setWindow(NPP instance, NPWindow* window) {
    if (!window) {
        return functionsOfPlugin.setwindow(instance, window);
    }
    heldWindows()[instance] = *window;
    browser.pluginthreadasynccall(instance, giveHeldWindow, instance);
    return NPERR_NO_ERROR;
}

template <class Function>
bool find(void* library, const char* name, Function& function) {
    function = reinterpret_cast<Function>(dlsym(library, name));
    return function != nullptr;
}

} // namespace

} // namespace desktop

using namespace desktop;

EXPORT bool telix_adapt_plugin(const PluginAdapterSettings& given) {
    settings = given;
    void* library = dlopen(settings.file, RTLD_LAZY | RTLD_LOCAL);
    return library && find(library, "NP_Initialize", plugin.initialize) &&
           find(library, "NP_Shutdown", plugin.shutdown) && find(library, "NP_GetValue", plugin.getValue) &&
           find(library, "NP_GetMIMEDescription", plugin.mimeDescription);
}

// NOLINTBEGIN(readability-identifier-naming): the names are those of NPAPI.

EXPORT NPError NP_Initialize(NPNetscapeFuncs* browserFuncs, NPPluginFuncs* pluginFuncs) {
    if (!isInitialized) {
        std::memcpy(&browser, browserFuncs, std::min<std::size_t>(sizeof(browser), browserFuncs->size));
        ofAdapter = browser;
        ofAdapter.createobject = createObject;
        ofAdapter.evaluate = evaluateOfPlugin;
        ofAdapter.setexception = setException;
        functionsOfPlugin.size = sizeof(functionsOfPlugin);
        const NPError error = plugin.initialize(&ofAdapter, &functionsOfPlugin);
        if (error != NPERR_NO_ERROR) {
            return error;
        }
        isInitialized = true;
    }
    std::memcpy(pluginFuncs, &functionsOfPlugin,
                std::min<std::size_t>(sizeof(functionsOfPlugin), pluginFuncs->size));
    pluginFuncs->newp = newInstance;
    pluginFuncs->destroy = destroyInstance;
    pluginFuncs->setwindow = setWindow;
    return NPERR_NO_ERROR;
}

EXPORT NPError NP_Shutdown() {
    if (!listFunctions().empty()) {
        return NPERR_NO_ERROR;
    }
    isInitialized = false;
    return plugin.shutdown();
}

EXPORT NPError NP_GetValue(void* future, NPPVariable variable, void* value) {
    return plugin.getValue(future, variable, value);
}

EXPORT const char* NP_GetMIMEDescription() {
    return plugin.mimeDescription();
}

// NOLINTEND(readability-identifier-naming)
