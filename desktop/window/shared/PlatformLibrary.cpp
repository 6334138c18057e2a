// The platform library that the plug-in has loaded.
#include "desktop/window/shared/PlatformLibrary.h"

#include <link.h>

#include <cstring>
#include <string>

namespace desktop {

namespace {

const char* const kLibraryName = "libtelix.so";

// Input and result of the search through the loaded libraries.
struct Search {
    unsigned long long knownLoads;
    unsigned long long loads;
    std::string file;
};

int findPlatformLibrary(dl_phdr_info* library, size_t, void* data) {
    auto* search = static_cast<Search*>(data);
    search->loads = library->dlpi_adds;
    if (search->loads == search->knownLoads) {
        return 1;
    }
    const char* slash = std::strrchr(library->dlpi_name, '/');
    if (std::strcmp(slash ? slash + 1 : library->dlpi_name, kLibraryName) != 0) {
        return 0;
    }
    search->file = library->dlpi_name;
    return 1;
}

} // namespace

bool PlatformLibrary::find() {
    if (m_handle) {
        return true;
    }
    Search search{m_knownLoads, 0, {}};
    dl_iterate_phdr(findPlatformLibrary, &search);
    m_knownLoads = search.loads;
    if (!search.file.empty()) {
        m_handle = dlopen(search.file.c_str(), RTLD_LAZY | RTLD_NOLOAD);
    }
    return m_handle != nullptr;
}

} // namespace desktop
