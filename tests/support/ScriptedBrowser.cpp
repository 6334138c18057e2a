// The browser of the unit tests: function table, accounts, page and scripts.
#include "tests/support/ScriptedBrowser.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <cxxabi.h>
#include <sstream>
#include <typeinfo>
#include <utility>

#include <glib.h>
#include <gtest/gtest.h>

#include "common/JSPluginBase.h"
#include "common/PluginExports.h"

namespace {

ScriptedBrowser* s_current = nullptr;

// Objects and blocks that outlived their browser because the plug-in never released them: still reachable for
// the leak checker, since the accounts have reported them already.
std::vector<const void*>& leftBehind() {
    static auto* addresses = new std::vector<const void*>;
    return *addresses;
}

struct Identifier {
    bool isString;
    std::string text;
    int32_t value;
};

// Never destroyed: identifiers are for good.
struct IdentifierStore {
    std::deque<Identifier> all;
    std::map<std::string, Identifier*> byText;
    std::map<int32_t, Identifier*> byValue;
};

IdentifierStore& identifiers() {
    static auto* store = new IdentifierStore;
    return *store;
}

// What a page sees of the class of an object: the name of the wrapper class, if it is one.
std::string wrapperNameOf(NPObject* object) {
    if (object->_class->deallocate != JSPluginBase::_Deallocate) {
        return "object";
    }
    const auto& wrapper = *static_cast<JSPluginBase*>(object);
    int status = 0;
    char* name = abi::__cxa_demangle(typeid(wrapper).name(), nullptr, nullptr, &status);
    const std::string qualified = status == 0 ? name : "object";
    std::free(name);
    const size_t scope = qualified.rfind("::");
    return scope == std::string::npos ? qualified : qualified.substr(scope + 2);
}

std::string quoted(const char* text) {
    return text ? "\"" + std::string(text) + "\"" : "null";
}

// Whether every string literal of the script is closed.
bool literalsAreClosed(const std::string& script) {
    char open = 0;
    for (size_t i = 0; i < script.size(); ++i) {
        const char c = script[i];
        if (open && c == '\\') {
            ++i;
        } else if (open) {
            open = c == open ? 0 : open;
        } else if (c == '"' || c == '\'') {
            open = c;
        }
    }
    return open == 0;
}

// The text between `before` and the next `after`.
std::string between(const std::string& text, const std::string& before, const std::string& after) {
    const size_t start = text.find(before);
    if (start == std::string::npos) {
        return "";
    }
    const size_t first = start + before.size();
    return text.substr(first, text.find(after, first) - first);
}

bool endsWith(const std::string& text, const std::string& end) {
    return text.size() >= end.size() && text.compare(text.size() - end.size(), end.size(), end) == 0;
}

} // namespace

bool operator==(const DomEvent& left, const DomEvent& right) {
    return left.type == right.type && left.elementId == right.elementId && left.bubbles == right.bubbles &&
           left.cancelable == right.cancelable && left.fields == right.fields;
}

std::ostream& operator<<(std::ostream& stream, const DomEvent& event) {
    stream << event.type << " at " << event.elementId << (event.bubbles ? " bubbles" : "")
           << (event.cancelable ? " cancelable" : "");
    for (const auto& field : event.fields) {
        stream << ' ' << field.first << "=\"" << field.second << '"';
    }
    return stream;
}

void EvaluationRule::gives(const Value& value) {
    m_body = [value](const Evaluation&) { return value; };
}

void EvaluationRule::throws() {
    m_body = [](const Evaluation&) { return std::nullopt; };
}

// The entries of the browser's table.
struct BrowserTable {
    static ScriptedBrowser& browser() { return ScriptedBrowser::current(); }
    static std::string name(NPObject* object) { return browser().nameOf(object); }

    static std::string list(const NPVariant* args, uint32_t count) {
        Values values;
        for (uint32_t i = 0; i < count; ++i) {
            values.push_back(Value::copyOf(args[i]));
        }
        return "(" + listOf(values) + ")";
    }

    static NPError getUrl(NPP, const char* url, const char* target) {
        return browser().enter("NPN_GetURL", [&] { return quoted(url) + " " + quoted(target); })
                   ? NPERR_NO_ERROR
                   : NPERR_GENERIC_ERROR;
    }

    static NPError postUrl(NPP, const char* url, const char* target, uint32_t, const char*, NPBool) {
        return browser().enter("NPN_PostURL", [&] { return quoted(url) + " " + quoted(target); })
                   ? NPERR_NO_ERROR
                   : NPERR_GENERIC_ERROR;
    }

    static NPError requestRead(NPStream*, NPByteRange*) {
        browser().enter("NPN_RequestRead");
        return NPERR_STREAM_NOT_SEEKABLE;
    }

