// The messages of telix-tv on standard error, and its exit statuses.
#include "desktop/window/shared/Diagnostics.h"

#include <glib.h>

#include <cstdio>

namespace desktop {

std::string simplified(const std::string& text) {
    std::string result;
    bool isAfterSpace = false;
    for (const char letter : text) {
        if (g_ascii_isspace(letter)) {
            isAfterSpace = true;
            continue;
        }
        if (isAfterSpace && !result.empty()) {
            result += ' ';
        }
        isAfterSpace = false;
        result += letter;
    }
    return result;
}

void printError(const std::string& message) {
    std::fprintf(stderr, "telix-tv: %s\n", simplified(message).c_str());
}

void printConsoleMessage(const std::string& source, int line, const std::string& text) {
    g_autofree char* file = g_filename_from_uri(source.c_str(), nullptr, nullptr);
    const std::string place = line > 0 ? ':' + std::to_string(line) : "";
    std::fprintf(stderr, "%s%s: %s\n", file ? file : source.c_str(), place.c_str(), text.c_str());
}

void printWarning(const std::string& url, const std::string& text) {
    const std::string warning = "telix: " + text;
    if (url.empty()) {
        std::fprintf(stderr, "%s\n", warning.c_str());
    } else {
        printConsoleMessage(url, 0, warning);
    }
}

} // namespace desktop
