// Which documents are XHTML of a television although no engine knows their types.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_DOCUMENTTYPES_H
#define TELIX_DESKTOP_WINDOW_SHARED_DOCUMENTTYPES_H

#include <glib.h>

namespace desktop {

// TS 102 796 and CEA-2014: the content type, and how files are named that have none.
struct DocumentType {
    const char* contentType;
    const char* suffix;
};
constexpr DocumentType kDocumentTypes[] = {{"application/vnd.hbbtv.xhtml+xml", ".hbbtv"},
                                           {"application/ce-html+xml", ".cehtml"}};

// `contentType` has no parameters.
inline bool isTelevisionType(const char* contentType) {
    for (const auto& type : kDocumentTypes) {
        if (g_ascii_strcasecmp(contentType, type.contentType) == 0) {
            return true;
        }
    }
    return false;
}

} // namespace desktop

#endif
