// Ownership of strings that GLib allocates, and the GLib calls around them that several files need.
#ifndef TELIX_DESKTOP_PLATFORM_OWNEDSTRING_H
#define TELIX_DESKTOP_PLATFORM_OWNEDSTRING_H

#include <glib.h>
#include <memory>
#include <optional>
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

// The contents of a file; nothing, with the reason in `error`, if it cannot be read.
inline std::optional<std::string> contentsOf(const std::string& file, std::string& error) {
    char* data = nullptr;
    gsize length = 0;
    GError* fileError = nullptr;
    if (!g_file_get_contents(file.c_str(), &data, &length, &fileError)) {
        error = messageOf(
            fileError); // "Failed to open file “FILE”: REASON", and callers name the file themselves
        error.erase(0, error.rfind(": ") == std::string::npos ? 0 : error.rfind(": ") + 2);
        return std::nullopt;
    }
    const OwnedString owner(data);
    return std::string(data, length);
}

// Without white space at both ends.
inline std::string trimmed(const std::string& string) {
    const OwnedString copy(g_strdup(string.c_str()));
    return g_strstrip(copy.get());
}

} // namespace desktop

#endif
