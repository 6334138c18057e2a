// The kinds of embedded objects, in the order in which a MIME type is compared with them.
#include "common/ObjectKind.h"

#include "src/application/ApplicationManager.h"
#include "src/avcontrol/AVControl.h"
#include "src/capabilities/Capabilities.h"
#include "src/config/OipfConfiguration.h"
#include "src/drm/DRMAgent.h"
#include "src/parental/ParentalControlManager.h"
#include "src/videobroadcast/VideoBroadcast.h"

const ObjectKind* const kObjectKinds[] = {
    &kApplicationManagerKind,     &kAvControlKind,    &kVideoBroadcastKind, &kOipfConfigurationKind,
    &kParentalControlManagerKind, &kCapabilitiesKind, &kDrmAgentKind,       nullptr,
};
