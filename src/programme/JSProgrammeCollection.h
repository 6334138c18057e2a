// The script interface of a collection of programmes. It owns the collection.
#ifndef TELIX_SRC_PROGRAMME_JSPROGRAMMECOLLECTION_H
#define TELIX_SRC_PROGRAMME_JSPROGRAMMECOLLECTION_H

#include "common/ScriptWrapper.h"
#include "src/programme/ProgrammeCollection.h"

class JSProgrammeCollection final : public SubObjectWrapper<ProgrammeCollection, 2> {
public:
    explicit JSProgrammeCollection(NPP npp);
};

#endif
