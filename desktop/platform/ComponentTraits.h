// What the plug-in can ask of a video, audio or subtitle stream, of broadcast and of media alike.
#ifndef TELIX_DESKTOP_PLATFORM_COMPONENTTRAITS_H
#define TELIX_DESKTOP_PLATFORM_COMPONENTTRAITS_H

#include <cstdint>
#include <string>

#include "telix/telix_platform.h"

namespace desktop {

struct ComponentTraits {
    TELIX_JS_AVCOMPTYPE type = 0;
    std::string encoding; // empty if it has no name
    std::string language; // ISO 639-2; empty if it is unknown
    bool isEncrypted = false;
    bool isAudioDescription = false;
    bool isForHearingImpaired = false;
    float aspectRatio = 0;      // 0 until it is known
    uint32_t audioChannels = 0; // 0 until it is known
};

} // namespace desktop

#endif
