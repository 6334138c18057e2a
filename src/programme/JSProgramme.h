// The script interface of a programme. It owns the programme.
#ifndef TELIX_SRC_PROGRAMME_JSPROGRAMME_H
#define TELIX_SRC_PROGRAMME_JSPROGRAMME_H

#include "common/ScriptWrapper.h"
#include "src/programme/Programme.h"

class JSProgramme final : public SubObjectWrapper<Programme, 6> {
public:
    explicit JSProgramme(NPP npp);
};

#endif
