// The model of one broadcast service as a page sees it: a handle of the platform, with caches that fill at
// the first read. Browser thread only.
#ifndef TELIX_SRC_CHANNEL_CHANNEL_H
#define TELIX_SRC_CHANNEL_CHANNEL_H

#include "common/PluginBase.h"

class Channel final : public PluginBase {
public:
    explicit Channel(NPP npp);

    // The platform's handle; 0 means none, and then the platform is never asked. Setting it leaves the caches
    // as they are.
    uint32_t getChannelHandle() const { return m_channelHandle; }
    void setChannelHandle(uint32_t handle) { m_channelHandle = handle; }

    // Turns the object into another channel: empties the caches too.
    void reset(uint32_t handle);

    // How often any channel has become another one: what was found by handle before may not be true any more.
    static uint32_t resetCount() { return s_resetCount; }

    // DVB ids: original network, transport stream, service. 0 until the platform has given one.
    uint32_t getOnid();
    uint32_t getTsid();
    uint32_t getSid();

    // The platform's value at this moment; the last one, at first 3, if it refuses.
    int getChannelType();

    // Name and delivery system descriptor; empty until the platform has given them.
    std::string getName();
    std::string getDsd();

    // The channel's id in script: its handle in decimal, so it means something only as long as the platform
    // keeps the handle.
    std::string getCcid();

    // Whether each getCcid() prints to the log.
    static bool logsCcid();

private:
    static uint32_t s_resetCount;

    uint32_t m_onid = 0;
    uint32_t m_tsid = 0;
    uint32_t m_sid = 0;
    std::string m_ccid;
    std::string m_name;
    std::string m_dsd;
    int m_channelType;
    uint32_t m_channelHandle = 0;
};

#endif
