// The embedded configuration object and the two sub-objects behind it.
#include "src/config/OipfConfiguration.h"

#include "common/ObjectKind.h"
#include "common/ScriptReferences.h"
#include "src/config/JSConfiguration.h"
#include "src/config/JSKeySet.h"
#include "src/config/JSOipfConfiguration.h"

namespace {

const char* const kMimeTypes[] = {"application/oipfconfiguration", nullptr};

} // namespace

const ObjectKind kOipfConfigurationKind = [] {
    ObjectKind kind{};
    kind.id = 500;
    kind.destroyText = "OIPFCONFIGURATION_OBJ_ID delete :: %p \n";
    kind.mimeTypes = kMimeTypes;
    kind.create = [](NPP npp, unsigned short id) -> PluginBase* { return new OipfConfiguration(npp, id); };
    kind.dispose = disposeOf<OipfConfiguration>;
    return kind;
}();

OipfConfiguration::OipfConfiguration(NPP npp, unsigned short objectId) : PluginBase(npp, objectId) {}

void OipfConfiguration::close() {
    releaseHeld(m_jsObject);
    releaseHeld(m_keySetObject);
    releaseHeld(m_configurationObject);
}

NPObject* OipfConfiguration::getJSObject() {
    return handOutOnce<JSOipfConfiguration>(getBrowser(), m_jsObject);
}

NPObject* OipfConfiguration::getKeySetObject() {
    // quirk 22: made for this object's own instance, which has no application manager.
    return handOutOnce<JSKeySet>(getBrowser(), m_keySetObject);
}

NPObject* OipfConfiguration::getConfigurationObject() {
    return handOutOnce<JSConfiguration>(getBrowser(), m_configurationObject);
}
