// scripts/gobject.js, which is embedded at build time.
#ifndef TELIX_BRIDGE_GOBJECTSCRIPT_H
#define TELIX_BRIDGE_GOBJECTSCRIPT_H

namespace bridge {

// An expression whose value holds the functions makeRegistry, makePage and evaluateWith (see GObjectEngine).
extern const char kGObjectScript[];

} // namespace bridge

#endif
