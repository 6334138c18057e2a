// Where the television's own files are: its plug-in, the programs of the engines and their extensions stand
// beside each other, in the build folder as after an installation.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_PROGRAMFOLDER_H
#define TELIX_DESKTOP_WINDOW_SHARED_PROGRAMFOLDER_H

#include <string>

namespace desktop {

// The absolute path of `name` in the folder of the running program, whichever link has started it.
std::string besideProgram(const std::string& name);

} // namespace desktop

#endif
