// The script interface of the A/V control object.
#ifndef TELIX_SRC_AVCONTROL_JSAVCONTROL_H
#define TELIX_SRC_AVCONTROL_JSAVCONTROL_H

#include "common/ScriptWrapper.h"

class JSAVControl final : public EmbeddedObjectWrapper<32> {
public:
    explicit JSAVControl(NPP npp);
};

#endif
