// Script's road into a model: identifier, row of the table, operation.
#include "common/ScriptWrapper.h"

#include <algorithm>

#include "common/BrowserGates.h"

ScriptWrapper::ScriptWrapper(NPP npp, const ScriptClass& scriptClass) : m_npp(npp), m_class(scriptClass) {
    PLUGIN_LOG_FOR(m_class.logModule, m_class.name, "Constructor called, This:-- %p --\n",
                   static_cast<void*>(this));
}

ScriptWrapper::~ScriptWrapper() {
    PLUGIN_LOG_FOR(m_class.logModule, m_class.name, "Destructor called, This:-- %p --\n",
                   static_cast<void*>(this));
}

void ScriptWrapper::fetchIdentifiers(NPIdentifier* identifiers) {
    for (size_t i = 0; i < m_class.memberCount; ++i) {
        identifiers[i] = NPN_GetStringIdentifier(m_class.members[i].name);
    }
    m_identifiers = identifiers;
}

const ScriptMember* ScriptWrapper::find(NPIdentifier name) const {
    const NPIdentifier* end = m_identifiers + m_class.memberCount;
    const NPIdentifier* found = std::find(m_identifiers, end, name);
    return found == end ? nullptr : m_class.members + (found - m_identifiers);
}

namespace {

// The index that a name stands for, or -1 if it stands for none of the list.
int indexInRange(const ScriptArray* array, PluginBase* list, NPIdentifier name) {
    if (!array || !list) {
        return -1;
    }
    const int index = getIntFromNPIdentifier(name);
    return index != -1 && static_cast<uint32_t>(index) < array->length(*list) ? index : -1;
}

} // namespace

bool ScriptWrapper::HasMethod(NPIdentifier name) {
    const ScriptMember* member = find(name);
    if (member && member->isMethod()) {
        return true;
    }
    if (m_class.refusalText) {
        PLUGIN_LOG_FOR(m_class.logModule, __func__, "%s", m_class.refusalText);
    }
    return false;
}

bool ScriptWrapper::Invoke(NPIdentifier name, const NPVariant* args, unsigned int argCount,
                           NPVariant* result) {
    PluginBase* target = model();
    if (!target) {
        if (m_class.missingModelText) {
            PLUGIN_LOG_FOR(m_class.logModule, __func__, "%s", m_class.missingModelText);
        }
        return false;
    }
    const ScriptMember* member = find(name);
    if (member && member->isMethod()) {
        PLUGIN_LOG_FOR(m_class.logModule, __func__, " %s%s\n", member->logPrefix, member->logName);
        return member->invoke(*target, args, argCount, *result);
    }
    if (m_class.refusalText) {
        PLUGIN_LOG_FOR(m_class.logModule, __func__, "%s", m_class.refusalText);
    }
    return false;
}

bool ScriptWrapper::InvokeDefault(const NPVariant*, unsigned int, NPVariant*) {
    return false;
}

bool ScriptWrapper::HasProperty(NPIdentifier name) {
    if (const ScriptMember* member = find(name)) {
        return !member->isMethod();
    }
    return indexInRange(m_class.array, model(), name) != -1;
}

bool ScriptWrapper::GetProperty(NPIdentifier name, NPVariant* result) {
    if (m_class.readsStartVoid) {
        setVoid(*result);
    }
    PluginBase* target = model();
    if (!target) {
        return false;
    }
    const ScriptMember* member = find(name);
    if (member && !member->isMethod()) {
        PLUGIN_LOG_FOR(m_class.logModule, __func__, " %s%s\n", member->logPrefix, member->logName);
        if (member->read) {
            return member->read(*target, *result);
        }
        setResult(*result, member->constantValue);
        return true;
    }
    if (!m_class.array || member) {
        return false;
    }
    const int index = indexInRange(m_class.array, target, name);
    if (index == -1) {
        return false;
    }
    PLUGIN_LOG_FOR(m_class.array->logModule, __func__, "%sArray Notation Index:-- %d --\n",
                   m_class.array->logIndent, index);
    setResult(*result, m_class.array->item(*target, static_cast<uint32_t>(index)));
    return true;
}

bool ScriptWrapper::SetProperty(NPIdentifier name, const NPVariant* value) {
    PluginBase* target = model();
    const ScriptMember* member = find(name);
    if (target && member && member->write) {
        PLUGIN_LOG_FOR(m_class.logModule, __func__, " %s%s\n", member->logPrefix, member->logName);
        return member->write(*target, *value);
    }
    if (m_class.refusalText) {
        PLUGIN_LOG_FOR(m_class.logModule, __func__, "%s", m_class.refusalText);
    }
    return false;
}
