// The script interface of the capabilities object.
#include "src/capabilities/JSCapabilities.h"

#include "src/capabilities/Capabilities.h"

namespace {

constexpr ScriptMember kMembers[] = {
    property("xmlCapabilities", read<&Capabilities::getxmlCapabilities>),
    method("hasCapability", invoke<&Capabilities::hasCapability>),
    property("extraSDVideoDecodes", read<&Capabilities::getExtraSDVideoDecodes>),
    property("extraHDVideoDecodes", read<&Capabilities::getExtraHDVideoDecodes>),
};

constexpr ScriptClass kClass("JSCapabilities", LogModule::CAPABILITIES, kMembers);

} // namespace

JSCapabilities::JSCapabilities(NPP npp) : EmbeddedObjectWrapper(npp, kClass) {}
