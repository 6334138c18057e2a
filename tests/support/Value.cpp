// Script values, references to script objects, and the operations of a script on an object.
#include "tests/support/Value.h"

#include <cstdlib>
#include <cstring>
#include <utility>

#include <gtest/gtest.h>

#include "tests/support/ScriptedBrowser.h"

namespace {

// Behind the arguments of a call: as many as the longest argument list of any method.
constexpr size_t kPaddingVariants = 16;

const NPVariant kVoidVariant{};

// A string's bytes in a block of just that size, so that a reader who expects a zero after them is caught by
// the sanitizer.
char* bareCopy(const std::string& text) {
    char* block = static_cast<char*>(std::malloc(text.empty() ? 1 : text.size()));
    std::memcpy(block, text.data(), text.size());
    return block;
}

} // namespace

std::ostream& operator<<(std::ostream& stream, Undefined) {
    return stream << "undefined";
}

Name::Name(const char* text) : m_identifier(ScriptedBrowser::identifier(text)) {}
Name::Name(const std::string& text) : m_identifier(ScriptedBrowser::identifier(text)) {}
Name::Name(int index) : m_identifier(ScriptedBrowser::identifier(index)) {}

ObjectRef ObjectRef::share(NPObject* object) {
    ObjectRef reference;
    if (object && ScriptedBrowser::current().pageRetain(object)) {
        reference.attach(object);
    }
    return reference;
}

ObjectRef ObjectRef::adopt(NPObject* object) {
    ObjectRef reference;
    if (object && ScriptedBrowser::current().pageAdopt(object)) {
        reference.attach(object);
    }
    return reference;
}

ObjectRef::ObjectRef(const ObjectRef& other) {
    if (other.m_object) {
        ScriptedBrowser::current().pageRetain(other.m_object);
        attach(other.m_object);
    }
}

ObjectRef::ObjectRef(ObjectRef&& other) noexcept {
    attach(other.detach());
}

ObjectRef& ObjectRef::operator=(ObjectRef other) noexcept {
    NPObject* const mine = detach();
    attach(other.detach());
    other.attach(mine);
    return *this;
}

ObjectRef::~ObjectRef() {
    reset();
}

void ObjectRef::reset() {
    if (NPObject* const object = detach()) {
        ScriptedBrowser::current().pageRelease(object);
    }
}

void ObjectRef::attach(NPObject* object) {
    m_object = object;
    if (object) {
        ScriptedBrowser::current().addPageReference(this);
    }
}

// A reference that outlives its browser is empty by then.
NPObject* ObjectRef::detach() {
    if (m_object) {
        ScriptedBrowser::current().removePageReference(this);
    }
    return std::exchange(m_object, nullptr);
}

std::string ObjectRef::name() const {
    return m_object ? ScriptedBrowser::current().nameOf(m_object) : "null";
}

int ObjectRef::pluginReferences() const {
    return m_object ? ScriptedBrowser::current().pluginReferences(m_object) : 0;
}

bool ObjectRef::hasProperty(const Name& name) const {
    return m_object && m_object->_class->hasProperty &&
           m_object->_class->hasProperty(m_object, name.identifier());
}

bool ObjectRef::hasMethod(const Name& name) const {
    return m_object && m_object->_class->hasMethod &&
           m_object->_class->hasMethod(m_object, name.identifier());
}

namespace {

Outcome finish(bool exists, bool succeeded, NPVariant& result) {
    Outcome outcome;
    outcome.exists = exists;
    outcome.succeeded = succeeded;
    outcome.inBrowserMemory =
        result.type == NPVariantType_String &&
        ScriptedBrowser::current().isBrowserMemory(result.value.stringValue.UTF8Characters);
    if (succeeded) {
        outcome.value = Value::take(result);
    }
    return outcome;
}

} // namespace

