// The script interface of the channel configuration.
#include "src/channel/JSChannelConfig.h"

namespace {

constexpr const char* kRefusal = "JSChannelConfig class\n";

constexpr ScriptMember kMembers[] = {
    property("channelList", reader<&ChannelConfig::getChannelList>),
};

constexpr ScriptClass kClass = ScriptClass("JSChannelConfig", LogModule::CHANNEL, kMembers)
                                   .refusingMethodsWith(kRefusal)
                                   .refusingWritesWith(kRefusal);

} // namespace

JSChannelConfig::JSChannelConfig(NPP npp) : SubObjectWrapper(npp, kClass) {}