    static NPError newStream(NPP, NPMIMEType, const char*, NPStream**) {
        browser().enter("NPN_NewStream");
        return NPERR_GENERIC_ERROR;
    }

    static int32_t write(NPP, NPStream*, int32_t, void*) {
        browser().enter("NPN_Write");
        return -1;
    }

    static NPError destroyStream(NPP npp, NPStream* stream, NPReason reason) {
        if (!browser().enter("NPN_DestroyStream", [&] {
                return quoted(stream ? stream->url : nullptr) + " " + std::to_string(reason);
            })) {
            return NPERR_GENERIC_ERROR;
        }
        if (EmbeddedObject::Record* record = browser().recordOf(npp)) {
            for (BrowserStream& offered : record->streams) {
                if (&offered.m_stream == stream) {
                    offered.m_destroyedByPlugin = true;
                    return NPERR_NO_ERROR;
                }
            }
        }
        return NPERR_INVALID_PARAM;
    }

    static void status(NPP, const char* message) {
        browser().enter("NPN_Status", [&] { return quoted(message); });
    }

    static const char* userAgent(NPP) {
        browser().enter("NPN_UserAgent");
        return "ScriptedBrowser/1.0";
    }

    static void* memAlloc(uint32_t size) {
        return browser().enter("NPN_MemAlloc", [&] { return std::to_string(size); })
                   ? browser().newBlock(size)
                   : nullptr;
    }

    static void memFree(void* block) {
        if (browser().enter("NPN_MemFree")) {
            browser().freeBlock(block);
        }
    }

    static uint32_t memFlush(uint32_t) {
        browser().enter("NPN_MemFlush");
        return 0;
    }

    static void reloadPlugins(NPBool) { browser().enter("NPN_ReloadPlugins"); }

    static void* getJavaEnv() {
        browser().enter("NPN_GetJavaEnv");
        return nullptr;
    }

    static void* getJavaPeer(NPP) {
        browser().enter("NPN_GetJavaPeer");
        return nullptr;
    }

    static NPError getUrlNotify(NPP, const char* url, const char* target, void*) {
        return browser().enter("NPN_GetURLNotify", [&] { return quoted(url) + " " + quoted(target); })
                   ? NPERR_NO_ERROR
                   : NPERR_GENERIC_ERROR;
    }

    static NPError postUrlNotify(NPP, const char* url, const char* target, uint32_t, const char*, NPBool,
                                 void*) {
        return browser().enter("NPN_PostURLNotify", [&] { return quoted(url) + " " + quoted(target); })
                   ? NPERR_NO_ERROR
                   : NPERR_GENERIC_ERROR;
    }

    static NPError getValue(NPP npp, NPNVariable variable, void* value) {
        if (!browser().enter("NPN_GetValue", [&] { return std::to_string(variable); })) {
            return NPERR_GENERIC_ERROR;
        }
        const EmbeddedObject::Record* record = browser().recordOf(npp);
        NPObject* object = nullptr;
        switch (variable) {
        case NPNVWindowNPObject:
            object = browser().m_window.object();
            break;
        case NPNVPluginElementNPObject:
            object = record ? record->element.object() : nullptr;
            break;
        case NPNVjavascriptEnabledBool:
        case NPNVSupportsWindowless:
            *static_cast<NPBool*>(value) = 1;
            return NPERR_NO_ERROR;
        case NPNVisOfflineBool:
        case NPNVSupportsXEmbedBool:
        case NPNVprivateModeBool:
            *static_cast<NPBool*>(value) = 0;
            return NPERR_NO_ERROR;
        default:
            break;
        }
        if (!object) {
            return NPERR_GENERIC_ERROR;
        }
        browser().giveReference(object);
        *static_cast<NPObject**>(value) = object;
        return NPERR_NO_ERROR;
    }

    static NPError setValue(NPP, NPPVariable variable, void* value) {
        return browser().enter("NPN_SetValue",
                               [&] {
                                   return std::to_string(variable) + " " +
                                          std::to_string(reinterpret_cast<uintptr_t>(value));
                               })
                   ? NPERR_NO_ERROR
                   : NPERR_GENERIC_ERROR;
    }

    static void invalidateRect(NPP, NPRect* rect) {
        browser().enter("NPN_InvalidateRect", [&] {
            std::ostringstream text;
            text << "top " << rect->top << " left " << rect->left << " bottom " << rect->bottom << " right "
                 << rect->right;
            return text.str();
        });
    }

    static void invalidateRegion(NPP, NPRegion) { browser().enter("NPN_InvalidateRegion"); }
    static void forceRedraw(NPP) { browser().enter("NPN_ForceRedraw"); }

    static NPIdentifier getStringIdentifier(const char* text) {
        return browser().enter("NPN_GetStringIdentifier", [&] { return quoted(text); })
                   ? ScriptedBrowser::identifier(text)
                   : nullptr;
    }

