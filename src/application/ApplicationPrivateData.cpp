// An application's private data.
#include "src/application/ApplicationPrivateData.h"

#include "common/ScriptReferences.h"
#include "src/application/ApplicationManager.h"
#include "src/channel/JSChannel.h"
#include "src/config/JSKeySet.h"
#include "telix/telix_platform.h"

namespace {

Channel* channelOf(NPObject* object) {
    return wrapperOf<JSChannel>(object)->impl();
}

} // namespace

ApplicationPrivateData::ApplicationPrivateData(NPP npp) : PluginBase(npp) {}

ApplicationPrivateData::~ApplicationPrivateData() {
    releaseHeld(m_keySet);
    // m_currentChannel is not released: the channel object outlives this one.
}

NPObject* ApplicationPrivateData::keySet() {
    return handOutOnce<JSKeySet>(m_npp, m_keySet);
}

uint32_t ApplicationPrivateData::getFreeMem() {
    ApplicationManager* manager = ApplicationManager::sharedInstance(m_npp);
    uint32_t amount = 0;
    if (manager && manager->getApplication(this) && TELIX_JS_APP_GetFreeMem(&amount) == 0) {
        m_freeMem = amount;
    }
    return m_freeMem;
}

NPObject* ApplicationPrivateData::getCurrChannel() {
    TELIX_JS_CM_HANDLE handle = 0;
    if (TELIX_JS_APP_GetCurrentChannel(&handle) != 0) {
        // The cached object, without a reference for the caller.
        return m_currentChannel;
    }
    if (m_currentChannel && channelOf(m_currentChannel)->getChannelHandle() != handle) {
        // The page may hold the old object, so that it keeps its handle and another takes its place.
        releaseHeld(m_currentChannel);
    }
    if (!m_currentChannel) {
        m_currentChannel = createScriptObject<JSChannel>(m_npp);
        if (m_currentChannel) {
            channelOf(m_currentChannel)->setChannelHandle(handle);
        }
    }
    return handOut(m_currentChannel);
}
