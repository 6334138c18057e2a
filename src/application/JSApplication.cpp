// The script interface of an application.
#include "src/application/JSApplication.h"

#include "src/application/Application.h"
#include "src/application/ApplicationManager.h"

namespace {

// quirk 16: a handler is written as an object or not at all; null is refused.
constexpr ScriptMember kMembers[] = {
    property("privateData", read<&Application::privateData>),
    property("private", read<&Application::privateData>),
    property("onKeyPress", read<&Application::onKeyPress>, write<&Application::setOnKeyPress>),
    property("onKeyUp", read<&Application::onKeyUp>, write<&Application::setOnKeyUp>),
    property("onKeyDown", read<&Application::onKeyDown>, write<&Application::setOnKeyDown>),
    property("onApplicationShown", read<&Application::onApplicationShown>,
             write<&Application::setOnApplicationShown>),
    property("onApplicationHidden", read<&Application::onApplicationHidden>,
             write<&Application::setOnApplicationHidden>),
    method("createApplication", invoke<&Application::createApplication>),
    method("destroyApplication", invoke<&Application::destroyApplication>),
    method("show", invoke<&Application::show>),
    method("hide", invoke<&Application::hide>),
};

constexpr ScriptClass kClass("JSApplication", LogModule::APP_MGR, kMembers);

} // namespace

JSApplication::JSApplication(NPP npp) : SubObjectWrapper(npp, kClass) {
    ApplicationManager::addApplication(impl());
}

JSApplication::~JSApplication() {
    endModel([](Application& application) { ApplicationManager::removeApplication(&application); });
}
