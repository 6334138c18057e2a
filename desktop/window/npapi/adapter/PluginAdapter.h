// A plug-in in front of the television's plug-in, for an engine that reads no elements of its lists by index
// and calls functions at the wrong time, for pages that give their elements no id, and for what neither
// engine nor plug-in tells anybody.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_ADAPTER_PLUGINADAPTER_H
#define TELIX_DESKTOP_WINDOW_NPAPI_ADAPTER_PLUGINADAPTER_H

// Reports a warning (see warningNamed()) of the page with the URL `page`, which is that of the application's
// document, not that of a frame in it. Main thread.
using ReportWarningFunction = void (*)(const char* page, const char* warning, const char* subject,
                                       void* data);

struct PluginAdapterSettings {
    const char* file; // of the plug-in
    bool isStrict;    // no ids, and lists as the engine has them
    ReportWarningFunction report;
    void* data; // for `report`
};

// What the adapter exports besides the entry points of a plug-in: names the plug-in that it leads to. Called
// once, before the engine loads the adapter. Returns false if the file cannot be loaded.
constexpr char kAdaptPluginFunction[] = "telix_adapt_plugin";
using AdaptPluginFunction = bool (*)(const PluginAdapterSettings& settings);

#endif
