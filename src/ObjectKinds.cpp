// The kinds of embedded objects, in the order in which a MIME type is compared with them.
#include "common/ObjectKind.h"

#include "src/application/ApplicationManager.h"
#include "src/capabilities/Capabilities.h"
#include "src/config/OipfConfiguration.h"
#include "src/drm/DRMAgent.h"
#include "src/parental/ParentalControlManager.h"

const ObjectKind* const objectKinds[] = {
    &applicationManagerKind, &oipfConfigurationKind, &parentalControlManagerKind,
    &capabilitiesKind,       &drmAgentKind,          nullptr,
};