    static void getStringIdentifiers(const char** names, int32_t count, NPIdentifier* identifiers) {
        const bool allowed = browser().enter("NPN_GetStringIdentifiers");
        for (int32_t i = 0; i < count; ++i) {
            identifiers[i] = allowed && names[i] ? ScriptedBrowser::identifier(names[i]) : nullptr;
        }
    }

    static NPIdentifier getIntIdentifier(int32_t value) {
        return browser().enter("NPN_GetIntIdentifier", [&] { return std::to_string(value); })
                   ? ScriptedBrowser::identifier(value)
                   : nullptr;
    }

    static bool identifierIsString(NPIdentifier identifier) {
        return browser().enter("NPN_IdentifierIsString") && static_cast<Identifier*>(identifier)->isString;
    }

    // Null for an integer. The block is the plug-in's, to be freed with free().
    static char* utf8FromIdentifier(NPIdentifier identifier) {
        const auto& known = *static_cast<Identifier*>(identifier);
        const bool allowed =
            browser().enter("NPN_UTF8FromIdentifier", [&] { return ScriptedBrowser::textOf(identifier); });
        return allowed && known.isString ? strdup(known.text.c_str()) : nullptr;
    }

    static int32_t intFromIdentifier(NPIdentifier identifier) {
        return browser().enter("NPN_IntFromIdentifier") ? static_cast<Identifier*>(identifier)->value : 0;
    }

    static NPObject* createObject(NPP npp, NPClass* objectClass) {
        const size_t place = browser().m_log.size();
        if (!browser().enter("NPN_CreateObject")) {
            return nullptr;
        }
        NPObject* object = objectClass->allocate ? objectClass->allocate(npp, objectClass)
                                                 : static_cast<NPObject*>(std::malloc(sizeof(NPObject)));
        if (!object) {
            return nullptr;
        }
        object->_class = objectClass;
        object->referenceCount = 1;
        browser().account(object, wrapperNameOf(object));
        browser().m_log.amend(place, " " + name(object));
        return object;
    }

    // Null passes, as in real browsers.
    static NPObject* retainObject(NPObject* object) {
        if (!browser().enter("NPN_RetainObject", [&] { return name(object); })) {
            return nullptr;
        }
        if (object && browser().isLive(object, "NPN_RetainObject")) {
            ++object->referenceCount;
        }
        return object;
    }

    static void releaseObject(NPObject* object) {
        if (browser().enter("NPN_ReleaseObject", [&] { return name(object); })) {
            releaseForPlugin(object);
        }
    }

    static void releaseForPlugin(NPObject* object) {
        if (!object || !browser().isLive(object, "NPN_ReleaseObject")) {
            return;
        }
        if (browser().pluginReferences(object) <= 0) {
            ADD_FAILURE() << "NPN_ReleaseObject: the plug-in holds no reference to " << name(object) << ".";
            return;
        }
        browser().dropReference(object);
    }

    static bool invoke(NPP, NPObject* object, NPIdentifier method, const NPVariant* args, uint32_t argCount,
                       NPVariant* result) {
        Value().giveTo(*result);
        if (!browser().enter("NPN_Invoke", [&] {
                return name(object) + "." + ScriptedBrowser::textOf(method) + list(args, argCount);
            })) {
            return false;
        }
        if (!browser().isLive(object, "NPN_Invoke") || !object->_class->invoke) {
            return false;
        }
        const ObjectRef kept = ObjectRef::share(object);
        browser().enterPage();
        return object->_class->invoke(object, method, args, argCount, result);
    }

    static bool invokeDefault(NPP, NPObject* object, const NPVariant* args, uint32_t argCount,
                              NPVariant* result) {
        Value().giveTo(*result);
        if (!browser().enter("NPN_InvokeDefault", [&] { return name(object) + list(args, argCount); })) {
            return false;
        }
        if (!browser().isLive(object, "NPN_InvokeDefault") || !object->_class->invokeDefault) {
            return false;
        }
        const ObjectRef kept = ObjectRef::share(object);
        browser().enterPage();
        return object->_class->invokeDefault(object, args, argCount, result);
    }

    static bool evaluate(NPP, NPObject* scope, NPString* script, NPVariant* result) {
        Value().giveTo(*result);
        const std::string text(script->UTF8Characters, script->UTF8Length);
        if (!browser().enter("NPN_Evaluate", [&] { return name(scope) + " \"" + text + "\""; })) {
            return false;
        }
        if (!scope || !browser().isLive(scope, "NPN_Evaluate")) {
            return false;
        }
        const ObjectRef kept = ObjectRef::share(scope);
        browser().enterPage();
        return browser().evaluate(scope, text, result);
    }

