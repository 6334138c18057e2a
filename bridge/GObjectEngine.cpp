// The script engine on the GObject API of JavaScriptCore.
//
// Identity. The API hands out one JSCValue for each script object of a context, as long as somebody holds it;
// so the JSCValue is the handle. A proxy is known by its number, the serial of its wrapper, which the
// registry keeps for the proxies of all pages and by which the natives find the wrapper again. Numbers of
// wrappers that are gone lead nowhere.
#include "bridge/GObjectEngine.h"

#include <utility>

#include "bridge/GObjectScript.h"
#include "bridge/Identifiers.h"
#include "bridge/Objects.h"
#include "bridge/Text.h"
#include "bridge/Variants.h"

namespace bridge {

namespace {

// In place of the number of a proxy: a method finds none, and an object whose instance has ended has none.
constexpr double kNoObject = 0;
constexpr double kEndedObject = -1;

// The first values of a native: the number of the proxy, the name.
constexpr unsigned kNumberIndex = 0;
constexpr unsigned kNameIndex = 1;

template <typename Type>
GObjectRef<Type> retained(Type* object) {
    return GObjectRef<Type>(object ? static_cast<Type*>(g_object_ref(object)) : nullptr);
}

JSCValue* valueOf(ScriptHandle handle) {
    return reinterpret_cast<JSCValue*>(handle);
}

ScriptHandle handleOf(JSCValue* value) {
    return reinterpret_cast<ScriptHandle>(value);
}

JSCValue* valueAt(GPtrArray* values, unsigned index) {
    return static_cast<JSCValue*>(g_ptr_array_index(values, index));
}

// The text of a string without lone surrogates.
std::string utf8Of(JSCValue* string) {
    GBytes* const bytes = jsc_value_to_string_as_bytes(string);
    if (!bytes) {
        return {};
    }
    gsize length = 0;
    const auto* const data = static_cast<const char*>(g_bytes_get_data(bytes, &length));
    std::string text(data ? data : "", length);
    g_bytes_unref(bytes);
    return text;
}

NPIdentifier identifierAt(GPtrArray* values, unsigned index) {
    return identifierOfScriptName(utf8Of(valueAt(values, index)));
}

// Makes the native that is running throw, and is its result.
JSCValue* throwError(const std::string& text) {
    jsc_context_throw(jsc_context_get_current(), text.c_str());
    return nullptr;
}

ValueRef propertyOf(JSCValue* object, const char* name) {
    return ValueRef(jsc_value_object_get_property(object, name));
}

// Null when the function throws, as one of ours does only where script has used up the stack.
ValueRef callFunction(JSCValue* function, const std::vector<JSCValue*>& values) {
    ValueRef result(jsc_value_function_callv(function, static_cast<guint>(values.size()),
                                             const_cast<JSCValue**>(values.data())));
    JSCContext* const context = jsc_value_get_context(function);
    if (!jsc_context_get_exception(context)) {
        return result;
    }
    jsc_context_clear_exception(context);
    return nullptr;
}

} // namespace

// The context without a page, where the numbers of the proxies are kept: one for each virtual machine, as
// long as there is an engine.
class GObjectEngine::Registry {
public:
    static std::shared_ptr<Registry> of(JSCContext* page) {
        static auto* all = new std::unordered_map<JSCVirtualMachine*, std::weak_ptr<Registry>>;
        JSCVirtualMachine* const machine = jsc_context_get_virtual_machine(page);
        std::shared_ptr<Registry> registry = (*all)[machine].lock();
        if (!registry) {
            registry = std::make_shared<Registry>(machine);
            (*all)[machine] = registry;
        }
        return registry;
    }

    explicit Registry(JSCVirtualMachine* machine) : m_context(jsc_context_new_with_virtual_machine(machine)) {
        const ValueRef script(jsc_context_evaluate(m_context.get(), kGObjectScript, -1));
        const ValueRef collected(jsc_value_new_function_variadic(
            m_context.get(), "collected", G_CALLBACK(onCollected), nullptr, nullptr, G_TYPE_NONE));
        m_functions = callFunction(propertyOf(script.get(), "makeRegistry").get(), {collected.get()});
        m_numberOf = propertyOf(m_functions.get(), "numberOf");
        m_wellFormed = propertyOf(m_functions.get(), "wellFormed");
    }

