// The script interface of the DRM agent.
#include "src/drm/JSDRMAgent.h"

#include "src/drm/DRMAgent.h"

namespace {

// The operation as the idiom has it, with the id in the log.
bool sendDRMMessage(PluginBase& model, const NPVariant* args, unsigned int, NPVariant& result) {
    using Texts = std::tuple<std::string, std::string, std::string>;
    if (!argumentsFit<Texts>(args)) {
        return false;
    }
    const auto [type, message, systemId] = readArguments<Texts>(args);
    const std::string id = static_cast<DRMAgent&>(model).sendDRMMessage(type, message, systemId);
    PLUGIN_LOG_FOR(LogModule::DRMAGENT, "Invoke", " msgID == %s\n", id.c_str());
    setResult(result, id);
    return true;
}

constexpr ScriptMember kMembers[] = {
    property("onDRMMessageResult", reader<&DRMAgent::getOnDRMMessageResult>,
             listenerWriter<&DRMAgent::setOnDRMMessageResult>),
    method("sendDRMMessage", sendDRMMessage),
};

constexpr ScriptClass kClass =
    ScriptClass("JSDRMAgent", LogModule::DRMAGENT, kMembers).missingModelSays(" Can't find plugin pointer\n");

} // namespace

JSDRMAgent::JSDRMAgent(NPP npp) : EmbeddedObjectWrapper(npp, kClass) {}