    static bool getProperty(NPP, NPObject* object, NPIdentifier property, NPVariant* result) {
        Value().giveTo(*result);
        if (!browser().enter("NPN_GetProperty",
                             [&] { return name(object) + "." + ScriptedBrowser::textOf(property); })) {
            return false;
        }
        if (!browser().isLive(object, "NPN_GetProperty") || !object->_class->getProperty) {
            return false;
        }
        const ObjectRef kept = ObjectRef::share(object);
        browser().enterPage();
        return object->_class->getProperty(object, property, result);
    }

    static bool setProperty(NPP, NPObject* object, NPIdentifier property, const NPVariant* value) {
        if (!browser().enter("NPN_SetProperty", [&] {
                return name(object) + "." + ScriptedBrowser::textOf(property) + " = " +
                       listOf({Value::copyOf(*value)});
            })) {
            return false;
        }
        if (!browser().isLive(object, "NPN_SetProperty") || !object->_class->setProperty) {
            return false;
        }
        const ObjectRef kept = ObjectRef::share(object);
        browser().enterPage();
        return object->_class->setProperty(object, property, value);
    }

    static bool removeProperty(NPP, NPObject* object, NPIdentifier property) {
        if (!browser().enter("NPN_RemoveProperty",
                             [&] { return name(object) + "." + ScriptedBrowser::textOf(property); })) {
            return false;
        }
        return browser().isLive(object, "NPN_RemoveProperty") && object->_class->removeProperty &&
               object->_class->removeProperty(object, property);
    }

    static bool hasProperty(NPP, NPObject* object, NPIdentifier property) {
        if (!browser().enter("NPN_HasProperty",
                             [&] { return name(object) + "." + ScriptedBrowser::textOf(property); })) {
            return false;
        }
        return browser().isLive(object, "NPN_HasProperty") && object->_class->hasProperty &&
               object->_class->hasProperty(object, property);
    }

    static bool hasMethod(NPP, NPObject* object, NPIdentifier method) {
        if (!browser().enter("NPN_HasMethod",
                             [&] { return name(object) + "." + ScriptedBrowser::textOf(method); })) {
            return false;
        }
        return browser().isLive(object, "NPN_HasMethod") && object->_class->hasMethod &&
               object->_class->hasMethod(object, method);
    }

    static void releaseVariantValue(NPVariant* variant) {
        if (!browser().enter("NPN_ReleaseVariantValue")) {
            return;
        }
        if (variant->type == NPVariantType_String) {
            browser().freeBlock(const_cast<char*>(variant->value.stringValue.UTF8Characters));
        } else if (variant->type == NPVariantType_Object) {
            releaseForPlugin(variant->value.objectValue);
        }
        Value().giveTo(*variant);
    }

    static void setException(NPObject*, const char* message) {
        browser().enter("NPN_SetException", [&] { return quoted(message); });
    }

    static void pushPopupsEnabledState(NPP, NPBool) { browser().enter("NPN_PushPopupsEnabledState"); }
    static void popPopupsEnabledState(NPP) { browser().enter("NPN_PopPopupsEnabledState"); }

    static bool enumerate(NPP, NPObject* object, NPIdentifier** names, uint32_t* count) {
        return browser().enter("NPN_Enumerate", [&] { return name(object); }) &&
               browser().isLive(object, "NPN_Enumerate") && object->_class->enumerate &&
               object->_class->enumerate(object, names, count);
    }

    // Any thread.
    static void pluginThreadAsyncCall(NPP, void (*function)(void*), void* data) {
        ScriptedBrowser& target = browser();
        target.m_log.add("NPN_PluginThreadAsyncCall");
        const std::lock_guard<std::mutex> guard(target.m_asyncMutex);
        target.m_asyncCalls.push_back({function, data});
    }

    static bool construct(NPP, NPObject* object, const NPVariant* args, uint32_t argCount,
                          NPVariant* result) {
        Value().giveTo(*result);
        return browser().enter("NPN_Construct", [&] { return name(object) + list(args, argCount); }) &&
               browser().isLive(object, "NPN_Construct") && object->_class->construct &&
               object->_class->construct(object, args, argCount, result);
    }

    static NPError getValueForUrl(NPP, NPNURLVariable, const char*, char**, uint32_t*) {
        browser().enter("NPN_GetValueForURL");
        return NPERR_GENERIC_ERROR;
    }

    static NPError setValueForUrl(NPP, NPNURLVariable, const char*, const char*, uint32_t) {
        browser().enter("NPN_SetValueForURL");
        return NPERR_GENERIC_ERROR;
    }

    static NPError getAuthenticationInfo(NPP, const char*, const char*, int32_t, const char*, const char*,
                                         char**, uint32_t*, char**, uint32_t*) {
        browser().enter("NPN_GetAuthenticationInfo");
        return NPERR_GENERIC_ERROR;
    }

