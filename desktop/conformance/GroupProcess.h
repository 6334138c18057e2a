// Runs a group of checks in a process of its own, so that a library that crashes or hangs ends nothing else.
#ifndef TELIX_DESKTOP_CONFORMANCE_GROUPPROCESS_H
#define TELIX_DESKTOP_CONFORMANCE_GROUPPROCESS_H

#include <string>

#include "desktop/conformance/CheckGroup.h"
#include "desktop/conformance/Summary.h"

namespace desktop {

struct CheckOptions {
    std::string file;         // absolute path of the library
    std::string media;        // a URL that it can play; empty if none is given
    int callbackTimeout = 15; // seconds
};

// Runs all checks of the group and hands their results to the summary. Returns an error of the system; empty
// if there is none.
std::string runGroup(const CheckGroup& group, const CheckOptions& options, Summary& summary);

} // namespace desktop

#endif
