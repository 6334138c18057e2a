// The log's printing, kept out of line: a statement that is switched off costs no more than its test.
#include "common/Log.h"

#include <cstdarg>
#include <cstdio>

void logPrint(const char* moduleName, const char* functionName, const char* text, ...) {
    va_list arguments;
    va_start(arguments, text);
    flockfile(stdout);
    std::printf(" PLUGIN >>> %s :: %s :: ", moduleName, functionName);
    std::vprintf(text, arguments);
    funlockfile(stdout);
    va_end(arguments);
}
