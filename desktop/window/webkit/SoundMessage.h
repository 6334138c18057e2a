// The messages of a SoundChannel.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_SOUNDMESSAGE_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_SOUNDMESSAGE_H

#include <cstdint>

#include "desktop/platform/telix_sound.h"

namespace desktop {

constexpr uint32_t kMaxSoundFrames = 4096; // in a message

struct SoundMessage {
    int64_t time;
    int16_t samples[kMaxSoundFrames * TELIX_DESKTOP_SOUND_CHANNELS]; // as many as there are
};

} // namespace desktop

#endif
