// The browser's function table as the plug-in gets it. Every entry is filled: what makes no sense in this
// browser returns an error and does nothing.
#ifndef TELIX_BRIDGE_BROWSERFUNCTIONS_H
#define TELIX_BRIDGE_BROWSERFUNCTIONS_H

#include "npapi/npfunctions.h"

namespace bridge {

// Valid for the life of the process. Its functions are for the main thread, but for pluginthreadasynccall,
// memalloc and memfree.
NPNetscapeFuncs* browserFunctions();

} // namespace bridge

#endif
