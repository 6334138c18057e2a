// The sound of the platform library on its way to the window.
#include "desktop/window/webkit/extension/SoundSender.h"

#include <sys/socket.h>

#include <algorithm>
#include <cstddef>

#include "desktop/window/record/SoundSource.h"
#include "desktop/window/webkit/SoundMessage.h"

namespace desktop {

namespace {

// Called on threads of the library. What the window does not take in time is lost: playback must not wait.
void sendPieces(int channel, const telix_desktop_sound& sound) {
    SoundMessage message;
    for (uint32_t sent = 0; sent < sound.frames; sent += kMaxSoundFrames) {
        const size_t frames = std::min(sound.frames - sent, kMaxSoundFrames);
        const size_t samples = frames * TELIX_DESKTOP_SOUND_CHANNELS;
        const int16_t* first = sound.samples + size_t{sent} * TELIX_DESKTOP_SOUND_CHANNELS;
        std::copy(first, first + samples, message.samples);
        message.time = sound.time + int64_t{sent} * 1000000000 / TELIX_DESKTOP_SOUND_RATE;
        send(channel, &message, offsetof(SoundMessage, samples) + samples * sizeof(int16_t),
             MSG_DONTWAIT | MSG_NOSIGNAL);
    }
}

} // namespace

void sendSound(int channel) {
    if (channel >= 0) {
        // For the life of the process, as the platform library is.
        [[maybe_unused]] static auto* source =
            new SoundSource([channel](const telix_desktop_sound& sound) { sendPieces(channel, sound); });
    }
}

} // namespace desktop
