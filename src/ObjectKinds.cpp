// The kinds of embedded objects, in the order in which a MIME type is compared with them.
#include "common/ObjectKind.h"

#include "src/application/ApplicationManager.h"
#include "src/avcontrol/AVControl.h"
#include "src/parental/ParentalControlManager.h"

const ObjectKind* const objectKinds[] = {
    &applicationManagerKind,
    &avControlKind,
    &parentalControlManagerKind,
    nullptr,
};
