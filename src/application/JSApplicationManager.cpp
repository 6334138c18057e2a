// The script interface of the application manager.
#include "src/application/JSApplicationManager.h"

#include "src/application/ApplicationManager.h"

namespace {

using Model = ApplicationManager;

// Script spells "onLowMemory" with a capital M, the log does not.
constexpr ScriptMember kMembers[] = {
    property("onLowMemory", read<&Model::onLowmemory>, writeListener<&Model::setOnLowmemory>)
        .logged("onLowmemory"),
    property("onApplicationLoaded", read<&Model::onApplicationLoaded>,
             writeListener<&Model::setOnApplicationLoaded>),
    property("onApplicationUnloaded", read<&Model::onApplicationUnloaded>,
             writeListener<&Model::setOnApplicationUnloaded>),
    property("onApplicationLoadError", read<&Model::onApplicationLoadError>,
             writeListener<&Model::setOnApplicationLoadError>),
    method("getOwnerApplication", invoke<&Model::getOwnerApplication>),
};

constexpr ScriptClass kClass("JSApplicationManager", LogModule::APP_MGR, kMembers);

} // namespace

JSApplicationManager::JSApplicationManager(NPP npp) : EmbeddedObjectWrapper(npp, kClass) {}
