/* The sound of the desktop's platform library, for the window that records it.
 *
 * The window finds these functions as those of telix_picture.h. Broadcast and media players are heard one at
 * a time. All functions may be called on any thread, also concurrently. */
#ifndef TELIX_DESKTOP_PLATFORM_TELIX_SOUND_H
#define TELIX_DESKTOP_PLATFORM_TELIX_SOUND_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* NOLINTBEGIN(modernize-use-using): the header is C. */

#define TELIX_DESKTOP_SOUND_RATE 48000 /* frames a second */
#define TELIX_DESKTOP_SOUND_CHANNELS 2 /* left and right: the samples of a frame */

/* A piece of what is heard, with volume and mute. */
typedef struct telix_desktop_sound {
    const int16_t* samples;
    uint32_t frames;
    int64_t time; /* when the first frame is heard: nanoseconds of CLOCK_MONOTONIC */
} telix_desktop_sound;

/* Gets the pieces in their order, shortly before or after they are heard; between them there is silence. The
 * record is valid during the call. Runs on threads of the library, one call at a time, must return at once
 * and must not call the function below. */
typedef void (*telix_desktop_sound_listener)(const telix_desktop_sound* sound, void* data);

typedef void (*telix_desktop_set_sound_listener_function)(telix_desktop_sound_listener listener, void* data);

/* NOLINTEND(modernize-use-using) */

#ifndef TELIX_DESKTOP_API
#define TELIX_DESKTOP_API __attribute__((visibility("default")))
#endif

/* Sets the listener, of which there is one; null removes it. When this returns, the previous listener is not
 * running and is not called again. */
TELIX_DESKTOP_API void telix_desktop_set_sound_listener(telix_desktop_sound_listener listener, void* data);

#ifdef __cplusplus
}
#endif

#endif
