// A channel: the platform's answers and their caches.
#include "src/channel/Channel.h"

#include <cstdlib>

#include "common/Log.h"
#include "telix/telix_platform.h"

namespace {

// quirk 27: none of the types that script knows.
constexpr int kTypeUnknown = 3;

// An id that the platform is asked for as long as it is 0.
template <class Ask>
uint32_t fetchId(uint32_t& cache, uint32_t handle, Ask ask) {
    if (cache == 0 && handle != 0) {
        uint32_t id = 0;
        if (ask(handle, &id) == 0) {
            cache = id;
        }
    }
    return cache;
}

// quirk 29: an id or a string that the platform has given is kept for good.
// A string that the platform is asked for as long as it is empty.
template <class Ask>
std::string fetchString(std::string& cache, uint32_t handle, Ask ask) {
    if (cache.empty() && handle != 0) {
        char* text = nullptr;
        if (ask(handle, &text) == 0 && text) {
            cache = text;
        }
        std::free(text); // ours, also if the call failed
    }
    return cache;
}

} // namespace

uint32_t Channel::s_resetCount = 0;

Channel::Channel(NPP npp) : PluginBase(npp), m_channelType(kTypeUnknown) {}

void Channel::reset(uint32_t handle) {
    m_onid = 0;
    m_tsid = 0;
    m_sid = 0;
    m_ccid.clear();
    m_name.clear();
    m_dsd.clear();
    m_channelType = kTypeUnknown;
    m_channelHandle = handle;
    ++s_resetCount;
}

uint32_t Channel::getOnid() {
    return fetchId(m_onid, m_channelHandle, TELIX_JS_CM_GetOnid);
}

uint32_t Channel::getTsid() {
    return fetchId(m_tsid, m_channelHandle, TELIX_JS_CM_GetTsid);
}

uint32_t Channel::getSid() {
    return fetchId(m_sid, m_channelHandle, TELIX_JS_CM_GetSid);
}

int Channel::getChannelType() {
    // Asked for at every read, unlike the rest.
    if (m_channelHandle != 0) {
        int32_t type = 0;
        if (TELIX_JS_CM_GetChannelType(m_channelHandle, &type) == 0) {
            m_channelType = type;
        }
    }
    return m_channelType;
}

std::string Channel::getName() {
    return fetchString(m_name, m_channelHandle, TELIX_JS_CM_GetName);
}

std::string Channel::getDsd() {
    return fetchString(m_dsd, m_channelHandle, TELIX_JS_CM_GetDsd);
}

std::string Channel::getCcid() {
    if (m_channelHandle != 0) {
        // quirk 28: the handle as a signed number.
        m_ccid = std::to_string(static_cast<int32_t>(m_channelHandle));
        PLUGIN_LOG(CHANNEL, "Channel:( %p )::m_Ccid= ( %s )\n", static_cast<void*>(this), m_ccid.c_str());
    }
    return m_ccid;
}

bool Channel::logsCcid() {
    return logWanted(logLevelOfFile, LogModule::CHANNEL);
}
