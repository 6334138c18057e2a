// The script interface of the embedded configuration object.
#include "src/config/JSOipfConfiguration.h"

#include "src/config/OipfConfiguration.h"

namespace {

constexpr const char* kRefusal = "JSOipfConfiguration class\n";

constexpr ScriptMember kMembers[] = {
    property("keyset", reader<&OipfConfiguration::getKeySetObject>),
    property("configuration", reader<&OipfConfiguration::getConfigurationObject>),
};

constexpr ScriptClass kClass = ScriptClass("JSOipfConfiguration", LogModule::CONFIG, kMembers)
                                   .refusingMethodsWith(kRefusal)
                                   .missingModelSays(kRefusal);

} // namespace

JSOipfConfiguration::JSOipfConfiguration(NPP npp) : EmbeddedObjectWrapper(npp, kClass) {}
