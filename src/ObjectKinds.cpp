// The kinds of embedded objects, in the order in which a MIME type is compared with them.
#include "common/ObjectKind.h"

#include "src/application/ApplicationManager.h"

const ObjectKind* const objectKinds[] = {
    &applicationManagerKind,
    nullptr,
};
