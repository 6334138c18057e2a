// The script interface of an application's private data.
#include "src/application/JSApplicationPrivateData.h"

namespace {

using Model = ApplicationPrivateData;

// quirk 21: an object variant also without an object, never a null variant.
bool readCurrentChannel(PluginBase& model, NPVariant& result) {
    result.type = NPVariantType_Object;
    result.value.objectValue = static_cast<Model&>(model).getCurrChannel();
    return true;
}

constexpr ScriptMember kMembers[] = {
    property("keyset", reader<&Model::keySet>),
    method("getFreeMem", invoker<&Model::getFreeMem>),
    property("currentChannel", readCurrentChannel),
};

constexpr ScriptClass kClass = ScriptClass("JSApplicationPrivateData", LogModule::APP_MGR, kMembers)
                                   .refusingWritesWith("JSApplicationPrivateData class\n");

} // namespace

JSApplicationPrivateData::JSApplicationPrivateData(NPP npp) : SubObjectWrapper(npp, kClass) {}
