// The base of every native model: of the objects that the browser instantiates by MIME type and of the
// sub-objects that script wrappers own. It keeps what every embedded object has and is the model's way upward
// to the page. All operations that touch the browser run on the browser thread.
#ifndef TELIX_COMMON_PLUGINBASE_H
#define TELIX_COMMON_PLUGINBASE_H

#include <atomic>
#include <string>

#include "common/CallGuard.h"
#include "npapi/npapi.h"
#include "npapi/npruntime.h"

enum plugin_state { PLUGIN_STATE_RUNNING = 0, PLUGIN_STATE_DESTROYING = 1, PLUGIN_STATE_NOT_INITIALISED = 3 };

class PluginBase : public CallGuarded {
public:
    explicit PluginBase(NPP npp, unsigned short objectId = 0);

    // The script wrapper with one reference added for the caller. Only the models of embedded objects have
    // one.
    virtual NPObject* getJSObject();

    // Takes over what NPP_New was given: tells the browser that the plug-in is windowless and transparent and
    // reads the element's attributes. Always NPERR_NO_ERROR.
    NPError init(unsigned short mode, int argc, char* const* argn, char* const* argv);

    // Keeps a copy of the record; null keeps the old one.
    void setWindow(const NPWindow* window);

    // Evaluates a script in the page. True only if it ran and yielded the boolean true.
    bool invokeJScript(const std::string& script);

    // Calls a script function. The arguments stay the caller's; the result is thrown away.
    bool invokeJScriptFunc(NPObject* function, NPVariant* args, unsigned int argCount);

    // The page's window object, or the element that embeds the plug-in. Both stay the model's; null if the
    // browser refuses.
    NPObject* getNPWindowObj();
    NPObject* getNPPluginObj();

    // Resolves a URL against the page's; empty if the browser does not give the page's URL.
    std::string getBaseURL(const std::string& url);

    // Sets the embedding element's background image, unless `style` is empty, and makes its background
    // transparent.
    void setObjectStyle(const std::string& style);

    unsigned short getObjectId() const { return m_objectId; }
    NPP getBrowser() const { return m_npp; }
    std::string getURL() const { return m_url; }
    void setURL(const std::string& url) { m_url = url; }
    std::string getId() const { return m_id; }
    int getPluginMode() const { return m_pluginMode; }
    bool isFullScreen() const { return m_fullScreen; }
    void setFullScreen(bool fullScreen) { m_fullScreen = fullScreen; }
    // Any thread.
    plugin_state getPluginState() const { return m_pluginState; }
    void setPluginState(plugin_state state) { m_pluginState = state; }
    void setAutoStart(bool autoStart) { m_autoStart = autoStart; }

    // Whether the instance has been destroyed. A model that a call is in stays until the call returns, and
    // has no further business with the platform.
    bool isClosed() const { return m_isClosed; }
    void markClosed() { m_isClosed = true; }

protected:
    // Not virtual: a model is deleted through its concrete class only.
    ~PluginBase();

    NPObject* m_windowObject = nullptr; // never released: it lives as long as the page
    NPObject* m_pluginObject = nullptr; // released in the destructor
    NPWindow m_window{};
    NPP m_npp;
    std::string m_url;
    std::string m_id;
    unsigned short m_objectId;
    int m_pluginMode = 0;
    std::atomic<plugin_state> m_pluginState{PLUGIN_STATE_NOT_INITIALISED};
    bool m_fullScreen = false;
    bool m_isClosed = false;
    bool m_autoStart = true;
    int m_width = 0;  // of the attribute
    int m_height = 0; // of the attribute
};

#endif
