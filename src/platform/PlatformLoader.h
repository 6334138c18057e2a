// Opens the television's platform library at the first platform call. This is the one part of the plug-in
// that depends on where a set keeps the library (TELIX_PLATFORM_DIRECTORY), and is compiled once for each
// such place.
#ifndef TELIX_SRC_PLATFORM_PLATFORMLOADER_H
#define TELIX_SRC_PLATFORM_PLATFORMLOADER_H

#include <gmodule.h>

// The library; null until it could be opened. It keeps its value when a library without any function has been
// closed again, so that no second attempt is made.
extern GModule* g_platformModule;

// Whether the library has been opened, 0 or 1. Tries to open it, as often as it is called, until that
// succeeds.
int should_load_telix_library();

// Opens the library and binds its functions. 1 if at least one was bound, else 0.
int load_library(const char* directory, const char* libraryName);

// Puts the address of the function `name` into *slot. 1 if there is such a function, else 0 and a warning.
int resolve_symbol(GModule* module, const char* name, void** slot);

// Calls `function` with `data` on the browser's main loop every `interval` milliseconds for as long as it
// returns other than 0. The result is the id of the source.
unsigned int createAndSetTimer(int interval, int (*function)(void*), void* data);

#endif
