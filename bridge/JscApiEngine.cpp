// The script engine on the C API of JavaScriptCore.
#include "bridge/JscApiEngine.h"

#include <array>
#include <string_view>
#include <utility>

#include "bridge/Identifiers.h"
#include "bridge/Objects.h"
#include "bridge/Text.h"
#include "bridge/Variants.h"

namespace bridge {

namespace {

// How many prototypes a method looks through for the object that it is called on.
constexpr int kLongestPrototypeChain = 32;

// Owns a string of the engine.
class OwnedString {
public:
    explicit OwnedString(JSStringRef string) : m_string(string) {}
    explicit OwnedString(std::string_view utf8) {
        const std::u16string text = utf16From(utf8);
        m_string = JSStringCreateWithCharacters(reinterpret_cast<const JSChar*>(text.data()), text.size());
    }
    OwnedString(const OwnedString&) = delete;
    OwnedString& operator=(const OwnedString&) = delete;
    ~OwnedString() { JSStringRelease(m_string); }

    JSStringRef get() const { return m_string; }

private:
    JSStringRef m_string;
};

std::string utf8Of(JSStringRef string) {
    static_assert(sizeof(JSChar) == sizeof(char16_t));
    return utf8From(
        {reinterpret_cast<const char16_t*>(JSStringGetCharactersPtr(string)), JSStringGetLength(string)});
}

NPIdentifier identifierOfName(JSStringRef name) {
    // Nearly all names are short and ASCII; those take no memory on the way.
    std::array<char, 64> buffer;
    const size_t length = JSStringGetLength(name);
    if (length < buffer.size() && JSStringGetUTF8CString(name, buffer.data(), buffer.size()) == length + 1) {
        return identifierOfScriptName({buffer.data(), length});
    }
    return identifierOfScriptName(utf8Of(name));
}

JSStringRef nameOf(NPIdentifier identifier) {
    Identifier& name = identifierOf(identifier);
    if (!name.engineName) {
        const std::u16string text = utf16From(name.text);
        name.engineName =
            JSStringCreateWithCharacters(reinterpret_cast<const JSChar*>(text.data()), text.size());
    }
    return static_cast<JSStringRef>(name.engineName);
}

JSValueRef errorOf(JSContextRef context, std::string_view text) {
    const OwnedString string(text);
    const JSValueRef message = JSValueMakeString(context, string.get());
    return JSObjectMakeError(context, 1, &message, nullptr);
}

// Whether script has thrown in a function of the API that takes no exception. It would stay with the engine
// and end whatever script runs next.
bool takeException(JSContextRef context) {
    JSValueRef exception = nullptr;
    JSValueToNumber(context, JSValueMakeNumber(context, 0), &exception);
    return exception != nullptr;
}

// Whether the object has the name; not if script throws when it is asked, as the traps of a proxy may.
bool hasName(JSContextRef context, JSObjectRef object, JSStringRef name) {
    const bool isThere = JSObjectHasProperty(context, object, name);
    return !takeException(context) && isThere;
}

JSObjectRef objectOf(ScriptHandle handle) {
    return reinterpret_cast<JSObjectRef>(handle);
}

ScriptHandle handleOf(JSObjectRef object) {
    return reinterpret_cast<ScriptHandle>(object);
}

JSObjectRef functionFrom(JSContextRef context, const char* source) {
    const OwnedString text{std::string_view(source)};
    const JSValueRef value = JSEvaluateScript(context, text.get(), nullptr, nullptr, 1, nullptr);
    return value && JSValueIsObject(context, value) ? JSValueToObject(context, value, nullptr) : nullptr;
}

} // namespace

// What ties a script object to its plug-in object. The script object and the wrapper share it, because either
// may go first.
struct JscApiEngine::Link {
    PluginObject* object; // null when the wrapper is cut
    JscApiEngine* engine; // valid with `object`
    NPObject* npObject;
    uint64_t serial; // of the wrapper
};

struct JscApiEngine::Method {
    JscApiEngine* engine;
    NPIdentifier name;
};

class JscApiEngine::Wrapper : public ScriptWrapper {
public:
    Wrapper(JscApiEngine& engine, std::shared_ptr<Link> link, JSObjectRef object)
        : m_engine(engine), m_link(std::move(link)), m_strong(object) {
        m_link->serial = serial();
        JSValueProtect(m_engine.m_context, object);
    }
    ~Wrapper() override {
        m_link->object = nullptr;
        release(m_strong);
        release(m_weak);
    }