    JSCValue* functions() const { return m_functions.get(); }
    // The number of a proxy, kNoObject for another object.
    double numberOf(JSCValue* object) const {
        const ValueRef number = callFunction(m_numberOf.get(), {object});
        return number && jsc_value_is_number(number.get()) ? jsc_value_to_double(number.get()) : kNoObject;
    }
    std::string wellFormed(JSCValue* string) const {
        const ValueRef text = callFunction(m_wellFormed.get(), {string});
        return text ? utf8Of(text.get()) : std::string();
    }

private:
    GObjectRef<JSCContext> m_context;
    ValueRef m_functions;
    ValueRef m_numberOf;
    ValueRef m_wellFormed;
};

class GObjectEngine::Wrapper : public ScriptWrapper {
public:
    Wrapper(GObjectEngine& engine, PluginObject& object) : m_engine(engine), m_object(object) {
        wrappers()[serial()] = this;
    }
    ~Wrapper() override {
        wrappers().erase(serial());
        if (m_weak) {
            g_signal_handlers_disconnect_by_data(m_weak.get(), this);
        }
    }

    // The proxy, once.
    void setProxy(const ValueRef& proxy) {
        m_strong = retained(proxy.get());
        m_weak.reset(jsc_weak_value_new(proxy.get()));
        g_signal_connect(m_weak.get(), "cleared",
                         G_CALLBACK(+[](JSCWeakValue*, Wrapper* self) { self->reportCollected(); }), this);
    }

    // The proxy is garbage. The signal of the weak value comes when the engine sweeps its memory, which may
    // be never; the report of the registry's script comes soon after the collection, but only where the
    // engine has a main loop for it.
    void reportCollected() {
        if (!std::exchange(m_isReported, true)) {
            PluginObject::scriptObjectCollected(m_object.object(), serial());
        }
    }

    bool makeStrong() override {
        m_strong = proxy();
        return m_strong != nullptr;
    }
    void makeWeak() override { m_strong = nullptr; }

    // Null when it has been collected.
    ValueRef proxy() const {
        return m_strong ? retained(m_strong.get()) : ValueRef(jsc_weak_value_get_value(m_weak.get()));
    }

