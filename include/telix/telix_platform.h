/* The platform library of a television set, libtelix.so: what a set maker implements for the plug-in.
 *
 * The plug-in does not link against the library. It opens libtelix.so at its first platform call, from the
 * one directory for which it was built (/mnt/browser/lib/TV unless the build says otherwise), with lazy and
 * local binding, and looks each function up by name. It never closes the library again. A function that the
 * library does not export counts as refused with TELIX_RETCODE_NOT_AVAILABLE at every call, and all others
 * work; a port can begin with a few functions and grow. While the file does not exist, each call looks for it
 * again.
 *
 * The functions and their meanings are listed in telix/telix_platform_calls.h and declared at the end of this
 * file: a library includes only this header, and the compiler checks its definitions. The rules for all of
 * them:
 *
 * Return codes. Every function returns 0 for success. Any other value refuses the call; apart from one value
 * of TELIX_JS_AV_Pause the plug-in does not distinguish them. Pages get no error for a refused call: they see
 * the last value or an empty one, as described with each function ("Refused: ...").
 *
 * Outputs are written through a pointer, which is never null. The variable that it points to is 0 or null
 * before the call unless the function says "not preset". A function that refuses leaves it unchanged.
 *
 * String arguments are null-terminated UTF-8 and valid during the call; copy what is needed later. They are
 * not null unless the function says so.
 *
 * String outputs (char**) are null-terminated UTF-8 in memory allocated with malloc. Ownership passes to the
 * plug-in, which calls free for each: allocate a new block at every call. Null with a return code of 0 counts
 * as an empty string.
 *
 * Array outputs (handles, records) are owned by the library: the plug-in reads them on the calling thread,
 * before it makes any further call, and never frees them. Keep the memory valid until the same function is
 * called again.
 *
 * Handles are numbers that the library chooses and the plug-in does not interpret; 0 means none. A handle is
 * valid for as long as the library accepts it. Pages may keep the object of a handle for a long time: a
 * function that is called with a handle that is no longer valid refuses and has no other effect.
 *
 * Threads. All calls come from the browser's main thread, one at a time, except TELIX_JS_AV_GetPlayInfo,
 * TELIX_JS_AV_Pause, TELIX_JS_AV_Resume and TELIX_JS_AV_Stop, which also come from a buffering thread of each
 * playing player; these four must be thread-safe beside any other call.
 *
 * Time. The browser is blocked during a call. Requests (tune, play, seek, send a message) start the operation
 * and return without waiting for it; the outcome is reported through a callback.
 *
 * Callbacks may be called on any thread, several concurrently, also before the call that caused them has
 * returned. They copy their arguments and return immediately; their return code is always 0. Strings and data
 * need to be valid only during the call. The plug-in delivers them to the page later, on the browser's main
 * thread, in the order of the calls. A callback for a handle that the plug-in has released has no effect. */
#ifndef TELIX_TELIX_PLATFORM_H
#define TELIX_TELIX_PLATFORM_H

#include <stdint.h>

/* Exports the functions, also from a library that is compiled with hidden visibility. */
#define TELIX_JS_API __attribute__((visibility("default")))

