// The folder with the engine's cookies, cache and storage.
#include "desktop/window/webkit/Profile.h"

#include <glib.h>

#include <filesystem>
#include <system_error>

namespace desktop {

Profile::Profile() {
    g_autoptr(GError) error = nullptr;
    g_autofree char* folder = g_dir_make_tmp("telix-tv-XXXXXX", &error);
    if (folder) {
        m_folder = folder;
    } else {
        m_failure = std::string("cannot create a profile: ") + error->message;
    }
}

Profile::~Profile() {
    if (!m_folder.empty()) {
        std::error_code ignored;
        std::filesystem::remove_all(m_folder, ignored);
    }
}

} // namespace desktop