    GObjectEngine& engine() const { return m_engine; }
    PluginObject& object() const { return m_object; }

private:
    GObjectEngine& m_engine;
    PluginObject& m_object;
    ValueRef m_strong; // null while weak
    GObjectRef<JSCWeakValue> m_weak;
    bool m_isReported = false;
};

// What a native is called for. A copy: the call may end the wrapper.
struct GObjectEngine::Target {
    PluginObject* object; // null: the native throws
    GObjectEngine* engine;
};

struct GObjectEngine::Native {
    const char* name;
    JSCValue* (*run)(GPtrArray* values, gpointer);
};

GObjectEngine::GObjectEngine(JSCContext* context, Client& client)
    : m_context(retained(context)), m_client(client), m_registry(Registry::of(context)),
      m_global(jsc_context_get_global_object(context)) {
    runScript();
}

GObjectEngine::~GObjectEngine() {
    GObjectEngine::close();
}

void GObjectEngine::runScript() {
    static constexpr Native kNatives[] = {
        {"read", onRead},
        {"write", onWrite},
        {"hasName", onHas},
        {"remove", onRemove},
        {"names", onNames},
        {"call", onCall},
        {"callDefault", onCallDefault},
        {"callConstructor", onConstruct},
    };
    JSCContext* const context = m_context.get();
    const ValueRef natives(jsc_value_new_object(context, nullptr, nullptr));
    for (const Native& native : kNatives) {
        const ValueRef function(jsc_value_new_function_variadic(context, native.name, G_CALLBACK(native.run),
                                                                nullptr, nullptr, JSC_TYPE_VALUE));
        jsc_value_object_set_property(natives.get(), native.name, function.get());
    }
    m_missing.reset(jsc_value_new_object(context, nullptr, nullptr));
    jsc_value_object_set_property(natives.get(), "missing", m_missing.get());

    const ValueRef script(jsc_context_evaluate(context, kGObjectScript, -1));
    const ValueRef functions = callFunction(
        propertyOf(script.get(), "makePage").get(),
        {m_registry->functions(), natives.get(), propertyOf(script.get(), "evaluateWith").get()});
    const auto function = [&](const char* name) { return propertyOf(functions.get(), name); };
    m_functions = {
        function("failed"),        function("makeObject"), function("makeMethod"), function("invoke"),
        function("invokeDefault"), function("construct"),  function("get"),        function("set"),
        function("has"),           function("hasMethod"),  function("remove"),     function("enumerate"),
        function("evaluate"),      function("log")};
}

void GObjectEngine::close() {
    m_methods.clear();
    m_functions = {};
    m_missing = nullptr;
    m_global = nullptr;
    m_registry = nullptr;
    m_context = nullptr;
}

ScriptHandle GObjectEngine::globalObject() const {
    return handleOf(m_global.get());
}

void GObjectEngine::protect(ScriptHandle object) {
    g_object_ref(valueOf(object));
}

void GObjectEngine::unprotect(ScriptHandle object) {
    g_object_unref(valueOf(object));
}

// Values across the border.

NPVariant GObjectEngine::toVariant(JSCValue* value) {
    if (jsc_value_is_number(value)) {
        return doubleVariant(jsc_value_to_double(value));
    }
    if (jsc_value_is_object(value)) {
        return objectToVariant(value);
    }
    if (jsc_value_is_string(value)) {
        return stringVariant(m_registry->wellFormed(value));
    }
    if (jsc_value_is_boolean(value)) {
        return boolVariant(jsc_value_to_boolean(value));
    }
    // The rest is undefined, or has no counterpart.
    return jsc_value_is_null(value) ? nullVariant() : voidVariant();
}

NPVariant GObjectEngine::objectToVariant(JSCValue* value) {
    const double number = m_registry->numberOf(value);
    const auto wrapper = number > 0 ? wrappers().find(static_cast<uint64_t>(number)) : wrappers().end();
    if (wrapper != wrappers().end()) {
        return objectVariant(retainObject(wrapper->second->object().object()));
    }
    if (jsc_value_get_context(value) == m_context.get()) {
        return objectVariant(m_client.retainedObjectFor(handleOf(value)));
    }
    // A script object that another frame's function has been called with: its handle is another there.
    const ValueRef own(jsc_value_new_array_from_garray(m_context.get(), nullptr));
    jsc_value_object_set_property_at_index(own.get(), 0, value);
    const ValueRef same(jsc_value_object_get_property_at_index(own.get(), 0));
    return objectVariant(m_client.retainedObjectFor(handleOf(same.get())));
}

ValueRef GObjectEngine::textValue(std::string_view text) const {
    // The API takes no invalid text at all.
    const std::string repaired =
        g_utf8_validate_len(text.data(), text.size(), nullptr) ? std::string() : utf8From(utf16From(text));
    const std::string_view valid = repaired.empty() ? text : std::string_view(repaired);
    GBytes* const bytes = g_bytes_new_static(valid.data(), valid.size());
    ValueRef value(jsc_value_new_string_from_bytes(m_context.get(), bytes));
    g_bytes_unref(bytes);
    return value;
}

ValueRef GObjectEngine::nameValue(NPIdentifier name) const {
    return textValue(identifierOf(name).text);
}

ValueRef GObjectEngine::toValue(const NPVariant& variant) {
    JSCContext* const context = m_context.get();
    switch (variant.type) {
    case NPVariantType_Bool:
        return ValueRef(jsc_value_new_boolean(context, variant.value.boolValue));
    case NPVariantType_Int32:
    case NPVariantType_Double:
        return ValueRef(jsc_value_new_number(context, numberOf(variant)));
    case NPVariantType_String:
        return textValue(textOf(variant));
    case NPVariantType_Object:
        if (ValueRef object =
                variant.value.objectValue ? scriptObjectFor(variant.value.objectValue) : nullptr) {
            return object;
        }
        [[fallthrough]];
    case NPVariantType_Null:
        return ValueRef(jsc_value_new_null(context));
    default:
        return ValueRef(jsc_value_new_undefined(context));
    }
}

ValueRef GObjectEngine::scriptObjectFor(NPObject* object) {
    if (const ScriptObject* const scriptObject = ScriptObject::from(object)) {
        return retained(valueOf(scriptObject->handle));
    }
    PluginObject& plugin = PluginObject::of(object);
    if (const auto* const wrapper = static_cast<Wrapper*>(plugin.wrapper())) {
        if (ValueRef existing = wrapper->proxy()) {
            return existing;
        }
    }
    if (auto* const owner = static_cast<GObjectEngine*>(plugin.engine())) {
        return owner->makeScriptObject(plugin);
    }
    const ValueRef number(jsc_value_new_number(m_context.get(), kEndedObject));
    const ValueRef isFunction(jsc_value_new_boolean(m_context.get(), FALSE));
    return call(m_functions.makeObject, {number.get(), isFunction.get()});
}

ValueRef GObjectEngine::makeScriptObject(PluginObject& object) {
    auto wrapper = std::make_unique<Wrapper>(*this, object);
    const ValueRef number(jsc_value_new_number(m_context.get(), static_cast<double>(wrapper->serial())));
    const ValueRef isFunction(jsc_value_new_boolean(m_context.get(), object.isFunction()));
    ValueRef proxy = call(m_functions.makeObject, {number.get(), isFunction.get()});
    if (!proxy || !jsc_value_is_object(proxy.get())) { // script has used up the stack
        return nullptr;
    }
    wrapper->setProxy(proxy);
    object.setWrapper(std::move(wrapper));
    return proxy;
}

JSCValue* GObjectEngine::methodFunction(NPIdentifier name) {
    ValueRef& function = m_methods[name];
    if (!function) {
        function = call(m_functions.makeMethod, {nameValue(name).get()});
    }
    return function.get();
}

std::unordered_map<uint64_t, GObjectEngine::Wrapper*>& GObjectEngine::wrappers() {
    static auto* instance = new std::unordered_map<uint64_t, Wrapper*>;
    return *instance;
}

// The operations of the plug-in on script objects.

// Null when it throws, when closed, and when script has closed the page meanwhile.
ValueRef GObjectEngine::call(const ValueRef& function, const std::vector<JSCValue*>& values) {
    if (!m_context) {
        return nullptr;
    }
    // Script may close the engine while it runs.
    const GObjectRef<JSCContext> context = retained(m_context.get());
    const ValueRef kept = retained(function.get());
    ValueRef result = callFunction(kept.get(), values);
    return m_context ? std::move(result) : nullptr;
}

bool GObjectEngine::isTrue(const ValueRef& function, std::initializer_list<JSCValue*> values) {
    const ValueRef result = call(function, values);
    return result && jsc_value_is_boolean(result.get()) && jsc_value_to_boolean(result.get());
}

bool GObjectEngine::takeResult(ValueRef value, NPVariant* result) {
    *result = voidVariant();
    if (!value || value == m_functions.failed) {
        return false;
    }
    *result = toVariant(value.get());
    return true;
}

// Calls an operation with the values and then the arguments of the plug-in.
bool GObjectEngine::run(const ValueRef& function, std::vector<JSCValue*> values, const NPVariant* args,
                        uint32_t count, NPVariant* result) {
    std::vector<ValueRef> converted;
    converted.reserve(count);
    for (uint32_t i = 0; i < count; i++) {
        converted.push_back(toValue(args[i]));
        values.push_back(converted.back().get());
    }
    return takeResult(call(function, values), result);
}

bool GObjectEngine::invoke(ScriptHandle object, NPIdentifier method, const NPVariant* args, uint32_t count,
                           NPVariant* result) {
    *result = voidVariant();
    return m_context &&
           run(m_functions.invoke, {valueOf(object), nameValue(method).get()}, args, count, result);
}

bool GObjectEngine::invokeDefault(ScriptHandle function, const NPVariant* args, uint32_t count,
                                  NPVariant* result) {
    *result = voidVariant();
    return m_context && run(m_functions.invokeDefault, {valueOf(function)}, args, count, result);
}

bool GObjectEngine::construct(ScriptHandle constructor, const NPVariant* args, uint32_t count,
                              NPVariant* result) {
    *result = voidVariant();
    return m_context && run(m_functions.construct, {valueOf(constructor)}, args, count, result);
}

bool GObjectEngine::evaluate(ScriptHandle scope, const std::string& source, const char* name,
                             NPVariant* result) {
    *result = voidVariant();
    if (!m_context) {
        return false;
    }
    if (valueOf(scope) != m_global.get()) {
        return takeResult(call(m_functions.evaluate, {valueOf(scope), textValue(source).get()}), result);
    }
    const GObjectRef<JSCContext> context = retained(m_context.get());
    const std::string valid = utf8From(utf16From(source));
    ValueRef value(jsc_context_evaluate_with_source_uri(context.get(), valid.data(),
                                                        static_cast<gssize>(valid.size()), name, 1));
    const bool hasThrown = logException();
    return m_context && !hasThrown && takeResult(std::move(value), result);
}

// Whether script has thrown.
bool GObjectEngine::logException() {
    if (!m_context) {
        return true;
    }
    const GObjectRef<JSCException> exception = retained(jsc_context_get_exception(m_context.get()));
    if (!exception) {
        return false;
    }
    jsc_context_clear_exception(m_context.get());
    char* const description = jsc_exception_to_string(exception.get());
    call(m_functions.log, {textValue(description ? description : "").get()});
    g_free(description);
    return true;
}

bool GObjectEngine::hasProperty(ScriptHandle object, NPIdentifier name) {
    return m_context && isTrue(m_functions.has, {valueOf(object), nameValue(name).get()});
}

bool GObjectEngine::hasMethod(ScriptHandle object, NPIdentifier name) {
    return m_context && isTrue(m_functions.hasMethod, {valueOf(object), nameValue(name).get()});
}

bool GObjectEngine::getProperty(ScriptHandle object, NPIdentifier name, NPVariant* result) {
    *result = voidVariant();
    return m_context && takeResult(call(m_functions.get, {valueOf(object), nameValue(name).get()}), result);
}

bool GObjectEngine::setProperty(ScriptHandle object, NPIdentifier name, const NPVariant& value) {
    return m_context &&
           isTrue(m_functions.set, {valueOf(object), nameValue(name).get(), toValue(value).get()});
}

bool GObjectEngine::removeProperty(ScriptHandle object, NPIdentifier name) {
    return m_context && isTrue(m_functions.remove, {valueOf(object), nameValue(name).get()});
}

bool GObjectEngine::enumerate(ScriptHandle object, std::vector<NPIdentifier>& names) {
    if (!m_context) {
        return false;
    }
    const ValueRef list = call(m_functions.enumerate, {valueOf(object)});
    if (!list || !jsc_value_is_array(list.get())) {
        return false;
    }
    const auto count = static_cast<guint>(jsc_value_to_double(propertyOf(list.get(), "length").get()));
    for (guint i = 0; i < count; i++) {
        const ValueRef name(jsc_value_object_get_property_at_index(list.get(), i));
        names.push_back(identifierOfScriptName(utf8Of(name.get())));
    }
    return true;
}

// The registry's report that a proxy is garbage.
void GObjectEngine::onCollected(GPtrArray* values, gpointer) {
    const auto wrapper =
        wrappers().find(static_cast<uint64_t>(jsc_value_to_double(valueAt(values, kNumberIndex))));
    if (wrapper != wrappers().end()) {
        wrapper->second->reportCollected();
    }
}

// The natives. Their context is that of the running function; what they return may be of another.

// The object of the proxy whose number comes first. Without one the native throws.
GObjectEngine::Target GObjectEngine::targetOf(GPtrArray* values) {
    const double number = values->len > kNumberIndex ? jsc_value_to_double(valueAt(values, kNumberIndex)) : 0;
    const auto wrapper = number > 0 ? wrappers().find(static_cast<uint64_t>(number)) : wrappers().end();
    if (wrapper == wrappers().end() || !wrapper->second->engine().m_context) {
        throwError(number == kNoObject ? PluginObject::kNoObjectText : PluginObject::kEndedText);
        return {};
    }
    return {&wrapper->second->object(), &wrapper->second->engine()};
}

JSCValue* GObjectEngine::onRead(GPtrArray* values, gpointer) {
    const Target target = targetOf(values);
    if (!target.object) {
        return nullptr;
    }
    GObjectEngine& engine = *target.engine;
    const NPIdentifier name = identifierAt(values, kNameIndex);
    OwnedVariant result;
    const PluginObject::Read outcome = target.object->read(name, &result);
    if (outcome == PluginObject::Read::Failed) {
        return throwError(PluginObject::takeError());
    }
    if (!engine.m_context) {
        return jsc_value_new_undefined(jsc_context_get_current());
    }
    switch (outcome) {
    case PluginObject::Read::Value:
        return engine.toValue(result.get()).release();
    case PluginObject::Read::Method:
        return retained(engine.methodFunction(name)).release();
    default:
        return retained(engine.m_missing.get()).release();
    }
}

JSCValue* GObjectEngine::onWrite(GPtrArray* values, gpointer) {
    const Target target = targetOf(values);
    if (!target.object) {
        return nullptr;
    }
    const OwnedVariant variant(target.engine->toVariant(valueAt(values, kNameIndex + 1)));
    const auto outcome = target.object->write(identifierAt(values, kNameIndex), variant.get());
    if (outcome == PluginObject::Write::Failed) {
        return throwError(PluginObject::takeError());
    }
    return jsc_value_new_boolean(jsc_context_get_current(), outcome == PluginObject::Write::Done);
}

JSCValue* GObjectEngine::onHas(GPtrArray* values, gpointer) {
    const Target target = targetOf(values);
    return target.object ? jsc_value_new_boolean(jsc_context_get_current(),
                                                 target.object->has(identifierAt(values, kNameIndex)))
                         : nullptr;
}

JSCValue* GObjectEngine::onRemove(GPtrArray* values, gpointer) {
    const Target target = targetOf(values);
    return target.object ? jsc_value_new_boolean(jsc_context_get_current(),
                                                 target.object->remove(identifierAt(values, kNameIndex)))
                         : nullptr;
}

JSCValue* GObjectEngine::onNames(GPtrArray* values, gpointer) {
    const Target target = targetOf(values);
    if (!target.object) {
        return nullptr;
    }
    JSCContext* const context = jsc_context_get_current();
    JSCValue* const list = jsc_value_new_array_from_garray(context, nullptr);
    guint count = 0;
    for (const NPIdentifier name : target.object->names()) {
        if (target.engine->m_context) {
            jsc_value_object_set_property_at_index(list, count++, target.engine->nameValue(name).get());
        }
    }
    return list;
}

// Calls the plug-in with the values from `first` on.
template <typename Call>
JSCValue* GObjectEngine::callPlugin(GPtrArray* values, unsigned first, Call call) {
    const Target target = targetOf(values);
    if (!target.object) {
        return nullptr;
    }
    GObjectEngine& engine = *target.engine;
    Arguments arguments(values->len - first);
    for (unsigned i = first; i < values->len; i++) {
        arguments[i - first] = engine.toVariant(valueAt(values, i));
    }
    OwnedVariant result;
    if (!call(*target.object, arguments, &result)) {
        return throwError(PluginObject::takeError());
    }
    return engine.m_context ? engine.toValue(result.get()).release()
                            : jsc_value_new_undefined(jsc_context_get_current());
}

JSCValue* GObjectEngine::onCall(GPtrArray* values, gpointer) {
    const NPIdentifier name = identifierAt(values, kNameIndex);
    return callPlugin(values, kNameIndex + 1,
                      [name](PluginObject& object, const Arguments& arguments, NPVariant* result) {
                          return object.call(name, arguments, result);
                      });
}

JSCValue* GObjectEngine::onCallDefault(GPtrArray* values, gpointer) {
    return callPlugin(values, kNumberIndex + 1,
                      [](PluginObject& object, const Arguments& arguments, NPVariant* result) {
                          return object.callDefault(arguments, result);
                      });
}

JSCValue* GObjectEngine::onConstruct(GPtrArray* values, gpointer) {
    return callPlugin(values, kNumberIndex + 1,
                      [](PluginObject& object, const Arguments& arguments, NPVariant* result) {
                          return object.construct(arguments, result);
                      });
}

} // namespace bridge
