/* The browser plug-in interface (NPAPI): basic types, instances, windows, streams, variables and errors.
 * Own declarations of the public binary interface for X11. Static assertions check sizes and offsets for
 * 32-bit (ILP32) and 64-bit (LP64) machines. */
#ifndef TELIX_NPAPI_NPAPI_H
#define TELIX_NPAPI_NPAPI_H

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#define NPAPI_STATIC_ASSERT(condition) static_assert(condition, #condition)
#else
#define NPAPI_STATIC_ASSERT(condition) _Static_assert(condition, #condition)
#endif

/* Selects the expected number for the target machine. */
#define NPAPI_BY_WORD(on32, on64) (sizeof(void*) == 8 ? (on64) : (on32))

#define NP_VERSION_MAJOR 0
#define NP_VERSION_MINOR 27

typedef unsigned char NPBool;
typedef int16_t NPError;
typedef int16_t NPReason;
typedef char* NPMIMEType;

/* A plug-in instance. The browser owns the struct; `pdata` is for the plug-in, `ndata` for the browser. */
typedef struct _NPP {
    void* pdata;
    void* ndata;
} NPP_t;
typedef NPP_t* NPP;

/* A stream between the browser and an instance. `headers` contains the HTTP response headers, one per line,
 * or is null. `pdata` is for the plug-in. */
typedef struct _NPStream {
    void* pdata;
    void* ndata;
    const char* url;
    uint32_t end;
    uint32_t lastmodified;
    void* notifyData;
    const char* headers;
} NPStream;

typedef struct _NPByteRange {
    int32_t offset;
    uint32_t length;
    struct _NPByteRange* next;
} NPByteRange;

typedef struct _NPSavedData {
    int32_t len;
    void* buf;
} NPSavedData;

/* Edges in page pixels; `right` and `bottom` are exclusive. */
typedef struct _NPRect {
    uint16_t top;
    uint16_t left;
    uint16_t bottom;
    uint16_t right;
} NPRect;

typedef struct _NPSize {
    int32_t width;
    int32_t height;
} NPSize;

typedef enum { NPWindowTypeWindow = 1, NPWindowTypeDrawable = 2 } NPWindowType;

/* The position of an instance in its page. `window` is the X window of a windowed plug-in. */
typedef struct _NPWindow {
    void* window;
    int32_t x;
    int32_t y;
    uint32_t width;
    uint32_t height;
    NPRect clipRect;
    void* ws_info;
    NPWindowType type;
} NPWindow;

typedef struct _NPFullPrint {
    NPBool pluginPrinted;
    NPBool printOne;
    void* platformPrint;
} NPFullPrint;

typedef struct _NPEmbedPrint {
    NPWindow window;
    void* platformPrint;
} NPEmbedPrint;

typedef struct _NPPrint {
    uint16_t mode;
    union {
        NPFullPrint fullPrint;
        NPEmbedPrint embedPrint;
    } print;
} NPPrint;

/* Modes of an instance. */
enum { NP_EMBED = 1, NP_FULL = 2 };

/* Stream modes. */
enum { NP_NORMAL = 1, NP_SEEK = 2, NP_ASFILE = 3, NP_ASFILEONLY = 4 };

/* Values of NPError. */
enum {
    NPERR_NO_ERROR = 0,
    NPERR_GENERIC_ERROR = 1,
    NPERR_INVALID_INSTANCE_ERROR = 2,
    NPERR_INVALID_FUNCTABLE_ERROR = 3,
    NPERR_MODULE_LOAD_FAILED_ERROR = 4,
    NPERR_OUT_OF_MEMORY_ERROR = 5,
    NPERR_INVALID_PLUGIN_ERROR = 6,
    NPERR_INVALID_PLUGIN_DIR_ERROR = 7,
    NPERR_INCOMPATIBLE_VERSION_ERROR = 8,
    NPERR_INVALID_PARAM = 9,
    NPERR_INVALID_URL = 10,
    NPERR_FILE_NOT_FOUND = 11,
    NPERR_NO_DATA = 12,
    NPERR_STREAM_NOT_SEEKABLE = 13
};

/* Reasons for the end of a stream. */
enum { NPRES_DONE = 0, NPRES_NETWORK_ERR = 1, NPRES_USER_BREAK = 2 };

/* Variables of NPP_GetValue. */
typedef enum {
    NPPVpluginNameString = 1,
    NPPVpluginDescriptionString = 2,
    NPPVpluginWindowBool = 3,
    NPPVpluginTransparentBool = 4,
    NPPVjavaClass = 5,
    NPPVpluginWindowSize = 6,
    NPPVpluginTimerInterval = 7,
    NPPVpluginScriptableInstance = 10,
    NPPVpluginScriptableIID = 11,
    NPPVjavascriptPushCallerBool = 12,
    NPPVpluginKeepLibraryInMemory = 13,
    NPPVpluginNeedsXEmbed = 14,
    NPPVpluginScriptableNPObject = 15,
    NPPVformValue = 16,
    NPPVpluginUrlRequestsDisplayedBool = 17,
    NPPVpluginWantsAllNetworkStreams = 18,
    NPPVpluginNativeAccessibleAtkPlugId = 19,
    NPPVpluginCancelSrcStream = 20,
    NPPVsupportsAdvancedKeyHandling = 21,
    NPPVpluginUsesDOMForCursorBool = 22
} NPPVariable;

