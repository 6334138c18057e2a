/* The platform library of a television set, libtelix.so: what a set maker implements for the plug-in.
 *
 * The plug-in does not link against the library. It opens libtelix.so at its first platform call, from the
 * one directory for which it was built (/mnt/browser/lib/TV unless the build says otherwise), with lazy and
 * local binding, and looks each function up by name. It never closes the library again. A function that the
 * library does not export is taken as refused with TELIX_RETCODE_NOT_AVAILABLE at every call, all others
 * work; so a set may begin with a few functions and grow. While the file is absent, each call looks for it
 * again.
 *
 * The functions stand in telix/telix_platform_calls.h, each with its meaning, and are declared at the end of
 * this file: a library includes this header alone, and the compiler checks its definitions. The rules that
 * hold for all of them:
 *
 * Results. Every function returns 0 for success. Any other value is a refusal, and only that: apart from one
 * value of TELIX_JS_AV_Pause no other number has a meaning for the plug-in. A page is never told of a refusal
 * as such: it sees the value that it saw last or an empty one, as told with each function.
 *
 * Outputs. A result is written through a pointer, which is never null. The variable behind it holds 0 or null
 * before the call unless the function says "not preset", and a function that refuses leaves it so.
 *
 * Texts given to the library are zero-terminated UTF-8, valid during the call; copy what is needed later.
 * They are not null unless the function says so.
 *
 * Texts given by the library through a char** are zero-terminated UTF-8 in a block of malloc, which passes to
 * the plug-in: it calls free for each. Allocate a fresh block at every call. A null text with a result of 0
 * counts as an empty text.
 *
 * Arrays given by the library (handles, records) stay the library's: the plug-in reads them at once, on the
 * calling thread, before it makes any further call, and never frees them. Keep the memory valid until the
 * same function is called again.
 *
 * Handles are numbers of the library's choice that the plug-in never looks into; 0 means none. A handle stays
 * good for as long as the library accepts it: pages may hold the object behind one for long, so a function
 * that gets a handle which has gone refuses, and does no harm.
 *
 * Threads. All calls come from the browser's main thread, one at a time, except TELIX_JS_AV_GetPlayInfo,
 * TELIX_JS_AV_Pause, TELIX_JS_AV_Resume and TELIX_JS_AV_Stop, which also come from a buffering thread of each
 * player that plays; these four must be safe beside any other call.
 *
 * Time. The browser is still while a call runs. Requests (tune, play, seek, send a message) start the work
 * and return without waiting for it; the outcome follows through a callback.
 *
 * Callbacks may be called from any thread, several at once, also before the call that caused them has
 * returned. They copy what they are given and return at once; their result is 0 and means nothing. Texts and
 * data need be valid only during the call. The plug-in delivers them to the page later, on the browser's
 * thread, in the order in which they came. A callback for a handle that the plug-in has given up does
 * nothing. */
#ifndef TELIX_TELIX_PLATFORM_H
#define TELIX_TELIX_PLATFORM_H

#include <stdint.h>

/* The functions are visible from outside, also in a library that is compiled with hidden visibility. */
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

/* The enumerations are 32-bit integers with named values beside them, so that a set may pass values of its
 * own where a page is the reader. */

/* Result of every function. */
typedef int32_t TELIX_RETCODE_ENUM_T;
enum {
    TELIX_RETCODE_SUCCESS = 0,
    TELIX_RETCODE_PAUSE_TAKEN = 4,   /* of TELIX_JS_AV_Pause alone: as good as success */
    TELIX_RETCODE_NOT_AVAILABLE = 5, /* what the plug-in itself answers for a missing library or function */
};

/* Kind of component. */
typedef uint32_t TELIX_JS_AVCOMPTYPE;
enum {
    TELIX_JS_AVCOMPTYPE_VIDEO = 0,
    TELIX_JS_AVCOMPTYPE_AUDIO = 1,
    TELIX_JS_AVCOMPTYPE_SUBTITLE = 2,
};

/* What a player reports. Values that are not named here are accepted and change nothing. A message that
 * equals the one before it is dropped, TELIX_AV_CB_MSG_PLAYSTART excepted. Errors put the A/V control object
 * into its error state; the number given behind each is the value of its property "error". */
