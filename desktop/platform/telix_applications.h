/* The applications that the current channel of the desktop's platform library signals, for the window that
 * runs them, and the rules by which they start and end.
 *
 * The window finds the loaded library and these functions in it as it finds those of telix_picture.h. A
 * libtelix.so without them signals no applications.
 *
 * The window keeps what runs. It takes a snapshot at each wake-up, and compares its numbers with those of the
 * snapshot before: another `service` is the event TELIX_DESKTOP_SERVICE_SELECTED, another `serial` while the
 * state is TELIX_DESKTOP_SIGNALLING_KNOWN is TELIX_DESKTOP_SIGNALLING_CHANGED, in this order. For each event
 * it asks telix_desktop_decide_application what ends and what starts. A window that is in another process
 * than the library, as telix-tv can be, has the same rules and the same parser compiled in
 * (ApplicationLifecycle.h, XmlAit.h).
 *
 * All functions may be called on any thread, also concurrently. */
#ifndef TELIX_DESKTOP_PLATFORM_TELIX_APPLICATIONS_H
#define TELIX_DESKTOP_PLATFORM_TELIX_APPLICATIONS_H

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* NOLINTBEGIN(modernize-use-using, performance-enum-size): the header is C. */

/* One application. Strings are UTF-8 without control characters and never null. */
typedef struct telix_desktop_application {
    uint32_t organisationId;
    uint16_t applicationId;
    uint8_t controlCode;           /* TS 102 809, 5.2.4: 1 AUTOSTART, 2 PRESENT, 4 KILL, 7 DISABLED */
    uint8_t serviceBound;          /* 1: ends when another service is selected */
    uint8_t visibility;            /* TS 102 809, 5.3.5.3 */
    uint8_t priority;              /* the highest one starts */
    uint8_t usage;                 /* TS 102 809, 5.3.5.5: 0 none given, 1 digital text */
    const char* name;              /* may be empty */
    const char* url;               /* absolute; may be empty unless AUTOSTART or PRESENT */
    const char* const* boundaries; /* beginnings of further URLs that belong to the application */
    size_t boundaryCount;
} telix_desktop_application;

typedef enum telix_desktop_signalling_state {
    TELIX_DESKTOP_SIGNALLING_NONE = 0,    /* no service is received: what runs goes on */
    TELIX_DESKTOP_SIGNALLING_AWAITED = 1, /* a service is selected, its signalling is not known yet */
    TELIX_DESKTOP_SIGNALLING_KNOWN = 2
} telix_desktop_signalling_state;

typedef struct telix_desktop_applications {
    const telix_desktop_application* applications; /* in the order of the signalling */
    size_t applicationCount;
    const char* const* skipped; /* per entry that was left out: which, and why */
    size_t skippedCount;
    telix_desktop_signalling_state state;
    uint64_t service; /* increases when another service is selected */
    uint64_t serial;  /* increases with each change */
    void* owner;      /* for the release */
} telix_desktop_applications;

typedef enum telix_desktop_application_event {
    TELIX_DESKTOP_SERVICE_SELECTED = 0,
    TELIX_DESKTOP_SIGNALLING_CHANGED = 1,
    TELIX_DESKTOP_LOAD_FAILED = 2, /* the running application could not be loaded */
    TELIX_DESKTOP_EXITED = 3,      /* the running application ended itself */
    TELIX_DESKTOP_STOPPED_BY_VIEWER = 4,
    TELIX_DESKTOP_STARTED_BY_VIEWER = 5 /* the viewer asks for the autostart application */
} telix_desktop_application_event;

typedef struct telix_desktop_application_id {
    uint32_t organisationId;
    uint16_t applicationId;
} telix_desktop_application_id;

/* What the window runs. */
typedef struct telix_desktop_running_application {
    uint8_t isRunning;
    uint8_t isBroadcastRelated; /* 0: not started by signalling, nor known to it; the id has no meaning */
    uint8_t serviceBound;       /* as signalled last */
    telix_desktop_application_id id;
} telix_desktop_running_application;

typedef struct telix_desktop_application_decision {
    uint8_t endsRunning;                      /* 1: the running application ends, before another one starts */
    const telix_desktop_application* started; /* in the snapshot; null: none starts */
} telix_desktop_application_decision;

/* Called when the signalling changes. It runs on threads of the library and must return at once: it may
 * schedule work on its own thread, and must not call the functions below. */
typedef void (*telix_desktop_applications_wakeup)(void* data);

typedef void (*telix_desktop_set_applications_wakeup_function)(telix_desktop_applications_wakeup wakeup,
                                                               void* data);
typedef void (*telix_desktop_acquire_applications_function)(telix_desktop_applications* applications);
typedef int (*telix_desktop_parse_xml_ait_function)(const char* document, size_t size,
                                                    telix_desktop_applications* applications);
typedef void (*telix_desktop_release_applications_function)(telix_desktop_applications* applications);
typedef void (*telix_desktop_decide_application_function)(telix_desktop_application_event event,
                                                          const telix_desktop_applications* applications,
                                                          const telix_desktop_running_application* running,
                                                          const telix_desktop_application_id* failed,
                                                          size_t failedCount,
                                                          telix_desktop_application_decision* decision);
typedef int (*telix_desktop_signal_application_function)(const char* url, uint32_t channel);

/* NOLINTEND(modernize-use-using, performance-enum-size) */

#ifndef TELIX_DESKTOP_API
#define TELIX_DESKTOP_API __attribute__((visibility("default")))
#endif

/* Sets the wake-up callback, of which there is one; null removes it. From the first one on the current
 * channel is received, also without a video/broadcast object. The callback is called immediately if a service
 * is known already. When this returns, the previous callback is not running and is not called again. */
TELIX_DESKTOP_API void telix_desktop_set_applications_wakeup(telix_desktop_applications_wakeup wakeup,
                                                             void* data);

/* Fills in what is signalled now. It stays valid and unchanged until it is passed to
 * telix_desktop_release_applications, which must follow. */
TELIX_DESKTOP_API void telix_desktop_acquire_applications(telix_desktop_applications* applications);

/* Fills in the applications of an XML AIT (application/vnd.dvb.ait+xml, TS 102 809, 5.4), of at most one
 * mebibyte; to be released like the others. State and numbers are 0. Returns 0 if the document is not an XML
 * AIT: then there are no applications, and the only skipped entry is the reason. */
TELIX_DESKTOP_API int telix_desktop_parse_xml_ait(const char* document, size_t size,
                                                  telix_desktop_applications* applications);

/* Releases and clears the record. A cleared record may be passed again. */
TELIX_DESKTOP_API void telix_desktop_release_applications(telix_desktop_applications* applications);

/* What follows from an event, by the rules of TS 102 796, 6.2.2. `failed` are the applications that could not
 * be loaded since the signalling changed, with or without the running one. A pure function. */
TELIX_DESKTOP_API void telix_desktop_decide_application(telix_desktop_application_event event,
                                                        const telix_desktop_applications* applications,
                                                        const telix_desktop_running_application* running,
                                                        const telix_desktop_application_id* failed,
                                                        size_t failedCount,
                                                        telix_desktop_application_decision* decision);

/* Signals a document as autostart application of a channel, with the highest priority and not service-bound,
 * until the next call for that channel; null or an empty string ends that. `channel` is the position in the
 * channel list, from 1; 0 is the current channel. Returns 0 if there is no such channel or the URL is not
 * absolute. */
TELIX_DESKTOP_API int telix_desktop_signal_application(const char* url, uint32_t channel);

#ifdef __cplusplus
}
#endif

#endif
