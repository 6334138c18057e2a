// A minimal browser for benchmarks: the function table entries that the plug-in needs, as fast as possible
// and without checks.
#ifndef TELIX_BENCH_BENCHBROWSER_H
#define TELIX_BENCH_BENCHBROWSER_H

#include <cstdlib>
#include <cstring>
#include <set>
#include <string>

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
        t.getproperty = [](NPP npp, NPObject*, NPIdentifier, NPVariant* result) {
            result->type = NPVariantType_Object;
            return benchBrowserTable().getvalue(npp, NPNVPluginElementNPObject, &result->value.objectValue) ==
                   NPERR_NO_ERROR;
        };
        t.pluginthreadasynccall = [](NPP, void (*function)(void*), void* data) { function(data); };
        t.setproperty = [](NPP, NPObject*, NPIdentifier, const NPVariant*) { return true; };
        t.invokeDefault = [](NPP, NPObject*, const NPVariant*, uint32_t, NPVariant* result) {
            result->type = NPVariantType_Void;
            return true;
        };
        return t;
    }();
    return table;
}

#endif
