// The script interface of the DRM agent.
#ifndef TELIX_SRC_DRM_JSDRMAGENT_H
#define TELIX_SRC_DRM_JSDRMAGENT_H

#include "common/ScriptWrapper.h"

class JSDRMAgent final : public EmbeddedObjectWrapper<2> {
public:
    explicit JSDRMAgent(NPP npp);
};

#endif
