// The components of what plays: lists for script, and selection.
#include "common/Log.h"
#include "common/ScriptReferences.h"
#include "src/avcomponent/AVcomponent.h"
#include "src/avcomponent/AVcomponentList.h"
#include "src/avcomponent/JSAVcomponent.h"
#include "src/avcomponent/JSAVcomponentList.h"
#include "src/avcontrol/AVControl.h"

// The lists stay as they are, also when the media changes.
NPObject* AVControl::getComponents(int32_t type) {
    const auto cached = [this, type](NPObject*& list) {
        if (!list) {
            list = getComponentList(type, false);
        }
        return handOut(list);
    };
    switch (type) {
    case AVCOMP_TYPE_VIDEO:
        // quirk 36: a list is built once, whatever media follow.
        return cached(m_videoComponents);
    case AVCOMP_TYPE_AUDIO:
        return cached(m_audioComponents);
    case AVCOMP_TYPE_SUBTITLE:
        return cached(m_subtitleComponents);
    default:
        return nullptr;
    }
}

NPObject* AVControl::getCurrentActiveComponents(int32_t type) {
    // One reference more than the caller's, never released: each of these lists stays for good.
    return handOut(getComponentList(type, true));
}

NPObject* AVControl::getComponentList(int32_t type, bool active) {
    PLUGIN_LOG(AVCONTROL, "Comp Type: %d \n", type);
    if (!m_playerHandle) {
        return nullptr;
    }
    const auto ask = active ? TELIX_JS_AV_GetCurrActiveComponents : TELIX_JS_AV_GetComponents;
    TELIX_JS_AVCOMPHANDLE* handles = nullptr; // the array stays the platform's
    uint32_t count = 0;
    if (ask(m_playerHandle, type, &handles, &count) != 0) {
        return nullptr;
    }
    PLUGIN_LOG(AVCONTROL, "count::%d", count);
    NPObject* list = createScriptObject<JSAVcomponentList>(m_npp);
    if (list) {
        wrapperOf<JSAVcomponentList>(list)->impl()->initialize(handles, static_cast<AVcompType_T>(type),
                                                               AVCOMP_OBJ_AVCONTROL, count);
    }
    return list;
}

void AVControl::selectComponent(JSAVcomponent* component) {
    if (m_playerHandle) {
        const AVcomponent* model = component->impl();
        TELIX_JS_AV_SelectComponent(m_playerHandle, model->getHandle(), model->getType());
    }
}

void AVControl::unSelectComponent(JSAVcomponent* component) {
    if (m_playerHandle) {
        const AVcomponent* model = component->impl();
        TELIX_JS_AV_UnselectComponent(m_playerHandle, model->getHandle(), model->getType());
    }
}
