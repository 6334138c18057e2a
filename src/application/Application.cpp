// An application: its private data, handler slots, and the four page functions.
#include "src/application/Application.h"

#include "common/Log.h"
#include "common/PluginUtils.h"
#include "common/ScriptReferences.h"
#include "src/application/JSApplication.h"
#include "src/application/JSApplicationPrivateData.h"

Application::Application(NPP npp) : PluginBase(npp) {}

Application::~Application() {
    releaseHeld(m_privateData);
    releaseHeld(m_onKeyDown);
    releaseHeld(m_onKeyUp);
    releaseHeld(m_onKeyPress);
    releaseHeld(m_onApplicationShown);
    releaseHeld(m_onApplicationHidden);
}

NPObject* Application::privateData() {
    return handOutOnce<JSApplicationPrivateData>(m_npp, m_privateData);
}

// quirk 18: the flag reaches neither the script nor the new object.
NPObject* Application::createApplication(const std::string& uri, bool) {
    // quirk 19: unless PLUGIN_ESCAPE_EVENTS is set, a URL with a quote makes a script that fails.
    if (!invokeJScript("window.createHbbTVApplication('" + literalText(uri) + "');")) {
        PLUGIN_LOG(APP_MGR, " Application class:: invokeJScript returned FAIL.\n");
        return nullptr;
    }
    NPObject* object = createScriptObject<JSApplication>(m_npp);
    PLUGIN_LOG(APP_MGR, " Target :: object: %p \n", static_cast<void*>(object));
    return object;
}

// quirk 20: the object lives on; only the page function is called.
void Application::destroyApplication() {
    invokeJScript("window.destroyHbbTVApplication();");
}

void Application::show() {
    invokeJScript("window.showHbbTVApplication();");
}

void Application::hide() {
    invokeJScript("window.hideHbbTVApplication();");
}

NPObject* Application::onKeyPress() {
    return handOut(m_onKeyPress);
}

NPObject* Application::onKeyUp() {
    return handOut(m_onKeyUp);
}

NPObject* Application::onKeyDown() {
    return handOut(m_onKeyDown);
}

NPObject* Application::onApplicationShown() {
    return handOut(m_onApplicationShown);
}

NPObject* Application::onApplicationHidden() {
    return handOut(m_onApplicationHidden);
}

void Application::setOnKeyPress(NPObject* handler) {
    storeListener(m_onKeyPress, handler);
}

void Application::setOnKeyUp(NPObject* handler) {
    storeListener(m_onKeyUp, handler);
}

void Application::setOnKeyDown(NPObject* handler) {
    storeListener(m_onKeyDown, handler);
}

void Application::setOnApplicationShown(NPObject* handler) {
    storeListener(m_onApplicationShown, handler);
}

void Application::setOnApplicationHidden(NPObject* handler) {
    storeListener(m_onApplicationHidden, handler);
}
