// Where the television's own files are.
#include "desktop/window/shared/ProgramFolder.h"

#include <glib.h>

namespace desktop {

std::string besideProgram(const std::string& name) {
    g_autofree char* program = g_file_read_link("/proc/self/exe", nullptr);
    g_autofree char* folder = g_path_get_dirname(program ? program : ".");
    g_autofree char* path = g_build_filename(folder, name.c_str(), nullptr);
    return path;
}

} // namespace desktop
