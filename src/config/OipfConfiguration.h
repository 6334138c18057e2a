// The model of the embedded configuration object: a door to the device's settings and to a key set. Browser
// thread only.
#ifndef TELIX_SRC_CONFIG_OIPFCONFIGURATION_H
#define TELIX_SRC_CONFIG_OIPFCONFIGURATION_H

#include "common/PluginBase.h"

struct ObjectKind;

extern const ObjectKind kOipfConfigurationKind;

class OipfConfiguration final : public PluginBase {
public:
    OipfConfiguration(NPP npp, unsigned short objectId);
    // The end of the object but for its memory, which a call that is in it may still need.
    void close();

    NPObject* getJSObject() override;

    // The key set and the settings, made at the first use. The caller owns one reference; null if the browser
    // refuses to make the object.
    NPObject* getKeySetObject();
    NPObject* getConfigurationObject();

private:
    // One reference held of each that isn't null.
    NPObject* m_jsObject = nullptr;
    NPObject* m_keySetObject = nullptr;
    NPObject* m_configurationObject = nullptr;
};

#endif
