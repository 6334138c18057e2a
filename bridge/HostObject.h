// The object by which the page script calls its page. It is an NPObject like the plug-in's, so that it needs
// nothing more of a script engine; the page script keeps it from the page's own script. Main thread only.
#ifndef TELIX_BRIDGE_HOSTOBJECT_H
#define TELIX_BRIDGE_HOSTOBJECT_H

#include <string>
#include <string_view>

#include "npapi/npruntime.h"

namespace bridge {

class Page;

// A host object that belongs to that instance, with a reference for the caller. Its page outlives its
// instance.
NPObject* createHostObject(Page& page, NPP instance);

// Bytes as the text whose characters they are, and back; characters above U+00FF count as their low byte.
std::string textFromBytes(std::string_view bytes);
std::string bytesFromText(std::string_view text);

} // namespace bridge

#endif
