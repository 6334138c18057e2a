// The script interface of the channel configuration.
#include "src/channel/JSChannelConfig.h"

namespace {

constexpr ScriptMember kMembers[] = {
    property("channelList", read<&ChannelConfig::getChannelList>),
};

constexpr ScriptClass kClass =
    ScriptClass("JSChannelConfig", LogModule::CHANNEL, kMembers).refusingWith("JSChannelConfig class\n");

} // namespace

JSChannelConfig::JSChannelConfig(NPP npp) : SubObjectWrapper(npp, kClass) {}