    bool makeStrong() override {
        const JSObjectRef current = object();
        if (current && !m_strong) {
            JSValueProtect(m_engine.m_context, current);
            m_strong = current;
            release(m_weak);
        }
        return current != nullptr;
    }

    void makeWeak() override {
        const JSValueRef target = m_strong;
        const JSValueRef reference =
            JSObjectCallAsFunction(m_engine.m_context, m_engine.m_makeWeak, nullptr, 1, &target, nullptr);
        if (!reference) { // no memory: stays strong
            return;
        }
        m_weak = JSValueToObject(m_engine.m_context, reference, nullptr);
        JSValueProtect(m_engine.m_context, m_weak);
        release(m_strong);
    }

    // The script object; null when it has been collected.
    JSObjectRef object() const {
        if (m_strong) {
            return m_strong;
        }
        const JSValueRef reference = m_weak;
        const JSValueRef target =
            JSObjectCallAsFunction(m_engine.m_context, m_engine.m_fromWeak, nullptr, 1, &reference, nullptr);
        return target && JSValueIsObject(m_engine.m_context, target)
                   ? JSValueToObject(m_engine.m_context, target, nullptr)
                   : nullptr;
    }

private:
    void release(JSObjectRef& held) {
        if (held && m_engine.m_context) {
            JSValueUnprotect(m_engine.m_context, std::exchange(held, nullptr));
        }
    }

