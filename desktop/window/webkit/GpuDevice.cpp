// Whether the machine has a GPU at all.
#include "desktop/window/webkit/GpuDevice.h"

#include <glob.h>

namespace desktop {

namespace {

constexpr const char* kDeviceFiles[] = {"/dev/dri/renderD*", "/dev/nvidiactl"};

} // namespace

bool hasGpuDevice() {
    for (const char* pattern : kDeviceFiles) {
        glob_t files{};
        const bool isFound = glob(pattern, GLOB_NOSORT, nullptr, &files) == 0;
        globfree(&files);
        if (isFound) {
            return true;
        }
    }
    return false;
}

} // namespace desktop
