// How telixctl ends, and the form of its error messages.
#ifndef TELIX_DESKTOP_TELIXCTL_EXITSTATUS_H
#define TELIX_DESKTOP_TELIXCTL_EXITSTATUS_H

#include <cstdio>
#include <string>

namespace desktop {

enum class ExitStatus {
    Success = 0,
    Refused = 1, // by the television, or there is no television
    BadInput = 2 // bad command line or configuration file
};

// Prints one line to standard error, "telixctl: WHAT: REASON". Returns the status.
inline ExitStatus fail(ExitStatus status, const std::string& message) {
    std::fprintf(stderr, "telixctl: %s\n", message.c_str());
    return status;
}

} // namespace desktop

#endif
