// The model of the embedded application manager object: answers a page's question for its owner application
// and keeps the process-wide list of applications. One manager an instance; one list for all. Browser thread
// only, but for the platform's callback.
#ifndef TELIX_SRC_APPLICATION_APPLICATIONMANAGER_H
#define TELIX_SRC_APPLICATION_APPLICATIONMANAGER_H

#include <map>
#include <vector>

#include "common/PluginBase.h"

class Application;
class ApplicationPrivateData;
class KeySet;
struct ObjectKind;

extern const ObjectKind kApplicationManagerKind;

class ApplicationManager final : public PluginBase {
public:
    // The manager of an instance; null if there is none.
    static ApplicationManager* sharedInstance(NPP npp);
    // The same, made if there is none; sees to the registration of the low-memory callback.
    static ApplicationManager* sharedInstance(NPP npp, unsigned short objectId);
    // Takes the instance's entry out; the last one takes the low-memory callback along. The manager itself
    // stays.
    static void deleteInstance(NPP npp);

    // Every live application, in the order of creation, whichever page made it. Entries are borrowed.
    static void addApplication(Application* application);
    static void removeApplication(Application* application);

    // The platform's low-memory callback (any thread), and the idle step that it queues.
    static int onLowMemoryCb();
    static int handleOnLowMemory(void*);

    // The end of the object but for its memory, which a call that is in it may still need.
    void close();

    NPObject* getJSObject() override;

    // A new application object for the page of the document; the caller owns its reference. Null if the
    // document has no location.
    NPObject* getOwnerApplication(NPObject* document);

    std::vector<Application*> applicationList() const { return m_applications; }

    // The application, of any page, that owns a private data object or a key set; null if none lives. Every
    // application that is visited makes these objects if it has none, and one reference to each of them is
    // never released.
    Application* getApplication(ApplicationPrivateData* data);
    Application* getApplication(KeySet* keySet);

    // Script handlers. A getter hands out one more reference; null if none is set. A setter takes null too.
    // quirk 14: nothing calls the handlers of loading, unloading and load errors.
    NPObject* onLowmemory();
    NPObject* onApplicationLoaded();
    NPObject* onApplicationUnloaded();
    NPObject* onApplicationLoadError();
    void setOnLowmemory(NPObject* handler);
    void setOnApplicationLoaded(NPObject* handler);
    void setOnApplicationUnloaded(NPObject* handler);
    void setOnApplicationLoadError(NPObject* handler);

    // Calls the load error handler; false if there is none.
    bool handleApplicationLoadError();

    // Call the key handlers of all applications of the process. Always 1.
    int handleKeyPressEvent();
    int handleKeyUpEvent();
    int handleKeyDownEvent();

    // Always 0, not handled: a page gets its keys by the browser's own means.
    int16_t handleEvent(void** event);

private:
    ApplicationManager(NPP npp, unsigned short objectId);

    int callKeyHandlers(NPObject* (Application::*handler)());

    static std::map<NPP, ApplicationManager*> m_instances;
    static std::vector<Application*> m_applications;
    static bool m_lowMemoryRegistered;

    NPObject* m_jsObject = nullptr;
    NPObject* m_onLowmemory = nullptr;
    NPObject* m_onApplicationLoaded = nullptr;
    NPObject* m_onApplicationUnloaded = nullptr;
    NPObject* m_onApplicationLoadError = nullptr;
};

#endif
