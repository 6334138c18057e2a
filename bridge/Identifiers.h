// The names of properties and methods, interned: equal names have equal addresses for the life of the
// process, which is what NPIdentifier promises. Main thread only.
#ifndef TELIX_BRIDGE_IDENTIFIERS_H
#define TELIX_BRIDGE_IDENTIFIERS_H

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "npapi/npruntime.h"

namespace bridge {

// What an NPIdentifier points at.
struct Identifier {
    bool isString;
    int32_t number;   // of an identifier that is not a string
    std::string text; // of a number its decimal digits
    // The engine's own form of the name, kept by the engine of the process and never freed.
    void* engineName;
};

NPIdentifier identifierFor(std::string_view text);
NPIdentifier identifierFor(int32_t number);
// The identifier of a name in script: names that are array indexes are numbers.
NPIdentifier identifierOfScriptName(std::string_view text);

inline Identifier& identifierOf(NPIdentifier identifier) {
    return *static_cast<Identifier*>(identifier);
}

} // namespace bridge

#endif
