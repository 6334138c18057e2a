// The model of one application as a page sees it. It lives exactly as long as its script wrapper and leaves
// all real work to the page functions of the hosting browser. Browser thread only.
#ifndef TELIX_SRC_APPLICATION_APPLICATION_H
#define TELIX_SRC_APPLICATION_APPLICATION_H

#include "common/PluginBase.h"

class Application final : public PluginBase {
public:
    explicit Application(NPP npp);
    ~Application();

    // The private data, made at the first use. The caller owns one reference; null if the browser refuses to
    // make it.
    NPObject* privateData();

    // Asks the browser to start the application at `uri`. The caller owns the new application object's
    // reference; null if the browser refused. The flag has no effect.
    NPObject* createApplication(const std::string& uri, bool createChild);
    void destroyApplication();
    void show();
    void hide();

    // Script handlers. A getter hands out one more reference; null if none is set.
    // quirk 17: stored for script alone; the plug-in calls none of them by itself.
    NPObject* onKeyPress();
    NPObject* onKeyUp();
    NPObject* onKeyDown();
    NPObject* onApplicationShown();
    NPObject* onApplicationHidden();
    void setOnKeyPress(NPObject* handler);
    void setOnKeyUp(NPObject* handler);
    void setOnKeyDown(NPObject* handler);
    void setOnApplicationShown(NPObject* handler);
    void setOnApplicationHidden(NPObject* handler);

private:
    NPObject* m_privateData = nullptr; // one reference held
    NPObject* m_onKeyPress = nullptr;
    NPObject* m_onKeyUp = nullptr;
    NPObject* m_onKeyDown = nullptr;
    NPObject* m_onApplicationShown = nullptr;
    NPObject* m_onApplicationHidden = nullptr;
};

#endif
