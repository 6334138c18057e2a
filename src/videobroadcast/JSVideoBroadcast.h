// The script interface of the video/broadcast object.
#ifndef TELIX_SRC_VIDEOBROADCAST_JSVIDEOBROADCAST_H
#define TELIX_SRC_VIDEOBROADCAST_JSVIDEOBROADCAST_H

#include "common/ScriptWrapper.h"

class JSVideoBroadcast final : public EmbeddedObjectWrapper<33> {
public:
    explicit JSVideoBroadcast(NPP npp);

    // Unlike with the other objects, a missing model is a fault of the browser that stops the process.
    bool Invoke(NPIdentifier name, const NPVariant* args, unsigned int argCount, NPVariant* result) override;
    bool GetProperty(NPIdentifier name, NPVariant* result) override;
    bool SetProperty(NPIdentifier name, const NPVariant* value) override;
};

#endif