    JscApiEngine& m_engine;
    std::shared_ptr<Link> m_link;
    JSObjectRef m_strong;
    JSObjectRef m_weak = nullptr; // a WeakRef; one of the two is null
};

JscApiEngine::JscApiEngine(JSGlobalContextRef context, Client& client)
    : m_context(JSGlobalContextRetain(context)), m_client(client) {
    m_makeWeak = functionFrom(context, "(W => object => new W(object))(WeakRef)");
    m_fromWeak = functionFrom(context, "((call, deref) => reference => call(deref, reference, []))"
                                       "(Reflect.apply, WeakRef.prototype.deref)");
    m_reportError = functionFrom(context, "typeof reportError === 'function' ? reportError : undefined");
    m_logError = functionFrom(context, "typeof console === 'object' ? console.error : undefined");
    for (const JSObjectRef held : {m_makeWeak, m_fromWeak, m_reportError, m_logError}) {
        if (held) {
            JSValueProtect(context, held);
        }
    }
}

JscApiEngine::~JscApiEngine() {
    JscApiEngine::close();
}

void JscApiEngine::close() {
    if (!m_context) {
        return;
    }
    for (const auto& [name, function] : m_methods) {
        methods().erase(function);
        JSValueUnprotect(m_context, function);
    }
    m_methods.clear();
    for (JSObjectRef* held : {&m_makeWeak, &m_fromWeak, &m_reportError, &m_logError}) {
        if (*held) {
            JSValueUnprotect(m_context, std::exchange(*held, nullptr));
        }
    }
    JSGlobalContextRelease(std::exchange(m_context, nullptr));
}

ScriptHandle JscApiEngine::globalObject() const {
    return m_context ? handleOf(JSContextGetGlobalObject(m_context)) : nullptr;
}

void JscApiEngine::protect(ScriptHandle object) {
    if (m_context) {
        JSValueProtect(m_context, objectOf(object));
    }
}

void JscApiEngine::unprotect(ScriptHandle object) {
    if (m_context) {
        JSValueUnprotect(m_context, objectOf(object));
    }
}

// Values across the border.

NPVariant JscApiEngine::toVariant(JSValueRef value) {
    switch (JSValueGetType(m_context, value)) {
    case kJSTypeNull:
        return nullVariant();
    case kJSTypeBoolean:
        return boolVariant(JSValueToBoolean(m_context, value));
    case kJSTypeNumber:
        return doubleVariant(JSValueToNumber(m_context, value, nullptr));
    case kJSTypeString: {
        const OwnedString string(JSValueToStringCopy(m_context, value, nullptr));
        return stringVariant(utf8Of(string.get()));
    }
    case kJSTypeObject: {
        const JSObjectRef object = JSValueToObject(m_context, value, nullptr);
        const Link* const link = findLink(m_context, object);
        return objectVariant(link && link->object ? retainObject(link->npObject)
                                                  : m_client.retainedObjectFor(handleOf(object)));
    }
    default: // undefined, and what has no counterpart
        return voidVariant();
    }
}

JSValueRef JscApiEngine::toValue(const NPVariant& variant) {
    switch (variant.type) {
    case NPVariantType_Null:
        return JSValueMakeNull(m_context);
    case NPVariantType_Bool:
        return JSValueMakeBoolean(m_context, variant.value.boolValue);
    case NPVariantType_Int32:
    case NPVariantType_Double:
        return JSValueMakeNumber(m_context, numberOf(variant));
    case NPVariantType_String: {
        const OwnedString string(textOf(variant));
        return JSValueMakeString(m_context, string.get());
    }
    case NPVariantType_Object: {
        const JSObjectRef object =
            variant.value.objectValue ? scriptObjectFor(variant.value.objectValue) : nullptr;
        return object ? object : JSValueMakeNull(m_context);
    }
    default:
        return JSValueMakeUndefined(m_context);
    }
}

JSObjectRef JscApiEngine::scriptObjectFor(NPObject* object) {
    if (const ScriptObject* const scriptObject = ScriptObject::from(object)) {
        return objectOf(scriptObject->handle);
    }
    PluginObject& plugin = PluginObject::of(object);
    if (const auto* const wrapper = static_cast<Wrapper*>(plugin.wrapper())) {
        if (const JSObjectRef existing = wrapper->object()) {
            return existing;
        }
    }
    auto* const owner = static_cast<JscApiEngine*>(plugin.engine());
    if (owner) {
        return owner->makeScriptObject(plugin);
    }
    return JSObjectMake(m_context, wrapperClass(false), new std::shared_ptr<Link>(new Link{}));
}

JSObjectRef JscApiEngine::makeScriptObject(PluginObject& object) {
    const auto link = std::make_shared<Link>(Link{&object, this, object.object(), 0});
    const JSObjectRef made =
        JSObjectMake(m_context, wrapperClass(object.isFunction()), new std::shared_ptr<Link>(link));
    object.setWrapper(std::make_unique<Wrapper>(*this, link, made));
    return made;
}

// The function of a method: one for all objects, so that script may borrow it from one for another.
JSObjectRef JscApiEngine::methodFunction(NPIdentifier name) {
    JSObjectRef& function = m_methods[name];
    if (!function) {
        function = JSObjectMakeFunctionWithCallback(m_context, nameOf(name), onMethod);
        JSValueProtect(m_context, function);
        methods()[function] = {this, name};
    }
    return function;
}

std::unordered_map<JSObjectRef, JscApiEngine::Method>& JscApiEngine::methods() {
    static auto* instance = new std::unordered_map<JSObjectRef, Method>;
    return *instance;
}

// Ends an operation: false when script has thrown, which is told to the function `report`, or has closed the
// page meanwhile.
bool JscApiEngine::takeResult(JSValueRef value, JSValueRef exception, JSObjectRef report, NPVariant* result) {
    *result = voidVariant();
    if (!m_context) {
        return false;
    }
    if (exception && report) {
        JSObjectCallAsFunction(m_context, report, nullptr, 1, &exception, nullptr);
    }
    if (exception || !value) {
        return false;
    }
    *result = toVariant(value);
    return true;
}

// The operations of the plug-in on script objects.

namespace {

// The arguments of a call into script. They need no protection: the engine finds them on the stack, or in
// `m_many` through the list that it makes of them.
class Values {
public:
    template <typename Convert>
    Values(JSContextRef context, const NPVariant* args, uint32_t count, Convert convert)
        : m_context(context), m_count(count) {
        if (count > m_few.size()) {
            m_many.resize(count);
        }
        for (uint32_t i = 0; i < count; i++) {
            data()[i] = convert(args[i]);
            if (!m_many.empty()) {
                JSValueProtect(m_context, data()[i]);
            }
        }
    }
    Values(const Values&) = delete;
    Values& operator=(const Values&) = delete;
    ~Values() {
        for (const JSValueRef value : m_many) {
            JSValueUnprotect(m_context, value);
        }
    }

