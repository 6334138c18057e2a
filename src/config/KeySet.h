// The model of a key set: the mask of remote control keys that a page asks for. It talks to the platform only
// if its instance is that of an application manager, so one reached through the configuration object is
// inert. Browser thread only.
#ifndef TELIX_SRC_CONFIG_KEYSET_H
#define TELIX_SRC_CONFIG_KEYSET_H

#include "common/PluginBase.h"

class KeySet final : public PluginBase {
public:
    explicit KeySet(NPP npp);

    // The mask that script set last. Until one is known that isn't 0, the platform is asked, provided that an
    // application owns this key set.
    uint32_t getValue();

    // Sets the mask, which may hold any bits, and returns the one that the platform answers; if the platform
    // refuses or there is none to ask, the mask known so far. `other` is only logged.
    uint32_t setValue(uint32_t value, uint32_t other);

private:
    double m_value = 0; // script numbers are doubles; what is stored is always a 32-bit unsigned integer
};

#endif
