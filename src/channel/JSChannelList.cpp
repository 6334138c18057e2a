// The script interface of the channel list.
#include "src/channel/JSChannelList.h"

namespace {

constexpr uint32_t kAnyTransportStream = 8191;

// The transport stream may be left open with null.
bool invokeGetChannelByTriplet(PluginBase& model, const NPVariant* args, unsigned int, NPVariant& result) {
    using Id = ScriptArgument<uint32_t>;
    const auto isNull = [](const NPVariant& value) { return value.type == NPVariantType_Null; };
    if (!Id::fits(args[0]) || !(isNull(args[1]) || Id::fits(args[1])) || !Id::fits(args[2])) {
        return false;
    }
    const uint32_t onid = Id::read(args[0]);
    const uint32_t tsid = isNull(args[1]) ? kAnyTransportStream : Id::read(args[1]);
    const uint32_t sid = Id::read(args[2]);
    setResult(result, static_cast<ChannelList&>(model).getChannelByTriplet(onid, tsid, sid));
    return true;
}

constexpr NPObject* (ChannelList::*kGetChannelByCcid)(const std::string&) = &ChannelList::getChannel;

constexpr ScriptMember kMembers[] = {
    method("getChannelByTriplet", invokeGetChannelByTriplet),
    method("item", invoker<&ChannelList::getitem>),
    method("getChannel", invoker<kGetChannelByCcid>),
    property("length", reader<&ChannelList::getLength>),
};

constexpr ScriptArray kArray =
    scriptArray<&ChannelList::getLength, &ChannelList::getitem>(LogModule::CHANNEL, "");

constexpr ScriptClass kClass = ScriptClass("JSChannelList", LogModule::CHANNEL, kMembers).withArray(&kArray);

} // namespace

JSChannelList::JSChannelList(NPP npp) : SubObjectWrapper(npp, kClass) {}
