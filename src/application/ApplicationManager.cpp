// The application manager: instances, the list of applications, and the low-memory notice.
#include "src/application/ApplicationManager.h"

#include <glib.h>

#include <algorithm>
#include <cstring>

#include "common/LiveRef.h"
#include "common/Log.h"
#include "common/ObjectKind.h"
#include "common/ScriptReferences.h"
#include "src/application/Application.h"
#include "src/application/JSApplication.h"
#include "src/application/JSApplicationManager.h"
#include "src/application/JSApplicationPrivateData.h"
#include "src/config/JSKeySet.h"
#include "telix/telix_platform.h"

std::map<NPP, ApplicationManager*> ApplicationManager::m_instances;
std::vector<Application*> ApplicationManager::m_applications;
bool ApplicationManager::m_lowMemoryRegistered = false;

namespace {

const char* const kMimeTypes[] = {"application/oipfapplicationmanager", nullptr};

} // namespace

const ObjectKind kApplicationManagerKind = [] {
    ObjectKind kind{};
    kind.id = 200;
    kind.destroyText = "APPMANAGER_OBJ_ID delete\n";
    kind.mimeTypes = kMimeTypes;
    kind.create = [](NPP npp, unsigned short id) -> PluginBase* {
        return ApplicationManager::sharedInstance(npp, id);
    };
    kind.dispose = disposeOf<ApplicationManager>;
    kind.handleEvent = [](PluginBase& model, void* event) {
        return static_cast<ApplicationManager&>(model).handleEvent(static_cast<void**>(event));
    };
    return kind;
}();

ApplicationManager* ApplicationManager::sharedInstance(NPP npp) {
    ApplicationManager* found = nullptr;
    for (const auto& [instance, manager] : m_instances) {
        PLUGIN_LOG(APP_MGR, " NPP: %p, ApplicationManager: %p \n", static_cast<void*>(instance),
                   static_cast<void*>(manager));
        if (instance == npp) {
            found = manager;
        }
    }
    if (!found) {
        PLUGIN_LOG(APP_MGR, " ApplicationManager instance does not exist \n");
    }
    return found;
}

ApplicationManager* ApplicationManager::sharedInstance(NPP npp, unsigned short objectId) {
    ApplicationManager* manager = nullptr;
    const auto entry = m_instances.find(npp);
    if (entry != m_instances.end()) {
        PLUGIN_LOG(APP_MGR, " AppManager instance already exists with specified NPP instance \n");
        manager = entry->second;
    } else {
        manager = new ApplicationManager(npp, objectId);
        m_instances[npp] = manager;
    }
    if (!m_lowMemoryRegistered) {
        TELIX_JS_APP_RegisterLowMemory(onLowMemoryCb);
        m_lowMemoryRegistered = true;
    }
    return manager;
}

void ApplicationManager::deleteInstance(NPP npp) {
    m_instances.erase(npp);
    if (m_lowMemoryRegistered && m_instances.empty()) {
        TELIX_JS_APP_UnRegisterLowMemory(onLowMemoryCb);
        m_lowMemoryRegistered = false;
    }
}

void ApplicationManager::addApplication(Application* application) {
    m_applications.push_back(application);
}

void ApplicationManager::removeApplication(Application* application) {
    m_applications.erase(std::remove(m_applications.begin(), m_applications.end(), application),
                         m_applications.end());
}

int ApplicationManager::onLowMemoryCb() {
    PLUGIN_LOG(APP_MGR, " is called \n");
    postIdle(handleOnLowMemory, nullptr); // for no object: the step touches none
    return 0;
}

// quirk 13: the notification ends here; the script handler is stored and never called.
int ApplicationManager::handleOnLowMemory(void*) {
    PLUGIN_LOG(APP_MGR, " is called \n");
    return G_SOURCE_REMOVE;
}

ApplicationManager::ApplicationManager(NPP npp, unsigned short objectId) : PluginBase(npp, objectId) {}

void ApplicationManager::close() {
    releaseHeld(m_jsObject);
    releaseHeld(m_onLowmemory);
    releaseHeld(m_onApplicationLoaded);
    releaseHeld(m_onApplicationUnloaded);
    releaseHeld(m_onApplicationLoadError);
    deleteInstance(m_npp);
}

NPObject* ApplicationManager::getJSObject() {
    return handOutOnce<JSApplicationManager>(getBrowser(), m_jsObject);
}

