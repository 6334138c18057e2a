// The video/broadcast object on the screen: its size, its display area and full screen.
#include "common/LiveRef.h"
#include "common/Log.h"
#include "common/ScriptValues.h"
#include "src/videobroadcast/VideoBroadcast.h"
#include "telix/telix_platform.h"

// quirk 83: a size is applied on a later turn of the main loop.
void VideoBroadcast::setWidth(int width) {
    PLUGIN_LOG(VIDEOBCAST, ":: new Width= %d \n", width);
    m_nWidth = width;
    postIdleIfAlive(ref(), shouldChangeWidth);
}

void VideoBroadcast::setHeight(int height) {
    PLUGIN_LOG(VIDEOBCAST, ":: new height= %d \n", height);
    m_nHeight = height;
    postIdleIfAlive(ref(), shouldChangeHeight);
}

int VideoBroadcast::shouldChangeWidth(void* object) {
    auto* self = static_cast<VideoBroadcast*>(object);
    self->applySize(__func__, "TELIX_JS_VB_SetWidth", TELIX_JS_VB_SetWidth, self->m_nWidth, self->m_pWidth);
    return 0;
}

int VideoBroadcast::shouldChangeHeight(void* object) {
    auto* self = static_cast<VideoBroadcast*>(object);
    self->applySize(__func__, "TELIX_JS_VB_SetHeight", TELIX_JS_VB_SetHeight, self->m_nHeight,
                    self->m_pHeight);
    return 0;
}

void VideoBroadcast::applySize(const char* step, const char* callName, SetSize call, int wanted,
                               int& applied) {
    if (!m_vbHandle) {
        // Despite its words the step goes on without a handle.
        PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, step, "m_vbHandle is NULL. Nothing to do, return. \n");
    }
    if (wanted == applied) {
        return;
    }
    if (call(m_vbHandle, wanted) == 0) {
        applied = wanted;
        PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, step, "%s Succeeded \n", callName);
    } else {
        PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, step, "%s Failed \n", callName);
    }
}

int VideoBroadcast::getWidth() {
    if (m_pWidth == 0 && m_vbHandle) {
        int32_t width = 0;
        if (TELIX_JS_VB_GetWidth(m_vbHandle, &width) == 0) {
            m_pWidth = width;
        }
    }
    return m_pWidth;
}

int VideoBroadcast::getHeight() {
    if (m_pHeight == 0 && m_vbHandle) {
        int32_t height = 0;
        if (TELIX_JS_VB_GetHeight(m_vbHandle, &height) == 0) {
            m_pHeight = height;
        }
    }
    return m_pHeight;
}

void VideoBroadcast::setPluginRegionFromDOM() {
    m_displayArea.readRegion(*this);
}

void VideoBroadcast::setWindow(const NPWindow*, bool bForceReset) {
    setPluginRegionFromDOM();
    const Area area = m_displayArea.choose(*this, m_isFullScreen);
    if (isClosed()) {
        return;
    }
    PLUGIN_LOG(VIDEOBCAST, "Window Values:: m_X: %d, m_Y: %d, m_width: %d, m_height: %d, bForceReset: %d \n",
               area.x, area.y, area.width, area.height, bForceReset);
    if (!m_vbHandle || (!bForceReset && m_displayArea.isAccepted(area))) {
        PLUGIN_LOG(VIDEOBCAST, "setWindow Condition failed::m_vbHandle ( %d )\n", m_vbHandle);
    } else if (!m_displayArea.present(m_npp, area, m_vbHandle, TELIX_JS_VB_SetDisplayArea)) {
        PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_SetDisplayArea failed: \n");
    }
    PLUGIN_LOG(VIDEOBCAST, "Call Ended \n");
}

bool VideoBroadcast::isFullScreen() {
    ___UINT8 fullScreen = 0;
    if (TELIX_JS_VB_IsFullScreen(m_vbHandle, &fullScreen) == 0) {
        m_isFullScreen = fullScreen != 0;
        PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_IsFullScreen is called. FullScreen = %d \n", m_isFullScreen);
    } else {
        PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_IsFullScreen is not called %d \n", m_isFullScreen);
    }
    return m_isFullScreen;
}

void VideoBroadcast::setFullScreenChange(bool bFullScreen) {
    PLUGIN_LOG(VIDEOBCAST, "is called m_isFullScreen = %d, bFullScreen = %d \n", m_isFullScreen, bFullScreen);
    if (bFullScreen == m_isFullScreen) {
        return;
    }
    if (TELIX_JS_VB_SetFullScreen(m_vbHandle, bFullScreen) != 0) {
        PLUGIN_LOG(VIDEOBCAST,
                   "TELIX_JS_VB_SetFullScreen is not called :: bFullScreen: %d :: m_isFullScreen :%d \n",
                   bFullScreen, m_isFullScreen);
        return;
    }
    m_isFullScreen = bFullScreen;
    PLUGIN_LOG(VIDEOBCAST, "TELIX_JS_VB_SetFullScreen is called :: bFullScreen: %d :: m_isFullScreen :%d \n",
               bFullScreen, m_isFullScreen);
    setFullScreen(bFullScreen);
    // quirk 82: the platform's own report of the change calls the handler once more.
    if (NPObject* handler = getOnFullScreenChange()) {
        NPVariant state{};
        setResult(state, bFullScreen);
        invokeJScriptFunc(handler, &state, 1);
        NPN_ReleaseObject(handler); // held during the call: the handler may take itself out of the slot
    }
}
