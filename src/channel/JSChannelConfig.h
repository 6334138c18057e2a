// The script interface of the channel configuration. It owns the configuration.
#ifndef TELIX_SRC_CHANNEL_JSCHANNELCONFIG_H
#define TELIX_SRC_CHANNEL_JSCHANNELCONFIG_H

#include "common/ScriptWrapper.h"
#include "src/channel/ChannelConfig.h"

class JSChannelConfig final : public SubObjectWrapper<ChannelConfig, 1> {
public:
    explicit JSChannelConfig(NPP npp);
};

#endif
