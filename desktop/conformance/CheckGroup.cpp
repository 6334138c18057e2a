#include "desktop/conformance/CheckGroup.h"

namespace desktop {

namespace {

template <std::vector<Check> (*Checks)()>
void runAll(const CheckContext& context) {
    for (const Check& check : Checks()) {
        context.run(check);
    }
}

// One check per function of the library.
void runExportChecks(const CheckContext& context) {
    for (const Library::Export& each : context.library.exports) {
        context.run({std::string("has ") + each.name, {}, [&](const CheckContext&) {
                         expect(each.isPresent, "it is missing");
                     }});
    }
}

} // namespace

const std::vector<CheckGroup>& checkGroups() {
    static const auto& groups = *new std::vector<CheckGroup>{
        {"functions", runExportChecks},
        {"device", runAll<deviceChecks>},
        {"capabilities", runAll<capabilityChecks>},
        {"channels", runAll<channelChecks>},
        {"ratings", runAll<ratingChecks>},
        {"broadcast objects", runAll<objectChecks>},
        {"broadcast", runAll<tuningChecks>},
        {"players", runAll<playerChecks>},
        {"DRM", runAll<drmChecks>},
    };
    return groups;
}

} // namespace desktop
