/* The requests of the control socket that are the window's, for the window.
 *
 * The library keeps the socket and passes on the requests of commands that need the window: see
 * ControlCommands.h. The window finds these functions as those of telix_picture.h; without a handler such
 * commands fail.
 *
 * All functions may be called on any thread, also concurrently. */
#ifndef TELIX_DESKTOP_PLATFORM_TELIX_CONTROL_H
#define TELIX_DESKTOP_PLATFORM_TELIX_CONTROL_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* NOLINTBEGIN(modernize-use-using): the header is C. */

typedef struct telix_desktop_control_handler {
    /* `line` is a request as ControlProtocol.h describes it: one line with a JSON object, checked against the
     * command table. Runs on a thread of the library, or in telix_desktop_set_control_handler for requests
     * that were there before; one call at a time. It must return at once, and may call
     * telix_desktop_answer_control_request, not the other function. Each request is to be answered once, in
     * this call or later; one that takes longer than its command allows fails without the window. */
    void (*onRequest)(uint64_t request, const char* line, void* data);
    void* data; /* of the callback */
} telix_desktop_control_handler;

typedef void (*telix_desktop_set_control_handler_function)(const telix_desktop_control_handler* handler);
typedef void (*telix_desktop_answer_control_request_function)(uint64_t request, const char* response);

/* NOLINTEND(modernize-use-using) */

#ifndef TELIX_DESKTOP_API
#define TELIX_DESKTOP_API __attribute__((visibility("default")))
#endif

/* Sets the handler, of which there is one, and copies the record; null removes it. When this returns, the
 * previous handler is not running and is not called again, and the requests that waited for it have failed.
 */
TELIX_DESKTOP_API void telix_desktop_set_control_handler(const telix_desktop_control_handler* handler);

/* Answers a request with a response as ControlProtocol.h describes it, a JSON object, and copies the string.
 * Does nothing if the request does not wait. */
TELIX_DESKTOP_API void telix_desktop_answer_control_request(uint64_t request, const char* response);

#ifdef __cplusplus
}
#endif

#endif
