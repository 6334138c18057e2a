/* What the viewer's remote control needs of the desktop's platform library, for the window.
 *
 * The window finds the functions as those of telix_picture.h. All functions may be called on any thread, also
 * concurrently, and return without waiting. */
#ifndef TELIX_DESKTOP_PLATFORM_TELIX_VIEWER_H
#define TELIX_DESKTOP_PLATFORM_TELIX_VIEWER_H

#include <stddef.h>
#include <stdint.h>

#include "desktop/platform/telix_picture.h"

#ifdef __cplusplus
extern "C" {
#endif

/* NOLINTBEGIN(modernize-use-using, modernize-redundant-void-arg): the header is C. */

typedef uint32_t (*telix_desktop_key_set_function)(void);
typedef uint32_t (*telix_desktop_channel_function)(void);
typedef uint32_t (*telix_desktop_channel_count_function)(void);
typedef uint8_t (*telix_desktop_tune_function)(uint32_t number);
typedef size_t (*telix_desktop_channel_name_function)(uint32_t number, char* name, size_t size);
typedef void (*telix_desktop_present_channel_function)(void);
typedef void (*telix_desktop_set_volume_function)(uint32_t volume);

/* NOLINTEND(modernize-use-using, modernize-redundant-void-arg) */

/* The mask of the key groups that pages receive, with the bits of the key set object of OIPF. */
TELIX_DESKTOP_API uint32_t telix_desktop_key_set(void);

/* The position in the channel list, from 1, of the channel that is on; 0 if none is. */
TELIX_DESKTOP_API uint32_t telix_desktop_channel(void);

/* The number of channels. */
TELIX_DESKTOP_API uint32_t telix_desktop_channel_count(void);

/* Tunes to the channel at a position in the channel list, from 1, as the viewer would. Returns 1, or 0 if
 * there is no such channel. */
TELIX_DESKTOP_API uint8_t telix_desktop_tune(uint32_t number);

/* Writes the name of a channel, in UTF-8, cut to `size` bytes with the terminating zero. Returns the length
 * of the whole name; 0 if there is no such channel. */
TELIX_DESKTOP_API size_t telix_desktop_channel_name(uint32_t number, char* name, size_t size);

/* From now on the set presents the channel that is on by itself, on the whole video plane and with sound,
 * while no video/broadcast object and no player presents. An object that has stopped its channel keeps it off
 * until it is released. */
TELIX_DESKTOP_API void telix_desktop_present_channel(void);

/* Sets the volume of the set, 0 to 100, by which that of every sound is multiplied. 100 at first. */
TELIX_DESKTOP_API void telix_desktop_set_volume(uint32_t volume);

#ifdef __cplusplus
}
#endif

#endif
