// Script access to the plug-in's objects: property read, method call and HasProperty through the NPClass, for
// the first and the last name of a wrapper, compared with a hand-written object; and calls to the browser and
// to the platform library, compared with direct calls. Each with LOG_MODULE unset, when every log statement
// calls getenv(), and set to the number of another module, when the level is cached.
#include <benchmark/benchmark.h>
#include <dlfcn.h>

#include <cstdio>

#include "bench/BenchMain.h"
#include "common/BrowserGates.h"
#include "common/PluginExports.h"
#include "common/ScriptReferences.h"
#include "src/application/JSApplication.h"
#include "telix/telix_platform.h"

namespace {

// The minimal object: it compares identifiers and returns a result.
struct BareObject : NPObject {
    NPIdentifier names[9];
};

const char* const kBareNames[] = {"onKeyPress",
                                  "onKeyUp",
                                  "onKeyDown",
                                  "onApplicationShown",
                                  "onApplicationHidden",
                                  "createApplication",
                                  "destroyApplication",
                                  "show",
                                  "hide"};

bool bareHasProperty(NPObject* object, NPIdentifier name) {
    auto* bare = static_cast<BareObject*>(object);
    return name == bare->names[0] || name == bare->names[1] || name == bare->names[2] ||
           name == bare->names[3] || name == bare->names[4];
}

bool bareGetProperty(NPObject* object, NPIdentifier name, NPVariant* result) {
    if (!bareHasProperty(object, name)) {
        return false;
    }
    result->type = NPVariantType_Null;
    return true;
}

bool bareInvoke(NPObject* object, NPIdentifier name, const NPVariant*, uint32_t, NPVariant*) {
    auto* bare = static_cast<BareObject*>(object);
    if (name != bare->names[5] && name != bare->names[6] && name != bare->names[7] &&
        name != bare->names[8]) {
        return false;
    }
    const std::string script = "window.hideHbbTVApplication();";
    NPString text{script.data(), static_cast<uint32_t>(script.size())};
    NPVariant value{};
    return benchBrowserTable().evaluate(nullptr, nullptr, &text, &value);
}

NPClass bareClass = {NP_CLASS_STRUCT_VERSION,
                     [](NPP, NPClass*) -> NPObject* {
                         auto* bare = new BareObject;
                         for (size_t i = 0; i < std::size(kBareNames); ++i) {
                             bare->names[i] = benchBrowserTable().getstringidentifier(kBareNames[i]);
                         }
                         return bare;
                     },
                     [](NPObject* object) { delete static_cast<BareObject*>(object); },
                     nullptr,
                     nullptr,
                     bareInvoke,
                     nullptr,
                     bareHasProperty,
                     bareGetProperty,
                     nullptr,
                     nullptr,
                     nullptr,
                     nullptr};

NPP instance() {
    static NPP_t npp{};
    return &npp;
}

NPObject* ours() {
    static NPObject* object = createScriptObject<JSApplication>(instance());
    return object;
}

NPObject* bare() {
    static NPObject* object = benchBrowserTable().createobject(instance(), &bareClass);
    return object;
}

void hasProperty(benchmark::State& state, NPObject* (*object)(), const char* name) {
    const NPIdentifier identifier = benchBrowserTable().getstringidentifier(name);
    NPObject* target = object();
    for (auto _ : state) {
        benchmark::DoNotOptimize(target->_class->hasProperty(target, identifier));
    }
}

void getProperty(benchmark::State& state, NPObject* (*object)(), const char* name) {
    const NPIdentifier identifier = benchBrowserTable().getstringidentifier(name);
    NPObject* target = object();
    for (auto _ : state) {
        NPVariant result;
        benchmark::DoNotOptimize(target->_class->getProperty(target, identifier, &result));
        benchmark::DoNotOptimize(result);
    }
}

void callMethod(benchmark::State& state, NPObject* (*object)(), const char* name) {
    const NPIdentifier identifier = benchBrowserTable().getstringidentifier(name);
    NPObject* target = object();
    const NPVariant none[1] = {};
    for (auto _ : state) {
        NPVariant result{};
        benchmark::DoNotOptimize(target->_class->invoke(target, identifier, none, 0, &result));
    }
}

void callGetenv(benchmark::State& state) {
    for (auto _ : state) {
        benchmark::DoNotOptimize(std::getenv("LOG_MODULE"));
    }
}

void identifierThroughGate(benchmark::State& state) {
    for (auto _ : state) {
        benchmark::DoNotOptimize(NPN_GetStringIdentifier("onKeyPress"));
    }
}

void identifierDirect(benchmark::State& state) {
    for (auto _ : state) {
        benchmark::DoNotOptimize(benchBrowserTable().getstringidentifier("onKeyPress"));
    }
}

void platformThroughForwarder(benchmark::State& state) {
    uint32_t amount = 0;
    for (auto _ : state) {
        benchmark::DoNotOptimize(TELIX_JS_APP_GetFreeMem(&amount));
    }
}

void platformDirect(benchmark::State& state) {
    void* library = dlopen(TELIX_BENCH_LIBRARY, RTLD_LAZY);
    auto call =
        library
            ? reinterpret_cast<decltype(&TELIX_JS_APP_GetFreeMem)>(dlsym(library, "TELIX_JS_APP_GetFreeMem"))
            : nullptr;
    if (!call) {
        state.SkipWithError("no platform library");
        return;
    }
    uint32_t amount = 0;
    for (auto _ : state) {
        benchmark::DoNotOptimize(call(&amount));
    }
}

// `level` is the value of LOG_MODULE, null for none.
void registerAll(const std::string& log, const char* level) {
    const auto add = [&](const std::string& name, auto function, auto... arguments) {
        benchmark::RegisterBenchmark((name + "/" + log).c_str(), [=](benchmark::State& state) {
            level ? setenv("LOG_MODULE", level, 1) : unsetenv("LOG_MODULE");
            function(state, arguments...);
        });
    };
    struct Side {
        const char* name;
        NPObject* (*object)();
    };
    for (const Side& side : {Side{"bare", bare}, Side{"ours", ours}}) {
        const std::string suffix = std::string("/") + side.name;
        add("HasProperty/first" + suffix, hasProperty, side.object, "onKeyPress");
        add("HasProperty/last" + suffix, hasProperty, side.object, "onApplicationHidden");
        add("HasProperty/none" + suffix, hasProperty, side.object, "noSuchName");
        add("GetProperty/first" + suffix, getProperty, side.object, "onKeyPress");
        add("GetProperty/last" + suffix, getProperty, side.object, "onApplicationHidden");
        add("Invoke/last" + suffix, callMethod, side.object, "hide");
    }
    add("getenv", callGetenv);
    add("identifier/direct", identifierDirect);
    add("identifier/gate", identifierThroughGate);
    add("platform/direct", platformDirect);
    add("platform/forwarder", platformThroughForwarder);
}

} // namespace

int main(int argc, char** argv) {
    return runWithAndWithoutLog(argc, argv, registerAll);
}
