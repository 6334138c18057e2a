// The groups of checks. Each group runs in a process of its own.
#ifndef TELIX_DESKTOP_CONFORMANCE_CHECKGROUP_H
#define TELIX_DESKTOP_CONFORMANCE_CHECKGROUP_H

#include <vector>

#include "desktop/conformance/CheckContext.h"

namespace desktop {

struct CheckGroup {
    const char* name;
    void (*run)(const CheckContext& context);
};
const std::vector<CheckGroup>& checkGroups();

// The checks of a group, in the order in which they are made: later ones may depend on earlier ones.
std::vector<Check> deviceChecks();
std::vector<Check> capabilityChecks();
std::vector<Check> channelChecks();
std::vector<Check> ratingChecks();
std::vector<Check> objectChecks();
std::vector<Check> tuningChecks();
std::vector<Check> playerChecks();
std::vector<Check> drmChecks();

} // namespace desktop

#endif
