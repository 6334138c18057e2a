// The model of the channel configuration: hands out the list of all channels. Browser thread only.
#ifndef TELIX_SRC_CHANNEL_CHANNELCONFIG_H
#define TELIX_SRC_CHANNEL_CHANNELCONFIG_H

#include "common/PluginBase.h"

class ChannelConfig final : public PluginBase {
public:
    explicit ChannelConfig(NPP npp);
    ~ChannelConfig();

    // The channel list with one reference added for the caller. It is built at the first call that the
    // platform answers and never again; null until then.
    NPObject* getChannelList();

private:
    NPObject* m_channelList = nullptr;
};

#endif
