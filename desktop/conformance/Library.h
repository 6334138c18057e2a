// A platform library under test: its functions by name, as the plug-in looks them up.
#ifndef TELIX_DESKTOP_LIBRARY_H
#define TELIX_DESKTOP_LIBRARY_H

#include "telix/telix_platform.h"

#include <string>
#include <vector>

// Null for those that the library lacks.
struct Library {
#define TELIX_CALL(name, parameters, arguments) TELIX_RETCODE_ENUM_T(*name) parameters = nullptr;
#define TELIX_CALL_UNBOUND(name, parameters, arguments)
#include "telix/telix_platform_calls.h"

    // Opens the file; false with the reason if it is no library. It is never closed.
    bool open(const std::string& file, std::string& error);

    struct Export {
        const char* name;
        bool isThere;
    };
    std::vector<Export> exports;
};

#endif