    static uint32_t scheduleTimer(NPP, uint32_t, NPBool, void (*)(NPP, uint32_t)) {
        browser().enter("NPN_ScheduleTimer");
        return 0;
    }

    static void unscheduleTimer(NPP, uint32_t) { browser().enter("NPN_UnscheduleTimer"); }

    static NPError popUpContextMenu(NPP, NPMenu*) {
        browser().enter("NPN_PopUpContextMenu");
        return NPERR_GENERIC_ERROR;
    }

    static NPBool convertPoint(NPP, double, double, NPCoordinateSpace, double*, double*, NPCoordinateSpace) {
        browser().enter("NPN_ConvertPoint");
        return 0;
    }

    static NPBool handleEvent(NPP, void*, NPBool handled) {
        browser().enter("NPN_HandleEvent");
        return handled;
    }

    static NPBool unfocusInstance(NPP, NPFocusDirection) {
        browser().enter("NPN_UnfocusInstance");
        return 0;
    }

    static void urlRedirectResponse(NPP, void*, NPBool) { browser().enter("NPN_URLRedirectResponse"); }

    static NPError initAsyncSurface(NPP, NPSize*, NPImageFormat, void*, NPAsyncSurface*) {
        browser().enter("NPN_InitAsyncSurface");
        return NPERR_GENERIC_ERROR;
    }

    static NPError finalizeAsyncSurface(NPP, NPAsyncSurface*) {
        browser().enter("NPN_FinalizeAsyncSurface");
        return NPERR_GENERIC_ERROR;
    }

    static void setCurrentAsyncSurface(NPP, NPAsyncSurface*, NPRect*) {
        browser().enter("NPN_SetCurrentAsyncSurface");
    }

    static NPNetscapeFuncs make() {
        return {sizeof(NPNetscapeFuncs),
                NP_VERSION_MAJOR << 8 | NP_VERSION_MINOR,
                getUrl,
                postUrl,
                requestRead,
                newStream,
                write,
                destroyStream,
                status,
                userAgent,
                memAlloc,
                memFree,
                memFlush,
                reloadPlugins,
                getJavaEnv,
                getJavaPeer,
                getUrlNotify,
                postUrlNotify,
                getValue,
                setValue,
                invalidateRect,
                invalidateRegion,
                forceRedraw,
                getStringIdentifier,
                getStringIdentifiers,
                getIntIdentifier,
                identifierIsString,
                utf8FromIdentifier,
                intFromIdentifier,
                createObject,
                retainObject,
                releaseObject,
                invoke,
                invokeDefault,
                evaluate,
                getProperty,
                setProperty,
                removeProperty,
                hasProperty,
                hasMethod,
                releaseVariantValue,
                setException,
                pushPopupsEnabledState,
                popPopupsEnabledState,
                enumerate,
                pluginThreadAsyncCall,
                construct,
                getValueForUrl,
                setValueForUrl,
                getAuthenticationInfo,
                scheduleTimer,
                unscheduleTimer,
                popUpContextMenu,
                convertPoint,
                handleEvent,
                unfocusInstance,
                urlRedirectResponse,
                initAsyncSurface,
                finalizeAsyncSurface,
                setCurrentAsyncSurface};
    }
};

ScriptedBrowser::ScriptedBrowser() : m_table(BrowserTable::make()) {
    if (s_current) {
        ADD_FAILURE() << "There is a scripted browser already.";
    }
    s_current = this;
    m_plugin.size = sizeof(NPPluginFuncs);
    m_window = ScriptObject::make("window");
    m_document = ScriptObject::make("document");
}

ScriptedBrowser::~ScriptedBrowser() {
    closePage();
    shutdown();
    m_window.reset();
    m_document.reset();
    for (const auto& entry : m_accounts) {
        leftBehind().push_back(entry.first);
    }
    leftBehind().insert(leftBehind().end(), m_blocks.begin(), m_blocks.end());
    s_current = nullptr;
}

ScriptedBrowser& ScriptedBrowser::current() {
    if (!s_current) {
        std::fprintf(stderr, "Script values need a scripted browser.\n");
        std::abort();
    }
    return *s_current;
}

bool ScriptedBrowser::exists() {
    return s_current != nullptr;
}

NPError ScriptedBrowser::initialize() {
    const NPError error = NP_Initialize(&m_table, &m_plugin);
    m_initialized = error == NPERR_NO_ERROR;
    return error;
}

NPError ScriptedBrowser::shutdown() {
    if (!m_initialized) {
        return NPERR_NO_ERROR;
    }
    m_initialized = false;
    return NP_Shutdown();
}

