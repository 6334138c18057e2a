// Script's road into a model: identifier, row of the table, operation.
#include "common/ScriptWrapper.h"

#include "common/BrowserGates.h"

ScriptWrapper::ScriptWrapper(NPP npp, const ScriptClass& scriptClass) : m_npp(npp), m_class(scriptClass) {
    PLUGIN_LOG_FOR(m_class.logModule, m_class.name, "Constructor called, This:-- %p --\n",
                   static_cast<void*>(this));
}

void ScriptWrapper::logDestructor() const {
    PLUGIN_LOG_FOR(m_class.logModule, ("~" + std::string(m_class.name)).c_str(),
                   "Destructor called, This:-- %p --\n", static_cast<const void*>(this));
}

void ScriptWrapper::fetchIdentifiers(NPIdentifier* identifiers) const {
    for (size_t i = 0; i < m_class.memberCount; ++i) {
        identifiers[i] = NPN_GetStringIdentifier(m_class.members[i].name);
    }
}

namespace {

// The index that a name stands for, or -1 if it stands for none of the list.
int indexInRange(const ScriptArray& array, PluginBase& list, NPIdentifier name) {
    const int index = getIntFromNPIdentifier(name);
    return index != -1 && static_cast<uint32_t>(index) < array.length(list) ? index : -1;
}

void logRefusal(const ScriptClass& scriptClass, const char* operation, const char* text) {
    if (text) {
        PLUGIN_LOG_FOR(scriptClass.logModule, operation, "%s", text);
    }
}

void logMember(const ScriptClass& scriptClass, const char* operation, const ScriptMember& member) {
    PLUGIN_LOG_FOR(scriptClass.logModule, operation, " %s%s\n", member.logPrefix, member.logName);
}

} // namespace

bool ScriptWrapper::refuseMethod() const {
    logRefusal(m_class, "HasMethod", m_class.hasMethodRefusal);
    return false;
}

bool ScriptWrapper::invokeMember(const ScriptMember* member, PluginBase* model, const NPVariant* args,
                                 unsigned int argCount, NPVariant* result) const {
    if (!model) {
        logRefusal(m_class, "Invoke", m_class.missingModelText);
        return false;
    }
    if (member && member->isMethod()) {
        logMember(m_class, "Invoke", *member);
        const CallGuard guard(*model);
        return member->invoke(*model, args, argCount, *result);
    }
    logRefusal(m_class, "Invoke", m_class.invokeRefusal);
    return false;
}

bool ScriptWrapper::InvokeDefault(const NPVariant*, unsigned int, NPVariant*) {
    return false;
}

bool ScriptWrapper::hasIndex(PluginBase* model, NPIdentifier name) const {
    return model && indexInRange(*m_class.array, *model, name) != -1;
}

bool ScriptWrapper::readMember(const ScriptMember* member, PluginBase* model, NPIdentifier name,
                               NPVariant* result) const {
    if (m_class.readsStartVoid) {
        setVoid(*result);
    }
    if (member && member->isConstant()) { // which an object that has gone leaves behind
        logMember(m_class, "GetProperty", *member);
        setResult(*result, member->constantValue);
        return true;
    }
    if (!model) {
        return false;
    }
    if (member && member->read) {
        logMember(m_class, "GetProperty", *member);
        const CallGuard guard(*model);
        return member->read(*model, *result);
    }
    const ScriptArray* array = m_class.array;
    const int index = array ? indexInRange(*array, *model, name) : -1;
    if (index == -1) {
        return false;
    }
    PLUGIN_LOG_FOR(array->logModule, "GetProperty", "%sArray Notation Index:-- %d --\n", array->logIndent,
                   index);
    setResult(*result, array->item(*model, static_cast<uint32_t>(index)));
    return true;
}

bool ScriptWrapper::writeMember(const ScriptMember* member, PluginBase* model, const NPVariant* value) const {
    if (model && member && member->write) {
        logMember(m_class, "SetProperty", *member);
        const CallGuard guard(*model);
        return member->write(*model, *value);
    }
    logRefusal(m_class, "SetProperty", m_class.setPropertyRefusal);
    return false;
}
