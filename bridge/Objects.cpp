// NPObjects: their life, and the identity of each on both sides.
#include "bridge/Objects.h"

#include <algorithm>
#include <cstdlib>
#include <mutex>
#include <utility>

#include <glib.h>

#include "bridge/CallDepth.h"
#include "bridge/Identifiers.h"
#include "bridge/Instance.h"
#include "bridge/Page.h"
#include "bridge/Variants.h"

namespace bridge {

const char PluginObject::kEndedText[] = "The plug-in instance of this object has ended.";
const char PluginObject::kNoObjectText[] = "A plug-in method was called on something else.";

namespace {

constexpr char kCallFailedText[] = "Error calling method on NPObject.";

// The versions of NPClass from which it has these entries.
constexpr uint32_t kVersionWithEnumerate = 2;
constexpr uint32_t kVersionWithConstruct = 3;

std::unordered_map<NPObject*, std::unique_ptr<PluginObject>>& pluginObjects() {
    static auto* objects = new std::unordered_map<NPObject*, std::unique_ptr<PluginObject>>;
    return *objects;
}

// The exception of the current call of script into the plug-in, and the text of the last that has failed.
std::string pendingException;
std::string lastError;

// Script objects that have been collected, until the main loop releases what they held.
struct Collected {
    std::mutex mutex;
    std::vector<std::pair<NPObject*, uint64_t>>
        objects; // and the serials of their wrappers; guarded by `mutex`
};

Collected& collected() {
    static auto* instance = new Collected;
    return *instance;
}

gboolean releaseCollected(gpointer) {
    decltype(Collected::objects) objects;
    {
        const std::lock_guard<std::mutex> lock(collected().mutex);
        objects.swap(collected().objects);
    }
    for (const auto& [object, serial] : objects) {
        const auto found = pluginObjects().find(object);
        if (found != pluginObjects().end()) {
            found->second->wrapperCollected(serial);
        }
    }
    return G_SOURCE_REMOVE;
}

void deleteObject(NPObject* object) {
    // The record goes last: the instance that the object may look at lives as long as it.
    auto node = pluginObjects().extract(object);
    if (!node.empty()) {
        node.mapped()->cut();
    }
    const CallDepth depth;
    if (object->_class->deallocate) {
        object->_class->deallocate(object);
    } else {
        std::free(object);
    }
}

// Calls of a ScriptObject's class: the engine's operation on the script object, unless it has been cut off.
template <typename Result, typename... Parameters, typename... Values>
Result inScript(NPObject* object, Result (ScriptEngine::*operation)(ScriptHandle, Parameters...),
                Values&&... values) {
    auto* const scriptObject = static_cast<ScriptObject*>(object);
    const CallDepth depth;
    return scriptObject->engine &&
           (scriptObject->engine->*operation)(scriptObject->handle, std::forward<Values>(values)...);
}

void deallocateScriptObject(NPObject* object) {
    auto* const scriptObject = static_cast<ScriptObject*>(object);
    scriptObject->cutOff();
    delete scriptObject;
}

bool enumerateScriptObject(NPObject* object, NPIdentifier** names, uint32_t* count) {
    std::vector<NPIdentifier> found;
    *names = nullptr;
    *count = 0;
    if (!inScript(object, &ScriptEngine::enumerate, found)) {
        return false;
    }
    // The plug-in frees the list with NPN_MemFree().
    *names = static_cast<NPIdentifier*>(std::calloc(found.size() + 1, sizeof(NPIdentifier)));
    if (!*names) {
        return false;
    }
    std::copy(found.begin(), found.end(), *names);
    *count = static_cast<uint32_t>(found.size());
    return true;
}

NPClass kScriptObjectClass = {
    NP_CLASS_STRUCT_VERSION,
    nullptr,
    deallocateScriptObject,
    nullptr,
    [](NPObject* object, NPIdentifier name) { return inScript(object, &ScriptEngine::hasMethod, name); },
    [](NPObject* object, NPIdentifier name, const NPVariant* args, uint32_t count, NPVariant* result) {
        return inScript(object, &ScriptEngine::invoke, name, args, count, result);
    },
    [](NPObject* object, const NPVariant* args, uint32_t count, NPVariant* result) {
        return inScript(object, &ScriptEngine::invokeDefault, args, count, result);
    },
    [](NPObject* object, NPIdentifier name) { return inScript(object, &ScriptEngine::hasProperty, name); },
    [](NPObject* object, NPIdentifier name, NPVariant* result) {
        return inScript(object, &ScriptEngine::getProperty, name, result);
    },
    [](NPObject* object, NPIdentifier name, const NPVariant* value) {
        return inScript(object, &ScriptEngine::setProperty, name, *value);
    },
    [](NPObject* object, NPIdentifier name) { return inScript(object, &ScriptEngine::removeProperty, name); },
    enumerateScriptObject,
    [](NPObject* object, const NPVariant* args, uint32_t count, NPVariant* result) {
        return inScript(object, &ScriptEngine::construct, args, count, result);
    }};

} // namespace

NPObject* createObject(NPP npp, NPClass* objectClass) {
    const auto instance = Instance::find(npp);
    if (!instance || !objectClass) {
        return nullptr;
    }
    const CallDepth depth;
    auto* const object = objectClass->allocate ? objectClass->allocate(npp, objectClass)
                                               : static_cast<NPObject*>(std::calloc(1, sizeof(NPObject)));
    if (!object) {
        return nullptr;
    }
    object->_class = objectClass;
    object->referenceCount = 1;
    pluginObjects()[object] = std::make_unique<PluginObject>(object, instance);
    return object;
}

NPObject* retainObject(NPObject* object) {
    if (object && ++object->referenceCount == 2 && !ScriptObject::from(object)) {
        PluginObject::of(object).updateHold();
    }
    return object;
}

void releaseObject(NPObject* object) {
    if (!object) {
        return;
    }
    object->referenceCount--;
    if (object->referenceCount == 0) {
        deleteObject(object);
    } else if (object->referenceCount == 1 && !ScriptObject::from(object)) {
        PluginObject::of(object).updateHold();
    }
}

void setPendingException(const char* text) {
    pendingException = text ? text : "";
    if (pendingException.empty()) {
        pendingException = kCallFailedText;
    }
}

// Around each call of script into the object: keeps it alive, and begins without an exception.
class PluginObject::Use {
public:
    explicit Use(NPObject* object) : m_object(object) {
        m_object->referenceCount++;
        pendingException.clear();
    }
    Use(const Use&) = delete;
    Use& operator=(const Use&) = delete;
    ~Use() {
        if (m_object->referenceCount == 1) {
            releaseObject(m_object);
        } else {
            m_object->referenceCount--;
            of(m_object).updateHold();
        }
    }

private:
    const CallDepth m_depth;
    NPObject* m_object;
};

PluginObject& PluginObject::of(NPObject* object) {
    auto& record = pluginObjects()[object];
    if (!record) {
        record = std::make_unique<PluginObject>(object, nullptr);
    }
    return *record;
}

PluginObject::PluginObject(NPObject* object, std::shared_ptr<Instance> instance)
    : m_object(object), m_instance(std::move(instance)) {
    if (m_instance) {
        m_instance->add(*this);
    }
}

PluginObject::~PluginObject() {
    if (m_instance) {
        m_instance->remove(*this);
    }
}

std::string PluginObject::takeError() {
    return std::exchange(lastError, {});
}

// Ends a call: its exception and its failure become the error of script, and a result that is none is void.
bool PluginObject::finish(bool done, NPVariant* result) {
    if (done && pendingException.empty()) {
        return true;
    }
    // What a call that failed has left there belongs to nobody.
    *result = voidVariant();
    lastError = pendingException.empty() ? kCallFailedText : std::exchange(pendingException, {});
    return false;
}

PluginObject::Read PluginObject::read(NPIdentifier name, NPVariant* result) {
    *result = voidVariant();
    if (!m_instance) {
        lastError = kEndedText;
        return Read::Failed;
    }
    const Use use(m_object);
    const NPClass& calls = *m_object->_class;
    if (calls.hasProperty && calls.hasProperty(m_object, name)) {
        // A property that cannot be read is undefined; only an exception is a failure.
        if (!calls.getProperty || !calls.getProperty(m_object, name, result)) {
            *result = voidVariant();
        }
        return pendingException.empty() || finish(false, result) ? Read::Value : Read::Failed;
    }
    return calls.hasMethod && calls.hasMethod(m_object, name) ? Read::Method : Read::Missing;
}

bool PluginObject::has(NPIdentifier name) {
    if (!m_instance) {
        return false;
    }
    const Use use(m_object);
    const NPClass& calls = *m_object->_class;
    return (calls.hasProperty && calls.hasProperty(m_object, name)) ||
           (calls.hasMethod && calls.hasMethod(m_object, name));
}

PluginObject::Write PluginObject::write(NPIdentifier name, const NPVariant& value) {
    if (!m_instance) {
        lastError = kEndedText;
        return Write::Failed;
    }
    const Use use(m_object);
    const NPClass& calls = *m_object->_class;
    if (calls.hasProperty && calls.hasProperty(m_object, name)) {
        // A property that refuses the value keeps its own, without an exception.
        NPVariant none = voidVariant();
        const bool isWritten = calls.setProperty && calls.setProperty(m_object, name, &value);
        return pendingException.empty() || finish(isWritten, &none) ? Write::Done : Write::Failed;
    }
    return calls.hasMethod && calls.hasMethod(m_object, name) ? Write::Done : Write::Missing;
}

bool PluginObject::remove(NPIdentifier name) {
    if (!m_instance) {
        return false;
    }
    const Use use(m_object);
    const NPClass& calls = *m_object->_class;
    return calls.hasProperty && calls.hasProperty(m_object, name) && calls.removeProperty &&
           calls.removeProperty(m_object, name);
}

std::vector<NPIdentifier> PluginObject::names() {
    std::vector<NPIdentifier> names;
    const NPClass& calls = *m_object->_class;
    if (!m_instance || calls.structVersion < kVersionWithEnumerate || !calls.enumerate) {
        return names;
    }
    const Use use(m_object);
    NPIdentifier* found = nullptr;
    uint32_t count = 0;
    if (calls.enumerate(m_object, &found, &count) && found) {
        names.assign(found, found + count);
        std::free(found);
    }
    return names;
}

// Makes a call of script into the object.
template <typename Call>
bool PluginObject::run(NPVariant* result, Call call) {
    *result = voidVariant();
    if (!m_instance) {
        lastError = kEndedText;
        return false;
    }
    const Use use(m_object);
    return finish(call(*m_object->_class), result);
}

bool PluginObject::call(NPIdentifier method, const Arguments& arguments, NPVariant* result) {
    return run(result, [&](const NPClass& calls) {
        const bool isDone =
            calls.invoke && calls.invoke(m_object, method, arguments.data(), arguments.count(), result);
        if (!isDone && pendingException.empty()) {
            warnOfRefusal(method, arguments);
        }
        return isDone;
    });
}

namespace {

// As the author of a page would say it.
std::string typeNameOf(const NPVariant& value) {
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

} // namespace

// The exception that script gets does not say which call it was, and script may catch it.
void PluginObject::warnOfRefusal(NPIdentifier method, const Arguments& arguments) const {
    Page* const page = m_instance ? m_instance->page() : nullptr;
    if (!page) {
        return;
    }
    std::string call = identifierOf(method).text + '(';
    for (uint32_t i = 0; i < arguments.count(); i++) {
        call += (i > 0 ? ", " : "") + typeNameOf(arguments.data()[i]);
    }
    page->warn("refused-call", call + ')');
}

bool PluginObject::callDefault(const Arguments& arguments, NPVariant* result) {
    return run(result, [&](const NPClass& calls) {
        return calls.invokeDefault &&
               calls.invokeDefault(m_object, arguments.data(), arguments.count(), result);
    });
}

bool PluginObject::construct(const Arguments& arguments, NPVariant* result) {
    return run(result, [&](const NPClass& calls) {
        return calls.structVersion >= kVersionWithConstruct && calls.construct &&
               calls.construct(m_object, arguments.data(), arguments.count(), result);
    });
}

bool PluginObject::isFunction() const {
    const NPClass& calls = *m_object->_class;
    return calls.invokeDefault && !calls.hasProperty && !calls.hasMethod;
}

ScriptEngine* PluginObject::engine() const {
    return m_instance ? m_instance->engine() : nullptr;
}

void PluginObject::setWrapper(std::unique_ptr<ScriptWrapper> wrapper) {
    if (!m_wrapper) {
        m_object->referenceCount++; // that of script
    }
    m_wrapper = std::move(wrapper);
    m_isStrong = true;
    updateHold();
}

void PluginObject::updateHold() {
    const bool shouldBeStrong = m_object->referenceCount > 1;
    if (!m_wrapper || shouldBeStrong == m_isStrong) {
        return;
    }
    m_isStrong = shouldBeStrong;
    if (!shouldBeStrong) {
        m_wrapper->makeWeak();
    } else if (!m_wrapper->makeStrong()) {
        dropWrapper();
    }
}

void PluginObject::wrapperCollected(uint64_t serial) {
    if (m_wrapper && m_wrapper->serial() == serial) {
        dropWrapper();
    }
}

// Script no longer has the object. This may be its end, and then that of the record.
void PluginObject::dropWrapper() {
    m_wrapper = nullptr;
    releaseObject(m_object);
}

void PluginObject::end() {
    if (m_instance) {
        std::exchange(m_instance, nullptr)->remove(*this);
        if (m_object->_class->invalidate) {
            const CallDepth depth;
            m_object->_class->invalidate(m_object);
        }
    }
    if (m_wrapper) {
        dropWrapper();
    }
}

void PluginObject::scriptObjectCollected(NPObject* object, uint64_t wrapperSerial) {
    const std::lock_guard<std::mutex> lock(collected().mutex);
    collected().objects.emplace_back(object, wrapperSerial);
    // Collections come in bulk; one turn of the main loop releases them all.
    if (collected().objects.size() == 1) {
        g_idle_add_full(G_PRIORITY_DEFAULT, releaseCollected, nullptr, nullptr);
    }
}

NPObject* ScriptObjects::retained(ScriptHandle handle) {
    auto& object = m_objects[handle];
    if (object) {
        object->setEvaluatedFor(nullptr);
        object->referenceCount++;
        return object;
    }
    object = new ScriptObject;
    object->_class = &kScriptObjectClass;
    object->referenceCount = 1;
    object->engine = &m_engine;
    object->handle = handle;
    object->table = this;
    object->evaluatedFor = nullptr;
    m_engine.protect(handle);
    return object;
}

void ScriptObjects::end() {
    while (!m_objects.empty()) {
        m_objects.begin()->second->cutOff();
    }
}

ScriptObject* ScriptObject::from(NPObject* object) {
    return object->_class == &kScriptObjectClass ? static_cast<ScriptObject*>(object) : nullptr;
}

void ScriptObject::setEvaluatedFor(Instance* instance) {
    if (evaluatedFor) {
        evaluatedFor->removeResult(*this);
    }
    evaluatedFor = instance;
    if (instance) {
        instance->addResult(*this);
    }
}

void ScriptObject::cutOff() {
    setEvaluatedFor(nullptr);
    if (ScriptEngine* const scriptEngine = std::exchange(engine, nullptr)) {
        table->remove(handle);
        scriptEngine->unprotect(std::exchange(handle, nullptr));
    }
}

} // namespace bridge