typedef uint32_t TELIX_AV_CB_MSG;
enum {
    TELIX_AV_CB_MSG_PLAYEND = 1,            /* the media has ended, all its repeats included */
    TELIX_AV_CB_MSG_PLAYSTART = 2,          /* the media, or the next one of the queue, is now presented */
    TELIX_AV_CB_MSG_ERR_PLAYING = 0xF000,   /* any other fault: 2 */
    TELIX_AV_CB_MSG_ERR_NOT_FOUND = 0xF003, /* content not available: 5 */
    TELIX_AV_CB_MSG_ERR_CODEC_NOT_SUPPORTED = 0xF004,    /* format not supported: 0 */
    TELIX_AV_CB_MSG_ERR_NET_DISCONNECTED = 0xFF00,       /* connection lost: 1 */
    TELIX_AV_CB_MSG_ERR_NET_BUSY = 0xFF01,               /* logged; no change of state */
    TELIX_AV_CB_MSG_ERR_NET_CANNOT_PROCESS = 0xFF02,     /* logged; no change of state */
    TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT = 0xFF03,     /* no connection: 1 */
    TELIX_AV_CB_MSG_ERR_WMDRM_CANNOT_PROCESS = 0xFF10,   /* rights: 2 */
    TELIX_AV_CB_MSG_ERR_WMDRM_LIC_FAILLOCAL = 0xFF11,    /* rights: 2 */
    TELIX_AV_CB_MSG_ERR_WMDRM_LIC_FAILTRANSFER = 0xFF12, /* rights: 2 */
    TELIX_AV_CB_MSG_ERR_WMDRM_LIC_EXPIRED = 0xFF13,      /* rights: 2 */
};

/* Play state of a video/broadcast object; pages read the number as it is. */
typedef int32_t TELIX_PLAYSTATE_ENUM_T;
enum {
    TELIX_PLAYSTATE_UNREALIZED = 0,
    TELIX_PLAYSTATE_CONNECTING = 1,
    TELIX_PLAYSTATE_PRESENTING = 2,
    TELIX_PLAYSTATE_STOPPED = 3,
};

/* Why broadcast presentation failed; pages read the number as it is. */
typedef int32_t TELIX_ERR_STATE_ENUM_T;
enum {
    TELIX_ERR_STATE_NONE = 200, /* in a play state change: no error; the page sees undefined */
};

/* Why rights for media are missing, and what became of a DRM message; pages read the numbers as they are. */
typedef int32_t TELIX_AV_DRM_ERR_STATE_ENUM_T;
typedef int32_t TELIX_DRM_RESULT_CODE_ENUM_T;
typedef TELIX_DRM_RESULT_CODE_ENUM_T TELIX_DRM_RESULT_CODE_ENUM_T_tag;

/* ---- Records ----------------------------------------------------------------------------------------- */

/* Where the picture stands, in pixels of the browser's 1280 by 720 page from its top left corner. Each value
 * is what the page gave, cut to 16 bits. */
typedef struct TELIX_JS_DISPLAY_AREA {
    uint16_t x;
    uint16_t y;
    uint16_t width;
    uint16_t height;
} TELIX_JS_DISPLAY_AREA;

/* How far a player has come.
 *
 * The two fields on buffering feed the plug-in's own buffering: while a player plays, a thread of the plug-in
 * reads this record once a second, pauses the player when `buffered` falls below a lower limit (4 unless the
 * page or the environment says otherwise), and resumes it at the upper limit (10). `buffered` is read so:
 *   0xFFFFFFFF          the set gives no report; the plug-in resumes a player that it has paused
 *   top byte 0xFF       otherwise: the low 16 bits are the amount, and watching ends for this clip
 *   third byte 0xFF     otherwise: the low 16 bits are the amount
 *   any other value     is the amount. */
typedef struct TELIX_JS_AV_PLAY_INFO {
    uint32_t state; /* 0: nothing to report; 1 with duration, position and buffered 0: nothing known yet */
    uint32_t playPosition; /* milliseconds */
    uint32_t duration;     /* milliseconds; 0 when unknown */
    uint32_t reserved;     /* not read */
    uint32_t bufferedEnd;  /* up to where media has been fetched, in seconds from the start of the clip */
    uint32_t buffered;     /* amount of media held ahead, in seconds; see above */
} TELIX_JS_AV_PLAY_INFO;

/* A scheme of parental ratings. Its texts stay the library's. A record with a null name gives the page a
 * scheme without name and ratings; otherwise both arrays hold `count` texts, none of them null. The scheme
 * with the name "dvb-si" is shown to pages with the length 0, whatever its count. */
