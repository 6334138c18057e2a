// Ownership of strings that GLib allocates, and the GLib calls around them that several files need.
#ifndef TELIX_DESKTOP_PLATFORM_OWNEDSTRING_H
#define TELIX_DESKTOP_PLATFORM_OWNEDSTRING_H

#include <glib.h>
#include <memory>
#include <string>

namespace desktop {

struct GLibFree {
    void operator()(char* string) const { g_free(string); }
    void operator()(char** strings) const { g_strfreev(strings); }
};
using OwnedString = std::unique_ptr<char, GLibFree>;
using OwnedStrings = std::unique_ptr<char*, GLibFree>; // null-terminated

// Takes the error over and returns its message.
inline std::string messageOf(GError* error) {
    std::string message = error->message;
    g_error_free(error);
    return message;
}

// Without white space at both ends.
inline std::string trimmed(const std::string& string) {
    const OwnedString copy(g_strdup(string.c_str()));
    return g_strstrip(copy.get());
}

} // namespace desktop

#endif
