// The script interface of the embedded configuration object.
#ifndef TELIX_SRC_CONFIG_JSOIPFCONFIGURATION_H
#define TELIX_SRC_CONFIG_JSOIPFCONFIGURATION_H

#include "common/ScriptWrapper.h"

class JSOipfConfiguration final : public EmbeddedObjectWrapper<2> {
public:
    explicit JSOipfConfiguration(NPP npp);
};

#endif
