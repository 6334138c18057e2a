// A plug-in that writes down the calls that reach it.
#include "tests/window/AdaptedPlugin.h"

#include <string>

#include "npapi/npfunctions.h"

#define EXPORT extern "C" __attribute__((visibility("default")))

namespace {

std::string calls;

void note(const std::string& call) {
    calls += calls.empty() ? call : ' ' + call;
}

NPError newInstance(NPMIMEType, NPP, uint16_t, int16_t, char*[], char*[], NPSavedData*) {
    note("new");
    return NPERR_NO_ERROR;
}

NPError destroyInstance(NPP, NPSavedData**) {
    note("destroy");
    return NPERR_NO_ERROR;
}

NPError setWindow(NPP, NPWindow* window) {
    note(window ? "window:" + std::to_string(window->width) : "window");
    return NPERR_NO_ERROR;
}

} // namespace

EXPORT const char* telix_adapted_calls() {
    static std::string taken;
    taken.swap(calls);
    calls.clear();
    return taken.c_str();
}

// NOLINTBEGIN(readability-identifier-naming): the names are those of NPAPI.

EXPORT NPError NP_Initialize(NPNetscapeFuncs*, NPPluginFuncs* plugin) {
    note("initialize");
    plugin->newp = newInstance;
    plugin->destroy = destroyInstance;
    plugin->setwindow = setWindow;
    return NPERR_NO_ERROR;
}

EXPORT NPError NP_Shutdown() {
    note("shutdown");
    return NPERR_NO_ERROR;
}

EXPORT NPError NP_GetValue(void*, NPPVariable, void*) {
    return NPERR_INVALID_PARAM;
}

EXPORT const char* NP_GetMIMEDescription() {
    return "application/x-telix-adapted::;";
}

// NOLINTEND(readability-identifier-naming)
