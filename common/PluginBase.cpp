// What every native model shares: its attributes, and its way upward to the page.
#include "common/PluginBase.h"

#include <strings.h>

#include <cstdlib>
#include <cstring>

#include "common/BrowserGates.h"
#include "common/Log.h"

PluginBase::PluginBase(NPP npp, unsigned short objectId) : m_npp(npp), m_objectId(objectId) {}

PluginBase::~PluginBase() {
    if (m_pluginObject) {
        NPN_ReleaseObject(m_pluginObject);
    }
}

NPObject* PluginBase::getJSObject() {
    return nullptr;
}

NPError PluginBase::init(unsigned short mode, int argc, char* const* argn, char* const* argv) {
    PLUGIN_LOG(COMMON, "PluginBase::Mode: %d , Argc:  %d \n", mode, argc);
    // The value of these two is the pointer itself.
    NPN_SetValue(m_npp, NPPVpluginWindowBool, nullptr);
    // NOLINTNEXTLINE(performance-no-int-to-ptr)
    NPN_SetValue(m_npp, NPPVpluginTransparentBool, reinterpret_cast<void*>(true));
    m_pluginMode = mode;
    m_pluginState = PLUGIN_STATE_RUNNING;
    for (int i = 0; i < argc; ++i) {
        if (!argn[i]) {
            continue;
        }
        const auto named = [name = argn[i]](const char* wanted) { return strcasecmp(name, wanted) == 0; };
        const char* value = argv[i] ? argv[i] : "";
        if (named("url")) {
            m_url = value;
        } else if (named("src") || named("src1") || named("data")) {
            m_url = *value == '\0' || std::strstr(value, "://") ? std::string(value) : getBaseURL(value);
            PLUGIN_LOG(COMMON, "data value in PluginBase::init:: %s \n", m_url.c_str());
        } else if (named("id")) {
            m_id = value;
            PLUGIN_LOG(COMMON, "ID attribute value:: %s \n", value);
        } else if (named("fullscreen") && strcasecmp(value, "true") == 0) {
            // quirk 9: the attribute is consumed, so that no page starts in full screen.
        } else if (named("autoStart") && strcasecmp(value, "false") == 0) {
            m_autoStart = false;
        } else if (named("width")) {
            m_width = std::atoi(value);
        } else if (named("height")) {
            m_height = std::atoi(value);
        }
    }
    getNPWindowObj();
    getNPPluginObj();
    return NPERR_NO_ERROR;
}

void PluginBase::setWindow(const NPWindow* window) {
    if (window) {
        PLUGIN_LOG(COMMON, "Window: %p \n", static_cast<const void*>(window));
        m_window = *window;
    } else {
        PLUGIN_LOG(COMMON, "Window: is NULL \n");
    }
}

bool PluginBase::invokeJScript(const std::string& script) {
    PLUGIN_LOG(COMMON, "JScript:  %s   \n", script.c_str());
    NPString text{script.data(), static_cast<uint32_t>(script.size())};
    NPVariant result{};
    if (NPN_Evaluate(m_npp, getNPWindowObj(), &text, &result) && result.type == NPVariantType_Bool) {
        const bool value = result.value.boolValue;
        NPN_ReleaseVariantValue(&result);
        return value;
    }
    // A result of another type is not released.
    return false;
}

bool PluginBase::invokeJScriptFunc(NPObject* function, NPVariant* args, unsigned int argCount) {
    PLUGIN_LOG(COMMON, "Javascript function object: %p will be invoked\n", static_cast<void*>(function));
    NPVariant none{};
    NPVariant result{};
    const bool invoked =
        NPN_InvokeDefault(m_npp, function, args ? args : &none, args ? argCount : 0, &result);
    NPN_ReleaseVariantValue(&result);
    return invoked;
}

NPObject* PluginBase::getNPWindowObj() {
    if (!m_windowObject) {
        NPObject* object = nullptr;
        if (NPN_GetValue(m_npp, NPNVWindowNPObject, &object) == NPERR_NO_ERROR) {
            m_windowObject = object;
        }
    }
    return m_windowObject;
}

NPObject* PluginBase::getNPPluginObj() {
    if (!m_pluginObject) {
        NPObject* object = nullptr;
        if (NPN_GetValue(m_npp, NPNVPluginElementNPObject, &object) == NPERR_NO_ERROR) {
            m_pluginObject = object;
        }
    }
    return m_pluginObject;
}

std::string PluginBase::getBaseURL(const std::string& url) {
    static const char kExpression[] = "document.location.href";
    std::string base;
    NPString text{kExpression, sizeof(kExpression) - 1};
    NPVariant result{};
    if (!NPN_Evaluate(m_npp, getNPWindowObj(), &text, &result) || result.type != NPVariantType_String) {
        return base;
    }
    const NPString& address = result.value.stringValue;
    const std::string href(address.UTF8Length ? address.UTF8Characters : "", address.UTF8Length);
    if (url[0] == '/') {
        const size_t scheme = href.find("://");
        if (scheme != std::string::npos) {
            // quirk 7: the search ends at the first slash of "://", so "/a" becomes "scheme:/a".
            base = href.substr(0, href.find('/', scheme) + 1) + url.substr(1);
        }
    } else {
        const size_t query = href.find('?');
        if (query != std::string::npos) {
            base = href.substr(0, query);
        }
        // quirk 8: the last slash of the whole address counts, also one in the query.
        const size_t slash = href.rfind('/');
        if (slash != std::string::npos) {
            base = href.substr(0, slash + 1);
        }
        base += url;
    }
    NPN_ReleaseVariantValue(&result);
    return base;
}

void PluginBase::setObjectStyle(const std::string& style) {
    PLUGIN_LOG(COMMON, " is called \n");
    const NPIdentifier styleId = NPN_GetStringIdentifier("style");
    const NPIdentifier imageId = NPN_GetStringIdentifier("backgroundImage");
    const NPIdentifier colorId = NPN_GetStringIdentifier("backgroundColor");
    NPVariant styleObject{};
    if (!NPN_GetProperty(m_npp, getNPPluginObj(), styleId, &styleObject) ||
        styleObject.type != NPVariantType_Object) {
        PLUGIN_LOG(COMMON, "NPN_GetProperty(styleId) failed.\n");
        return;
    }
    NPVariant value{};
    value.type = NPVariantType_String;
    if (!style.empty()) {
        PLUGIN_LOG(COMMON, "backgroundImage style property is set \n");
        value.value.stringValue = {style.c_str(), static_cast<uint32_t>(std::strlen(style.c_str()))};
        NPN_SetProperty(m_npp, styleObject.value.objectValue, imageId, &value);
    }
    static const NPString kTransparent{"transparent", 11};
    value.value.stringValue = kTransparent;
    NPN_SetProperty(m_npp, styleObject.value.objectValue, colorId, &value);
    NPN_ReleaseVariantValue(&styleObject);
}
