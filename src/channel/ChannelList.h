// The model of the list of all channels that the platform knows, each an object made once. Browser thread
// only.
#ifndef TELIX_SRC_CHANNEL_CHANNELLIST_H
#define TELIX_SRC_CHANNEL_CHANNELLIST_H

#include <utility>
#include <vector>

#include "common/PluginBase.h"
#include "common/ScriptObjectList.h"

class JSChannel;

class ChannelList final : public PluginBase {
public:
    explicit ChannelList(NPP npp);

    // Makes the channels of `count` handles, which stay the caller's; without an array the list is empty.
    void initialize(const uint32_t* handles, unsigned int count);

    uint32_t getLength() const { return m_channels.length(); }

    // A channel of the list with one reference added for the caller; null if the list has none such.
    NPObject* getitem(unsigned int index);
    NPObject* getChannel(unsigned int handle);
    NPObject* getChannel(const std::string& ccid); // whichever case
    NPObject* getChannelByTriplet(unsigned int onid, unsigned int tsid, unsigned int sid);

private:
    NPObject* findSorted(uint32_t handle);
    void sortByHandle();

    ScriptObjectList<JSChannel> m_channels;

    // Handles and indexes of the entries, sorted at the first search by ccid, and again after entries have
    // become other channels.
    std::vector<std::pair<uint32_t, uint32_t>> m_byHandle;
    uint32_t m_sortedAtReset = 0;
};

#endif