EmbeddedObject ScriptedBrowser::embed(const std::string& mimeType, const Attributes& attributes,
                                      uint16_t mode) {
    const EmbeddedObject object(std::make_shared<EmbeddedObject::Record>());
    m_instances.push_back(object.m_record);

    Attributes texts = attributes; // the interface hands out writable strings
    std::vector<char*> names;
    std::vector<char*> values;
    for (auto& attribute : texts) {
        if (attribute.first == "id") {
            object.m_record->id = attribute.second;
        }
        names.push_back(attribute.first.data());
        values.push_back(attribute.second.data());
    }
    const std::string& id = object.m_record->id;
    object.m_record->element = ScriptObject::make(id.empty() ? "element" : id);
    const ScriptObject element = object.m_record->element;
    element.set("style", ScriptObject::make(element.name() + ".style"));
    object.setRectangle(0, 0, 0, 0);
    element.method("addEventListener", [](const Values&) { return Value(); });
    element.method("removeEventListener", [](const Values&) { return Value(); });

    std::string type = mimeType;
    object.m_record->error =
        m_plugin.newp(type.data(), object.npp(), mode, static_cast<int16_t>(attributes.size()), names.data(),
                      values.data(), nullptr);
    return object;
}

EvaluationRule& ScriptedBrowser::whenEvaluating(const std::string& text) {
    return whenEvaluatingIf([text](const Evaluation& evaluation) { return evaluation.text == text; });
}

EvaluationRule& ScriptedBrowser::whenEvaluatingTextFrom(const std::string& prefix) {
    return whenEvaluatingIf([prefix](const Evaluation& evaluation) {
        return evaluation.text.compare(0, prefix.size(), prefix) == 0;
    });
}

EvaluationRule& ScriptedBrowser::whenEvaluatingIf(std::function<bool(const Evaluation&)> matches) {
    EvaluationRule& rule = m_rules.emplace_front();
    rule.m_matches = std::move(matches);
    rule.gives(undefined);
    return rule;
}

std::string ScriptedBrowser::lastScript() const {
    if (m_scripts.empty()) {
        ADD_FAILURE() << "No script was evaluated.";
        return "";
    }
    return m_scripts.back();
}

std::vector<std::string> ScriptedBrowser::eventTypes() const {
    std::vector<std::string> types;
    for (const DomEvent& event : m_events) {
        types.push_back(event.type);
    }
    return types;
}

void ScriptedBrowser::onEvent(const std::string& type, std::function<void(const DomEvent&)> listener) {
    m_listeners.emplace_back(type, std::move(listener));
}

void ScriptedBrowser::refuse(const std::string& entry, unsigned times, unsigned after) {
    m_refusals[entry] = {after, times};
}

bool ScriptedBrowser::runAsyncCall() {
    AsyncCall call{};
    {
        const std::lock_guard<std::mutex> guard(m_asyncMutex);
        if (m_asyncCalls.empty()) {
            return false;
        }
        call = m_asyncCalls.front();
        m_asyncCalls.pop_front();
    }
    call.function(call.data);
    return true;
}

void ScriptedBrowser::pump() {
    constexpr int kLimit = 1000000;
    for (int turn = 0; turn < kLimit; ++turn) {
        const bool ranAsyncCall = runAsyncCall();
        if (g_main_context_iteration(nullptr, FALSE) == FALSE && !ranAsyncCall) {
            return;
        }
    }
    ADD_FAILURE() << "The main loop never comes to rest.";
}

bool ScriptedBrowser::pumpUntil(const std::function<bool()>& condition, std::chrono::milliseconds bound) {
    const auto end = std::chrono::steady_clock::now() + bound;
    for (;;) {
        const bool ranAsyncCall = runAsyncCall();
        const bool ranSource = g_main_context_iteration(nullptr, FALSE) == TRUE;
        if (condition()) {
            return true;
        }
        if (std::chrono::steady_clock::now() > end) {
            ADD_FAILURE() << "What was waited for didn't come within " << bound.count() << " ms.";
            return false;
        }
        if (!ranAsyncCall && !ranSource) {
            std::this_thread::sleep_for(std::chrono::microseconds(200));
        }
    }
}

size_t ScriptedBrowser::pendingAsyncCalls() const {
    const std::lock_guard<std::mutex> guard(m_asyncMutex);
    return m_asyncCalls.size();
}

std::vector<LiveObject> ScriptedBrowser::liveObjects() const {
    std::vector<std::pair<unsigned, LiveObject>> numbered;
    for (const auto& [object, account] : m_accounts) {
        numbered.push_back({account.serial,
                            {object, account.name, account.className,
                             static_cast<int>(object->referenceCount), pluginReferences(object)}});
    }
    std::sort(numbered.begin(), numbered.end(),
              [](const auto& left, const auto& right) { return left.first < right.first; });
    std::vector<LiveObject> objects;
    for (const auto& entry : numbered) {
        objects.push_back(entry.second);
    }
    return objects;
}