typedef struct PARENTALRATTINGSCHEME_STRUCT_T_TAG {
    TELIX_JS_SI_PARENTALRATINGSCHEME_HANDLE handle;
    uint32_t count;     /* number of ratings */
    char* szName;       /* name of the scheme, as in the page's call getParentalRatingScheme */
    char** ratingNames; /* in rising order */
    char** iconUris;    /* beside ratingNames, an empty text where there is no icon */
} PARENTALRATTINGSCHEME_STRUCT_T_TAG;

/* ---- Callbacks --------------------------------------------------------------------------------------- */

/* The set is short of memory. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_APP_LOW_MEMORY_CB)(void);

/* A player has something to report. The set has one media pipeline for all players: the message concerns the
 * player that was last given a URL. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_AV_PLAYSTATE_CB)(TELIX_JS_AV_HANDLE player, TELIX_AV_CB_MSG message);

/* Rights for the media of a player are missing or not good. None of the texts may be null; empty ones may. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_AV_DRM_RIGHTS_CB)(TELIX_JS_AV_HANDLE player,
                                                          TELIX_AV_DRM_ERR_STATE_ENUM_T state,
                                                          ___UINT8* contentId, ___UINT8* drmSystemId,
                                                          ___UINT8* rightsIssuerUrl);

/* Events of a video/broadcast object. Pages get them only if the element has an id. */

/* The object now presents `channel`; 0 gives the page a channel object without values. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_CHANNEL_CHANGE_CB)(TELIX_JS_VB_HANDLE object,
                                                              TELIX_JS_CM_HANDLE channel);

/* The object could not be tuned to `channel`. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_CHANNEL_ERROR_CB)(TELIX_JS_VB_HANDLE object,
                                                             TELIX_JS_CM_HANDLE channel,
                                                             TELIX_ERR_STATE_ENUM_T error);

/* The set has taken the object to full screen or back. Of a change that the page itself asked for, the page
 * has been told when TELIX_JS_VB_SetFullScreen returned; a callback for it as well tells it once more. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_FULLSCREEN_CB)(TELIX_JS_VB_HANDLE object);

/* The play state has become `state`. `value` is carried and not read. `error` is TELIX_ERR_STATE_NONE where
 * there is none: any other number, 0 too, reaches the page as an error. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_PLAYSTATE_CB)(TELIX_JS_VB_HANDLE object, uint32_t value,
                                                         TELIX_PLAYSTATE_ENUM_T state,
                                                         TELIX_ERR_STATE_ENUM_T error);

/* The programmes of the channel have changed. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_PROGRAMMES_CB)(TELIX_JS_VB_HANDLE object);

/* The rating of what is shown has changed, or could not be evaluated. The texts are the content id and the
 * DRM system id; either may be null or empty, and the page then sees null. With the rating 0 the page gets
 * the DOM event but no call of its handler. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_PARENTAL_RATING_CB)(TELIX_JS_VB_HANDLE object, ___UINT8* contentId,
                                                               TELIX_JS_SI_PARENTALRATING_HANDLE rating,
                                                               ___UINT8* drmSystemId);

/* A stream event has been received. `first` and `second` are not read and may be null. `name` and `status`
 * must not be null, and `data` only if `length` is 0: anything else stops the browser. `data` is `length`
 * bytes and need not be terminated; the page gets it as text. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_VB_STREAM_EVENT_CB)(TELIX_JS_VB_HANDLE object, ___UINT8* first,
                                                            ___UINT8* second, ___UINT8* name, ___UINT8* data,
                                                            ___UINT32 length, ___UINT8* status);

/* The answer to a DRM message, whose id is the one that TELIX_JS_DRM_SendDRMMessage gave out. Neither text
 * may be null. */
typedef TELIX_RETCODE_ENUM_T (*TELIX_JS_DRM_MESSAGE_RESULT_CB)(___UINT8* messageId, ___UINT8* resultMessage,
                                                               TELIX_DRM_RESULT_CODE_ENUM_T result);

/* ---- Functions --------------------------------------------------------------------------------------- */

#define TELIX_CALL(name, parameters, arguments) TELIX_JS_API TELIX_RETCODE_ENUM_T name parameters;
#include "telix/telix_platform_calls.h"

#ifdef __cplusplus
}
#endif

#endif
