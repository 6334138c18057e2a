// The video/broadcast object: tuning, channels, programmes and components.
#include <iterator>

#include "common/Log.h"
#include "common/ScriptReferences.h"
#include "src/avcomponent/AVcomponent.h"
#include "src/avcomponent/AVcomponentList.h"
#include "src/avcomponent/JSAVcomponent.h"
#include "src/avcomponent/JSAVcomponentList.h"
#include "src/channel/Channel.h"
#include "src/channel/ChannelConfig.h"
#include "src/channel/ChannelList.h"
#include "src/channel/JSChannel.h"
#include "src/channel/JSChannelConfig.h"
#include "src/channel/JSChannelList.h"
#include "src/programme/JSProgrammeCollection.h"
#include "src/programme/ProgrammeCollection.h"
#include "src/videobroadcast/VideoBroadcast.h"
#include "telix/telix_platform.h"

namespace {

Channel* channelOf(NPObject* object) {
    return wrapperOf<JSChannel>(object)->impl();
}

// The script object's address, as the log says it.
void* addressOf(NPObject* object) {
    return object;
}

// The page's object with an empty channel of its own, or null if the browser refuses.
NPObject* createChannel(NPP npp, unsigned int channelHandle) {
    NPObject* object = createScriptObject<JSChannel>(npp);
    if (object) {
        channelOf(object)->setChannelHandle(channelHandle);
    }
    return object;
}

} // namespace

void VideoBroadcast::bindToCurrentChannel() {
    if (m_vbHandle && TELIX_JS_VB_BindToCurrChannel(m_vbHandle) == 0) {
        m_isActive = true;
        PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_BindToCurrChannel Success \n");
    } else {
        PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_BindToCurrChannel Failed \n");
    }
}

void VideoBroadcast::setChannel(JSChannel* channel, bool trickPlay) {
    const unsigned int channelHandle = channel ? channel->impl()->getChannelHandle() : 0;
    if (m_vbHandle && TELIX_JS_VB_SetChannel(m_vbHandle, channelHandle, trickPlay) == 0) {
        PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_SetChannel call succeeded \n");
        // No channel marks the object active too.
        m_isActive = true;
    }
}

void VideoBroadcast::setChannelByTriplet(int onid, int tsid, int sid) {
    if (m_vbHandle) {
        TELIX_JS_VB_SetChannelByTriplet(m_vbHandle, onid, tsid, sid);
    }
}

void VideoBroadcast::prevChannel() {
    TELIX_JS_CM_HANDLE channelHandle = 0;
    if (m_vbHandle && TELIX_JS_VB_PrevChannel(m_vbHandle, &channelHandle) == 0) {
        resetCurrentChannel(channelHandle);
    }
}

void VideoBroadcast::nextChannel() {
    TELIX_JS_CM_HANDLE channelHandle = 0;
    if (m_vbHandle && TELIX_JS_VB_NextChannel(m_vbHandle, &channelHandle) == 0) {
        resetCurrentChannel(channelHandle);
    }
}

// quirk 86: the object that the page holds becomes the new channel in place, before any event.
void VideoBroadcast::resetCurrentChannel(unsigned int channelHandle) {
    if (!m_pCurChannel) {
        m_pCurChannel = getCurrChannel(); // one reference more than is held, never released
    }
    if (m_pCurChannel) {
        channelOf(m_pCurChannel)->reset(channelHandle);
    }
}

void VideoBroadcast::stop() {
    if (m_vbHandle) {
        if (TELIX_JS_VB_Stop(m_vbHandle) == 0) {
            PLUGIN_LOG(VIDEOBCAST, "is success \n");
        } else {
            PLUGIN_LOG(VIDEOBCAST, "is failed \n");
        }
    }
}

NPObject* VideoBroadcast::createChannelObject(unsigned int idType, unsigned int onid, unsigned int tsid,
                                              unsigned int sid) {
    TELIX_JS_CM_HANDLE channelHandle = 0;
    NPObject* channel = nullptr;
    if (TELIX_JS_VB_CreateChannelObjectByTriplet(m_vbHandle, static_cast<___UINT8>(idType), onid, tsid, sid,
                                                 &channelHandle) == 0) {
        channel = createChannel(m_npp, channelHandle);
    }
    PLUGIN_LOG(VIDEOBCAST, "called With triplet. ChannelObj: %p \n", static_cast<void*>(channel));
    return channel;
}

NPObject* VideoBroadcast::createChannelObject(unsigned int idType, const unsigned char* dsd,
                                              unsigned int length, unsigned int sid) {
    PLUGIN_LOG(VIDEOBCAST, "String Length: %u \n", length);
    TELIX_JS_CM_HANDLE channelHandle = 0;
    NPObject* channel = nullptr;
    if (TELIX_JS_VB_CreateChannelObjectByDsd(m_vbHandle, static_cast<___UINT8>(idType), dsd, length, sid,
                                             &channelHandle) == 0) {
        channel = createChannel(m_npp, channelHandle);
    }
    PLUGIN_LOG(VIDEOBCAST, "called with Dsd. ChannelObj: %p \n", static_cast<void*>(channel));
    return channel;
}

