// A minimal browser for benchmarks: the function table entries that the plug-in needs, as fast as possible
// and without checks.
#ifndef TELIX_BENCH_BENCHBROWSER_H
#define TELIX_BENCH_BENCHBROWSER_H

#include <benchmark/benchmark.h>

#include <cstdlib>
#include <cstring>
#include <set>
#include <string>

#include "common/PluginExports.h"
#include "npapi/npfunctions.h"

// The function table for NP_Initialize, with static lifetime.
inline NPNetscapeFuncs& benchBrowserTable() {
    static NPNetscapeFuncs table = [] {
        NPNetscapeFuncs t{};
        t.size = sizeof(t);
        t.version = NP_VERSION_MINOR;
        t.getstringidentifier = [](const char* name) -> NPIdentifier {
            static std::set<std::string> names;
            return const_cast<std::string*>(&*names.insert(name).first);
        };
        t.utf8fromidentifier = [](NPIdentifier name) {
            return strdup(static_cast<std::string*>(name)->c_str());
        };
        t.memalloc = [](uint32_t size) { return std::malloc(size); };
        t.memfree = [](void* block) { std::free(block); };
        t.getvalue = [](NPP, NPNVariable, void* value) -> NPError {
            static NPObject pageObject{nullptr, 1};
            *static_cast<NPObject**>(value) = &pageObject;
            return NPERR_NO_ERROR;
        };
        t.setvalue = [](NPP, NPPVariable, void*) -> NPError { return NPERR_NO_ERROR; };
        t.createobject = [](NPP npp, NPClass* objectClass) {
            NPObject* object = objectClass->allocate(npp, objectClass);
            object->_class = objectClass;
            object->referenceCount = 1;
            return object;
        };
        t.retainobject = [](NPObject* object) {
            if (object) {
                ++object->referenceCount;
            }
            return object;
        };
        t.releaseobject = [](NPObject* object) {
            if (--object->referenceCount == 0 && object->_class) {
                object->_class->deallocate(object);
            }
        };
        t.releasevariantvalue = [](NPVariant* variant) {
            if (variant->type == NPVariantType_String) {
                std::free(const_cast<char*>(variant->value.stringValue.UTF8Characters));
            } else if (variant->type == NPVariantType_Object) {
                benchBrowserTable().releaseobject(variant->value.objectValue);
            }
            variant->type = NPVariantType_Void;
        };
        t.evaluate = [](NPP, NPObject*, NPString*, NPVariant* result) {
            result->type = NPVariantType_Bool;
            result->value.boolValue = true;
            return true;
        };
        t.invokeDefault = [](NPP, NPObject*, const NPVariant*, uint32_t, NPVariant* result) {
            result->type = NPVariantType_Void;
            return true;
        };
        return t;
    }();
    return table;
}

// Initialises the plug-in and runs the benchmarks that `add(plugin)` registers; `plugin` is the plug-in's
// function table. Returns the exit status of the program.
template <typename Add>
int runBenchmarks(int argc, char** argv, Add add) {
    NPPluginFuncs plugin{};
    plugin.size = sizeof(plugin);
    if (NP_Initialize(&benchBrowserTable(), &plugin) != NPERR_NO_ERROR) {
        return 2;
    }
    benchmark::Initialize(&argc, argv);
    add(plugin);
    benchmark::RunSpecifiedBenchmarks();
    NP_Shutdown();
    return 0;
}

// The same with benchmarks that `registerAll(name, level)` registers, without and with a log level.
inline int runWithAndWithoutLog(int argc, char** argv,
                                void (*registerAll)(const std::string& name, const char* level)) {
    return runBenchmarks(argc, argv, [=](NPPluginFuncs&) {
        registerAll("log unset", nullptr);
        // Last, because the plug-in caches a log level other than 0. No module has this number, so nothing is
        // logged.
        registerAll("log set", "99");
    });
}

#endif
