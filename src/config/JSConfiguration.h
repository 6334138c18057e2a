// The script interface of the device's settings.
#ifndef TELIX_SRC_CONFIG_JSCONFIGURATION_H
#define TELIX_SRC_CONFIG_JSCONFIGURATION_H

#include "common/ScriptWrapper.h"
#include "src/config/Configuration.h"

class JSConfiguration final : public SubObjectWrapper<Configuration, 3> {
public:
    explicit JSConfiguration(NPP npp);
};

#endif
