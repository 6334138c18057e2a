// The script interface of the capabilities object.
#ifndef TELIX_SRC_CAPABILITIES_JSCAPABILITIES_H
#define TELIX_SRC_CAPABILITIES_JSCAPABILITIES_H

#include "common/ScriptWrapper.h"

class JSCapabilities final : public EmbeddedObjectWrapper<4> {
public:
    explicit JSCapabilities(NPP npp);
};

#endif
