// The channel list: built from handles; its searches find the first entry that matches.
#include "src/channel/ChannelList.h"

#include <strings.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <optional>

#include "common/Log.h"
#include "src/channel/JSChannel.h"
#include "telix/telix_platform.h"

namespace {

// The handle with this ccid. Nothing for other strings, which only a channel without a handle can have.
std::optional<uint32_t> handleOfCcid(const std::string& ccid) {
    const auto number = static_cast<int32_t>(std::strtol(ccid.c_str(), nullptr, 10));
    const bool isHandle = number != 0 && std::strcmp(std::to_string(number).c_str(), ccid.c_str()) == 0;
    return isHandle ? std::optional(static_cast<uint32_t>(number)) : std::nullopt;
}

} // namespace

ChannelList::ChannelList(NPP npp) : PluginBase(npp) {}

void ChannelList::initialize(const uint32_t* handles, unsigned int count) {
    m_channels.setLength(0);
    m_byHandle.clear();
    if (!handles) {
        return;
    }
    m_channels.fillUpTo(count, m_npp, [handles](JSChannel& wrapper, uint32_t index) {
        wrapper.impl()->setChannelHandle(handles[index]);
        PLUGIN_LOG_FOR(LogModule::CHANNEL, "initialize", "Channel Object =( %p ), ChannelHandle = (%u) \n",
                       static_cast<void*>(static_cast<NPObject*>(&wrapper)), handles[index]);
    });
}

NPObject* ChannelList::getitem(unsigned int index) {
    PLUGIN_LOG(CHANNEL, " getitem\n");
    NPObject* channel = m_channels.item(index);
    if (channel) {
        PLUGIN_LOG(CHANNEL, " Channel Obj = %p \n", static_cast<void*>(channel));
    }
    return channel;
}

NPObject* ChannelList::getChannel(unsigned int handle) {
    return m_channels.find([handle](const Channel& channel) { return channel.getChannelHandle() == handle; });
}

NPObject* ChannelList::getChannel(const std::string& ccid) {
    PLUGIN_LOG(CHANNEL, "Channel Id =( %s )\n", ccid.c_str());
    const auto handle = handleOfCcid(ccid);
    if (handle && !Channel::logsCcid()) { // the log shows a search from the front
        return findSorted(*handle);
    }
    return m_channels.find([&ccid](Channel& channel) {
        if (strcasecmp(channel.getCcid().c_str(), ccid.c_str()) != 0) {
            return false;
        }
        // Before the reference for the caller is added, as the log of all modules shows.
        PLUGIN_LOG_FOR(LogModule::CHANNEL, "getChannel", "getChannel() succeeded. ccid string: %s \n",
                       ccid.c_str());
        return true;
    });
}

NPObject* ChannelList::findSorted(uint32_t handle) {
    if (m_byHandle.size() != getLength() || m_sortedAtReset != Channel::resetCount()) {
        sortByHandle();
    }
    const auto found = std::lower_bound(m_byHandle.begin(), m_byHandle.end(), std::pair(handle, 0U));
    return found != m_byHandle.end() && found->first == handle ? m_channels.item(found->second) : nullptr;
}

void ChannelList::sortByHandle() {
    m_byHandle.clear();
    m_byHandle.reserve(getLength());
    for (uint32_t index = 0; index < getLength(); ++index) {
        m_byHandle.emplace_back(m_channels.wrapperAt(index).impl()->getChannelHandle(), index);
    }
    std::sort(m_byHandle.begin(), m_byHandle.end());
    m_sortedAtReset = Channel::resetCount();
}

NPObject* ChannelList::getChannelByTriplet(unsigned int onid, unsigned int tsid, unsigned int sid) {
    PLUGIN_LOG(CHANNEL, "called. onid: %u, tsid: %u, sid: %u \n", onid, tsid, sid);
    TELIX_JS_CM_HANDLE handle = 0;
    if (TELIX_JS_CM_GetChannelByTriplet(onid, tsid, sid, &handle) != 0) {
        return nullptr;
    }
    PLUGIN_LOG(CHANNEL, "ChannelHandle = %u \n", handle);
    return getChannel(handle);
}
