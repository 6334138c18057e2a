// A plug-in in front of the television's plug-in, for an engine that reads no elements of its lists by index,
// and for pages that give their elements no id.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_ADAPTER_PLUGINADAPTER_H
#define TELIX_DESKTOP_WINDOW_NPAPI_ADAPTER_PLUGINADAPTER_H

// What the adapter exports besides the entry points of a plug-in: names the plug-in that it leads to. Called
// once, before the engine loads the adapter. Returns false if `file` cannot be loaded.
constexpr char kAdaptPluginFunction[] = "telix_adapt_plugin";
using AdaptPluginFunction = bool (*)(const char* file);

#endif
