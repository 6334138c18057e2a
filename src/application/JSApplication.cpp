// The script interface of an application.
#include "src/application/JSApplication.h"

#include "src/application/Application.h"
#include "src/application/ApplicationManager.h"

namespace {

// quirk 16: a handler is written as an object or not at all; null is refused.
constexpr ScriptMember kMembers[] = {
    property("privateData", reader<&Application::privateData>),
    property("private", reader<&Application::privateData>),
    property("onKeyPress", reader<&Application::onKeyPress>, writer<&Application::setOnKeyPress>),
    property("onKeyUp", reader<&Application::onKeyUp>, writer<&Application::setOnKeyUp>),
    property("onKeyDown", reader<&Application::onKeyDown>, writer<&Application::setOnKeyDown>),
    property("onApplicationShown", reader<&Application::onApplicationShown>,
             writer<&Application::setOnApplicationShown>),
    property("onApplicationHidden", reader<&Application::onApplicationHidden>,
             writer<&Application::setOnApplicationHidden>),
    method("createApplication", invoker<&Application::createApplication>),
    method("destroyApplication", invoker<&Application::destroyApplication>),
    method("show", invoker<&Application::show>),
    method("hide", invoker<&Application::hide>),
};

constexpr ScriptClass kClass("JSApplication", LogModule::APP_MGR, kMembers);

} // namespace

JSApplication::JSApplication(NPP npp) : SubObjectWrapper(npp, kClass) {
    ApplicationManager::addApplication(impl());
}

JSApplication::~JSApplication() {
    endModel([](Application& application) { ApplicationManager::removeApplication(&application); });
}
