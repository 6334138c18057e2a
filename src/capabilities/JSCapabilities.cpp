// The script interface of the capabilities object.
#include "src/capabilities/JSCapabilities.h"

#include "src/capabilities/Capabilities.h"

namespace {

constexpr ScriptMember kMembers[] = {
    property("xmlCapabilities", reader<&Capabilities::getxmlCapabilities>),
    method("hasCapability", invoker<&Capabilities::hasCapability>),
    property("extraSDVideoDecodes", reader<&Capabilities::getExtraSDVideoDecodes>),
    property("extraHDVideoDecodes", reader<&Capabilities::getExtraHDVideoDecodes>),
};

constexpr ScriptClass kClass("JSCapabilities", LogModule::CAPABILITIES, kMembers);

} // namespace

JSCapabilities::JSCapabilities(NPP npp) : EmbeddedObjectWrapper(npp, kClass) {}
