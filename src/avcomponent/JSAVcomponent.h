// The script interface of an A/V component. It owns the component.
#ifndef TELIX_SRC_AVCOMPONENT_JSAVCOMPONENT_H
#define TELIX_SRC_AVCOMPONENT_JSAVCOMPONENT_H

#include "common/ScriptWrapper.h"
#include "src/avcomponent/AVcomponent.h"

class JSAVcomponent final : public SubObjectWrapper<AVcomponent, 8> {
public:
    explicit JSAVcomponent(NPP npp);
};

#endif
