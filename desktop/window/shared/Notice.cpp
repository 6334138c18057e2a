// The page that the window shows in place of an application whose process has ended by itself.
#include "desktop/window/shared/Notice.h"

#include "desktop/window/shared/PageScript.h"

#include <glib.h>

namespace desktop {

namespace {

void replace(std::string& text, const std::string& placeholder, const std::string& value) {
    text.replace(text.find(placeholder), placeholder.size(), value);
}

} // namespace

std::string noticePage(const std::string& reason) {
    std::string page = resourceText("notice.html");
    g_autofree char* valid = g_utf8_make_valid(reason.c_str(), -1);
    g_autofree char* markup = g_markup_escape_text(valid, -1);
    replace(page, "@REASON@", markup);
    return page;
}

} // namespace desktop
