// The script interface of a list of A/V components. It owns the list.
#ifndef TELIX_SRC_AVCOMPONENT_JSAVCOMPONENTLIST_H
#define TELIX_SRC_AVCOMPONENT_JSAVCOMPONENTLIST_H

#include "common/ScriptWrapper.h"
#include "src/avcomponent/AVcomponentList.h"

class JSAVcomponentList final : public SubObjectWrapper<AVcomponentList, 2> {
public:
    explicit JSAVcomponentList(NPP npp);
};

#endif