Outcome ObjectRef::get(const Name& name) const {
    if (!m_object) {
        ADD_FAILURE() << "A property of null was read.";
        return {};
    }
    const ObjectRef kept = *this;
    const bool exists = hasProperty(name);
    NPVariant result = kVoidVariant;
    const bool succeeded =
        m_object->_class->getProperty && m_object->_class->getProperty(m_object, name.identifier(), &result);
    return finish(exists, succeeded, result);
}

Outcome ObjectRef::set(const Name& name, const Value& value) const {
    if (!m_object) {
        ADD_FAILURE() << "A property of null was written.";
        return {};
    }
    const ObjectRef kept = *this;
    Outcome outcome;
    outcome.exists = hasProperty(name);
    const ArgumentArray array({value});
    outcome.succeeded = m_object->_class->setProperty &&
                        m_object->_class->setProperty(m_object, name.identifier(), array.data());
    return outcome;
}

Outcome ObjectRef::callWith(const Name& name, const Values& arguments) const {
    if (!m_object) {
        ADD_FAILURE() << "A method of null was called.";
        return {};
    }
    const ObjectRef kept = *this;
    const bool exists = hasMethod(name);
    const ArgumentArray array(arguments);
    NPVariant result = kVoidVariant;
    const bool succeeded =
        m_object->_class->invoke &&
        m_object->_class->invoke(m_object, name.identifier(), array.data(), array.count(), &result);
    return finish(exists, succeeded, result);
}

Outcome ObjectRef::callDefault(const Values& arguments) const {
    const ArgumentArray array(arguments);
    NPVariant result = kVoidVariant;
    const bool succeeded = m_object && m_object->_class->invokeDefault &&
                           m_object->_class->invokeDefault(m_object, array.data(), array.count(), &result);
    return finish(true, succeeded, result);
}

Outcome ObjectRef::construct(const Values& arguments) const {
    const ArgumentArray array(arguments);
    NPVariant result = kVoidVariant;
    const bool succeeded = m_object && m_object->_class->construct &&
                           m_object->_class->construct(m_object, array.data(), array.count(), &result);
    return finish(true, succeeded, result);
}

bool ObjectRef::remove(const Name& name) const {
    return m_object && m_object->_class->removeProperty &&
           m_object->_class->removeProperty(m_object, name.identifier());
}

bool ObjectRef::enumerate() const {
    NPIdentifier* names = nullptr;
    uint32_t count = 0;
    const bool succeeded =
        m_object && m_object->_class->enumerate && m_object->_class->enumerate(m_object, &names, &count);
    if (names) {
        ScriptedBrowser::current().freeBlock(names);
    }
    return succeeded;
}

std::ostream& operator<<(std::ostream& stream, const ObjectRef& reference) {
    return stream << reference.name();
}

Value::Value(const ObjectRef& object) {
    if (object) {
        m_content = object;
    } else {
        m_content = nullptr;
    }
}

Value Value::copyOf(const NPVariant& variant) {
    switch (variant.type) {
    case NPVariantType_Void:
        return {};
    case NPVariantType_Null:
        return nullptr;
    case NPVariantType_Bool:
        return variant.value.boolValue;
    case NPVariantType_Int32:
        return variant.value.intValue;
    case NPVariantType_Double:
        return variant.value.doubleValue;
    case NPVariantType_String:
        return std::string(variant.value.stringValue.UTF8Characters, variant.value.stringValue.UTF8Length);
    case NPVariantType_Object:
        return ObjectRef::share(variant.value.objectValue);
    }
    ADD_FAILURE() << "A variant of the unknown type " << static_cast<int>(variant.type) << ".";
    return {};
}

Value Value::take(NPVariant& variant) {
    Value value;
    if (variant.type == NPVariantType_Object) {
        value = ObjectRef::adopt(variant.value.objectValue);
    } else {
        value = copyOf(variant);
        if (variant.type == NPVariantType_String) {
            ScriptedBrowser::current().freeBlock(const_cast<char*>(variant.value.stringValue.UTF8Characters));
        }
    }
    variant = kVoidVariant;
    return value;
}

