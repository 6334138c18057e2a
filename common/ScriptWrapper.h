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
    const ScriptArray* array = nullptr;     // of the list classes
    const char* refusalText = nullptr;      // logged by HasMethod, Invoke and SetProperty when they refuse
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
    constexpr ScriptClass refusingWith(const char* text) const {
        ScriptClass copy = *this;
        copy.refusalText = text;
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

class ScriptWrapper : public JSPluginBase {
public:
    bool HasMethod(NPIdentifier name) override;
    bool Invoke(NPIdentifier name, const NPVariant* args, unsigned int argCount, NPVariant* result) override;
    bool InvokeDefault(const NPVariant* args, unsigned int argCount, NPVariant* result) override;
    bool HasProperty(NPIdentifier name) override;
    bool GetProperty(NPIdentifier name, NPVariant* result) override;
    bool SetProperty(NPIdentifier name, const NPVariant* value) override;

protected:
    ScriptWrapper(NPP npp, const ScriptClass& scriptClass);
    ~ScriptWrapper() override;

    // Fetches the identifiers of the table's names, in its order, into a place that lives as long as the
    // wrapper.
    void fetchIdentifiers(NPIdentifier* identifiers);

    // The model behind the wrapper at this moment, or null.
    virtual PluginBase* model() = 0;

    NPP m_npp;

private:
    // The row of a name, null if the class has none: a run of address comparisons, no string work.
    const ScriptMember* find(NPIdentifier name) const;

    const ScriptClass& m_class;
    const NPIdentifier* m_identifiers = nullptr;
};

// A wrapper with room for the identifiers of `Count` names.
template <size_t Count>
class SizedScriptWrapper : public ScriptWrapper {
protected:
    SizedScriptWrapper(NPP npp, const ScriptClass& scriptClass) : ScriptWrapper(npp, scriptClass) {
        assert(scriptClass.memberCount == Count);
        fetchIdentifiers(m_identifiers);
    }

private:
    NPIdentifier m_identifiers[Count];
};

// The wrapper of an object that the browser instantiates: finds its model through the instance at every call,
// since it can outlive it.
template <size_t Count>
class EmbeddedObjectWrapper : public SizedScriptWrapper<Count> {
protected:
    using SizedScriptWrapper<Count>::SizedScriptWrapper;

    PluginBase* model() override { return static_cast<PluginBase*>(this->m_npp->pdata); }
};

// The wrapper of a sub-object: makes its model and owns it.
template <class Model, size_t Count>
class SubObjectWrapper : public SizedScriptWrapper<Count> {
public:
    Model* impl() const { return m_impl; }

protected:
    SubObjectWrapper(NPP npp, const ScriptClass& scriptClass)
        : SizedScriptWrapper<Count>(npp, scriptClass), m_impl(new Model(npp)) {}
    ~SubObjectWrapper() override { delete m_impl; }

    PluginBase* model() override { return m_impl; }

private:
    Model* m_impl;
};

#endif
