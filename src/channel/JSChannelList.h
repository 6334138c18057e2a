// The script interface of the channel list. It owns the list.
#ifndef TELIX_SRC_CHANNEL_JSCHANNELLIST_H
#define TELIX_SRC_CHANNEL_JSCHANNELLIST_H

#include "common/ScriptWrapper.h"
#include "src/channel/ChannelList.h"

class JSChannelList final : public SubObjectWrapper<ChannelList, 4> {
public:
    explicit JSChannelList(NPP npp);
};

#endif
