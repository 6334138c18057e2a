// The script interface of a key set.
#ifndef TELIX_SRC_CONFIG_JSKEYSET_H
#define TELIX_SRC_CONFIG_JSKEYSET_H

#include "common/ScriptWrapper.h"
#include "src/config/KeySet.h"

class JSKeySet final : public SubObjectWrapper<KeySet, 12> {
public:
    explicit JSKeySet(NPP npp);
};

#endif
