// The script interface of the application manager.
#ifndef TELIX_SRC_APPLICATION_JSAPPLICATIONMANAGER_H
#define TELIX_SRC_APPLICATION_JSAPPLICATIONMANAGER_H

#include "common/ScriptWrapper.h"

class JSApplicationManager final : public EmbeddedObjectWrapper<5> {
public:
    explicit JSApplicationManager(NPP npp);
};

#endif
