// What the plug-in behind the adapter exports besides the entry points of a plug-in.
#ifndef TELIX_TESTS_WINDOW_ADAPTEDPLUGIN_H
#define TELIX_TESTS_WINDOW_ADAPTEDPLUGIN_H

// The calls that have reached the plug-in since the last call of this function, separated by spaces. The text
// stays valid until the next call.
constexpr char kAdaptedCallsFunction[] = "telix_adapted_calls";
using AdaptedCallsFunction = const char* (*)();

#endif
