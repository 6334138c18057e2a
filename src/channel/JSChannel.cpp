// The script interface of a channel.
#include "src/channel/JSChannel.h"

namespace {

constexpr const char* kRefusal = "JSChannel class\n";

constexpr ScriptMember kMembers[] = {
    property("onid", reader<&Channel::getOnid>).logged("Onid"),
    property("tsid", reader<&Channel::getTsid>).logged("Tsid"),
    property("sid", reader<&Channel::getSid>).logged("Sid"),
    property("channelType", reader<&Channel::getChannelType>).logged("ChannelType"),
    property("ccid", reader<&Channel::getCcid>).logged("Ccid"),
    property("name", reader<&Channel::getName>).logged("Name"),
    property("dsd", reader<&Channel::getDsd>).logged("Dsd"),
    constant("TYPE_TV", 0).logged("ChannelType_TV"),
    constant("TYPE_RADIO", 1).logged("ChannelType_RADIO"),
    constant("TYPE_OTHER", 2).logged("ChannelType_OTHER"),
};

constexpr ScriptClass kClass = ScriptClass("JSChannel", LogModule::CHANNEL, kMembers)
                                   .refusingMethodsWith(kRefusal)
                                   .refusingWritesWith(kRefusal);

} // namespace

JSChannel::JSChannel(NPP npp) : SubObjectWrapper(npp, kClass) {}
