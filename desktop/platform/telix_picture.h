/* The video plane of the desktop's platform library, for the window that composes it with the page.
 *
 * The window does not link against libtelix.so, because the plug-in opens it. It finds the loaded library
 * with dlopen(..., RTLD_NOLOAD) and these functions in it with dlsym, by the names below; a libtelix.so
 * without them has no video plane.
 *
 * Broadcast and media players present on the same plane, one at a time. It holds the newest frame: a frame
 * that nobody acquires is replaced by the next one.
 *
 * All functions may be called on any thread, also concurrently. */
#ifndef TELIX_DESKTOP_PLATFORM_TELIX_PICTURE_H
#define TELIX_DESKTOP_PLATFORM_TELIX_PICTURE_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* NOLINTBEGIN(modernize-use-using, modernize-redundant-void-arg): the header is C. */

/* What is to be seen now. Coordinates are pixels of the browser's 1280 by 720 page. */
typedef struct telix_desktop_frame {
    const uint8_t* pixels; /* 4 bytes a pixel: blue, green, red, unused; null if there is no frame */
    uint32_t width;        /* of the frame, in pixels */
    uint32_t height;
    uint32_t stride;      /* bytes from one line to the next */
    uint32_t aspectWidth; /* display aspect ratio, as 16 and 9; 0 and 0 without a frame */
    uint32_t aspectHeight;
    uint64_t presenter; /* the object that presents, see telix_desktop_newest_presenter; 0: none */
    uint64_t serial;    /* increases with each frame; equal numbers mean equal pixels */
    int32_t areaX;      /* where the page shows the video */
    int32_t areaY;
    uint32_t areaWidth;
    uint32_t areaHeight;
    uint8_t fullScreen; /* 1: the video fills the page, whatever the area */
    uint8_t visible;    /* 1: there is video to show; 0: show black, pixels is null */
    void* owner;        /* for the release */
} telix_desktop_frame;

/* Called when the frame, the display area, full screen or visibility changes. It runs on threads of the
 * library, also concurrently, and must return at once: it may schedule a repaint on its own thread, and must
 * not call the functions below. */
typedef void (*telix_desktop_wakeup)(void* data);

typedef void (*telix_desktop_set_wakeup_function)(telix_desktop_wakeup wakeup, void* data);
typedef void (*telix_desktop_acquire_frame_function)(telix_desktop_frame* frame);
typedef void (*telix_desktop_release_frame_function)(telix_desktop_frame* frame);
typedef uint64_t (*telix_desktop_newest_presenter_function)(void);

/* NOLINTEND(modernize-use-using, modernize-redundant-void-arg) */

#ifndef TELIX_DESKTOP_API
#define TELIX_DESKTOP_API __attribute__((visibility("default")))
#endif

/* Sets the wake-up callback, of which there is one; null removes it. It is called immediately if something is
 * presented already. When this returns, the previous callback is not running and is not called again. */
TELIX_DESKTOP_API void telix_desktop_set_wakeup(telix_desktop_wakeup wakeup, void* data);

/* Fills in the newest frame and the display area. The pixels stay valid and unchanged until the record is
 * passed to telix_desktop_release_frame, which must follow for each record, also for one without pixels. A
 * frame that is kept for long costs its memory and nothing else. */
TELIX_DESKTOP_API void telix_desktop_acquire_frame(telix_desktop_frame* frame);

/* Releases the pixels of an acquired frame and clears the record. A cleared record may be passed again. */
TELIX_DESKTOP_API void telix_desktop_release_frame(telix_desktop_frame* frame);

/* The number of the object that has been created last, 0 before the first. Video/broadcast objects and media
 * players are numbered together, from 1, in the order in which TELIX_JS_VB_GetHandle and
 * TELIX_JS_AV_CreatePlayer create them. So whoever reads this before and after a page's element gets its
 * object knows the number of the element's object. */
TELIX_DESKTOP_API uint64_t telix_desktop_newest_presenter(void);

#ifdef __cplusplus
}
#endif

#endif