NPObject* VideoBroadcast::getCurrChannel() {
    TELIX_JS_CM_HANDLE channelHandle = 0;
    if (TELIX_JS_VB_GetCurrentChannel(m_vbHandle, &channelHandle) != 0) {
        if (m_pCurChannel) {
            PLUGIN_LOG(VIDEOBCAST, " TELIX_JS_VB_GetCurrentChannel API failed.\n");
            releaseHeld(m_pCurChannel);
        }
        return nullptr;
    }
    if (m_pCurChannel && channelOf(m_pCurChannel)->getChannelHandle() != channelHandle) {
        PLUGIN_LOG(VIDEOBCAST, "The current channel is different%u \n", channelHandle);
        releaseHeld(m_pCurChannel);
    }
    if (!m_pCurChannel) {
        m_pCurChannel = createChannel(m_npp, channelHandle);
        if (m_pCurChannel) {
            PLUGIN_LOG(VIDEOBCAST, "New Object created. m_pCurChannel = %p \n",
                       static_cast<void*>(m_pCurChannel));
        }
    }
    return handOut(m_pCurChannel);
}

NPObject* VideoBroadcast::getChannel(unsigned int channelHandle) {
    if (channelHandle) {
        // The references to the configuration and the list are never released.
        if (NPObject* config = getChannelConfig()) {
            if (NPObject* list = wrapperOf<JSChannelConfig>(config)->impl()->getChannelList()) {
                if (NPObject* channel = wrapperOf<JSChannelList>(list)->impl()->getChannel(channelHandle)) {
                    return channel;
                }
            }
        }
    }
    return createChannel(m_npp, channelHandle);
}

NPObject* VideoBroadcast::getChannelConfig() {
    PLUGIN_LOG(VIDEOBCAST, "is Called.VB Handle:%d \n", m_vbHandle);
    NPObject* config = handOutOnce<JSChannelConfig>(m_npp, m_configObj);
    PLUGIN_LOG(VIDEOBCAST, "configObj:%p \n", static_cast<void*>(config));
    return config;
}

// quirk 87: a collection once made is never made again, whatever changes.
NPObject* VideoBroadcast::getProgrammes() {
    if (!m_programmesObj) {
        uint32_t count = 0;
        TELIX_JS_SI_HANDLE* handles = nullptr;
        if (TELIX_JS_SI_GetProgrammeHandles(&count, &handles) == 0 && count != 0) {
            m_programmesObj = createScriptObject<JSProgrammeCollection>(m_npp);
            if (m_programmesObj) {
                wrapperOf<JSProgrammeCollection>(m_programmesObj)->impl()->initialize(count, handles);
            }
        }
    }
    return handOut(m_programmesObj);
}

NPObject* VideoBroadcast::getParentalRatingObj(unsigned int ratingHandle) {
    if (!ratingHandle) {
        return nullptr;
    }
    // quirk 81: the rating comes from a programme; without one the handler is not called.
    NPObject* programmes = getProgrammes(); // the reference is never released
    return programmes ? wrapperOf<JSProgrammeCollection>(programmes)
                            ->impl()
                            ->getJSParentalRatingForHandle(ratingHandle)
                      : nullptr;
}

NPObject* VideoBroadcast::getComponentList(unsigned int type, bool active) {
    PLUGIN_LOG(VIDEOBCAST, "Comp Type: %d \n", type);
    if (!m_vbHandle) {
        return nullptr;
    }
    TELIX_JS_AVCOMPHANDLE* handles = nullptr;
    uint32_t count = 0;
    const TELIX_RETCODE_ENUM_T result =
        active ? TELIX_JS_VB_GetCurrActiveComponents(m_vbHandle, type, &handles, &count)
               : TELIX_JS_VB_GetComponents(m_vbHandle, type, &handles, &count);
    NPObject* list = nullptr;
    if (result == 0) {
        PLUGIN_LOG(VIDEOBCAST, "count::%d", count);
        list = createScriptObject<JSAVcomponentList>(m_npp);
        if (list) {
            wrapperOf<JSAVcomponentList>(list)->impl()->initialize(handles, static_cast<AVcompType_T>(type),
                                                                   AVCOMP_OBJ_VIDEOBROADCAST, count);
        }
    }
    return list;
}

// quirk 36: the lists are kept through channel changes.
NPObject* VideoBroadcast::getComponents(unsigned int type) {
    NPObject** const lists[] = {&m_videoComponents, &m_audioComponents, &m_subtitleComponents};
    if (type >= std::size(lists)) {
        return nullptr;
    }
    NPObject*& list = *lists[type];
    if (!list) {
        list = getComponentList(type, false);
    }
    return handOut(list);
}

NPObject* VideoBroadcast::getCurrentActiveComponents(unsigned int type) {
    PLUGIN_LOG(VIDEOBCAST, "Comp Type :: %d\n", type);
    return handOut(getComponentList(type, true)); // the reference of the creation is never released
}

void VideoBroadcast::selectComponent(JSAVcomponent* component) {
    PLUGIN_LOG(VIDEOBCAST, "AVCompObj: %p \n", addressOf(component));
    if (m_vbHandle) {
        const AVcomponent* model = component->impl();
        TELIX_JS_VB_SelectComponent(m_vbHandle, model->getHandle(),
                                    static_cast<TELIX_JS_AVCOMPTYPE>(model->getType()));
    }
}

void VideoBroadcast::unSelectComponent(JSAVcomponent* component) {
    PLUGIN_LOG(VIDEOBCAST, "AVCompObj: %p \n", addressOf(component));
    if (m_vbHandle) {
        const AVcomponent* model = component->impl();
        TELIX_JS_VB_UnselectComponent(m_vbHandle, model->getHandle(),
                                      static_cast<TELIX_JS_AVCOMPTYPE>(model->getType()));
    }
}
