// The platform library under test: its functions, looked up by name as the plug-in does.
#ifndef TELIX_DESKTOP_CONFORMANCE_LIBRARY_H
#define TELIX_DESKTOP_CONFORMANCE_LIBRARY_H

#include <string>
#include <vector>

#include "telix/telix_platform.h"

namespace desktop {

struct Library {
    // One member per function, with its name; null if the library does not export it.
#define TELIX_CALL(name, parameters, arguments) TELIX_RETCODE_ENUM_T(*name) parameters = nullptr;
#define TELIX_CALL_UNBOUND(name, parameters, arguments)
#include "telix/telix_platform_calls.h"

    struct Export {
        const char* name;
        bool isPresent;
    };
    std::vector<Export> exports; // of all functions, once the library is open

    // Opens the file. False, with the reason in `error`, if it is not a library. It is never closed.
    bool open(const std::string& file, std::string& error);
};

} // namespace desktop

#endif
