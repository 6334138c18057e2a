// The channel configuration: the list, made at its first use.
#include "src/channel/ChannelConfig.h"

#include "common/Log.h"
#include "common/ScriptReferences.h"
#include "src/channel/JSChannelList.h"
#include "telix/telix_platform.h"

ChannelConfig::ChannelConfig(NPP npp) : PluginBase(npp) {}

ChannelConfig::~ChannelConfig() {
    releaseHeld(m_channelList);
}

NPObject* ChannelConfig::getChannelList() {
    PLUGIN_LOG(CHANNEL, " ChannelConfig getChannelListObject\n");
    // quirk 30: a snapshot that is never rebuilt.
    if (!m_channelList) {
        uint32_t count = 0;
        TELIX_JS_CM_HANDLE* handles = nullptr; // stay the platform's
        if (TELIX_JS_CM_GetChannelList(&count, &handles) != 0 || !handles) {
            PLUGIN_LOG(CHANNEL, " TELIX_JS_CM_GetChannelList failed.\n");
            return nullptr;
        }
        PLUGIN_LOG(CHANNEL, "TELIX_JS_CM_GetChannelList::channelCount:-- %d --\n", count);
        // Kept: the reference of the creation.
        m_channelList = createScriptObject<JSChannelList>(m_npp);
        if (m_channelList) {
            wrapperOf<JSChannelList>(m_channelList)->impl()->initialize(handles, count);
        }
    }
    return handOut(m_channelList);
}
