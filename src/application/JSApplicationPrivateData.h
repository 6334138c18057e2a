// The script interface of an application's private data.
#ifndef TELIX_SRC_APPLICATION_JSAPPLICATIONPRIVATEDATA_H
#define TELIX_SRC_APPLICATION_JSAPPLICATIONPRIVATEDATA_H

#include "common/ScriptWrapper.h"
#include "src/application/ApplicationPrivateData.h"

class JSApplicationPrivateData final : public SubObjectWrapper<ApplicationPrivateData, 3> {
public:
    explicit JSApplicationPrivateData(NPP npp);
};

#endif
