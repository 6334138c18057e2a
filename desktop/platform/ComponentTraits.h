// A video, sound or subtitle stream as the calls of components tell it, be it of broadcast or of media.
#ifndef TELIX_DESKTOP_COMPONENTTRAITS_H
#define TELIX_DESKTOP_COMPONENTTRAITS_H

#include "telix/telix_platform.h"

#include <cstdint>
#include <string>

namespace desktop {

struct ComponentTraits {
    TELIX_JS_AVCOMPTYPE type = 0;
    std::string encoding; // empty where it has no name
    std::string language; // ISO 639-2 code; empty if it is not known
    bool isEncrypted = false;
    bool isAudioDescription = false;
    bool isForHearingImpaired = false;
    float aspectRatio = 0;      // 0 as long as it is not known
    uint32_t audioChannels = 0; // the same
};

} // namespace desktop

#endif
