// Script values and references to script objects, as a test holds them: what the page would hold. Browser
// thread only, while a ScriptedBrowser exists.
#ifndef TELIX_TESTS_SUPPORT_VALUE_H
#define TELIX_TESTS_SUPPORT_VALUE_H

#include <cstdint>
#include <ostream>
#include <string>
#include <type_traits>
#include <variant>
#include <vector>

#include "npapi/npruntime.h"

class Value;
struct Outcome;
using Values = std::vector<Value>;

// The script value `undefined`: a void variant.
struct Undefined {};
inline constexpr Undefined undefined{};
std::ostream& operator<<(std::ostream& stream, Undefined);

// A script name as text, or as the integer of array notation in browsers that intern integers.
class Name {
public:
    Name(const char* text);
    Name(const std::string& text);
    Name(int index);
    NPIdentifier identifier() const { return m_identifier; }

private:
    NPIdentifier m_identifier;
};

// One counted reference of the page's to a script object, and what a script can do with the object. Null if
// empty, and after the browser has closed its page.
class ObjectRef {
public:
    ObjectRef() = default;
    // Adds a reference for the page.
    static ObjectRef share(NPObject* object);
    // Takes over a reference that the plug-in handed out; that the plug-in held none fails the test.
    static ObjectRef adopt(NPObject* object);
    ObjectRef(const ObjectRef& other);
    ObjectRef(ObjectRef&& other) noexcept;
    ObjectRef& operator=(ObjectRef other) noexcept;
    ~ObjectRef();

    NPObject* object() const { return m_object; }
    explicit operator bool() const { return m_object != nullptr; }
    bool operator==(const ObjectRef& other) const { return m_object == other.m_object; }
    bool operator!=(const ObjectRef& other) const { return m_object != other.m_object; }

    // How the border log calls the object; "null" if empty.
    std::string name() const;
    // References that the plug-in holds: all but those of the page.
    int pluginReferences() const;

    // The object's operations, asked as a browser asks them. The existence is asked first, and the operation
    // carried out whatever came of it. A method finds void values after its last argument.
    Outcome get(const Name& name) const;
    Outcome set(const Name& name, const Value& value) const;
    template <class... Arguments>
    Outcome call(const Name& name, const Arguments&... arguments) const;
    Outcome callWith(const Name& name, const Values& arguments) const;
    Outcome callDefault(const Values& arguments = {}) const;
    Outcome construct(const Values& arguments = {}) const;
    bool remove(const Name& name) const;
    bool enumerate() const;
    bool hasProperty(const Name& name) const;
    bool hasMethod(const Name& name) const;

    // Drops the reference.
    void reset();

private:
    void attach(NPObject* object);
    NPObject* detach();

    NPObject* m_object = nullptr;
};

std::ostream& operator<<(std::ostream& stream, const ObjectRef& reference);

// One script value. Equal values have the same type: the integer 1 isn't the double 1.0.
class Value {
public:
    Value() = default;
    Value(Undefined) {}
    Value(std::nullptr_t) : m_content(nullptr) {}
    Value(bool value) : m_content(value) {}
    template <class Integer,
              std::enable_if_t<std::is_integral_v<Integer> && !std::is_same_v<Integer, bool>, int> = 0>
    Value(Integer value) : m_content(static_cast<int32_t>(value)) {}
    Value(double value) : m_content(value) {}
    Value(const char* text) : m_content(std::string(text)) {}
    Value(std::string text) : m_content(std::move(text)) {}
    // An empty reference is null.
    Value(const ObjectRef& object);
    // Any other address is a mistake, not the value true.
    template <class Other>
    Value(const Other*) = delete;

    // A copy of what the plug-in keeps.
    static Value copyOf(const NPVariant& variant);
    // What the plug-in handed out, taking over its reference or memory; the variant becomes void.
    static Value take(NPVariant& variant);
    // Hands the value to the plug-in, which owns the reference or memory then.
    void giveTo(NPVariant& variant) const;

    NPVariantType type() const;
    bool isUndefined() const { return type() == NPVariantType_Void; }
    bool isNull() const { return type() == NPVariantType_Null; }
    bool isObject() const { return type() == NPVariantType_Object; }
    // The content; any other type fails the test and gives an empty one.
    bool boolean() const;
    int32_t integer() const;
    double number() const; // of an integer too
    std::string string() const;
    ObjectRef object() const;

    friend bool operator==(const Value& left, const Value& right) {
        return left.m_content == right.m_content;
    }
    friend bool operator!=(const Value& left, const Value& right) { return !(left == right); }

private:
    template <class Content>
    Content as(const char* what) const;

    std::variant<std::monostate, std::nullptr_t, bool, int32_t, double, std::string, ObjectRef> m_content;
};

std::ostream& operator<<(std::ostream& stream, const Value& value);
// "1, "text", null"
std::string listOf(const Values& values);

// What a browser saw of one operation. Compares with a value, and counts as true, only if the name exists and
// the operation succeeded.
struct Outcome {
    bool exists = false;    // HasProperty or HasMethod
    bool succeeded = false; // what the operation itself returned
    Value value;
    bool inBrowserMemory = false; // a string came in a block of NPN_MemAlloc

    explicit operator bool() const { return exists && succeeded; }
    ObjectRef object() const { return value.object(); }
    friend bool operator==(const Outcome& outcome, const Value& value) {
        return outcome.exists && outcome.succeeded && outcome.value == value;
    }
    friend bool operator==(const Value& value, const Outcome& outcome) { return outcome == value; }
    friend bool operator!=(const Outcome& outcome, const Value& value) { return !(outcome == value); }
};

std::ostream& operator<<(std::ostream& stream, const Outcome& outcome);

// Arguments as they stand in memory during a call: strings without a terminating zero, and readable void
// variants after the last one. Everything stays the browser's.
class ArgumentArray {
public:
    explicit ArgumentArray(const Values& values);
    ArgumentArray(const ArgumentArray&) = delete;
    ArgumentArray& operator=(const ArgumentArray&) = delete;
    ~ArgumentArray();
    const NPVariant* data() const { return m_variants.data(); }
    uint32_t count() const { return m_count; }

private:
    std::vector<NPVariant> m_variants;
    uint32_t m_count;
};

template <class... Arguments>
Outcome ObjectRef::call(const Name& name, const Arguments&... arguments) const {
    return callWith(name, Values{Value(arguments)...});
}

#endif