NPObject* ApplicationManager::getOwnerApplication(NPObject* document) {
    static const char kExpression[] = "location.href";
    NPString text{kExpression, sizeof(kExpression) - 1};
    NPVariant location{};
    // The document itself is the scope, not the page's window.
    if (!NPN_Evaluate(m_npp, document, &text, &location)) {
        return nullptr;
    }
    NPObject* application = nullptr;
    if (location.type == NPVariantType_String) {
        const NPString& href = location.value.stringValue;
        PLUGIN_LOG(APP_MGR, " ApplicationManager class:: Location: %s \n",
                   std::string(href.UTF8Length ? href.UTF8Characters : "", href.UTF8Length).c_str());
        // quirk 15: a new object at every call; the reference of its creation goes to the caller, none is
        // kept.
        application = createScriptObject<JSApplication>(m_npp);
    }
    NPN_ReleaseVariantValue(&location);
    return application;
}

Application* ApplicationManager::getApplication(ApplicationPrivateData* data) {
    for (Application* application : m_applications) {
        // The reference that comes with the object is never released: an application that was visited keeps
        // it.
        auto* wrapper = wrapperOf<JSApplicationPrivateData>(application->privateData());
        if (wrapper && wrapper->impl() == data) {
            return application;
        }
    }
    return nullptr;
}

Application* ApplicationManager::getApplication(KeySet* keySet) {
    for (Application* application : m_applications) {
        // The references that come with both objects are never released.
        auto* dataWrapper = wrapperOf<JSApplicationPrivateData>(application->privateData());
        if (dataWrapper) {
            auto* keySetWrapper = wrapperOf<JSKeySet>(dataWrapper->impl()->keySet());
            if (keySetWrapper && keySetWrapper->impl() == keySet) {
                return application;
            }
        }
    }
    return nullptr;
}

NPObject* ApplicationManager::onLowmemory() {
    return handOut(m_onLowmemory);
}

NPObject* ApplicationManager::onApplicationLoaded() {
    return handOut(m_onApplicationLoaded);
}

NPObject* ApplicationManager::onApplicationUnloaded() {
    return handOut(m_onApplicationUnloaded);
}

NPObject* ApplicationManager::onApplicationLoadError() {
    return handOut(m_onApplicationLoadError);
}

void ApplicationManager::setOnLowmemory(NPObject* handler) {
    storeListener(m_onLowmemory, handler);
}

void ApplicationManager::setOnApplicationLoaded(NPObject* handler) {
    storeListener(m_onApplicationLoaded, handler);
}

void ApplicationManager::setOnApplicationUnloaded(NPObject* handler) {
    storeListener(m_onApplicationUnloaded, handler);
}

void ApplicationManager::setOnApplicationLoadError(NPObject* handler) {
    storeListener(m_onApplicationLoadError, handler);
}

bool ApplicationManager::handleApplicationLoadError() {
    // This one statement names another class, under that class's module.
    PLUGIN_LOG(AVCONTROL, "AVControl class");
    if (!m_onApplicationLoadError) {
        return false;
    }
    const CallGuard guard(*this);
    invokeJScriptFunc(m_onApplicationLoadError, nullptr, 0);
    return true;
}

int ApplicationManager::handleKeyPressEvent() {
    return callKeyHandlers(&Application::onKeyPress);
}

int ApplicationManager::handleKeyUpEvent() {
    return callKeyHandlers(&Application::onKeyUp);
}

int ApplicationManager::handleKeyDownEvent() {
    return callKeyHandlers(&Application::onKeyDown);
}

int ApplicationManager::callKeyHandlers(NPObject* (Application::*handler)()) {
    const CallGuard guard(*this);
    if (!m_applications.empty() && sharedInstance(m_npp)) {
        // A copy, looked up again: a handler may make or drop applications.
        for (Application* application : applicationList()) {
            const bool isAlive =
                std::find(m_applications.begin(), m_applications.end(), application) != m_applications.end();
            if (isAlive && (application->*handler)()) {
                // Neither of the two references that the getter hands out is released.
                invokeJScriptFunc((application->*handler)(), nullptr, 0);
            }
        }
    }
    return 1;
}

int16_t ApplicationManager::handleEvent(void**) {
    PLUGIN_LOG(APP_MGR, " is called \n");
    return 0;
}