    JSValueRef* data() { return m_many.empty() ? m_few.data() : m_many.data(); }
    size_t count() const { return m_count; }

private:
    JSContextRef m_context;
    std::array<JSValueRef, Arguments::kPadding> m_few;
    std::vector<JSValueRef> m_many;
    uint32_t m_count;
};

// Keeps a context that script may close while it runs.
class KeptContext {
public:
    explicit KeptContext(JSGlobalContextRef context) : m_context(JSGlobalContextRetain(context)) {}
    KeptContext(const KeptContext&) = delete;
    KeptContext& operator=(const KeptContext&) = delete;
    ~KeptContext() { JSGlobalContextRelease(m_context); }

    JSGlobalContextRef get() const { return m_context; }

private:
    JSGlobalContextRef m_context;
};

} // namespace

bool JscApiEngine::invoke(ScriptHandle object, NPIdentifier method, const NPVariant* args, uint32_t count,
                          NPVariant* result) {
    *result = voidVariant();
    if (!m_context) {
        return false;
    }
    const KeptContext kept(m_context);
    JSValueRef exception = nullptr;
    const JSValueRef function = JSObjectGetProperty(kept.get(), objectOf(object), nameOf(method), &exception);
    if (exception || !m_context || !function || !JSValueIsObject(kept.get(), function)) {
        return takeResult(nullptr, exception, m_reportError, result);
    }
    Values values(kept.get(), args, count, [this](const NPVariant& variant) { return toValue(variant); });
    const JSValueRef value =
        JSObjectCallAsFunction(kept.get(), JSValueToObject(kept.get(), function, nullptr), objectOf(object),
                               values.count(), values.data(), &exception);
    return takeResult(value, exception, m_reportError, result);
}

bool JscApiEngine::invokeDefault(ScriptHandle function, const NPVariant* args, uint32_t count,
                                 NPVariant* result) {
    *result = voidVariant();
    if (!m_context) {
        return false;
    }
    const KeptContext kept(m_context);
    JSValueRef exception = nullptr;
    Values values(kept.get(), args, count, [this](const NPVariant& variant) { return toValue(variant); });
    const JSValueRef value = JSObjectCallAsFunction(kept.get(), objectOf(function), nullptr, values.count(),
                                                    values.data(), &exception);
    return takeResult(value, exception, m_reportError, result);
}

bool JscApiEngine::construct(ScriptHandle constructor, const NPVariant* args, uint32_t count,
                             NPVariant* result) {
    *result = voidVariant();
    if (!m_context) {
        return false;
    }
    const KeptContext kept(m_context);
    JSValueRef exception = nullptr;
    Values values(kept.get(), args, count, [this](const NPVariant& variant) { return toValue(variant); });
    const JSValueRef value = JSObjectCallAsConstructor(kept.get(), objectOf(constructor), values.count(),
                                                       values.data(), &exception);
    return takeResult(value, exception, m_reportError, result);
}

bool JscApiEngine::evaluate(ScriptHandle scope, const std::string& source, const char* name,
                            NPVariant* result) {
    *result = voidVariant();
    if (!m_context) {
        return false;
    }
    const KeptContext kept(m_context);
    const OwnedString text{std::string_view(source)};
    const OwnedString sourceName{std::string_view(name)};
    JSValueRef exception = nullptr;
    const JSValueRef value =
        JSEvaluateScript(kept.get(), text.get(), objectOf(scope), sourceName.get(), 1, &exception);
    return takeResult(value, exception, m_logError, result);
}

bool JscApiEngine::hasProperty(ScriptHandle object, NPIdentifier name) {
    if (!m_context) {
        return false;
    }
    const KeptContext kept(m_context);
    return hasName(kept.get(), objectOf(object), nameOf(name));
}

bool JscApiEngine::hasMethod(ScriptHandle object, NPIdentifier name) {
    if (!m_context) {
        return false;
    }
    const KeptContext kept(m_context);
    const JSValueRef value = JSObjectGetProperty(kept.get(), objectOf(object), nameOf(name), nullptr);
    return value && JSValueIsObject(kept.get(), value) &&
           JSObjectIsFunction(kept.get(), JSValueToObject(kept.get(), value, nullptr));
}

bool JscApiEngine::getProperty(ScriptHandle object, NPIdentifier name, NPVariant* result) {
    *result = voidVariant();
    if (!m_context) {
        return false;
    }
    const KeptContext kept(m_context);
    JSValueRef exception = nullptr;
    const JSValueRef value = JSObjectGetProperty(kept.get(), objectOf(object), nameOf(name), &exception);
    return takeResult(value, exception, m_reportError, result);
}

bool JscApiEngine::setProperty(ScriptHandle object, NPIdentifier name, const NPVariant& value) {
    if (!m_context) {
        return false;
    }
    const KeptContext kept(m_context);
    JSValueRef exception = nullptr;
    JSObjectSetProperty(kept.get(), objectOf(object), nameOf(name), toValue(value), kJSPropertyAttributeNone,
                        &exception);
    NPVariant none;
    takeResult(nullptr, exception, m_reportError, &none);
    return !exception;
}

bool JscApiEngine::removeProperty(ScriptHandle object, NPIdentifier name) {
    if (!m_context) {
        return false;
    }
    const KeptContext kept(m_context);
    return hasName(kept.get(), objectOf(object), nameOf(name)) &&
           JSObjectDeleteProperty(kept.get(), objectOf(object), nameOf(name), nullptr);
}

bool JscApiEngine::enumerate(ScriptHandle object, std::vector<NPIdentifier>& names) {
    if (!m_context) {
        return false;
    }
    const KeptContext kept(m_context);
    const JSPropertyNameArrayRef found = JSObjectCopyPropertyNames(kept.get(), objectOf(object));
    for (size_t i = 0; i < JSPropertyNameArrayGetCount(found); i++) {
        names.push_back(identifierOfName(JSPropertyNameArrayGetNameAtIndex(found, i)));
    }
    JSPropertyNameArrayRelease(found);
    return !takeException(kept.get());
}

// Calls of script into plug-in objects.

JSClassRef JscApiEngine::wrapperClass(bool isFunction) {
    const auto make = [](bool callable) {
        JSClassDefinition definition = kJSClassDefinitionEmpty;
        definition.attributes = kJSClassAttributeNoAutomaticPrototype;
        definition.className = "NPObject";
        definition.getProperty = onGet;
        definition.setProperty = onSet;
        definition.deleteProperty = onDelete;
        definition.getPropertyNames = onNames;
        definition.callAsFunction = callable ? onCall : nullptr;
        definition.callAsConstructor = callable ? onConstruct : nullptr;
        definition.finalize = onFinalize;
        return JSClassCreate(&definition);
    };
    static JSClassRef object = make(false);
    static JSClassRef function = make(true);
    return isFunction ? function : object;
}

JscApiEngine::Link& JscApiEngine::linkOf(JSObjectRef object) {
    return **static_cast<std::shared_ptr<Link>*>(JSObjectGetPrivate(object));
}

// The link of a script object that stands for a plug-in object, null for another.
JscApiEngine::Link* JscApiEngine::findLink(JSContextRef context, JSObjectRef object) {
    const bool isWrapper = JSValueIsObjectOfClass(context, object, wrapperClass(false)) ||
                           JSValueIsObjectOfClass(context, object, wrapperClass(true));
    return isWrapper ? &linkOf(object) : nullptr;
}

// The same for an object that inherits from such a script object, as an element does.
JscApiEngine::Link* JscApiEngine::findLinkBehind(JSContextRef context, JSObjectRef object) {
    for (int i = 0; object && i < kLongestPrototypeChain; i++) {
        if (Link* const found = findLink(context, object)) {
            return found;
        }
        const JSValueRef prototype = JSObjectGetPrototype(context, object);
        object = JSValueIsObject(context, prototype) ? JSValueToObject(context, prototype, nullptr) : nullptr;
    }
    return nullptr;
}

// Calls the plug-in with the arguments of script; what it throws goes to `exception`.
template <typename Call>
JSValueRef JscApiEngine::callPlugin(JSContextRef context, const Link& link, size_t count,
                                    const JSValueRef values[], JSValueRef* exception, Call call) {
    if (!link.object) {
        *exception = errorOf(context, PluginObject::kEndedText);
        return nullptr;
    }
    JscApiEngine& engine = *link.engine;
    Arguments arguments(static_cast<uint32_t>(count));
    for (size_t i = 0; i < count; i++) {
        arguments[static_cast<uint32_t>(i)] = engine.toVariant(values[i]);
    }
    OwnedVariant result;
    if (!call(*link.object, arguments, &result)) {
        *exception = errorOf(context, PluginObject::takeError());
        return nullptr;
    }
    return engine.m_context ? engine.toValue(result.get()) : JSValueMakeUndefined(context);
}

JSValueRef JscApiEngine::onGet(JSContextRef context, JSObjectRef object, JSStringRef name,
                               JSValueRef* exception) {
    const Link link = linkOf(object); // a copy: the call may cut the object
    if (!link.object) {
        *exception = errorOf(context, PluginObject::kEndedText);
        return nullptr;
    }
    JscApiEngine& engine = *link.engine;
    const NPIdentifier identifier = identifierOfName(name);
    OwnedVariant result;
    switch (link.object->read(identifier, &result)) {
    case PluginObject::Read::Value:
        return engine.m_context ? engine.toValue(result.get()) : JSValueMakeUndefined(context);
    case PluginObject::Read::Method:
        return engine.m_context ? engine.methodFunction(identifier) : JSValueMakeUndefined(context);
    case PluginObject::Read::Failed:
        *exception = errorOf(context, PluginObject::takeError());
        return nullptr;
    case PluginObject::Read::Missing:
        break;
    }
    return nullptr;
}

bool JscApiEngine::onSet(JSContextRef context, JSObjectRef object, JSStringRef name, JSValueRef value,
                         JSValueRef* exception) {
    const Link link = linkOf(object); // a copy: the call may cut the object
    if (!link.object) {
        *exception = errorOf(context, PluginObject::kEndedText);
        return true;
    }
    const OwnedVariant variant(link.engine->toVariant(value));
    switch (link.object->write(identifierOfName(name), variant.get())) {
    case PluginObject::Write::Done:
        return true;
    case PluginObject::Write::Failed:
        *exception = errorOf(context, PluginObject::takeError());
        return true;
    case PluginObject::Write::Missing:
        break;
    }
    return false;
}

bool JscApiEngine::onDelete(JSContextRef, JSObjectRef object, JSStringRef name, JSValueRef*) {
    const Link link = linkOf(object); // a copy: the call may cut the object
    return link.object && link.object->remove(identifierOfName(name));
}

void JscApiEngine::onNames(JSContextRef, JSObjectRef object, JSPropertyNameAccumulatorRef names) {
    const Link link = linkOf(object); // a copy: the call may cut the object
    if (!link.object) {
        return;
    }
    for (const NPIdentifier name : link.object->names()) {
        JSPropertyNameAccumulatorAddName(names, nameOf(name));
    }
}

JSValueRef JscApiEngine::onCall(JSContextRef context, JSObjectRef function, JSObjectRef, size_t count,
                                const JSValueRef values[], JSValueRef* exception) {
    return callPlugin(context, linkOf(function), count, values, exception,
                      [](PluginObject& object, const Arguments& arguments, NPVariant* result) {
                          return object.callDefault(arguments, result);
                      });
}

JSObjectRef JscApiEngine::onConstruct(JSContextRef context, JSObjectRef constructor, size_t count,
                                      const JSValueRef values[], JSValueRef* exception) {
    const JSValueRef value =
        callPlugin(context, linkOf(constructor), count, values, exception,
                   [](PluginObject& object, const Arguments& arguments, NPVariant* result) {
                       return object.construct(arguments, result);
                   });
    return *exception ? nullptr : JSValueToObject(context, value, exception);
}

JSValueRef JscApiEngine::onMethod(JSContextRef context, JSObjectRef function, JSObjectRef self, size_t count,
                                  const JSValueRef values[], JSValueRef* exception) {
    const auto method = methods().find(function);
    if (method == methods().end()) {
        *exception = errorOf(context, PluginObject::kEndedText);
        return nullptr;
    }
    const Link* const link = findLinkBehind(context, self);
    if (!link) {
        *exception = errorOf(context, PluginObject::kNoObjectText);
        return nullptr;
    }
    const NPIdentifier name = method->second.name;
    return callPlugin(context, Link(*link), count, values, exception,
                      [name](PluginObject& object, const Arguments& arguments, NPVariant* result) {
                          return object.call(name, arguments, result);
                      });
}

void JscApiEngine::onFinalize(JSObjectRef object) {
    const std::unique_ptr<std::shared_ptr<Link>> link(
        static_cast<std::shared_ptr<Link>*>(JSObjectGetPrivate(object)));
    if ((*link)->object) {
        PluginObject::scriptObjectCollected((*link)->npObject, (*link)->serial);
    }
}

} // namespace bridge
