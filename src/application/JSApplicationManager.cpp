// The script interface of the application manager.
#include "src/application/JSApplicationManager.h"

#include "src/application/ApplicationManager.h"

namespace {

using Model = ApplicationManager;

// Script spells "onLowMemory" with a capital M, the log does not.
constexpr ScriptMember kMembers[] = {
    property("onLowMemory", reader<&Model::onLowmemory>, listenerWriter<&Model::setOnLowmemory>)
        .logged("onLowmemory"),
    property("onApplicationLoaded", reader<&Model::onApplicationLoaded>,
             listenerWriter<&Model::setOnApplicationLoaded>),
    property("onApplicationUnloaded", reader<&Model::onApplicationUnloaded>,
             listenerWriter<&Model::setOnApplicationUnloaded>),
    property("onApplicationLoadError", reader<&Model::onApplicationLoadError>,
             listenerWriter<&Model::setOnApplicationLoadError>),
    method("getOwnerApplication", invoker<&Model::getOwnerApplication>),
};

constexpr ScriptClass kClass("JSApplicationManager", LogModule::APP_MGR, kMembers);

} // namespace

JSApplicationManager::JSApplicationManager(NPP npp) : EmbeddedObjectWrapper(npp, kClass) {}
