// Checks whether a page can be loaded before the engine loads it.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_LOADCHECK_H
#define TELIX_DESKTOP_WINDOW_SHARED_LOADCHECK_H

#include <string>

namespace desktop {

// The reason why the page at `url` cannot be loaded; empty if it can. A local file must be readable; a server
// must start a successful response within 5 seconds. Blocks the calling thread, and runs no event of it
// meanwhile. `userAgent` is sent to the server. Any thread.
std::string loadError(const std::string& url, const std::string& userAgent);

} // namespace desktop

#endif