void Value::giveTo(NPVariant& variant) const {
    variant = kVoidVariant;
    variant.type = type();
    switch (type()) {
    case NPVariantType_Bool:
        variant.value.boolValue = boolean();
        break;
    case NPVariantType_Int32:
        variant.value.intValue = integer();
        break;
    case NPVariantType_Double:
        variant.value.doubleValue = number();
        break;
    case NPVariantType_String: {
        const std::string text = string();
        variant.value.stringValue = {ScriptedBrowser::current().newBlockOf(text),
                                     static_cast<uint32_t>(text.size())};
        break;
    }
    case NPVariantType_Object:
        variant.value.objectValue = object().object();
        ScriptedBrowser::current().giveReference(variant.value.objectValue);
        break;
    default:
        break;
    }
}

NPVariantType Value::type() const {
    return static_cast<NPVariantType>(m_content.index());
}

template <class Content>
Content Value::as(const char* what) const {
    if (const Content* content = std::get_if<Content>(&m_content)) {
        return *content;
    }
    ADD_FAILURE() << "Not " << what << ": " << *this;
    return {};
}

bool Value::boolean() const {
    return as<bool>("a boolean");
}

int32_t Value::integer() const {
    return as<int32_t>("an integer");
}

double Value::number() const {
    return type() == NPVariantType_Int32 ? integer() : as<double>("a number");
}

std::string Value::string() const {
    return as<std::string>("a string");
}

ObjectRef Value::object() const {
    return as<ObjectRef>("an object");
}

std::ostream& operator<<(std::ostream& stream, const Value& value) {
    switch (value.type()) {
    case NPVariantType_Void:
        return stream << undefined;
    case NPVariantType_Null:
        return stream << "null";
    case NPVariantType_Bool:
        return stream << (value.boolean() ? "true" : "false");
    case NPVariantType_Int32:
        return stream << value.integer();
    case NPVariantType_Double:
        return stream << "double " << value.number();
    case NPVariantType_String:
        return stream << '"' << value.string() << '"';
    case NPVariantType_Object:
        return stream << value.object();
    }
    return stream;
}

std::string listOf(const Values& values) {
    std::ostringstream text;
    const char* separator = "";
    for (const Value& value : values) {
        text << separator << value;
        separator = ", ";
    }
    return text.str();
}

std::ostream& operator<<(std::ostream& stream, const Outcome& outcome) {
    if (!outcome.exists) {
        stream << "(no such name) ";
    }
    if (!outcome.succeeded) {
        return stream << "(refused)";
    }
    return stream << outcome.value;
}

ArgumentArray::ArgumentArray(const Values& values)
    : m_variants(values.size() + kPaddingVariants, kVoidVariant),
      m_count(static_cast<uint32_t>(values.size())) {
    for (size_t i = 0; i < values.size(); ++i) {
        NPVariant& variant = m_variants[i];
        variant.type = values[i].type();
        switch (variant.type) {
        case NPVariantType_Bool:
            variant.value.boolValue = values[i].boolean();
            break;
        case NPVariantType_Int32:
            variant.value.intValue = values[i].integer();
            break;
        case NPVariantType_Double:
            variant.value.doubleValue = values[i].number();
            break;
        case NPVariantType_String: {
            const std::string text = values[i].string();
            variant.value.stringValue = {bareCopy(text), static_cast<uint32_t>(text.size())};
            break;
        }
        case NPVariantType_Object:
            variant.value.objectValue = values[i].object().object();
            break;
        default:
            break;
        }
    }
}

ArgumentArray::~ArgumentArray() {
    for (size_t i = 0; i < m_count; ++i) {
        if (m_variants[i].type == NPVariantType_String) {
            std::free(const_cast<char*>(m_variants[i].value.stringValue.UTF8Characters));
        }
    }
}
