// Objects and functions of the page: what script itself would make. They are handles; copies share the
// object.
#ifndef TELIX_TESTS_SUPPORT_PAGEOBJECTS_H
#define TELIX_TESTS_SUPPORT_PAGEOBJECTS_H

#include <functional>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "tests/support/Value.h"

// What a function of the page does: gives its result, or nothing if it throws.
using ScriptBody = std::function<std::optional<Value>(const Values& arguments)>;

// A plain object. Its properties are read and written with get() and set(), as by script; a property that it
// doesn't have reads as undefined.
class ScriptObject : public ObjectRef {
public:
    ScriptObject() = default;
    static ScriptObject make(const std::string& name);

    // Gives the object a method, or another body to one that it has.
    void method(const std::string& name, ScriptBody body) const;
    // The arguments of each call of a method so far.
    std::vector<Values> calls(const std::string& method) const;
    // Reads, writes and calls of this name fail from now on.
    void refuse(const std::string& name) const;

protected:
    explicit ScriptObject(ObjectRef reference) : ObjectRef(std::move(reference)) {}
};

// A function object, such as a listener. It keeps the arguments of its calls, with the references in them.
class ScriptFunction : public ScriptObject {
public:
    ScriptFunction() = default;
    static ScriptFunction make(const std::string& name);

    size_t count() const { return calls().size(); }
    std::vector<Values> calls() const;
    // The arguments of the last call; the test fails if there was none.
    Values last() const;
    // What the function does when it is called; undefined is its result otherwise.
    void does(ScriptBody body) const;
    void throws() const {
        does([](const Values&) { return std::nullopt; });
    }

private:
    using ScriptObject::ScriptObject;
};

// The object behind the handles.
struct PageObject : NPObject {
    explicit PageObject(std::string objectName);
    // Lets go of everything that the object refers to.
    void forget();

    std::string name;
    std::map<std::string, Value> properties;
    std::map<std::string, ScriptBody> methods;
    std::map<std::string, std::vector<Values>> methodCalls;
    std::set<std::string> refused;
    ScriptBody body;
    std::vector<Values> calls;

    static NPClass* pageClass();
    // The page object, or null if the object is of another class.
    static PageObject* from(NPObject* object);
};

#endif
