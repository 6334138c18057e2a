// The script interface of a channel. It owns the channel.
#ifndef TELIX_SRC_CHANNEL_JSCHANNEL_H
#define TELIX_SRC_CHANNEL_JSCHANNEL_H

#include "common/ScriptWrapper.h"
#include "src/channel/Channel.h"

class JSChannel final : public SubObjectWrapper<Channel, 10> {
public:
    explicit JSChannel(NPP npp);
};

#endif
