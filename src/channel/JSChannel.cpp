// The script interface of a channel.
#include "src/channel/JSChannel.h"

namespace {

constexpr const char* kRefusal = "JSChannel class\n";

constexpr ScriptMember kMembers[] = {
    property("onid", read<&Channel::getOnid>).logged("Onid"),
    property("tsid", read<&Channel::getTsid>).logged("Tsid"),
    property("sid", read<&Channel::getSid>).logged("Sid"),
    property("channelType", read<&Channel::getChannelType>).logged("ChannelType"),
    property("ccid", read<&Channel::getCcid>).logged("Ccid"),
    property("name", read<&Channel::getName>).logged("Name"),
    property("dsd", read<&Channel::getDsd>).logged("Dsd"),
    constant("TYPE_TV", 0).logged("ChannelType_TV"),
    constant("TYPE_RADIO", 1).logged("ChannelType_RADIO"),
    constant("TYPE_OTHER", 2).logged("ChannelType_OTHER"),
};

constexpr ScriptClass kClass = ScriptClass("JSChannel", LogModule::CHANNEL, kMembers)
                                   .refusingMethodsWith(kRefusal)
                                   .refusingWritesWith(kRefusal);

} // namespace

JSChannel::JSChannel(NPP npp) : SubObjectWrapper(npp, kClass) {}