/* Variables of NPN_GetValue, NPN_SetValue and NPP_SetValue. */
typedef enum {
    NPNVxDisplay = 1,
    NPNVxtAppContext = 2,
    NPNVnetscapeWindow = 3,
    NPNVjavascriptEnabledBool = 4,
    NPNVasdEnabledBool = 5,
    NPNVisOfflineBool = 6,
    NPNVToolkit = 13,
    NPNVSupportsXEmbedBool = 14,
    NPNVWindowNPObject = 15,
    NPNVPluginElementNPObject = 16,
    NPNVSupportsWindowless = 17,
    NPNVprivateModeBool = 18
} NPNVariable;

/* Variables of NPN_GetValueForURL and NPN_SetValueForURL. */
typedef enum { NPNURLVCookie = 501, NPNURLVProxy = 502 } NPNURLVariable;

/* Coordinate spaces of NPN_ConvertPoint. */
typedef enum {
    NPCoordinateSpacePlugin = 1,
    NPCoordinateSpaceWindow = 2,
    NPCoordinateSpaceFlippedWindow = 3,
    NPCoordinateSpaceScreen = 4,
    NPCoordinateSpaceFlippedScreen = 5
} NPCoordinateSpace;

/* Direction in which the focus entered a plug-in (the table's `gotfocus`). */
typedef enum { NPFocusNext = 0, NPFocusPrevious = 1 } NPFocusDirection;

/* Pixel formats and surface of asynchronous drawing. */
typedef enum { NPImageFormatBGRA32 = 1, NPImageFormatBGRX32 = 2 } NPImageFormat;

typedef struct _NPAsyncSurface {
    uint32_t version;
    NPSize size;
    NPImageFormat format;
    union {
        struct {
            uint32_t stride;
            void* data;
        } bitmap;
        void* sharedHandle;
    } surface;
} NPAsyncSurface;

/* Platform-specific types that are passed by pointer only. On X11 an NPRegion is an X `Region`. */
typedef void* NPRegion;
typedef void NPMenu;

NPAPI_STATIC_ASSERT(sizeof(NPBool) == 1);
NPAPI_STATIC_ASSERT(sizeof(NPError) == 2);
NPAPI_STATIC_ASSERT(sizeof(NPPVariable) == 4);
NPAPI_STATIC_ASSERT(sizeof(NPNVariable) == 4);

NPAPI_STATIC_ASSERT(sizeof(NPP_t) == NPAPI_BY_WORD(8, 16));
NPAPI_STATIC_ASSERT(offsetof(NPP_t, ndata) == NPAPI_BY_WORD(4, 8));

NPAPI_STATIC_ASSERT(sizeof(NPStream) == NPAPI_BY_WORD(28, 48));
NPAPI_STATIC_ASSERT(offsetof(NPStream, url) == NPAPI_BY_WORD(8, 16));
NPAPI_STATIC_ASSERT(offsetof(NPStream, end) == NPAPI_BY_WORD(12, 24));
NPAPI_STATIC_ASSERT(offsetof(NPStream, lastmodified) == NPAPI_BY_WORD(16, 28));
NPAPI_STATIC_ASSERT(offsetof(NPStream, notifyData) == NPAPI_BY_WORD(20, 32));
NPAPI_STATIC_ASSERT(offsetof(NPStream, headers) == NPAPI_BY_WORD(24, 40));

NPAPI_STATIC_ASSERT(sizeof(NPByteRange) == NPAPI_BY_WORD(12, 16));
NPAPI_STATIC_ASSERT(sizeof(NPSavedData) == NPAPI_BY_WORD(8, 16));
NPAPI_STATIC_ASSERT(sizeof(NPRect) == 8);

NPAPI_STATIC_ASSERT(sizeof(NPWindow) == NPAPI_BY_WORD(36, 48));
NPAPI_STATIC_ASSERT(offsetof(NPWindow, x) == NPAPI_BY_WORD(4, 8));
NPAPI_STATIC_ASSERT(offsetof(NPWindow, width) == NPAPI_BY_WORD(12, 16));
NPAPI_STATIC_ASSERT(offsetof(NPWindow, clipRect) == NPAPI_BY_WORD(20, 24));
NPAPI_STATIC_ASSERT(offsetof(NPWindow, ws_info) == NPAPI_BY_WORD(28, 32));
NPAPI_STATIC_ASSERT(offsetof(NPWindow, type) == NPAPI_BY_WORD(32, 40));

NPAPI_STATIC_ASSERT(offsetof(NPPrint, print) == NPAPI_BY_WORD(4, 8));
NPAPI_STATIC_ASSERT(sizeof(NPPrint) == NPAPI_BY_WORD(44, 64));

#ifdef __cplusplus
}
#endif

#endif
