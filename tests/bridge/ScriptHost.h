// A JavaScript context without a browser, with a page of the bridge and the test plug-in in it, for the unit
// tests.
//
// There is no document: instances are made by the test, and what the page script would do is said in script.
// Main thread only.
#ifndef TELIX_TESTS_BRIDGE_SCRIPTHOST_H
#define TELIX_TESTS_BRIDGE_SCRIPTHOST_H

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "bridge/BrowserFunctions.h"
#include "bridge/Page.h"
#include "bridge/Plugin.h"
#include "bridge/Variants.h"

// The implementations of ScriptEngine; tests run on each.
enum class EngineKind { CApi, GObject };
std::string nameOf(const testing::TestParamInfo<EngineKind>& kind);

class ScriptHost : public testing::TestWithParam<EngineKind> {
protected:
    ScriptHost();
    ~ScriptHost() override;

    // Ends the page; everything that is done later then has been done.
    void endPage();
    // Runs what waits for the main loop.
    void runMainLoop();
    // Runs it until the condition holds, a few seconds at most; false when it never does.
    bool runUntil(const std::function<bool()>& condition);

    // The value of a program as text; `threw TEXT` when it throws.
    std::string script(const std::string& source);
    // The same in the window of another frame of the page, where `plugin` is the variable of this one.
    std::string scriptOfAnotherFrame(const std::string& source);
    // A new instance whose object is that global variable of script; its number.
    uint32_t addInstance(const std::string& variable,
                         const std::vector<bridge::Instance::Parameter>& parameters = {});
    NPP npp(uint32_t instance) { return page->instance(instance)->npp(); }
    // Collects garbage until the condition holds; false when it never does.
    bool collectUntil(const std::function<bool()>& condition);
    // An object of script for the plug-in, owned by the caller.
    bridge::OwnedVariant evaluated(const std::string& source);

    const NPNetscapeFuncs& browser = *bridge::browserFunctions();
    std::unique_ptr<bridge::Plugin> plugin;
    std::shared_ptr<bridge::Page> page;

private:
    struct Context;
    std::unique_ptr<Context> m_context;
    std::unique_ptr<Context> m_otherFrame;
};

#endif
