// The binding of the platform calls: each function that telix/telix_platform.h declares is a forwarder of
// the plug-in with the same name, and has a slot for the library's own function.
#ifndef TELIX_SRC_PLATFORM_PLATFORMCALLS_H
#define TELIX_SRC_PLATFORM_PLATFORMCALLS_H

#include <gmodule.h>

// Looks up every function in the library, in the order of the list, whether or not those before it were
// found. 1 if at least one was found, else 0.
int bindPlatformCalls(GModule* module);

#endif
