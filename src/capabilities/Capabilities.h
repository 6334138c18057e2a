// The model of the embedded capabilities object: what the device can do, as the platform describes it.
// Browser thread only.
#ifndef TELIX_SRC_CAPABILITIES_CAPABILITIES_H
#define TELIX_SRC_CAPABILITIES_CAPABILITIES_H

#include "common/PluginBase.h"

struct ObjectKind;

extern const ObjectKind kCapabilitiesKind;

class Capabilities final : public PluginBase {
public:
    // Gives the page the function with which the description is parsed: there is no XML parser in here.
    Capabilities(NPP npp, unsigned short objectId);
    // The end of the object but for its memory, which a call that is in it may still need.
    void close();
    ~Capabilities();

    NPObject* getJSObject() override;

    // The description as a document of the page, parsed at the first read that succeeds. The caller owns one
    // reference; null if there is no description or the page failed to parse it.
    NPObject* getxmlCapabilities();

    // Whether the platform supports a profile; names are the platform's. False for an empty name.
    bool hasCapability(const std::string& name);

    // How many more videos of each definition could be decoded now; the last figure if the platform refuses.
    uint32_t getExtraSDVideoDecodes();
    uint32_t getExtraHDVideoDecodes();

private:
    // One reference held of each that isn't null.
    NPObject* m_jsObject = nullptr;
    NPObject* m_xmlCapabilities = nullptr;
    uint32_t m_extraSDVideoDecodes = 0;
    uint32_t m_extraHDVideoDecodes = 0;
};

#endif
