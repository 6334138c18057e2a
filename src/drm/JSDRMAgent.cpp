// The script interface of the DRM agent.
#include "src/drm/JSDRMAgent.h"

#include "src/drm/DRMAgent.h"

namespace {

// The operation as the idiom has it, with the id in the log.
bool sendDRMMessage(PluginBase& model, const NPVariant* args, unsigned int, NPVariant& result) {
    using Text = ScriptArgument<std::string>;
    if (!Text::fits(args[0]) || !Text::fits(args[1]) || !Text::fits(args[2])) {
        return false;
    }
    const std::string id = static_cast<DRMAgent&>(model).sendDRMMessage(
        Text::read(args[0]), Text::read(args[1]), Text::read(args[2]));
    PLUGIN_LOG_FOR(LogModule::DRMAGENT, "Invoke", " msgID == %s\n", id.c_str());
    setResult(result, id);
    return true;
}

constexpr ScriptMember kMembers[] = {
    property("onDRMMessageResult", read<&DRMAgent::getOnDRMMessageResult>,
             writeListener<&DRMAgent::setOnDRMMessageResult>),
    method("sendDRMMessage", sendDRMMessage),
};

constexpr ScriptClass kClass =
    ScriptClass("JSDRMAgent", LogModule::DRMAGENT, kMembers).missingModelSays(" Can't find plugin pointer\n");

} // namespace

JSDRMAgent::JSDRMAgent(NPP npp) : EmbeddedObjectWrapper(npp, kClass) {}
