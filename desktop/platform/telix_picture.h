/* The picture of the desktop's platform library, for the window that shows it beneath the page.
 *
 * The window does not link against libtelix.so: the plug-in opens it. The window finds the library that is
 * loaded with dlopen(..., RTLD_NOLOAD) and these functions in it with dlsym, by the names below; a
 * libtelix.so without them has no picture for it.
 *
 * Broadcast and media players present through the same picture, one at a time. It is never out of date by
 * more than one frame: a frame that nobody acquires is replaced by the next one.
 *
 * All functions may be called from any thread, several at once. */
#ifndef TELIX_PICTURE_H
#define TELIX_PICTURE_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* NOLINTBEGIN(modernize-use-using): the header is C. */

/* What is to be seen now. Coordinates are pixels of the browser's 1280 by 720 page. */
typedef struct telix_desktop_frame {
    const uint8_t* pixels; /* 4 bytes a pixel: blue, green, red, not used; null while there is no frame */
    uint32_t width;        /* of the frame, in pixels */
    uint32_t height;
    uint32_t stride;      /* bytes from one line to the next */
    uint32_t aspectWidth; /* the shape in which the frame is to be seen, as 16 to 9; 0 to 0 without a frame */
    uint32_t aspectHeight;
    uint64_t serial; /* a new number with each frame; equal numbers mean the same pixels */
    int32_t areaX;   /* where the page wants the picture */
    int32_t areaY;
    uint32_t areaWidth;
    uint32_t areaHeight;
    uint8_t fullScreen; /* 1: the picture fills the page, whatever the area */
    uint8_t visible;    /* 1: something is presented; 0: show black, pixels is null */
    void* owner;        /* the library's, for the release */
} telix_desktop_frame;

/* Called when a frame, the display area, full screen or visibility is new. It comes from the library's
 * threads, also several at once, and must return at once: it may schedule a repaint on its own thread, and
 * must not call the functions below. */
typedef void (*telix_desktop_wakeup)(void* data);

typedef void (*telix_desktop_set_wakeup_function)(telix_desktop_wakeup wakeup, void* data);
typedef void (*telix_desktop_acquire_frame_function)(telix_desktop_frame* frame);
typedef void (*telix_desktop_release_frame_function)(telix_desktop_frame* frame);

/* NOLINTEND(modernize-use-using) */

#define TELIX_DESKTOP_API __attribute__((visibility("default")))

/* Sets the one wake-up callback, or none with null. It is called once at once if something is visible
 * already. When this returns, the callback before it is not running and is never called again. */
TELIX_DESKTOP_API void telix_desktop_set_wakeup(telix_desktop_wakeup wakeup, void* data);

/* Fills in the newest frame and the display area. The pixels stay valid and unchanged until the record is
 * given to telix_desktop_release_frame, which must follow for each record, also for one without pixels. A
 * frame held for long costs its memory and nothing else. */
TELIX_DESKTOP_API void telix_desktop_acquire_frame(telix_desktop_frame* frame);

/* Gives the pixels of an acquired frame back and clears the record; a cleared record may be given again. */
TELIX_DESKTOP_API void telix_desktop_release_frame(telix_desktop_frame* frame);

#ifdef __cplusplus
}
#endif

#endif