#ifdef __cplusplus
extern "C" {
#endif

/* ---- Numbers ----------------------------------------------------------------------------------------- */

typedef uint8_t ___UINT8;
typedef uint32_t ___UINT32;

/* Handles. 0 means none. */
typedef uint32_t TELIX_JS_AV_HANDLE;                      /* a player of the A/V control object */
typedef uint32_t TELIX_JS_VB_HANDLE;                      /* a video/broadcast object */
typedef uint32_t TELIX_JS_CM_HANDLE;                      /* a channel */
typedef uint32_t TELIX_JS_SI_HANDLE;                      /* a programme */
typedef uint32_t TELIX_JS_SI_PARENTALRATING_HANDLE;       /* a parental rating */
typedef uint32_t TELIX_JS_SI_PARENTALRATINGSCHEME_HANDLE; /* a scheme of parental ratings */
typedef uint32_t TELIX_JS_AVCOMPHANDLE;                   /* a video, audio or subtitle component */

/* The enumerations are 32-bit integers with named values, so that a set can pass values of its own where
 * pages read the number. */

/* Return code of every function. */
typedef int32_t TELIX_RETCODE_ENUM_T;
enum {
    TELIX_RETCODE_SUCCESS = 0,
    TELIX_RETCODE_PAUSE_TAKEN = 4,   /* of TELIX_JS_AV_Pause only: counts as success */
    TELIX_RETCODE_NOT_AVAILABLE = 5, /* what the plug-in itself returns for a missing library or function */
};

/* Type of a component. */
typedef uint32_t TELIX_JS_AVCOMPTYPE;
enum {
    TELIX_JS_AVCOMPTYPE_VIDEO = 0,
    TELIX_JS_AVCOMPTYPE_AUDIO = 1,
    TELIX_JS_AVCOMPTYPE_SUBTITLE = 2,
};

/* Messages of a player. Values without a name are accepted and ignored. A message that equals the previous
 * one is dropped, except TELIX_AV_CB_MSG_PLAYSTART. Errors put the A/V control object into its error state;
 * the number after each is the value of its property "error". */
typedef uint32_t TELIX_AV_CB_MSG;
enum {
    TELIX_AV_CB_MSG_PLAYEND = 1,                       /* the media has ended, including all repetitions */
    TELIX_AV_CB_MSG_PLAYSTART = 2,                     /* the media, or the next of the queue, is presented */
    TELIX_AV_CB_MSG_ERR_PLAYING = 0xF000,              /* any other error: 2 */
    TELIX_AV_CB_MSG_ERR_NOT_FOUND = 0xF003,            /* content not available: 5 */
    TELIX_AV_CB_MSG_ERR_CODEC_NOT_SUPPORTED = 0xF004,  /* format not supported: 0 */
    TELIX_AV_CB_MSG_ERR_NET_DISCONNECTED = 0xFF00,     /* connection lost: 1 */
    TELIX_AV_CB_MSG_ERR_NET_BUSY = 0xFF01,             /* logged; no change of state */
    TELIX_AV_CB_MSG_ERR_NET_CANNOT_PROCESS = 0xFF02,   /* logged; no change of state */
    TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT = 0xFF03,   /* no connection: 1 */
    TELIX_AV_CB_MSG_ERR_WMDRM_CANNOT_PROCESS = 0xFF10, /* rights: 2 */
    TELIX_AV_CB_MSG_ERR_WMDRM_LIC_FAILLOCAL = 0xFF11,  /* rights: 2 */
    TELIX_AV_CB_MSG_ERR_WMDRM_LIC_FAILTRANSFER = 0xFF12, /* rights: 2 */
    TELIX_AV_CB_MSG_ERR_WMDRM_LIC_EXPIRED = 0xFF13,      /* rights: 2 */
};

/* Play state of a video/broadcast object; pages read the number unchanged. */
typedef int32_t TELIX_PLAYSTATE_ENUM_T;
enum {
    TELIX_PLAYSTATE_UNREALIZED = 0,
    TELIX_PLAYSTATE_CONNECTING = 1,
    TELIX_PLAYSTATE_PRESENTING = 2,
    TELIX_PLAYSTATE_STOPPED = 3,
};

/* Why broadcast presentation has failed; pages read the number unchanged. */
typedef int32_t TELIX_ERR_STATE_ENUM_T;
enum {
    TELIX_ERR_STATE_NONE = 200, /* in a play state change: no error; pages read undefined */
};

/* Error state of rights for media, and result code of a DRM message; pages read the numbers unchanged. */
typedef int32_t TELIX_AV_DRM_ERR_STATE_ENUM_T;
typedef int32_t TELIX_DRM_RESULT_CODE_ENUM_T;
typedef TELIX_DRM_RESULT_CODE_ENUM_T TELIX_DRM_RESULT_CODE_ENUM_T_tag;

/* ---- Records ----------------------------------------------------------------------------------------- */

/* Position and size of the video plane, in pixels of the 1280 by 720 page from its top left corner. Each
 * value is the number of the page, truncated to 16 bits. */
typedef struct TELIX_JS_DISPLAY_AREA {
    uint16_t x;
    uint16_t y;
    uint16_t width;
    uint16_t height;
} TELIX_JS_DISPLAY_AREA;

/* Progress of a player.
 *
 * The plug-in does its own buffering with the last two fields: while a player is playing, a thread of the
 * plug-in reads this record once a second, pauses the player when `buffered` falls below a lower limit
 * (default 4; the page or the environment can change it), and resumes it at the upper limit (default 10).
 * Values of `buffered`: 0xFFFFFFFF          the set does not report the level; the plug-in resumes a player
 * that it has paused top byte 0xFF       otherwise: the low 16 bits are the level, and monitoring ends for
 * this clip third byte 0xFF     otherwise: the low 16 bits are the level any other value     is the level. */
typedef struct TELIX_JS_AV_PLAY_INFO {
    uint32_t state;        /* 0: no values; 1 with duration, position and buffered 0: no values yet */
    uint32_t playPosition; /* milliseconds */
    uint32_t duration;     /* milliseconds; 0 when unknown */
    uint32_t reserved;     /* not read */
    uint32_t bufferedEnd;  /* end of the media that has been fetched, in seconds from the start of the clip */
    uint32_t buffered;     /* buffer level: media fetched ahead of the position, in seconds; see above */
} TELIX_JS_AV_PLAY_INFO;

/* A parental rating scheme. The library owns its strings. For a record with a null name pages get a scheme
 * without name and ratings; otherwise both arrays hold `count` strings, none of them null. The scheme named
 * "dvb-si" has the length 0 in pages, whatever its count is. */
typedef struct PARENTALRATTINGSCHEME_STRUCT_T_TAG {
    TELIX_JS_SI_PARENTALRATINGSCHEME_HANDLE handle;
    uint32_t count;     /* number of ratings */
    char* szName;       /* name of the scheme, as pages pass it to getParentalRatingScheme */
    char** ratingNames; /* in ascending order */
    char** iconUris;    /* URL per rating; an empty string where there is no icon */
} PARENTALRATTINGSCHEME_STRUCT_T_TAG;

/* ---- Callbacks --------------------------------------------------------------------------------------- */

/* Memory is low. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_APP_LOW_MEMORY_CB)(void);

/* Reports a message of a player. The set has one media pipeline for all players: the message concerns the
 * player that was given a URL last. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_AV_PLAYSTATE_CB)(TELIX_JS_AV_HANDLE player, TELIX_AV_CB_MSG message);

/* Rights for the media of a player are missing or invalid. The strings must not be null, but may be empty. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_AV_DRM_RIGHTS_CB)(TELIX_JS_AV_HANDLE player,
                                                          TELIX_AV_DRM_ERR_STATE_ENUM_T state,
                                                          ___UINT8* contentId, ___UINT8* drmSystemId,
                                                          ___UINT8* rightsIssuerUrl);

/* Events of a video/broadcast object. Pages get them only if the element has an id. */

/* The object presents `channel`; for 0 pages get a channel object without values. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_CHANNEL_CHANGE_CB)(TELIX_JS_VB_HANDLE object,
                                                              TELIX_JS_CM_HANDLE channel);

/* Tuning the object to `channel` has failed. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_CHANNEL_ERROR_CB)(TELIX_JS_VB_HANDLE object,
                                                             TELIX_JS_CM_HANDLE channel,
                                                             TELIX_ERR_STATE_ENUM_T error);

/* The set has switched full screen on or off. A page that switches it gets an event when
 * TELIX_JS_VB_SetFullScreen returns; calling the callback for it sends a second event. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_FULLSCREEN_CB)(TELIX_JS_VB_HANDLE object);

/* The play state has changed to `state`. `value` is ignored. `error` is TELIX_ERR_STATE_NONE if there is
 * none; pages get any other number, also 0, as an error. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_PLAYSTATE_CB)(TELIX_JS_VB_HANDLE object, uint32_t value,
                                                         TELIX_PLAYSTATE_ENUM_T state,
                                                         TELIX_ERR_STATE_ENUM_T error);

/* The programmes of the channel have changed. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_PROGRAMMES_CB)(TELIX_JS_VB_HANDLE object);

/* The parental rating of the current programme has changed, or cannot be evaluated. The content id and the
 * DRM system id may be null or empty; pages then get null. For the rating 0 pages get the DOM event, but
 * their handler is not called. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_PARENTAL_RATING_CB)(TELIX_JS_VB_HANDLE object, ___UINT8* contentId,
                                                               TELIX_JS_SI_PARENTALRATING_HANDLE rating,
                                                               ___UINT8* drmSystemId);

/* A stream event has been received. `first` and `second` are ignored and may be null. `name` and `status`
 * must not be null, and `data` only if `length` is 0: otherwise the browser crashes. `data` is `length` bytes
 * and need not be terminated; pages get it as a string. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_STREAM_EVENT_CB)(TELIX_JS_VB_HANDLE object, ___UINT8* first,
                                                            ___UINT8* second, ___UINT8* name, ___UINT8* data,
                                                            ___UINT32 length, ___UINT8* status);

/* The result of a DRM message, with the id that TELIX_JS_DRM_SendDRMMessage has returned. The strings must
 * not be null. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_DRM_MESSAGE_RESULT_CB)(___UINT8* messageId, ___UINT8* resultMessage,
                                                               TELIX_DRM_RESULT_CODE_ENUM_T result);

/* ---- Functions --------------------------------------------------------------------------------------- */

#define TELIX_CALL(name, parameters, arguments) TELIX_JS_API TELIX_RETCODE_ENUM_T name parameters;
#include "telix/telix_platform_calls.h"

#ifdef __cplusplus
}
#endif

#endif
