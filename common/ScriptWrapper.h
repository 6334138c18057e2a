// The one implementation of a script wrapper: looks names up in the class's table and leads them to the
// model. A wrapper class adds its table, and whatever it does differently. Browser thread only.
#ifndef TELIX_COMMON_SCRIPTWRAPPER_H
#define TELIX_COMMON_SCRIPTWRAPPER_H

#include <cassert>

#include "common/JSPluginBase.h"
#include "common/ScriptInterface.h"

// What all objects of a wrapper class have in common; a constant beside the class's table.
struct ScriptClass {
    const char* name;
    LogModule logModule;
    const ScriptMember* members;
    size_t memberCount;
    const ScriptArray* array = nullptr; // of the list classes
    // What an operation logs when it refuses; each class logs with some operations and is silent with others.
    const char* hasMethodRefusal = nullptr;
    const char* invokeRefusal = nullptr;
    const char* setPropertyRefusal = nullptr;
    const char* missingModelText = nullptr; // logged by Invoke without a model
    bool readsStartVoid = true;             // whether GetProperty sets the result to void first

    template <size_t Count>
    constexpr ScriptClass(const char* className, LogModule module, const ScriptMember (&table)[Count])
        : name(className), logModule(module), members(table), memberCount(Count) {}

    constexpr ScriptClass withArray(const ScriptArray* access) const {
        ScriptClass copy = *this;
        copy.array = access;
        return copy;
    }
    constexpr ScriptClass refusingMethodsWith(const char* text) const {
        ScriptClass copy = *this;
        copy.hasMethodRefusal = text;
        copy.invokeRefusal = text;
        return copy;
    }
    constexpr ScriptClass refusingWritesWith(const char* text) const {
        ScriptClass copy = *this;
        copy.setPropertyRefusal = text;
        return copy;
    }
    constexpr ScriptClass missingModelSays(const char* text) const {
        ScriptClass copy = *this;
        copy.missingModelText = text;
        return copy;
    }
    constexpr ScriptClass keepingUnreadResults() const {
        ScriptClass copy = *this;
        copy.readsStartVoid = false;
        return copy;
    }
};

// The part of a wrapper that does not depend on its size: what a name's row has done.
class ScriptWrapper : public JSPluginBase {
public:
    bool InvokeDefault(const NPVariant* args, unsigned int argCount, NPVariant* result) override;

    const ScriptClass& scriptClass() const { return m_class; }

protected:
    ScriptWrapper(NPP npp, const ScriptClass& scriptClass);

    // The first statement of a destructor, under its own name.
    void logDestructor() const;

    // Fetches the identifiers of the table's names, in its order.
    void fetchIdentifiers(NPIdentifier* identifiers) const;

    // The rest of the virtual operations after the look-up. `member` is the name's row, null if the class
    // has none; `model` is the model at this moment, or null.
    bool refuseMethod() const;
    bool invokeMember(const ScriptMember* member, PluginBase* model, const NPVariant* args,
                      unsigned int argCount, NPVariant* result) const;
    bool hasIndex(PluginBase* model, NPIdentifier name) const;
    bool readMember(const ScriptMember* member, PluginBase* model, NPIdentifier name,
                    NPVariant* result) const;
    bool writeMember(const ScriptMember* member, PluginBase* model, const NPVariant* value) const;

    NPP m_npp;
    const ScriptClass& m_class;
};

// A wrapper with room for the identifiers of `Count` names. `Self` derives from it and has model(). Looking a
// name up is a run of address comparisons over adjacent fields, no string work.
template <class Self, size_t Count>
class SizedScriptWrapper : public ScriptWrapper {
public:
    bool HasMethod(NPIdentifier name) override {
        const ScriptMember* member = find(name);
        return (member && member->isMethod()) || refuseMethod();
    }

    bool Invoke(NPIdentifier name, const NPVariant* args, unsigned int argCount, NPVariant* result) override {
        return invokeMember(find(name), currentModel(), args, argCount, result);
    }

    bool HasProperty(NPIdentifier name) override {
        const ScriptMember* member = find(name);
        return (member && !member->isMethod()) || (m_class.array && hasIndex(currentModel(), name));
    }

    bool GetProperty(NPIdentifier name, NPVariant* result) override {
        return readMember(find(name), currentModel(), name, result);
    }

    bool SetProperty(NPIdentifier name, const NPVariant* value) override {
        return writeMember(find(name), currentModel(), value);
    }

protected:
    SizedScriptWrapper(NPP npp, const ScriptClass& scriptClass) : ScriptWrapper(npp, scriptClass) {
        assert(scriptClass.memberCount == Count);
        fetchIdentifiers(m_identifiers);
    }

private:
    PluginBase* currentModel() const { return static_cast<const Self*>(this)->model(); }

    const ScriptMember* find(NPIdentifier name) const {
        return find(name, std::make_index_sequence<Count>{});
    }

    template <size_t... Index>
    const ScriptMember* find(NPIdentifier name, std::index_sequence<Index...>) const {
        const ScriptMember* found = nullptr;
        static_cast<void>(((m_identifiers[Index] == name && (found = m_class.members + Index, true)) || ...));
        return found;
    }

    NPIdentifier m_identifiers[Count];
};

// The wrapper of an object that the browser instantiates: finds its model through the instance at every call,
// since it can outlive it.
template <size_t Count>
class EmbeddedObjectWrapper : public SizedScriptWrapper<EmbeddedObjectWrapper<Count>, Count> {
public:
    // The model at this moment; null once the instance has been destroyed.
    PluginBase* model() const { return static_cast<PluginBase*>(this->m_npp->pdata); }

protected:
    EmbeddedObjectWrapper(NPP npp, const ScriptClass& scriptClass)
        : SizedScriptWrapper<EmbeddedObjectWrapper, Count>(npp, scriptClass) {}
    ~EmbeddedObjectWrapper() override { this->logDestructor(); }
};

// The wrapper of a sub-object: makes its model and owns it.
template <class Model, size_t Count>
class SubObjectWrapper : public SizedScriptWrapper<SubObjectWrapper<Model, Count>, Count> {
public:
    Model* impl() const { return m_impl; }
    PluginBase* model() const { return m_impl; }

protected:
    SubObjectWrapper(NPP npp, const ScriptClass& scriptClass)
        : SizedScriptWrapper<SubObjectWrapper, Count>(npp, scriptClass), m_impl(new Model(npp)) {}
    ~SubObjectWrapper() override {
        endModel([](Model&) {});
    }

    // What every wrapper's destructor does: logs, then deletes the model. A class that has something to do
    // between the two calls this in its own destructor, with that as `before`.
    template <class Before>
    void endModel(Before before) {
        if (m_impl) {
            this->logDestructor();
            before(*m_impl);
            delete m_impl;
            m_impl = nullptr;
        }
    }

private:
    Model* m_impl; // null once the destructor has deleted it
};

#endif
