// The script interface of an application. It owns the application and keeps it in the process-wide list.
#ifndef TELIX_SRC_APPLICATION_JSAPPLICATION_H
#define TELIX_SRC_APPLICATION_JSAPPLICATION_H

#include "common/ScriptWrapper.h"

class Application;

class JSApplication final : public SubObjectWrapper<Application, 11> {
public:
    explicit JSApplication(NPP npp);
    ~JSApplication() override;
};

#endif