std::string ScriptedBrowser::report() const {
    std::ostringstream text;
    for (const LiveObject& object : liveObjects()) {
        text << "  " << object.name << ": " << object.references << " references, " << object.pluginReferences
             << " of the plug-in\n";
    }
    text << "  " << m_blocks.size() << " blocks of memory\n";
    return text.str();
}

size_t ScriptedBrowser::liveCount(const std::string& className) const {
    return static_cast<size_t>(std::count_if(m_accounts.begin(), m_accounts.end(), [&](const auto& entry) {
        return entry.second.className == className;
    }));
}

void ScriptedBrowser::enterPage() {
    if (const auto action = std::exchange(m_onEnteringPage, nullptr)) {
        action();
        if (!m_onEnteringPage) {
            m_onEnteringPage = action;
        }
    }
}

void ScriptedBrowser::removeElements() {
    const auto instances = m_instances;
    for (const auto& record : instances) {
        if (!record->destroyed && record->error == NPERR_NO_ERROR) {
            EmbeddedObject(record).destroy();
        }
    }
}

void ScriptedBrowser::closePage() {
    m_onEnteringPage = nullptr;
    if (m_initialized) {
        removeElements();
        pump();
    }
    m_rules.clear();
    m_listeners.clear();
    // One by one: an object that ends drops further references.
    const auto isOfScript = [this](const ObjectRef* reference) {
        return reference != &m_window && reference != &m_document;
    };
    for (;;) {
        const auto next = std::find_if(m_pageReferences.begin(), m_pageReferences.end(), isOfScript);
        if (next == m_pageReferences.end()) {
            break;
        }
        (*next)->reset();
    }
    for (const ObjectRef* reference : {&m_window, &m_document}) {
        PageObject::from(reference->object())->forget();
    }
    if (m_initialized) {
        pump();
    }
}

NPIdentifier ScriptedBrowser::identifier(const std::string& name) {
    IdentifierStore& store = identifiers();
    Identifier*& entry = store.byText[name];
    if (!entry) {
        entry = &store.all.emplace_back(Identifier{true, name, 0});
    }
    return entry;
}

NPIdentifier ScriptedBrowser::identifier(int32_t value) {
    IdentifierStore& store = identifiers();
    Identifier*& entry = store.byValue[value];
    if (!entry) {
        entry = &store.all.emplace_back(Identifier{false, "", value});
    }
    return entry;
}

std::string ScriptedBrowser::textOf(NPIdentifier identifier) {
    if (!identifier) {
        return "(null)";
    }
    const auto& known = *static_cast<Identifier*>(identifier);
    return known.isString ? known.text : std::to_string(known.value);
}

ScriptedBrowser::Account& ScriptedBrowser::account(NPObject* object, const std::string& className) {
    const unsigned number = ++m_numbers[className];
    const std::string name = number == 1 ? className : className + "#" + std::to_string(number);
    return m_accounts[object] = {name, className, m_serial++, 0};
}

ObjectRef ScriptedBrowser::newPageObject(const std::string& name) {
    auto* object = new PageObject(name);
    account(object, name);
    return ObjectRef::adopt(object);
}

bool ScriptedBrowser::isLive(NPObject* object, const char* entry) const {
    if (m_accounts.count(object) > 0) {
        return true;
    }
    ADD_FAILURE() << entry << (object ? ": a dead or unknown object" : ": no object");
    return false;
}

bool ScriptedBrowser::pageRetain(NPObject* object) {
    if (!isLive(object, "A reference of the page")) {
        return false;
    }
    ++object->referenceCount;
    ++m_accounts[object].pageReferences;
    return true;
}

void ScriptedBrowser::pageRelease(NPObject* object) {
    if (isLive(object, "A reference of the page")) {
        --m_accounts[object].pageReferences;
        dropReference(object);
    }
}

bool ScriptedBrowser::pageAdopt(NPObject* object) {
    if (!isLive(object, "A result")) {
        return false;
    }
    if (pluginReferences(object) <= 0) {
        ADD_FAILURE() << "The plug-in handed out " << nameOf(object) << " without a reference to it.";
        ++object->referenceCount;
    }
    ++m_accounts[object].pageReferences;
    return true;
}

void ScriptedBrowser::giveReference(NPObject* object) {
    if (isLive(object, "A reference for the plug-in")) {
        ++object->referenceCount;
    }
}

void ScriptedBrowser::dropReference(NPObject* object) {
    if (--object->referenceCount > 0) {
        return;
    }
    m_accounts.erase(object);
    if (PageObject* pageObject = PageObject::from(object)) {
        m_deadPageObjects.emplace_back(pageObject);
        pageObject->forget();
    } else if (object->_class->deallocate) {
        object->_class->deallocate(object);
    } else {
        std::free(object);
    }
}

