// The script interface of the parental control manager.
#ifndef TELIX_SRC_PARENTAL_JSPARENTALCONTROLMANAGER_H
#define TELIX_SRC_PARENTAL_JSPARENTALCONTROLMANAGER_H

#include "common/ScriptWrapper.h"

class JSParentalControlManager final : public EmbeddedObjectWrapper<1> {
public:
    explicit JSParentalControlManager(NPP npp);
};

#endif