int ScriptedBrowser::pluginReferences(NPObject* object) const {
    const auto account = m_accounts.find(object);
    return account == m_accounts.end()
               ? 0
               : static_cast<int>(object->referenceCount) - account->second.pageReferences;
}

std::string ScriptedBrowser::nameOf(NPObject* object) const {
    if (!object) {
        return "null";
    }
    const auto account = m_accounts.find(object);
    return account == m_accounts.end() ? "(dead object)" : account->second.name;
}

std::string ScriptedBrowser::classNameOf(NPObject* object) const {
    const auto account = m_accounts.find(object);
    return account == m_accounts.end() ? "" : account->second.className;
}

void* ScriptedBrowser::newBlock(size_t size) {
    void* block = std::malloc(size ? size : 1);
    if (!m_blocks.insert(block).second) {
        ADD_FAILURE() << "A block of the browser's memory was freed without telling the browser.";
    }
    return block;
}

char* ScriptedBrowser::newBlockOf(const std::string& text) {
    char* block = static_cast<char*>(newBlock(text.size()));
    std::memcpy(block, text.data(), text.size());
    return block;
}

// Blocks of the C heap come here too: the two heaps are one.
void ScriptedBrowser::freeBlock(void* block) {
    m_blocks.erase(block);
    std::free(block);
}

bool ScriptedBrowser::enter(const char* entry) {
    return enter(entry, [] { return std::string(); });
}

template <class Text>
bool ScriptedBrowser::enter(const char* entry, Text text) {
    if (std::this_thread::get_id() != m_thread) {
        ADD_FAILURE() << entry << " was called on another thread than the browser's.";
        return false;
    }
    const std::string details = text();
    m_log.add(details.empty() ? entry : std::string(entry) + " " + details);
    const auto refusal = m_refusals.find(entry);
    if (refusal == m_refusals.end()) {
        return true;
    }
    if (refusal->second.after > 0) {
        --refusal->second.after;
        return true;
    }
    if (refusal->second.times == 0) {
        return true;
    }
    --refusal->second.times;
    return false;
}

EmbeddedObject::Record* ScriptedBrowser::recordOf(NPP npp) const {
    for (const auto& record : m_instances) {
        if (&record->npp == npp) {
            return record.get();
        }
    }
    return nullptr;
}

bool ScriptedBrowser::evaluate(NPObject* scope, const std::string& text, NPVariant* result) {
    m_scripts.push_back(text);
    if (!literalsAreClosed(text)) {
        return false;
    }
    const std::optional<Value> value = runScript({text, ObjectRef::share(scope)});
    if (value) {
        value->giveTo(*result);
    }
    return value.has_value();
}

std::optional<Value> ScriptedBrowser::runScript(const Evaluation& evaluation) {
    for (const EvaluationRule& rule : m_rules) {
        if (rule.m_matches(evaluation)) {
            const EvaluationRule::Body body = rule.m_body;
            return body(evaluation);
        }
    }
    const bool inPage = evaluation.scope == m_document || evaluation.scope == m_window;
    if (evaluation.text == "document.location.href" || (evaluation.text == "location.href" && inPage)) {
        return m_address;
    }
    if (endsWith(evaluation.text, ".dispatchEvent(newEvent);")) {
        return dispatchEvent(evaluation.text, false);
    }
    if (endsWith(evaluation.text, ".dispatchEvent(strEvent);")) {
        return dispatchEvent(evaluation.text, true);
    }
    return Value();
}

std::optional<Value> ScriptedBrowser::dispatchEvent(const std::string& text, bool isStreamEvent) {
    DomEvent event;
    event.elementId = between(text, "getElementById(\"", "\"");
    const std::string quote = isStreamEvent ? "'" : "\"";
    event.type = between(text, "initEvent(" + quote, quote);
    const std::string flags = between(text, "initEvent(" + quote + event.type + quote, ")");
    event.bubbles = flags.find("true") == 2;
    event.cancelable = endsWith(flags, "true");
    if (isStreamEvent) {
        for (const char* field : {"name", "data", "text", "status"}) {
            const std::string assignment = std::string("strEvent.") + field + " = \"";
            if (text.find(assignment) != std::string::npos) {
                event.fields[field] = between(text, assignment, "\"");
            }
        }
    }
    const bool inDocument = std::any_of(m_instances.begin(), m_instances.end(), [&](const auto& record) {
        return !record->destroyed && record->id == event.elementId && !record->id.empty();
    });
    if (!inDocument) {
        return std::nullopt; // getElementById gave null
    }
    std::ostringstream entry;
    entry << "event " << event;
    m_log.add(entry.str());
    m_events.push_back(event);
    const auto listeners = m_listeners;
    for (const auto& listener : listeners) {
        if (listener.first == event.type) {
            listener.second(event);
        }
    }
    return Value(true);
}
